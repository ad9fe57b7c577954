#include "CMPI/CMPIIPComputerSystem.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIIPComputerSystem = "Tarvo.IPInterfaceProvider";

CMPIIPComputerSystem::CMPIIPComputerSystem(const CMPIBroker* broker_, const CMPIContext* context_,
                                           std::string nameSpace_)
    : CMPILookupAdapter(broker_, context_, std::move(nameSpace_), loggerCMPIIPComputerSystem, NX_FILE, __func__,
                        "Inside enumeration"),
      findServiceProcessor(false) {}

void CMPIIPComputerSystem::setObjectPath(const CMPIObjectPath* path, bool findServiceProcessor_) {
    const TraceParams params(" objectPath=", path, " findServiceProcessor=", findServiceProcessor_);
    NX_ENTER_PARAMS(loggerCMPIIPComputerSystem, params.c_str());
    findServiceProcessor = findServiceProcessor_;
    enumerate(path);
    if (!findServiceProcessor)
        takeFirst();
    else if (enumeration)
        findSP(enumeration, path);
    NX_EXIT_PARAMS(loggerCMPIIPComputerSystem, params.c_str());
}

// Every element is fetched, also after the match, so the enumeration is always drained; when
// nothing matches the last element fetched stays current.
void CMPIIPComputerSystem::findSP(CMPIEnumeration* systems, const CMPIObjectPath* path) {
    const TraceParams params(" enumeration=", systems, " objectPath=", path);
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

}  // namespace IPInterfaceProvider
}  // namespace Nx
