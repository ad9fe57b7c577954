// The setting data adapters: static settings from ifcfg files or the live node, the doubled
// IPv6AddressType, and the modification rules of both classes.
#include <string>
#include <vector>

#include "CMPI/CMPIAssignmentSettingData.h"
#include "CMPI/CMPIStaticIPAssignmentSettingData.h"
#include "adapters_fixture.h"

using Nx::IPInterfaceProvider::CMPIAssignmentSettingData;
using Nx::IPInterfaceProvider::CMPIStaticIPAssignmentSettingData;
using namespace adaptertest;

namespace {

const std::string kRefused = ": the value holds characters that may not be written to the host configuration";

const char* const kStatic = "KVRNX_StaticIPAssignmentSettingData";
const char* const kAssignment = "KVRNX_IPAssignmentSettingData";
const char* const kSecurity = "Invalid Security data passed in the property value";

using SettingDataAdapter = AdapterTest;

TEST_F(SettingDataAdapter, StaticSettingsComeFromTheFileOrTheLiveNode) {
    useFixture("host-basic.model");
    testfiles::writeFile(ifcfg("eth0"), "IPV4ADDR=192.168.1.99\nGATEWAY=192.168.1.254\nCONFIG_NAME=lab\nPREFIX=48x\n");
    CMPIStaticIPAssignmentSettingData adapter(broker, nullptr, path(kStatic));
    std::vector<CMPIInstance*> found = walk(adapter);
    ASSERT_EQ(found.size(), 5u);
    EXPECT_EQ(prop(found[0], "InstanceID"), "string:Computer%eth0");
    EXPECT_EQ(prop(found[0], "AddressOrigin"), "uint16:3");
    EXPECT_EQ(prop(found[0], "IPv4Address"), "string:192.168.1.99");
    EXPECT_EQ(prop(found[0], "GatewayIPv4Address"), "string:192.168.1.254");
    EXPECT_EQ(prop(found[0], "ConfigurationName"), "string:lab");
    EXPECT_EQ(prop(found[0], "IPv6SubnetPrefixLength"), "uint16:48");
    EXPECT_EQ(prop(found[0], "SubnetMask"), "string:");  // a key missing from the file reads empty
    EXPECT_EQ(prop(found[2], "IPv4Address"), "string:172.16.5.20");  // eth2 has no file
    EXPECT_EQ(prop(found[2], "GatewayIPv6Address"), "string:2001:db8:5::1");
    EXPECT_EQ(prop(found[2], "IPv6SubnetPrefixLength"), "uint16:64");
    EXPECT_EQ(prop(found[4], "InstanceID"), "string:BMC%usb0");

    CMPIStaticIPAssignmentSettingData keyed(broker, nullptr, path(kStatic, {{"InstanceID", "Computer%eth2"}}));
    EXPECT_EQ(keyNames(keyed.getObjectPath()), (std::vector<std::string>{"InstanceID"}));
    EXPECT_EQ(key(keyed.getObjectPath(), "InstanceID"), "string:Computer%eth2");
    EXPECT_EQ(walk(keyed).size(), 1u);
}

TEST_F(SettingDataAdapter, IPv6AddressTypeFallsBackToTheAddressTypeAndAddressTypeIsNeverSet) {
    testhost::HostBuilder builder;
    int reported = builder.endpoint(builder.root(), "eth0", "eth0");
    builder.number(reported, Nx::NodeLexicon::IPVersion, 6).number(reported, Nx::NodeLexicon::IPv6AddressType, 1);
    int unreported = builder.endpoint(builder.root(), "eth1", "eth1");
    builder.number(unreported, Nx::NodeLexicon::IPVersion, 6).number(unreported, Nx::NodeLexicon::IPv6AddressType, 1);
    builder.unreadable(unreported, Nx::NodeLexicon::IPv6AddressType);
    testhost::ScopedHostModel model(builder);
    CMPIStaticIPAssignmentSettingData adapter(broker, nullptr, path(kStatic));
    std::vector<CMPIInstance*> found = walk(adapter);
    ASSERT_EQ(found.size(), 2u);
    EXPECT_EQ(prop(found[0], "IPv6AddressType"), "uint16:1");  // the IPv6 type wins
    EXPECT_EQ(prop(found[1], "IPv6AddressType"), "uint16:2");  // the address type (code 6) stands in
    EXPECT_EQ(prop(found[0], "AddressType"), "absent");
    EXPECT_EQ(prop(found[1], "AddressType"), "absent");
}

TEST_F(SettingDataAdapter, StaticModifyStopsAtTheFirstRejectionAndKeepsEarlierWrites) {
    useFixture("host-basic.model");
    testfiles::writeFile(ifcfg("eth0"), "NETMASK=255.255.255.0\nGATEWAY=192.168.1.1\nCONFIG_NAME=lab\n");
    CMPIObjectPath* p = path(kStatic, {{"InstanceID", "Computer%eth0"}});
    const auto modify = [&](CMPIInstance* change) {
        CMPIStaticIPAssignmentSettingData adapter(broker, nullptr, p);
        return statusText(adapter.modifyInstance(change));
    };
    EXPECT_EQ(modify(instance(p, {{"IPv4Address", "192.168.1.20"},
                                  {"SubnetMask", "255.255.0.0"},
                                  {"GatewayIPv4Address", "192.168.1.1$(reboot)"},
                                  {"ConfigurationName", "never"}})),
              "4:GatewayIPv4Address" + kRefused);
    EXPECT_EQ(testfiles::readFile(ifcfg("eth0")),
              "NETMASK=255.255.0.0\nGATEWAY=192.168.1.1\nCONFIG_NAME=lab\nIPv4ADDR=192.168.1.20\n");
    EXPECT_EQ(logged(kSecurity), 0u);  // IPv4-style rejections say nothing

    EXPECT_EQ(modify(instance(p, {{"GatewayIPv4Address", "192.168.1.254"},
                                  {"IPv6Address", "2001:db8::5\nBOOTPROTO=dhcp"},
                                  {"GatewayIPv6Address", "2001:db8::1"}})),
              "4:IPv6Address" + kRefused);
    EXPECT_EQ(logged(kSecurity), 1u);
    EXPECT_EQ(testfiles::readFile(ifcfg("eth0")),
              "NETMASK=255.255.0.0\nGATEWAY=192.168.1.254\nCONFIG_NAME=lab\nIPv4ADDR=192.168.1.20\n");

    // The addresses pass, the name cannot be written: the client hears which property failed.
    EXPECT_EQ(modify(instance(p, {{"IPv4Address", "192.168.1.21"}, {"ConfigurationName", "lab`reboot`"}})),
              "4:ConfigurationName" + kRefused);
    EXPECT_EQ(testfiles::readFile(ifcfg("eth0")),
              "NETMASK=255.255.0.0\nGATEWAY=192.168.1.254\nCONFIG_NAME=lab\nIPv4ADDR=192.168.1.21\n");

    // Everything accepted; leaving ConfigurationName out clears it.
    CMPIInstance* change = instance(p, {{"IPv6Address", "2001:db8::5"}, {"GatewayIPv6Address", "2001:db8::1"}});
    CMPIUint16 prefix = 48;
    CMSetProperty(change, "IPv6SubnetPrefixLength", &prefix, CMPI_uint16);
    EXPECT_EQ(modify(change), "0:(null)");
    EXPECT_EQ(testfiles::readFile(ifcfg("eth0")),
              "NETMASK=255.255.0.0\nGATEWAY=192.168.1.254\nCONFIG_NAME=\nIPv4ADDR=192.168.1.21\n"
              "IPV6ADDR=2001:db8::5\nIPV6GATEWAY=2001:db8::1\nPREFIX=48\n");
}

TEST_F(SettingDataAdapter, AssignmentSettingsComeInPairsAndModifyOnlyTouchesTheConfigurationName) {
    useFixture("host-basic.model");
    testfiles::writeFile(ifcfg("eth1"), "DEVICE=eth1\nCONFIG_NAME=office\n");
    CMPIAssignmentSettingData all(broker, nullptr, path(kAssignment));
    std::vector<CMPIInstance*> found = walk(all);
    ASSERT_EQ(found.size(), 10u);
    EXPECT_EQ(prop(found[0], "InstanceID"), "string:Computer%eth0%static");
    EXPECT_EQ(prop(found[1], "InstanceID"), "string:Computer%eth0%dhcp");
    EXPECT_EQ(prop(found[3], "ConfigurationName"), "string:office");
    EXPECT_EQ(prop(found[3], "AddressOrigin"), "uint16:2");
    EXPECT_EQ(prop(found[3], "ElementName"), "string:eth1");
    EXPECT_EQ(prop(found[0], "ConfigurationName"), "string:");  // eth0 has no file

    CMPIObjectPath* p = path(kAssignment, {{"InstanceID", "Computer%eth1%dhcp"}});
    CMPIAssignmentSettingData keyed(broker, nullptr, p);
    ASSERT_TRUE(keyed);
    EXPECT_EQ(key(keyed.getObjectPath(), "InstanceID"), "string:Computer%eth1%dhcp");
    EXPECT_EQ(statusText(keyed.modifyInstance(instance(p, {{"ConfigurationName", "home"}, {"ElementName", "x"}}))),
              "0:(null)");
    EXPECT_EQ(testfiles::readFile(ifcfg("eth1")), "DEVICE=eth1\nCONFIG_NAME=home\n");
    // An unsafe name is refused as such, and nothing is written.
    EXPECT_EQ(statusText(keyed.modifyInstance(instance(p, {{"ConfigurationName", "a;reboot"}}))),
              "4:ConfigurationName" + kRefused);
    EXPECT_EQ(testfiles::readFile(ifcfg("eth1")), "DEVICE=eth1\nCONFIG_NAME=home\n");
    EXPECT_EQ(statusText(keyed.modifyInstance(instance(p, {}))), "0:(null)");
    EXPECT_EQ(testfiles::readFile(ifcfg("eth1")), "DEVICE=eth1\nCONFIG_NAME=\n");
}

}  // namespace
