// The assignment and static setting data models: identities, the two views per endpoint, and the
// interface configuration file behind the static settings.
#include <filesystem>
#include <string>
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

class SettingDataModel : public modeltest::ModelTest {
protected:
    SettingDataModel() {
        eth0 = host.endpoint(host.root(), "eth0", "eth0");
        eth1 = host.endpoint(host.root(), "eth1", "eth1");
        int sp = host.serviceProcessor();
        usb0 = host.endpoint(sp, "usb0", "BMC usb0");
        host.text(eth0, IPv4Address, "192.168.1.10")
            .text(eth0, SubnetMask, "255.255.255.0")
            .text(eth0, IPv4Gateway, "192.168.1.1")
            .text(eth0, IPv6Address, "2001:db8::10")
            .text(eth0, IPv6Gateway, "2001:db8::1")
            .number(eth0, PrefixLength, 64)
            .number(eth0, IPVersion, 4)
            .number(eth0, IPv6AddressType, 2);
    }

    std::vector<std::string> walk(IPAssignmentSettingData& model) {
        std::vector<std::string> ids;
        for (int guard = 0; model && guard < 20; ++guard, ++model) {
            std::string id;
            EXPECT_TRUE(model.getInstanceId(id));
            ids.push_back(id);
        }
        return ids;
    }
    std::vector<std::string> walk(StaticIPAssignmentSettingData& model) {
        std::vector<std::string> ids;
        for (int guard = 0; model && guard < 20; ++guard, ++model) {
            std::string id;
            EXPECT_TRUE(model.getInstanceID(id));
            ids.push_back(id);
        }
        return ids;
    }

    testhost::HostBuilder host;
    int eth0 = -1, eth1 = -1, usb0 = -1;
};

TEST_F(SettingDataModel, AssignmentPresentsStaticThenDhcpForEveryEndpoint) {
    testhost::ScopedHostModel model(host);
    IPAssignmentSettingData settings;
    EXPECT_EQ(walk(settings), (std::vector<std::string>{"Computer%eth0%static", "Computer%eth0%dhcp",
                                                         "Computer%eth1%static", "Computer%eth1%dhcp",
                                                         "BMC%usb0%static", "BMC%usb0%dhcp"}));
    settings.initialize();
    unsigned short origin = 0;
    std::string element;
    EXPECT_TRUE(settings.getAddressOrigin(origin));
    EXPECT_TRUE(settings.getElementName(element));
    EXPECT_EQ(origin, 2);
    EXPECT_EQ(element, "eth0");
}

TEST_F(SettingDataModel, AssignmentFilterComparesExactlyOrByEndpointWithIsCfg) {
    testhost::ScopedHostModel model(host);
    {
        // Exact: only the view named.
        IPAssignmentSettingData settings;
        settings.setFilter(IPAssignmentSettingData::ByInstanceID, "Computer%eth1%dhcp", false);
        EXPECT_EQ(walk(settings), std::vector<std::string>{"Computer%eth1%dhcp"});
    }
    {
        // isCfg: both views of the endpoint, static first.
        IPAssignmentSettingData settings;
        settings.setFilter(IPAssignmentSettingData::ByInstanceID, "Computer%eth0%dhcp", true);
        EXPECT_EQ(walk(settings), (std::vector<std::string>{"Computer%eth0%static", "Computer%eth0%dhcp"}));
    }
    {
        IPAssignmentSettingData settings;
        settings.setFilter(IPAssignmentSettingData::ByInstanceID, "BMC%usb0%static", true);
        EXPECT_EQ(walk(settings), (std::vector<std::string>{"BMC%usb0%static", "BMC%usb0%dhcp"}));
    }
    {
        // The service processor's prefix is part of the identity.
        IPAssignmentSettingData settings;
        settings.setFilter(IPAssignmentSettingData::ByInstanceID, "Computer%usb0%static", false);
        EXPECT_FALSE(settings);
    }
    {
        // Static model: one view per node, exact comparison, no rewinding.
        StaticIPAssignmentSettingData settings;
        EXPECT_EQ(walk(settings), (std::vector<std::string>{"Computer%eth0", "Computer%eth1", "BMC%usb0"}));
        settings.initialize();
        settings.setFilter(StaticIPAssignmentSettingData::ByInstanceID, "Computer%eth1");
        EXPECT_EQ(walk(settings), std::vector<std::string>{"Computer%eth1"});
        settings.initialize();
        settings.setFilter(StaticIPAssignmentSettingData::ByInstanceID, "Computer%eth1");
        settings.setFilter(StaticIPAssignmentSettingData::ByInstanceID, "Computer%eth0");
        EXPECT_FALSE(settings);
        settings.initialize();
        settings.setFilter(StaticIPAssignmentSettingData::ByInstanceID, "Computer%eth1%static");
        EXPECT_FALSE(settings);
    }
}

TEST_F(SettingDataModel, StaticGettersUseTheFileAndFallBackToTheNodeWithoutIt) {
    testhost::ScopedHostModel model(host);
    StaticIPAssignmentSettingData settings;
    std::string ipv4, mask, gateway, ipv6, gateway6, configName = "untouched";
    unsigned short prefix = 0, origin = 0, addressType = 9;

    // No ifcfg-eth0: the live values.
    EXPECT_TRUE(settings.getIPv4Address(ipv4));
    EXPECT_TRUE(settings.getSubnetMask(mask));
    EXPECT_TRUE(settings.getGatewayIPv4Address(gateway));
    EXPECT_TRUE(settings.getIPv6Address(ipv6));
    EXPECT_TRUE(settings.getGatewayIPv6Address(gateway6));
    EXPECT_TRUE(settings.getIPv6SubnetPrefixLength(prefix));
    EXPECT_TRUE(settings.getConfigurationName(configName));
    EXPECT_EQ(ipv4, "192.168.1.10");
    EXPECT_EQ(mask, "255.255.255.0");
    EXPECT_EQ(gateway, "192.168.1.1");
    EXPECT_EQ(ipv6, "2001:db8::10");
    EXPECT_EQ(gateway6, "2001:db8::1");
    EXPECT_EQ(prefix, 64);
    EXPECT_EQ(configName, "untouched");
    EXPECT_TRUE(settings.getAddressOrigin(origin));
    EXPECT_EQ(origin, 3);
    EXPECT_TRUE(settings.getAddressType(addressType));
    EXPECT_EQ(addressType, 1);  // node code 4

    // With the file, its values win and absent keys read as empty.
    writeFile(ifcfg("eth0"),
              "DEVICE=eth0\nIPV4ADDR=10.1.1.1\nNETMASK=255.0.0.0\nPREFIX=48\nCONFIG_NAME=office\n");
    EXPECT_TRUE(settings.getIPv4Address(ipv4));
    EXPECT_TRUE(settings.getSubnetMask(mask));
    EXPECT_TRUE(settings.getGatewayIPv4Address(gateway));
    EXPECT_TRUE(settings.getIPv6Address(ipv6));
    EXPECT_TRUE(settings.getIPv6SubnetPrefixLength(prefix));
    EXPECT_TRUE(settings.getConfigurationName(configName));
    EXPECT_EQ(ipv4, "10.1.1.1");
    EXPECT_EQ(mask, "255.0.0.0");
    EXPECT_EQ(gateway, "");
    EXPECT_EQ(ipv6, "");
    EXPECT_EQ(prefix, 48);
    EXPECT_EQ(configName, "office");

    IPAssignmentSettingData assignment;
    std::string assignmentName = "untouched";
    EXPECT_TRUE(assignment.getConfigurationName(assignmentName));
    EXPECT_EQ(assignmentName, "office");
    ++assignment;
    ++assignment;  // eth1 has no file
    assignmentName = "untouched";
    EXPECT_TRUE(assignment.getConfigurationName(assignmentName));
    EXPECT_EQ(assignmentName, "untouched");

    struct Case {
        unsigned int code;
        unsigned short type;
    };
    for (Case c : {Case{6, 2}, Case{1, 0}, Case{2, 0}}) {
        host.number(eth0, IPVersion, c.code);
        testhost::ScopedHostModel scoped(host);
        StaticIPAssignmentSettingData fresh;
        EXPECT_TRUE(fresh.getAddressType(addressType));
        EXPECT_EQ(addressType, c.type) << c.code;
    }
}

TEST_F(SettingDataModel, StaticSettersRewriteTheFileWithItsQuirks) {
    testhost::ScopedHostModel model(host);
    writeFile(ifcfg("eth0"), "DEVICE=eth0\nIPV4ADDR=10.1.1.1\nIPV6GATEWAY=2001:db8::1\nONBOOT=yes\n");
    StaticIPAssignmentSettingData settings;

    // The address goes under a different spelling than the one it is read from.
    EXPECT_TRUE(settings.setIPv4Address("10.2.2.2"));
    std::string ipv4;
    settings.getIPv4Address(ipv4);
    EXPECT_EQ(ipv4, "10.1.1.1");

    // GATEWAY also matches the IPV6GATEWAY line.
    EXPECT_TRUE(settings.setGatewayIPv4Address("10.1.1.254"));
    // A missing key is appended.
    EXPECT_TRUE(settings.setSubnetMask("255.255.0.0"));
    // Whatever the origin asked for, the file says static.
    EXPECT_TRUE(settings.setAddressOrigin(4));
    EXPECT_TRUE(settings.setIPv6SubnetPrefixLength(56));

    EXPECT_EQ(readFile(ifcfg("eth0")),
              "DEVICE=eth0\nIPV4ADDR=10.1.1.1\nGATEWAY=10.1.1.254\nONBOOT=yes\nIPv4ADDR=10.2.2.2\n"
              "NETMASK=255.255.0.0\nBOOTPROTO=static\nPREFIX=56\n");
    unsigned short prefix = 0;
    settings.getIPv6SubnetPrefixLength(prefix);
    EXPECT_EQ(prefix, 56);

    // An interface without a file gets one.
    ++settings;
    EXPECT_TRUE(settings.setIPv6Address("2001:db8::11"));
    EXPECT_TRUE(settings.setGatewayIPv6Address("fe80::1%eth1"));
    EXPECT_TRUE(settings.setConfigurationName("lab-1"));
    EXPECT_EQ(readFile(ifcfg("eth1")), "IPV6ADDR=2001:db8::11\nIPV6GATEWAY=fe80::1%eth1\nCONFIG_NAME=lab-1\n");

    // Values that could add lines or shell text are refused and leave the file alone.
    const std::string before = readFile(ifcfg("eth1"));
    EXPECT_TRUE(settings.setIPv6Address("2001:db8::12\nBOOTPROTO=dhcp"));
    EXPECT_TRUE(settings.setConfigurationName("lab 2"));
    EXPECT_TRUE(settings.setGatewayIPv6Address("$(reboot)"));
    EXPECT_EQ(readFile(ifcfg("eth1")), before);

    IPAssignmentSettingData assignment;
    EXPECT_TRUE(assignment.setConfigurationName("home"));
    std::string name;
    settings.initialize();
    settings.getConfigurationName(name);
    EXPECT_EQ(name, "home");
}

TEST_F(SettingDataModel, InterfaceNamesThatCannotNameAFileAreNeitherReadNorWritten) {
    // A name with '/' would otherwise reach into this directory.
    std::filesystem::create_directory(dataDir.file("ifcfg-sub"));
    writeFile(dataDir.file("ifcfg-sub/x"), "NETMASK=1.1.1.1\n");
    const std::string longName(128 - dataDir.path().size() - std::string("/ifcfg-").size(), 'x');
    for (const std::string& bad : {std::string("sub/x"), std::string(".hidden"), std::string(""), longName}) {
        testhost::HostBuilder odd;
        int ep = odd.endpoint(odd.root(), "port", "port");
        odd.text(ep, ElementName, bad).text(ep, SubnetMask, "255.255.255.0");
        testhost::ScopedHostModel model(odd);
        StaticIPAssignmentSettingData settings;
        EXPECT_TRUE(settings.setSubnetMask("255.0.0.0"));
        EXPECT_TRUE(settings.setConfigurationName("x"));
        IPAssignmentSettingData assignment;
        EXPECT_TRUE(assignment.setConfigurationName("x"));
        std::string mask;
        settings.getSubnetMask(mask);
        EXPECT_EQ(mask, "255.255.255.0") << bad;
        EXPECT_EQ(readFile(dataDir.file("ifcfg-sub/x")), "NETMASK=1.1.1.1\n") << bad;
        size_t entries = 0;
        for (const auto& entry : std::filesystem::directory_iterator(dataDir.path())) {
            (void)entry;
            ++entries;
        }
        EXPECT_EQ(entries, 1u) << bad;
    }
    // One character shorter fits the buffer and is used.
    testhost::HostBuilder fits;
    int ep = fits.endpoint(fits.root(), "port", "port");
    fits.text(ep, ElementName, longName.substr(1));
    testhost::ScopedHostModel model(fits);
    StaticIPAssignmentSettingData settings;
    settings.setSubnetMask("255.0.0.0");
    EXPECT_EQ(readFile(ifcfg(longName.substr(1))), "NETMASK=255.0.0.0\n");
}

}  // namespace
