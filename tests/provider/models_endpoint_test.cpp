// The IP protocol endpoint model and the filter/walk pattern it shares with the other models.
#include <string>
#include <vector>

#include "Lindows/IPprotocolEndpoint.h"
#include "models_fixture.h"

using Nx::IPInterfaceProvider::IPprotocolEndpoint;
using namespace Nx::NodeLexicon;

namespace {

class EndpointModel : public modeltest::ModelTest {
protected:
    EndpointModel() {
        eth0 = host.endpoint(host.root(), "eth0", "eth0");
        eth1 = host.endpoint(host.root(), "eth1", "eth1");
        // Described exactly "BMC" but on the host: not the service processor's.
        lom = host.endpoint(host.root(), "lom0", "BMC");
        int sp = host.serviceProcessor();
        usb0 = host.endpoint(sp, "usb0", "BMC usb0");
        for (int ep : {eth0, eth1, lom, usb0}) {
            host.number(ep, AdminState, 1).number(ep, AddressOrigin, 3).number(ep, IPVersion, 1);
            host.text(ep, IPv4Address, "10.0.0.1").text(ep, SubnetMask, "255.0.0.0");
        }
    }

    std::vector<std::string> walk(IPprotocolEndpoint& model) {
        std::vector<std::string> names;
        for (int guard = 0; model && guard < 20; ++guard, ++model) {
            std::string name;
            model.getName(name);
            names.push_back(name);
        }
        return names;
    }

    testhost::HostBuilder host;
    int eth0 = -1, eth1 = -1, lom = -1, usb0 = -1;
};

TEST_F(EndpointModel, WalksEveryEndpointAndFiltersNarrowWithoutRewinding) {
    testhost::ScopedHostModel model(host);
    {
        IPprotocolEndpoint endpoints;
        EXPECT_EQ(walk(endpoints), (std::vector<std::string>{"eth0", "eth1", "lom0", "usb0"}));
    }
    {
        IPprotocolEndpoint endpoints;
        endpoints.setFilter(IPprotocolEndpoint::ByName, "eth1");
        ASSERT_TRUE(endpoints);
        std::string name;
        endpoints.getName(name);
        EXPECT_EQ(name, "eth1");
        // A second name cannot be found behind the first: the cursor never goes back.
        endpoints.setFilter(IPprotocolEndpoint::ByName, "eth0");
        EXPECT_FALSE(endpoints);
        // Nor does a filter added after walking on.
        IPprotocolEndpoint walked;
        walked.setFilter(IPprotocolEndpoint::BySystemName, modeltest::hostName());
        ++walked;
        walked.setFilter(IPprotocolEndpoint::ByName, "eth0");
        EXPECT_FALSE(walked);
        // initialize forgets the filters and starts over.
        endpoints.initialize();
        EXPECT_EQ(walk(endpoints).size(), 4u);
        endpoints.initialize();
        endpoints.setFilter(IPprotocolEndpoint::ByName, "eth0");
        EXPECT_EQ(walk(endpoints), std::vector<std::string>{"eth0"});
    }
    {
        // Names differing only in case or length do not match.
        for (const char* other : {"ETH0", "eth", "eth00", ""}) {
            IPprotocolEndpoint endpoints;
            endpoints.setFilter(IPprotocolEndpoint::ByName, other);
            EXPECT_FALSE(endpoints) << other;
        }
    }
    {
        // System and name together: a key lookup.
        IPprotocolEndpoint endpoints;
        endpoints.setFilter(IPprotocolEndpoint::BySystemName, "BMC:-1");
        endpoints.setFilter(IPprotocolEndpoint::ByName, "usb0");
        EXPECT_EQ(walk(endpoints), std::vector<std::string>{"usb0"});

        IPprotocolEndpoint wrongSystem;
        wrongSystem.setFilter(IPprotocolEndpoint::BySystemName, modeltest::hostName());
        wrongSystem.setFilter(IPprotocolEndpoint::ByName, "usb0");
        EXPECT_FALSE(wrongSystem);

        IPprotocolEndpoint hostSide;
        hostSide.setFilter(IPprotocolEndpoint::BySystemName, modeltest::hostName());
        EXPECT_EQ(walk(hostSide), (std::vector<std::string>{"eth0", "eth1", "lom0"}));
    }
    {
        // A filter of a kind the class does not know never excludes anything.
        IPprotocolEndpoint endpoints;
        endpoints.setFilter(static_cast<IPprotocolEndpoint::FilterType>(7), "anything");
        EXPECT_EQ(walk(endpoints).size(), 4u);
    }
}

TEST_F(EndpointModel, HostWithoutEndpointsHasNothingToPresent) {
    testhost::HostBuilder bare;
    bare.node(bare.root(), 12, "eth0", "eth0");  // a port without an IP endpoint
    testhost::ScopedHostModel model(bare);
    IPprotocolEndpoint endpoints;
    EXPECT_FALSE(endpoints);
    endpoints.setFilter(IPprotocolEndpoint::ByName, "eth0");
    EXPECT_FALSE(endpoints);
    ++endpoints;
    EXPECT_FALSE(endpoints);
}

TEST_F(EndpointModel, ServiceProcessorIsRecognisedByBmcAndABlank) {
    testhost::ScopedHostModel model(host);
    IPprotocolEndpoint endpoints;
    struct Seen {
        std::string name, systemName, systemClass;
    };
    std::vector<Seen> seen;
    for (; endpoints; ++endpoints) {
        Seen one;
        endpoints.getName(one.name);
        EXPECT_TRUE(endpoints.getSystemName(one.systemName));
        endpoints.getSystemCreationClassName(one.systemClass);
        seen.push_back(one);
    }
    ASSERT_EQ(seen.size(), 4u);
    EXPECT_EQ(seen[2].name, "lom0");
    EXPECT_EQ(seen[2].systemName, modeltest::hostName());
    EXPECT_EQ(seen[2].systemClass, "KVRNX_ComputerSystem");
    EXPECT_EQ(seen[3].name, "usb0");
    EXPECT_EQ(seen[3].systemName, "BMC:-1");
    EXPECT_EQ(seen[3].systemClass, "KVRNX_SPComputerSystem");
    EXPECT_EQ(seen[0].systemName, modeltest::hostName());
}

TEST_F(EndpointModel, StateCodesMapToEnabledStates) {
    struct Case {
        unsigned int code;
        unsigned short state;
    };
    for (Case c : {Case{1, 2}, Case{12, 3}, Case{16, 3}, Case{9, 5}, Case{0, 5}, Case{2, 5}}) {
        host.number(eth0, AdminState, c.code);
        testhost::ScopedHostModel scoped(host);
        IPprotocolEndpoint endpoint;
        unsigned short enabled = 77, requested = 77;
        EXPECT_TRUE(endpoint.getEnabledState(enabled));
        EXPECT_TRUE(endpoint.getRequestedState(requested));
        EXPECT_EQ(enabled, c.state) << "node code " << c.code;
        EXPECT_EQ(requested, c.state) << "node code " << c.code;
    }
    host.unreadable(eth0, AdminState);
    testhost::ScopedHostModel scoped(host);
    IPprotocolEndpoint endpoint;
    unsigned short enabled = 77;
    EXPECT_TRUE(endpoint.getEnabledState(enabled));
    EXPECT_EQ(enabled, 77);
}

TEST_F(EndpointModel, SetEnabledStateWritesOnlyTheThreeAcceptedStates) {
    testhost::ScopedHostModel model(host);
    const std::string path = host.path(eth0);
    IPprotocolEndpoint endpoint;
    for (unsigned short refused : {0, 1, 4, 5, 6, 9, 10, 12}) EXPECT_FALSE(endpoint.setEnabledState(refused));
    EXPECT_TRUE(model.backend().writes().empty());

    EXPECT_TRUE(endpoint.setEnabledState(11));
    EXPECT_EQ(model.backend().number(path, AdminState), 9u);
    unsigned short state = 0;
    endpoint.getEnabledState(state);
    EXPECT_EQ(state, 5);  // a pending reset is neither enabled nor disabled

    EXPECT_TRUE(endpoint.setEnabledState(3));
    EXPECT_EQ(model.backend().number(path, AdminState), 12u);
    endpoint.getEnabledState(state);
    EXPECT_EQ(state, 3);

    EXPECT_TRUE(endpoint.setEnabledState(2));
    EXPECT_EQ(model.backend().number(path, AdminState), 1u);
    EXPECT_EQ(model.backend().writes().size(), 3u);

    model.backend().refuseWrites(true);
    EXPECT_FALSE(endpoint.setEnabledState(3));
}

TEST_F(EndpointModel, AddressOriginTableAndRoundTrips) {
    const unsigned short expected[] = {0, 4, 5, 3, 6, 1, 1, 0, 0};
    for (unsigned int code = 0; code < 9; ++code) {
        host.number(eth0, AddressOrigin, code);
        testhost::ScopedHostModel model(host);
        IPprotocolEndpoint endpoint;
        unsigned short origin = 99;
        EXPECT_TRUE(endpoint.getAddressOrigin(origin));
        EXPECT_EQ(origin, expected[code]) << "node code " << code;
    }

    testhost::ScopedHostModel model(host);
    IPprotocolEndpoint endpoint;
    struct Case {
        unsigned short written;
        unsigned int nodeCode;
        unsigned short readBack;
    };
    for (Case c : {Case{3, 3, 3}, Case{4, 1, 4}, Case{2, 0, 0}, Case{1, 0, 0}, Case{6, 0, 0}}) {
        EXPECT_TRUE(endpoint.setAddressOrigin(c.written));
        EXPECT_EQ(model.backend().number(host.path(eth0), AddressOrigin), c.nodeCode) << c.written;
        unsigned short origin = 99;
        endpoint.getAddressOrigin(origin);
        EXPECT_EQ(origin, c.readBack) << c.written;
    }
}

}  // namespace
