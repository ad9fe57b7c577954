#include "Lindows/RemoteHostedAccessPoint.h"

#include "Lindows/AssociationModel.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerRemoteHostedAccessPoint = "Tarvo.IPInterfaceProvider";

RemoteHostedAccessPoint::RemoteHostedAccessPoint() = default;
RemoteHostedAccessPoint::~RemoteHostedAccessPoint() = default;

Nx::Moniker RemoteHostedAccessPoint::getSystemMoniker(Nx::Moniker& accessPoint) {
    return computerSystemMoniker(accessPoint, instrumentation);
}

Nx::Moniker RemoteHostedAccessPoint::getRemoteSAPMoniker(Nx::Moniker& computer) {
    NX_ENTER(loggerRemoteHostedAccessPoint);
    Nx::Moniker result = hostedByComputerMoniker(computer);
    NX_EXIT(loggerRemoteHostedAccessPoint);
    return result;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
