// KVRNX_IPRemoteAccessAvailableToElement: a gateway (remote service access point) and the IP
// endpoint it is reached through.
#pragma once

#include "Nx/Moniker.h"

namespace Nx {
namespace IPInterfaceProvider {

class RemoteAccessAvailableToElement {
public:
    RemoteAccessAvailableToElement();
    ~RemoteAccessAvailableToElement();

    // Gateway ("interface_IPv4" or "interface_IPv6") to its endpoint.
    Nx::Moniker getIPProtocolEndpointMoniker(Nx::Moniker& accessPoint);
    // Endpoint to its gateways (both presentations of an interface with two).
    Nx::Moniker getRemoteServiceAccessPointMoniker(Nx::Moniker& endpoint);

    // No order of access is kept: always false, and the output is left alone.
    bool getOrderOfAccess(unsigned short& orderOfAccess);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
