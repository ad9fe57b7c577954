// What the live backend and the provider's models write into ifcfg files, and what they read back,
// for interfaces a real kernel names and addresses (inside the test's network namespace).
#include <gtest/gtest.h>

#include <filesystem>
#include <string>

#include "CMPI/ApplyConfiguration.h"
#include "LiveNamespace.h"
#include "Lindows/StaticIPAssignmentSettingData.h"
#include "Nx/Instrumentation.h"
#include "Nx/LiveBackend.h"
#include "Nx/PropertyFile.h"
#include "Nx/String.h"

namespace {

using namespace livetest;
namespace ip = Nx::IPInterfaceProvider;
namespace P = Nx::NodeLexicon;

class LiveIfcfg : public LiveNamespace {
protected:
    void SetUp() override {
        LiveNamespace::SetUp();
        if (IsSkipped() || HasFatalFailure()) return;
        Nx::HostModel::setCurrent(Nx::HostModel::openLiveBackend());
    }
    void TearDown() override {
        Nx::HostModel::setCurrent(nullptr);  // its netlink sockets hold the namespace
        for (const char* name : {"IFNAME", "IFNAME2", "IFCFG", "IPIF_DATA_DIR"}) ::unsetenv(name);
        LiveNamespace::TearDown();
    }

    // A veth pair whose names reach ip(8) through the environment, untouched by any shell.
    void addVeth(const std::string& name, const std::string& peer) {
        ::setenv("IFNAME", name.c_str(), 1);
        ::setenv("IFNAME2", peer.c_str(), 1);
        sh("ip link add \"$IFNAME\" type veth peer name \"$IFNAME2\"");
    }

    // The interface's endpoint node, or a cursor past the end.
    static Nx::Instrumentation endpoint(const std::string& name) {
        Nx::Instrumentation node;
        for (node.selectNode(P::IPEndpointNode); node; ++node) {
            std::string element;
            if (node.getProperty(P::ElementName, element) && element == name) break;
        }
        return node;
    }

    // What bash makes of DEVICE when it sources the file.
    static std::string sourcedDevice(const std::string& file) {
        ::setenv("IFCFG", file.c_str(), 1);
        return run("bash -c '. \"$IFCFG\" && printf %s \"$DEVICE\"'");
    }
};

TEST_F(LiveIfcfg, InterfaceNamesAreQuotedSoSourcingRunsNothing) {
    for (const std::string name : {"x$(id)", "q'`id`;s", "e\xff"}) {
        SCOPED_TRACE(name);
        ASSERT_NO_FATAL_FAILURE(addVeth(name, "peer0"));
        Nx::Instrumentation node = endpoint(name);
        ASSERT_TRUE(node);
        ASSERT_TRUE(node.setProperty(P::IPv4Address, std::string("10.9.0.1")));
        const std::string file = ifcfg(name);
        EXPECT_EQ(sourcedDevice(file), name) << slurp(file);
        Nx::PropertyFile read{Nx::File::Path(Nx::make_wstring(file))};
        ASSERT_TRUE(read.open(1));
        EXPECT_EQ(Nx::make_string(read.getValue(L"DEVICE")), name);
        EXPECT_EQ(Nx::make_string(read.getValue(L"IPADDR")), "10.9.0.1");
        sh("ip link del peer0");
    }
}

TEST_F(LiveIfcfg, StaticSettingOfANonUtf8InterfaceReadsTheFileItWrote) {
    const std::string name = "e\xff\xfe";
    ASSERT_NO_FATAL_FAILURE(addVeth(name, "peer0"));
    sh("ip addr add 10.8.0.1/24 dev \"$IFNAME\"");
    std::filesystem::create_directories(std::filesystem::path(ifcfg(name)).parent_path());
    {
        ip::StaticIPAssignmentSettingData setting;
        setting.setFilter(ip::StaticIPAssignmentSettingData::ByInstanceID, "Computer%" + name);
        ASSERT_TRUE(setting);
        setting.setConfigurationName("lab");
        setting.setGatewayIPv4Address("10.8.0.254");
    }
    EXPECT_EQ(slurp(ifcfg(name)), "CONFIG_NAME=lab\nGATEWAY=10.8.0.254\n");
    ip::StaticIPAssignmentSettingData setting;
    setting.setFilter(ip::StaticIPAssignmentSettingData::ByInstanceID, "Computer%" + name);
    ASSERT_TRUE(setting);
    std::string configurationName, gateway;
    setting.getConfigurationName(configurationName);
    setting.getGatewayIPv4Address(gateway);
    EXPECT_EQ(configurationName, "lab");
    EXPECT_EQ(gateway, "10.8.0.254");
}

TEST_F(LiveIfcfg, AppliedIPv6SettingReadsBackAndReappliesWithoutReboot) {
    ASSERT_NO_FATAL_FAILURE(buildNetwork());  // va: 2001:db8:1::2/64 in the kernel
    ::setenv("IPIF_DATA_DIR", (root_ + "/data").c_str(), 1);
    ip::IP_CONFIG_DATA request;
    request.name = "va";
    request.addr_origin = 3;
    request.ipv6Address = "2001:db8:1::77";
    request.ipv6_prefix = 56;
    ip::IP_CONFIG_DATA again = request;
    const bool firstReboot = ip::isSystemRebootRequired(&request);
    EXPECT_TRUE(firstReboot) << "a new address waits for the next start";
    EXPECT_EQ(slurp(root_ + "/data/ifcfg-va"),
              "DEVICE=va\nIPV6INIT=yes\nIPV6ADDR=2001:db8:1::77\nPREFIX=56\n");

    ip::StaticIPAssignmentSettingData setting;
    setting.setFilter(ip::StaticIPAssignmentSettingData::ByInstanceID, "Computer%va");
    ASSERT_TRUE(setting);
    std::string address;
    unsigned short prefix = 0;
    setting.getIPv6Address(address);
    setting.getIPv6SubnetPrefixLength(prefix);
    EXPECT_EQ(address, "2001:db8:1::77");
    EXPECT_EQ(prefix, 56u);
    std::string nodeAddress;
    unsigned int nodePrefix = 0;
    const Nx::Instrumentation node = endpoint("va");
    node.getProperty(P::IPv6Address, nodeAddress);
    node.getProperty(P::PrefixLength, nodePrefix);
    EXPECT_EQ(nodeAddress + "/" + std::to_string(nodePrefix), "2001:db8:1::77/56");

    EXPECT_FALSE(ip::isSystemRebootRequired(&again)) << "the same setting again changes nothing";
}

}  // namespace
