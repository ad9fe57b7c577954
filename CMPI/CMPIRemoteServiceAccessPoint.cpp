#include "CMPI/CMPIRemoteServiceAccessPoint.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIRemoteServiceAccessPoint = "Tarvo.IPInterfaceProvider";

CMPIRemoteServiceAccessPoint::CMPIRemoteServiceAccessPoint(const CMPIBroker* broker, const CMPIContext* context,
                                                           const std::string& nameSpace)
    : CMPIAdapter(broker, context, nameSpace, loggerCMPIRemoteServiceAccessPoint, NX_FILE, __func__) {}

CMPIRemoteServiceAccessPoint::CMPIRemoteServiceAccessPoint(const CMPIBroker* broker, const CMPIContext* context,
                                                           const CMPIObjectPath* path)
    : CMPIAdapter(broker, context, path, loggerCMPIRemoteServiceAccessPoint, NX_FILE) {
    constructedAt(__func__, path, [&] { setObjectPath(path); });
}

void CMPIRemoteServiceAccessPoint::setObjectPath(const CMPIObjectPath* path) {
    filterByKeys(__func__, TraceParams(" objectPath=", path), path,
                 {{"SystemName", RemoteServiceAccessPoint::FilterType::BySystemName},
                  {"Name", RemoteServiceAccessPoint::FilterType::ByName}});
}

CMPIObjectPath* CMPIRemoteServiceAccessPoint::getObjectPath() {
    return objectPath(__func__, "KVRNX_IPRemoteServiceAccessPoint", [this](CMPIObjectPath* path) {
        copyKey(path, "SystemCreationClassName", &RemoteServiceAccessPoint::getSystemCreationClassName);
        copyKey(path, "SystemName", &RemoteServiceAccessPoint::getSystemName);
        copyKey(path, "CreationClassName", &RemoteServiceAccessPoint::getCreationClassName);
        copyKey(path, "Name", &RemoteServiceAccessPoint::getName);
    });
}

CMPIInstance* CMPIRemoteServiceAccessPoint::getCMPIInstance(const char** properties) {
    return instanceOf(__func__, properties, properties, this, [this](CMPIInstance* instance) {
        using M = RemoteServiceAccessPoint;
        copyProperty<std::string>(instance, "ElementName", &M::getElementName);
        copyProperty<std::string>(instance, "AccessInfo", &M::getAccessInfo);
        copyProperty<std::string>(instance, "OtherAccessContext", &M::getOtherAccessContext);
        copyProperty<unsigned short>(instance, "InfoFormat", &M::getInfoFormat);
        copyProperty<unsigned short>(instance, "AccessContext", &M::getAccessContext);
        copyProperty<std::string>(instance, "SystemCreationClassName", &M::getSystemCreationClassName);
        copyProperty<std::string>(instance, "SystemName", &M::getSystemName);
        copyProperty<std::string>(instance, "CreationClassName", &M::getCreationClassName);
        copyProperty<std::string>(instance, "Name", &M::getName);
    });
}

CMPIStatus CMPIRemoteServiceAccessPoint::modifyInstance(const CMPIInstance* newInstance) {
    const TraceParams params(" newInstance=", newInstance);
    NX_ENTER_PARAMS(loggerCMPIRemoteServiceAccessPoint, params.c_str());
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIObjectPath* path = newInstance ? CMGetObjectPath(newInstance, nullptr) : nullptr;
    if (path) {
        setObjectPath(path);
        NX_VAR(loggerCMPIRemoteServiceAccessPoint, "objstring", ProviderUtilities::toString(broker, path).c_str());
    }
    std::string accessInfo;
    if (ProviderUtilities::getProperty(newInstance, "AccessInfo", accessInfo)) {
        NX_VAR(loggerCMPIRemoteServiceAccessPoint, "AccessInfo", accessInfo.c_str());
        // The address ends up in a file that network scripts source as root.
        if (ProviderUtilities::ValidateInput(accessInfo, ":") == 0) {
            NX_MESSAGE(loggerCMPIRemoteServiceAccessPoint, 6000, "Invalid Security data passed in the property value");
            status = refuseProperty("AccessInfo");
        } else {
            // Which gateway is written follows the interface's protocol type, not the one
            // presented; a refused write is not reported back.
            model.setAccessInfo(accessInfo);
        }
    }
    NX_EXIT_PARAMS(loggerCMPIRemoteServiceAccessPoint, params.c_str());
    return status;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
