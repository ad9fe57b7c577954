// KVRNX_IPHostedService: the host's computer system and its IP configuration service.
#pragma once

#include "Nx/Instrumentation.h"
#include "Nx/Moniker.h"

namespace Nx {
namespace IPInterfaceProvider {

class IPHostedService {
public:
    IPHostedService();
    ~IPHostedService();

    // Configuration service to the computer system.
    Nx::Moniker getComputerSystemMoniker(Nx::Moniker& service);
    // Computer system to its configuration service.
    Nx::Moniker getIPConfigurationServiceMoniker(Nx::Moniker& computer);

private:
    Nx::Instrumentation instrumentation;
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
