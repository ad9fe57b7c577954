// KVRNX_BindsToLanEndPoint: an IP endpoint and the LAN endpoint (network port) it runs over.
#pragma once

#include "Nx/Instrumentation.h"
#include "Nx/Moniker.h"

namespace Nx {
namespace IPInterfaceProvider {

class BindsToLANEndpoint {
public:
    BindsToLANEndpoint();
    ~BindsToLANEndpoint();

    // LAN endpoint to the IP endpoint of the same interface on the same system.
    Nx::Moniker getIPProtocolEndPointMoniker(Nx::Moniker& lanEndpoint);
    // IP endpoint to the LAN endpoint: the first LAN node with the endpoint's interface name.
    Nx::Moniker getLANEndpointMoniker(Nx::Moniker& ipEndpoint);

private:
    Nx::Instrumentation instrumentation;
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
