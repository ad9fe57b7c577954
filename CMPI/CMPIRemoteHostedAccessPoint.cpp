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
    constructAnchored(__func__, path, RemoteHostedAccessPointId, &CMPIRemoteHostedAccessPoint::locateComputer,
                      &CMPIRemoteHostedAccessPoint::locateRemoteSAP);
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
