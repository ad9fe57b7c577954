#include "Lindows/IPElementCapabilities.h"

#include "Lindows/AssociationModel.h"
#include "Lindows/IPEnabledLogicalElementCapabilities.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerIPElementCapabilities = "Tarvo.IPInterfaceProvider";

IPElementCapabilities::IPElementCapabilities() = default;
IPElementCapabilities::~IPElementCapabilities() = default;

Nx::Moniker IPElementCapabilities::getIPMoniker(Nx::Moniker& capabilities) {
    NX_ENTER(loggerIPElementCapabilities);
    const std::string name = requireKey(capabilities, "InstanceID", "Could not find 'InstanceID' Key in Moniker");
    IPprotocolEndpoint endpoint;
    if (!findEndpoint(endpoint, name, nullptr))
        throw Nx::FrameworkException("Could not get 'System Name' and  'Name' key");
    Nx::Moniker result;
    addEndpointKeys(result, endpoint);
    NX_EXIT(loggerIPElementCapabilities);
    return result;
}

Nx::Moniker IPElementCapabilities::getCapabilitiesMoniker(Nx::Moniker& endpoint) {
    NX_ENTER(loggerIPElementCapabilities);
    std::string name;
    if (!findKey(endpoint, "Name", name) || name.empty())
        throw Nx::FrameworkException("Name Property value is not correct");
    IPEnabledLogicalElementCapabilities capabilities;
    capabilities.setFilter(IPEnabledLogicalElementCapabilities::FilterType::ByInstanceID, name);
    std::string instanceId;
    if (!capabilities || !capabilities.getInstanceID(instanceId))
        throw Nx::InstrumentationException("Concerned IPEnabledLogicalElementCapabilities Could Not Be Found.");
    Nx::Moniker result;
    result.addKey("InstanceID", instanceId);
    NX_EXIT(loggerIPElementCapabilities);
    return result;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
