// The IP protocol endpoint model and the filter/walk pattern it shares with the other models.
#include <sched.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cstring>
#include <string>
#include <utility>
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
        host.endpoint(host.root(), "eth1", "eth1");
        // Described exactly "BMC" but on the host: not the service processor's.
        host.endpoint(host.root(), "lom0", "BMC");
        host.endpoint(host.serviceProcessor(), "usb0", "BMC usb0");
    }

    static std::vector<std::string> walk(IPprotocolEndpoint& model) {
        std::vector<std::string> names;
        for (int guard = 0; model && guard < 20; ++guard, ++model) {
            std::string name;
            model.getName(name);
            names.push_back(name);
        }
        return names;
    }

    testhost::HostBuilder host;
    int eth0 = -1;
};

TEST_F(EndpointModel, WalksEveryEndpointAndFiltersNarrowWithoutRewinding) {
    testhost::ScopedHostModel model(host);
    IPprotocolEndpoint endpoints;
    endpoints.setFilter(IPprotocolEndpoint::ByName, "eth1");
    ASSERT_TRUE(endpoints);
    // A second name cannot be found behind the first: the cursor never goes back.
    endpoints.setFilter(IPprotocolEndpoint::ByName, "eth0");
    EXPECT_FALSE(endpoints);
    // Nor does a filter added after walking on.
    IPprotocolEndpoint walked;
    ++walked;
    walked.setFilter(IPprotocolEndpoint::ByName, "eth0");
    EXPECT_FALSE(walked);
    // initialize forgets the filters and starts over.
    endpoints.initialize();
    EXPECT_EQ(walk(endpoints), (std::vector<std::string>{"eth0", "eth1", "lom0", "usb0"}));
    endpoints.initialize();
    endpoints.setFilter(IPprotocolEndpoint::ByName, "eth0");
    EXPECT_EQ(walk(endpoints), std::vector<std::string>{"eth0"});

    for (const char* other : {"ETH0", "eth"}) {
        IPprotocolEndpoint miss;
        miss.setFilter(IPprotocolEndpoint::ByName, other);
        EXPECT_FALSE(miss) << other;
    }
    // A filter of a kind the class does not know never excludes anything.
    IPprotocolEndpoint unknown;
    unknown.setFilter(static_cast<IPprotocolEndpoint::FilterType>(7), "anything");
    EXPECT_EQ(walk(unknown).size(), 4u);

    testhost::HostBuilder bare;
    bare.node(bare.root(), 12, "eth0", "eth0");  // a port without an IP endpoint
    testhost::ScopedHostModel bareModel(bare);
    IPprotocolEndpoint none;
    none.setFilter(IPprotocolEndpoint::ByName, "eth0");
    ++none;
    EXPECT_FALSE(none);
}

TEST_F(EndpointModel, ServiceProcessorIsRecognisedByBmcAndABlank) {
    testhost::ScopedHostModel model(host);
    std::vector<std::string> seen;
    for (IPprotocolEndpoint endpoints; endpoints; ++endpoints) {
        std::string name, system, systemClass;
        endpoints.getName(name);
        EXPECT_TRUE(endpoints.getSystemName(system));
        endpoints.getSystemCreationClassName(systemClass);
        seen.push_back(name + " " + system + " " + systemClass);
    }
    const std::string host = " " + modeltest::hostName() + " KVRNX_ComputerSystem";
    EXPECT_EQ(seen, (std::vector<std::string>{"eth0" + host, "eth1" + host, "lom0" + host,
                                              "usb0 BMC:-1 KVRNX_SPComputerSystem"}));

    IPprotocolEndpoint hostSide;
    hostSide.setFilter(IPprotocolEndpoint::BySystemName, modeltest::hostName());
    EXPECT_EQ(walk(hostSide), (std::vector<std::string>{"eth0", "eth1", "lom0"}));
}

TEST_F(EndpointModel, StateCodesMapToEnabledStatesAndOnlyThreeStatesAreWritten) {
    using Case = std::pair<unsigned, unsigned short>;  // node code, enabled state
    for (auto [code, state] : std::vector<Case>{{1, 2}, {12, 3}, {16, 3}, {9, 5}, {0, 5}}) {
        host.number(eth0, AdminState, code);
        testhost::ScopedHostModel scoped(host);
        IPprotocolEndpoint endpoint;
        unsigned short enabled = 77, requested = 77;
        EXPECT_TRUE(endpoint.getEnabledState(enabled));
        EXPECT_TRUE(endpoint.getRequestedState(requested));
        EXPECT_EQ(enabled, state) << "node code " << code;
        EXPECT_EQ(requested, state) << "node code " << code;
    }
    host.unreadable(eth0, AdminState);
    testhost::ScopedHostModel model(host);
    IPprotocolEndpoint endpoint;
    unsigned short enabled = 77;
    EXPECT_TRUE(endpoint.getEnabledState(enabled));
    EXPECT_EQ(enabled, 77);

    for (unsigned short refused : {0, 1, 4, 12}) EXPECT_FALSE(endpoint.setEnabledState(refused)) << refused;
    EXPECT_TRUE(model.backend().writes().empty());
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

    // Only static and DHCP have a node code; anything else is stored as unknown.
    testhost::ScopedHostModel model(host);
    IPprotocolEndpoint endpoint;
    for (auto [written, nodeCode, readBack] : std::vector<std::array<unsigned, 3>>{{3, 3, 3}, {4, 1, 4}, {2, 0, 0}}) {
        EXPECT_TRUE(endpoint.setAddressOrigin(static_cast<unsigned short>(written)));
        EXPECT_EQ(model.backend().number(host.path(eth0), AddressOrigin), nodeCode) << written;
        unsigned short origin = 99;
        endpoint.getAddressOrigin(origin);
        EXPECT_EQ(origin, readBack) << written;
    }
}

// The host name is read once per request (in a UTS namespace of a child's own): a rename during
// the request shows from the next request on, or at once when the request made it itself.
TEST_F(EndpointModel, SystemNameIsReadOncePerRequest) {
    using Nx::IPInterfaceProvider::RequestScope;
    testhost::ScopedHostModel model(host);
    const pid_t child = ::fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
        if (::unshare(CLONE_NEWUTS) != 0) ::_exit(99);
        const auto rename = [](const char* name) { return ::sethostname(name, std::strlen(name)) == 0; };
        const auto systemName = [] {
            std::string name;
            IPprotocolEndpoint().getSystemName(name);
            return name;
        };
        int wrong = !rename("first");
        {
            const RequestScope request;
            wrong |= (systemName() != "first") << 1;
            wrong |= !rename("second") << 2;
            const RequestScope upcall;
            wrong |= (systemName() != "first") << 3;
            RequestScope::hostNameChanged();
            wrong |= (systemName() != "second") << 4;
            wrong |= !rename("third") << 5;
        }
        wrong |= (systemName() != "third") << 6;
        ::_exit(wrong);
    }
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFEXITED(status));
    if (WEXITSTATUS(status) == 99) GTEST_SKIP() << "no UTS namespace here";
    EXPECT_EQ(WEXITSTATUS(status), 0) << "bit set per failed check";
}

// A lookup by name goes straight to the endpoints of that name: the walk (which traces each
// evaluation) evaluates no endpoint of another readable name, yet still looks at one whose name
// cannot be read, and finds every endpoint of the name in order.
TEST_F(EndpointModel, LookupByNameEvaluatesOnlyEndpointsThatMayMatch) {
    for (int i = 0; i < 40; ++i) host.endpoint(host.root(), "veth" + std::to_string(i), "veth");
    host.remove(host.endpoint(host.root(), "nameless", "x"), ElementName);
    host.endpoint(host.root(), "veth30", "again");
    testhost::ScopedHostModel model(host);
    testfiles::ScratchDir logs;
    const std::string trace = logs.file("trace");
    std::vector<std::string> names;
    {
        testfiles::ScopedEnv level("IPIF_LOG_LEVEL", "0"), log("IPIF_LOG_FILE", "/dev/null"),
            traceEnv("IPIF_TRACE_FILE", trace);
        TALog::TALogger::reconfigure();
        IPprotocolEndpoint endpoints;
        endpoints.setFilter(IPprotocolEndpoint::ByName, "veth30");
        names = walk(endpoints);
    }
    TALog::TALogger::reconfigure();
    EXPECT_EQ(names, (std::vector<std::string>{"veth30", "veth30"}));
    const std::string traced = testfiles::readFile(trace);
    size_t evaluations = 0;
    for (size_t at = traced.find("ENTERING: evaluate()"); at != std::string::npos;
         at = traced.find("ENTERING: evaluate()", at + 1))
        ++evaluations;
    EXPECT_EQ(evaluations, 3u);  // the two of that name and the nameless one
}

}  // namespace
