#include "DefaultPaths.h"

#include <unistd.h>

#include <cstdlib>

// Relative to the program's directory; set by the build from the install layout.
#ifndef IPIF_RELATIVE_DATA_DIR
#define IPIF_RELATIVE_DATA_DIR "../share/ipif"
#endif
#ifndef IPIF_RELATIVE_PROVIDER_DIR
#define IPIF_RELATIVE_PROVIDER_DIR "../lib/cmpi"
#endif

namespace ipif {
namespace detail {

namespace {

// The directory of the running program with a trailing '/', or "" when it cannot be read.
std::string programDir() {
    std::string buf(4096, '\0');
    ssize_t n = readlink("/proc/self/exe", &buf[0], buf.size());
    if (n <= 0 || static_cast<std::size_t>(n) >= buf.size()) return "";
    buf.resize(static_cast<std::size_t>(n));
    return buf.substr(0, buf.rfind('/') + 1);
}

}  // namespace

std::string defaultDataDir() {
    const char* env = std::getenv("IPIF_SHARE_DIR");
    if (env && *env) return env;
    return programDir() + IPIF_RELATIVE_DATA_DIR;
}

std::vector<std::string> defaultMofPaths() {
    std::string dir = defaultDataDir();
    return {dir + "/embedded", dir};
}

std::string defaultProviderDir() { return programDir() + IPIF_RELATIVE_PROVIDER_DIR; }

}  // namespace detail
}  // namespace ipif
