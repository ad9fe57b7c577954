#include "CMPI/CMPIBindsToLanEndpoint.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIBindsToLanEndpoint = "Tarvo.IPInterfaceProvider";

namespace {

const AssociationClass kAssociation = {
    "KVRNX_BindsToLanEndPoint",
    {IPProtocolEndpointId, "KVRNX_IPProtocolEndpoint", "CIM_IPProtocolEndpoint", "Dependent"},
    {LANEndpointId, "KVRNX_LANEndpoint", "CIM_LanEndpoint", "Antecedent"},
    false,
};

}  // namespace

CMPIBindsToLanEndpoint::CMPIBindsToLanEndpoint(const CMPIBroker* broker_, const CMPIContext* context_,
                                               const CMPIObjectPath* path)
    : Base(broker_, context_, path, kAssociation, loggerCMPIBindsToLanEndpoint, NX_FILE) {
    construct(__func__, path, [&] {
        switch (requestedClassId) {
            case LANEndpointId:
                fromB(path, &CMPIBindsToLanEndpoint::getIPEndptPath);
                break;
            case BindsToLanEndPointId:
                // The endpoints are walked; the LAN end is looked up once, from the first of them.
                if (endA) endB.setObjectPath(getLanEndptPath(endA.getObjectPath()));
                walk(Side::A);
                break;
            case IPProtocolEndpointId:
                fromA(path, &CMPIBindsToLanEndpoint::getLanEndptPath);
                break;
            default:
                break;
        }
    });
}

CMPIObjectPath* CMPIBindsToLanEndpoint::getIPEndptPath(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPProtocolEndpoint", &BindsToLANEndpoint::getIPProtocolEndPointMoniker,
                  "getIPProtocolEndPointMoniker");
}

CMPIObjectPath* CMPIBindsToLanEndpoint::getLanEndptPath(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_LANEndpoint", &BindsToLANEndpoint::getLANEndpointMoniker, "getLANEndpointMoniker");
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
