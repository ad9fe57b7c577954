// Node types and property numbers of the host model.
#pragma once

namespace Nx {
namespace NodeLexicon {

// Kinds of node in the host model tree.
enum NodeType : unsigned int {
    LanEndpointNode = 12,       // a network port (child of the system or of the service processor)
    IPEndpointNode = 29,        // the IP endpoint of one interface (child of its LAN node)
    SystemNode = 40,            // the host itself; the root of the tree
    ServiceProcessorNode = 41,  // the service processor ("BMC"), child of the system node
};

// Numbered node properties. Kinds: S string, U unsigned, L string list.
enum Properties : unsigned int {
    AddressOrigin = 24,      // U  0 unknown, 1 DHCP, 3 static (endpoint)
    IPv4Address = 25,        // S  primary IPv4 address, dotted (endpoint)
    SubnetMask = 26,         // S  IPv4 mask, dotted (endpoint)
    IPv6Address = 27,        // S  primary global IPv6 address (endpoint)
    IPv6AddressType = 28,    // U  (endpoint)
    ProtocolIFType = 47,     // U  4096 IPv4, 4097 IPv6, 4098 IPv4+IPv6 (endpoint)
    DNSServers = 94,         // L  name servers (system)
    IPVersion = 96,          // U  1 IPv4, 2 IPv6, 3 both (endpoint)
    HostName = 97,           // S  (system)
    DomainName = 98,         // S  (system)
    DNSSuffixes = 99,        // L  search suffixes (system)
    IPv4Gateway = 100,       // S  IPv4 default gateway through this interface (endpoint)
    IPv6Gateway = 101,       // S  IPv6 default gateway through this interface (endpoint)
    PrefixLength = 102,      // U  (endpoint)
    ElementName = 108,       // S  interface name (LAN and endpoint nodes)
    AdminState = 123,        // U  1 up, 12 down, write 9 to reset; on the system node 9 reboots
};

}  // namespace NodeLexicon
}  // namespace Nx
