// The live backend against a real kernel, in a network namespace of the test's own with IPIF_ROOT
// at a scratch directory: the node tree's shape and system node, when the picture is rebuilt, and
// the writes and refusals. What the tree says per interface (addresses, gateways, origin, state)
// is held against ip(8) and the ifcfg files once, through the provider (LiveProviderTest).
#include <arpa/inet.h>
#include <gtest/gtest.h>
#include <sched.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <map>
#include <string>
#include <vector>

#include "LiveNamespace.h"
#include "Netlink.h"
#include "Nx/LiveBackend.h"
#include "Nx/NodeLexicon.h"
#include "Nx/PlatformUtilities.h"

namespace {

using Nx::HostModel::Node;
using Nx::HostModel::Tree;
using V = Nx::HostModel::PropertyValue;
using namespace livetest;
namespace P = Nx::NodeLexicon;

const Node* endpoint(const Tree& tree, const std::string& name) {
    for (const Node& node : tree.nodes) {
        const auto found = node.properties.find(P::ElementName);
        if (node.type == P::IPEndpointNode && found != node.properties.end() && found->second.text == name) return &node;
    }
    return nullptr;
}

std::string text(const Node* node, unsigned int property) {
    return node && node->properties.count(property) ? node->properties.at(property).text : "<missing>";
}

unsigned int number(const Node* node, unsigned int property) {
    return node && node->properties.count(property) ? node->properties.at(property).number : 999999;
}

std::vector<std::string> list(const Node* node, unsigned int property) {
    return node && node->properties.count(property) ? node->properties.at(property).list
                                                     : std::vector<std::string>{"<missing>"};
}

class LiveHost : public LiveNamespace {
protected:
    void TearDown() override {
        backend_.reset();
        Nx::PlatformUtilities::setCommandRunner(nullptr);
        LiveNamespace::TearDown();
    }

    Nx::HostModel::Backend& backend() {
        if (!backend_) backend_ = Nx::HostModel::openLiveBackend();
        return *backend_;
    }

    std::shared_ptr<Nx::HostModel::Backend> backend_;
};

// Addresses are printed without inet_ntop; every byte value must read as inet_ntop writes it.
TEST(LiveText, Ipv4TextMatchesInetNtop) {
    for (unsigned v = 0; v < 256; ++v) {
        const unsigned char bytes[4] = {static_cast<unsigned char>(v), static_cast<unsigned char>(255 - v), 0,
                                        static_cast<unsigned char>(v * 7)};
        char expected[INET_ADDRSTRLEN];
        ASSERT_NE(inet_ntop(AF_INET, bytes, expected, sizeof expected), nullptr);
        EXPECT_EQ(Nx::Live::ipv4Text(bytes), expected);
    }
}

// Every placement and length of zero runs (each group zero or not, in two non-zero spellings),
// the IPv4-compatible and -mapped forms, and random addresses.
TEST(LiveText, Ipv6TextMatchesInetNtop) {
    const auto check = [](const unsigned char (&bytes)[16]) {
        char expected[INET6_ADDRSTRLEN];
        ASSERT_NE(inet_ntop(AF_INET6, bytes, expected, sizeof expected), nullptr);
        ASSERT_EQ(Nx::Live::ipv6Text(bytes), expected);
    };
    for (unsigned mask = 0; mask < 256; ++mask)
        for (unsigned spelling = 0; spelling < 2; ++spelling) {
            unsigned char bytes[16] = {};
            for (int g = 0; g < 8; ++g)
                if (mask & (1u << g)) {
                    bytes[2 * g] = spelling ? 0xfe : 0x00;
                    bytes[2 * g + 1] = static_cast<unsigned char>(spelling ? 0x80 + g : g + 1);
                }
            ASSERT_NO_FATAL_FAILURE(check(bytes));
        }
    for (unsigned tail : {0x00000000u, 0x00000001u, 0x0a000001u, 0xc0a80101u, 0xffffffffu})
        for (unsigned five : {0x0000u, 0xffffu, 0xfffeu}) {
            unsigned char bytes[16] = {};
            bytes[10] = static_cast<unsigned char>(five >> 8);
            bytes[11] = static_cast<unsigned char>(five);
            for (int b = 0; b < 4; ++b) bytes[12 + b] = static_cast<unsigned char>(tail >> (24 - 8 * b));
            ASSERT_NO_FATAL_FAILURE(check(bytes));
        }
    unsigned seed = 12345;
    for (int n = 0; n < 2000; ++n) {
        unsigned char bytes[16];
        for (auto& b : bytes) {
            seed = seed * 1103515245u + 12345u;
            b = static_cast<unsigned char>((seed >> 16) % 4 == 0 ? 0 : seed >> 24);
        }
        ASSERT_NO_FATAL_FAILURE(check(bytes));
    }
}

TEST_F(LiveHost, TreeShapeAndSystemNodeFollowTheKernelAndTheFiles) {
    ASSERT_NO_FATAL_FAILURE(buildNetwork());
    ::setenv("IPIF_BMC_INTERFACES", "wb, absent0", 1);
    const std::shared_ptr<const Tree> tree = backend().snapshot();
    EXPECT_EQ(endpoint(*tree, "lo"), nullptr);

    // An endpoint sits under its LAN node under the system node, or under the BMC node.
    const Node& system = tree->nodes.at(0);
    EXPECT_EQ(system.type, unsigned(P::SystemNode));
    const Node* va = endpoint(*tree, "va");
    ASSERT_NE(va, nullptr);
    const Node& vaLan = tree->nodes.at(static_cast<std::size_t>(va->parent));
    EXPECT_EQ(vaLan.type, unsigned(P::LanEndpointNode));
    EXPECT_EQ(vaLan.parent, 0);
    const Node* wb = endpoint(*tree, "wb");
    ASSERT_NE(wb, nullptr);
    const Node& bmc = tree->nodes.at(static_cast<std::size_t>(tree->nodes.at(static_cast<std::size_t>(wb->parent)).parent));
    EXPECT_EQ(bmc.type, unsigned(P::ServiceProcessorNode));
    EXPECT_EQ(bmc.description, "BMC");
    EXPECT_EQ(tree->find(wb->path), static_cast<int>(wb - tree->nodes.data()));

    // The system node: the host name of this process, the resolver file under IPIF_ROOT.
    const std::string host = hostName();
    EXPECT_EQ(text(&system, P::HostName), host);
    EXPECT_EQ(text(&system, P::DomainName), host.find('.') == std::string::npos ? "" : host.substr(host.find('.') + 1));
    EXPECT_EQ(list(&system, P::DNSServers), std::vector<std::string>{"192.0.2.53"});
    EXPECT_EQ(list(&system, P::DNSSuffixes), (std::vector<std::string>{"a.example", "b.example"}));
}

TEST_F(LiveHost, PictureIsKeptUntilTheKernelOrAFileChanges) {
    ASSERT_NO_FATAL_FAILURE(buildNetwork());
    const std::shared_ptr<const Tree> first = backend().snapshot();
    for (int i = 0; i < 100; ++i) ASSERT_EQ(backend().snapshot(), first) << "rebuilt without a change";

    // Kernel changes made behind the backend's back arrive as netlink notifications (address, link
    // and route groups). An address with a lifetime is what a DHCP client leaves: origin 1.
    sh("ip addr add 10.3.0.2/24 dev vb valid_lft 600 preferred_lft 600");
    std::shared_ptr<const Tree> now = backend().snapshot();
    ASSERT_NE(now, first);
    EXPECT_EQ(text(endpoint(*now, "vb"), P::IPv4Address), "10.3.0.2");
    EXPECT_EQ(number(endpoint(*now, "vb"), P::AddressOrigin), 1u);
    sh("ip link set wa down");
    EXPECT_EQ(number(endpoint(*backend().snapshot(), "wa"), P::AdminState), 12u);
    sh("ip route del default via 10.1.0.1");
    EXPECT_EQ(text(endpoint(*backend().snapshot(), "va"), P::IPv4Gateway), "");

    // An ifcfg file created, then edited in place, overrides the kernel's flags for the origin.
    spit(ifcfg("vb"), "BOOTPROTO=static\n");
    EXPECT_EQ(number(endpoint(*backend().snapshot(), "vb"), P::AddressOrigin), 3u);
    {
        std::ofstream edit(ifcfg("vb"), std::ios::in | std::ios::out);
        edit << "BOOTPROTO=dhcp  \n";
    }
    EXPECT_EQ(number(endpoint(*backend().snapshot(), "vb"), P::AddressOrigin), 1u);

    spit(root_ + "/etc/resolv.conf", "domain corp.example\nnameserver 198.51.100.7\n");
    now = backend().snapshot();
    EXPECT_EQ(list(&now->nodes[0], P::DNSServers), std::vector<std::string>{"198.51.100.7"});
    EXPECT_EQ(text(&now->nodes[0], P::DomainName), "corp.example");
    EXPECT_EQ(backend().snapshot(), now);
}

TEST_F(LiveHost, InterfaceWritesPersistToIfcfgFilesAndRefusalsWriteNothing) {
    ASSERT_NO_FATAL_FAILURE(buildNetwork());
    const std::string original = "# edited by hand\nDEVICE=va\nONBOOT=yes\nBOOTPROTO=none\nIPADDR=10.1.0.2\n";
    spit(ifcfg("va"), original);
    const std::string va = endpoint(*backend().snapshot(), "va")->path;
    auto write = [&](unsigned int property, V value) { return backend().write(va, property, value); };

    for (const char* bad : {"10.0.0.1; reboot", "$(reboot)", "x\nIPADDR=1.2.3.4"}) {
        EXPECT_FALSE(write(P::IPv4Address, V::ofText(bad))) << bad;
    }
    EXPECT_FALSE(write(P::AddressOrigin, V::ofNumber(2)));
    EXPECT_FALSE(write(P::PrefixLength, V::ofNumber(129)));
    EXPECT_FALSE(write(P::IPv6Address, V::ofText("2001:db8::1/200")));
    EXPECT_FALSE(write(P::AdminState, V::ofNumber(4))) << "only 1, 12 and 9";
    EXPECT_FALSE(write(P::AdminState, V::ofText("12"))) << "wrong kind";
    EXPECT_FALSE(write(P::ProtocolIFType, V::ofNumber(4096))) << "read-only";
    EXPECT_FALSE(backend().write("/system/nosuch/ip", P::AdminState, V::ofNumber(12)));
    EXPECT_EQ(slurp(ifcfg("va")), original);
    EXPECT_TRUE(askIp().at("va").up);

    ASSERT_TRUE(write(P::AddressOrigin, V::ofNumber(1)));
    EXPECT_EQ(number(endpoint(*backend().snapshot(), "va"), P::AddressOrigin), 1u);
    ASSERT_TRUE(write(P::IPv4Address, V::ofText("10.1.0.9")));
    ASSERT_TRUE(write(P::SubnetMask, V::ofText("255.255.0.0")));
    ASSERT_TRUE(write(P::IPv4Gateway, V::ofText("10.1.0.254")));
    ASSERT_TRUE(write(P::IPv6Gateway, V::ofText("fe80::1%va")));
    ASSERT_TRUE(write(P::IPv6Address, V::ofText("2001:db8:1::9")));  // the kernel's prefix (64) is kept
    EXPECT_EQ(slurp(ifcfg("va")),
              "# edited by hand\nDEVICE=va\nONBOOT=yes\nBOOTPROTO=dhcp\nIPADDR=10.1.0.9\nNETMASK=255.255.0.0\n"
              "GATEWAY=10.1.0.254\nIPV6_DEFAULTGW=fe80::1%va\nIPV6INIT=yes\nIPV6ADDR=2001:db8:1::9\nPREFIX=64\n");
    ASSERT_TRUE(write(P::PrefixLength, V::ofNumber(56)));
    ASSERT_TRUE(write(P::IPv4Gateway, V::ofText("")));  // empty removes the key
    ASSERT_TRUE(write(P::AddressOrigin, V::ofNumber(3)));
    EXPECT_EQ(slurp(ifcfg("va")),
              "# edited by hand\nDEVICE=va\nONBOOT=yes\nBOOTPROTO=static\nIPADDR=10.1.0.9\nNETMASK=255.255.0.0\n"
              "IPV6_DEFAULTGW=fe80::1%va\nIPV6INIT=yes\nIPV6ADDR=2001:db8:1::9\nPREFIX=56\n");
    ASSERT_TRUE(write(P::IPv6Address, V::ofText("2001:db8:1::a/60")));  // brings its prefix
    EXPECT_NE(slurp(ifcfg("va")).find("\nIPV6ADDR=2001:db8:1::a/60\nPREFIX=60\n"), std::string::npos);
    // The files are configuration for the next start: the kernel keeps what it has, and the node
    // shows it, but for the IPv6 address and prefix, which read back as written.
    const Node* node = endpoint(*backend().snapshot(), "va");
    EXPECT_EQ(text(node, P::IPv4Address), "10.1.0.2");
    EXPECT_EQ(text(node, P::IPv6Address) + " " + std::to_string(number(node, P::PrefixLength)), "2001:db8:1::a/60 60");
    ASSERT_TRUE(write(P::IPv6Address, V::ofText("")));  // removes the address with its prefix
    EXPECT_EQ(slurp(ifcfg("va")).find("PREFIX"), std::string::npos);
    node = endpoint(*backend().snapshot(), "va");
    EXPECT_EQ(text(node, P::IPv6Address) + " " + std::to_string(number(node, P::PrefixLength)), "2001:db8:1::2 64");

    // A new file names its device; a prefix without any IPv6 address to carry it is refused.
    const std::string vb = endpoint(*backend().snapshot(), "vb")->path;
    EXPECT_FALSE(backend().write(vb, P::PrefixLength, V::ofNumber(64)));
    EXPECT_FALSE(std::filesystem::exists(ifcfg("vb")));
    ASSERT_TRUE(backend().write(vb, P::IPv4Address, V::ofText("10.4.0.1")));
    EXPECT_EQ(slurp(ifcfg("vb")), "DEVICE=vb\nIPADDR=10.4.0.1\n");

    // IPIF_DATA_DIR moves the files out of the root.
    ::setenv("IPIF_DATA_DIR", (root_ + "/data").c_str(), 1);
    const bool moved = backend().write(endpoint(*backend().snapshot(), "wa")->path, P::IPv4Gateway, V::ofText("10.2.0.1"));
    ::unsetenv("IPIF_DATA_DIR");
    ASSERT_TRUE(moved);
    EXPECT_EQ(slurp(root_ + "/data/ifcfg-wa"), "DEVICE=wa\nGATEWAY=10.2.0.1\n");
}

TEST_F(LiveHost, ResolverWritesKeepForeignLinesAndRebootGoesThroughTheSeam) {
    std::vector<std::string> commands;
    Nx::PlatformUtilities::setCommandRunner([&](const std::string& command, std::string&) {
        commands.push_back(command);
        return true;
    });
    const std::string resolver = root_ + "/etc/resolv.conf";
    EXPECT_FALSE(backend().write("/system", P::DNSSuffixes, V::ofList({"good.example", "bad one"})));
    EXPECT_FALSE(backend().write("/system", P::DNSServers, V::ofList({"192.0.2.1\nnameserver 6.6.6.6"})));
    EXPECT_FALSE(backend().write("/system", P::DNSServers, V::ofList({""})));
    EXPECT_EQ(slurp(resolver), "# generated\nnameserver 192.0.2.53\nsearch a.example b.example\noptions ndots:2\n");

    ASSERT_TRUE(backend().write("/system", P::DNSServers, V::ofList({"192.0.2.1", "2001:db8::53"})));
    ASSERT_TRUE(backend().write("/system", P::DNSSuffixes, V::ofList({"c.example"})));
    ASSERT_TRUE(backend().write("/system", P::DomainName, V::ofText("example.org")));
    EXPECT_EQ(slurp(resolver), "# generated\ndomain example.org\nsearch c.example\nnameserver 192.0.2.1\n"
                               "nameserver 2001:db8::53\noptions ndots:2\n");
    const std::shared_ptr<const Tree> tree = backend().snapshot();
    EXPECT_EQ(list(&tree->nodes[0], P::DNSServers), (std::vector<std::string>{"192.0.2.1", "2001:db8::53"}));
    EXPECT_EQ(text(&tree->nodes[0], P::DomainName), "example.org");

    EXPECT_FALSE(backend().write("/system", P::AdminState, V::ofNumber(1)));
    EXPECT_TRUE(commands.empty());
    EXPECT_TRUE(backend().write("/system", P::AdminState, V::ofNumber(9)));
    EXPECT_EQ(commands, std::vector<std::string>{"reboot"});
}

// sethostname only in a child that has a UTS namespace of its own; it reports through a file.
TEST_F(LiveHost, HostNameIsSetInItsOwnUtsNamespace) {
    const std::string report = root_ + "/report";
    const pid_t child = ::fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
        std::string problems;
        if (::unshare(CLONE_NEWUTS) != 0) {
            problems = std::string("SKIP the kernel refuses a UTS namespace: ") + std::strerror(errno);
        } else {
            auto check = [&](bool ok, const std::string& what) {
                if (!ok) problems += what + "\n";
            };
            auto live = Nx::HostModel::openLiveBackend();
            check(live->write("/system", P::HostName, V::ofText("node1.example.net")), "write refused");
            check(!live->write("/system", P::HostName, V::ofText("bad_name")), "bad_name accepted");
            check(hostName() == "node1.example.net", "gethostname says " + hostName());
            check(slurp(root_ + "/etc/hostname") == "node1.example.net\n", "etc/hostname: " + slurp(root_ + "/etc/hostname"));
            const auto tree = live->snapshot();
            check(text(&tree->nodes[0], P::HostName) == "node1.example.net", "97 not updated");
            check(text(&tree->nodes[0], P::DomainName) == "example.net", "98 is not the host name's domain");
        }
        spit(report, problems);
        ::_exit(0);
    }
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    ASSERT_TRUE(std::filesystem::exists(report));
    const std::string problems = slurp(report);
    if (problems.compare(0, 5, "SKIP ") == 0) GTEST_SKIP() << problems.substr(5);
    EXPECT_EQ(problems, "");
}

}  // namespace
