// The IP protocol endpoint adapter: instances and paths of the fixture host's interfaces,
// keyed lookups, modification and RequestStateChange.
#include <map>
#include <string>
#include <vector>

#include "CMPI/CMPIProtocolEndpoint.h"
#include "adapters_fixture.h"

using Nx::IPInterfaceProvider::CMPIProtocolEndpoint;
using namespace adaptertest;

namespace {

const char* const kClass = "KVRNX_IPProtocolEndpoint";

class EndpointAdapter : public AdapterTest {
protected:
    std::vector<std::string> names(CMPIProtocolEndpoint& adapter) {
        std::vector<std::string> found;
        for (CMPIInstance* i : walk(adapter)) found.push_back(prop(i, "Name"));
        return found;
    }

    CMPIArgs* args(CMPIType stateType, bool withTimeout, CMPIType timeoutType = CMPI_dateTime,
                   unsigned short state = 3) {
        CMPIArgs* in = CMNewArgs(broker, nullptr);
        CMPIValue value;
        if (stateType == CMPI_uint16)
            value.uint16 = state;
        else
            value.uint32 = state;
        CMAddArg(in, "RequestedState", &value, stateType);
        if (withTimeout && timeoutType == CMPI_dateTime) {
            value.dateTime = CMNewDateTime(broker, nullptr);
            CMAddArg(in, "TimeoutPeriod", &value, CMPI_dateTime);
        } else if (withTimeout) {
            CMAddArg(in, "TimeoutPeriod", "00000000000100.000000:000", CMPI_chars);
        }
        return in;
    }
};

TEST_F(EndpointAdapter, PresentsEveryFixtureInterfaceWithItsMappedValues) {
    useFixture("host-basic.model");
    CMPIProtocolEndpoint adapter(broker, nullptr, path(kClass));
    std::map<std::string, CMPIInstance*> byName;
    for (CMPIInstance* i : walk(adapter)) byName[prop(i, "Name")] = i;
    ASSERT_EQ(byName.size(), 5u);

    const CMPIInstance* eth0 = byName.at("string:eth0");
    EXPECT_EQ(prop(eth0, "ElementName"), "string:eth0");
    EXPECT_EQ(prop(eth0, "Description"), "string:eth0");
    EXPECT_EQ(prop(eth0, "IPv4Address"), "string:192.168.1.10");
    EXPECT_EQ(prop(eth0, "SubnetMask"), "string:255.255.255.0");
    EXPECT_EQ(prop(eth0, "PrefixLength"), "uint8:24");
    EXPECT_EQ(prop(eth0, "AddressOrigin"), "uint16:3");
    EXPECT_EQ(prop(eth0, "EnabledState"), "uint16:2");
    EXPECT_EQ(prop(eth0, "RequestedState"), "uint16:2");
    EXPECT_EQ(prop(eth0, "ProtocolIFType"), "uint16:4096");
    EXPECT_EQ(prop(eth0, "IPVersionSupport"), "uint16:1");
    EXPECT_EQ(prop(eth0, "AddressType"), "uint16:1");
    EXPECT_EQ(prop(eth0, "SystemName"), "string:" + hostName);
    EXPECT_EQ(prop(eth0, "SystemCreationClassName"), "string:KVRNX_ComputerSystem");
    EXPECT_EQ(prop(eth0, "CreationClassName"), "string:KVRNX_IPProtocolEndpoint");
    EXPECT_EQ(prop(eth0, "NameFormat"), "string:NIC Name");

    EXPECT_EQ(prop(byName.at("string:eth1"), "AddressOrigin"), "uint16:4");  // DHCP
    const CMPIInstance* eth2 = byName.at("string:eth2");
    EXPECT_EQ(prop(eth2, "IPv6Address"), "string:2001:db8:5::20");
    EXPECT_EQ(prop(eth2, "IPv6AddressType"), "uint16:2");
    EXPECT_EQ(prop(eth2, "IPv6SubnetPrefixLength"), "uint16:64");
    EXPECT_EQ(prop(eth2, "IPVersionSupport"), "uint16:3");
    EXPECT_EQ(prop(eth2, "AddressType"), "uint16:0");
    EXPECT_EQ(prop(byName.at("string:br0"), "EnabledState"), "uint16:3");
    const CMPIInstance* usb0 = byName.at("string:usb0");
    EXPECT_EQ(prop(usb0, "SystemName"), "string:BMC:-1");
    EXPECT_EQ(prop(usb0, "SystemCreationClassName"), "string:KVRNX_SPComputerSystem");

    // The path carries the keys only, in the order clients have always seen.
    CMPIProtocolEndpoint first(broker, nullptr, path(kClass));
    CMPIObjectPath* p = first.getObjectPath();
    EXPECT_EQ(keyNames(p),
              (std::vector<std::string>{"Name", "CreationClassName", "SystemName", "SystemCreationClassName"}));
    EXPECT_EQ(key(p, "Name"), "string:eth0");
    EXPECT_EQ(charsOf(CMGetNameSpace(p, nullptr)), kNamespace);
}

TEST_F(EndpointAdapter, NarrowsThePrefixLengthAndLeavesOutWhatTheHostCannotReport) {
    testhost::HostBuilder builder;
    int ep = builder.endpoint(builder.root(), "eth9", "eth9");
    builder.number(ep, Nx::NodeLexicon::PrefixLength, 280).text(ep, Nx::NodeLexicon::IPv4Address, "10.9.9.9");
    builder.unreadable(ep, Nx::NodeLexicon::IPv4Address);
    testhost::ScopedHostModel model(builder);
    CMPIProtocolEndpoint adapter(broker, nullptr, path(kClass));
    std::vector<CMPIInstance*> found = walk(adapter);
    ASSERT_EQ(found.size(), 1u);
    EXPECT_EQ(prop(found[0], "PrefixLength"), "uint8:24");  // 280 seen through uint8
    EXPECT_EQ(prop(found[0], "IPv6SubnetPrefixLength"), "uint16:280");
    EXPECT_EQ(prop(found[0], "IPv4Address"), "absent");
    EXPECT_EQ(prop(found[0], "SubnetMask"), "absent");
}

TEST_F(EndpointAdapter, KeyedPathsSelectBySystemAndName) {
    useFixture("host-basic.model");
    {
        CMPIProtocolEndpoint adapter(broker, nullptr, path(kClass, {{"SystemName", hostName}, {"Name", "eth2"}}));
        EXPECT_EQ(names(adapter), (std::vector<std::string>{"string:eth2"}));
    }
    {
        CMPIProtocolEndpoint adapter(broker, nullptr, path(kClass, {{"SystemName", "BMC:-1"}, {"Name", "usb0"}}));
        EXPECT_EQ(names(adapter), (std::vector<std::string>{"string:usb0"}));
    }
    {
        // The service processor's interface is not the host's.
        CMPIProtocolEndpoint adapter(broker, nullptr, path(kClass, {{"SystemName", hostName}, {"Name", "usb0"}}));
        EXPECT_FALSE(adapter);
    }
    {
        CMPIProtocolEndpoint adapter(broker, nullptr, path(kClass, {{"SystemName", "BMC:-1"}}));
        EXPECT_EQ(names(adapter), (std::vector<std::string>{"string:usb0"}));
    }
    {
        // The namespace constructor covers every interface until a path positions it.
        CMPIProtocolEndpoint adapter(broker, nullptr, std::string(kNamespace));
        adapter.setObjectPath(path(kClass, {{"Name", "br0"}}));
        EXPECT_EQ(names(adapter), (std::vector<std::string>{"string:br0"}));
        adapter.initialize();
        EXPECT_EQ(names(adapter).size(), 5u);
    }
}

TEST_F(EndpointAdapter, ModifyAppliesEachAcceptedValueAtOnceWithoutRollback) {
    useFixture("host-basic.model");
    const std::string ip = "/host/eth0/ip";
    CMPIObjectPath* p = path(kClass, {{"SystemName", hostName}, {"Name", "eth0"}});
    {
        CMPIProtocolEndpoint adapter(broker, nullptr, p);
        CMPIInstance* change = instance(p, {{"IPv4Address", "192.168.1.77"}, {"SubnetMask", "255.255.0.0;reboot"}});
        CMPIUint16 origin = 4;
        CMSetProperty(change, "AddressOrigin", &origin, CMPI_uint16);
        EXPECT_EQ(statusText(adapter.modifyInstance(change)), "4:(null)");
    }
    EXPECT_EQ(node(ip, 24).number, 1u);  // DHCP is stored as code 1
    EXPECT_EQ(node(ip, 25).text, "192.168.1.77");
    EXPECT_EQ(node(ip, 26).text, "255.255.255.0");
    {
        // A rejected address ends the modification before the mask is looked at.
        CMPIProtocolEndpoint adapter(broker, nullptr, p);
        CMPIInstance* change = instance(p, {{"IPv4Address", "10.0.0.1 "}, {"SubnetMask", "255.0.0.0"}});
        EXPECT_EQ(statusText(adapter.modifyInstance(change)), "4:(null)");
    }
    EXPECT_EQ(node(ip, 25).text, "192.168.1.77");
    EXPECT_EQ(node(ip, 26).text, "255.255.255.0");
    {
        CMPIProtocolEndpoint adapter(broker, nullptr, p);
        CMPIInstance* change = instance(p, {{"SubnetMask", "255.255.252.0"}, {"Description", "ignored"}});
        EXPECT_EQ(statusText(adapter.modifyInstance(change)), "0:(null)");
    }
    EXPECT_EQ(node(ip, 26).text, "255.255.252.0");
    EXPECT_EQ(node(ip, 24).number, 1u);
}

TEST_F(EndpointAdapter, RequestStateChangeWritesTheStateAndReturnsTheJob) {
    useFixture("host-basic.model");
    CMPIObjectPath* p = path(kClass, {{"SystemName", hostName}, {"Name", "eth1"}});
    const std::vector<std::pair<unsigned short, unsigned int>> stateToCode = {{3, 12}, {11, 9}, {2, 1}};
    for (const auto& [state, code] : stateToCode) {
        CMPIProtocolEndpoint adapter(broker, nullptr, p);
        CMPIArgs* out = CMNewArgs(broker, nullptr);
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        EXPECT_EQ(adapter.executeMethod(args(CMPI_uint16, true, CMPI_dateTime, state), out, &status), 0u);
        EXPECT_EQ(statusText(status), "0:(null)");
        EXPECT_EQ(node("/host/eth1/ip", 123).number, code) << state;
        CMPIData job = CMGetArg(out, "Job", nullptr);
        ASSERT_EQ(job.type, CMPI_ref);
        EXPECT_EQ(charsOf(CMGetClassName(job.value.ref, nullptr)), "KVRNX_ConcreteJob");
        EXPECT_EQ(charsOf(CMGetNameSpace(job.value.ref, nullptr)), kNamespace);
        EXPECT_EQ(key(job.value.ref, "InstanceID"), "string:IPConfigSvcJob:1");
    }
}

TEST_F(EndpointAdapter, RequestStateChangeRefusalsCarryTheirCodesAndTexts) {
    useFixture("host-basic.model");
    CMPIObjectPath* p = path(kClass, {{"SystemName", hostName}, {"Name", "eth0"}});
    struct Case {
        CMPIArgs* in;
        std::string status;
    };
    const std::vector<Case> cases = {
        {args(CMPI_uint32, true), "4:Invalid Type of Parameter"},
        // The timeout's type is checked before the state's value.
        {args(CMPI_uint16, false, CMPI_dateTime, 6), "4:Invalid Type of TimeOut Parameter"},
        {args(CMPI_uint16, true, CMPI_chars), "4:Invalid Type of TimeOut Parameter"},
        {args(CMPI_uint16, true, CMPI_dateTime, 6), "1:Invalid Value of RequestedState Parameter"},
        {args(CMPI_uint16, true, CMPI_dateTime, 4), "1:Invalid Value of RequestedState Parameter"},
    };
    for (const Case& c : cases) {
        CMPIProtocolEndpoint adapter(broker, nullptr, p);
        CMPIArgs* out = CMNewArgs(broker, nullptr);
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        EXPECT_EQ(adapter.executeMethod(c.in, out, &status), 4u) << c.status;
        EXPECT_EQ(statusText(status), c.status);
        EXPECT_EQ(CMGetArgCount(out, nullptr), 0u);
        EXPECT_EQ(adapter.executeMethod(c.in, out, nullptr), 4u);  // no status to fill
    }
    EXPECT_EQ(node("/host/eth0/ip", 123).number, 1u);

    // Without a broker there is nothing to make a message with.
    CMPIProtocolEndpoint brokerless(nullptr, nullptr, p);
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    EXPECT_EQ(brokerless.executeMethod(args(CMPI_uint32, true), nullptr, &status), 4u);
    EXPECT_EQ(statusText(status), "4:(null)");
}

TEST_F(EndpointAdapter, RequestStateChangeTheHostRefusesReusesTheTimeoutText) {
    useFixture("host-locked.model");  // its endpoint's state is read-only
    CMPIObjectPath* p = path(kClass, {{"SystemName", hostName}, {"Name", "eth0"}});
    CMPIProtocolEndpoint adapter(broker, nullptr, p);
    ASSERT_TRUE(adapter);
    CMPIArgs* out = CMNewArgs(broker, nullptr);
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    EXPECT_EQ(adapter.executeMethod(args(CMPI_uint16, true), out, &status), 4u);
    EXPECT_EQ(statusText(status), "1:Invalid Type of TimeOut Parameter");
    EXPECT_EQ(CMGetArgCount(out, nullptr), 0u);
}

}  // namespace
