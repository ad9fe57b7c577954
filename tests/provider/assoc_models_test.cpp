// The association models over the basic fixture host: the exception (type and text) each refuses
// a source with. The far ends they lead to and the association property values are checked where
// the client sees them (assoc_ends_test.cpp).
#include <functional>
#include <sstream>
#include <string>
#include <vector>

#include "Lindows/BindsToLANEndpoint.h"
#include "Lindows/IPElementCapabilities.h"
#include "Lindows/IPElementSettingData.h"
#include "Lindows/IPHostedAccessPoint.h"
#include "Lindows/RemoteAccessAvailableToElement.h"
#include "Lindows/SPHostedAccessPoint.h"
#include "Lindows/ServiceAffectsElement.h"
#include "Nx/Exceptions.h"
#include "Nx/HostModel.h"
#include "models_fixture.h"

namespace {

using namespace Nx::IPInterfaceProvider;
using Conversion = std::function<Nx::Moniker(Nx::Moniker&)>;

// Runs one conversion of a freshly made model.
template <class Model>
Conversion op(Nx::Moniker (Model::*conversion)(Nx::Moniker&)) {
    return [conversion](Nx::Moniker& source) {
        Model model;
        return (model.*conversion)(source);
    };
}

// Keys are written "Name=value,Name=value"; "@" stands for the host name.
class AssociationModels : public modeltest::ModelTest {
protected:
    AssociationModels() {
        Nx::HostModel::setCurrent(
            Nx::HostModel::open(std::string("fixture:") + IPIF_TEST_FIXTURES + "/host-basic.model"));
    }
    ~AssociationModels() override { Nx::HostModel::setCurrent(nullptr); }

    Nx::Moniker moniker(const std::string& keys) const {
        Nx::Moniker m;
        std::istringstream in(keys);
        for (std::string key; std::getline(in, key, ',');) {
            const std::string value = key.substr(key.find('=') + 1);
            m.addKey(key.substr(0, key.find('=')), value == "@" ? host : value);
        }
        return m;
    }
    const std::string host = modeltest::hostName();
};

// Each exception type, and the texts whose odd spelling clients match on; the refusals the
// dispatch test sends through the entry points are not repeated here.
TEST_F(AssociationModels, RefusalsNameTheirCauseWithTheirType) {
    enum Kind { Framework, Instrumentation };
    struct Row {
        Conversion convert;
        const char* source;
        Kind kind;
        const char* text;
    };
    const Row rows[] = {
        // Key names are matched in their case.
        {op(&IPElementSettingData::getManagedElementMoniker), "instanceid=Computer%eth0%static", Framework,
         "Could not find 'Name' key in Moniker"},
        {op(&IPElementSettingData::getManagedElementMoniker), "InstanceID=BMC%eth0%static", Framework,
         "Could not get 'System Name' and  'Name' key"},
        {op(&BindsToLANEndpoint::getIPProtocolEndPointMoniker), "SystemName=@", Framework,
         "Could not find 'Name' Key in Moniker"},
        {op(&IPHostedAccessPoint::getIPProtocolEndPointMoniker), "CreationClassName=KVRNX_SPComputerSystem,Name=@",
         Framework, "'SystemCreationClasName'  is not BMC in Moniker"},
        {op(&IPHostedAccessPoint::getIPProtocolEndPointMoniker), "Name=elsewhere", Framework,
         "Could not match 'System Name' key with 'Name' key in Computer Moniker"},
        {op(&SPHostedAccessPoint::getSPMoniker), "SystemCreationClassName=KVRNX_SPComputerSystem,SystemName=@",
         Framework, "Could not match 'Name' key with 'System Name' key in SP Moniker"},
        {op(&RemoteAccessAvailableToElement::getIPProtocolEndpointMoniker), "Name=eth0", Framework,
         "Name Key is not correct."},
        {op(&RemoteAccessAvailableToElement::getRemoteServiceAccessPointMoniker), "Name=eth9", Instrumentation,
         "Concerned DHCP Protocol Endpoint Could Not Be Found."},
        {op(&IPElementCapabilities::getCapabilitiesMoniker), "Name=eth9", Instrumentation,
         "Concerned IPEnabledLogicalElementCapabilities Could Not Be Found."},
        {op(&ServiceAffectsElement::getIPConfigurationServiceMoniker), "Name=eth0", Framework,
         "Could not find 'System Name' Key in Moniker"},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.text);
        Nx::Moniker source = moniker(row.source);
        try {
            row.convert(source);
            ADD_FAILURE() << "no exception";
        } catch (const Nx::FrameworkException& e) {
            EXPECT_EQ(row.kind, Framework);
            EXPECT_STREQ(e.what(), row.text);
        } catch (const Nx::InstrumentationException& e) {
            EXPECT_EQ(row.kind, Instrumentation);
            EXPECT_STREQ(e.what(), row.text);
        }
    }
}

}  // namespace
