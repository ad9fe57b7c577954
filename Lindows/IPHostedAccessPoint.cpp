#include "Lindows/IPHostedAccessPoint.h"

#include "Lindows/AssociationModel.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerIPHostedAccessPoint = "Tarvo.IPInterfaceProvider";

IPHostedAccessPoint::IPHostedAccessPoint() = default;
IPHostedAccessPoint::~IPHostedAccessPoint() = default;

Nx::Moniker IPHostedAccessPoint::getComputerSystemMoniker(Nx::Moniker& endpoint) {
    return computerSystemMoniker(endpoint, instrumentation);
}

Nx::Moniker IPHostedAccessPoint::getIPProtocolEndPointMoniker(Nx::Moniker& computer) {
    NX_ENTER(loggerIPHostedAccessPoint);
    const std::string name = requireKey(computer, "Name", "Could not find 'Name' key in Moniker");
    std::string creationClass;
    findKey(computer, "CreationClassName", creationClass);
    // The service processor is a computer system too; its endpoints name it "BMC:-1".
    if (creationClass == SPComputerSystemClass) {
        if (name != ServiceProcessorName)
            throw Nx::FrameworkException("'SystemCreationClasName'  is not BMC in Moniker");
    } else {
        requireHostComputer(name);
    }
    Nx::Moniker result;
    result.addKey("SystemCreationClassName",
                  creationClass == SPComputerSystemClass ? SPComputerSystemClass : ComputerSystemClass);
    result.addKey("CreationClassName", IPProtocolEndpointClass);
    result.addKey("SystemName", name);
    NX_EXIT(loggerIPHostedAccessPoint);
    return result;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
