#include "Lindows/ModelPattern.h"

#include <unistd.h>

namespace Nx {
namespace IPInterfaceProvider {

bool isUnderServiceProcessor(const Nx::Instrumentation& cursor) {
    // A copy shares the host model, so walking it upwards leaves the caller's position alone.
    Nx::Instrumentation probe(cursor);
    if (!probe.selectNode(cursor.getPathToParentNode())) return false;
    if (!probe.selectNode(probe.getPathToParentNode())) return false;
    return probe.getNodeDescription() == "BMC";
}

bool localHostName(std::string& name) {
    char buffer[256] = {};
    if (::gethostname(buffer, sizeof buffer) != 0) return false;
    buffer[sizeof buffer - 1] = '\0';  // a truncated name need not be terminated
    name = buffer;
    return true;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
