#include "CMPI/CMPIRemoteAccessAvailableToElement.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIRemoteAccessAvailableToElement = "Tarvo.IPInterfaceProvider";

namespace {

const AssociationClass kAssociation = {
    "KVRNX_IPRemoteAccessAvailableToElement",
    {IPRemoteServiceAccessPointId, "KVRNX_IPRemoteServiceAccessPoint", "CIM_RemoteServiceAccessPoint", "Antecedent"},
    {IPProtocolEndpointId, "KVRNX_IPProtocolEndpoint", "CIM_IPProtocolEndpoint", "Dependent"},
    false,
};

}  // namespace

CMPIRemoteAccessAvailableToElement::CMPIRemoteAccessAvailableToElement(const CMPIBroker* broker_,
                                                                       const CMPIContext* context_,
                                                                       const CMPIObjectPath* path)
    : Base(broker_, context_, path, kAssociation, loggerCMPIRemoteAccessAvailableToElement, NX_FILE) {
    construct(__func__, path, [&] {
        switch (requestedClassId) {
            case IPRemoteServiceAccessPointId:
                fromA(path, &CMPIRemoteAccessAvailableToElement::locateIPEndptPath);
                break;
            case IPRemoteAccessAvailableToElementId:
                walkA(&CMPIRemoteAccessAvailableToElement::locateIPEndptPath);
                break;
            case IPProtocolEndpointId:
                fromB(path, &CMPIRemoteAccessAvailableToElement::locateRemoteSAP);
                break;
            default:
                break;
        }
    });
}

CMPIObjectPath* CMPIRemoteAccessAvailableToElement::locateRemoteSAP(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPRemoteServiceAccessPoint",
                  &RemoteAccessAvailableToElement::getRemoteServiceAccessPointMoniker,
                  "getRemoteServiceAccessPointMoniker");
}

CMPIObjectPath* CMPIRemoteAccessAvailableToElement::locateIPEndptPath(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPProtocolEndpoint", &RemoteAccessAvailableToElement::getIPProtocolEndpointMoniker,
                  "getIPProtocolEndpointMoniker");
}

void CMPIRemoteAccessAvailableToElement::setAssociationProperties(CMPIInstance* instance) {
    // Never set: the model keeps no order of access.
    copyProperty<unsigned short>(instance, "OrderOfAccess", &RemoteAccessAvailableToElement::getOrderOfAccess);
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
