#include "CMPI/CMPIRemoteHostedAccessPoint.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIRemoteHostedAccessPoint = "Tarvo.IPInterfaceProvider";

namespace {

const AssociationClass kAssociation = {
    "KVRNX_RemoteHostedAccessPoint",
    {ComputerSystemId, "KVRNX_ComputerSystem", "CIM_ComputerSystem", "Antecedent"},
    {IPRemoteServiceAccessPointId, "KVRNX_IPRemoteServiceAccessPoint", "CIM_RemoteServiceAccessPoint", "Dependent"},
    false,
};

}  // namespace

CMPIRemoteHostedAccessPoint::CMPIRemoteHostedAccessPoint(const CMPIBroker* broker_, const CMPIContext* context_,
                                                         const CMPIObjectPath* path)
    : Base(broker_, context_, path, kAssociation, loggerCMPIRemoteHostedAccessPoint, NX_FILE) {
    const std::string params = parameterList(" _broker=", broker_, " _context=", context_, " objectPath=", path);
    NX_ENTER_PARAMS(loggerCMPIRemoteHostedAccessPoint, params.c_str());
    switch (requestedClassId) {
        case IPRemoteServiceAccessPointId:
            fromB(path, &CMPIRemoteHostedAccessPoint::locateComputer);
            break;
        case RemoteHostedAccessPointId:
            if (!setObjectPath(path)) fromA(path, &CMPIRemoteHostedAccessPoint::locateRemoteSAP);
            break;
        case ComputerSystemId:
            fromA(path, &CMPIRemoteHostedAccessPoint::locateRemoteSAP);
            break;
        default:
            break;
    }
    NX_EXIT_PARAMS(loggerCMPIRemoteHostedAccessPoint, params.c_str());
}

bool CMPIRemoteHostedAccessPoint::setObjectPath(const CMPIObjectPath* path) {
    return setAnchoredObjectPath<Side::A>(path, "Name", &CMPIRemoteHostedAccessPoint::locateRemoteSAP,
                                          &CMPIRemoteHostedAccessPoint::locateComputer);
}

CMPIObjectPath* CMPIRemoteHostedAccessPoint::locateComputer(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_ComputerSystem", &RemoteHostedAccessPoint::getSystemMoniker, "getSystemMoniker");
}

CMPIObjectPath* CMPIRemoteHostedAccessPoint::locateRemoteSAP(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPRemoteServiceAccessPoint", &RemoteHostedAccessPoint::getRemoteSAPMoniker,
                  "getRemoteSAPMoniker");
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
