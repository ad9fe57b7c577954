#include "Lindows/IPHostedService.h"

#include "Lindows/AssociationModel.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerIPHostedService = "Tarvo.IPInterfaceProvider";

IPHostedService::IPHostedService() = default;
IPHostedService::~IPHostedService() = default;

Nx::Moniker IPHostedService::getComputerSystemMoniker(Nx::Moniker& service) {
    return computerSystemMoniker(service, instrumentation);
}

Nx::Moniker IPHostedService::getIPConfigurationServiceMoniker(Nx::Moniker& computer) {
    NX_ENTER(loggerIPHostedService);
    Nx::Moniker result = hostedByComputerMoniker(computer);
    NX_EXIT(loggerIPHostedService);
    return result;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
