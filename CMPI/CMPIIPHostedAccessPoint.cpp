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
    const std::string params = parameterList(" _broker=", broker_, " _context=", context_, " objectPath=", path);
    NX_ENTER_PARAMS(loggerCMPIIPHostedAccessPoint, params.c_str());
    switch (requestedClassId) {
        case IPProtocolEndpointId:
            fromB(path, &CMPIIPHostedAccessPoint::locateComputer);
            break;
        case IPHostedAccessPointId:
            if (!setObjectPath(path)) fromA(path, &CMPIIPHostedAccessPoint::locateProtocolEndpoint);
            break;
        case ComputerSystemId:
            fromA(path, &CMPIIPHostedAccessPoint::locateProtocolEndpoint);
            break;
        default:
            break;
    }
    NX_EXIT_PARAMS(loggerCMPIIPHostedAccessPoint, params.c_str());
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
