// KVRNX_IPHostedAccessPoint: the host's computer system and its IP endpoints.
#pragma once

#include "Nx/Instrumentation.h"
#include "Nx/Moniker.h"

namespace Nx {
namespace IPInterfaceProvider {

class IPHostedAccessPoint {
public:
    IPHostedAccessPoint();
    ~IPHostedAccessPoint();

    // Endpoint to the computer system.
    Nx::Moniker getComputerSystemMoniker(Nx::Moniker& endpoint);
    // Computer system to the endpoints it hosts (all endpoints named with its system name).
    Nx::Moniker getIPProtocolEndPointMoniker(Nx::Moniker& computer);

private:
    Nx::Instrumentation instrumentation;
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
