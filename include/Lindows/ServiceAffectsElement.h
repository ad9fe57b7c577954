// KVRNX_IPServiceAffectsElement: the IP configuration service and the endpoints it configures.
#pragma once

#include "Nx/Moniker.h"

namespace Nx {
namespace IPInterfaceProvider {

class ServiceAffectsElement {
public:
    ServiceAffectsElement();
    ~ServiceAffectsElement();

    // Service to the endpoints of its system.
    Nx::Moniker getIPProtocolEndpointMoniker(Nx::Moniker& service);
    // Endpoint to the service of its system.
    Nx::Moniker getIPConfigurationServiceMoniker(Nx::Moniker& endpoint);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
