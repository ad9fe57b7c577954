// ApplySettingToIPProtocolEndpoint end to end: the embedded host loads the built provider and its
// companion (DHCP and DNS settings, DNS endpoints) over a fixture host, and every command the
// method would run is only recorded.
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdio>
#include <filesystem>
#include <memory>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "Nx/HostModel.h"
#include "TestFiles.h"
#include "ipif/Host.h"
#include "models_fixture.h"

namespace fs = std::filesystem;
using ipif::Value;

namespace {

const char* const kMethod = "ApplySettingToIPProtocolEndpoint";

std::vector<std::string> lines(const std::string& text) {
    std::vector<std::string> out;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);) out.push_back(line);
    return out;
}

class ApplyMethod : public ::testing::Test {
protected:
    // Providers keep the host model they first open, so the fixture keeps one path per process.
    static fs::path modelDir() { return fs::temp_directory_path() / ("ipif-apply-" + std::to_string(::getpid())); }
    static void TearDownTestSuite() { fs::remove_all(modelDir()); }

    // A fresh fixture under the same path; renamed into place so that every reader sees a new file.
    void hostModel(const std::string& from, const std::string& to) {
        std::string model = testfiles::readFile(std::string(IPIF_TEST_FIXTURES) + "/host-basic.model");
        if (!from.empty()) model.replace(model.find(from), from.size(), to);
        testfiles::writeFile(model_ + ".new", model);
        fs::rename(model_ + ".new", model_);
    }
    Nx::HostModel::PropertyValue node(const std::string& path, unsigned property) const {
        auto tree = Nx::HostModel::open("fixture:" + model_)->snapshot();
        return tree->nodes.at(static_cast<size_t>(tree->find(path))).properties.at(property);
    }

    ipif::Host& host() {
        if (!host_) {
            ipif::HostOptions options;
            options.mofPaths = testfiles::projectMofPaths();
            options.regPaths = {std::string(IPIF_SOURCE_DIR) + "/mof"};
            options.providerDirs = {IPIF_BINARY_DIR};
            // A sanitizer runtime starts its own lasting thread at the first thread the process
            // creates; have that happen before the Host counts the threads it does not own.
            std::thread([] {}).join();
            host_ = std::make_unique<ipif::Host>(options);
        }
        return *host_;
    }
    std::string servicePath() const {
        return "KVRNX_IPConfigurationService.SystemCreationClassName=\"KVRNX_ComputerSystem\",SystemName=\"" +
               modeltest::hostName() + "\",CreationClassName=\"KVRNX_IPConfigurationService\",Name=\"IPConfigService\"";
    }
    std::string endpointPath(const std::string& name, const char* cls = "KVRNX_IPProtocolEndpoint",
                             const std::string& system = modeltest::hostName()) const {
        return std::string(cls) + ".SystemCreationClassName=\"KVRNX_ComputerSystem\",SystemName=\"" + system +
               "\",CreationClassName=\"KVRNX_IPProtocolEndpoint\",Name=\"" + name + "\"";
    }
    Value ref(const std::string& path) { return Value::reference(ipif::ObjectPath::parse(path)); }
    ipif::Args args(Value configuration, Value endpoint) {
        ipif::Args in;
        in.set("Configuration", std::move(configuration));
        in.set("Endpoint", std::move(endpoint));
        return in;
    }
    ipif::Args apply(const std::string& configurationId, const std::string& endpoint = "eth0") {
        const char* cls = configurationId.find("static") != std::string::npos ? "KVRNX_StaticIPAssignmentSettingData"
                                                                              : "KVRNX_DHCPSettingData";
        return args(ref(std::string(cls) + ".InstanceID=\"" + configurationId + "\""), ref(endpointPath(endpoint)));
    }
    ipif::Result invoke(const ipif::Args& in, const char* method = kMethod) {
        ipif::Result r = host().invokeMethod(host().parsePath(servicePath()), method, in);
        EXPECT_TRUE(host().waitForProviderThreads(std::chrono::seconds(10)));
        return r;
    }
    // Changes a setting the companion serves, as a client does before applying it.
    void modify(const std::string& path, const char* property, Value value) {
        ipif::Instance instance;
        instance.path = host().parsePath(path);
        instance.properties.set(property, std::move(value));
        ASSERT_EQ(host().modifyInstance(instance.path, instance).rc, 0) << path << " " << property;
    }
    std::vector<std::string> commands() const { return lines(testfiles::readFile(scratch.file("commands"))); }

    testfiles::ScratchDir scratch;
    std::string model_ = (fs::create_directories(modelDir()), (modelDir() / "host.model").string());
    testfiles::ScopedEnv env[6] = {{"IPIF_HOST_MODEL", "fixture:" + model_},
                                   {"IPIF_DATA_DIR", scratch.path() + "/"},
                                   {"IPIF_ROOT", scratch.path()},
                                   {"IPIF_COMMANDS", "record:" + scratch.file("commands")},
                                   {"IPIF_LOG_FILE", scratch.file("log")},
                                   {"IPIF_LOG_LEVEL", "6000"}};
    std::unique_ptr<ipif::Host> host_;
};

const std::string kRpm = "rpm -qa | grep NetworkManager*";

TEST_F(ApplyMethod, RefusalsAnswerWithTheirCodesAndTouchNothing) {
    struct Case {
        const char* what;
        ipif::Args in;
        const char* method;
        int rc;
        const char* message;
        unsigned ret;
        std::vector<std::string> commands;
        bool noHostName = false;
    };
    const Value null = Value::null(ipif::CimType::Reference);
    const Value dhcp = ref("KVRNX_DHCPSettingData.InstanceID=\"Computer%eth0%dhcp\"");
    const char* const noHostName = "Configuration Cannot be applied since hostname is empty";
    const Case cases[] = {
        {"Configuration of string type", args(Value::string("Computer%eth0%dhcp"), ref(endpointPath("eth0"))),
         kMethod, 4, "Invalid Type of Parameter", 4, {}},
        {"no Endpoint at all", [&] { ipif::Args in; in.set("Configuration", dhcp); return in; }(), kMethod, 4,
         "Invalid Type of Parameter", 4, {}},
        {"null Configuration", args(null, ref(endpointPath("eth0"))), kMethod, 4,
         "Configuration Parameter passed has NULL value", 4, {}},
        {"null Endpoint fails, yet returns 4", args(dhcp, null), kMethod, 1, "Endpoint Parameter passed has NULL value",
         4, {}},
        {"bridge: nothing done, nothing said", apply("Computer%br0%dhcp", "br0"), kMethod, 0, "", 1, {}},
        {"endpoint that makes no instance", args(dhcp, ref(endpointPath("eth0", "KVRNX_NoSuchEndpoint"))), kMethod, 1,
         "Failed to get the IP Protocol instance", 2, {}},
        {"other method", apply("Computer%eth0%dhcp"), "RequestStateChange", 17, "", 17, {}},
        // Refused after the NetworkManager check, whatever the setting.
        {"endpoint without a DNS client: no host name gathered",
         args(dhcp, ref(endpointPath("eth0", "KVRNX_IPProtocolEndpoint", "elsewhere"))), kMethod, 1, noHostName, 4,
         {kRpm}},
        {"host without a host name", apply("Computer%eth0%dhcp"), kMethod, 1, noHostName, 4, {kRpm}, true},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        hostModel(c.noHostName ? "97 string basic-host" : "", "97 string \"\"");
        fs::remove(scratch.file("commands"));
        ipif::Result r = invoke(c.in, c.method);
        EXPECT_EQ(r.rc, c.rc);
        EXPECT_EQ(r.message, c.message);
        ASSERT_TRUE(r.hasReturnValue);
        EXPECT_EQ(r.returnValue.toText(), std::to_string(c.ret));
        EXPECT_FALSE(r.outArgs.find("Job"));
        EXPECT_EQ(commands(), c.commands);
        EXPECT_EQ(node("/host/eth0/ip", 24).number, 3u);  // eth0 stays static
    }
}

TEST_F(ApplyMethod, AppliesTheSettingAndRebootsOnlyAnUnnamedConfigurationThatNeedsIt) {
    struct Case {
        const char* what;
        const char* ifcfg;  // the static setting of eth0, from its interface file
        const char* configurationId;
        const char* dhcpName;  // ConfigurationName given to eth0's DHCP setting
        unsigned ret;
        bool reboots;
        const char* address;
        unsigned origin;
    };
    const Case cases[] = {
        {"named static, new address: left for the administrator", "IPV4ADDR=192.168.1.77\nCONFIG_NAME=office\n",
         "Computer%eth0%static", "lab", 5, false, "192.168.1.77", 3},
        {"unnamed static, new address: rebooted", "IPV4ADDR=192.168.1.77\n", "Computer%eth0%static", "lab", 0, true,
         "192.168.1.77", 3},
        {"named static, same address", "IPV4ADDR=192.168.1.10\nCONFIG_NAME=office\n", "Computer%eth0%static", "lab",
         0, false, "192.168.1.10", 3},
        {"named DHCP on a static interface", "", "Computer%eth0%dhcp", "lab", 5, false, "192.168.1.10", 1},
        {"unnamed DHCP on a static interface", "", "Computer%eth0%dhcp", "", 0, true, "192.168.1.10", 1},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        hostModel("", "");
        fs::remove(scratch.file("commands"));
        testfiles::writeFile(scratch.file("ifcfg-eth0"), c.ifcfg);
        modify("KVRNX_DNSSettingData.InstanceID=\"Computer%eth0%\"", "RequestedHostname", Value::string("renamed"));
        modify("KVRNX_DHCPSettingData.InstanceID=\"Computer%eth0%dhcp\"", "ConfigurationName",
               Value::string(c.dhcpName));
        // The one general DNS setting is taken whatever the configuration is called.
        modify("KVRNX_DNSGeneralSettingData.InstanceID=\"Computer%dnsgeneral\"", "DNSSuffixesToAppend",
               Value::array(ipif::CimType::String, {ipif::Element(std::string("corp.example"))}));

        ipif::Result r = invoke(apply(c.configurationId));
        EXPECT_EQ(r.rc, 0) << r.message;
        EXPECT_EQ(r.returnValue.toText(), std::to_string(c.ret));
        const Value* job = r.outArgs.find("Job");
        ASSERT_TRUE(job);
        EXPECT_EQ(job->asReference().toStringWithoutNamespace(), "KVRNX_ConcreteJob.InstanceID=\"IPConfigSvcJob:1\"");
        std::vector<std::string> expected = {kRpm};
        if (c.reboots) expected.push_back("reboot");
        EXPECT_EQ(commands(), expected);
        EXPECT_EQ(node("/host", 97).text, "renamed");
        EXPECT_EQ(node("/host", 99).list, std::vector<std::string>{"corp.example"});
        EXPECT_EQ(node("/host/eth0/ip", 25).text, c.address);
        EXPECT_EQ(node("/host/eth0/ip", 24).number, c.origin);
    }
}

// Through ipif, with every command recorded; the package list names NetworkManager only when the
// command is given an answer.
TEST_F(ApplyMethod, IpifShowsTheReturnValueAndTheJob) {
    hostModel("", "");
    testfiles::writeFile(scratch.file("ifcfg-eth0"), "IPV4ADDR=192.168.1.77\nCONFIG_NAME=office\n");
    auto quoted = [](const std::string& text) {
        std::string out = "'";
        for (char c : text) out += c == '\'' ? std::string("'\\''") : std::string(1, c);
        return out + "'";
    };
    const std::string configuration = "KVRNX_StaticIPAssignmentSettingData.InstanceID=\"Computer%eth0%static\"";
    const std::string command = std::string(IPIF_BINARY_DIR) + "/cli/ipif cm " + quoted(servicePath()) + " " +
                                kMethod + " " + quoted("Configuration=" + configuration) + " " +
                                quoted("Endpoint=" + endpointPath("eth0")) + " 2>&1";
    // The output, and whether ipif succeeded.
    auto run = [](const std::string& line, std::string& output) {
        output.clear();
        FILE* pipe = ::popen(line.c_str(), "r");
        if (!pipe) return false;
        char buffer[512];
        while (std::fgets(buffer, sizeof buffer, pipe)) output += buffer;
        return ::pclose(pipe) == 0;
    };
    std::string output;
    testfiles::writeFile(scratch.file("answers"), std::string(kRpm) + "\tNetworkManager-glib-0.7.0\n");
    EXPECT_FALSE(run("IPIF_COMMAND_ANSWERS=" + scratch.file("answers") + " " + command, output)) << output;
    EXPECT_EQ(output,
              "ReturnValue = 4;\n"
              "ipif: error: rc 1 (CMPI_RC_ERR_FAILED): Configuration Cannot be Applied since NetworkManager Tool "
              "is present in Endpoint\n");
    EXPECT_EQ(commands(), std::vector<std::string>{kRpm});
    EXPECT_EQ(node("/host/eth0/ip", 25).text, "192.168.1.10");

    fs::remove(scratch.file("commands"));
    // Applied, but the host needs a reboot: ipif prints the result and fails on the nonzero code.
    EXPECT_FALSE(run(command, output)) << output;
    EXPECT_EQ(output,
              "ReturnValue = 5;\n"
              "Job = \"root/cimv2:KVRNX_ConcreteJob.InstanceID=\\\"IPConfigSvcJob:1\\\"\";\n"
              "ipif: error: KVRNX_IPConfigurationService.ApplySettingToIPProtocolEndpoint returned 5\n");
    EXPECT_EQ(commands(), std::vector<std::string>{kRpm});
    EXPECT_EQ(node("/host/eth0/ip", 25).text, "192.168.1.77");
}

}  // namespace
