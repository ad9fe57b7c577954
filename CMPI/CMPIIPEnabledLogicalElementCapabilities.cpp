#include "CMPI/CMPIIPEnabledLogicalElementCapabilities.h"

#include <vector>

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIIPEnabledLogicalElementCapabilities = "Tarvo.IPInterfaceProvider";

CMPIIPEnabledLogicalElementCapabilities::CMPIIPEnabledLogicalElementCapabilities(const CMPIBroker* broker,
                                                                                 const CMPIContext* context,
                                                                                 const std::string& nameSpace)
    : CMPIAdapter(broker, context, nameSpace, loggerCMPIIPEnabledLogicalElementCapabilities, NX_FILE, __func__) {}

CMPIIPEnabledLogicalElementCapabilities::CMPIIPEnabledLogicalElementCapabilities(const CMPIBroker* broker,
                                                                                 const CMPIContext* context,
                                                                                 const CMPIObjectPath* path)
    : CMPIAdapter(broker, context, path, loggerCMPIIPEnabledLogicalElementCapabilities, NX_FILE) {
    constructedAt(__func__, path, [&] { setObjectPath(path); });
}

void CMPIIPEnabledLogicalElementCapabilities::setObjectPath(const CMPIObjectPath* path) {
    filterByKeys(__func__, TraceParams(" objectPath=", path), path,
                 {{"InstanceID", IPEnabledLogicalElementCapabilities::FilterType::ByInstanceID}});
}

CMPIObjectPath* CMPIIPEnabledLogicalElementCapabilities::getObjectPath() {
    return objectPath(__func__, "KVRNX_IPEnabledLogicalElementCapabilities", [this](CMPIObjectPath* path) {
        copyKey(path, "InstanceID", &IPEnabledLogicalElementCapabilities::getInstanceID);
    });
}

CMPIInstance* CMPIIPEnabledLogicalElementCapabilities::getCMPIInstance(const char** properties) {
    return instanceOf(__func__, properties, properties, this, [this](CMPIInstance* instance) {
        using M = IPEnabledLogicalElementCapabilities;
        copyProperty<std::string>(instance, "ElementName", &M::getElementName);
        copyProperty<bool>(instance, "ElementNameEditSupported", &M::getElementNameEditSupported);
        // The host states no maximum, so the property stays unset.
        copyProperty<unsigned short>(instance, "MaxElementNameLen", &M::getMaxElementNameLen);
        copyProperty<std::vector<unsigned short>>(instance, "RequestedStatesSupported",
                                                  &M::getRequestedStatesSupported);
        copyProperty<std::string>(instance, "InstanceID", &M::getInstanceID);
    });
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
