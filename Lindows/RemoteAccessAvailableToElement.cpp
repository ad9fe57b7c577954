#include "Lindows/RemoteAccessAvailableToElement.h"

#include "Lindows/AssociationModel.h"
#include "Lindows/RemoteServiceAccessPoint.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerRemoteAccessAvailableToElement = "Tarvo.IPInterfaceProvider";

RemoteAccessAvailableToElement::RemoteAccessAvailableToElement() = default;
RemoteAccessAvailableToElement::~RemoteAccessAvailableToElement() = default;

// A gateway's name is the interface name, "_" and the protocol. Interface names may hold "_"
// themselves, so only the last one separates.
Nx::Moniker RemoteAccessAvailableToElement::getIPProtocolEndpointMoniker(Nx::Moniker& accessPoint) {
    NX_ENTER(loggerRemoteAccessAvailableToElement);
    const std::string name = requireKey(accessPoint, "Name", "Could not find 'Name' Key in Moniker");
    const std::string::size_type cut = name.rfind('_');
    if (cut == std::string::npos || cut == 0) throw Nx::FrameworkException("Name Key is not correct.");
    const std::string interfaceName = name.substr(0, cut);
    std::string systemName, systemClass;
    const bool systemGiven = findKey(accessPoint, "SystemName", systemName);
    findKey(accessPoint, "SystemCreationClassName", systemClass);
    NX_VAR(loggerRemoteAccessAvailableToElement, "SystemCreationClassName", systemClass.c_str());

    IPprotocolEndpoint endpoint;
    if (!findEndpoint(endpoint, interfaceName, systemGiven ? &systemName : nullptr))
        throw Nx::InstrumentationException("Concerned IP Protocol Endpoint Could Not Be Found.");
    std::string endpointSystem, endpointSystemClass;
    Nx::Moniker result;
    if (endpoint.getSystemName(endpointSystem)) result.addKey("SystemName", endpointSystem);
    result.addKey("Name", interfaceName);
    endpoint.getSystemCreationClassName(endpointSystemClass);
    result.addKey("SystemCreationClassName", endpointSystemClass);
    result.addKey("CreationClassName", IPProtocolEndpointClass);
    NX_EXIT(loggerRemoteAccessAvailableToElement);
    return result;
}

// The gateways are found in the gateway model itself, so an endpoint is associated with exactly
// the gateways an enumeration of them presents.
Nx::Moniker RemoteAccessAvailableToElement::getRemoteServiceAccessPointMoniker(Nx::Moniker& endpoint) {
    NX_ENTER(loggerRemoteAccessAvailableToElement);
    const std::string name = requireKey(endpoint, "Name", "Could not find 'Name' Key in Moniker");
    if (name.empty()) throw Nx::FrameworkException("Name Key is not correct.");
    std::string systemName, systemClass;
    const bool systemGiven = findKey(endpoint, "SystemName", systemName);
    findKey(endpoint, "SystemCreationClassName", systemClass);

    RemoteServiceAccessPoint gateway;
    for (; gateway; ++gateway) {
        std::string interfaceName, gatewaySystem;
        gateway.getElementName(interfaceName);
        if (interfaceName != name) continue;
        if (systemGiven && gateway.getSystemName(gatewaySystem) && gatewaySystem != systemName) continue;
        break;
    }
    if (!gateway) throw Nx::InstrumentationException("Concerned DHCP Protocol Endpoint Could Not Be Found.");
    std::string gatewayName, gatewaySystem, gatewaySystemClass;
    if (!gateway.getName(gatewayName))
        throw Nx::InstrumentationException("Name Property on NetworkIPConfig Node not available.");
    Nx::Moniker result;
    result.addKey("Name", gatewayName);
    if (gateway.getSystemName(gatewaySystem)) result.addKey("SystemName", gatewaySystem);
    gateway.getSystemCreationClassName(gatewaySystemClass);
    result.addKey("SystemCreationClassName", gatewaySystemClass);
    result.addKey("CreationClassName", "KVRNX_IPRemoteServiceAccessPoint");
    NX_EXIT(loggerRemoteAccessAvailableToElement);
    return result;
}

bool RemoteAccessAvailableToElement::getOrderOfAccess(unsigned short&) { return false; }

}  // namespace IPInterfaceProvider
}  // namespace Nx
