// The node properties of the live host, in one table. "Written" says what a write does
// (LiveBackend.cpp); ifcfg keys go to <data dir>/ifcfg-<interface>, resolver lines to
// $IPIF_ROOT/etc/resolv.conf.
//
// Node          Prop Kind Read from                                        Written
// system (40)    97  S    gethostname()                                    sethostname, etc/hostname
//                98  S    resolv.conf "domain", else the host name after   resolv.conf "domain"
//                         its first dot, else empty
//                94  L    resolv.conf "nameserver" lines                   resolv.conf "nameserver"
//                99  L    resolv.conf last "search" line                   resolv.conf "search"
//               123  U    1                                                9 asks for a reboot
// LAN (12)      108  S    interface name                                   -
// endpoint (29) 108  S    interface name                                   -
//                24  U    ifcfg BOOTPROTO: dhcp/bootp 1, static/none 3;    BOOTPROTO: 1 dhcp, 3 static
//                         without one, the primary address (IPv4, else
//                         IPv6): IFA_F_PERMANENT 3, limited lifetime 1;
//                         no address 0
//                25  S    primary IPv4 address: the first not flagged      IPADDR
//                         IFA_F_SECONDARY
//                26  S    its mask, dotted                                 NETMASK
//                27  S    the ifcfg file's IPV6ADDR as it stands, when     IPV6ADDR=<the value as given>,
//                         it has one; else the primary IPv6 address:       IPV6INIT=yes, and PREFIX when
//                         global scope before site scope, stable before    the file has none (the value's
//                         temporary, deprecated or tentative; link-local   "/n", else 102, else 64);
//                         never                                            empty removes IPV6ADDR, PREFIX
//               102  U    with the file's IPV6ADDR: its PREFIX (leading    PREFIX=<n>, and IPV6ADDR from
//                         digits, 0 without any); else the kernel's        27 when the file has none
//                         prefix of 27 (0 without one). IPv6 only; the
//                         IPv4 prefix is the mask (26)
//                28  U    type of 27: 2 global unicast (2000::/3),         -
//                         4 site-local (fec0::/10), 1 other (unique
//                         local, ...), 0 no address
//                96  U    families the kernel has an address of (IPv4:     -
//                         25; IPv6: its primary address): 1 IPv4, 2 IPv6,
//                         3 both, 0 none
//                47  U    the same as 4096, 4097, 4098 (0 none)            -
//               100  S    gateway of the lowest-metric IPv4 default route  GATEWAY
//                         of the main table leaving through the interface
//               101  S    the same for IPv6                                IPV6_DEFAULTGW
//               123  U    IFF_UP: 1 up, 12 down                            1 up, 12 down, 9 down then up,
//                                                                          on the kernel at once
// Every endpoint carries every property; what the host lacks reads as "" or 0.
// ifcfg writes are configuration for the interface's next start: the kernel keeps its values until
// then (123 alone acts at once), and so does the node, except 27 and 102: they read back from the
// file what was written there, as the static setting data does (IPV6ADDR and PREFIX), so that a
// setting applied twice is the same setting. 28 is the type of 27; 96 and 47 are the kernel's.
// A new ifcfg file starts with DEVICE=<interface>, the name quoted as Nx::quoteValue says
// (Nx/PropertyFile.h). An empty value removes the key. Values must be plain (isPlainValue).
#include "LiveTree.h"

#include <arpa/inet.h>
#include <linux/if_addr.h>
#include <linux/rtnetlink.h>
#include <net/if.h>
#include <net/if_arp.h>
#include <unordered_map>

#include "Nx/NodeLexicon.h"
#include "Nx/String.h"

namespace Nx {
namespace Live {

const char* const kSystemName = "system";
const char* const kServiceProcessorName = "sp:BMC";
const char* const kEndpointName = "ip";

namespace {

using HostModel::PropertyValue;
namespace P = NodeLexicon;

struct Interface {
    const KernelLink* link = nullptr;
    const KernelAddress* ipv4 = nullptr;
    const KernelAddress* ipv6 = nullptr;
    int ipv6Rank = 0;
    const KernelRoute* gateway4 = nullptr;
    const KernelRoute* gateway6 = nullptr;
};

// Lower is better; -1 for addresses that are never the primary IPv6 address.
int ipv6Rank(const KernelAddress& address) {
    int rank = 0;
    if (address.scope == RT_SCOPE_SITE) rank += 8;
    else if (address.scope != RT_SCOPE_UNIVERSE) return -1;
    if (address.flags & (IFA_F_TENTATIVE | IFA_F_DADFAILED)) rank += 4;
    if (address.flags & IFA_F_DEPRECATED) rank += 2;
    if (address.flags & IFA_F_TEMPORARY) rank += 1;
    return rank;
}

unsigned int ipv6Type(const std::string& text) {
    in6_addr address{};
    if (inet_pton(AF_INET6, text.substr(0, text.find('/')).c_str(), &address) != 1) return 0;
    const unsigned char first = address.s6_addr[0];
    if ((first & 0xe0) == 0x20) return 2;                                    // 2000::/3
    if (first == 0xfe && (address.s6_addr[1] & 0xc0) == 0xc0) return 4;      // fec0::/10
    if (first == 0xfe && (address.s6_addr[1] & 0xc0) == 0x80) return 3;      // fe80::/10
    return 1;
}

std::string maskText(unsigned int prefix) {
    const std::uint32_t mask = prefix == 0 ? 0 : 0xffffffffu << (32 - (prefix > 32 ? 32 : prefix));
    const unsigned char bytes[4] = {static_cast<unsigned char>(mask >> 24), static_cast<unsigned char>(mask >> 16),
                                    static_cast<unsigned char>(mask >> 8), static_cast<unsigned char>(mask)};
    return ipv4Text(bytes);
}

// The key's value in the interface's ifcfg file, empty when either is missing.
std::string fileValue(const HostState& host, const std::string& name, const std::string& key) {
    const auto file = host.interfaceFiles.find(name);
    if (file == host.interfaceFiles.end()) return std::string();
    const auto found = file->second.find(key);
    return found == file->second.end() ? std::string() : found->second;
}

unsigned int originOf(const Interface& i, const HostState& host) {
    const std::string protocol = fileValue(host, i.link->name, "BOOTPROTO");
    if (protocol == "dhcp" || protocol == "bootp") return 1;
    if (protocol == "static" || protocol == "none") return 3;
    const KernelAddress* primary = i.ipv4 ? i.ipv4 : i.ipv6;
    if (!primary) return 0;
    return (primary->flags & IFA_F_PERMANENT) ? 3 : 1;
}

void readOnly(HostModel::Node& node, unsigned int property, PropertyValue value) {
    value.readOnly = true;
    node.properties[property] = std::move(value);
}

void addInterface(HostModel::Tree& tree, int parent, const Interface& i, const HostState& host, bool bmc) {
    const std::string& name = i.link->name;
    const int lan = tree.add(parent, P::LanEndpointNode, name, name);
    readOnly(tree.nodes[static_cast<std::size_t>(lan)], P::ElementName, PropertyValue::ofText(name));

    const std::string description = bmc ? "BMC " + name : i.link->kind == "bridge" ? "Bridge" : name;
    const int index = tree.add(lan, P::IPEndpointNode, kEndpointName, description);
    HostModel::Node& node = tree.nodes[static_cast<std::size_t>(index)];
    node.properties.reserve(12);  // the ones set below
    const bool v4 = i.ipv4 != nullptr;
    const bool v6 = i.ipv6 != nullptr;
    std::string ipv6 = fileValue(host, name, "IPV6ADDR");
    // Read as the static setting data reads it.
    unsigned int prefix = static_cast<unsigned int>(leadingDecimal(fileValue(host, name, "PREFIX")));
    if (ipv6.empty()) {
        ipv6 = v6 ? i.ipv6->text : std::string();
        prefix = v6 ? i.ipv6->prefix : 0;
    }
    // In ascending property order: each lands at the end of the node's list.
    node.properties[P::AddressOrigin] = PropertyValue::ofNumber(originOf(i, host));
    node.properties[P::IPv4Address] = PropertyValue::ofText(v4 ? i.ipv4->text : std::string());
    node.properties[P::SubnetMask] = PropertyValue::ofText(v4 ? maskText(i.ipv4->prefix) : std::string());
    const unsigned int ipv6AddressType = ipv6Type(ipv6);
    node.properties[P::IPv6Address] = PropertyValue::ofText(std::move(ipv6));
    readOnly(node, P::IPv6AddressType, PropertyValue::ofNumber(ipv6AddressType));
    readOnly(node, P::ProtocolIFType, PropertyValue::ofNumber(v4 && v6 ? 4098 : v6 ? 4097 : v4 ? 4096 : 0));
    readOnly(node, P::IPVersion, PropertyValue::ofNumber((v4 ? 1u : 0u) | (v6 ? 2u : 0u)));
    node.properties[P::IPv4Gateway] = PropertyValue::ofText(i.gateway4 ? i.gateway4->gateway : std::string());
    node.properties[P::IPv6Gateway] = PropertyValue::ofText(i.gateway6 ? i.gateway6->gateway : std::string());
    node.properties[P::PrefixLength] = PropertyValue::ofNumber(prefix);
    readOnly(node, P::ElementName, PropertyValue::ofText(name));
    node.properties[P::AdminState] = PropertyValue::ofNumber((i.link->flags & IFF_UP) ? 1 : 12);
}

}  // namespace

std::string domainName(const HostState& host) {
    if (!host.resolver.domain.empty()) return host.resolver.domain;
    const std::size_t dot = host.hostName.find('.');
    return dot == std::string::npos ? std::string() : host.hostName.substr(dot + 1);
}

HostModel::Tree buildTree(const KernelState& kernel, const HostState& host) {
    std::vector<Interface> interfaces;
    interfaces.reserve(kernel.links.size());
    std::unordered_map<int, std::size_t> byIndex;
    for (const KernelLink& link : kernel.links) {
        if ((link.flags & IFF_LOOPBACK) || link.type == ARPHRD_LOOPBACK) continue;
        byIndex[link.index] = interfaces.size();
        Interface i;
        i.link = &link;
        interfaces.push_back(i);
    }
    for (const KernelAddress& address : kernel.addresses) {
        const auto found = byIndex.find(address.index);
        if (found == byIndex.end()) continue;
        Interface& i = interfaces[found->second];
        if (address.family == AF_INET) {
            if (!i.ipv4 || ((i.ipv4->flags & IFA_F_SECONDARY) && !(address.flags & IFA_F_SECONDARY))) {
                i.ipv4 = &address;
            }
        } else {
            const int rank = ipv6Rank(address);
            if (rank >= 0 && (!i.ipv6 || rank < i.ipv6Rank)) {
                i.ipv6 = &address;
                i.ipv6Rank = rank;
            }
        }
    }
    for (const KernelRoute& route : kernel.defaultRoutes) {
        const auto found = byIndex.find(route.outputIndex);
        if (found == byIndex.end() || route.gateway.empty()) continue;
        const KernelRoute*& best =
            route.family == AF_INET ? interfaces[found->second].gateway4 : interfaces[found->second].gateway6;
        if (!best || route.metric < best->metric) best = &route;
    }

    HostModel::Tree tree;
    tree.nodes.reserve(2 * interfaces.size() + 4);
    const int system = tree.add(-1, P::SystemNode, kSystemName, "System");
    {
        HostModel::Node& node = tree.nodes[static_cast<std::size_t>(system)];
        node.properties[P::HostName] = PropertyValue::ofText(host.hostName);
        node.properties[P::DomainName] = PropertyValue::ofText(domainName(host));
        node.properties[P::DNSServers] = PropertyValue::ofList(host.resolver.nameServers);
        node.properties[P::DNSSuffixes] = PropertyValue::ofList(host.resolver.search);
        node.properties[P::AdminState] = PropertyValue::ofNumber(1);
    }
    auto isBmc = [&](const std::string& name) {
        for (const std::string& bmc : host.bmcInterfaces) {
            if (bmc == name) return true;
        }
        return false;
    };
    for (const Interface& i : interfaces) {
        if (!isBmc(i.link->name)) addInterface(tree, system, i, host, false);
    }
    if (!host.bmcInterfaces.empty()) {
        const int processor = tree.add(system, P::ServiceProcessorNode, kServiceProcessorName, "BMC");
        for (const std::string& name : host.bmcInterfaces) {
            for (const Interface& i : interfaces) {
                if (i.link->name == name) addInterface(tree, processor, i, host, true);
            }
        }
    }
    return tree;
}

}  // namespace Live
}  // namespace Nx
