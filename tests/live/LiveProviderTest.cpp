// The provider library on the live backend, end to end: loaded by the embedded host (and run by
// ipif) inside a network namespace of the test's own, compared with what ip(8) and the ifcfg
// files the test wrote say.
#include <gtest/gtest.h>
#include <unistd.h>

#include <algorithm>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include "LiveNamespace.h"
#include "TestFiles.h"
#include "ipif/Host.h"

namespace {

using namespace livetest;
using ipif::Instance;
using ipif::Value;

const char* const kNamespace = "root/cimv2";

// The configuration files the tests start from. Their values differ from the kernel's on purpose:
// they are what the interfaces get at their next start. vb's kernel address is dynamic and va's
// permanent, so each BOOTPROTO below contradicts the kernel.
const std::map<std::string, std::string> kIfcfg = {
    {"va", "DEVICE=va\nBOOTPROTO=dhcp\nIPV4ADDR=10.1.0.20\nNETMASK=255.255.255.0\nGATEWAY=10.1.0.1\n"
           "IPV6ADDR=2001:db8:1::20\nPREFIX=64\nIPV6GATEWAY=2001:db8:1::1\nCONFIG_NAME=uplink\n"},
    {"vb", "DEVICE=vb\nBOOTPROTO=static\nIPV4ADDR=10.3.0.9\n"},
    {"br0", "DEVICE=br0\nBOOTPROTO=none\n"},
};
const std::set<std::string> kBmc = {"wb"};

std::string str(const Instance& instance, const char* property) {
    const Value* v = instance.property(property);
    return v && !v->isNull() && !v->isArray() ? v->asString() : "<missing>";
}

std::uint64_t num(const Instance& instance, const char* property) {
    const Value* v = instance.property(property);
    return v && !v->isNull() && !v->isArray() ? v->asUnsigned() : 999999;
}

std::map<std::string, std::string> assignments(const std::string& content) {
    std::map<std::string, std::string> values;
    for (const std::string& line : lines(content)) {
        const std::size_t equals = line.find('=');
        if (equals != std::string::npos) values[line.substr(0, equals)] = line.substr(equals + 1);
    }
    return values;
}

std::string address(const std::vector<std::string>& list) {
    return list.empty() ? "" : list[0].substr(0, list[0].find('/'));
}

unsigned prefix(const std::vector<std::string>& list) {
    return list.empty() ? 0 : std::stoul(list[0].substr(list[0].find('/') + 1));
}

// AddressOrigin: the file's BOOTPROTO first (dhcp 4, static/none 3), else the kernel's flags: the
// interfaces without a file have permanent addresses here, i.e. static (LiveBackendTest holds
// dynamic ones).
unsigned origin(const std::string& name, const IpView& view) {
    if (kIfcfg.count(name)) return assignments(kIfcfg.at(name))["BOOTPROTO"] == "dhcp" ? 4 : 3;
    return view.ipv4.empty() && view.ipv6.empty() ? 0 : 3;
}

std::set<std::string> keysOf(const ipif::Result& r) {
    std::set<std::string> keys;
    for (const ipif::ObjectPath& path : r.paths) {
        const Value* key = path.keys.find("InstanceID") ? path.keys.find("InstanceID") : path.keys.find("Name");
        keys.insert(key ? key->asString() : "<no key>");
    }
    return keys;
}

// The bridge and veths of the backend tests, plus an IPv6-only default route on wa and a dynamic
// address with an IPv4-only default route on vb; wb belongs to the service processor.
class LiveProvider : public LiveNamespace {
protected:
    void SetUp() override {
        LiveNamespace::SetUp();
        if (IsSkipped() || HasFatalFailure()) return;
        ::setenv("IPIF_HOST_MODEL", "live", 1);
        ::setenv("IPIF_BMC_INTERFACES", "wb", 1);
        ASSERT_NO_FATAL_FAILURE(buildNetwork());
        for (const char* command : {"ip addr add 10.3.0.2/24 dev vb valid_lft 600 preferred_lft 600",
                                    "ip route add default via 10.3.0.1 dev vb metric 300",
                                    "ip -6 route add default via 2001:db8:2::1 dev wa metric 2048"}) {
            ASSERT_NO_FATAL_FAILURE(sh(command));
        }
        for (const auto& [name, content] : kIfcfg) spit(ifcfg(name), content);
    }

    void TearDown() override {
        // The provider's netlink sockets hold the namespace: it must go with the host.
        host_.reset();
        EXPECT_EQ(slurp("/proc/self/maps").find("libIPInterface"), std::string::npos)
            << "a provider library outlived its host";
        ::unsetenv("IPIF_HOST_MODEL");
        LiveNamespace::TearDown();
    }

    ipif::Host& host() {
        if (!host_) {
            ipif::HostOptions options;
            options.mofPaths = testfiles::projectMofPaths();
            options.regPaths = {IPIF_SOURCE_DIR "/mof"};
            options.providerDirs = {IPIF_BINARY_DIR};
            host_ = std::make_unique<ipif::Host>(options);
        }
        return *host_;
    }

    std::vector<Instance> enumerate(const std::string& className) {
        const ipif::Result r = host().enumerateInstances(kNamespace, className);
        EXPECT_TRUE(r.ok()) << className << ": " << r.rcName() << " " << r.message;
        return r.instances;
    }

    // The instances by the value of one property, which must be unique.
    std::map<std::string, Instance> byKey(const std::string& className, const char* key) {
        std::map<std::string, Instance> found;
        for (const Instance& instance : enumerate(className)) {
            const std::string value = str(instance, key);
            EXPECT_TRUE(found.emplace(value, instance).second) << className << ": " << value;
        }
        return found;
    }

    std::unique_ptr<ipif::Host> host_;
};

TEST_F(LiveProvider, EndpointsCapabilitiesAndServiceAgreeWithIp) {
    const std::map<std::string, IpView> ip = askIp();
    ASSERT_EQ(ip.size(), 5u) << "br0, va, vb, wa, wb";
    const std::map<std::string, Instance> endpoints = byKey("KVRNX_IPProtocolEndpoint", "Name");
    EXPECT_EQ(endpoints.size(), ip.size()) << "one endpoint per interface, loopback excluded";
    for (const auto& [name, expected] : ip) {
        SCOPED_TRACE(name);
        ASSERT_EQ(endpoints.count(name), 1u);
        const Instance& e = endpoints.at(name);
        const bool bmc = kBmc.count(name) > 0;
        EXPECT_EQ(str(e, "ElementName"), name);
        EXPECT_EQ(str(e, "Description"), bmc ? "BMC " + name : name == "br0" ? "Bridge" : name);
        EXPECT_EQ(str(e, "SystemName"), bmc ? "BMC:-1" : hostName());
        EXPECT_EQ(str(e, "SystemCreationClassName"), bmc ? "KVRNX_SPComputerSystem" : "KVRNX_ComputerSystem");
        EXPECT_EQ(str(e, "IPv4Address"), address(expected.ipv4));
        EXPECT_EQ(str(e, "SubnetMask"), expected.ipv4.empty() ? "" : dottedMask(int(prefix(expected.ipv4))));
        // An IPv6 address in the file is what was applied last: it is shown with the file's prefix.
        std::map<std::string, std::string> file;
        if (kIfcfg.count(name)) file = assignments(kIfcfg.at(name));
        const bool applied = file.count("IPV6ADDR") > 0;
        const std::string ipv6 = applied ? file["IPV6ADDR"] : address(expected.ipv6);
        const unsigned ipv6Prefix = applied ? std::stoul(file["PREFIX"]) : prefix(expected.ipv6);
        EXPECT_EQ(str(e, "IPv6Address"), ipv6);
        EXPECT_EQ(num(e, "PrefixLength"), ipv6Prefix);
        EXPECT_EQ(num(e, "IPv6SubnetPrefixLength"), ipv6Prefix);
        EXPECT_EQ(num(e, "IPv6AddressType"), ipv6.empty() ? 0u : 2u);
        const unsigned families = (expected.ipv4.empty() ? 0 : 1) + (expected.ipv6.empty() ? 0 : 2);
        EXPECT_EQ(num(e, "IPVersionSupport"), families);
        EXPECT_EQ(num(e, "ProtocolIFType"), families ? 4095 + families : 0);
        EXPECT_EQ(num(e, "EnabledState"), expected.up ? 2u : 3u);
        EXPECT_EQ(num(e, "RequestedState"), expected.up ? 2u : 3u);
        EXPECT_EQ(num(e, "AddressOrigin"), origin(name, expected));
    }
    // The scenario itself, so that a broken ip parser cannot make the comparison vacuous.
    EXPECT_EQ(str(endpoints.at("va"), "IPv4Address"), "10.1.0.2");
    EXPECT_EQ(str(endpoints.at("va"), "IPv6Address"), "2001:db8:1::20");
    EXPECT_EQ(num(endpoints.at("va"), "AddressOrigin"), 4u);
    EXPECT_EQ(num(endpoints.at("wa"), "PrefixLength"), 48u);
    EXPECT_EQ(num(endpoints.at("wb"), "EnabledState"), 3u);

    std::set<std::string> capabilities, expected;
    for (const auto& entry : byKey("KVRNX_IPEnabledLogicalElementCapabilities", "InstanceID")) capabilities.insert(entry.first);
    for (const auto& entry : ip) expected.insert(entry.first);
    EXPECT_EQ(capabilities, expected);
    const std::vector<Instance> services = enumerate("KVRNX_IPConfigurationService");
    ASSERT_EQ(services.size(), 1u);
    EXPECT_EQ(str(services[0], "SystemName"), hostName());
}

TEST_F(LiveProvider, RequestStateChangeReachesTheKernel) {
    // 3 and 2 set the link down and up, 11 resets it (down, then up), 6 is not supported.
    const std::map<std::string, Instance> endpoints = byKey("KVRNX_IPProtocolEndpoint", "Name");
    ASSERT_EQ(askIp().at("va").gateway4, "10.1.0.1");
    struct Step {
        const char* name;
        std::uint16_t requested;
        std::uint64_t returned;
        bool up;
    };
    for (const Step& step : {Step{"wa", 3, 0, false}, Step{"wa", 6, 4, false}, Step{"wa", 2, 0, true},
                             Step{"va", 11, 0, true}}) {
        SCOPED_TRACE(std::string(step.name) + " " + std::to_string(step.requested));
        ipif::Args in;
        in.set("RequestedState", Value::uint16(step.requested));
        in.set("TimeoutPeriod", Value::dateTime("00000000000100.000000:000"));
        const ipif::ObjectPath path = endpoints.at(step.name).path;
        const ipif::Result r = host().invokeMethod(path, "RequestStateChange", in);
        ASSERT_TRUE(r.hasReturnValue) << r.rcName() << " " << r.message;
        EXPECT_EQ(r.returnValue.asUnsigned(), step.returned);
        EXPECT_EQ(askIp().at(step.name).up, step.up) << run("ip -o link show");
        const ipif::Result now = host().getInstance(path);
        ASSERT_EQ(now.instances.size(), 1u) << now.rcName();
        EXPECT_EQ(num(now.instances[0], "EnabledState"), step.up ? 2u : 3u);
    }
    // A reset takes the interface down on the way, which flushes its IPv4 default route.
    EXPECT_EQ(askIp().at("va").gateway4, "");
    EXPECT_TRUE(askIp().at("vb").up) << "only the addressed interfaces change";
}

TEST_F(LiveProvider, GatewaysAgreeWithIpRoute) {
    // Node order: the host's interfaces in the kernel's order, then the service processor's. The
    // walk starts at the first interface with a gateway; one with both gateways comes as _IPv6,
    // then _IPv4; later ones without a gateway come as _IPv4 with nothing to access.
    std::vector<std::pair<std::string, IpView>> order;
    for (const auto& entry : askIp()) order.push_back(entry);
    auto rank = [](const auto& entry) { return std::make_pair(kBmc.count(entry.first), entry.second.index); };
    std::sort(order.begin(), order.end(), [&](const auto& a, const auto& b) { return rank(a) < rank(b); });
    std::vector<std::string> expected;
    for (const auto& [name, view] : order) {
        if (expected.empty() && view.gateway4.empty() && view.gateway6.empty()) continue;
        const std::string system = kBmc.count(name) ? "BMC:-1" : hostName();
        if (!view.gateway6.empty()) expected.push_back(system + " " + name + "_IPv6 " + view.gateway6 + " 4");
        if (!view.gateway4.empty() || view.gateway6.empty()) {
            expected.push_back(system + " " + name + "_IPv4 " + view.gateway4 + " 3");
        }
    }
    std::vector<std::string> actual;
    for (const Instance& g : enumerate("KVRNX_IPRemoteServiceAccessPoint")) {
        actual.push_back(str(g, "SystemName") + " " + str(g, "Name") + " " + str(g, "AccessInfo") + " " +
                         std::to_string(num(g, "InfoFormat")));
        EXPECT_EQ(num(g, "AccessContext"), 2u);
    }
    EXPECT_EQ(actual, expected);
    // The scenario: IPv4 only on vb, both on va, IPv6 only on wa, none on wb.
    std::string all;
    for (const std::string& line : actual) all += line + "\n";
    for (const char* gateway : {"vb_IPv4 10.3.0.1 ", "va_IPv6 2001:db8:1::1 ", "va_IPv4 10.1.0.1 ",
                                "wa_IPv6 2001:db8:2::1 ", "wb_IPv4  3"}) {
        EXPECT_NE(all.find(gateway), std::string::npos) << gateway << " in\n" << all;
    }
}

TEST_F(LiveProvider, StaticSettingsReadAndRewriteTheIfcfgFiles) {
    const std::map<std::string, IpView> ip = askIp();
    const std::map<std::string, Instance> settings = byKey("KVRNX_StaticIPAssignmentSettingData", "InstanceID");
    EXPECT_EQ(settings.size(), ip.size());
    for (const auto& [name, view] : ip) {
        SCOPED_TRACE(name);
        const std::string id = (kBmc.count(name) ? "BMC%" : "Computer%") + name;
        ASSERT_EQ(settings.count(id), 1u);
        const Instance& s = settings.at(id);
        // The file's keys when there is a file, else what the interface has now.
        std::map<std::string, std::string> file = {
            {"IPV4ADDR", address(view.ipv4)},
            {"NETMASK", view.ipv4.empty() ? "" : dottedMask(int(prefix(view.ipv4)))},
            {"GATEWAY", view.gateway4},
            {"IPV6ADDR", address(view.ipv6)},
            {"PREFIX", std::to_string(prefix(view.ipv6))},
            {"IPV6GATEWAY", view.gateway6}};
        if (kIfcfg.count(name)) file = assignments(kIfcfg.at(name));
        EXPECT_EQ(str(s, "ElementName"), name);
        EXPECT_EQ(num(s, "AddressOrigin"), 3u);
        EXPECT_EQ(str(s, "IPv4Address"), file["IPV4ADDR"]);
        EXPECT_EQ(str(s, "SubnetMask"), file["NETMASK"]);
        EXPECT_EQ(str(s, "GatewayIPv4Address"), file["GATEWAY"]);
        EXPECT_EQ(str(s, "IPv6Address"), file["IPV6ADDR"]);
        EXPECT_EQ(num(s, "IPv6SubnetPrefixLength"), file["PREFIX"].empty() ? 0 : std::stoul(file["PREFIX"]));
        EXPECT_EQ(str(s, "GatewayIPv6Address"), file["IPV6GATEWAY"]);
        EXPECT_EQ(str(s, "ConfigurationName"), file["CONFIG_NAME"]);
    }

    // A modify rewrites va's file under the scratch root, key by key, and leaves the kernel alone.
    Instance change;
    change.path = settings.at("Computer%va").path;
    change.properties.set("SubnetMask", Value::string("255.255.0.0"));
    change.properties.set("IPv6SubnetPrefixLength", Value::uint16(56));
    change.properties.set("ConfigurationName", Value::string("edited"));
    ipif::Result r = host().modifyInstance(change.path, change);
    ASSERT_TRUE(r.ok()) << r.rcName() << " " << r.message;
    const std::string rewritten = "DEVICE=va\nBOOTPROTO=dhcp\nIPV4ADDR=10.1.0.20\nNETMASK=255.255.0.0\nGATEWAY=10.1.0.1\n"
                                  "IPV6ADDR=2001:db8:1::20\nPREFIX=56\nIPV6GATEWAY=2001:db8:1::1\nCONFIG_NAME=edited\n";
    EXPECT_EQ(slurp(ifcfg("va")), rewritten);
    r = host().getInstance(change.path);
    ASSERT_EQ(r.instances.size(), 1u) << r.rcName();
    EXPECT_EQ(num(r.instances[0], "IPv6SubnetPrefixLength"), 56u);
    EXPECT_EQ(askIp().at("va").ipv4.at(0), "10.1.0.2/24");

    // A value that could break out of the file is refused, and nothing is written.
    Instance hostile;
    hostile.path = change.path;
    hostile.properties.set("GatewayIPv4Address", Value::string("10.1.0.1;reboot"));
    EXPECT_EQ(host().modifyInstance(hostile.path, hostile).rc, 4);
    EXPECT_EQ(slurp(ifcfg("va")), rewritten);
}

TEST_F(LiveProvider, AssociationsReachTheLiveFarEnds) {
    const std::map<std::string, IpView> ip = askIp();
    const std::map<std::string, Instance> endpoints = byKey("KVRNX_IPProtocolEndpoint", "Name");
    // The far ends are the gateway instances that an enumeration presents for the interface
    // (GatewaysAgreeWithIpRoute holds those against ip route).
    std::map<std::string, std::set<std::string>> gateways;
    for (const Instance& g : enumerate("KVRNX_IPRemoteServiceAccessPoint")) {
        gateways[str(g, "ElementName")].insert(str(g, "Name"));
    }
    ASSERT_EQ(gateways["va"], (std::set<std::string>{"va_IPv4", "va_IPv6"}));
    std::set<std::string> hosted;
    for (const auto& [name, view] : ip) {
        SCOPED_TRACE(name);
        ASSERT_EQ(endpoints.count(name), 1u);
        const ipif::ObjectPath& endpoint = endpoints.at(name).path;
        const std::string id = (kBmc.count(name) ? "BMC%" : "Computer%") + name;
        if (!kBmc.count(name)) hosted.insert(name);
        EXPECT_EQ(keysOf(host().associatorNames(endpoint, "KVRNX_StaticIPElementSettingData")),
                  std::set<std::string>{id});
        EXPECT_EQ(keysOf(host().associatorNames(endpoint, "KVRNX_IPRemoteAccessAvailableToElement")), gateways[name]);
        // The setting in force follows the origin, so the ifcfg files and the kernel decide it.
        for (const char* kind : {"static", "dhcp"}) {
            const ipif::Result r = host().references(
                host().parsePath("KVRNX_IPAssignmentSettingData.InstanceID=\"" + id + "%" + kind + "\""),
                "KVRNX_IPElementSettingData");
            ASSERT_EQ(r.instances.size(), 1u) << kind << ": " << r.rcName() << " " << r.message;
            const bool current = origin(name, view) == (kind[0] == 'd' ? 4u : 3u);
            EXPECT_EQ(num(r.instances[0], "IsCurrent"), current ? 1u : 2u) << kind;
        }
    }
    const ipif::ObjectPath computer = host().parsePath(
        "KVRNX_ComputerSystem.CreationClassName=\"KVRNX_ComputerSystem\",Name=\"" + hostName() + "\"");
    EXPECT_EQ(keysOf(host().associatorNames(computer, "KVRNX_IPHostedAccessPoint")), hosted);
}

TEST_F(LiveProvider, IpifPrintsTheNamespacesInterfaces) {
    int status = -1;
    const std::string output = run(IPIF_BINARY_DIR "/cli/ipif ei KVRNX_IPProtocolEndpoint", &status);
    ASSERT_EQ(status, 0) << output;
    std::set<std::string> names;
    for (const std::string& line : lines(output)) {
        const std::vector<std::string> w = words(line);
        if (w.size() == 3 && w[0] == "Name" && w[1] == "=") names.insert(w[2].substr(1, w[2].size() - 3));  // "va";
    }
    std::set<std::string> expected;
    for (const auto& entry : askIp()) expected.insert(entry.first);
    EXPECT_EQ(names, expected) << output;
}

}  // namespace
