#include <sys/wait.h>
#include <unistd.h>

#include <cstring>
#include <fstream>
#include <thread>

#include "Nx/Exceptions.h"
#include "Nx/FixtureBackend.h"
#include "Nx/Instrumentation.h"
#include "Nx/PlatformUtilities.h"
#include "SupportTestUtil.h"

using namespace supporttest;
using Nx::Instrumentation;
using namespace Nx::NodeLexicon;
using Nx::HostModel::PropertyValue;

namespace {

// Makes a fixture the process's host model for one test.
class UseFixture {
public:
    explicit UseFixture(const std::string& path) : backend_(Nx::HostModel::open("fixture:" + path)) {
        Nx::HostModel::setCurrent(backend_);
    }
    ~UseFixture() { Nx::HostModel::setCurrent(nullptr); }

private:
    std::shared_ptr<Nx::HostModel::Backend> backend_;
};

// Records what would have been run instead of running it (single-threaded use only).
class RecordCommands {
public:
    RecordCommands() {
        Nx::PlatformUtilities::setCommandRunner([this](const std::string& command, std::string&) {
            commands.push_back(command);
            return true;
        });
    }
    ~RecordCommands() { Nx::PlatformUtilities::setCommandRunner(nullptr); }
    std::vector<std::string> commands;
};

std::string text(const Instrumentation& cursor, Properties property) {
    std::string value;
    EXPECT_TRUE(cursor.getProperty(property, value)) << "property " << property;
    return value;
}

unsigned int number(const Instrumentation& cursor, Properties property) {
    unsigned int value = 0;
    EXPECT_TRUE(cursor.getProperty(property, value)) << "property " << property;
    return value;
}

std::string errorOf(const std::string& text) {
    try {
        Nx::HostModel::parseFixture(text, "t.model");
    } catch (const Nx::InstrumentationException& error) {
        return error.what();
    }
    return "(parsed)";
}

}  // namespace

TEST(FixtureFormat, ShippedHostParsesIntoTheExpectedShape) {
    Nx::HostModel::Tree tree = Nx::HostModel::parseFixture(slurp(fixture("host-basic.model")), "host-basic.model");
    std::vector<std::string> paths;
    for (const auto& node : tree.nodes) paths.push_back(node.path);
    EXPECT_EQ(paths, (std::vector<std::string>{"/host", "/host/eth0", "/host/eth0/ip", "/host/eth1", "/host/eth1/ip",
                                               "/host/eth2", "/host/eth2/ip", "/host/br0", "/host/br0/ip", "/host/bmc",
                                               "/host/bmc/usb0", "/host/bmc/usb0/ip"}));
    EXPECT_EQ(tree.nodes[0].properties.at(94).list, (std::vector<std::string>{"192.168.1.1", "10.0.0.53"}));
    EXPECT_EQ(tree.nodes[11].parent, 10);
    EXPECT_EQ(tree.nodes[11].properties.at(25).text, "169.254.95.120");
    EXPECT_EQ(tree.find("/host/eth9"), -1);

    for (const char* name : {"host-empty.model", "host-locked.model", "demo.model"})
        EXPECT_NO_THROW(Nx::HostModel::parseFixture(slurp(fixture(name)), name)) << name;
}

TEST(FixtureFormat, FormatAndParseRoundTripAwkwardValues) {
    Nx::HostModel::Tree tree;
    int root = tree.add(-1, 40, "host", "Host \"main\" # system");
    tree.nodes[0].properties[97] = PropertyValue::ofText("");
    tree.nodes[0].properties[94] = PropertyValue::ofList({});
    tree.nodes[0].properties[99] = PropertyValue::ofList({"a b", "#x", "back\\slash", "line\nbreak", "tab\there"});
    int lan = tree.add(root, 12, "lan 0", "");
    int ip = tree.add(lan, 29, "ip", "BMC usb0");
    auto number = PropertyValue::ofNumber(4294967295u);
    number.readOnly = true;
    number.readable = false;
    tree.nodes[static_cast<size_t>(ip)].properties[123] = number;
    tree.nodes[static_cast<size_t>(ip)].properties[25] = PropertyValue::ofText("readonly");

    // The format renders every field, so an identical rendering of the re-parsed tree means an
    // identical tree.
    const std::string text = Nx::HostModel::formatFixture(tree);
    Nx::HostModel::Tree back = Nx::HostModel::parseFixture(text, "round.model");
    EXPECT_EQ(Nx::HostModel::formatFixture(back), text);
    ASSERT_EQ(back.nodes.size(), 3u);
    EXPECT_EQ(back.nodes[0].description, "Host \"main\" # system");
    EXPECT_EQ(back.nodes[0].properties.at(99).list, tree.nodes[0].properties.at(99).list);
    EXPECT_EQ(back.nodes[2].path, "/host/lan 0/ip");
    const auto& state = back.nodes[2].properties.at(123);
    EXPECT_TRUE(state.readOnly && !state.readable && state.number == 4294967295u);
    EXPECT_EQ(back.nodes[2].properties.at(25).text, "readonly");
}

TEST(FixtureFormat, ErrorsNameTheFileAndLine) {
    struct Case {
        const char* text;
        const char* expected;
    } cases[] = {
        {"node 40 host\n\tnode 12 eth0\n", "t.model:2: a tab in the indentation"},
        {"node 40 host\n  97 string \"open\n", "t.model:2: a quoted text is not closed"},
        {"# c\n\nnode 40 host\n  97 text x\n", "t.model:4: unknown property kind \"text\""},
        {"node 40 host\n  24 unsigned 4294967296\n", "t.model:2: an unsigned property takes exactly one number"},
        {"node 40 host\n  24 unsigned -1\n", "t.model:2: an unsigned property"},
        {"97 string x\n", "t.model:1: a property outside any node"},
        {"node 40 host\nnode 40 other\n", "t.model:2: a second top-level node"},
        {"node 40 host\n  node 12 eth0\n  node 12 eth0\n", "t.model:3: a second node named \"eth0\""},
        {"node 40 host\n  97 string a\n  97 string b\n", "t.model:3: property 97 given twice"},
        {"node 40 host\n  97 string \"a\\q\"\n", "t.model:2: unknown escape \\q"},
        {"node 40 host\n  97 string two words\n", "t.model:2: a string property takes exactly one value"},
        {"node forty host\n", "t.model:1: node type \"forty\" is not a number"},
        {"node 40 a/b\n", "t.model:1: node name \"a/b\""},
        {"node 40 host\n  readonly\n", "t.model:2: expected: [readonly]"},
        {"node 40 host\n  x9 string a\n", "t.model:2: expected \"node\" or a property number"},
    };
    for (const Case& c : cases) {
        std::string error = errorOf(c.text);
        EXPECT_EQ(error.compare(0, std::strlen(c.expected), c.expected), 0) << c.text << "\n -> " << error;
    }
    EXPECT_THROW(Nx::HostModel::open("fixture:/nonexistent/host.model"), Nx::InstrumentationException);
    EXPECT_THROW(Nx::HostModel::open("fixture:"), Nx::InstrumentationException);
    EXPECT_THROW(Nx::HostModel::open("simulated"), Nx::InstrumentationException);
}

TEST(FixtureBackend, WriteRewritesOnlyThePropertyLineAndKeepsComments) {
    ScratchDir dir;
    const std::string path = copyFixture(dir, "demo.model");
    const auto before = lines(slurp(path));
    auto backend = Nx::HostModel::open("fixture:" + path);
    ASSERT_TRUE(backend->write("/host/eth0/ip", 24, PropertyValue::ofNumber(1)));
    ASSERT_TRUE(backend->write("/host", 94, PropertyValue::ofList({"192.0.2.99", "a \"quoted\" one"})));
    EXPECT_FALSE(backend->write("/host/eth0/ip", 24, PropertyValue::ofText("1")));   // wrong kind
    EXPECT_FALSE(backend->write("/host/eth0/ip", 222, PropertyValue::ofNumber(1)));  // no such property
    EXPECT_FALSE(backend->write("/host/eth7/ip", 24, PropertyValue::ofNumber(1)));   // no such node

    const auto after = lines(slurp(path));
    ASSERT_EQ(after.size(), before.size());
    int changed = 0;
    for (size_t i = 0; i < before.size(); ++i) {
        if (before[i] == after[i]) continue;
        ++changed;
        if (before[i].find("24 unsigned 3") != std::string::npos)
            EXPECT_EQ(after[i], "      24 unsigned 1             # origin: static");
        else
            EXPECT_EQ(after[i], "  94 list 192.0.2.99 \"a \\\"quoted\\\" one\"");
    }
    EXPECT_EQ(changed, 2);
    auto tree = backend->snapshot();
    EXPECT_EQ(tree->nodes[0].properties.at(94).list, (std::vector<std::string>{"192.0.2.99", "a \"quoted\" one"}));

    // A fixture named through a link is read through it, but never written through it.
    const std::string link = dir.file("linked.model");
    ASSERT_EQ(::symlink(path.c_str(), link.c_str()), 0);
    auto linked = Nx::HostModel::open("fixture:" + link);
    EXPECT_EQ(linked->snapshot()->nodes.size(), tree->nodes.size());
    EXPECT_FALSE(linked->write("/host/eth0/ip", 24, PropertyValue::ofNumber(3)));
    EXPECT_EQ(lines(slurp(path)), after);
}

TEST(Instrumentation, WalksNodesOfOneTypeAndFollowsPaths) {
    UseFixture use(fixture("host-basic.model"));
    Instrumentation cursor;
    EXPECT_FALSE(cursor);
    std::vector<std::string> endpoints;
    for (cursor.selectNode(IPEndpointNode); cursor; ++cursor) endpoints.push_back(cursor.getNodeDescription());
    EXPECT_EQ(endpoints, (std::vector<std::string>{"eth0", "eth1", "eth2", "Bridge", "BMC usb0"}));
    EXPECT_EQ(cursor.getNodeDescription(), "");
    EXPECT_EQ(cursor.getPathToParentNode(), "");
    std::string unchanged = "x";
    EXPECT_FALSE(cursor.getProperty(ElementName, unchanged));
    EXPECT_EQ(unchanged, "x");

    int lans = 0;
    for (cursor.selectNode(LanEndpointNode); cursor; ++cursor) ++lans;
    EXPECT_EQ(lans, 5);

    // From the service processor's endpoint up to the root.
    ASSERT_TRUE(cursor.selectNode(std::string("/host/bmc/usb0/ip")));
    EXPECT_EQ(text(cursor, ElementName), "usb0");
    const std::string lan = cursor.getPathToParentNode();
    EXPECT_EQ(lan, "/host/bmc/usb0");
    ASSERT_TRUE(cursor.selectNode(lan));
    ASSERT_TRUE(cursor.selectNode(cursor.getPathToParentNode()));
    EXPECT_EQ(cursor.getNodeDescription(), "BMC");
    ASSERT_TRUE(cursor.selectNode(cursor.getPathToParentNode()));
    EXPECT_EQ(text(cursor, HostName), "basic-host");
    EXPECT_EQ(cursor.getPathToParentNode(), "");
    EXPECT_FALSE(cursor.selectNode(std::string("/host/nothing")));
    EXPECT_FALSE(cursor);

    // A node found by path walks on through the nodes of its type.
    ASSERT_TRUE(cursor.selectNode(std::string("/host/eth1/ip")));
    ++cursor;
    EXPECT_EQ(cursor.getNodeDescription(), "eth2");

    ASSERT_TRUE(cursor.selectNode(ServiceProcessorNode));
    EXPECT_FALSE(++cursor);

    UseFixture empty(fixture("host-empty.model"));
    Instrumentation none;
    EXPECT_FALSE(none.selectNode(IPEndpointNode));
    EXPECT_TRUE(none.selectNode(SystemNode));
    std::vector<std::string> servers{"stale"};
    EXPECT_TRUE(none.getProperty(DNSServers, servers));
    EXPECT_TRUE(servers.empty());
}

TEST(Instrumentation, KindsReadOnlyAndUnreadableProperties) {
    ScratchDir dir;
    UseFixture use(copyFixture(dir, "host-locked.model"));
    RecordCommands commands;
    Instrumentation cursor;
    ASSERT_TRUE(cursor.selectNode(IPEndpointNode));

    unsigned int asNumber = 7;
    std::vector<std::string> asList;
    EXPECT_FALSE(cursor.getProperty(ElementName, asNumber));  // a string read as a number
    EXPECT_EQ(asNumber, 7u);
    EXPECT_FALSE(cursor.getProperty(ElementName, asList));
    EXPECT_EQ(number(cursor, AddressOrigin), 3u);
    EXPECT_FALSE(cursor.setProperty(AddressOrigin, std::string("3")));
    EXPECT_FALSE(cursor.setProperty(PrefixLength, std::vector<std::string>{"24"}));
    EXPECT_EQ(number(cursor, PrefixLength), 24u);

    bool readOnly = false;
    ASSERT_TRUE(cursor.isPropertyReadOnly(IPv4Address, readOnly));
    EXPECT_TRUE(readOnly);
    EXPECT_FALSE(cursor.setProperty(IPv4Address, std::string("192.168.7.99")));
    EXPECT_EQ(text(cursor, IPv4Address), "192.168.7.10");
    EXPECT_FALSE(cursor.setProperty(AdminState, 12u));

    std::string ipv6 = "unchanged";
    EXPECT_FALSE(cursor.getProperty(IPv6Address, ipv6));
    EXPECT_EQ(ipv6, "unchanged");
    ASSERT_TRUE(cursor.isPropertyReadOnly(IPv6Address, readOnly));
    EXPECT_FALSE(readOnly);
    EXPECT_TRUE(cursor.setProperty(IPv6Address, std::string("2001:db8::7")));  // writable, still unreadable
    EXPECT_FALSE(cursor.getProperty(IPv6Address, ipv6));
    EXPECT_FALSE(cursor.isPropertyReadOnly(DNSServers, readOnly));  // not a property of this node

    // The host refuses reboot requests here: nothing may reach the command seam.
    ASSERT_TRUE(cursor.selectNode(SystemNode));
    EXPECT_FALSE(cursor.setProperty(AdminState, 9u));
    EXPECT_TRUE(commands.commands.empty());
}

TEST(Instrumentation, WritesPersistKeepThePositionAndRebootGoesThroughTheSeam) {
    ScratchDir dir;
    const std::string path = copyFixture(dir, "host-basic.model");
    UseFixture use(path);
    RecordCommands commands;
    Instrumentation cursor;
    ASSERT_TRUE(cursor.selectNode(IPEndpointNode));
    ASSERT_TRUE(cursor.setProperty(IPv4Address, std::string("192.168.1.77")));
    EXPECT_EQ(text(cursor, ElementName), "eth0");
    EXPECT_EQ(text(cursor, IPv4Address), "192.168.1.77");
    ++cursor;
    EXPECT_EQ(text(cursor, ElementName), "eth1");
    ASSERT_TRUE(cursor.setProperty(AdminState, 9u));  // an interface reset is only recorded
    ASSERT_TRUE(cursor.selectNode(SystemNode));
    ASSERT_TRUE(cursor.setProperty(DNSSuffixes, std::vector<std::string>{"new.example.com"}));
    ASSERT_TRUE(cursor.setProperty(AdminState, 9u));  // a reboot request
    EXPECT_EQ(commands.commands, (std::vector<std::string>{"reboot"}));
    EXPECT_EQ(number(cursor, AdminState), 1u);

    // A fresh backend on the file, as another process would open it.
    auto reopened = Nx::HostModel::open("fixture:" + path)->snapshot();
    const auto& eth0 = reopened->nodes[static_cast<size_t>(reopened->find("/host/eth0/ip"))];
    const auto& eth1 = reopened->nodes[static_cast<size_t>(reopened->find("/host/eth1/ip"))];
    EXPECT_EQ(eth0.properties.at(25).text, "192.168.1.77");
    EXPECT_EQ(eth1.properties.at(123).number, 9u);
    EXPECT_EQ(reopened->nodes[0].properties.at(99).list, (std::vector<std::string>{"new.example.com"}));
}

TEST(FixtureBackend, ProcessesAndThreadsSeeEachOthersWritesWithoutLosingAny) {
    ScratchDir dir;
    const std::string path = copyFixture(dir, "host-basic.model");
    UseFixture use(path);
    Instrumentation watcher;
    ASSERT_TRUE(watcher.selectNode(std::string("/host/eth1/ip")));

    // Each writer owns one endpoint and counts its prefix length up; a lost update would leave an
    // endpoint behind its count.
    const std::vector<std::string> owned{"/host/eth0/ip", "/host/eth1/ip", "/host/eth2/ip", "/host/br0/ip"};
    const unsigned int rounds = 40;
    auto writer = [&](const std::string& node, bool fresh) {
        std::shared_ptr<Nx::HostModel::Backend> backend =
            fresh ? Nx::HostModel::open("fixture:" + path) : Nx::HostModel::current();
        Nx::HostModel::setCurrent(backend);
        Instrumentation cursor;
        bool ok = cursor.selectNode(node);
        for (unsigned int i = 1; ok && i <= rounds; ++i) ok = cursor.setProperty(PrefixLength, 100 + i);
        return ok;
    };
    std::vector<pid_t> children;
    for (size_t i = 2; i < owned.size(); ++i) {
        pid_t pid = ::fork();
        ASSERT_GE(pid, 0);
        if (pid == 0) ::_exit(writer(owned[i], true) ? 0 : 1);
        children.push_back(pid);
    }
    bool ok0 = false, ok1 = false;
    std::thread t0([&] { ok0 = writer(owned[0], false); });
    std::thread t1([&] { ok1 = writer(owned[1], false); });
    t0.join();
    t1.join();
    EXPECT_TRUE(ok0 && ok1);
    for (pid_t pid : children) {
        int status = 0;
        ASSERT_EQ(::waitpid(pid, &status, 0), pid);
        EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    }

    // The watcher opened before the children wrote: it must see their writes on its next select.
    for (const std::string& node : owned) {
        ASSERT_TRUE(watcher.selectNode(node));
        EXPECT_EQ(number(watcher, PrefixLength), 100 + rounds) << node;
    }
    EXPECT_NO_THROW(Nx::HostModel::parseFixture(slurp(path), path));
}

TEST(FixtureBackend, KeepsTheLastGoodPictureWhenTheFileBreaks) {
    ScratchDir dir;
    const std::string path = copyFixture(dir, "host-empty.model");
    auto backend = Nx::HostModel::open("fixture:" + path);
    ASSERT_EQ(backend->snapshot()->nodes[0].properties.at(97).text, "empty-host");
    std::ofstream(path, std::ios::app) << "  98 string \"unclosed\n";
    EXPECT_EQ(backend->snapshot()->nodes[0].properties.at(97).text, "empty-host");
    EXPECT_FALSE(backend->write("/host", 97, PropertyValue::ofText("other")));
}

TEST(HostModel, CurrentFollowsTheEnvironmentUntilReplaced) {
    ScratchDir dir;
    const std::string path = copyFixture(dir, "host-empty.model");
    {
        ScopedEnv env("IPIF_HOST_MODEL", "fixture:" + path);
        Nx::HostModel::setCurrent(nullptr);
        auto chosen = Nx::HostModel::current();
        EXPECT_EQ(chosen->describe(), "fixture:" + std::filesystem::canonical(path).string());
        EXPECT_EQ(Nx::HostModel::current(), chosen);  // chosen once
    }
    {
        ScopedEnv env("IPIF_HOST_MODEL", "nonsense");
        Nx::HostModel::setCurrent(nullptr);
        EXPECT_THROW(Nx::HostModel::current(), Nx::InstrumentationException);
        EXPECT_THROW(Instrumentation(), Nx::InstrumentationException);
    }
    Nx::HostModel::setCurrent(nullptr);
}
