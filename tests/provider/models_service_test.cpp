// The configuration service and capabilities models.
#include <string>
#include <vector>

#include "Lindows/IPConfigurationService.h"
#include "Lindows/IPEnabledLogicalElementCapabilities.h"
#include "models_fixture.h"

using Nx::IPInterfaceProvider::IPConfigurationService;
using Nx::IPInterfaceProvider::IPEnabledLogicalElementCapabilities;
using namespace Nx::NodeLexicon;

namespace {

class ServiceModel : public modeltest::ModelTest {
protected:
    ServiceModel() {
        // The service processor's port comes first in node order and shares its name with a host port.
        spEth0 = host.endpoint(host.serviceProcessor(), "eth0", "BMC eth0");
        host.readOnly(spEth0, ElementName);
        eth0 = host.endpoint(host.root(), "eth0", "eth0");
        eth1 = host.endpoint(host.root(), "eth1", "eth1");
    }

    testhost::HostBuilder host;
    int spEth0 = -1, eth0 = -1, eth1 = -1;
};

TEST_F(ServiceModel, ConfigurationServiceIsOneInstanceWhileAnyEndpointExists) {
    testhost::ScopedHostModel model(host);
    IPConfigurationService service;
    ASSERT_TRUE(service);
    // Standing on the service processor's port changes nothing: the service is the host's.
    std::string text;
    EXPECT_TRUE(service.getSystemCreationClassName(text));
    EXPECT_EQ(text, "KVRNX_ComputerSystem");
    EXPECT_TRUE(service.getSystemName(text));
    EXPECT_EQ(text, modeltest::hostName());
    ++service;
    EXPECT_FALSE(service);  // although two more endpoints follow
    service.initialize();
    EXPECT_TRUE(service);

    IPConfigurationService byHost, byOther;
    byHost.setFilter(IPConfigurationService::BySystemName, modeltest::hostName());
    byOther.setFilter(IPConfigurationService::BySystemName, "BMC:-1");
    EXPECT_TRUE(byHost);
    EXPECT_FALSE(byOther);
}

TEST_F(ServiceModel, CapabilitiesFollowTheEndpointsAndTheirNames) {
    testhost::ScopedHostModel model(host);
    std::vector<std::string> ids;
    for (IPEnabledLogicalElementCapabilities all; all; ++all) {
        std::string id, element;
        EXPECT_TRUE(all.getInstanceID(id));
        EXPECT_TRUE(all.getElementName(element));
        EXPECT_EQ(id, element);
        ids.push_back(id);
    }
    EXPECT_EQ(ids, (std::vector<std::string>{"eth0", "eth0", "eth1"}));

    // Both eth0 match; the service processor's comes first and its name is read-only.
    IPEnabledLogicalElementCapabilities lookup;
    lookup.setFilter(IPEnabledLogicalElementCapabilities::ByInstanceID, "eth0");
    std::vector<bool> editable;
    for (; lookup; ++lookup) {
        bool one = false;
        EXPECT_TRUE(lookup.getElementNameEditSupported(one));
        editable.push_back(one);
    }
    EXPECT_EQ(editable, (std::vector<bool>{false, true}));

    // The supported states are appended, not assigned.
    std::vector<unsigned short> states{7};
    EXPECT_TRUE(lookup.getRequestedStatesSupported(states));
    EXPECT_TRUE(lookup.getRequestedStatesSupported(states));
    EXPECT_EQ(states, (std::vector<unsigned short>{7, 2, 3, 11, 2, 3, 11}));
}

TEST_F(ServiceModel, CapabilitiesWithAnUnreadableOrMissingName) {
    host.unreadable(eth0, ElementName).remove(eth1, ElementName);
    testhost::ScopedHostModel model(host);
    // An unreadable name compares as empty.
    IPEnabledLogicalElementCapabilities capabilities;
    capabilities.setFilter(IPEnabledLogicalElementCapabilities::ByInstanceID, "");
    ASSERT_TRUE(capabilities);
    std::string id = "untouched";
    EXPECT_FALSE(capabilities.getInstanceID(id));
    EXPECT_EQ(id, "untouched");
    bool editable = false;
    EXPECT_TRUE(capabilities.getElementNameEditSupported(editable));  // unreadable, yet writable
    EXPECT_TRUE(editable);
    ++capabilities;
    ASSERT_TRUE(capabilities);  // eth1, without the property at all
    EXPECT_FALSE(capabilities.getElementNameEditSupported(editable));
}

}  // namespace
