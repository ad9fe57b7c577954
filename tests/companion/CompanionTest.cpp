// The companion provider through the embedded host, loaded next to the IP interface provider: the
// objects it serves must be exactly the ones that provider names in its keys and InstanceIDs.
#include <gtest/gtest.h>
#include <stdlib.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "TestFiles.h"
#include "ipif/Host.h"

namespace {

using ipif::CimType;
using ipif::ObjectPath;
using ipif::Value;

std::string hostName() {
    char buffer[256] = {};
    ::gethostname(buffer, sizeof buffer - 1);
    return buffer;
}

std::string text(const ipif::NamedValues& values, const std::string& name) {
    const Value* value = values.find(name);
    return value && !value->isNull() && value->type() == CimType::String ? value->asString() : "<none>";
}

std::vector<std::string> texts(const Value* value) {
    std::vector<std::string> out;
    if (value)
        for (const auto& element : value->elements()) out.push_back(std::get<std::string>(element));
    return out;
}

Value strings(const std::vector<std::string>& values) {
    std::vector<ipif::Element> elements(values.begin(), values.end());
    return Value::array(CimType::String, elements);
}

void expectSamePaths(const std::vector<ObjectPath>& actual, const std::vector<ObjectPath>& expected) {
    EXPECT_EQ(actual.size(), expected.size());
    for (const ObjectPath& path : expected)
        EXPECT_EQ(std::count(actual.begin(), actual.end(), path), 1) << "missing or repeated: " << path.toString();
}

const char* const kClasses[] = {"KVRNX_ComputerSystem",      "KVRNX_SPComputerSystem",    "KVRNX_LANEndpoint",
                                "KVRNX_DHCPSettingData",     "KVRNX_DNSSettingData",      "KVRNX_DNSGeneralSettingData",
                                "KVRNX_DNSProtocolEndpoint", "KVRNX_DNSSAPSAPDependency", "KVRNX_ConcreteJob"};

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
            options.mofPaths = {IPIF_SOURCE_DIR "/mof"};
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
    int modify(const std::string& pathText, const ipif::NamedValues& values,
               const std::vector<std::string>* propertyList = nullptr) {
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

const std::string kEth0Dns = "KVRNX_DNSSettingData.InstanceID=\"Computer%eth0%\"";

TEST_F(Companion, EachClassEnumeratesExactlyTheHostsObjectsAsTheIPProviderNamesThem) {
    // eth01 next to eth0: no setting of one may be taken for the other's.
    useModel(fixture("host-basic.model") +
             "  node 12 eth01 eth01\n    108 string eth01\n    node 29 ip eth01\n      108 string eth01\n");
    const std::string h = hostName();
    expectSamePaths(names("KVRNX_ComputerSystem"),
                    {path("KVRNX_ComputerSystem.CreationClassName=\"KVRNX_ComputerSystem\",Name=\"" + h + "\"")});
    expectSamePaths(names("KVRNX_SPComputerSystem"),
                    {path("KVRNX_SPComputerSystem.CreationClassName=\"KVRNX_SPComputerSystem\",Name=\"BMC:-1\"")});
    std::vector<ObjectPath> lans, dnsEndpoints;
    for (const char* port : {"eth0", "eth1", "eth2", "br0", "eth01"}) {
        lans.push_back(path(endpoint("KVRNX_LANEndpoint", "KVRNX_ComputerSystem", h, port)));
        dnsEndpoints.push_back(path(endpoint("KVRNX_DNSProtocolEndpoint", "KVRNX_ComputerSystem", h, port)));
    }
    lans.push_back(path(endpoint("KVRNX_LANEndpoint", "KVRNX_ComputerSystem", "BMC:-1", "usb0")));
    dnsEndpoints.push_back(path(endpoint("KVRNX_DNSProtocolEndpoint", "KVRNX_SPComputerSystem", "BMC:-1", "usb0")));
    expectSamePaths(names("KVRNX_LANEndpoint"), lans);
    expectSamePaths(names("KVRNX_DNSProtocolEndpoint"), dnsEndpoints);
    expectSamePaths(names("KVRNX_DNSGeneralSettingData"),
                    {path("KVRNX_DNSGeneralSettingData.InstanceID=\"Computer%dnsgeneral\"")});
    expectSamePaths(names("KVRNX_ConcreteJob"), {path("KVRNX_ConcreteJob.InstanceID=\"IPConfigSvcJob:1\"")});
    for (const char* cls : kClasses) {
        ipif::Result all = host().enumerateInstances("root/cimv2", cls);
        ASSERT_TRUE(all.ok()) << cls;
        std::vector<ObjectPath> paths;
        for (const auto& instance : all.instances) paths.push_back(instance.path);
        expectSamePaths(paths, names(cls));
    }

    // The LAN binding names the LAN endpoint of each IP endpoint by the endpoint's Name and
    // SystemName under KVRNX_ComputerSystem; every such path must be there.
    const std::vector<ObjectPath> ipEndpoints = names("KVRNX_IPProtocolEndpoint");
    ASSERT_EQ(ipEndpoints.size(), 6u);
    for (const ObjectPath& ip : ipEndpoints) {
        get(endpoint("KVRNX_LANEndpoint", "KVRNX_ComputerSystem", text(ip.keys, "SystemName"), text(ip.keys, "Name")));
    }
    std::vector<ObjectPath> antecedents;
    for (const ObjectPath& link : names("KVRNX_DNSSAPSAPDependency"))
        antecedents.push_back(link.keys.find("Antecedent")->asReference());
    expectSamePaths(antecedents, ipEndpoints);

    // Applying an assignment setting's InstanceID takes every setting whose InstanceID it contains:
    // exactly one DNS setting, and the DHCP setting for a DHCP configuration only.
    auto ids = [&](const char* cls) {
        std::vector<std::string> out;
        for (const ObjectPath& p : names(cls)) out.push_back(text(p.keys, "InstanceID"));
        return out;
    };
    const std::vector<std::string> dns = ids("KVRNX_DNSSettingData"), dhcp = ids("KVRNX_DHCPSettingData");
    const std::vector<std::string> configurations = ids("KVRNX_IPAssignmentSettingData");
    ASSERT_EQ(configurations.size(), 12u);
    EXPECT_EQ(dns.size(), 6u);
    for (const std::string& configuration : configurations) {
        auto within = [&](const std::string& id) { return configuration.find(id) != std::string::npos; };
        EXPECT_EQ(std::count_if(dns.begin(), dns.end(), within), 1) << configuration;
        const bool isStatic = configuration.find("static") != std::string::npos;
        EXPECT_EQ(std::count_if(dhcp.begin(), dhcp.end(), within), isStatic ? 0 : 1) << configuration;
    }
}

TEST_F(Companion, GetFindsEachObjectByItsFullKeysOnly) {
    for (const char* cls : kClasses) {
        for (const ipif::Instance& instance : host().enumerateInstances("root/cimv2", cls).instances) {
            ipif::Instance got = get(instance.path.toString());
            EXPECT_EQ(got.path, instance.path);
            EXPECT_EQ(got.toMof(), instance.toMof());
        }
    }
    const std::string h = hostName();
    for (const std::string& missing :
         {"KVRNX_ComputerSystem.CreationClassName=\"KVRNX_ComputerSystem\",Name=\"not-" + h + "\"",
          endpoint("KVRNX_LANEndpoint", "KVRNX_ComputerSystem", "BMC:-1", "eth0"),
          endpoint("KVRNX_LANEndpoint", "KVRNX_ComputerSystem", h, "usb0"),
          endpoint("KVRNX_DNSProtocolEndpoint", "KVRNX_ComputerSystem", h, "ETH0"),
          std::string("KVRNX_LANEndpoint.Name=\"eth0\""),
          std::string("KVRNX_DNSSettingData.InstanceID=\"Computer%eth0\""),
          std::string("KVRNX_DHCPSettingData.InstanceID=\"computer%eth0%dhcp\""),
          std::string("KVRNX_ConcreteJob.InstanceID=\"IPConfigSvcJob:2\"")}) {
        EXPECT_EQ(host().getInstance(path(missing)).rc, 6) << missing;
    }
    // Class names in keys are names of classes, whatever their case.
    get("KVRNX_ComputerSystem.CreationClassName=\"kvrnx_computersystem\",Name=\"" + h + "\"");

    EXPECT_EQ(texts(get("KVRNX_DNSGeneralSettingData.InstanceID=\"Computer%dnsgeneral\"")
                        .properties.find("DNSSuffixesToAppend")),
              (std::vector<std::string>{"example.com", "lab.example.com"}));
    ipif::Instance job = get("KVRNX_ConcreteJob.InstanceID=\"IPConfigSvcJob:1\"");
    EXPECT_EQ(job.properties.find("JobState")->asUnsigned(), 7u);
}

TEST_F(Companion, AServiceProcessorIsOnlyANodeDescribedExactlyBMC) {
    useModel(fixture("host-empty.model"));
    EXPECT_EQ(names("KVRNX_ComputerSystem").size(), 1u);
    for (const char* cls : {"KVRNX_SPComputerSystem", "KVRNX_LANEndpoint", "KVRNX_DNSSettingData",
                            "KVRNX_DHCPSettingData", "KVRNX_DNSProtocolEndpoint", "KVRNX_DNSSAPSAPDependency"})
        EXPECT_TRUE(names(cls).empty()) << cls;
    EXPECT_EQ(
        host()
            .getInstance(path("KVRNX_SPComputerSystem.CreationClassName=\"KVRNX_SPComputerSystem\",Name=\"BMC:-1\""))
            .rc,
        6);
    EXPECT_TRUE(texts(get("KVRNX_DNSGeneralSettingData.InstanceID=\"Computer%dnsgeneral\"")
                          .properties.find("DNSSuffixesToAppend"))
                    .empty());

    useModel(
        "node 40 host \"Host computer system\"\n"
        "  node 41 bmc \"BMC \"\n"
        "    node 12 usb0 usb0\n"
        "      108 string usb0\n");
    EXPECT_TRUE(names("KVRNX_SPComputerSystem").empty());
    expectSamePaths(names("KVRNX_LANEndpoint"),
                    {path(endpoint("KVRNX_LANEndpoint", "KVRNX_ComputerSystem", hostName(), "usb0"))});
}

TEST_F(Companion, ModifiedDNSValuesAreKeptUntilTheHostReportsThem) {
    ipif::NamedValues change;
    change.set("RequestedHostname", Value::string("newhost"));
    change.set("DNSServerAddresses", strings({"192.0.2.53", "2001:db8::53"}));
    change.set("ConfigurationName", Value::string(""));
    ASSERT_EQ(modify(kEth0Dns, change), 0);
    ipif::Instance eth0 = get(kEth0Dns);
    EXPECT_EQ(text(eth0.properties, "RequestedHostname"), "newhost");
    EXPECT_EQ(text(eth0.properties, "DomainName"), "example.com");
    EXPECT_EQ(texts(eth0.properties.find("DNSServerAddresses")),
              (std::vector<std::string>{"192.0.2.53", "2001:db8::53"}));
    EXPECT_EQ(text(eth0.properties, "ConfigurationName"), "");
    // Nothing reaches the host before the setting is applied, and other settings keep the host's values.
    EXPECT_NE(model().find("97 string basic-host"), std::string::npos);
    EXPECT_EQ(text(get("KVRNX_DNSSettingData.InstanceID=\"Computer%eth1%\"").properties, "RequestedHostname"),
              "basic-host");

    // With a property list only the listed properties change; a listed property left out goes back to the host's value.
    ipif::NamedValues domain;
    domain.set("DomainName", Value::string("example.org"));
    domain.set("RequestedHostname", Value::string("ignored"));
    const std::vector<std::string> list = {"DomainName", "DNSServerAddresses"};
    ASSERT_EQ(modify(kEth0Dns, domain, &list), 0);
    eth0 = get(kEth0Dns);
    EXPECT_EQ(text(eth0.properties, "DomainName"), "example.org");
    EXPECT_EQ(text(eth0.properties, "RequestedHostname"), "newhost");
    EXPECT_EQ(texts(eth0.properties.find("DNSServerAddresses")),
              (std::vector<std::string>{"192.168.1.1", "10.0.0.53"}));

    // Once the host reports the requested name it is dropped, so the setting follows later host changes.
    std::string renamed = fixture("host-basic.model");
    renamed.replace(renamed.find("97 string basic-host"), 20, "97 string newhost");
    useModel(renamed);
    EXPECT_EQ(text(get(kEth0Dns).properties, "RequestedHostname"), "newhost");
    EXPECT_EQ(testfiles::readFile(settingsFile()).find("RequestedHostname"), std::string::npos);
    useModel(fixture("host-basic.model"));
    eth0 = get(kEth0Dns);
    EXPECT_EQ(text(eth0.properties, "RequestedHostname"), "basic-host");
    EXPECT_EQ(text(eth0.properties, "DomainName"), "example.org");  // not reported by the host yet

    const std::string general = "KVRNX_DNSGeneralSettingData.InstanceID=\"Computer%dnsgeneral\"";
    ipif::NamedValues suffixes;
    suffixes.set("DNSSuffixesToAppend", strings({"corp.example.org", "example.org"}));
    ASSERT_EQ(modify(general, suffixes), 0);
    EXPECT_EQ(texts(get(general).properties.find("DNSSuffixesToAppend")),
              (std::vector<std::string>{"corp.example.org", "example.org"}));
    ipif::NamedValues named;
    named.set("ConfigurationName", Value::string("lab-dhcp"));
    ASSERT_EQ(modify("KVRNX_DHCPSettingData.InstanceID=\"BMC%usb0%dhcp\"", named), 0);
    EXPECT_EQ(text(get("KVRNX_DHCPSettingData.InstanceID=\"BMC%usb0%dhcp\"").properties, "ConfigurationName"),
              "lab-dhcp");
}

TEST_F(Companion, ApplyingAConfigurationTakesTheModifiedDNSValuesToTheHost) {
    ipif::NamedValues change;
    change.set("RequestedHostname", Value::string("applied-host"));
    change.set("DomainName", Value::string("example.net"));
    ASSERT_EQ(modify("KVRNX_DNSSettingData.InstanceID=\"Computer%eth1%\"", change), 0);
    const std::string h = hostName();
    ipif::Args in;
    in.set("Configuration", Value::reference(path("KVRNX_IPAssignmentSettingData.InstanceID=\"Computer%eth1%dhcp\"")));
    in.set("Endpoint", Value::reference(path(endpoint("KVRNX_IPProtocolEndpoint", "KVRNX_ComputerSystem", h, "eth1"))));
    ipif::Result applied = host().invokeMethod(
        path(endpoint("KVRNX_IPConfigurationService", "KVRNX_ComputerSystem", h, "IPConfigService")),
        "ApplySettingToIPProtocolEndpoint", in);
    ASSERT_TRUE(applied.ok()) << applied.message;
    EXPECT_EQ(applied.returnValue.asUnsigned(), 0u);
    EXPECT_NE(model().find("97 string applied-host"), std::string::npos);
    EXPECT_NE(model().find("98 string example.net"), std::string::npos);
    // Applied values are the host's now; the setting no longer keeps them.
    EXPECT_EQ(text(get("KVRNX_DNSSettingData.InstanceID=\"Computer%eth1%\"").properties, "RequestedHostname"),
              "applied-host");
    EXPECT_EQ(testfiles::readFile(settingsFile()).find("Computer%eth1%"), std::string::npos);
}

TEST_F(Companion, ConcurrentModificationsOfDifferentSettingsAreAllKept) {
    const std::vector<std::string> ports = {"eth0", "eth1", "eth2", "br0"};
    host();
    std::vector<std::thread> clients;
    for (const std::string& port : ports) {
        clients.emplace_back([this, port] {
            for (int round = 0; round < 10; ++round) {
                ipif::NamedValues change;
                change.set("ConfigurationName", Value::string(port + "-" + std::to_string(round)));
                ipif::Instance instance;
                instance.path = host_->parsePath("KVRNX_DHCPSettingData.InstanceID=\"Computer%" + port + "%dhcp\"");
                instance.properties = change;
                EXPECT_EQ(host_->modifyInstance(instance.path, instance).rc, 0);
            }
        });
    }
    for (std::thread& client : clients) client.join();
    for (const std::string& port : ports)
        EXPECT_EQ(text(get("KVRNX_DHCPSettingData.InstanceID=\"Computer%" + port + "%dhcp\"").properties,
                       "ConfigurationName"),
                  port + "-9");
}

TEST_F(Companion, ModifyRefusesValuesThatCouldReachAShellAndClassesThatCannotChange) {
    for (const char* bad : {"a;reboot", "$(reboot)", "`id`", "two words", "x\ny", "a|b", "a>b", "'q'", "\"q\"", "a\tb",
                            "a&b", "a*", "", "a/b"}) {
        ipif::NamedValues change;
        change.set("RequestedHostname", Value::string(bad));
        EXPECT_EQ(modify(kEth0Dns, change), 4) << bad;
    }
    for (const std::vector<std::string>& servers :
         {std::vector<std::string>{"192.0.2.1", "192.0.2.2;reboot"}, std::vector<std::string>{},
          std::vector<std::string>{"192.0.2.1", ""}}) {
        ipif::NamedValues change;
        change.set("DNSServerAddresses", strings(servers));
        EXPECT_EQ(modify(kEth0Dns, change), 4);
    }
    ipif::NamedValues suffix, name, number;
    suffix.set("DNSSuffixesToAppend", strings({"ok.example", "$HOME"}));
    EXPECT_EQ(modify("KVRNX_DNSGeneralSettingData.InstanceID=\"Computer%dnsgeneral\"", suffix), 4);
    name.set("ConfigurationName", Value::string("x;y"));
    EXPECT_EQ(modify("KVRNX_DHCPSettingData.InstanceID=\"Computer%eth0%dhcp\"", name), 4);
    EXPECT_FALSE(testfiles::fileExists(settingsFile()));
    EXPECT_EQ(text(get(kEth0Dns).properties, "RequestedHostname"), "basic-host");

    number.set("ConfigurationName", Value::uint16(3));
    EXPECT_EQ(modify("KVRNX_DHCPSettingData.InstanceID=\"Computer%eth0%dhcp\"", number, nullptr), 13);
    EXPECT_EQ(modify("KVRNX_DNSSettingData.InstanceID=\"Computer%eth9%\"", name), 6);
    EXPECT_EQ(modify("KVRNX_ComputerSystem.CreationClassName=\"KVRNX_ComputerSystem\",Name=\"" + hostName() + "\"",
                     ipif::NamedValues()),
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
    expectSamePaths(host().associatorNames(spDns, assoc).paths, {spIp});
    // The IP endpoint comes from the IP interface provider, fetched through the broker.
    ipif::Result far = host().associators(spDns, assoc, "CIM_IPProtocolEndpoint");
    ASSERT_EQ(far.instances.size(), 1u);
    EXPECT_EQ(far.instances[0].path, spIp);
    EXPECT_EQ(text(far.instances[0].properties, "Description"), "BMC usb0");
    ipif::Result dnsEnd = host().associators(ip, assoc);
    ASSERT_EQ(dnsEnd.instances.size(), 1u);
    EXPECT_EQ(text(dnsEnd.instances[0].properties, "Hostname"), "basic-host");

    for (const ObjectPath& source : {ip, dns}) {
        ipif::Result refs = host().references(source, assoc);
        ipif::Result refNames = host().referenceNames(source, assoc);
        ASSERT_EQ(refs.instances.size(), 1u);
        expectSamePaths(refNames.paths, {refs.instances[0].path});
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
    ipif::Result unrelated = host().associatorNames(
        path("KVRNX_ComputerSystem.CreationClassName=\"KVRNX_ComputerSystem\",Name=\"" + h + "\""), assoc);
    EXPECT_TRUE(unrelated.ok());
    EXPECT_TRUE(unrelated.paths.empty());
}

}  // namespace
