// The gateway model: one or two presentations per endpoint, name matching without the suffix.
#include <string>
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

struct Presented {
    std::string name, accessInfo;
    unsigned short infoFormat;
    bool operator==(const Presented& other) const {
        return name == other.name && accessInfo == other.accessInfo && infoFormat == other.infoFormat;
    }
};

std::ostream& operator<<(std::ostream& out, const Presented& p) {
    return out << p.name << "/" << p.accessInfo << "/" << p.infoFormat;
}

class GatewayModel : public modeltest::ModelTest {
protected:
    GatewayModel() {
        int none0 = host.endpoint(host.root(), "lo", "lo");
        setGateways(none0, "", "", 4096);
        int eth0 = host.endpoint(host.root(), "eth0", "eth0");
        setGateways(eth0, "192.168.1.1", "", 4096);
        int eth1 = host.endpoint(host.root(), "eth1", "eth1");
        setGateways(eth1, "", "", 4096);
        eth2 = host.endpoint(host.root(), "eth2", "eth2");
        setGateways(eth2, "172.16.5.1", "2001:db8:5::1", 4096);
        int eth3 = host.endpoint(host.root(), "eth3", "eth3");
        setGateways(eth3, "", "2001:db8:3::1", 4097);
        int sp = host.serviceProcessor();
        usb0 = host.endpoint(sp, "usb0", "BMC usb0");
        setGateways(usb0, "169.254.95.1", "", 4096);
        // Described like a service processor port, but it hangs off the host.
        fake = host.endpoint(host.root(), "usb1", "BMC usb1");
        setGateways(fake, "169.254.96.1", "", 4096);
    }

    void setGateways(int ep, const std::string& v4, const std::string& v6, unsigned int protocol) {
        host.text(ep, IPv4Gateway, v4).text(ep, IPv6Gateway, v6).number(ep, ProtocolIFType, protocol);
    }

    static Presented current(RemoteServiceAccessPoint& model) {
        Presented p{"", "", 0};
        model.getName(p.name);
        EXPECT_TRUE(model.getAccessInfo(p.accessInfo));
        EXPECT_TRUE(model.getInfoFormat(p.infoFormat));
        return p;
    }
    static std::vector<Presented> walk(RemoteServiceAccessPoint& model) {
        std::vector<Presented> seen;
        for (int guard = 0; model && guard < 20; ++guard, ++model) seen.push_back(current(model));
        return seen;
    }

    testhost::HostBuilder host;
    int eth2 = -1, usb0 = -1, fake = -1;
};

TEST_F(GatewayModel, EnumerationStartsAtAGatewayPresentsBothGatewaysAndKeepsGatewaylessFollowers) {
    testhost::ScopedHostModel model(host);
    RemoteServiceAccessPoint gateways;
    const std::vector<Presented> expected{
        {"eth0_IPv4", "192.168.1.1", 3},   {"eth1_IPv4", "", 3},  // no gateway, still presented
        {"eth2_IPv6", "2001:db8:5::1", 4}, {"eth2_IPv4", "172.16.5.1", 3},
        {"eth3_IPv6", "2001:db8:3::1", 4}, {"usb0_IPv4", "169.254.95.1", 3},
        {"usb1_IPv4", "169.254.96.1", 3},
    };
    EXPECT_EQ(walk(gateways), expected);

    gateways.initialize();
    EXPECT_EQ(current(gateways), expected.front());
    unsigned short context = 0;
    std::string other = "untouched", element, creation;
    EXPECT_TRUE(gateways.getAccessContext(context));
    EXPECT_EQ(context, 2);
    EXPECT_FALSE(gateways.getOtherAccessContext(other));
    EXPECT_EQ(other, "untouched");
    EXPECT_TRUE(gateways.getElementName(element));
    EXPECT_EQ(element, "eth0");
    EXPECT_TRUE(gateways.getCreationClassName(creation));
    EXPECT_EQ(creation, "KVRNX_IPRemoteServiceAccessPoint");

    // Without any gateway on the host, there is nothing to present.
    testhost::HostBuilder bare;
    int ep = bare.endpoint(bare.root(), "eth0", "eth0");
    bare.text(ep, IPv4Gateway, "").text(ep, IPv6Gateway, "2001:db8::1").unreadable(ep, IPv6Gateway);
    testhost::ScopedHostModel bareModel(bare);
    RemoteServiceAccessPoint none;
    EXPECT_FALSE(none);
}

TEST_F(GatewayModel, NamesMatchBeforeTheLastUnderscore) {
    testhost::ScopedHostModel model(host);
    {
        // The suffix does not pick the node; a lookup of either presentation finds eth2, and asks
        // for the presentation its suffix names.
        RemoteServiceAccessPoint gateways;
        gateways.setFilter(RemoteServiceAccessPoint::ByName, "eth2_IPv6");
        EXPECT_EQ(walk(gateways), (std::vector<Presented>{{"eth2_IPv6", "2001:db8:5::1", 4},
                                                           {"eth2_IPv4", "172.16.5.1", 3}}));
    }
    {
        RemoteServiceAccessPoint gateways;
        gateways.setFilter(RemoteServiceAccessPoint::BySystemName, modeltest::hostName());
        gateways.setFilter(RemoteServiceAccessPoint::ByName, "eth2_IPv4");
        ASSERT_TRUE(gateways);
        EXPECT_EQ(current(gateways), (Presented{"eth2_IPv4", "172.16.5.1", 3}));
    }
    {
        RemoteServiceAccessPoint gateways;
        gateways.setFilter(RemoteServiceAccessPoint::ByName, "eth0_anything");
        EXPECT_EQ(walk(gateways), (std::vector<Presented>{{"eth0_IPv4", "192.168.1.1", 3}}));
    }
    for (const char* miss : {"eth0", "eth_IPv4", "eth00_IPv4", "ETH0_IPv4", "_IPv4"}) {
        RemoteServiceAccessPoint gateways;
        gateways.setFilter(RemoteServiceAccessPoint::ByName, miss);
        EXPECT_FALSE(gateways) << miss;
    }
    {
        // Filters accumulate: a second name behind the first is not found.
        RemoteServiceAccessPoint gateways;
        gateways.setFilter(RemoteServiceAccessPoint::ByName, "eth3_IPv6");
        gateways.setFilter(RemoteServiceAccessPoint::ByName, "eth0_IPv4");
        EXPECT_FALSE(gateways);
    }
    {
        RemoteServiceAccessPoint gateways;
        gateways.setFilter(RemoteServiceAccessPoint::BySystemName, "BMC:-1");
        EXPECT_EQ(walk(gateways), (std::vector<Presented>{{"usb0_IPv4", "169.254.95.1", 3}}));
    }
}

TEST_F(GatewayModel, UnreadableNamesDoNotExcludeANode) {
    host.unreadable(eth2, ElementName);
    testhost::ScopedHostModel model(host);
    RemoteServiceAccessPoint gateways;
    gateways.setFilter(RemoteServiceAccessPoint::ByName, "eth3_IPv6");
    ASSERT_TRUE(gateways);
    std::string name = "untouched";
    EXPECT_FALSE(gateways.getName(name));
    EXPECT_EQ(name, "untouched");
    std::string accessInfo;
    gateways.getAccessInfo(accessInfo);
    EXPECT_EQ(accessInfo, "2001:db8:5::1");  // eth2, whose name could not be read
}

TEST_F(GatewayModel, ChangeFilterReferenceRewritesTheFirstUnderscoredNameFilter) {
    testhost::ScopedHostModel model(host);
    PeekingGateway gateways;
    gateways.setFilter(RemoteServiceAccessPoint::BySystemName, "host_IPv6");
    gateways.setFilter(RemoteServiceAccessPoint::ByName, "plain");
    gateways.setFilter(RemoteServiceAccessPoint::ByName, "eth2_IPv6");
    gateways.setFilter(RemoteServiceAccessPoint::ByName, "eth3_IPv6");
    gateways.changeFilterReference();
    ASSERT_EQ(gateways.filters.size(), 4u);
    EXPECT_EQ(gateways.filters[0].reference, "host_IPv6");
    EXPECT_EQ(gateways.filters[1].reference, "plain");
    EXPECT_EQ(gateways.filters[2].reference, "eth2_IPv4");
    EXPECT_EQ(gateways.filters[3].reference, "eth3_IPv6");

    PeekingGateway longSuffix;
    longSuffix.setFilter(RemoteServiceAccessPoint::ByName, "a_b_IPv6xyz");
    longSuffix.changeFilterReference();
    EXPECT_EQ(longSuffix.filters[0].reference, "a_b_IPv4yz");

    // Moving from a node's IPv6 presentation to its IPv4 one does it during a filtered walk.
    PeekingGateway walked;
    walked.setFilter(RemoteServiceAccessPoint::ByName, "eth2_IPv6");
    ++walked;
    EXPECT_EQ(walked.filters[0].reference, "eth2_IPv4");
    EXPECT_EQ(current(walked), (Presented{"eth2_IPv4", "172.16.5.1", 3}));
}

TEST_F(GatewayModel, ServiceProcessorIsTheGrandparentDescribedBmc) {
    testhost::ScopedHostModel model(host);
    RemoteServiceAccessPoint gateways;
    gateways.setFilter(RemoteServiceAccessPoint::ByName, "usb0_IPv4");
    std::string systemName, systemClass;
    EXPECT_TRUE(gateways.getSystemName(systemName));
    EXPECT_TRUE(gateways.getSystemCreationClassName(systemClass));
    EXPECT_EQ(systemName, "BMC:-1");
    EXPECT_EQ(systemClass, "KVRNX_SPComputerSystem");

    RemoteServiceAccessPoint lookalike;  // "BMC usb1" in its own description, but under the host
    lookalike.setFilter(RemoteServiceAccessPoint::ByName, "usb1_IPv4");
    ASSERT_TRUE(lookalike);
    EXPECT_TRUE(lookalike.getSystemName(systemName));
    EXPECT_TRUE(lookalike.getSystemCreationClassName(systemClass));
    EXPECT_EQ(systemName, modeltest::hostName());
    EXPECT_EQ(systemClass, "KVRNX_ComputerSystem");

    // A service processor described "BMC " (with a blank) is not recognised.
    testhost::HostBuilder other;
    int sp = other.serviceProcessor("BMC ");
    int ep = other.endpoint(sp, "usb0", "BMC usb0");
    other.text(ep, IPv4Gateway, "169.254.95.1");
    testhost::ScopedHostModel otherModel(other);
    RemoteServiceAccessPoint blank;
    ASSERT_TRUE(blank);
    blank.getSystemCreationClassName(systemClass);
    EXPECT_EQ(systemClass, "KVRNX_ComputerSystem");
}

TEST_F(GatewayModel, SetAccessInfoWritesTheGatewayOfTheInterfaceProtocol) {
    testhost::ScopedHostModel model(host);
    const std::string eth2Path = host.path(eth2);
    RemoteServiceAccessPoint gateways;
    gateways.setFilter(RemoteServiceAccessPoint::ByName, "eth2_IPv6");
    // Presents the IPv6 gateway, but the interface runs IPv4 (4096): the IPv4 gateway changes.
    EXPECT_TRUE(gateways.setAccessInfo("172.16.5.254"));
    EXPECT_EQ(model.backend().text(eth2Path, IPv4Gateway), "172.16.5.254");
    EXPECT_EQ(model.backend().text(eth2Path, IPv6Gateway), "2001:db8:5::1");

    for (unsigned int protocol : {4097u, 4098u}) {
        host.number(eth2, ProtocolIFType, protocol);
        testhost::ScopedHostModel scoped(host);
        RemoteServiceAccessPoint v6;
        v6.setFilter(RemoteServiceAccessPoint::ByName, "eth2_IPv4");
        EXPECT_TRUE(v6.setAccessInfo("2001:db8:5::fe"));
        EXPECT_EQ(scoped.backend().text(eth2Path, IPv6Gateway), "2001:db8:5::fe") << protocol;
        EXPECT_EQ(scoped.backend().text(eth2Path, IPv4Gateway), "172.16.5.1") << protocol;
    }
    for (unsigned int protocol : {0u, 4099u, 1u}) {
        host.number(eth2, ProtocolIFType, protocol);
        testhost::ScopedHostModel scoped(host);
        RemoteServiceAccessPoint unknown;
        unknown.setFilter(RemoteServiceAccessPoint::ByName, "eth2_IPv6");
        EXPECT_FALSE(unknown.setAccessInfo("10.9.9.9")) << protocol;
        EXPECT_TRUE(scoped.backend().writes().empty()) << protocol;
    }
}

}  // namespace
