#include "Lindows/SPHostedAccessPoint.h"

#include "Lindows/AssociationModel.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerSPHostedAccessPoint = "Tarvo.IPInterfaceProvider";

SPHostedAccessPoint::SPHostedAccessPoint() = default;
SPHostedAccessPoint::~SPHostedAccessPoint() = default;

Nx::Moniker SPHostedAccessPoint::getIPProtocolEndPointMoniker(Nx::Moniker& serviceProcessor) {
    NX_ENTER(loggerSPHostedAccessPoint);
    const std::string name = requireKey(serviceProcessor, "Name", "Could not find 'Name' key in Moniker");
    if (name != ServiceProcessorName)
        throw Nx::FrameworkException("Could not match 'System Name' key with 'Name' key in Computer Moniker");
    Nx::Moniker result;
    result.addKey("SystemCreationClassName", SPComputerSystemClass);
    result.addKey("SystemName", name);
    NX_EXIT(loggerSPHostedAccessPoint);
    return result;
}

Nx::Moniker SPHostedAccessPoint::getSPMoniker(Nx::Moniker& endpoint) {
    NX_ENTER(loggerSPHostedAccessPoint);
    std::string systemClass, systemName;
    findKey(endpoint, "SystemCreationClassName", systemClass);
    if (systemClass != SPComputerSystemClass)
        throw Nx::FrameworkException("'SystemCreationClasName'  is not BMC in Moniker");
    findKey(endpoint, "SystemName", systemName);
    const std::string name = ServiceProcessorName;
    if (systemName != name)
        throw Nx::FrameworkException("Could not match 'Name' key with 'System Name' key in SP Moniker");
    Nx::Moniker result;
    result.addKey("Name", name);
    NX_EXIT(loggerSPHostedAccessPoint);
    return result;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
