// The gateway model: one or two presentations per endpoint, name matching without the suffix.
#include <string>
#include <utility>
#include <vector>

#include "Lindows/RemoteServiceAccessPoint.h"
#include "models_fixture.h"

using Nx::IPInterfaceProvider::RemoteServiceAccessPoint;
using namespace Nx::NodeLexicon;

namespace {

// Exposes the filters so that the rewriting of a reference can be seen.
class PeekingGateway : public RemoteServiceAccessPoint {
public:
    using RemoteServiceAccessPoint::filters;
};

// "name accessInfo infoFormat" of the current presentation.
std::string current(RemoteServiceAccessPoint& model) {
    std::string name, accessInfo;
    unsigned short infoFormat = 0;
    model.getName(name);
    EXPECT_TRUE(model.getAccessInfo(accessInfo));
    EXPECT_TRUE(model.getInfoFormat(infoFormat));
    return name + " " + accessInfo + " " + std::to_string(infoFormat);
}

std::vector<std::string> walk(RemoteServiceAccessPoint& model) {
    std::vector<std::string> seen;
    for (int guard = 0; model && guard < 20; ++guard, ++model) seen.push_back(current(model));
    return seen;
}

using Seen = std::vector<std::string>;

class GatewayModel : public modeltest::ModelTest {
protected:
    GatewayModel() {
        add("lo", "", "");
        add("eth0", "192.168.1.1", "");
        add("eth1", "", "");
        eth2 = add("eth2", "172.16.5.1", "2001:db8:5::1");
        add("eth3", "", "2001:db8:3::1");
        add("usb0", "169.254.95.1", "", host.serviceProcessor());
        // Described like a service processor port, but it hangs off the host.
        add("usb1", "169.254.96.1", "", host.root(), "BMC usb1");
    }

    // An endpoint with its two gateways, running IPv4.
    int add(const std::string& name, const std::string& v4, const std::string& v6, int parent = -1,
            const std::string& description = "") {
        int ep = host.endpoint(parent < 0 ? host.root() : parent, name, description.empty() ? name : description);
        host.text(ep, IPv4Gateway, v4).text(ep, IPv6Gateway, v6).number(ep, ProtocolIFType, 4096);
        return ep;
    }

    testhost::HostBuilder host;
    int eth2 = -1;
};

TEST_F(GatewayModel, EnumerationStartsAtAGatewayPresentsBothGatewaysAndKeepsGatewaylessFollowers) {
    testhost::ScopedHostModel model(host);
    RemoteServiceAccessPoint gateways;
    EXPECT_EQ(walk(gateways), (Seen{"eth0_IPv4 192.168.1.1 3", "eth1_IPv4  3",  // no gateway, still presented
                                    "eth2_IPv6 2001:db8:5::1 4", "eth2_IPv4 172.16.5.1 3", "eth3_IPv6 2001:db8:3::1 4",
                                    "usb0_IPv4 169.254.95.1 3", "usb1_IPv4 169.254.96.1 3"}));
    gateways.initialize();
    EXPECT_EQ(current(gateways), "eth0_IPv4 192.168.1.1 3");

    // Without any readable gateway on the host, there is nothing to present.
    testhost::HostBuilder bare;
    int ep = bare.endpoint(bare.root(), "eth0", "eth0");
    bare.text(ep, IPv4Gateway, "").text(ep, IPv6Gateway, "2001:db8::1").unreadable(ep, IPv6Gateway);
    testhost::ScopedHostModel bareModel(bare);
    RemoteServiceAccessPoint none;
    EXPECT_FALSE(none);
}

TEST_F(GatewayModel, NamesMatchBeforeTheLastUnderscore) {
    testhost::ScopedHostModel model(host);
    const auto lookup = [](std::vector<std::pair<RemoteServiceAccessPoint::FilterType, std::string>> filters) {
        RemoteServiceAccessPoint gateways;
        for (const auto& [type, reference] : filters) gateways.setFilter(type, reference);
        return walk(gateways);
    };
    const auto byName = RemoteServiceAccessPoint::ByName;
    const auto bySystem = RemoteServiceAccessPoint::BySystemName;
    // The IPv4 suffix asks for the node's IPv4 presentation; any other suffix finds the node.
    EXPECT_EQ(lookup({{bySystem, modeltest::hostName()}, {byName, "eth2_IPv4"}}), Seen{"eth2_IPv4 172.16.5.1 3"});
    EXPECT_EQ(lookup({{byName, "eth0_anything"}}), Seen{"eth0_IPv4 192.168.1.1 3"});
    EXPECT_EQ(lookup({{bySystem, "BMC:-1"}}), Seen{"usb0_IPv4 169.254.95.1 3"});
    for (const char* miss : {"eth0", "eth00_IPv4", "ETH0_IPv4"}) EXPECT_EQ(lookup({{byName, miss}}), Seen{}) << miss;
    // Filters accumulate: a second name behind the first is not found.
    EXPECT_EQ(lookup({{byName, "eth3_IPv6"}, {byName, "eth0_IPv4"}}), Seen{});
}

TEST_F(GatewayModel, UnreadableNamesDoNotExcludeANode) {
    host.unreadable(eth2, ElementName);
    testhost::ScopedHostModel model(host);
    RemoteServiceAccessPoint gateways;
    gateways.setFilter(RemoteServiceAccessPoint::ByName, "eth3_IPv6");
    ASSERT_TRUE(gateways);
    std::string name = "untouched", accessInfo;
    EXPECT_FALSE(gateways.getName(name));
    EXPECT_EQ(name, "untouched");
    gateways.getAccessInfo(accessInfo);
    EXPECT_EQ(accessInfo, "2001:db8:5::1");  // eth2, whose name could not be read
}

TEST_F(GatewayModel, ChangeFilterReferenceRewritesTheFirstUnderscoredNameFilter) {
    testhost::ScopedHostModel model(host);
    PeekingGateway gateways;
    gateways.setFilter(RemoteServiceAccessPoint::BySystemName, "host_IPv6");
    for (const char* name : {"plain", "eth2_IPv6", "eth3_IPv6"})
        gateways.setFilter(RemoteServiceAccessPoint::ByName, name);
    gateways.changeFilterReference();
    std::vector<std::string> references;
    for (const auto& filter : gateways.filters) references.push_back(filter.reference);
    EXPECT_EQ(references, (Seen{"host_IPv6", "plain", "eth2_IPv4", "eth3_IPv6"}));

    // Five characters after the "_" give way to "IPv4".
    PeekingGateway longSuffix;
    longSuffix.setFilter(RemoteServiceAccessPoint::ByName, "a_b_IPv6xyz");
    longSuffix.changeFilterReference();
    EXPECT_EQ(longSuffix.filters[0].reference, "a_b_IPv4yz");

    // A filtered walk from a node's IPv6 presentation to its IPv4 one rewrites the reference.
    PeekingGateway walked;
    walked.setFilter(RemoteServiceAccessPoint::ByName, "eth2_IPv6");
    ++walked;
    EXPECT_EQ(walked.filters[0].reference, "eth2_IPv4");
    EXPECT_EQ(current(walked), "eth2_IPv4 172.16.5.1 3");
}

// Unlike the endpoint, the gateway knows the service processor by its grandparent described "BMC".
TEST_F(GatewayModel, ServiceProcessorIsTheGrandparentDescribedBmc) {
    const auto system = [](const std::string& name) {
        RemoteServiceAccessPoint gateways;
        gateways.setFilter(RemoteServiceAccessPoint::ByName, name);
        std::string systemName, systemClass;
        EXPECT_TRUE(gateways.getSystemName(systemName));
        EXPECT_TRUE(gateways.getSystemCreationClassName(systemClass));
        return systemName + " " + systemClass;
    };
    {
        testhost::ScopedHostModel model(host);
        EXPECT_EQ(system("usb0_IPv4"), "BMC:-1 KVRNX_SPComputerSystem");
        EXPECT_EQ(system("usb1_IPv4"), modeltest::hostName() + " KVRNX_ComputerSystem");
    }
    // A service processor described "BMC " (with a blank) is not recognised.
    testhost::HostBuilder other;
    int ep = other.endpoint(other.serviceProcessor("BMC "), "usb0", "BMC usb0");
    other.text(ep, IPv4Gateway, "169.254.95.1");
    testhost::ScopedHostModel otherModel(other);
    EXPECT_EQ(system("usb0_IPv4"), modeltest::hostName() + " KVRNX_ComputerSystem");
}

// The interface's protocol picks the gateway written, whichever presentation is modified.
TEST_F(GatewayModel, SetAccessInfoWritesTheGatewayOfTheInterfaceProtocol) {
    for (auto [protocol, written] : std::vector<std::pair<unsigned, unsigned>>{
             {4096, IPv4Gateway}, {4097, IPv6Gateway}, {4098, IPv6Gateway}, {0, 0}, {4099, 0}}) {
        host.number(eth2, ProtocolIFType, protocol);
        testhost::ScopedHostModel model(host);
        RemoteServiceAccessPoint gateways;
        gateways.setFilter(RemoteServiceAccessPoint::ByName, protocol == 4096 ? "eth2_IPv6" : "eth2_IPv4");
        EXPECT_EQ(gateways.setAccessInfo("2001:db8:5::fe"), written != 0) << protocol;
        Seen writes;
        for (const auto& write : model.backend().writes())
            writes.push_back(std::to_string(write.property) + "=" + write.value.text);
        EXPECT_EQ(writes, written ? Seen{std::to_string(written) + "=2001:db8:5::fe"} : Seen{}) << protocol;
    }
}

}  // namespace
