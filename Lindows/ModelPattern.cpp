#include "Lindows/ModelPattern.h"

#include <unistd.h>

namespace Nx {
namespace IPInterfaceProvider {

bool isUnderServiceProcessor(const Nx::Instrumentation& cursor) {
    // A copy shares the cursor's picture, so walking it upwards leaves the caller's position alone.
    Nx::Instrumentation probe(cursor);
    if (!probe.selectParent() || !probe.selectParent()) return false;
    return probe.getNodeDescription() == "BMC";
}

namespace {

bool systemHostName(std::string& name) {
    char buffer[256] = {};
    if (::gethostname(buffer, sizeof buffer) != 0) return false;
    buffer[sizeof buffer - 1] = '\0';  // a truncated name need not be terminated
    name = buffer;
    return true;
}

// The outermost scope of this thread's request. A plain pointer: a thread_local with a destructor
// would keep the provider library from ever being unloaded.
thread_local RequestScope* currentRequest = nullptr;

}  // namespace

RequestScope::RequestScope() : outer_(currentRequest) {
    if (!outer_) currentRequest = this;
}

RequestScope::~RequestScope() {
    if (!outer_) currentRequest = nullptr;
}

void RequestScope::hostNameChanged() {
    if (currentRequest) currentRequest->asked_ = false;
}

bool localHostName(std::string& name) {
    RequestScope* request = currentRequest;
    if (!request) return systemHostName(name);
    if (!request->asked_) {
        request->known_ = systemHostName(request->hostName_);
        request->asked_ = true;
    }
    if (request->known_) name = request->hostName_;
    return request->known_;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
