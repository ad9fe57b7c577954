// KVRNX_RemoteHostedAccessPoint: the host's computer system and its gateways.
#pragma once

#include "Nx/Instrumentation.h"
#include "Nx/Moniker.h"

namespace Nx {
namespace IPInterfaceProvider {

class RemoteHostedAccessPoint {
public:
    RemoteHostedAccessPoint();
    ~RemoteHostedAccessPoint();

    // Gateway (remote service access point) to the computer system.
    Nx::Moniker getSystemMoniker(Nx::Moniker& accessPoint);
    // Computer system to its gateways.
    Nx::Moniker getRemoteSAPMoniker(Nx::Moniker& computer);

private:
    Nx::Instrumentation instrumentation;
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
