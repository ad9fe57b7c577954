#include "Lindows/ServiceAffectsElement.h"

#include "Lindows/AssociationModel.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerServiceAffectsElement = "Tarvo.IPInterfaceProvider";

ServiceAffectsElement::ServiceAffectsElement() = default;
ServiceAffectsElement::~ServiceAffectsElement() = default;

Nx::Moniker ServiceAffectsElement::getIPProtocolEndpointMoniker(Nx::Moniker& service) {
    NX_ENTER(loggerServiceAffectsElement);
    const std::string systemName = requireKey(service, "SystemName", "Could not find 'Name' Key in Moniker");
    std::string systemClass;
    findKey(service, "SystemCreationClassName", systemClass);
    IPprotocolEndpoint endpoint;
    endpoint.setFilter(IPprotocolEndpoint::FilterType::BySystemName, systemName);
    if (!endpoint) throw Nx::InstrumentationException("Concerned IP Protocol Endpoint Could Not Be Found.");
    if (systemClass.empty()) endpoint.getSystemCreationClassName(systemClass);
    Nx::Moniker result;
    result.addKey("SystemName", systemName);
    result.addKey("CreationClassName", IPProtocolEndpointClass);
    result.addKey("SystemCreationClassName", systemClass);
    NX_EXIT(loggerServiceAffectsElement);
    return result;
}

Nx::Moniker ServiceAffectsElement::getIPConfigurationServiceMoniker(Nx::Moniker& endpoint) {
    NX_ENTER(loggerServiceAffectsElement);
    const std::string systemName = requireKey(endpoint, "SystemName", "Could not find 'System Name' Key in Moniker");
    std::string systemClass;
    findKey(endpoint, "SystemCreationClassName", systemClass);
    NX_VAR(loggerServiceAffectsElement, "SystemCreationClassName", systemClass.c_str());
    Nx::Moniker result;
    result.addKey("SystemName", systemName);
    NX_EXIT(loggerServiceAffectsElement);
    return result;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
