#include "CMPI/CMPIIPLanEndPoint.h"

#include <cmpift.h>
#include <cmpimacs.h>

#include "CMPI/CMPIAdapter.h"
#include "Nx/Exceptions.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIIPLanEndPoint = "Tarvo.IPInterfaceProvider";

namespace {

CMPIInstance* instanceOf(const CMPIData& data, const CMPIStatus& rc) {
    if (rc.rc != CMPI_RC_OK || data.type != CMPI_instance || (data.state & CMPI_nullValue)) return nullptr;
    return data.value.inst;
}

// The same text as the computer system lookup: callers match on it.
const char* const kLookupFailed = "Could not obtain an instance of Computer System";

}  // namespace

CMPIIPLanEndPoint::CMPIIPLanEndPoint(const CMPIBroker* broker_, const CMPIContext* context_, std::string nameSpace_)
    : broker(broker_),
      context(context_),
      nameSpace(std::move(nameSpace_)),
      instance(nullptr),
      enumeration(nullptr),
      initialLoad(false) {
    const std::string params = parameterList(" _broker=", broker, " _context=", context, " _namespace=", nameSpace);
    NX_ENTER_PARAMS(loggerCMPIIPLanEndPoint, params.c_str());
    NX_EXIT_PARAMS(loggerCMPIIPLanEndPoint, params.c_str());
}

void CMPIIPLanEndPoint::setSingleObjectPath(const CMPIObjectPath* path) {
    const std::string params = parameterList(" objectPath=", path);
    NX_ENTER_PARAMS(loggerCMPIIPLanEndPoint, params.c_str());
    CMPIStatus rc = {CMPI_RC_OK, nullptr};
    CMPIInstance* found = broker ? CBGetInstance(broker, context, path, nullptr, &rc) : nullptr;
    if (!broker || rc.rc != CMPI_RC_OK || !found) throw Nx::ProviderException(kLookupFailed);
    instance = found;
    initialLoad = true;
    NX_EXIT_PARAMS(loggerCMPIIPLanEndPoint, params.c_str());
}

void CMPIIPLanEndPoint::setObjectPath(const CMPIObjectPath* path) {
    const std::string params = parameterList(" objectPath=", path);
    NX_ENTER_PARAMS(loggerCMPIIPLanEndPoint, params.c_str());
    CMPIStatus rc = {CMPI_RC_OK, nullptr};
    enumeration = broker ? CBEnumInstances(broker, context, path, nullptr, &rc) : nullptr;
    if (!broker || rc.rc != CMPI_RC_OK) throw Nx::ProviderException(kLookupFailed);
    if (enumeration && CMHasNext(enumeration, nullptr)) {
        CMPIStatus next = {CMPI_RC_OK, nullptr};
        CMPIData data = CMGetNext(enumeration, &next);
        if (CMPIInstance* first = instanceOf(data, next)) {
            instance = first;
            initialLoad = true;
        }
    }
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

void CMPIIPLanEndPoint::operator++() {
    NX_ENTER(loggerCMPIIPLanEndPoint);
    instance = nullptr;
    if (enumeration) {
        CMPIStatus next = {CMPI_RC_OK, nullptr};
        CMPIData data = CMGetNext(enumeration, &next);
        instance = instanceOf(data, next);
    }
    NX_EXIT(loggerCMPIIPLanEndPoint);
}

CMPIObjectPath* CMPIIPLanEndPoint::getObjectPath() {
    NX_ENTER(loggerCMPIIPLanEndPoint);
    CMPIObjectPath* path = nullptr;
    if (instance) {
        CMPIStatus rc = {CMPI_RC_OK, nullptr};
        path = CMGetObjectPath(instance, &rc);
        if (rc.rc != CMPI_RC_OK) path = nullptr;
    }
    NX_EXIT(loggerCMPIIPLanEndPoint);
    return path;
}

CMPIInstance* CMPIIPLanEndPoint::getCMPIInstance(const char** properties) {
    const std::string params = parameterList(" properties=", properties);
    NX_ENTER_PARAMS(loggerCMPIIPLanEndPoint, params.c_str());
    NX_EXIT_PARAMS(loggerCMPIIPLanEndPoint, params.c_str());
    return instance;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
