// The gateway, capabilities and configuration service adapters.
#include <string>
#include <vector>

#include "CMPI/CMPIIPConfigurationService.h"
#include "CMPI/CMPIIPEnabledLogicalElementCapabilities.h"
#include "CMPI/CMPIRemoteServiceAccessPoint.h"
#include "adapters_fixture.h"

using Nx::IPInterfaceProvider::CMPIIPConfigurationService;
using Nx::IPInterfaceProvider::CMPIIPEnabledLogicalElementCapabilities;
using Nx::IPInterfaceProvider::CMPIRemoteServiceAccessPoint;
using namespace adaptertest;

namespace {

const char* const kGateway = "KVRNX_IPRemoteServiceAccessPoint";
const char* const kCapabilities = "KVRNX_IPEnabledLogicalElementCapabilities";
const char* const kService = "KVRNX_IPConfigurationService";

using GatewayAdapter = AdapterTest;
using CapabilitiesAdapter = AdapterTest;
using ServiceAdapter = AdapterTest;

TEST_F(GatewayAdapter, PresentsBothGatewaysOfADualStackInterface) {
    useFixture("host-basic.model");
    CMPIRemoteServiceAccessPoint adapter(broker, nullptr, path(kGateway, {{"SystemName", hostName}, {"Name", "eth2_IPv6"}}));
    std::vector<CMPIInstance*> found = walk(adapter);
    ASSERT_EQ(found.size(), 2u);
    EXPECT_EQ(prop(found[0], "Name"), "string:eth2_IPv6");
    EXPECT_EQ(prop(found[0], "AccessInfo"), "string:2001:db8:5::1");
    EXPECT_EQ(prop(found[0], "InfoFormat"), "uint16:4");
    EXPECT_EQ(prop(found[1], "Name"), "string:eth2_IPv4");
    EXPECT_EQ(prop(found[1], "AccessInfo"), "string:172.16.5.1");
    EXPECT_EQ(prop(found[1], "AccessContext"), "uint16:2");
    EXPECT_EQ(prop(found[1], "OtherAccessContext"), "absent");
    EXPECT_EQ(prop(found[1], "SystemName"), "string:" + hostName);
    // A class path starts at the first interface with a gateway.
    CMPIRemoteServiceAccessPoint first(broker, nullptr, path(kGateway));
    CMPIObjectPath* p = first.getObjectPath();
    EXPECT_EQ(keyNames(p),
              (std::vector<std::string>{"SystemCreationClassName", "SystemName", "CreationClassName", "Name"}));
    EXPECT_EQ(key(p, "Name"), "string:eth0_IPv4");
}

TEST_F(GatewayAdapter, AccessInfoIsWrittenToTheGatewayOfTheInterfacesProtocol) {
    useFixture("host-basic.model");
    const auto modify = [&](const std::string& name, Texts texts) {
        CMPIObjectPath* p = path(kGateway, {{"SystemName", hostName}, {"Name", name}});
        CMPIRemoteServiceAccessPoint adapter(broker, nullptr, p);
        EXPECT_TRUE(adapter) << name;
        return statusText(adapter.modifyInstance(instance(p, texts)));
    };
    // eth2 runs both protocols (4098): its IPv6 gateway is written, though the IPv4 one is named.
    EXPECT_EQ(modify("eth2_IPv4", {{"AccessInfo", "2001:db8:5::fe"}}), "0:(null)");
    EXPECT_EQ(node("/host/eth2/ip", 101).text, "2001:db8:5::fe");
    EXPECT_EQ(node("/host/eth2/ip", 100).text, "172.16.5.1");

    EXPECT_EQ(modify("eth0_IPv4", {{"AccessInfo", "10.0.0.1;reboot"}}).rfind("4:AccessInfo: ", 0), 0u);
    EXPECT_EQ(logged("Invalid Security data passed in the property value"), 1u);
    EXPECT_EQ(modify("eth0_IPv4", {{"ElementName", "gw"}}), "0:(null)");
    EXPECT_EQ(node("/host/eth0/ip", 100).text, "192.168.1.1");
}

TEST_F(CapabilitiesAdapter, OneInstancePerInterfaceWithoutAMaximumNameLength) {
    useFixture("host-locked.model");  // eth0's interface name is writable, its addresses are not
    CMPIIPEnabledLogicalElementCapabilities all(broker, nullptr, path(kCapabilities));
    std::vector<CMPIInstance*> found = walk(all);
    ASSERT_EQ(found.size(), 1u);
    EXPECT_EQ(prop(found[0], "InstanceID"), "string:eth0");
    EXPECT_EQ(prop(found[0], "ElementNameEditSupported"), "boolean:true");
    EXPECT_EQ(prop(found[0], "RequestedStatesSupported"), "uint16[]:2,3,11");
    EXPECT_EQ(prop(found[0], "MaxElementNameLen"), "absent");

    useFixture("host-basic.model");
    CMPIIPEnabledLogicalElementCapabilities keyed(broker, nullptr, path(kCapabilities, {{"InstanceID", "br0"}}));
    std::vector<CMPIInstance*> one = walk(keyed);
    ASSERT_EQ(one.size(), 1u);
    EXPECT_EQ(prop(one[0], "InstanceID"), "string:br0");
}

TEST_F(ServiceAdapter, TheHostHasOneServiceNamedOnlyBySystemName) {
    useFixture("host-basic.model");
    CMPIIPConfigurationService named(broker, nullptr, path(kService, {{"SystemName", hostName}, {"Name", "other"}}));
    CMPIObjectPath* p = named.getObjectPath();
    EXPECT_EQ(keyNames(p),
              (std::vector<std::string>{"SystemCreationClassName", "SystemName", "CreationClassName", "Name"}));
    EXPECT_EQ(key(p, "Name"), "string:IPConfigService");
    std::vector<CMPIInstance*> found = walk(named);
    ASSERT_EQ(found.size(), 1u);
    EXPECT_EQ(prop(found[0], "ElementName"), "string:IPConfigService");
    EXPECT_EQ(prop(found[0], "SystemCreationClassName"), "string:KVRNX_ComputerSystem");

    CMPIIPConfigurationService elsewhere(broker, nullptr, path(kService, {{"SystemName", "BMC:-1"}}));
    EXPECT_FALSE(elsewhere);
    useFixture("host-empty.model");
    CMPIIPConfigurationService none(broker, nullptr, path(kService));
    EXPECT_FALSE(none);
}

}  // namespace
