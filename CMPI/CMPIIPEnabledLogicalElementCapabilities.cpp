#include "CMPI/CMPIIPEnabledLogicalElementCapabilities.h"

#include <vector>

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIIPEnabledLogicalElementCapabilities = "Tarvo.IPInterfaceProvider";

CMPIIPEnabledLogicalElementCapabilities::CMPIIPEnabledLogicalElementCapabilities(const CMPIBroker* broker,
                                                                                 const CMPIContext* context,
                                                                                 const std::string& nameSpace)
    : CMPIAdapter(broker, context, nameSpace, loggerCMPIIPEnabledLogicalElementCapabilities, NX_FILE) {
    const std::string params =
        parameterList(" _broker=", broker, " _context=", context, " _namespace=", nameSpace);
    NX_ENTER_PARAMS(loggerCMPIIPEnabledLogicalElementCapabilities, params.c_str());
    NX_EXIT_PARAMS(loggerCMPIIPEnabledLogicalElementCapabilities, params.c_str());
}

CMPIIPEnabledLogicalElementCapabilities::CMPIIPEnabledLogicalElementCapabilities(const CMPIBroker* broker,
                                                                                 const CMPIContext* context,
                                                                                 const CMPIObjectPath* path)
    : CMPIAdapter(broker, context, ProviderUtilities::getNamespace(path),
                  loggerCMPIIPEnabledLogicalElementCapabilities, NX_FILE) {
    const std::string params = parameterList(" _broker=", broker, " _context=", context, " objectPath=", path);
    NX_ENTER_PARAMS(loggerCMPIIPEnabledLogicalElementCapabilities, params.c_str());
    setObjectPath(path);
    NX_EXIT_PARAMS(loggerCMPIIPEnabledLogicalElementCapabilities, params.c_str());
}

void CMPIIPEnabledLogicalElementCapabilities::setObjectPath(const CMPIObjectPath* path) {
    const std::string params = parameterList(" objectPath=", path);
    NX_ENTER_PARAMS(loggerCMPIIPEnabledLogicalElementCapabilities, params.c_str());
    std::string instanceId;
    if (ProviderUtilities::getKeyCount(path) != 0 && ProviderUtilities::getKeyProperty(path, "InstanceID", instanceId)) {
        NX_VAR(loggerCMPIIPEnabledLogicalElementCapabilities, "InstanceID", instanceId.c_str());
        model.setFilter(IPEnabledLogicalElementCapabilities::FilterType::ByInstanceID, instanceId);
    }
    NX_EXIT_PARAMS(loggerCMPIIPEnabledLogicalElementCapabilities, params.c_str());
}

CMPIObjectPath* CMPIIPEnabledLogicalElementCapabilities::getObjectPath() {
    NX_ENTER(loggerCMPIIPEnabledLogicalElementCapabilities);
    CMPIObjectPath* path = newClassPath("KVRNX_IPEnabledLogicalElementCapabilities");
    if (path) copyKey(path, "InstanceID", &IPEnabledLogicalElementCapabilities::getInstanceID);
    NX_EXIT(loggerCMPIIPEnabledLogicalElementCapabilities);
    return path;
}

CMPIInstance* CMPIIPEnabledLogicalElementCapabilities::getCMPIInstance(const char** properties) {
    const std::string params = parameterList(" properties=", properties);
    NX_ENTER_PARAMS(loggerCMPIIPEnabledLogicalElementCapabilities, params.c_str());
    CMPIInstance* instance = ProviderUtilities::createInstance(broker, getObjectPath(), properties);
    if (instance) {
        using M = IPEnabledLogicalElementCapabilities;
        copyProperty<std::string>(instance, "ElementName", &M::getElementName);
        copyProperty<bool>(instance, "ElementNameEditSupported", &M::getElementNameEditSupported);
        // The host states no maximum, so the property stays unset.
        copyProperty<unsigned short>(instance, "MaxElementNameLen", &M::getMaxElementNameLen);
        copyProperty<std::vector<unsigned short>>(instance, "RequestedStatesSupported",
                                                  &M::getRequestedStatesSupported);
        copyProperty<std::string>(instance, "InstanceID", &M::getInstanceID);
    }
    NX_EXIT_PARAMS(loggerCMPIIPEnabledLogicalElementCapabilities, params.c_str());
    return instance;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
