// The companion provider through the embedded host, loaded next to the IP interface provider: the
// objects it serves must be exactly the ones that provider names in its keys and InstanceIDs.
#include <gtest/gtest.h>
#include <stdlib.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <initializer_list>
#include <memory>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "TestFiles.h"
#include "ipif/Host.h"

namespace {

using ipif::CimType;
using ipif::ObjectPath;
using ipif::Value;
using Strings = std::vector<std::string>;

std::string hostName() {
    char buffer[256] = {};
    ::gethostname(buffer, sizeof buffer - 1);
    return buffer;
}

std::string text(const ipif::NamedValues& values, const std::string& name) {
    const Value* value = values.find(name);
    return value && !value->isNull() && value->type() == CimType::String ? value->asString() : "<none>";
}

Value strings(const Strings& values) {
    std::vector<ipif::Element> elements(values.begin(), values.end());
    return Value::array(CimType::String, elements);
}

ipif::NamedValues with(std::initializer_list<std::pair<const char*, Value>> values) {
    ipif::NamedValues out;
    for (const auto& [name, value] : values) out.set(name, value);
    return out;
}

void expectSamePaths(const std::vector<ObjectPath>& actual, const std::vector<ObjectPath>& expected) {
    EXPECT_EQ(actual.size(), expected.size());
    for (const ObjectPath& path : expected)
        EXPECT_EQ(std::count(actual.begin(), actual.end(), path), 1) << "missing or repeated: " << path.toString();
}

const char* const kClasses[] = {"KVRNX_ComputerSystem",      "KVRNX_SPComputerSystem",    "KVRNX_LANEndpoint",
                                "KVRNX_DHCPSettingData",     "KVRNX_DNSSettingData",      "KVRNX_DNSGeneralSettingData",
                                "KVRNX_DNSProtocolEndpoint", "KVRNX_DNSSAPSAPDependency", "KVRNX_ConcreteJob"};
const std::string kEth0Dns = "KVRNX_DNSSettingData.InstanceID=\"Computer%eth0%\"";
const std::string kGeneral = "KVRNX_DNSGeneralSettingData.InstanceID=\"Computer%dnsgeneral\"";

// One model file and data directory per process, rewritten by each test: a provider library that
// stays loaded keeps the backend it opened first, and the backend re-reads a replaced file.
class Companion : public ::testing::Test {
protected:
    static testfiles::ScratchDir& dir() {
        static testfiles::ScratchDir scratch;
        return scratch;
    }
    static std::string settingsFile() { return dir().file("kvrnx-companion.settings"); }

    void SetUp() override {
        ::setenv("IPIF_HOST_MODEL", ("fixture:" + dir().file("host.model")).c_str(), 1);
        ::setenv("IPIF_DATA_DIR", (dir().path() + "/").c_str(), 1);
        ::setenv("IPIF_COMMANDS", ("record:" + dir().file("commands")).c_str(), 1);
        std::remove(settingsFile().c_str());
        useModel(fixture("host-basic.model"));
    }

    static std::string fixture(const char* name) {
        return testfiles::readFile(std::string(IPIF_TEST_FIXTURES) + "/" + name);
    }
    static void useModel(const std::string& model) {
        testfiles::writeFile(dir().file("host.model.new"), model);
        std::rename(dir().file("host.model.new").c_str(), dir().file("host.model").c_str());
    }
    static std::string model() { return testfiles::readFile(dir().file("host.model")); }

    ipif::Host& host() {
        if (!host_) {
            ipif::HostOptions options;
            options.mofPaths = testfiles::projectMofPaths();
            options.regPaths = {IPIF_SOURCE_DIR "/mof/IPInterfaceProvider.reg",
                                IPIF_SOURCE_DIR "/mof/IPInterfaceCompanion.reg"};
            options.providerDirs = {IPIF_BINARY_DIR};
            options.strictProperties = true;
            host_ = std::make_unique<ipif::Host>(options);
        }
        return *host_;
    }
    ObjectPath path(const std::string& text) { return host().parsePath(text); }
    std::vector<ObjectPath> names(const char* className) {
        ipif::Result r = host().enumerateInstanceNames("root/cimv2", className);
        EXPECT_TRUE(r.ok()) << className << ": " << r.message;
        return r.paths;
    }
    ipif::Instance get(const std::string& pathText) {
        ipif::Result r = host().getInstance(path(pathText));
        EXPECT_TRUE(r.ok() && r.instances.size() == 1) << pathText << ": " << r.message;
        return r.instances.empty() ? ipif::Instance() : r.instances.front();
    }
    std::string prop(const std::string& pathText, const char* name) { return text(get(pathText).properties, name); }
    Strings list(const std::string& pathText, const char* name) {
        Strings out;
        const ipif::Instance instance = get(pathText);
        if (const Value* value = instance.properties.find(name))
            for (const auto& element : value->elements()) out.push_back(std::get<std::string>(element));
        return out;
    }
    int modify(const std::string& pathText, const ipif::NamedValues& values, const Strings* propertyList = nullptr) {
        ipif::Instance change;
        change.path = path(pathText);
        change.properties = values;
        return host().modifyInstance(change.path, change, propertyList).rc;
    }
    // A key path of class with the four keys of a system's endpoint.
    std::string endpoint(const std::string& cls, const std::string& systemClass, const std::string& system,
                         const std::string& name) {
        return cls + ".SystemCreationClassName=\"" + systemClass + "\",SystemName=\"" + system +
               "\",CreationClassName=\"" + cls + "\",Name=\"" + name + "\"";
    }

    std::unique_ptr<ipif::Host> host_;
};

TEST_F(Companion, EachClassEnumeratesExactlyTheHostsObjectsAsTheIPProviderNamesThem) {
    // eth01 next to eth0: no setting of one may be taken for the other's.
    useModel(fixture("host-basic.model") +
             "  node 12 eth01 eth01\n    108 string eth01\n    node 29 ip eth01\n      108 string eth01\n");
    const std::string h = hostName();
    expectSamePaths(names("KVRNX_ComputerSystem"),
                    {path("KVRNX_ComputerSystem.CreationClassName=\"KVRNX_ComputerSystem\",Name=\"" + h + "\"")});
    expectSamePaths(names("KVRNX_SPComputerSystem"),
                    {path("KVRNX_SPComputerSystem.CreationClassName=\"KVRNX_SPComputerSystem\",Name=\"BMC:-1\"")});
    expectSamePaths(names("KVRNX_DNSGeneralSettingData"), {path(kGeneral)});
    expectSamePaths(names("KVRNX_ConcreteJob"), {path("KVRNX_ConcreteJob.InstanceID=\"IPConfigSvcJob:1\"")});

    // Per IP endpoint: its LAN endpoint under KVRNX_ComputerSystem by the endpoint's SystemName and
    // Name, its DNS endpoint under the endpoint's own system, and the link between the two.
    const std::vector<ObjectPath> ipEndpoints = names("KVRNX_IPProtocolEndpoint");
    ASSERT_EQ(ipEndpoints.size(), 6u) << "eth0, eth1, eth2, br0, eth01 and the BMC's usb0";
    std::vector<ObjectPath> lans, dnsEndpoints, antecedents;
    for (const ObjectPath& ip : ipEndpoints) {
        const std::string system = text(ip.keys, "SystemName"), name = text(ip.keys, "Name");
        lans.push_back(path(endpoint("KVRNX_LANEndpoint", "KVRNX_ComputerSystem", system, name)));
        dnsEndpoints.push_back(path(
            endpoint("KVRNX_DNSProtocolEndpoint", text(ip.keys, "SystemCreationClassName"), system, name)));
    }
    expectSamePaths(names("KVRNX_LANEndpoint"), lans);
    expectSamePaths(names("KVRNX_DNSProtocolEndpoint"), dnsEndpoints);
    for (const ObjectPath& link : names("KVRNX_DNSSAPSAPDependency"))
        antecedents.push_back(link.keys.find("Antecedent")->asReference());
    expectSamePaths(antecedents, ipEndpoints);

    // Applying an assignment setting's InstanceID takes every setting whose InstanceID it contains:
    // exactly one DNS setting, and the DHCP setting for a DHCP configuration only.
    auto ids = [&](const char* cls) {
        Strings out;
        for (const ObjectPath& p : names(cls)) out.push_back(text(p.keys, "InstanceID"));
        return out;
    };
    const Strings dns = ids("KVRNX_DNSSettingData"), dhcp = ids("KVRNX_DHCPSettingData");
    const Strings configurations = ids("KVRNX_IPAssignmentSettingData");
    ASSERT_EQ(configurations.size(), 12u);
    EXPECT_EQ(dns.size(), 6u);
    for (const std::string& configuration : configurations) {
        auto within = [&](const std::string& id) { return configuration.find(id) != std::string::npos; };
        EXPECT_EQ(std::count_if(dns.begin(), dns.end(), within), 1) << configuration;
        const bool isStatic = configuration.find("static") != std::string::npos;
        EXPECT_EQ(std::count_if(dhcp.begin(), dhcp.end(), within), isStatic ? 0 : 1) << configuration;
    }
}

TEST_F(Companion, GetFindsEachEnumeratedObjectByItsFullKeysOnly) {
    for (const char* cls : kClasses) {
        ipif::Result all = host().enumerateInstances("root/cimv2", cls);
        ASSERT_TRUE(all.ok()) << cls;
        std::vector<ObjectPath> paths;
        for (const ipif::Instance& instance : all.instances) {
            paths.push_back(instance.path);
            const ipif::Instance got = get(instance.path.toString());
            EXPECT_EQ(got.path, instance.path);
            EXPECT_EQ(got.toMof(), instance.toMof());
        }
        expectSamePaths(paths, names(cls));
    }
    const std::string h = hostName();
    for (const std::string& missing :
         {"KVRNX_ComputerSystem.CreationClassName=\"KVRNX_ComputerSystem\",Name=\"not-" + h + "\"",
          endpoint("KVRNX_LANEndpoint", "KVRNX_ComputerSystem", "BMC:-1", "eth0"),
          endpoint("KVRNX_DNSProtocolEndpoint", "KVRNX_ComputerSystem", h, "ETH0"),
          std::string("KVRNX_LANEndpoint.Name=\"eth0\""),
          std::string("KVRNX_DNSSettingData.InstanceID=\"Computer%eth0\""),
          std::string("KVRNX_DHCPSettingData.InstanceID=\"computer%eth0%dhcp\"")}) {
        EXPECT_EQ(host().getInstance(path(missing)).rc, 6) << missing;
    }
    // Class names in keys are names of classes, whatever their case.
    get("KVRNX_ComputerSystem.CreationClassName=\"kvrnx_computersystem\",Name=\"" + h + "\"");
    EXPECT_EQ(list(kGeneral, "DNSSuffixesToAppend"), (Strings{"example.com", "lab.example.com"}));
}

TEST_F(Companion, AServiceProcessorIsOnlyANodeDescribedExactlyBMC) {
    useModel(fixture("host-empty.model"));
    EXPECT_EQ(names("KVRNX_ComputerSystem").size(), 1u);
    for (const char* cls : {"KVRNX_SPComputerSystem", "KVRNX_LANEndpoint", "KVRNX_DNSSettingData",
                            "KVRNX_DHCPSettingData", "KVRNX_DNSProtocolEndpoint", "KVRNX_DNSSAPSAPDependency"})
        EXPECT_TRUE(names(cls).empty()) << cls;
    EXPECT_TRUE(list(kGeneral, "DNSSuffixesToAppend").empty());

    useModel("node 40 host \"Host computer system\"\n  node 41 bmc \"BMC \"\n    node 12 usb0 usb0\n"
             "      108 string usb0\n");
    EXPECT_TRUE(names("KVRNX_SPComputerSystem").empty());
    expectSamePaths(names("KVRNX_LANEndpoint"),
                    {path(endpoint("KVRNX_LANEndpoint", "KVRNX_ComputerSystem", hostName(), "usb0"))});
}

TEST_F(Companion, ModifiedDNSValuesAreKeptUntilTheHostReportsThem) {
    ASSERT_EQ(modify(kEth0Dns, with({{"RequestedHostname", Value::string("newhost")},
                                     {"DNSServerAddresses", strings({"192.0.2.53", "2001:db8::53"})},
                                     {"ConfigurationName", Value::string("")}})),
              0);
    EXPECT_EQ(prop(kEth0Dns, "RequestedHostname"), "newhost");
    EXPECT_EQ(prop(kEth0Dns, "DomainName"), "example.com");
    EXPECT_EQ(list(kEth0Dns, "DNSServerAddresses"), (Strings{"192.0.2.53", "2001:db8::53"}));
    EXPECT_EQ(prop(kEth0Dns, "ConfigurationName"), "");
    // Nothing reaches the host before the setting is applied, and other settings keep the host's values.
    EXPECT_NE(model().find("97 string basic-host"), std::string::npos);
    EXPECT_EQ(prop("KVRNX_DNSSettingData.InstanceID=\"Computer%eth1%\"", "RequestedHostname"), "basic-host");

    // With a property list only the listed properties change; a listed property left out goes back to the host's value.
    const Strings listed = {"DomainName", "DNSServerAddresses"};
    ASSERT_EQ(modify(kEth0Dns,
                     with({{"DomainName", Value::string("example.org")}, {"RequestedHostname", Value::string("x")}}),
                     &listed),
              0);
    EXPECT_EQ(prop(kEth0Dns, "DomainName"), "example.org");
    EXPECT_EQ(prop(kEth0Dns, "RequestedHostname"), "newhost");
    EXPECT_EQ(list(kEth0Dns, "DNSServerAddresses"), (Strings{"192.168.1.1", "10.0.0.53"}));

    // Once the host reports the requested name it is dropped, so the setting follows later host changes
    // (applying a setting takes the values to the host: tests/provider/apply_*_test).
    std::string renamed = fixture("host-basic.model");
    renamed.replace(renamed.find("97 string basic-host"), 20, "97 string newhost");
    useModel(renamed);
    EXPECT_EQ(prop(kEth0Dns, "RequestedHostname"), "newhost");
    EXPECT_EQ(testfiles::readFile(settingsFile()).find("RequestedHostname"), std::string::npos);
    useModel(fixture("host-basic.model"));
    EXPECT_EQ(prop(kEth0Dns, "RequestedHostname"), "basic-host");
    EXPECT_EQ(prop(kEth0Dns, "DomainName"), "example.org");  // not reported by the host yet

    ASSERT_EQ(modify(kGeneral, with({{"DNSSuffixesToAppend", strings({"corp.example.org", "example.org"})}})), 0);
    EXPECT_EQ(list(kGeneral, "DNSSuffixesToAppend"), (Strings{"corp.example.org", "example.org"}));
}

TEST_F(Companion, ConcurrentModificationsOfDifferentSettingsAreAllKept) {
    const Strings ports = {"eth0", "eth1", "eth2", "br0"};
    auto dhcp = [](const std::string& port) { return "KVRNX_DHCPSettingData.InstanceID=\"Computer%" + port + "%dhcp\""; };
    host();
    std::vector<std::thread> clients;
    for (const std::string& port : ports) {
        clients.emplace_back([&, port] {
            for (int round = 0; round < 10; ++round) {
                ipif::Instance instance;
                instance.path = host_->parsePath(dhcp(port));
                instance.properties = with({{"ConfigurationName", Value::string(port + "-" + std::to_string(round))}});
                EXPECT_EQ(host_->modifyInstance(instance.path, instance).rc, 0);
            }
        });
    }
    for (std::thread& client : clients) client.join();
    for (const std::string& port : ports) EXPECT_EQ(prop(dhcp(port), "ConfigurationName"), port + "-9");
}

TEST_F(Companion, ModifyRefusesValuesThatCouldReachAShellAndClassesThatCannotChange) {
    // The validator itself is the support layer's (tests/support): here, that every modifiable
    // property goes through it with the right extras, and that empty values are refused.
    const std::string eth0Dhcp = "KVRNX_DHCPSettingData.InstanceID=\"Computer%eth0%dhcp\"";
    for (const char* bad : {"a;reboot", "two words", "x\ny", "", "a/b"})
        EXPECT_EQ(modify(kEth0Dns, with({{"RequestedHostname", Value::string(bad)}})), 4) << bad;
    for (const Strings& servers : {Strings{"192.0.2.1", "192.0.2.2;reboot"}, Strings{}, Strings{"192.0.2.1", ""}})
        EXPECT_EQ(modify(kEth0Dns, with({{"DNSServerAddresses", strings(servers)}})), 4);
    EXPECT_EQ(modify(kGeneral, with({{"DNSSuffixesToAppend", strings({"ok.example", "$HOME"})}})), 4);
    EXPECT_EQ(modify(eth0Dhcp, with({{"ConfigurationName", Value::string("x;y")}})), 4);
    EXPECT_FALSE(testfiles::fileExists(settingsFile()));
    EXPECT_EQ(prop(kEth0Dns, "RequestedHostname"), "basic-host");

    EXPECT_EQ(modify(eth0Dhcp, with({{"ConfigurationName", Value::uint16(3)}})), 13);
    EXPECT_EQ(modify("KVRNX_DNSSettingData.InstanceID=\"Computer%eth9%\"", with({})), 6);
    EXPECT_EQ(modify("KVRNX_ComputerSystem.CreationClassName=\"KVRNX_ComputerSystem\",Name=\"" + hostName() + "\"",
                     with({})),
              7);
}

TEST_F(Companion, DNSSAPSAPDependencyLinksEachIPEndpointWithItsDNSEndpointBothWays) {
    const std::string h = hostName();
    const ObjectPath ip = path(endpoint("KVRNX_IPProtocolEndpoint", "KVRNX_ComputerSystem", h, "eth1"));
    const ObjectPath dns = path(endpoint("KVRNX_DNSProtocolEndpoint", "KVRNX_ComputerSystem", h, "eth1"));
    const ObjectPath spIp = path(endpoint("KVRNX_IPProtocolEndpoint", "KVRNX_SPComputerSystem", "BMC:-1", "usb0"));
    const ObjectPath spDns = path(endpoint("KVRNX_DNSProtocolEndpoint", "KVRNX_SPComputerSystem", "BMC:-1", "usb0"));
    const std::string assoc = "KVRNX_DNSSAPSAPDependency";

    expectSamePaths(host().associatorNames(ip, assoc, "KVRNX_DNSProtocolEndpoint").paths, {dns});
    // The IP endpoint comes from the IP interface provider, fetched through the broker.
    ipif::Result far = host().associators(spDns, assoc, "CIM_IPProtocolEndpoint");
    ASSERT_EQ(far.instances.size(), 1u);
    EXPECT_EQ(far.instances[0].path, spIp);
    EXPECT_EQ(text(far.instances[0].properties, "Description"), "BMC usb0");

    for (const ObjectPath& source : {ip, dns}) {
        ipif::Result refs = host().references(source, assoc);
        ASSERT_EQ(refs.instances.size(), 1u);
        expectSamePaths(host().referenceNames(source, assoc).paths, {refs.instances[0].path});
        EXPECT_EQ(refs.instances[0].properties.find("Antecedent")->asReference(), ip);
        EXPECT_EQ(refs.instances[0].properties.find("Dependent")->asReference(), dns);
    }
    // Roles and result classes narrow; a path with only some keys names every endpoint that has them.
    EXPECT_TRUE(host().associatorNames(ip, assoc, "", "Dependent").paths.empty());
    EXPECT_TRUE(host().associatorNames(dns, assoc, "", "", "Dependent").paths.empty());
    EXPECT_TRUE(host().associatorNames(dns, assoc, "KVRNX_DNSProtocolEndpoint").paths.empty());
    EXPECT_TRUE(host().referenceNames(dns, assoc, "Antecedent").paths.empty());
    expectSamePaths(host().associatorNames(dns, "CIM_SAPSAPDependency", "", "Dependent", "Antecedent").paths, {ip});
    expectSamePaths(host().associatorNames(path("KVRNX_IPProtocolEndpoint.Name=\"eth1\""), assoc).paths, {dns});
    const ipif::Result unrelated = host().associatorNames(
        path("KVRNX_ComputerSystem.CreationClassName=\"KVRNX_ComputerSystem\",Name=\"" + h + "\""), assoc);
    EXPECT_TRUE(unrelated.ok() && unrelated.paths.empty()) << unrelated.message;
}

}  // namespace
