#include "CMPI/CMPIIPHostedAccessPoint.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIIPHostedAccessPoint = "Tarvo.IPInterfaceProvider";

namespace {

const AssociationClass kAssociation = {
    "KVRNX_IPHostedAccessPoint",
    {ComputerSystemId, "KVRNX_ComputerSystem", "CIM_ComputerSystem", "Antecedent"},
    {IPProtocolEndpointId, "KVRNX_IPProtocolEndpoint", "CIM_IPProtocolEndpoint", "Dependent"},
    false,
};

}  // namespace

CMPIIPHostedAccessPoint::CMPIIPHostedAccessPoint(const CMPIBroker* broker_, const CMPIContext* context_,
                                                 const CMPIObjectPath* path)
    : Base(broker_, context_, path, kAssociation, loggerCMPIIPHostedAccessPoint, NX_FILE) {
    constructAnchored(__func__, path, IPHostedAccessPointId, &CMPIIPHostedAccessPoint::locateComputer,
                      &CMPIIPHostedAccessPoint::locateProtocolEndpoint);
}

bool CMPIIPHostedAccessPoint::setObjectPath(const CMPIObjectPath* path) {
    return setAnchoredObjectPath<Side::A>(path, "Name", &CMPIIPHostedAccessPoint::locateProtocolEndpoint,
                                          &CMPIIPHostedAccessPoint::locateComputer);
}

CMPIObjectPath* CMPIIPHostedAccessPoint::locateComputer(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_ComputerSystem", &IPHostedAccessPoint::getComputerSystemMoniker,
                  "getComputerSystemMoniker");
}

CMPIObjectPath* CMPIIPHostedAccessPoint::locateProtocolEndpoint(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPProtocolEndpoint", &IPHostedAccessPoint::getIPProtocolEndPointMoniker,
                  "getIPProtocolEndPointMoniker");
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
