// KVRNX_IPElementCapabilities: an IP endpoint and its capabilities.
#pragma once

#include "Nx/Moniker.h"

namespace Nx {
namespace IPInterfaceProvider {

class IPElementCapabilities {
public:
    IPElementCapabilities();
    ~IPElementCapabilities();

    // Capabilities (InstanceID = interface name) to the endpoint; the first in node order.
    Nx::Moniker getIPMoniker(Nx::Moniker& capabilities);
    // Endpoint to its capabilities.
    Nx::Moniker getCapabilitiesMoniker(Nx::Moniker& endpoint);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
