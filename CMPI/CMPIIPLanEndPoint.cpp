#include "CMPI/CMPIIPLanEndPoint.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIIPLanEndPoint = "Tarvo.IPInterfaceProvider";

CMPIIPLanEndPoint::CMPIIPLanEndPoint(const CMPIBroker* broker_, const CMPIContext* context_, std::string nameSpace_)
    : CMPILookupAdapter(broker_, context_, std::move(nameSpace_), loggerCMPIIPLanEndPoint, NX_FILE, __func__) {}

void CMPIIPLanEndPoint::setSingleObjectPath(const CMPIObjectPath* path) {
    const TraceParams params(" objectPath=", path);
    NX_ENTER_PARAMS(loggerCMPIIPLanEndPoint, params.c_str());
    CMPIStatus rc = {CMPI_RC_OK, nullptr};
    CMPIInstance* found = broker ? CBGetInstance(broker, context, path, nullptr, &rc) : nullptr;
    if (!broker || rc.rc != CMPI_RC_OK || !found) throw Nx::ProviderException(lookupFailed);
    instance = found;
    initialLoad = true;
    NX_EXIT_PARAMS(loggerCMPIIPLanEndPoint, params.c_str());
}

void CMPIIPLanEndPoint::setObjectPath(const CMPIObjectPath* path) {
    const TraceParams params(" objectPath=", path);
    NX_ENTER_PARAMS(loggerCMPIIPLanEndPoint, params.c_str());
    enumerate(path);
    takeFirst();
    NX_EXIT_PARAMS(loggerCMPIIPLanEndPoint, params.c_str());
}

// Looks at the initial-load flag only: one element per lookup.
CMPIIPLanEndPoint::operator bool() {
    NX_ENTER(loggerCMPIIPLanEndPoint);
    const bool current = initialLoad;
    initialLoad = false;
    NX_EXIT(loggerCMPIIPLanEndPoint);
    return current;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
