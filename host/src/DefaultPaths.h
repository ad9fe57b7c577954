// Where the host looks when neither HostOptions nor the environment name its MOF, registration
// and provider locations: beside the running program, at the same relative places as in the
// installed tree (the build tree mirrors them), so an installed tree works wherever it is put.
#pragma once

#include <string>
#include <vector>

namespace ipif {
namespace detail {

// IPIF_SHARE_DIR if set, else <program dir>/<relative data dir>: the KVRNX_ MOF and the .reg
// files, with the embedded host's DMTF stand-ins in its embedded/ sub-directory.
std::string defaultDataDir();
// defaultDataDir()/embedded, then defaultDataDir().
std::vector<std::string> defaultMofPaths();
// <program dir>/<relative provider dir>.
std::string defaultProviderDir();

}  // namespace detail
}  // namespace ipif
