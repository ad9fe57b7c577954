// The configuration service and capabilities models, and what the models leave in the trace.
#include <string>
#include <vector>

#include "Lindows/ConfigurationFile.h"
#include "Lindows/IPConfigurationService.h"
#include "Lindows/IPEnabledLogicalElementCapabilities.h"
#include "Lindows/IPprotocolEndpoint.h"
#include "TALog/TALogger.h"
#include "models_fixture.h"

using Nx::IPInterfaceProvider::IPConfigurationService;
using Nx::IPInterfaceProvider::IPEnabledLogicalElementCapabilities;
using Nx::IPInterfaceProvider::IPprotocolEndpoint;
using namespace Nx::NodeLexicon;

namespace {

class ServiceModel : public modeltest::ModelTest {
protected:
    ServiceModel() {
        // The service processor's port comes first in node order and shares its name with a host port.
        int sp = host.serviceProcessor();
        spEth0 = host.endpoint(sp, "eth0", "BMC eth0");
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
    std::string text;
    EXPECT_TRUE(service.getName(text));
    EXPECT_EQ(text, "IPConfigService");
    EXPECT_TRUE(service.getElementName(text));
    EXPECT_EQ(text, "IPConfigService");
    EXPECT_TRUE(service.getCreationClassName(text));
    EXPECT_EQ(text, "KVRNX_IPConfigurationService");
    // Standing on the service processor's port changes nothing: the service is the host's.
    EXPECT_TRUE(service.getSystemCreationClassName(text));
    EXPECT_EQ(text, "KVRNX_ComputerSystem");
    EXPECT_TRUE(service.getSystemName(text));
    EXPECT_EQ(text, modeltest::hostName());
    ++service;
    EXPECT_FALSE(service);  // although two more endpoints follow
    service.initialize();
    EXPECT_TRUE(service);

    IPConfigurationService byHost;
    byHost.setFilter(IPConfigurationService::BySystemName, modeltest::hostName());
    EXPECT_TRUE(byHost);
    IPConfigurationService byOther;
    byOther.setFilter(IPConfigurationService::BySystemName, "BMC:-1");
    EXPECT_FALSE(byOther);

    testhost::HostBuilder bare;
    bare.node(bare.root(), 12, "eth0", "eth0");
    testhost::ScopedHostModel bareModel(bare);
    IPConfigurationService none;
    EXPECT_FALSE(none);
}

TEST_F(ServiceModel, CapabilitiesFollowTheEndpointsAndTheirNames) {
    testhost::ScopedHostModel model(host);
    IPEnabledLogicalElementCapabilities capabilities;
    std::vector<std::string> ids;
    for (; capabilities; ++capabilities) {
        std::string id, element;
        EXPECT_TRUE(capabilities.getInstanceID(id));
        EXPECT_TRUE(capabilities.getElementName(element));
        EXPECT_EQ(id, element);
        ids.push_back(id);
    }
    EXPECT_EQ(ids, (std::vector<std::string>{"eth0", "eth0", "eth1"}));

    // Both eth0 match; the service processor's comes first and its name is read-only.
    IPEnabledLogicalElementCapabilities lookup;
    lookup.setFilter(IPEnabledLogicalElementCapabilities::ByInstanceID, "eth0");
    bool editable = true;
    ASSERT_TRUE(lookup);
    EXPECT_TRUE(lookup.getElementNameEditSupported(editable));
    EXPECT_FALSE(editable);
    ++lookup;
    ASSERT_TRUE(lookup);
    EXPECT_TRUE(lookup.getElementNameEditSupported(editable));
    EXPECT_TRUE(editable);
    ++lookup;
    EXPECT_FALSE(lookup);

    IPEnabledLogicalElementCapabilities missing;
    missing.setFilter(IPEnabledLogicalElementCapabilities::ByInstanceID, "eth2");
    EXPECT_FALSE(missing);

    unsigned short maxLength = 33;
    capabilities.initialize();
    EXPECT_FALSE(capabilities.getMaxElementNameLen(maxLength));
    EXPECT_EQ(maxLength, 33);
    std::vector<unsigned short> states{7};
    EXPECT_TRUE(capabilities.getRequestedStatesSupported(states));
    EXPECT_TRUE(capabilities.getRequestedStatesSupported(states));
    EXPECT_EQ(states, (std::vector<unsigned short>{7, 2, 3, 11, 2, 3, 11}));

    // Every state offered is one the endpoint accepts.
    host.number(spEth0, AdminState, 1);
    testhost::ScopedHostModel writable(host);
    IPprotocolEndpoint fresh;
    for (unsigned short state : {2, 3, 11}) EXPECT_TRUE(fresh.setEnabledState(state)) << state;
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
    editable = true;
    EXPECT_FALSE(capabilities.getElementNameEditSupported(editable));
    EXPECT_TRUE(editable);
}

TEST_F(ServiceModel, TracesCarryEntryExitParametersAndRefusals) {
    std::string traced, logged;
    {
        testfiles::ScopedEnv level("IPIF_LOG_LEVEL", "3000");
        testfiles::ScopedEnv trace("IPIF_TRACE_FILE", dataDir.file("trace.log"));
        testfiles::ScopedEnv log("IPIF_LOG_FILE", dataDir.file("log.log"));
        TALog::TALogger::reconfigure();
        testhost::ScopedHostModel model(host);
        IPprotocolEndpoint endpoint;
        endpoint.setFilter(IPprotocolEndpoint::ByName, "eth1");
        endpoint.setEnabledState(3);
        Nx::IPInterfaceProvider::modifyValue(dataDir.file("ifcfg-x"), "NETMASK", "1 2");
        traced = testfiles::readFile(dataDir.file("trace.log"));
        logged = testfiles::readFile(dataDir.file("log.log"));
    }
    TALog::TALogger::reconfigure();  // back to the environment the run started with

    EXPECT_NE(traced.find("ENTERING: setFilter() in ModelPattern.h [Line: "), std::string::npos) << traced;
    EXPECT_NE(traced.find("],Parameters List:  filterType=1 reference=eth1"), std::string::npos) << traced;
    EXPECT_NE(traced.find("VARIABLE: 'evaluationPassed' has Value '1'"), std::string::npos) << traced;
    EXPECT_NE(traced.find("VARIABLE: 'name' has Value 'eth1'"), std::string::npos) << traced;
    EXPECT_NE(traced.find("EXITING: setEnabledState() in IPprotocolEndpoint.cpp [Line: "), std::string::npos);
    EXPECT_NE(traced.find(" 6000 Tarvo.IPInterfaceProvider "), std::string::npos) << traced;
    EXPECT_NE(logged.find("Refused to write a configuration value"), std::string::npos) << logged;
    EXPECT_FALSE(testfiles::fileExists(dataDir.file("ifcfg-x")));
}

}  // namespace
