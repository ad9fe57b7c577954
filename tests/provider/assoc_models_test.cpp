// The association models over the basic fixture host: the far-end monikers they build, and the
// exception (type and text) each refuses a source with.
#include <functional>
#include <string>
#include <vector>

#include "Lindows/BindsToLANEndpoint.h"
#include "Lindows/IPElementCapabilities.h"
#include "Lindows/IPElementSettingData.h"
#include "Lindows/IPHostedAccessPoint.h"
#include "Lindows/IPHostedService.h"
#include "Lindows/RemoteAccessAvailableToElement.h"
#include "Lindows/RemoteHostedAccessPoint.h"
#include "Lindows/SPHostedAccessPoint.h"
#include "Lindows/ServiceAffectsElement.h"
#include "Lindows/StaticIPElementSettingData.h"
#include "Lindows/StaticOrderedComponent.h"
#include "Nx/Exceptions.h"
#include "Nx/HostModel.h"
#include "models_fixture.h"

namespace {

using namespace Nx::IPInterfaceProvider;
using Keys = std::vector<std::pair<std::string, std::string>>;

Nx::Moniker moniker(const Keys& keys) {
    Nx::Moniker m;
    for (const auto& [name, value] : keys) m.addKey(name, value);
    return m;
}

Keys keysOf(Nx::Moniker m) {
    Keys keys;
    for (unsigned int i = 0; i < m.getKeyCount(); ++i) {
        m.selectKey(i);
        keys.emplace_back(m.getName(), m.getValue());
    }
    return keys;
}

// Runs one conversion of a freshly made model.
template <class Model>
std::function<Nx::Moniker(Nx::Moniker&)> op(Nx::Moniker (Model::*conversion)(Nx::Moniker&)) {
    return [conversion](Nx::Moniker& source) {
        Model model;
        return (model.*conversion)(source);
    };
}

class AssociationModels : public modeltest::ModelTest {
protected:
    AssociationModels() {
        Nx::HostModel::setCurrent(
            Nx::HostModel::open(std::string("fixture:") + IPIF_TEST_FIXTURES + "/host-basic.model"));
    }
    ~AssociationModels() override { Nx::HostModel::setCurrent(nullptr); }
    const std::string host = modeltest::hostName();
};

TEST_F(AssociationModels, FarEndMonikersCarryTheKeysInOrder) {
    const std::string cs = "KVRNX_ComputerSystem", ep = "KVRNX_IPProtocolEndpoint";
    struct Row {
        std::function<Nx::Moniker(Nx::Moniker&)> convert;
        Keys source;
        Keys far;
    };
    const std::vector<Row> rows = {
        {op(&IPElementSettingData::getManagedElementMoniker),
         {{"InstanceID", "BMC%usb0%static"}},
         {{"SystemCreationClassName", "KVRNX_SPComputerSystem"},
          {"SystemName", "BMC:-1"},
          {"Name", "usb0"},
          {"CreationClassName", ep}}},
        {op(&IPElementSettingData::getIPSettingDataMoniker),
         {{"Name", "usb0"}, {"SystemName", "BMC:-1"}},
         {{"InstanceID", "BMC%usb0"}}},
        {op(&StaticIPElementSettingData::getManagedElementMoniker),
         {{"InstanceID", "Computer%br0"}},
         {{"SystemName", host}, {"Name", "br0"}}},
        {op(&BindsToLANEndpoint::getLANEndpointMoniker),
         {{"SystemName", host}, {"Name", "eth1"}},
         {{"Name", "eth1"},
          {"SystemCreationClassName", cs},
          {"CreationClassName", "KVRNX_LANEndpoint"},
          {"SystemName", host}}},
        {op(&BindsToLANEndpoint::getIPProtocolEndPointMoniker),
         {{"Name", "usb0"}, {"SystemName", "BMC:-1"}},
         {{"SystemCreationClassName", "KVRNX_SPComputerSystem"},
          {"CreationClassName", ep},
          {"SystemName", "BMC:-1"},
          {"Name", "usb0"}}},
        {op(&IPHostedAccessPoint::getIPProtocolEndPointMoniker),
         {{"CreationClassName", cs}, {"Name", host}},
         {{"SystemCreationClassName", cs}, {"CreationClassName", ep}, {"SystemName", host}}},
        {op(&RemoteAccessAvailableToElement::getRemoteServiceAccessPointMoniker),
         {{"Name", "eth2"}},
         {{"Name", "eth2_IPv6"},
          {"SystemName", host},
          {"SystemCreationClassName", cs},
          {"CreationClassName", "KVRNX_IPRemoteServiceAccessPoint"}}},
        {op(&ServiceAffectsElement::getIPProtocolEndpointMoniker),
         {{"SystemName", host}},
         {{"SystemName", host}, {"CreationClassName", ep}, {"SystemCreationClassName", cs}}},
    };
    for (size_t i = 0; i < rows.size(); ++i) {
        SCOPED_TRACE("row " + std::to_string(i));
        Nx::Moniker source = moniker(rows[i].source);
        EXPECT_EQ(keysOf(rows[i].convert(source)), rows[i].far);
    }
}

TEST_F(AssociationModels, RefusalsNameTheirCauseWithTheirType) {
    enum Kind { Framework, Instrumentation };
    struct Row {
        std::function<Nx::Moniker(Nx::Moniker&)> convert;
        Keys source;
        Kind kind;
        const char* text;
    };
    const std::vector<Row> rows = {
        {op(&IPElementSettingData::getManagedElementMoniker), {}, Framework, "Could not find 'Name' key in Moniker"},
        {op(&IPElementSettingData::getManagedElementMoniker),
         {{"instanceid", "Computer%eth0%static"}},
         Framework,
         "Could not find 'Name' key in Moniker"},
        {op(&IPElementSettingData::getManagedElementMoniker),
         {{"InstanceID", "eth0"}},
         Framework,
         "Instance ID Property value is not correct"},
        {op(&IPElementSettingData::getManagedElementMoniker),
         {{"InstanceID", "BMC%eth0%static"}},
         Framework,
         "Could not get 'System Name' and  'Name' key"},
        {op(&IPElementSettingData::getIPSettingDataMoniker),
         {{"Name", "eth9"}},
         Framework,
         "Could not get 'Instance ID' key"},
        {op(&StaticIPElementSettingData::getManagedElementMoniker),
         {{"InstanceID", "eth0"}},
         Framework,
         "Could not find 'InstanceID tokens"},
        {op(&StaticIPElementSettingData::getStaticIPSettingDataMoniker),
         {{"SystemName", host}},
         Framework,
         "Could not find 'Name' key in Moniker"},
        {op(&StaticOrderedComponent::getGroupComponentMoniker),
         {{"Name", "eth0"}},
         Framework,
         "Could not find 'InstanceID' property"},
        {op(&StaticOrderedComponent::getPartComponentMoniker),
         {{"InstanceID", "Computer%eth0%dhcp"}},
         Framework,
         "AssignmentSetting data is not static"},
        {op(&StaticOrderedComponent::getPartComponentMoniker),
         {{"InstanceID", "Computer%eth9%static"}},
         Framework,
         "Could not get InstanceID"},
        {op(&BindsToLANEndpoint::getIPProtocolEndPointMoniker),
         {{"Name", "eth0"}, {"SystemName", "BMC:-1"}},
         Instrumentation,
         "Concerned Computer Could Not Be Found."},
        {op(&BindsToLANEndpoint::getIPProtocolEndPointMoniker),
         {{"SystemName", host}},
         Framework,
         "Could not find 'Name' Key in Moniker"},
        {op(&BindsToLANEndpoint::getLANEndpointMoniker),
         {{"Name", "ETH0"}},
         Framework,
         "Could not match 'System Name' key with 'Name' key in Computer Moniker"},
        {op(&IPHostedAccessPoint::getComputerSystemMoniker),
         {{"Name", "eth0"}},
         Framework,
         "Could not find 'System Name' Key in Moniker"},
        {op(&IPHostedAccessPoint::getIPProtocolEndPointMoniker),
         {{"Name", "elsewhere"}},
         Framework,
         "Could not match 'System Name' key with 'Name' key in Computer Moniker"},
        {op(&IPHostedAccessPoint::getIPProtocolEndPointMoniker),
         {{"CreationClassName", "KVRNX_SPComputerSystem"}, {"Name", host}},
         Framework,
         "'SystemCreationClasName'  is not BMC in Moniker"},
        {op(&SPHostedAccessPoint::getSPMoniker),
         {{"SystemCreationClassName", "KVRNX_ComputerSystem"}, {"SystemName", "BMC:-1"}},
         Framework,
         "'SystemCreationClasName'  is not BMC in Moniker"},
        {op(&SPHostedAccessPoint::getSPMoniker),
         {{"SystemCreationClassName", "KVRNX_SPComputerSystem"}, {"SystemName", host}},
         Framework,
         "Could not match 'Name' key with 'System Name' key in SP Moniker"},
        {op(&SPHostedAccessPoint::getIPProtocolEndPointMoniker),
         {{"Name", host}},
         Framework,
         "Could not match 'System Name' key with 'Name' key in Computer Moniker"},
        {op(&RemoteHostedAccessPoint::getRemoteSAPMoniker), {}, Framework, "Could not find 'Name' key in Moniker"},
        {op(&RemoteAccessAvailableToElement::getIPProtocolEndpointMoniker),
         {{"Name", "eth0"}},
         Framework,
         "Name Key is not correct."},
        {op(&RemoteAccessAvailableToElement::getIPProtocolEndpointMoniker),
         {{"Name", "eth9_IPv4"}},
         Instrumentation,
         "Concerned IP Protocol Endpoint Could Not Be Found."},
        {op(&RemoteAccessAvailableToElement::getRemoteServiceAccessPointMoniker),
         {{"Name", "eth9"}},
         Instrumentation,
         "Concerned DHCP Protocol Endpoint Could Not Be Found."},
        {op(&IPElementCapabilities::getIPMoniker),
         {{"Name", "eth0"}},
         Framework,
         "Could not find 'InstanceID' Key in Moniker"},
        {op(&IPElementCapabilities::getCapabilitiesMoniker),
         {{"Name", ""}},
         Framework,
         "Name Property value is not correct"},
        {op(&IPElementCapabilities::getCapabilitiesMoniker),
         {{"Name", "eth9"}},
         Instrumentation,
         "Concerned IPEnabledLogicalElementCapabilities Could Not Be Found."},
        {op(&IPHostedService::getIPConfigurationServiceMoniker),
         {{"Name", "BMC:-1"}},
         Framework,
         "Could not match 'System Name' key with 'Name' key in Computer Moniker"},
        {op(&ServiceAffectsElement::getIPProtocolEndpointMoniker),
         {{"SystemName", "elsewhere"}},
         Instrumentation,
         "Concerned IP Protocol Endpoint Could Not Be Found."},
        {op(&ServiceAffectsElement::getIPProtocolEndpointMoniker),
         {{"Name", "IPConfigService"}},
         Framework,
         "Could not find 'Name' Key in Moniker"},
        {op(&ServiceAffectsElement::getIPConfigurationServiceMoniker),
         {{"Name", "eth0"}},
         Framework,
         "Could not find 'System Name' Key in Moniker"},
    };
    for (size_t i = 0; i < rows.size(); ++i) {
        SCOPED_TRACE("row " + std::to_string(i) + ": " + rows[i].text);
        Nx::Moniker source = moniker(rows[i].source);
        try {
            rows[i].convert(source);
            ADD_FAILURE() << "no exception";
        } catch (const Nx::FrameworkException& e) {
            EXPECT_EQ(rows[i].kind, Framework);
            EXPECT_STREQ(e.what(), rows[i].text);
        } catch (const Nx::InstrumentationException& e) {
            EXPECT_EQ(rows[i].kind, Instrumentation);
            EXPECT_STREQ(e.what(), rows[i].text);
        }
    }

    // A host without its system node has no computer to name.
    testfiles::writeFile(dataDir.file("none.model"), "node 41 bmc BMC\n");
    Nx::HostModel::setCurrent(Nx::HostModel::open("fixture:" + dataDir.file("none.model")));
    Nx::Moniker endpoint = moniker({{"SystemName", host}});
    try {
        IPHostedService().getComputerSystemMoniker(endpoint);
        ADD_FAILURE() << "no exception";
    } catch (const Nx::InstrumentationException& e) {
        EXPECT_STREQ(e.what(), "Concerned Computer Could Not Be Found.");
    }
}

TEST_F(AssociationModels, AssociationPropertiesFollowTheSetting) {
    struct Row {
        const char* instanceId;
        unsigned short both;  // IsDefault and IsCurrent
    };
    // eth0 is static, eth1 takes DHCP.
    for (const Row& row : {Row{"Computer%eth0%static", 1}, Row{"Computer%eth0%dhcp", 2}, Row{"Computer%eth1%dhcp", 1},
                           Row{"Computer%eth1%static", 2}}) {
        SCOPED_TRACE(row.instanceId);
        IPElementSettingData model;
        Nx::Moniker setting = moniker({{"InstanceID", row.instanceId}});
        model.getManagedElementMoniker(setting);
        unsigned short isDefault = 0, isCurrent = 0, isNext = 0;
        EXPECT_TRUE(model.getIsDefault(isDefault) && model.getIsCurrent(isCurrent) && model.getIsNext(isNext));
        EXPECT_EQ(isDefault, row.both);
        EXPECT_EQ(isCurrent, row.both);
        EXPECT_EQ(isNext, 2);
    }
    for (const Row& row : {Row{"Computer%eth2", 1}, Row{"Computer%eth1", 2}}) {
        StaticIPElementSettingData model;
        Nx::Moniker setting = moniker({{"InstanceID", row.instanceId}});
        model.getManagedElementMoniker(setting);
        unsigned short isDefault = 0, isCurrent = 0;
        EXPECT_TRUE(model.getIsDefault(isDefault) && model.getIsCurrent(isCurrent));
        EXPECT_EQ(isDefault, row.both);
        EXPECT_EQ(isCurrent, row.both);
    }
    unsigned long long sequence = 0;
    EXPECT_TRUE(StaticOrderedComponent().getAssignedSequence(sequence));
    EXPECT_EQ(sequence, 1u);
    unsigned short order = 7;
    EXPECT_FALSE(RemoteAccessAvailableToElement().getOrderOfAccess(order));
    EXPECT_EQ(order, 7);
}

}  // namespace
