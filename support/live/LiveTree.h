// Turns the kernel's state and the host's files into the host model's node tree.
#pragma once

#include <map>
#include <string>
#include <vector>

#include "HostFiles.h"
#include "Netlink.h"
#include "Nx/HostModel.h"

namespace Nx {
namespace Live {

// Node names, and with them the paths: "/system", "/system/<if>" (LAN), "/system/<if>/ip"
// (endpoint) and "/system/sp:BMC/<if>/ip" for the service processor's interfaces. Interface names
// cannot contain ':', so "sp:BMC" never collides with a LAN node.
extern const char* const kSystemName;
extern const char* const kServiceProcessorName;
extern const char* const kEndpointName;

// What the files and the environment say, gathered before the tree is built.
struct HostState {
    std::string hostName;
    ResolverConfig resolver;
    std::map<std::string, std::map<std::string, std::string>> interfaceFiles;  // interface -> its ifcfg file
    std::vector<std::string> bmcInterfaces;            // IPIF_BMC_INTERFACES, in order
};

HostModel::Tree buildTree(const KernelState& kernel, const HostState& host);

// The domain reported for the system: the resolver's "domain", else what follows the first dot
// of the host name, else empty.
std::string domainName(const HostState& host);

}  // namespace Live
}  // namespace Nx
