// The association request dispatch: which adapters a request reaches and in which order, the
// association and result class filters, sources without keys or of unrelated classes, and what a
// failure inside a model or an up-call turns into.
#include <cmpidt.h>

#include <string>
#include <vector>

#include "assoc_fixture.h"

namespace {

using Forms = std::vector<std::string>;

class AssociationDispatch : public assoctest::AssocTest {
protected:
    Forms names(const std::string& source, const std::string& assocClass, const std::string& resultClass = "") {
        ipif::Result r = host().associatorNames(path(source), assocClass, resultClass);
        EXPECT_EQ(r.rc, 0) << r.message;
        EXPECT_TRUE(r.done);
        return shortForms(r.paths);
    }
};

const Forms kHostEndpoints = {"EP:eth0", "EP:eth1", "EP:eth2", "EP:br0"};
const Forms kAllEndpoints = {"EP:eth0", "EP:eth1", "EP:eth2", "EP:br0", "EP:usb0/BMC"};

TEST_F(AssociationDispatch, AKeylessSourceStandsForEveryObjectOfTheFarClass) {
    struct Row {
        const char* association;
        const char* source;
        Forms far;
    };
    const std::vector<Row> rows = {
        {"KVRNX_IPElementSettingData",
         "KVRNX_IPProtocolEndpoint",
         {"ASD:Computer%eth0%static", "ASD:Computer%eth0%dhcp", "ASD:Computer%eth1%static", "ASD:Computer%eth1%dhcp",
          "ASD:Computer%eth2%static", "ASD:Computer%eth2%dhcp", "ASD:Computer%br0%static", "ASD:Computer%br0%dhcp",
          "ASD:BMC%usb0%static", "ASD:BMC%usb0%dhcp"}},
        {"KVRNX_IPElementCapabilities",
         "KVRNX_IPProtocolEndpoint",
         {"CAPS:eth0", "CAPS:eth1", "CAPS:eth2", "CAPS:br0", "CAPS:usb0"}},
        {"KVRNX_StaticIPElementSettingData", "KVRNX_StaticIPAssignmentSettingData", kAllEndpoints},
        {"KVRNX_IPHostedAccessPoint", "KVRNX_ComputerSystem", kAllEndpoints},
        {"KVRNX_IPServiceAffectsElement", "KVRNX_IPConfigurationService", kAllEndpoints},
        // A LAN endpoint lookup yields one element, however many the enumeration holds.
        {"KVRNX_BindsToLanEndPoint", "KVRNX_IPProtocolEndpoint", {"LAN:eth0"}},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(std::string(row.association) + " from " + row.source);
        EXPECT_EQ(names(row.source, row.association), row.far);
    }
}

TEST_F(AssociationDispatch, ParentAssociationClassesVisitTheirAdaptersInOrderAndUnrelatedSourcesYieldNothing) {
    // 72, 120, 80: the host's access points, the service processor's, the gateways.
    EXPECT_EQ(names("EP:usb0/BMC", "CIM_HostedAccessPoint"), (Forms{"CS", "SP"}));
    Forms hosted = kHostEndpoints;
    for (const char* sap : {"SAP:eth0_IPv4", "SAP:eth1_IPv4", "SAP:eth2_IPv6", "SAP:eth2_IPv4", "SAP:br0_IPv4"})
        hosted.push_back(sap);
    EXPECT_EQ(names("CS", "CIM_HostedAccessPoint"), hosted);
    const std::string text = log();
    const size_t ip = text.rfind("ENTERING: CMPIIPHostedAccessPoint() in CMPIIPHostedAccessPoint.cpp");
    const size_t sp = text.rfind("ENTERING: CMPISPHostedAccessPoint() in CMPISPHostedAccessPoint.cpp");
    const size_t remote = text.rfind("ENTERING: CMPIRemoteHostedAccessPoint() in CMPIRemoteHostedAccessPoint.cpp");
    ASSERT_NE(remote, std::string::npos);
    EXPECT_LT(ip, sp);
    EXPECT_LT(sp, remote);
    EXPECT_EQ(logged("VARIABLE: 'rcode' has Value '0'"), 6u);

    // The service processor is no end of 72 or 80, a setting no end of the static association.
    EXPECT_EQ(names("SP", "CIM_HostedAccessPoint"), (Forms{"EP:usb0/BMC"}));
    EXPECT_EQ(names("ASD:Computer%eth0%static", "CIM_ElementSettingData"), (Forms{"EP:eth0"}));
    EXPECT_EQ(names("ST:Computer%eth0", "CIM_ElementSettingData"), (Forms{"EP:eth0"}));
}

TEST_F(AssociationDispatch, ResultClassesAreTheFarEndsOwnOrItsDirectParentInAnyCase) {
    const char* setting = "KVRNX_IPElementSettingData";
    const Forms both = {"ASD:Computer%eth0%static", "ASD:Computer%eth0%dhcp"};
    EXPECT_EQ(names("EP:eth0", setting, "cim_ipassignmentsettingdata"), both);
    EXPECT_EQ(names("EP:eth0", setting, "CIM_SettingData"), Forms{});
    EXPECT_EQ(names("EP:eth0", setting, "KVRNX_IPProtocolEndpoint"), Forms{});
    EXPECT_EQ(names("ASD:Computer%eth0%dhcp", setting, "CIM_IPProtocolEndpoint"), (Forms{"EP:eth0"}));
    // The adapters that cannot give the result class are skipped whole.
    EXPECT_EQ(names("CS", "CIM_HostedAccessPoint", "CIM_IPProtocolEndpoint"), kHostEndpoints);
    ipif::Result far = host().associators(path("EP:usb0/BMC"), "CIM_HostedAccessPoint", "kvrnx_spcomputersystem");
    EXPECT_EQ(shortForms(far.instances), (Forms{"SP"}));
}

TEST_F(AssociationDispatch, UnknownAssociationClassIsLenientUnknownResultClassIsNot) {
    // Only this provider, so that the status is its own.
    ipif::Host& only = host(false);
    const ipif::ObjectPath endpoint = path("EP:eth0");
    ipif::Result unknownAssociation = only.associatorNames(endpoint, "KVRNX_NoSuchAssociation");
    EXPECT_EQ(unknownAssociation.rc, 0);
    EXPECT_TRUE(unknownAssociation.paths.empty());
    EXPECT_TRUE(unknownAssociation.done);
    EXPECT_EQ(logged("VARIABLE: 'CMPI_RC_ERR_INVALID_CLASS' has Value '5'"), 1u);
    EXPECT_EQ(only.associators(endpoint, "KVRNX_NoSuchAssociation").instances.size(), 0u);

    // A parent class is no result class of the reference operations.
    for (const char* resultClass : {"KVRNX_NoSuchAssociation", "CIM_ElementSettingData"}) {
        SCOPED_TRACE(resultClass);
        ipif::Result names = only.referenceNames(endpoint, resultClass);
        EXPECT_EQ(names.rc, CMPI_RC_ERR_INVALID_CLASS);
        EXPECT_TRUE(names.paths.empty());
        EXPECT_EQ(only.references(endpoint, resultClass).rc, CMPI_RC_ERR_INVALID_CLASS);
    }
}

TEST_F(AssociationDispatch, FailuresBelowTheAdaptersEndTheRequestQuietly) {
    struct Row {
        const char* operation;
        const char* association;
        std::string source;
        const char* text;
    };
    const std::string elsewhere =
        "KVRNX_IPProtocolEndpoint.SystemCreationClassName=\"KVRNX_ComputerSystem\",SystemName=\"elsewhere\","
        "CreationClassName=\"KVRNX_IPProtocolEndpoint\",Name=\"eth0\"";
    const std::vector<Row> rows = {
        {"ai", "KVRNX_IPElementSettingData", "ASD:eth0", "Instance ID Property value is not correct"},
        {"ri", "KVRNX_StaticIPElementSettingData", "ST:eth0", "Could not find 'InstanceID tokens"},
        {"rin", "KVRNX_StaticOrderedComponent", "ASD:Computer%eth1%dhcp", "AssignmentSetting data is not static"},
        {"ain", "KVRNX_BindsToLanEndPoint", "LAN:eth9", "Concerned Computer Could Not Be Found."},
        // The LAN endpoint of a system nobody serves: the broker finds none.
        {"ain", "KVRNX_BindsToLanEndPoint", elsewhere, "Could not obtain an instance of Computer System"},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(std::string(row.operation) + " " + row.association + " " + row.source);
        const ipif::ObjectPath source = path(row.source);
        const std::string op = row.operation;
        ipif::Result r = op == "ai"    ? host().associators(source, row.association)
                         : op == "ain" ? host().associatorNames(source, row.association)
                         : op == "ri"  ? host().references(source, row.association)
                                       : host().referenceNames(source, row.association);
        EXPECT_EQ(r.rc, 0) << r.message;
        EXPECT_TRUE(r.instances.empty() && r.paths.empty());
        EXPECT_FALSE(r.done);
        EXPECT_EQ(logged(std::string("]: ") + row.text), 1u) << log();
        EXPECT_NE(log().find("MESSAGE [File: IPInterfaceProvider.cpp, Line: "), std::string::npos);
    }
    // A hosted association's own path is taken apart, then read as a computer path, which it is not.
    ipif::Result pair = host().getInstance(host().referenceNames(path("CS"), "KVRNX_IPHostedAccessPoint").paths.at(0));
    EXPECT_EQ(pair.rc, 0);
    EXPECT_TRUE(pair.instances.empty());
    EXPECT_EQ(logged("]: Could not find 'Name' key in Moniker"), 1u);
    // Still serving.
    EXPECT_EQ(names("EP:eth0", "KVRNX_IPElementCapabilities"), (Forms{"CAPS:eth0"}));
}

}  // namespace
