#include "CMPI/CMPIServiceAffectsElement.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIServiceAffectsElement = "Tarvo.IPInterfaceProvider";

namespace {

const AssociationClass kAssociation = {
    "KVRNX_IPServiceAffectsElement",
    {IPProtocolEndpointId, "KVRNX_IPProtocolEndpoint", "CIM_IPProtocolEndpoint", "AffectedElement"},
    {IPConfigurationServiceId, "KVRNX_IPConfigurationService", "CIM_IPConfigurationService", "AffectingElement"},
    false,
};

}  // namespace

CMPIServiceAffectsElement::CMPIServiceAffectsElement(const CMPIBroker* broker_, const CMPIContext* context_,
                                                     const CMPIObjectPath* path)
    : Base(broker_, context_, path, kAssociation, loggerCMPIServiceAffectsElement, NX_FILE) {
    constructAnchored(__func__, path, IPServiceAffectsElementId, &CMPIServiceAffectsElement::locateIPEndptPath,
                      &CMPIServiceAffectsElement::locateIPConfgSvce);
}

bool CMPIServiceAffectsElement::setObjectPath(const CMPIObjectPath* path) {
    return setAnchoredObjectPath<Side::B>(path, "SystemName", &CMPIServiceAffectsElement::locateIPEndptPath,
                                          &CMPIServiceAffectsElement::locateIPConfgSvce);
}

CMPIObjectPath* CMPIServiceAffectsElement::locateIPEndptPath(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPProtocolEndpoint", &ServiceAffectsElement::getIPProtocolEndpointMoniker,
                  "getIPProtocolEndpointMoniker");
}

CMPIObjectPath* CMPIServiceAffectsElement::locateIPConfgSvce(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPConfigurationService", &ServiceAffectsElement::getIPConfigurationServiceMoniker,
                  "getIPConfigurationServiceMoniker");
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
