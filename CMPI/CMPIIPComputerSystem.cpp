#include "CMPI/CMPIIPComputerSystem.h"

#include <cmpift.h>
#include <cmpimacs.h>

#include "CMPI/CMPIAdapter.h"
#include "Nx/Exceptions.h"
#include "Nx/ProviderUtilities.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIIPComputerSystem = "Tarvo.IPInterfaceProvider";

namespace {

// The instance an enumeration element carries; null when the fetch failed or it is no instance.
CMPIInstance* instanceOf(const CMPIData& data, const CMPIStatus& rc) {
    if (rc.rc != CMPI_RC_OK || data.type != CMPI_instance || (data.state & CMPI_nullValue)) return nullptr;
    return data.value.inst;
}

}  // namespace

CMPIIPComputerSystem::CMPIIPComputerSystem(const CMPIBroker* broker_, const CMPIContext* context_,
                                           std::string nameSpace_)
    : broker(broker_),
      context(context_),
      nameSpace(std::move(nameSpace_)),
      instance(nullptr),
      enumeration(nullptr),
      initialLoad(false),
      findServiceProcessor(false) {
    const std::string params = parameterList(" _broker=", broker, " _context=", context, " _namespace=", nameSpace);
    NX_ENTER_PARAMS(loggerCMPIIPComputerSystem, params.c_str());
    NX_EXIT_PARAMS(loggerCMPIIPComputerSystem, params.c_str());
}

void CMPIIPComputerSystem::setObjectPath(const CMPIObjectPath* path, bool findServiceProcessor_) {
    const std::string params = parameterList(" objectPath=", path, " findServiceProcessor=", findServiceProcessor_);
    NX_ENTER_PARAMS(loggerCMPIIPComputerSystem, params.c_str());
    findServiceProcessor = findServiceProcessor_;
    CMPIStatus rc = {CMPI_RC_OK, nullptr};
    enumeration = broker ? CBEnumInstances(broker, context, path, nullptr, &rc) : nullptr;
    if (!broker || rc.rc != CMPI_RC_OK) throw Nx::ProviderException("Could not obtain an instance of Computer System");
    if (!findServiceProcessor) {
        if (enumeration && CMHasNext(enumeration, nullptr)) {
            CMPIStatus next = {CMPI_RC_OK, nullptr};
            CMPIData data = CMGetNext(enumeration, &next);
            if (CMPIInstance* first = instanceOf(data, next)) {
                instance = first;
                initialLoad = true;
            }
        }
    } else if (enumeration) {
        findSP(enumeration, path);
    }
    NX_EXIT_PARAMS(loggerCMPIIPComputerSystem, params.c_str());
}

// Every element is fetched, also after the match, so the enumeration is always drained; when
// nothing matches the last element fetched stays current.
void CMPIIPComputerSystem::findSP(CMPIEnumeration* systems, const CMPIObjectPath* path) {
    const std::string params = parameterList(" enumeration=", systems, " objectPath=", path);
    NX_ENTER_PARAMS(loggerCMPIIPComputerSystem, params.c_str());
    std::string wanted;
    ProviderUtilities::getKeyProperty(path, "Name", wanted);
    NX_VAR(loggerCMPIIPComputerSystem, "Name", wanted.c_str());
    findServiceProcessor = false;
    bool found = false;
    while (CMHasNext(systems, nullptr)) {
        CMPIStatus next = {CMPI_RC_OK, nullptr};
        CMPIData data = CMGetNext(systems, &next);
        CMPIInstance* system = instanceOf(data, next);
        if (!system || found) continue;
        instance = system;
        std::string name;
        ProviderUtilities::getProperty(instance, "Name", name, false);
        if (name.size() == wanted.size() && name == wanted) found = true;
    }
    NX_EXIT_PARAMS(loggerCMPIIPComputerSystem, params.c_str());
}

CMPIIPComputerSystem::operator bool() {
    NX_ENTER(loggerCMPIIPComputerSystem);
    bool current = false;
    if (initialLoad) {
        initialLoad = false;
        NX_MESSAGE(loggerCMPIIPComputerSystem, 3000, "Inside IntialLoad");
        current = true;
    } else if (enumeration && instance && instance->hdl) {
        NX_MESSAGE(loggerCMPIIPComputerSystem, 3000, "Inside enumeration");
        current = true;
    }
    NX_EXIT(loggerCMPIIPComputerSystem);
    return current;
}

void CMPIIPComputerSystem::operator++() {
    NX_ENTER(loggerCMPIIPComputerSystem);
    instance = nullptr;
    if (enumeration) {
        CMPIStatus next = {CMPI_RC_OK, nullptr};
        CMPIData data = CMGetNext(enumeration, &next);
        instance = instanceOf(data, next);
        NX_MESSAGE(loggerCMPIIPComputerSystem, 3000, "Inside enumeration");
    }
    NX_EXIT(loggerCMPIIPComputerSystem);
}

CMPIObjectPath* CMPIIPComputerSystem::getObjectPath() {
    NX_ENTER(loggerCMPIIPComputerSystem);
    CMPIObjectPath* path = nullptr;
    if (instance) {
        CMPIStatus rc = {CMPI_RC_OK, nullptr};
        path = CMGetObjectPath(instance, &rc);
        if (rc.rc != CMPI_RC_OK) path = nullptr;
    }
    NX_EXIT(loggerCMPIIPComputerSystem);
    return path;
}

CMPIInstance* CMPIIPComputerSystem::getCMPIInstance(const char** properties) {
    const std::string params = parameterList(" properties=", properties);
    NX_ENTER_PARAMS(loggerCMPIIPComputerSystem, params.c_str());
    NX_EXIT_PARAMS(loggerCMPIIPComputerSystem, params.c_str());
    return instance;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
