// The live backend: one cached picture of the host, rebuilt from three kernel dumps and the
// configuration files only when something changed, so that a request over N interfaces costs a
// bounded number of dumps however large N is. What counts as a change: a netlink notification
// (links, addresses, routes of either family), a changed stat() of the ifcfg directory, of a file
// in it or of the resolver configuration, a new host name, another IPIF_ROOT,
// IPIF_DATA_DIR or IPIF_BMC_INTERFACES, and our own writes. Change checks happen when a snapshot
// is asked for; no thread runs in the background.
#include "Nx/LiveBackend.h"

#include <climits>
#include <cstdlib>
#include <linux/rtnetlink.h>
#include <mutex>
#include <unistd.h>

#include "HostFiles.h"
#include "LiveTree.h"
#include "Netlink.h"
#include "Nx/File.h"
#include "Nx/NodeLexicon.h"
#include "Nx/PlatformUtilities.h"
#include "Nx/PropertyFile.h"

namespace Nx {
namespace HostModel {

namespace {

namespace P = NodeLexicon;
using Live::HostState;

std::string withoutTrailingSlash(std::string path) {
    while (path.size() > 1 && path.back() == '/') path.pop_back();
    return path;
}

std::string parentOf(const std::string& path) {
    const std::size_t slash = path.find_last_of('/');
    if (slash == std::string::npos) return ".";
    return slash == 0 ? "/" : path.substr(0, slash);
}

std::string currentHostName() {
    char name[HOST_NAME_MAX + 1] = {};
    if (::gethostname(name, sizeof name - 1) != 0) return std::string();
    return name;
}

std::vector<std::string> bmcInterfaces(const std::string& setting) {
    std::vector<std::string> names;
    std::size_t start = 0;
    while (start <= setting.size()) {
        std::size_t end = setting.find(',', start);
        if (end == std::string::npos) end = setting.size();
        std::string name = setting.substr(start, end - start);
        const std::size_t first = name.find_first_not_of(" \t");
        const std::size_t last = name.find_last_not_of(" \t");
        name = first == std::string::npos ? std::string() : name.substr(first, last - first + 1);
        bool seen = name.empty();
        for (const std::string& known : names) seen = seen || known == name;
        if (!seen) names.push_back(name);
        start = end + 1;
    }
    return names;
}

// Letters, digits, '-' and '.', at most HOST_NAME_MAX characters.
bool isHostName(const std::string& name) {
    if (name.empty() || name.size() > HOST_NAME_MAX) return false;
    for (const char c : name) {
        const bool alnum = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9');
        if (!alnum && c != '-' && c != '.') return false;
    }
    return true;
}

bool isDecimal(const std::string& text, unsigned int maximum) {
    if (text.empty() || text.size() > 3) return false;
    for (const char c : text) {
        if (c < '0' || c > '9') return false;
    }
    return std::stoul(text) <= maximum;
}

const PropertyValue* findProperty(const Node& node, unsigned int property) {
    const auto found = node.properties.find(property);
    return found == node.properties.end() ? nullptr : &found->second;
}

std::string text(const Node& node, unsigned int property) {
    const PropertyValue* value = findProperty(node, property);
    return value ? value->text : std::string();
}

class LiveBackend : public Backend {
public:
    LiveBackend()
        : events_(RTMGRP_LINK | RTMGRP_IPV4_IFADDR | RTMGRP_IPV6_IFADDR | RTMGRP_IPV4_ROUTE | RTMGRP_IPV6_ROUTE) {}

    std::shared_ptr<const Tree> snapshot() override {
        std::lock_guard<std::mutex> lock(mutex_);
        return current();
    }

    bool write(const std::string& nodePath, unsigned int property, const PropertyValue& value) override {
        std::lock_guard<std::mutex> lock(mutex_);
        const std::shared_ptr<const Tree> tree = current();
        const int index = tree->find(nodePath);
        if (index < 0) return false;
        const Node* node = &tree->nodes[static_cast<size_t>(index)];
        const PropertyValue* known = findProperty(*node, property);
        if (!known || known->readOnly || known->kind != value.kind || !isSafe(value)) return false;

        bool done = false;
        if (node->type == P::SystemNode) {
            done = writeSystem(property, value);
        } else if (node->type == P::IPEndpointNode) {
            done = property == P::AdminState ? writeLinkState(text(*node, P::ElementName), value.number)
                                             : writeInterfaceFile(*node, property, value);
        }
        tree_.reset();
        return done;
    }

    std::string describe() const override { return "live"; }

private:
    static bool isSafe(const PropertyValue& value) {
        if (!isPlainValue(value.text)) return false;
        for (const std::string& item : value.list) {
            if (item.empty() || !isPlainValue(item)) return false;
        }
        return true;
    }

    struct Paths {
        std::string dataDirectory;  // without the trailing '/'
        std::string resolver;
        std::string hostNameFile;
        std::string bmcSetting;
        bool operator==(const Paths& o) const {
            return dataDirectory == o.dataDirectory && resolver == o.resolver && hostNameFile == o.hostNameFile &&
                   bmcSetting == o.bmcSetting;
        }
    };

    static Paths paths() {
        Paths p;
        p.dataDirectory = withoutTrailingSlash(PlatformUtilities::getMerrowDataDir());
        p.resolver = PlatformUtilities::hostPath("/etc/resolv.conf");
        p.hostNameFile = PlatformUtilities::hostPath("/etc/hostname");
        const char* bmc = std::getenv("IPIF_BMC_INTERFACES");
        p.bmcSetting = bmc ? bmc : "";
        return p;
    }

    // The picture, rebuilt first when anything changed. Caller holds mutex_.
    std::shared_ptr<const Tree> current() {
        const Paths now = paths();
        const std::string hostName = currentHostName();
        const bool changed = !tree_ || !(now == paths_) || hostName != hostName_ || events_.drainNotifications() ||
                             files_.changed();
        if (changed) rebuild(now, hostName);
        return tree_;
    }

    void rebuild(const Paths& now, const std::string& hostName) {
        tree_.reset();  // stays empty if the rebuild throws, so the next call tries again
        paths_ = now;
        hostName_ = hostName;
        // Watch first, read afterwards: a change that races with the reading forces another rebuild.
        files_.watch({now.dataDirectory}, {now.resolver});
        events_.drainNotifications();

        const Live::KernelState kernel = requests_.readState();
        HostState host;
        host.hostName = hostName;
        std::string resolver;
        if (File::read(now.resolver, resolver)) host.resolver = Live::parseResolver(resolver);
        host.interfaceFiles = Live::readInterfaceFiles(now.dataDirectory);
        host.bmcInterfaces = bmcInterfaces(now.bmcSetting);
        tree_ = std::make_shared<const Tree>(Live::buildTree(kernel, host));
    }

    bool writeSystem(unsigned int property, const PropertyValue& value) {
        switch (property) {
        case P::HostName: {
            if (!isHostName(value.text) || ::sethostname(value.text.c_str(), value.text.size()) != 0) return false;
            const std::string file = PlatformUtilities::hostPath("/etc/hostname");
            Live::makeDirectories(parentOf(file));
            return File::update(file, [&](std::string& content, bool) {
                content = value.text + "\n";
                return true;
            });
        }
        case P::DomainName:
        case P::DNSServers:
        case P::DNSSuffixes: {
            const std::string file = PlatformUtilities::hostPath("/etc/resolv.conf");
            Live::makeDirectories(parentOf(file));
            return File::update(file, [&](std::string& content, bool) {
                Live::ResolverConfig config = Live::parseResolver(content);
                if (property == P::DomainName) config.domain = value.text;
                else if (property == P::DNSServers) config.nameServers = value.list;
                else config.search = value.list;
                content = Live::rewriteResolver(content, config);
                return true;
            });
        }
        case P::AdminState:
            return value.number == 9 && PlatformUtilities::requestReboot();
        default:
            return false;
        }
    }

    bool writeLinkState(const std::string& name, unsigned int state) {
        switch (state) {
        case 1: return requests_.setLinkUp(name, true) == 0;
        case 12: return requests_.setLinkUp(name, false) == 0;
        case 9: return requests_.setLinkUp(name, false) == 0 && requests_.setLinkUp(name, true) == 0;
        default: return false;
        }
    }

    // The keys the network start-up scripts read, in the interface's ifcfg file. The IPv6 address
    // and its prefix go to IPV6ADDR and PREFIX, the keys the static setting data reads, and read
    // back as written (LiveTree.cpp).
    bool writeInterfaceFile(const Node& node, unsigned int property, const PropertyValue& value) {
        const std::string name = text(node, P::ElementName);
        std::string device;
        if (!quoteValue(name, device)) return false;  // the file could not name its interface
        std::string key;
        std::string setting = value.text;
        std::string slashPrefix;  // the "/n" of an address given with its prefix
        switch (property) {
        case P::AddressOrigin:
            if (value.number != 1 && value.number != 3) return false;
            key = "BOOTPROTO";
            setting = value.number == 1 ? "dhcp" : "static";
            break;
        case P::IPv4Address: key = "IPADDR"; break;
        case P::SubnetMask: key = "NETMASK"; break;
        case P::IPv4Gateway: key = "GATEWAY"; break;
        case P::IPv6Gateway: key = "IPV6_DEFAULTGW"; break;
        case P::IPv6Address: {
            key = "IPV6ADDR";
            const std::size_t slash = setting.find('/');
            if (slash != std::string::npos) {
                slashPrefix = setting.substr(slash + 1);
                if (!isDecimal(slashPrefix, 128)) return false;
            }
            break;
        }
        case P::PrefixLength:
            if (value.number > 128) return false;
            key = "PREFIX";
            setting = std::to_string(value.number);
            break;
        default:
            return false;
        }
        const std::string directory = PlatformUtilities::getMerrowDataDir();
        if (!Live::makeDirectories(withoutTrailingSlash(directory))) return false;
        bool applied = false;
        const bool written = File::update(directory + "ifcfg-" + name, [&](std::string& content, bool exists) {
            if (!exists) content = "DEVICE=" + device + "\n";
            std::map<std::string, std::string> values = Live::parseAssignments(content);
            // Without IPV6INIT=yes the start-up scripts ignore the address. An address keeps the
            // file's prefix (or brings its own); a prefix needs an address to belong to.
            if (property == P::IPv6Address && setting.empty()) {
                content = Live::assign(content, "PREFIX", "");
            } else if (property == P::IPv6Address) {
                content = Live::assign(content, "IPV6INIT", "yes");
                content = Live::assign(content, "IPV6ADDR", setting);
                if (!slashPrefix.empty() || values["PREFIX"].empty()) {
                    const PropertyValue* known = findProperty(node, P::PrefixLength);
                    std::string prefix = slashPrefix;
                    if (prefix.empty() && known && known->number > 0) prefix = std::to_string(known->number);
                    content = Live::assign(content, "PREFIX", prefix.empty() ? std::string("64") : prefix);
                }
            } else if (property == P::PrefixLength && values["IPV6ADDR"].empty()) {
                const std::string address = text(node, P::IPv6Address);  // the kernel's: the file has none
                if (address.empty() || !isPlainValue(address)) return false;
                content = Live::assign(content, "IPV6INIT", "yes");
                content = Live::assign(content, "IPV6ADDR", address);
            }
            content = Live::assign(content, key, setting);
            applied = true;
            return true;
        });
        return written && applied;
    }

    std::mutex mutex_;
    Live::NetlinkSocket requests_;
    Live::NetlinkSocket events_;
    Live::ChangeWatch files_;
    std::shared_ptr<const Tree> tree_;
    Paths paths_;
    std::string hostName_;
};

}  // namespace

std::shared_ptr<Backend> openLiveBackend() {
    return std::make_shared<LiveBackend>();
}

}  // namespace HostModel
}  // namespace Nx
