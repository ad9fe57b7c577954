#include "Netlink.h"

#include <arpa/inet.h>
#include <cerrno>
#include <cstring>
#include <linux/if_addr.h>
#include <linux/if_link.h>
#include <linux/netlink.h>
#include <linux/rtnetlink.h>
#include <net/if.h>
#include <sys/socket.h>
#include <unistd.h>

#include "Nx/Exceptions.h"

namespace Nx {
namespace Live {

namespace {

// The kernel never builds a dump message larger than 32 KiB; twice that leaves room.
constexpr std::size_t kBufferSize = 64 * 1024;
constexpr int kDumpAttempts = 4;

[[noreturn]] void fail(const std::string& what, int error) {
    throw InstrumentationException("netlink: " + what + ": " + std::strerror(error));
}

// Structures are copied out of the receive buffer rather than cast in place.
template <class T>
T load(const char* p) {
    T value;
    std::memcpy(&value, p, sizeof value);
    return value;
}

// Calls f(type, payload, length) for every attribute in [data, data + length).
template <class F>
void forEachAttribute(const char* data, std::size_t length, F&& f) {
    while (length >= sizeof(rtattr)) {
        const rtattr attribute = load<rtattr>(data);
        if (attribute.rta_len < sizeof(rtattr) || attribute.rta_len > length) return;
        f(attribute.rta_type & NLA_TYPE_MASK, data + RTA_LENGTH(0),
          static_cast<std::size_t>(attribute.rta_len) - RTA_LENGTH(0));
        const std::size_t step = RTA_ALIGN(attribute.rta_len);
        if (step >= length) return;
        data += step;
        length -= step;
    }
}

std::string addressText(unsigned char family, const char* data, std::size_t length) {
    if (family == AF_INET && length == 4) return ipv4Text(reinterpret_cast<const unsigned char*>(data));
    if (family == AF_INET6 && length == 16) return ipv6Text(reinterpret_cast<const unsigned char*>(data));
    return std::string();
}

std::uint32_t u32(const char* data, std::size_t length) {
    return length >= sizeof(std::uint32_t) ? load<std::uint32_t>(data) : 0;
}

std::string cString(const char* data, std::size_t length) {
    return std::string(data, strnlen(data, length));
}

void parseLink(const char* body, std::size_t length, KernelState& state) {
    if (length < NLMSG_ALIGN(sizeof(ifinfomsg))) return;
    const ifinfomsg info = load<ifinfomsg>(body);
    KernelLink link;
    link.index = info.ifi_index;
    link.flags = info.ifi_flags;
    link.type = info.ifi_type;
    forEachAttribute(body + NLMSG_ALIGN(sizeof info), length - NLMSG_ALIGN(sizeof info),
                     [&](unsigned type, const char* data, std::size_t size) {
                         if (type == IFLA_IFNAME) {
                             link.name = cString(data, size);
                         } else if (type == IFLA_LINKINFO) {
                             forEachAttribute(data, size, [&](unsigned inner, const char* d, std::size_t s) {
                                 if (inner == IFLA_INFO_KIND) link.kind = cString(d, s);
                             });
                         }
                     });
    if (!link.name.empty()) state.links.push_back(std::move(link));
}

void parseAddress(const char* body, std::size_t length, KernelState& state) {
    if (length < NLMSG_ALIGN(sizeof(ifaddrmsg))) return;
    const ifaddrmsg info = load<ifaddrmsg>(body);
    if (info.ifa_family != AF_INET && info.ifa_family != AF_INET6) return;
    KernelAddress address;
    address.index = static_cast<int>(info.ifa_index);
    address.family = info.ifa_family;
    address.prefix = info.ifa_prefixlen;
    address.scope = info.ifa_scope;
    address.flags = info.ifa_flags;
    std::string local, peer;
    forEachAttribute(body + NLMSG_ALIGN(sizeof info), length - NLMSG_ALIGN(sizeof info),
                     [&](unsigned type, const char* data, std::size_t size) {
                         if (type == IFA_LOCAL) local = addressText(info.ifa_family, data, size);
                         else if (type == IFA_ADDRESS) peer = addressText(info.ifa_family, data, size);
                         else if (type == IFA_FLAGS) address.flags = u32(data, size);
                     });
    // IFA_LOCAL is the interface's own address when both are present (point-to-point links).
    address.text = local.empty() ? peer : local;
    if (!address.text.empty()) state.addresses.push_back(std::move(address));
}

void parseRoute(const char* body, std::size_t length, KernelState& state) {
    if (length < NLMSG_ALIGN(sizeof(rtmsg))) return;
    const rtmsg info = load<rtmsg>(body);
    if ((info.rtm_family != AF_INET && info.rtm_family != AF_INET6) || info.rtm_dst_len != 0 ||
        info.rtm_type != RTN_UNICAST) {
        return;
    }
    std::uint32_t table = info.rtm_table;
    KernelRoute route;
    route.family = info.rtm_family;
    std::vector<KernelRoute> hops;
    forEachAttribute(body + NLMSG_ALIGN(sizeof info), length - NLMSG_ALIGN(sizeof info),
                     [&](unsigned type, const char* data, std::size_t size) {
                         switch (type) {
                         case RTA_TABLE: table = u32(data, size); break;
                         case RTA_OIF: route.outputIndex = static_cast<int>(u32(data, size)); break;
                         case RTA_GATEWAY: route.gateway = addressText(info.rtm_family, data, size); break;
                         case RTA_PRIORITY: route.metric = u32(data, size); break;
                         case RTA_MULTIPATH:
                             // A list of rtnexthop records, each followed by its own attributes.
                             while (size >= sizeof(rtnexthop)) {
                                 const rtnexthop hop = load<rtnexthop>(data);
                                 if (hop.rtnh_len < sizeof(rtnexthop) || hop.rtnh_len > size) break;
                                 KernelRoute next;
                                 next.family = info.rtm_family;
                                 next.outputIndex = hop.rtnh_ifindex;
                                 forEachAttribute(data + RTNH_LENGTH(0), hop.rtnh_len - RTNH_LENGTH(0),
                                                  [&](unsigned t, const char* d, std::size_t s) {
                                                      if (t == RTA_GATEWAY) next.gateway = addressText(info.rtm_family, d, s);
                                                  });
                                 hops.push_back(std::move(next));
                                 const std::size_t step = RTNH_ALIGN(hop.rtnh_len);
                                 if (step >= size) break;
                                 data += step;
                                 size -= step;
                             }
                             break;
                         default: break;
                         }
                     });
    if (table != RT_TABLE_MAIN) return;
    if (hops.empty()) {
        state.defaultRoutes.push_back(std::move(route));
        return;
    }
    for (KernelRoute& hop : hops) {
        hop.metric = route.metric;
        state.defaultRoutes.push_back(std::move(hop));
    }
}

}  // namespace

std::string ipv4Text(const unsigned char bytes[4]) {
    char text[INET_ADDRSTRLEN];
    char* at = text;
    for (int i = 0; i < 4; ++i) {
        unsigned int b = bytes[i];
        if (i) *at++ = '.';
        if (b >= 100) *at++ = static_cast<char>('0' + b / 100);
        if (b >= 10) *at++ = static_cast<char>('0' + b / 10 % 10);
        *at++ = static_cast<char>('0' + b % 10);
    }
    return std::string(text, static_cast<std::size_t>(at - text));
}

std::string ipv6Text(const unsigned char bytes[16]) {
    unsigned int groups[8];
    for (int i = 0; i < 8; ++i) groups[i] = (bytes[2 * i] << 8) | bytes[2 * i + 1];
    // The longest run of zero groups; a single zero group is written out.
    int bestAt = -1, bestLength = 0;
    for (int i = 0; i < 8;) {
        if (groups[i]) {
            ++i;
            continue;
        }
        int end = i;
        while (end < 8 && !groups[end]) ++end;
        if (end - i > bestLength) {
            bestAt = i;
            bestLength = end - i;
        }
        i = end;
    }
    if (bestLength < 2) bestAt = -1;

    static const char hex[] = "0123456789abcdef";
    char text[INET6_ADDRSTRLEN];
    char* at = text;
    for (int i = 0; i < 8; ++i) {
        if (bestAt >= 0 && i >= bestAt && i < bestAt + bestLength) {
            if (i == bestAt) *at++ = ':';
            continue;
        }
        if (i) *at++ = ':';
        if (i == 6 && bestAt == 0 && (bestLength == 6 || (bestLength == 5 && groups[5] == 0xffff))) {
            const std::string tail = ipv4Text(bytes + 12);
            std::memcpy(at, tail.data(), tail.size());
            at += tail.size();
            break;
        }
        bool started = false;
        for (int shift = 12; shift >= 0; shift -= 4) {
            const unsigned int digit = (groups[i] >> shift) & 0xf;
            if (digit || started || shift == 0) {
                *at++ = hex[digit];
                started = true;
            }
        }
    }
    if (bestAt >= 0 && bestAt + bestLength == 8) *at++ = ':';
    return std::string(text, static_cast<std::size_t>(at - text));
}

NetlinkSocket::NetlinkSocket(unsigned int groups) : buffer_(kBufferSize) {
    fd_ = ::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC | (groups ? SOCK_NONBLOCK : 0), NETLINK_ROUTE);
    if (fd_ < 0) fail("socket", errno);
    sockaddr_nl local{};
    local.nl_family = AF_NETLINK;
    local.nl_groups = groups;
    if (groups) {
        // A bigger queue makes overflow (and with it a forced rebuild) rarer during bursts.
        int size = 1 << 20;
        ::setsockopt(fd_, SOL_SOCKET, SO_RCVBUF, &size, sizeof size);
    } else {
        // Lets the kernel filter route dumps by table (kernels before 4.20 ignore the request).
        int on = 1;
        ::setsockopt(fd_, SOL_NETLINK, NETLINK_GET_STRICT_CHK, &on, sizeof on);
    }
    if (::bind(fd_, reinterpret_cast<const sockaddr*>(&local), sizeof local) != 0) {
        const int error = errno;
        ::close(fd_);
        fd_ = -1;
        fail("bind", error);
    }
}

NetlinkSocket::~NetlinkSocket() {
    if (fd_ >= 0) ::close(fd_);
}

// Sends one dump request and hands every reply to handler(type, body, length) until NLMSG_DONE.
// True when the kernel flagged the dump as interrupted by a concurrent change (inconsistent).
template <class Handler>
bool NetlinkSocket::dump(std::uint16_t type, unsigned char family, Handler&& handler) {
    struct {
        nlmsghdr header;
        union {
            struct {
                ifinfomsg info;
                rtattr maskAttribute;
                std::uint32_t mask;
            } link;
            ifaddrmsg address;
            rtmsg route;
        } body;
    } request{};
    std::size_t bodySize = sizeof(rtgenmsg);
    if (type == RTM_GETLINK) {
        // Counters are neither read nor wanted: the kernel then skips summing them per link.
        request.body.link.info.ifi_family = family;
        request.body.link.maskAttribute.rta_type = IFLA_EXT_MASK;
        request.body.link.maskAttribute.rta_len = RTA_LENGTH(sizeof(std::uint32_t));
        request.body.link.mask = RTEXT_FILTER_SKIP_STATS;
        bodySize = NLMSG_ALIGN(sizeof(ifinfomsg)) + RTA_LENGTH(sizeof(std::uint32_t));
        static_assert(sizeof(ifinfomsg) % NLMSG_ALIGNTO == 0 && sizeof(rtattr) == RTA_LENGTH(0), "packed request");
    } else if (type == RTM_GETADDR) {
        request.body.address.ifa_family = family;
        bodySize = sizeof(ifaddrmsg);
    } else {
        request.body.route.rtm_family = family;
        request.body.route.rtm_table = RT_TABLE_MAIN;
        bodySize = sizeof(rtmsg);
    }
    request.header.nlmsg_len = NLMSG_LENGTH(bodySize);
    request.header.nlmsg_type = type;
    request.header.nlmsg_flags = NLM_F_REQUEST | NLM_F_DUMP;
    request.header.nlmsg_seq = ++seq_;
    sockaddr_nl kernel{};
    kernel.nl_family = AF_NETLINK;
    if (::sendto(fd_, &request, request.header.nlmsg_len, 0, reinterpret_cast<const sockaddr*>(&kernel),
                 sizeof kernel) < 0) {
        fail("send", errno);
    }
    bool interrupted = false;
    for (;;) {
        const ssize_t received = ::recv(fd_, buffer_.data(), buffer_.size(), MSG_TRUNC);
        if (received < 0) {
            if (errno == EINTR) continue;
            fail("receive", errno);
        }
        if (static_cast<std::size_t>(received) > buffer_.size()) fail("receive", EMSGSIZE);
        const char* cursor = buffer_.data();
        std::size_t left = static_cast<std::size_t>(received);
        while (left >= sizeof(nlmsghdr)) {
            const nlmsghdr header = load<nlmsghdr>(cursor);
            if (header.nlmsg_len < sizeof(nlmsghdr) || header.nlmsg_len > left) fail("receive", EBADMSG);
            const char* body = cursor + NLMSG_HDRLEN;
            const std::size_t bodyLength = header.nlmsg_len - NLMSG_HDRLEN;
            if (header.nlmsg_seq == seq_) {
                if (header.nlmsg_flags & NLM_F_DUMP_INTR) interrupted = true;
                if (header.nlmsg_type == NLMSG_DONE) return interrupted;
                if (header.nlmsg_type == NLMSG_ERROR) {
                    const int error = bodyLength >= sizeof(nlmsgerr) ? -load<nlmsgerr>(body).error : EBADMSG;
                    fail("dump", error ? error : EBADMSG);
                }
                handler(header.nlmsg_type, body, bodyLength);
            }
            const std::size_t step = NLMSG_ALIGN(header.nlmsg_len);
            if (step >= left) break;
            cursor += step;
            left -= step;
        }
    }
}

KernelState NetlinkSocket::readState() {
    for (int attempt = 1;; ++attempt) {
        KernelState state;
        auto handle = [&](std::uint16_t type, const char* body, std::size_t length) {
            switch (type) {
            case RTM_NEWLINK: parseLink(body, length, state); break;
            case RTM_NEWADDR: parseAddress(body, length, state); break;
            case RTM_NEWROUTE: parseRoute(body, length, state); break;
            default: break;
            }
        };
        bool interrupted = dump(RTM_GETLINK, AF_UNSPEC, handle);
        interrupted |= dump(RTM_GETADDR, AF_UNSPEC, handle);
        interrupted |= dump(RTM_GETROUTE, AF_INET, handle);
        interrupted |= dump(RTM_GETROUTE, AF_INET6, handle);
        if (!interrupted || attempt == kDumpAttempts) return state;
    }
}

int NetlinkSocket::acknowledge(std::uint32_t seq) {
    for (;;) {
        const ssize_t received = ::recv(fd_, buffer_.data(), buffer_.size(), 0);
        if (received < 0) {
            if (errno == EINTR) continue;
            return -errno;
        }
        const char* cursor = buffer_.data();
        std::size_t left = static_cast<std::size_t>(received);
        while (left >= sizeof(nlmsghdr)) {
            const nlmsghdr header = load<nlmsghdr>(cursor);
            if (header.nlmsg_len < sizeof(nlmsghdr) || header.nlmsg_len > left) return -EBADMSG;
            if (header.nlmsg_seq == seq && header.nlmsg_type == NLMSG_ERROR) {
                if (header.nlmsg_len < NLMSG_LENGTH(sizeof(nlmsgerr))) return -EBADMSG;
                return load<nlmsgerr>(cursor + NLMSG_HDRLEN).error;
            }
            const std::size_t step = NLMSG_ALIGN(header.nlmsg_len);
            if (step >= left) break;
            cursor += step;
            left -= step;
        }
    }
}

int NetlinkSocket::setLinkUp(const std::string& name, bool up) {
    const unsigned int index = if_nametoindex(name.c_str());
    if (index == 0) return -ENODEV;
    struct {
        nlmsghdr header;
        ifinfomsg info;
    } request{};
    request.header.nlmsg_len = NLMSG_LENGTH(sizeof(ifinfomsg));
    request.header.nlmsg_type = RTM_NEWLINK;
    request.header.nlmsg_flags = NLM_F_REQUEST | NLM_F_ACK;
    request.header.nlmsg_seq = ++seq_;
    request.info.ifi_family = AF_UNSPEC;
    request.info.ifi_index = static_cast<int>(index);
    request.info.ifi_change = IFF_UP;
    request.info.ifi_flags = up ? IFF_UP : 0;
    sockaddr_nl kernel{};
    kernel.nl_family = AF_NETLINK;
    if (::sendto(fd_, &request, request.header.nlmsg_len, 0, reinterpret_cast<const sockaddr*>(&kernel),
                 sizeof kernel) < 0) {
        return -errno;
    }
    return acknowledge(request.header.nlmsg_seq);
}

bool NetlinkSocket::drainNotifications() {
    bool changed = false;
    for (;;) {
        const ssize_t received = ::recv(fd_, buffer_.data(), buffer_.size(), MSG_DONTWAIT | MSG_TRUNC);
        if (received > 0) {
            changed = true;
            continue;
        }
        if (received < 0 && errno == EINTR) continue;
        if (received < 0 && errno == ENOBUFS) {
            changed = true;  // the queue overflowed: notifications were lost
            continue;
        }
        return changed;
    }
}

}  // namespace Live
}  // namespace Nx
