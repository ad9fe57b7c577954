#include "CMPI/CMPIAssignmentSettingData.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIAssignmentSettingData = "Tarvo.IPInterfaceProvider";

CMPIAssignmentSettingData::CMPIAssignmentSettingData(const CMPIBroker* broker, const CMPIContext* context,
                                                     const std::string& nameSpace)
    : CMPIAdapter(broker, context, nameSpace, loggerCMPIAssignmentSettingData, NX_FILE) {
    const std::string params =
        parameterList(" _broker=", broker, " _context=", context, " _namespace=", nameSpace);
    NX_ENTER_PARAMS(loggerCMPIAssignmentSettingData, params.c_str());
    NX_EXIT_PARAMS(loggerCMPIAssignmentSettingData, params.c_str());
}

CMPIAssignmentSettingData::CMPIAssignmentSettingData(const CMPIBroker* broker, const CMPIContext* context,
                                                     const CMPIObjectPath* path)
    : CMPIAdapter(broker, context, ProviderUtilities::getNamespace(path), loggerCMPIAssignmentSettingData, NX_FILE) {
    const std::string params = parameterList(" _broker=", broker, " _context=", context, " objectPath=", path);
    NX_ENTER_PARAMS(loggerCMPIAssignmentSettingData, params.c_str());
    setObjectPath(path, false);
    NX_EXIT_PARAMS(loggerCMPIAssignmentSettingData, params.c_str());
}

void CMPIAssignmentSettingData::setObjectPath(const CMPIObjectPath* path, bool isCfg) {
    const std::string params = parameterList(" objectPath=", path, " isCfg=", isCfg);
    NX_ENTER_PARAMS(loggerCMPIAssignmentSettingData, params.c_str());
    std::string instanceId;
    if (ProviderUtilities::getKeyCount(path) != 0 && ProviderUtilities::getKeyProperty(path, "InstanceID", instanceId)) {
        NX_VAR(loggerCMPIAssignmentSettingData, "InstanceID", instanceId.c_str());
        model.setFilter(IPAssignmentSettingData::FilterType::ByInstanceID, instanceId, isCfg);
    }
    NX_EXIT_PARAMS(loggerCMPIAssignmentSettingData, params.c_str());
}

CMPIObjectPath* CMPIAssignmentSettingData::getObjectPath() {
    NX_ENTER(loggerCMPIAssignmentSettingData);
    CMPIObjectPath* path = newClassPath("KVRNX_IPAssignmentSettingData");
    std::string instanceId;
    if (path && model.getInstanceId(instanceId)) {
        NX_VAR(loggerCMPIAssignmentSettingData, "instanceID", instanceId.c_str());
        ProviderUtilities::setKeyProperty(path, "InstanceID", instanceId);
    }
    NX_EXIT(loggerCMPIAssignmentSettingData);
    return path;
}

CMPIInstance* CMPIAssignmentSettingData::getCMPIInstance(const char** properties) {
    const std::string params = parameterList(" properties=", properties);
    NX_ENTER_PARAMS(loggerCMPIAssignmentSettingData, params.c_str());
    CMPIInstance* instance = ProviderUtilities::createInstance(broker, getObjectPath());
    if (instance) {
        using M = IPAssignmentSettingData;
        copyProperty<std::string>(instance, "InstanceID", &M::getInstanceId);
        copyProperty<std::string>(instance, "ElementName", &M::getElementName);
        copyProperty<unsigned short>(instance, "AddressOrigin", &M::getAddressOrigin);
        copyProperty<std::string>(instance, "ConfigurationName", &M::getConfigurationName);
    }
    NX_EXIT_PARAMS(loggerCMPIAssignmentSettingData, params.c_str());
    return instance;
}

CMPIStatus CMPIAssignmentSettingData::modifyInstance(const CMPIInstance* newInstance) {
    const std::string params = parameterList(" newInstance=", newInstance);
    NX_ENTER_PARAMS(loggerCMPIAssignmentSettingData, params.c_str());
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIObjectPath* path = newInstance ? CMGetObjectPath(newInstance, nullptr) : nullptr;
    if (path) {
        setObjectPath(path, false);
        NX_VAR(loggerCMPIAssignmentSettingData, "l_strObjString", ProviderUtilities::toString(broker, path).c_str());
        // A modification that leaves ConfigurationName out clears it.
        std::string configurationName;
        ProviderUtilities::getProperty(newInstance, "ConfigurationName", configurationName);
        model.setConfigurationName(configurationName);
    }
    NX_EXIT_PARAMS(loggerCMPIAssignmentSettingData, params.c_str());
    return status;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
