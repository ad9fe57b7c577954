// The assignment and static setting data models: the two views per endpoint, and the quirks of
// the interface configuration file behind the static settings.
#include <filesystem>
#include <string>
#include <utility>
#include <vector>

#include "Lindows/IPAssignmentSettingData.h"
#include "Lindows/StaticIPAssignmentSettingData.h"
#include "models_fixture.h"

using Nx::IPInterfaceProvider::IPAssignmentSettingData;
using Nx::IPInterfaceProvider::StaticIPAssignmentSettingData;
using namespace Nx::NodeLexicon;
using testfiles::readFile;
using testfiles::writeFile;

namespace {

using Ids = std::vector<std::string>;

class SettingDataModel : public modeltest::ModelTest {
protected:
    SettingDataModel() {
        eth0 = host.endpoint(host.root(), "eth0", "eth0");
        host.endpoint(host.root(), "eth1", "eth1");
        host.endpoint(host.serviceProcessor(), "usb0", "BMC usb0");
        host.text(eth0, IPv4Address, "192.168.1.10").number(eth0, IPVersion, 4);
    }

    testhost::HostBuilder host;
    int eth0 = -1;
};

TEST_F(SettingDataModel, AssignmentFilterComparesExactlyOrByEndpointWithIsCfg) {
    testhost::ScopedHostModel model(host);
    const auto lookup = [](const std::string& reference, bool isCfg) {
        IPAssignmentSettingData settings;
        settings.setFilter(IPAssignmentSettingData::ByInstanceID, reference, isCfg);
        Ids ids;
        for (int guard = 0; settings && guard < 20; ++guard, ++settings) {
            std::string id;
            EXPECT_TRUE(settings.getInstanceId(id));
            ids.push_back(id);
        }
        return ids;
    };
    EXPECT_EQ(lookup("Computer%eth1%dhcp", false), Ids{"Computer%eth1%dhcp"});
    // isCfg: both views of the endpoint, static first.
    EXPECT_EQ(lookup("Computer%eth0%dhcp", true), (Ids{"Computer%eth0%static", "Computer%eth0%dhcp"}));
    EXPECT_EQ(lookup("BMC%usb0%static", true), (Ids{"BMC%usb0%static", "BMC%usb0%dhcp"}));
    // The service processor's prefix is part of the identity.
    EXPECT_EQ(lookup("Computer%usb0%static", false), Ids{});

    // The static model has one view per node and compares exactly.
    StaticIPAssignmentSettingData settings;
    settings.setFilter(StaticIPAssignmentSettingData::ByInstanceID, "Computer%eth1%static");
    EXPECT_FALSE(settings);
}

TEST_F(SettingDataModel, StaticAddressTypeHasCodesOfItsOwn) {
    for (auto [code, type] : std::vector<std::pair<unsigned, unsigned short>>{{4, 1}, {6, 2}, {1, 0}}) {
        host.number(eth0, IPVersion, code);
        testhost::ScopedHostModel model(host);
        StaticIPAssignmentSettingData settings;
        unsigned short addressType = 9;
        EXPECT_TRUE(settings.getAddressType(addressType));
        EXPECT_EQ(addressType, type) << code;
    }
}

TEST_F(SettingDataModel, StaticSettersRewriteTheFileWithItsQuirks) {
    testhost::ScopedHostModel model(host);
    writeFile(ifcfg("eth0"), "DEVICE=eth0\nIPV4ADDR=10.1.1.1\nIPV6GATEWAY=2001:db8::1\n");
    StaticIPAssignmentSettingData settings;
    // The address is written under a different spelling than the one it is read from.
    EXPECT_TRUE(settings.setIPv4Address("10.2.2.2"));
    std::string ipv4;
    settings.getIPv4Address(ipv4);
    EXPECT_EQ(ipv4, "10.1.1.1");
    // GATEWAY also matches the IPV6GATEWAY line; whatever origin is asked for, the file says static.
    EXPECT_TRUE(settings.setGatewayIPv4Address("10.1.1.254"));
    EXPECT_TRUE(settings.setAddressOrigin(4));
    EXPECT_EQ(readFile(ifcfg("eth0")),
              "DEVICE=eth0\nIPV4ADDR=10.1.1.1\nGATEWAY=10.1.1.254\nIPv4ADDR=10.2.2.2\nBOOTPROTO=static\n");
}

TEST_F(SettingDataModel, InterfaceNamesThatCannotNameAFileAreNeitherReadNorWritten) {
    // A name with '/' would otherwise reach into this directory.
    std::filesystem::create_directory(dataDir.file("ifcfg-sub"));
    writeFile(dataDir.file("ifcfg-sub/x"), "NETMASK=1.1.1.1\n");
    const std::string tooLong(128 - dataDir.path().size() - std::string("/ifcfg-").size(), 'x');
    for (const std::string& bad : {std::string("sub/x"), tooLong}) {
        testhost::HostBuilder odd;
        int ep = odd.endpoint(odd.root(), "port", "port");
        odd.text(ep, ElementName, bad).text(ep, SubnetMask, "255.255.255.0");
        testhost::ScopedHostModel model(odd);
        StaticIPAssignmentSettingData settings;
        EXPECT_TRUE(settings.setSubnetMask("255.0.0.0"));
        IPAssignmentSettingData assignment;
        EXPECT_TRUE(assignment.setConfigurationName("x"));
        std::string mask;
        settings.getSubnetMask(mask);
        EXPECT_EQ(mask, "255.255.255.0") << bad;  // the live value, not a file's
        EXPECT_EQ(readFile(dataDir.file("ifcfg-sub/x")), "NETMASK=1.1.1.1\n") << bad;
        const auto entries = std::distance(std::filesystem::directory_iterator(dataDir.path()), {});
        EXPECT_EQ(entries, 1) << bad;
    }
}

}  // namespace
