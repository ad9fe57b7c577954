// The live backend against a real kernel. Every test runs in a network namespace of its own (the
// namespace and all its interfaces vanish when the test returns to the original one) with
// IPIF_ROOT pointing at a scratch directory, and compares the backend with what ip(8) reports.
#include <gtest/gtest.h>
#include <sched.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <cstring>
#include <map>
#include <string>
#include <vector>

#include "LiveNamespace.h"
#include "Nx/Instrumentation.h"
#include "Nx/LiveBackend.h"
#include "Nx/NodeLexicon.h"
#include "Nx/PlatformUtilities.h"

namespace {

using Nx::HostModel::Node;
using Nx::HostModel::PropertyValue;
using Nx::HostModel::Tree;
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
        Nx::HostModel::setCurrent(nullptr);
        Nx::PlatformUtilities::setCommandRunner(nullptr);
        LiveNamespace::TearDown();
    }

    Nx::HostModel::Backend& backend() {
        if (!backend_) backend_ = Nx::HostModel::openLiveBackend();
        return *backend_;
    }

    std::shared_ptr<Nx::HostModel::Backend> backend_;
};

TEST_F(LiveHost, SnapshotAgreesWithIp) {
    ASSERT_NO_FATAL_FAILURE(buildNetwork());
    ::setenv("IPIF_BMC_INTERFACES", "wb, absent0", 1);
    const std::shared_ptr<const Tree> tree = backend().snapshot();
    const std::map<std::string, IpView> ip = askIp();

    std::size_t endpoints = 0;
    for (const Node& node : tree->nodes) endpoints += node.type == P::IPEndpointNode;
    EXPECT_EQ(endpoints, ip.size()) << "one endpoint per interface, loopback excluded";
    for (const auto& [name, expected] : ip) {
        SCOPED_TRACE(name);
        const Node* node = endpoint(*tree, name);
        ASSERT_NE(node, nullptr);
        EXPECT_EQ(number(node, P::AdminState), expected.up ? 1u : 12u);
        const std::string v4 = expected.ipv4.empty() ? "" : expected.ipv4[0];
        const std::size_t slash4 = v4.find('/');
        EXPECT_EQ(text(node, P::IPv4Address), v4.substr(0, slash4));
        EXPECT_EQ(text(node, P::SubnetMask), v4.empty() ? "" : dottedMask(std::stoi(v4.substr(slash4 + 1))));
        ASSERT_LE(expected.ipv6.size(), 1u);
        const std::string v6 = expected.ipv6.empty() ? "" : expected.ipv6[0];
        const std::size_t slash6 = v6.find('/');
        EXPECT_EQ(text(node, P::IPv6Address), v6.substr(0, slash6));
        EXPECT_EQ(number(node, P::PrefixLength), v6.empty() ? 0u : std::stoul(v6.substr(slash6 + 1)));
        EXPECT_EQ(number(node, P::IPv6AddressType), v6.empty() ? 0u : 2u);
        const unsigned int families = (v4.empty() ? 0 : 1) + (v6.empty() ? 0 : 2);
        EXPECT_EQ(number(node, P::IPVersion), families);
        EXPECT_EQ(number(node, P::ProtocolIFType), families ? 4095 + families : 0u);
        EXPECT_EQ(text(node, P::IPv4Gateway), expected.gateway4);
        EXPECT_EQ(text(node, P::IPv6Gateway), expected.gateway6);
        // ip adds addresses without a lifetime: the kernel marks them permanent, i.e. static.
        EXPECT_EQ(number(node, P::AddressOrigin), families ? 3u : 0u);
    }

    // The scenario itself, so that a broken comparison above cannot pass on an empty picture.
    const Node* va = endpoint(*tree, "va");
    EXPECT_EQ(text(va, P::IPv4Address), "10.1.0.2");
    EXPECT_EQ(text(va, P::SubnetMask), "255.255.255.0");
    EXPECT_EQ(text(va, P::IPv4Gateway), "10.1.0.1");
    EXPECT_EQ(text(va, P::IPv6Gateway), "2001:db8:1::1");
    EXPECT_EQ(number(va, P::ProtocolIFType), 4098u);
    EXPECT_EQ(number(endpoint(*tree, "wa"), P::IPVersion), 2u);
    EXPECT_EQ(number(endpoint(*tree, "wa"), P::PrefixLength), 48u);
    EXPECT_EQ(number(endpoint(*tree, "wb"), P::AdminState), 12u);
    EXPECT_EQ(endpoint(*tree, "br0")->description, "Bridge");
    EXPECT_EQ(va->description, "va");
    EXPECT_EQ(endpoint(*tree, "lo"), nullptr);

    // Tree shape: endpoint under its LAN node under the system node, or under the BMC node.
    const Node& system = tree->nodes.at(0);
    EXPECT_EQ(system.type, unsigned(P::SystemNode));
    const Node& vaLan = tree->nodes.at(static_cast<std::size_t>(va->parent));
    EXPECT_EQ(vaLan.type, unsigned(P::LanEndpointNode));
    EXPECT_EQ(text(&vaLan, P::ElementName), "va");
    EXPECT_EQ(vaLan.parent, 0);
    const Node* wb = endpoint(*tree, "wb");
    EXPECT_EQ(wb->description, "BMC wb");
    const Node& bmc = tree->nodes.at(static_cast<std::size_t>(tree->nodes.at(static_cast<std::size_t>(wb->parent)).parent));
    EXPECT_EQ(bmc.type, unsigned(P::ServiceProcessorNode));
    EXPECT_EQ(bmc.description, "BMC");
    EXPECT_EQ(tree->find(wb->path), static_cast<int>(wb - tree->nodes.data()));

    // The system node: the host name of this process, the resolver file under IPIF_ROOT.
    char host[HOST_NAME_MAX + 1] = {};
    ::gethostname(host, sizeof host - 1);
    EXPECT_EQ(text(&system, P::HostName), host);
    const char* dot = std::strchr(host, '.');
    EXPECT_EQ(text(&system, P::DomainName), dot ? dot + 1 : "");
    EXPECT_EQ(list(&system, P::DNSServers), std::vector<std::string>{"192.0.2.53"});
    EXPECT_EQ(list(&system, P::DNSSuffixes), (std::vector<std::string>{"a.example", "b.example"}));
}

TEST_F(LiveHost, PictureIsKeptUntilTheKernelOrAFileChanges) {
    ASSERT_NO_FATAL_FAILURE(buildNetwork());
    const std::shared_ptr<const Tree> first = backend().snapshot();
    for (int i = 0; i < 100; ++i) ASSERT_EQ(backend().snapshot(), first) << "rebuilt without a change";

    // A kernel change made behind the backend's back arrives as a netlink notification. An
    // address with a lifetime is what a DHCP client leaves: origin 1.
    sh("ip addr add 10.3.0.2/24 dev vb valid_lft 600 preferred_lft 600");
    std::shared_ptr<const Tree> now = backend().snapshot();
    ASSERT_NE(now, first);
    EXPECT_EQ(text(endpoint(*now, "vb"), P::IPv4Address), "10.3.0.2");
    EXPECT_EQ(number(endpoint(*now, "vb"), P::AddressOrigin), 1u);
    sh("ip link set wa down");
    now = backend().snapshot();
    EXPECT_EQ(number(endpoint(*now, "wa"), P::AdminState), 12u);
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

TEST_F(LiveHost, AdministrativeStateWritesReachTheKernel) {
    ASSERT_NO_FATAL_FAILURE(buildNetwork());
    Nx::HostModel::setCurrent(Nx::HostModel::openLiveBackend());
    auto kernelSaysUp = [](const char* name) { return askIp().at(name).up; };

    Nx::Instrumentation cursor;  // the provider's way in
    ASSERT_TRUE(cursor.selectNode(P::IPEndpointNode));
    std::string name;
    while (cursor && (cursor.getProperty(P::ElementName, name), name != "wa")) ++cursor;
    ASSERT_TRUE(cursor) << "no endpoint for wa";
    unsigned int state = 0;

    ASSERT_TRUE(cursor.setProperty(P::AdminState, 12u));
    EXPECT_FALSE(kernelSaysUp("wa"));
    EXPECT_TRUE(kernelSaysUp("va")) << "only the addressed interface changes";
    ASSERT_TRUE(cursor.getProperty(P::AdminState, state));
    EXPECT_EQ(state, 12u);

    ASSERT_TRUE(cursor.setProperty(P::AdminState, 1u));
    EXPECT_TRUE(kernelSaysUp("wa"));
    ASSERT_TRUE(cursor.getProperty(P::AdminState, state));
    EXPECT_EQ(state, 1u);

    // Reset on va: down, then up. Going down flushes va's IPv4 default route, which shows that
    // the interface really was down in between.
    cursor.selectNode(P::IPEndpointNode);
    while (cursor && (cursor.getProperty(P::ElementName, name), name != "va")) ++cursor;
    ASSERT_TRUE(cursor) << "no endpoint for va";
    ASSERT_EQ(askIp().at("va").gateway4, "10.1.0.1");
    ASSERT_TRUE(cursor.setProperty(P::AdminState, 9u));
    EXPECT_TRUE(kernelSaysUp("va"));
    EXPECT_EQ(askIp().at("va").gateway4, "");
    std::string gateway = "stale";
    ASSERT_TRUE(cursor.getProperty(P::IPv4Gateway, gateway));
    EXPECT_EQ(gateway, "");

    EXPECT_FALSE(cursor.setProperty(P::AdminState, 4u));
    EXPECT_FALSE(cursor.setProperty(P::ProtocolIFType, 4096u)) << "read-only";
    EXPECT_FALSE(cursor.setProperty(P::AdminState, std::string("1"))) << "wrong kind";
    EXPECT_FALSE(Nx::HostModel::current()->write("/system/nosuch/ip", P::AdminState, PropertyValue::ofNumber(12)));
    EXPECT_TRUE(kernelSaysUp("wa"));
}

TEST_F(LiveHost, InterfaceSettingsPersistToIfcfgFiles) {
    ASSERT_NO_FATAL_FAILURE(buildNetwork());
    const std::string original = "# edited by hand\nDEVICE=va\nONBOOT=yes\nBOOTPROTO=none\nIPADDR=10.1.0.2\n";
    spit(ifcfg("va"), original);
    const std::string va = endpoint(*backend().snapshot(), "va")->path;
    auto write = [&](unsigned int property, PropertyValue value) { return backend().write(va, property, value); };
    using V = PropertyValue;

    // Refused values write nothing.
    for (const char* bad : {"10.0.0.1; reboot", "$(reboot)", "`id`", "a b", "x\nIPADDR=1.2.3.4", "'q'", "a\\b", "~"}) {
        EXPECT_FALSE(write(P::IPv4Address, V::ofText(bad))) << bad;
    }
    EXPECT_FALSE(write(P::AddressOrigin, V::ofNumber(2)));
    EXPECT_FALSE(write(P::PrefixLength, V::ofNumber(129)));
    EXPECT_FALSE(write(P::IPv6Address, V::ofText("2001:db8::1/200")));
    EXPECT_EQ(slurp(ifcfg("va")), original);

    ASSERT_TRUE(write(P::AddressOrigin, V::ofNumber(1)));
    EXPECT_EQ(number(endpoint(*backend().snapshot(), "va"), P::AddressOrigin), 1u);
    ASSERT_TRUE(write(P::IPv4Address, V::ofText("10.1.0.9")));
    ASSERT_TRUE(write(P::SubnetMask, V::ofText("255.255.0.0")));
    ASSERT_TRUE(write(P::IPv4Gateway, V::ofText("10.1.0.254")));
    ASSERT_TRUE(write(P::IPv6Gateway, V::ofText("fe80::1%va")));
    ASSERT_TRUE(write(P::IPv6Address, V::ofText("2001:db8:1::9")));  // the kernel's prefix (64) is kept
    EXPECT_EQ(slurp(ifcfg("va")),
              "# edited by hand\nDEVICE=va\nONBOOT=yes\nBOOTPROTO=dhcp\nIPADDR=10.1.0.9\nNETMASK=255.255.0.0\n"
              "GATEWAY=10.1.0.254\nIPV6_DEFAULTGW=fe80::1%va\nIPV6INIT=yes\nIPV6ADDR=2001:db8:1::9/64\n");
    ASSERT_TRUE(write(P::PrefixLength, V::ofNumber(56)));
    ASSERT_TRUE(write(P::IPv4Gateway, V::ofText("")));  // empty removes the key
    ASSERT_TRUE(write(P::AddressOrigin, V::ofNumber(3)));
    EXPECT_EQ(slurp(ifcfg("va")),
              "# edited by hand\nDEVICE=va\nONBOOT=yes\nBOOTPROTO=static\nIPADDR=10.1.0.9\nNETMASK=255.255.0.0\n"
              "IPV6_DEFAULTGW=fe80::1%va\nIPV6INIT=yes\nIPV6ADDR=2001:db8:1::9/56\n");
    ASSERT_TRUE(write(P::IPv6Address, V::ofText("2001:db8:1::a/60")));
    EXPECT_NE(slurp(ifcfg("va")).find("\nIPV6ADDR=2001:db8:1::a/60\n"), std::string::npos);

    // The files are configuration for the next start: the kernel keeps what it has.
    EXPECT_EQ(text(endpoint(*backend().snapshot(), "va"), P::IPv4Address), "10.1.0.2");

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
    using V = PropertyValue;
    EXPECT_FALSE(backend().write("/system", P::DNSSuffixes, V::ofList({"good.example", "bad one"})));
    EXPECT_FALSE(backend().write("/system", P::DNSServers, V::ofList({"192.0.2.1\nnameserver 6.6.6.6"})));
    EXPECT_FALSE(backend().write("/system", P::DNSServers, V::ofList({""})));
    EXPECT_FALSE(backend().write("/system", P::DomainName, V::ofText("x;y")));
    EXPECT_EQ(slurp(resolver), "# generated\nnameserver 192.0.2.53\nsearch a.example b.example\noptions ndots:2\n");

    ASSERT_TRUE(backend().write("/system", P::DNSServers, V::ofList({"192.0.2.1", "2001:db8::53"})));
    ASSERT_TRUE(backend().write("/system", P::DNSSuffixes, V::ofList({"c.example"})));
    ASSERT_TRUE(backend().write("/system", P::DomainName, V::ofText("example.org")));
    EXPECT_EQ(slurp(resolver), "# generated\ndomain example.org\nsearch c.example\nnameserver 192.0.2.1\n"
                               "nameserver 2001:db8::53\noptions ndots:2\n");
    const std::shared_ptr<const Tree> tree = backend().snapshot();
    EXPECT_EQ(list(&tree->nodes[0], P::DNSServers), (std::vector<std::string>{"192.0.2.1", "2001:db8::53"}));
    EXPECT_EQ(list(&tree->nodes[0], P::DNSSuffixes), std::vector<std::string>{"c.example"});
    EXPECT_EQ(text(&tree->nodes[0], P::DomainName), "example.org");

    EXPECT_TRUE(commands.empty());
    EXPECT_FALSE(backend().write("/system", P::AdminState, V::ofNumber(1)));
    EXPECT_TRUE(commands.empty());
    EXPECT_TRUE(backend().write("/system", P::AdminState, V::ofNumber(9)));
    EXPECT_EQ(commands, std::vector<std::string>{"reboot"});
}

// sethostname only in a child that has a UTS namespace of its own.
TEST_F(LiveHost, HostNameIsSetInItsOwnUtsNamespace) {
    int pipeFds[2];
    ASSERT_EQ(::pipe(pipeFds), 0);
    const pid_t child = ::fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
        ::close(pipeFds[0]);
        std::string problems;
        if (::unshare(CLONE_NEWUTS) != 0) {
            problems = std::string("SKIP the kernel refuses a UTS namespace: ") + std::strerror(errno);
        } else {
            auto check = [&](bool ok, const std::string& what) {
                if (!ok) problems += what + "\n";
            };
            auto live = Nx::HostModel::openLiveBackend();
            check(live->write("/system", P::HostName, PropertyValue::ofText("node1.example.net")), "write refused");
            char name[HOST_NAME_MAX + 1] = {};
            ::gethostname(name, sizeof name - 1);
            check(std::string(name) == "node1.example.net", std::string("gethostname says ") + name);
            check(slurp(root_ + "/etc/hostname") == "node1.example.net\n", "etc/hostname: " + slurp(root_ + "/etc/hostname"));
            const auto tree = live->snapshot();
            check(text(&tree->nodes[0], P::HostName) == "node1.example.net", "97 not updated");
            check(text(&tree->nodes[0], P::DomainName) == "example.net", "98 is not the host name's domain");
            check(!live->write("/system", P::HostName, PropertyValue::ofText("bad_name")), "bad_name accepted");
            ::gethostname(name, sizeof name - 1);
            check(std::string(name) == "node1.example.net", "a refused name changed the host name");
        }
        const ssize_t ignored = ::write(pipeFds[1], problems.data(), problems.size());
        (void)ignored;
        ::_exit(0);
    }
    ::close(pipeFds[1]);
    std::string report;
    char buffer[512];
    for (ssize_t n; (n = ::read(pipeFds[0], buffer, sizeof buffer)) > 0;) report.append(buffer, static_cast<std::size_t>(n));
    ::close(pipeFds[0]);
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    if (report.compare(0, 5, "SKIP ") == 0) GTEST_SKIP() << report.substr(5);
    EXPECT_EQ(report, "");
}

}  // namespace
