#include "CMPI/CMPIIPElementCapabilities.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIIPElementCapabilities = "Tarvo.IPInterfaceProvider";

namespace {

const AssociationClass kAssociation = {
    "KVRNX_IPElementCapabilities",
    {IPProtocolEndpointId, "KVRNX_IPProtocolEndpoint", "CIM_IPProtocolEndpoint", "ManagedElement"},
    {IPEnabledLogicalElementCapabilitiesId, "KVRNX_IPEnabledLogicalElementCapabilities",
     "CIM_EnabledLogicalElementCapabilities", "Capabilities"},
    false,
};

}  // namespace

CMPIIPElementCapabilities::CMPIIPElementCapabilities(const CMPIBroker* broker_, const CMPIContext* context_,
                                                     const CMPIObjectPath* path)
    : Base(broker_, context_, path, kAssociation, loggerCMPIIPElementCapabilities, NX_FILE) {
    construct(__func__, path, [&] {
        switch (requestedClassId) {
            case IPElementCapabilitiesId:
                walkA(&CMPIIPElementCapabilities::locateCapabilities);
                break;
            case IPEnabledLogicalElementCapabilitiesId:
                fromB(path, &CMPIIPElementCapabilities::locateProtocolEndpt);
                break;
            case IPProtocolEndpointId:
                fromA(path, &CMPIIPElementCapabilities::locateCapabilities);
                break;
            default:
                break;
        }
    });
}

CMPIObjectPath* CMPIIPElementCapabilities::locateProtocolEndpt(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPProtocolEndpoint", &IPElementCapabilities::getIPMoniker, "getIPMoniker");
}

CMPIObjectPath* CMPIIPElementCapabilities::locateCapabilities(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPEnabledLogicalElementCapabilities", &IPElementCapabilities::getCapabilitiesMoniker,
                  "getCapabilitiesMoniker");
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
