#include "CMPI/CMPIAssignmentSettingData.h"
#include "Lindows/ConfigurationFile.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIAssignmentSettingData = "Tarvo.IPInterfaceProvider";

CMPIAssignmentSettingData::CMPIAssignmentSettingData(const CMPIBroker* broker, const CMPIContext* context,
                                                     const std::string& nameSpace)
    : CMPIAdapter(broker, context, nameSpace, loggerCMPIAssignmentSettingData, NX_FILE, __func__) {}

CMPIAssignmentSettingData::CMPIAssignmentSettingData(const CMPIBroker* broker, const CMPIContext* context,
                                                     const CMPIObjectPath* path)
    : CMPIAdapter(broker, context, path, loggerCMPIAssignmentSettingData, NX_FILE) {
    constructedAt(__func__, path, [&] { setObjectPath(path, false); });
}

void CMPIAssignmentSettingData::setObjectPath(const CMPIObjectPath* path, bool isCfg) {
    filterByKeys(__func__, TraceParams(" objectPath=", path, " isCfg=", isCfg), path,
                 {{"InstanceID", IPAssignmentSettingData::FilterType::ByInstanceID}}, isCfg);
}

CMPIObjectPath* CMPIAssignmentSettingData::getObjectPath() {
    return instanceIdPath(__func__, "KVRNX_IPAssignmentSettingData", &IPAssignmentSettingData::getInstanceId);
}

CMPIInstance* CMPIAssignmentSettingData::getCMPIInstance(const char** properties) {
    return instanceOf(__func__, properties, nullptr, this, [this](CMPIInstance* instance) {
        using M = IPAssignmentSettingData;
        copyProperty<std::string>(instance, "InstanceID", &M::getInstanceId);
        copyProperty<std::string>(instance, "ElementName", &M::getElementName);
        copyProperty<unsigned short>(instance, "AddressOrigin", &M::getAddressOrigin);
        copyProperty<std::string>(instance, "ConfigurationName", &M::getConfigurationName);
    });
}

CMPIStatus CMPIAssignmentSettingData::modifyInstance(const CMPIInstance* newInstance) {
    const TraceParams params(" newInstance=", newInstance);
    NX_ENTER_PARAMS(loggerCMPIAssignmentSettingData, params.c_str());
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIObjectPath* path = newInstance ? CMGetObjectPath(newInstance, nullptr) : nullptr;
    if (path) {
        setObjectPath(path, false);
        NX_VAR(loggerCMPIAssignmentSettingData, "l_strObjString", ProviderUtilities::toString(broker, path).c_str());
        // A modification that leaves ConfigurationName out clears it.
        std::string configurationName;
        ProviderUtilities::getProperty(newInstance, "ConfigurationName", configurationName);
        if (isSafeConfigurationValue(configurationName))
            model.setConfigurationName(configurationName);
        else
            status = refuseProperty("ConfigurationName");
    }
    NX_EXIT_PARAMS(loggerCMPIAssignmentSettingData, params.c_str());
    return status;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
