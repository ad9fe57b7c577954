// Applying a gathered configuration to a fixture host, the host checks and the reboot thread, with
// every command answered and recorded by a test runner instead of running.
#include <gtest/gtest.h>
#include <pthread.h>

#include <filesystem>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "CMPI/ApplyConfiguration.h"
#include "CMPI/CMPIIPConfigurationService.h"
#include "Nx/HostModel.h"
#include "Nx/PlatformUtilities.h"
#include "TestFiles.h"

namespace ip = Nx::IPInterfaceProvider;
using Nx::HostModel::PropertyValue;

namespace {

// Passes writes on to a fixture backend and keeps them as "node property value" lines.
class RecordingBackend : public Nx::HostModel::Backend {
public:
    explicit RecordingBackend(std::shared_ptr<Nx::HostModel::Backend> inner) : inner_(std::move(inner)) {}
    std::shared_ptr<const Nx::HostModel::Tree> snapshot() override { return inner_->snapshot(); }
    bool write(const std::string& path, unsigned int property, const PropertyValue& value) override {
        std::string text = value.kind == PropertyValue::Kind::Unsigned ? std::to_string(value.number) : value.text;
        for (const auto& item : value.list) text += (&item == &value.list.front() ? "" : ",") + item;
        writes.push_back(path + " " + std::to_string(property) + " " + text);
        return inner_->write(path, property, value);
    }
    std::string describe() const override { return "recording"; }
    std::vector<std::string> writes;

private:
    std::shared_ptr<Nx::HostModel::Backend> inner_;
};

class ApplyHost : public ::testing::Test {
protected:
    ApplyHost() {
        resetHost();
        Nx::PlatformUtilities::setCommandRunner([this](const std::string& command, std::string& output) {
            commands.push_back(command);
            output = answers[command];
            return true;
        });
    }
    ~ApplyHost() override {
        Nx::PlatformUtilities::setCommandRunner(nullptr);
        Nx::HostModel::setCurrent(nullptr);
    }
    // A fresh copy of the fixture behind a fresh backend, and nothing recorded yet.
    void resetHost() {
        std::filesystem::copy_file(std::string(IPIF_TEST_FIXTURES) + "/host-basic.model", fixture,
                                   std::filesystem::copy_options::overwrite_existing);
        inner = Nx::HostModel::open("fixture:" + fixture);
        backend = std::make_shared<RecordingBackend>(inner);
        Nx::HostModel::setCurrent(backend);
        std::filesystem::remove_all(root.path() + "/etc");
        answers.clear();
        commands.clear();
    }
    void makeEsxHost() {
        std::filesystem::create_directories(root.path() + "/etc");
        testfiles::writeFile(root.file("etc/vmware-release"), "VMware ESX 4.1.0 build-260247\n");
        answers["cat /etc/vmware-release | grep 4"] = "VMware ESX 4.1.0 build-260247\n";
    }

    testfiles::ScratchDir root;
    testfiles::ScopedEnv rootEnv{"IPIF_ROOT", root.path()};
    std::string fixture = root.file("host.model");
    std::shared_ptr<Nx::HostModel::Backend> inner;
    std::shared_ptr<RecordingBackend> backend;
    std::map<std::string, std::string> answers;
    std::vector<std::string> commands;
};

const char* const kRestart = "/etc/init.d/network restart ";

struct ApplyCase {
    const char* what;
    ip::IP_CONFIG_DATA record;
    bool esx;
    unsigned eth1Origin;  // eth1 is DHCP (1) on the fixture; 0 makes its origin unknown
    bool reboot;
    std::vector<std::string> writes;
    std::vector<std::string> commands;
};

ip::IP_CONFIG_DATA record(const char* name, unsigned short origin, const char* ip = "", const char* mask = "",
                          const char* gateway = "") {
    ip::IP_CONFIG_DATA r;
    r.name = name;
    r.addr_origin = origin;
    r.ipAddress = ip;
    r.subnet_mask = mask;
    r.ipGateway = gateway;
    return r;
}

ip::IP_CONFIG_DATA withDns(ip::IP_CONFIG_DATA r) {
    r.dnsHostName = "renamed";
    r.dnsDomainName = "corp.example";
    r.dnsServers = {"10.9.9.9", "10.9.9.8"};
    r.dnsSuffixes = {"corp.example"};
    return r;
}

ip::IP_CONFIG_DATA withIPv6(ip::IP_CONFIG_DATA r, const char* address, const char* gateway) {
    r.ipv6Address = address;
    r.ipv6Gateway = gateway;
    r.ipv6_prefix = 64;
    return r;
}

TEST_F(ApplyHost, WritesWhatWasAskedAndDecidesBetweenRebootAndNetworkRestart) {
    const std::string e0 = "/host/eth0/ip ", e1 = "/host/eth1/ip ", e2 = "/host/eth2/ip ";
    const std::vector<ApplyCase> cases = {
        {"same static address: written again, no reboot", record("eth0", 3, "192.168.1.10"), false, 1, false,
         {e0 + "25 192.168.1.10"}, {}},
        {"suffix after _ names the interface; new address reboots", record("eth0_static", 3, "192.168.1.99",
         "255.255.0.0", "192.168.1.254"), false, 1, true,
         {e0 + "25 192.168.1.99", e0 + "26 255.255.0.0", e0 + "100 192.168.1.254"}, {}},
        {"static to DHCP reboots without any address", record("eth0", 4), false, 1, true, {e0 + "24 1"}, {}},
        {"DHCP on DHCP: nothing to write", record("eth1", 4), false, 1, false, {}, {}},
        {"host-wide DNS changes go to the system node, no reboot", withDns(record("eth1", 4)), false, 1, false,
         {"/host 94 10.9.9.9,10.9.9.8", "/host 99 corp.example", "/host 97 renamed", "/host 98 corp.example"}, {}},
        {"unknown origin and no address change restarts the network", record("eth1", 3, "10.0.0.17"), false, 0,
         false, {e1 + "24 3", e1 + "25 10.0.0.17"}, {kRestart}},
        {"unknown origin with a new address reboots instead", record("eth1", 3, "10.0.0.18"), false, 0, true,
         {e1 + "24 3", e1 + "25 10.0.0.18"}, {}},
        {"gateway change alone: no reboot, no restart", record("eth0", 3, "", "", "192.168.1.2"), false, 1, false,
         {e0 + "100 192.168.1.2"}, {}},
        {"unknown interface", record("eth9", 3, "192.168.1.99"), false, 0, false, {}, {}},
        {"new IPv6 address reboots; unchanged gateway not written",
         withIPv6(record("eth2", 3), "2001:db8:5::21", "2001:db8:5::1"), false, 1, true,
         {e2 + "27 2001:db8:5::21", e2 + "102 64"}, {}},
        {"same IPv6 address", withIPv6(record("eth2", 3), "2001:db8:5::20", "2001:db8:5::2"), false, 1, false,
         {e2 + "101 2001:db8:5::2", e2 + "27 2001:db8:5::20", e2 + "102 64"}, {}},
        {"ESX 4.1 takes address/prefix, so the same address differs",
         withIPv6(record("eth2", 3), "2001:db8:5::20", ""), true, 1, true,
         {e2 + "27 2001:db8:5::20/64", e2 + "102 64"}, {"cat /etc/vmware-release | grep 4"}},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        resetHost();
        ASSERT_TRUE(inner->write("/host/eth1/ip", 24, PropertyValue::ofNumber(c.eth1Origin)));
        if (c.esx) makeEsxHost();

        ip::IP_CONFIG_DATA data = c.record;
        EXPECT_EQ(ip::isSystemRebootRequired(&data), c.reboot);
        EXPECT_EQ(backend->writes, c.writes);
        EXPECT_EQ(commands, c.commands);
    }
}

// The NetworkManager check itself is seen through ipif (apply_method_test.cpp).
TEST_F(ApplyHost, HostChecksReadCommandOutputAndTheNodeTree) {
    // No release file: not ESX, and nothing is run; with one, any "4" in the grep's output counts.
    EXPECT_FALSE(ip::checkESX4_1Release());
    EXPECT_TRUE(commands.empty());
    makeEsxHost();
    answers["cat /etc/vmware-release | grep 4"] = "VMware ESX Server 3.5.0 build-64607\n";
    EXPECT_TRUE(ip::checkESX4_1Release());
    answers["cat /etc/vmware-release | grep 4"] = "";
    EXPECT_FALSE(ip::checkESX4_1Release());

    EXPECT_TRUE(ip::checkIfbridgeInteface("br0"));
    EXPECT_FALSE(ip::checkIfbridgeInteface("eth0"));
    EXPECT_FALSE(ip::checkIfbridgeInteface("br"));
    ASSERT_TRUE(inner->write("/host/br0/ip", 108, PropertyValue::ofText("br0x")));
    EXPECT_FALSE(ip::checkIfbridgeInteface("br0"));

    // With NetworkManager installed only a request that keeps the addresses is supported.
    answers["rpm -qa | grep NetworkManager*"] = "NetworkManager-glib-0.7.0-10.el5\n";
    EXPECT_FALSE(ip::isConfigurationSupportedOnRedhat(nullptr));
    ip::IP_CONFIG_DATA keep = record("eth0_static", 3, "192.168.1.10"), change = record("eth0", 3, "192.168.1.99"),
                       unknown = record("eth9", 3);
    EXPECT_TRUE(ip::isConfigurationSupportedOnRedhat(&keep));
    EXPECT_FALSE(ip::isConfigurationSupportedOnRedhat(&change));
    EXPECT_FALSE(ip::isConfigurationSupportedOnRedhat(&unknown));
    answers["rpm -qa | grep NetworkManager*"] = "";
    EXPECT_TRUE(ip::isConfigurationSupportedOnRedhat(&change));
}

TEST_F(ApplyHost, RebootThreadWritesNineToTheSystemNode) {
    pthread_t thread;
    ASSERT_EQ(pthread_create(&thread, nullptr, ip::SystemRebootThread, nullptr), 0);
    ASSERT_EQ(pthread_join(thread, nullptr), 0);
    EXPECT_EQ(backend->writes, std::vector<std::string>{"/host 123 9"});
    // The fixture turns the write into a reboot request instead of storing it.
    EXPECT_EQ(commands, std::vector<std::string>{"reboot"});
    EXPECT_EQ(inner->snapshot()->nodes.front().properties.at(123).number, 1u);
}

}  // namespace
