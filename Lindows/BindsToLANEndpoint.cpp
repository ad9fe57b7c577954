#include "Lindows/BindsToLANEndpoint.h"

#include "Lindows/AssociationModel.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerBindsToLANEndpoint = "Tarvo.IPInterfaceProvider";

BindsToLANEndpoint::BindsToLANEndpoint() = default;
BindsToLANEndpoint::~BindsToLANEndpoint() = default;

Nx::Moniker BindsToLANEndpoint::getIPProtocolEndPointMoniker(Nx::Moniker& lanEndpoint) {
    NX_ENTER(loggerBindsToLANEndpoint);
    const std::string name = requireKey(lanEndpoint, "Name", "Could not find 'Name' Key in Moniker");
    std::string systemName, systemClass;
    const bool systemGiven = findKey(lanEndpoint, "SystemName", systemName);
    findKey(lanEndpoint, "SystemCreationClassName", systemClass);
    NX_VAR(loggerBindsToLANEndpoint, "SystemCreationClassName", systemClass.c_str());

    // The LAN endpoint names the system it belongs to; when no endpoint of that system carries
    // the interface, the system is not one of ours.
    IPprotocolEndpoint endpoint;
    if (!findEndpoint(endpoint, name, systemGiven ? &systemName : nullptr))
        throw Nx::InstrumentationException("Concerned Computer Could Not Be Found.");
    Nx::Moniker result;
    std::string endpointSystemClass, endpointSystem;
    endpoint.getSystemCreationClassName(endpointSystemClass);
    result.addKey("SystemCreationClassName", endpointSystemClass);
    result.addKey("CreationClassName", IPProtocolEndpointClass);
    if (endpoint.getSystemName(endpointSystem))
        result.addKey("SystemName", endpointSystem);
    else if (systemGiven)
        result.addKey("SystemName", systemName);
    result.addKey("Name", name);
    NX_EXIT(loggerBindsToLANEndpoint);
    return result;
}

Nx::Moniker BindsToLANEndpoint::getLANEndpointMoniker(Nx::Moniker& ipEndpoint) {
    NX_ENTER(loggerBindsToLANEndpoint);
    std::string name, systemName;
    if (!findKey(ipEndpoint, "Name", name)) throw Nx::FrameworkException("Could not find 'Name' key in Moniker");
    const bool systemGiven = findKey(ipEndpoint, "SystemName", systemName);
    NX_VAR(loggerBindsToLANEndpoint, "Name", name.c_str());

    for (instrumentation.selectNode(Nx::NodeLexicon::LanEndpointNode); instrumentation; ++instrumentation) {
        std::string interfaceName;
        if (!instrumentation.getProperty(Nx::NodeLexicon::ElementName, interfaceName)) continue;
        if (interfaceName != name) continue;
        Nx::Moniker result;
        result.addKey("Name", interfaceName);
        result.addKey("SystemCreationClassName", ComputerSystemClass);
        result.addKey("CreationClassName", "KVRNX_LANEndpoint");
        if (systemGiven) result.addKey("SystemName", systemName);
        NX_EXIT(loggerBindsToLANEndpoint);
        return result;
    }
    throw Nx::FrameworkException("Could not match 'System Name' key with 'Name' key in Computer Moniker");
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
