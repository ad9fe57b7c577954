// A small rtnetlink client: one dump each of links, addresses and routes, change notifications,
// and setting a link up or down.
//
// Our own reader rather than libnl-3: we need four request kinds and a handful of attributes, the
// kernel headers already describe all of it, and it keeps the provider free of a shared library
// that object managers would have to load next to it.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace Nx {
namespace Live {

// Dotted-quad text of four address bytes in network order, as inet_ntop writes it, without the
// formatted printing inet_ntop goes through: a large host has thousands of addresses.
std::string ipv4Text(const unsigned char bytes[4]);
// The same for sixteen IPv6 address bytes: the text inet_ntop writes, byte for byte (the longest
// run of two or more zero groups as "::", the first of equal runs; the IPv4-compatible and
// IPv4-mapped forms end in a dotted quad).
std::string ipv6Text(const unsigned char bytes[16]);

struct KernelLink {
    int index = 0;
    std::string name;
    unsigned int flags = 0;     // IFF_*
    unsigned short type = 0;    // ARPHRD_*
    std::string kind;           // IFLA_INFO_KIND ("bridge", "veth", ...), empty for plain devices
};

struct KernelAddress {
    int index = 0;
    unsigned char family = 0;   // AF_INET or AF_INET6
    unsigned char prefix = 0;
    unsigned char scope = 0;    // RT_SCOPE_*
    std::uint32_t flags = 0;    // IFA_F_*
    std::string text;           // the local address, printable
};

// A default route of the main table, one per next hop.
struct KernelRoute {
    unsigned char family = 0;
    int outputIndex = 0;
    std::string gateway;        // printable; empty for a device route without a gateway
    std::uint32_t metric = 0;
};

// What one dump of each kind returned, in the kernel's order.
struct KernelState {
    std::vector<KernelLink> links;
    std::vector<KernelAddress> addresses;
    std::vector<KernelRoute> defaultRoutes;
};

class NetlinkSocket {
public:
    // groups: RTMGRP_* multicast groups to join (0 for a request socket). Throws
    // Nx::InstrumentationException when the socket cannot be made.
    explicit NetlinkSocket(unsigned int groups = 0);
    ~NetlinkSocket();
    NetlinkSocket(const NetlinkSocket&) = delete;
    NetlinkSocket& operator=(const NetlinkSocket&) = delete;

    // Links, addresses and default routes in three dumps. Throws Nx::InstrumentationException on a
    // kernel error; a dump the kernel flags as interrupted by a concurrent change is retried.
    KernelState readState();

    // Sets IFF_UP on the interface (up) or clears it. Returns 0 or a negative errno.
    int setLinkUp(const std::string& name, bool up);

    // For a socket made with groups: reads every pending notification without blocking. True when
    // any arrived or the queue overflowed (events were lost), i.e. the kernel state has changed.
    bool drainNotifications();

private:
    template <class Handler>
    bool dump(std::uint16_t type, unsigned char family, Handler&& handler);
    int acknowledge(std::uint32_t seq);

    int fd_ = -1;
    std::uint32_t seq_ = 0;
    std::vector<char> buffer_;
};

}  // namespace Live
}  // namespace Nx
