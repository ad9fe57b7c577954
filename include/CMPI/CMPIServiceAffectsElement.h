// KVRNX_IPServiceAffectsElement: the IP configuration service and the endpoints it configures.
#pragma once

#include "CMPI/CMPIAssociationAdapter.h"
#include "CMPI/CMPIIPConfigurationService.h"
#include "CMPI/CMPIProtocolEndpoint.h"
#include "Lindows/ServiceAffectsElement.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIServiceAffectsElement : public CMPIAssociationAdapter<CMPIServiceAffectsElement, ServiceAffectsElement,
                                                                CMPIProtocolEndpoint, CMPIIPConfigurationService> {
    using Base = CMPIAssociationAdapter;
    friend Base;

public:
    CMPIServiceAffectsElement(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

    // A path of the association class: without keys, the service and the endpoints it affects; with keys,
    // positions what it can and returns false (see setAnchoredObjectPath).
    bool setObjectPath(const CMPIObjectPath* path);

protected:
    CMPIObjectPath* locateIPEndptPath(const CMPIObjectPath* path);
    CMPIObjectPath* locateIPConfgSvce(const CMPIObjectPath* path);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
