// KVRNX_SPHostedAccessPoint: the service processor's computer system and its IP endpoints.
#pragma once

#include "Nx/Moniker.h"

namespace Nx {
namespace IPInterfaceProvider {

class SPHostedAccessPoint {
public:
    SPHostedAccessPoint();
    ~SPHostedAccessPoint();

    // Service processor to the endpoints it hosts.
    Nx::Moniker getIPProtocolEndPointMoniker(Nx::Moniker& serviceProcessor);
    // Endpoint of the service processor to the service processor.
    Nx::Moniker getSPMoniker(Nx::Moniker& endpoint);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
