#include "CMPI/CMPISPHostedAccessPoint.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPISPHostedAccessPoint = "Tarvo.IPInterfaceProvider";

namespace {

const AssociationClass kAssociation = {
    "KVRNX_SPHostedAccessPoint",
    {SPComputerSystemId, "KVRNX_SPComputerSystem", "CIM_ComputerSystem", "Antecedent"},
    {IPProtocolEndpointId, "KVRNX_IPProtocolEndpoint", "CIM_IPProtocolEndpoint", "Dependent"},
    false,
};

}  // namespace

CMPISPHostedAccessPoint::CMPISPHostedAccessPoint(const CMPIBroker* broker_, const CMPIContext* context_,
                                                 const CMPIObjectPath* path)
    : Base(broker_, context_, path, kAssociation, loggerCMPISPHostedAccessPoint, NX_FILE) {
    construct(__func__, path, [&] {
        switch (requestedClassId) {
            case SPComputerSystemId:
                fromA(path, &CMPISPHostedAccessPoint::locateProtocolEndpoint);
                break;
            case SPHostedAccessPointId: {
                CMPIObjectPath* located = locateBMC(path);
                endA.setObjectPath(located, false);
                CMPIObjectPath* found = endA.getObjectPath();
                endB.setObjectPath(locateProtocolEndpoint(found ? found : located));
                walk(Side::B);
                break;
            }
            case IPProtocolEndpointId:
                // Picked out by name among the service processors enumerated.
                endA.setObjectPath(locateBMC(path), true);
                endB.setObjectPath(path);
                walk(Side::A);
                break;
            default:
                break;
        }
    });
}

CMPIObjectPath* CMPISPHostedAccessPoint::locateBMC(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_SPComputerSystem", &SPHostedAccessPoint::getSPMoniker, "getSPMoniker");
}

CMPIObjectPath* CMPISPHostedAccessPoint::locateProtocolEndpoint(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPProtocolEndpoint", &SPHostedAccessPoint::getIPProtocolEndPointMoniker,
                  "getIPProtocolEndPointMoniker");
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
