// The IP protocol endpoint adapter: the fixture host's interfaces as instances and paths, keyed
// lookups, modification and RequestStateChange.
#include <array>
#include <map>
#include <utility>

#include "CMPI/CMPIProtocolEndpoint.h"
#include "adapters_fixture.h"

using Nx::IPInterfaceProvider::CMPIProtocolEndpoint;
using namespace adaptertest;

namespace {

const char* const kClass = "KVRNX_IPProtocolEndpoint";
using Names = std::vector<std::string>;

class EndpointAdapter : public AdapterTest {
protected:
    Names names(CMPIProtocolEndpoint& adapter) {
        Names found;
        for (CMPIInstance* i : walk(adapter)) found.push_back(prop(i, "Name"));
        return found;
    }

    // RequestStateChange arguments; timeoutType 0 leaves TimeoutPeriod out.
    CMPIArgs* args(CMPIType stateType, unsigned short state, CMPIType timeoutType = CMPI_dateTime) {
        CMPIArgs* in = CMNewArgs(broker, nullptr);
        CMPIValue value;
        value.uint32 = state;
        if (stateType == CMPI_uint16) value.uint16 = state;
        CMAddArg(in, "RequestedState", &value, stateType);
        value.dateTime = CMNewDateTime(broker, nullptr);
        if (timeoutType == CMPI_dateTime) CMAddArg(in, "TimeoutPeriod", &value, CMPI_dateTime);
        if (timeoutType == CMPI_chars) CMAddArg(in, "TimeoutPeriod", "00000000000100.000000:000", CMPI_chars);
        return in;
    }
};

TEST_F(EndpointAdapter, PresentsEveryFixtureInterfaceWithItsMappedValues) {
    useFixture("host-basic.model");
    CMPIProtocolEndpoint adapter(broker, nullptr, path(kClass));
    std::map<std::string, CMPIInstance*> by;
    for (CMPIInstance* i : walk(adapter)) by[prop(i, "Name").substr(std::string("string:").size())] = i;
    ASSERT_EQ(by.size(), 5u);
    const std::vector<std::array<std::string, 3>> expected = {
        {"eth0", "IPv4Address", "string:192.168.1.10"}, {"eth0", "PrefixLength", "uint8:24"},
        {"eth0", "RequestedState", "uint16:2"},         {"eth0", "ProtocolIFType", "uint16:4096"},
        {"eth0", "SystemName", "string:" + hostName},   {"eth1", "AddressOrigin", "uint16:4"},  // DHCP
        {"eth2", "IPv6AddressType", "uint16:2"},        {"eth2", "IPVersionSupport", "uint16:3"},
        {"br0", "EnabledState", "uint16:3"},
        {"usb0", "SystemCreationClassName", "string:KVRNX_SPComputerSystem"},
    };
    for (const auto& [name, property, value] : expected)
        EXPECT_EQ(prop(by.at(name), property.c_str()), value) << name << "." << property;

    CMPIProtocolEndpoint first(broker, nullptr, path(kClass));
    CMPIObjectPath* p = first.getObjectPath();
    EXPECT_EQ(keyNames(p), (Names{"Name", "CreationClassName", "SystemName", "SystemCreationClassName"}));
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
    EXPECT_EQ(prop(found[0], "PrefixLength"), "uint8:24");
    EXPECT_EQ(prop(found[0], "IPv6SubnetPrefixLength"), "uint16:280");
    EXPECT_EQ(prop(found[0], "IPv4Address"), "absent");
}

TEST_F(EndpointAdapter, KeyedPathsSelectBySystemAndName) {
    useFixture("host-basic.model");
    const auto lookup = [&](Texts keys) {
        CMPIProtocolEndpoint adapter(broker, nullptr, path(kClass, keys));
        return names(adapter);
    };
    EXPECT_EQ(lookup({{"SystemName", hostName}, {"Name", "eth2"}}), Names{"string:eth2"});
    EXPECT_EQ(lookup({{"SystemName", "BMC:-1"}, {"Name", "usb0"}}), Names{"string:usb0"});
    EXPECT_EQ(lookup({{"SystemName", hostName}, {"Name", "usb0"}}), Names{});
    EXPECT_EQ(lookup({{"SystemName", "BMC:-1"}}), Names{"string:usb0"});

    CMPIProtocolEndpoint adapter(broker, nullptr, std::string(kNamespace));
    adapter.setObjectPath(path(kClass, {{"Name", "br0"}}));
    EXPECT_EQ(names(adapter), Names{"string:br0"});
    adapter.initialize();
    EXPECT_EQ(names(adapter).size(), 5u);
}

TEST_F(EndpointAdapter, ModifyAppliesEachAcceptedValueAtOnceWithoutRollback) {
    useFixture("host-basic.model");
    CMPIObjectPath* p = path(kClass, {{"SystemName", hostName}, {"Name", "eth0"}});
    const auto modify = [&](CMPIInstance* change) {
        CMPIProtocolEndpoint adapter(broker, nullptr, p);
        return statusText(adapter.modifyInstance(change));
    };
    CMPIInstance* change = instance(p, {{"IPv4Address", "192.168.1.77"}, {"SubnetMask", "255.255.0.0;reboot"}});
    CMPIUint16 origin = 4;
    CMSetProperty(change, "AddressOrigin", &origin, CMPI_uint16);
    EXPECT_EQ(modify(change).rfind("4:SubnetMask: ", 0), 0u);
    EXPECT_EQ(node("/host/eth0/ip", 24).number, 1u);  // DHCP is stored as code 1
    EXPECT_EQ(node("/host/eth0/ip", 25).text, "192.168.1.77");
    EXPECT_EQ(node("/host/eth0/ip", 26).text, "255.255.255.0");
    // A rejected address ends the modification before the mask is looked at.
    EXPECT_EQ(modify(instance(p, {{"IPv4Address", "10.0.0.1 "}, {"SubnetMask", "255.0.0.0"}})).rfind("4:IPv4Address: ", 0), 0u);
    EXPECT_EQ(node("/host/eth0/ip", 26).text, "255.255.255.0");
    EXPECT_EQ(modify(instance(p, {{"SubnetMask", "255.255.252.0"}})), "0:(null)");
    EXPECT_EQ(node("/host/eth0/ip", 26).text, "255.255.252.0");
}

TEST_F(EndpointAdapter, RequestStateChangeWritesTheStateAndReturnsTheJob) {
    useFixture("host-basic.model");
    for (const auto& [state, code] : std::vector<std::pair<unsigned short, unsigned>>{{3, 12}, {11, 9}, {2, 1}}) {
        CMPIProtocolEndpoint adapter(broker, nullptr, path(kClass, {{"SystemName", hostName}, {"Name", "eth1"}}));
        CMPIArgs* out = CMNewArgs(broker, nullptr);
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        EXPECT_EQ(adapter.executeMethod(args(CMPI_uint16, state), out, &status), 0u);
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
    const std::vector<std::pair<CMPIArgs*, std::string>> cases = {
        {args(CMPI_uint32, 3), "4:Invalid Type of Parameter"},
        {args(CMPI_uint16, 6, 0), "4:Invalid Type of TimeOut Parameter"},  // before the value
        {args(CMPI_uint16, 3, CMPI_chars), "4:Invalid Type of TimeOut Parameter"},
        {args(CMPI_uint16, 4), "1:Invalid Value of RequestedState Parameter"},
    };
    for (const auto& [in, expected] : cases) {
        CMPIProtocolEndpoint adapter(broker, nullptr, p);
        CMPIArgs* out = CMNewArgs(broker, nullptr);
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        EXPECT_EQ(adapter.executeMethod(in, out, &status), 4u) << expected;
        EXPECT_EQ(statusText(status), expected);
        EXPECT_EQ(CMGetArgCount(out, nullptr), 0u);
        EXPECT_EQ(adapter.executeMethod(in, out, nullptr), 4u);
    }
    EXPECT_EQ(node("/host/eth0/ip", 123).number, 1u);

    CMPIProtocolEndpoint brokerless(nullptr, nullptr, p);
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    EXPECT_EQ(brokerless.executeMethod(args(CMPI_uint32, 3), nullptr, &status), 4u);
    EXPECT_EQ(statusText(status), "4:(null)");

    useFixture("host-locked.model");  // its endpoint's state is read-only
    CMPIProtocolEndpoint locked(broker, nullptr, p);
    ASSERT_TRUE(locked);
    EXPECT_EQ(locked.executeMethod(args(CMPI_uint16, 3), nullptr, &status), 4u);
    EXPECT_EQ(statusText(status), "1:Invalid Type of TimeOut Parameter");
}

// Below the threshold (6000 here) no trace text is made: the helpers' buffers keep what they held.
// With everything traced, the same walk writes its entry lines with their parameter lists.
TEST_F(EndpointAdapter, FormatsNoTraceTextBelowTheThreshold) {
    useFixture("host-basic.model");
    const char* buffers[] = {Nx::trace("v", "S", 1, "s"), Nx::trace("n", "S", 1, 1u),
                             Nx::trace("S", "f", 1, Nx::ENTERING), Nx::tracepara("S", "f", 1, "s", Nx::ENTERING)};
    const std::vector<std::string> before(std::begin(buffers), std::end(buffers));
    const auto walkAll = [&] {
        CMPIProtocolEndpoint adapter(broker, nullptr, path(kClass));
        for (CMPIInstance* i : walk(adapter)) EXPECT_NE(i, nullptr);
        CMPIProtocolEndpoint keyed(broker, nullptr, path(kClass, {{"Name", "eth1"}}));
        EXPECT_NE(keyed.getObjectPath(), nullptr);
    };
    walkAll();
    for (size_t i = 0; i < before.size(); ++i) EXPECT_EQ(buffers[i], before[i]) << i;
    EXPECT_EQ(testfiles::readFile(scratch.file("trace")), "");

    testfiles::ScopedEnv everything("IPIF_LOG_LEVEL", "0");
    TALog::TALogger::reconfigure();
    walkAll();
    EXPECT_EQ(logged("ENTERING: getCMPIInstance() in CMPIProtocolEndpoint.cpp"), 5u);
    EXPECT_EQ(logged("Parameters List:  filterType=1 reference=eth1"), 2u);  // entry and exit
}

}  // namespace
