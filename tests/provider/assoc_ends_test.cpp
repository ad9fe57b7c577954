// Each association from each of its ends, through the provider's association entry points as the
// embedded host drives them: the far ends (associator names and associators), and the association
// instances (reference names and references) with their references in order and their own
// properties.
#include <string>
#include <vector>

#include "assoc_fixture.h"

namespace {

struct FromEnd {
    const char* association;
    const char* source;
    std::vector<std::string> far;         // in the order they arrive
    std::vector<std::string> references;  // reference keys in path order
    std::vector<std::string> properties;  // association properties asked
    std::vector<std::string> values;      // per far end: the properties' values ("-" when absent)
};

const std::vector<FromEnd> kFromEachEnd = {
    {"KVRNX_IPElementSettingData",
     "EP:eth0",
     {"ASD:Computer%eth0%static", "ASD:Computer%eth0%dhcp"},
     {"SettingData", "ManagedElement"},
     {"IsDefault", "IsCurrent", "IsNext"},
     {"uint16:1 uint16:1 uint16:2", "uint16:2 uint16:2 uint16:2"}},
    {"KVRNX_IPElementSettingData",
     "ASD:Computer%eth1%dhcp",
     {"EP:eth1"},
     {"SettingData", "ManagedElement"},
     {"IsDefault", "IsCurrent", "IsNext"},
     {"uint16:1 uint16:1 uint16:2"}},
    {"KVRNX_IPElementSettingData",
     "ASD:BMC%usb0%dhcp",
     {"EP:usb0/BMC"},
     {"SettingData", "ManagedElement"},
     {"IsDefault", "IsCurrent"},
     {"uint16:2 uint16:2"}},
    {"KVRNX_StaticIPElementSettingData",
     "EP:eth2",
     {"ST:Computer%eth2"},
     {"SettingData", "ManagedElement"},
     {"IsDefault", "IsCurrent", "IsNext"},
     {"uint16:1 uint16:1 -"}},
    {"KVRNX_StaticIPElementSettingData",
     "ST:Computer%eth1",
     {"EP:eth1"},
     {"SettingData", "ManagedElement"},
     {"IsDefault", "IsCurrent"},
     {"uint16:2 uint16:2"}},
    {"KVRNX_StaticOrderedComponent",
     "ASD:Computer%eth0%static",
     {"ST:Computer%eth0"},
     {"PartComponent", "GroupComponent"},
     {"AssignedSequence"},
     {"uint64:1"}},
    {"KVRNX_StaticOrderedComponent",
     "ST:BMC%usb0",
     {"ASD:BMC%usb0%static"},
     {"PartComponent", "GroupComponent"},
     {"AssignedSequence"},
     {"uint64:1"}},
    {"KVRNX_BindsToLanEndPoint", "EP:eth2", {"LAN:eth2"}, {"Dependent", "Antecedent"}, {}, {""}},
    {"KVRNX_BindsToLanEndPoint", "LAN:usb0/BMC", {"EP:usb0/BMC"}, {"Dependent", "Antecedent"}, {}, {""}},
    {"KVRNX_IPHostedAccessPoint", "EP:eth1", {"CS"}, {"Antecedent", "Dependent"}, {}, {""}},
    {"KVRNX_IPHostedAccessPoint",
     "CS",
     {"EP:eth0", "EP:eth1", "EP:eth2", "EP:br0"},
     {"Antecedent", "Dependent"},
     {},
     {"", "", "", ""}},
    {"KVRNX_SPHostedAccessPoint", "EP:usb0/BMC", {"SP"}, {"Antecedent", "Dependent"}, {}, {""}},
    {"KVRNX_SPHostedAccessPoint", "SP", {"EP:usb0/BMC"}, {"Antecedent", "Dependent"}, {}, {""}},
    {"KVRNX_RemoteHostedAccessPoint", "SAP:eth0_IPv4", {"CS"}, {"Antecedent", "Dependent"}, {}, {""}},
    {"KVRNX_RemoteHostedAccessPoint",
     "CS",
     {"SAP:eth0_IPv4", "SAP:eth1_IPv4", "SAP:eth2_IPv6", "SAP:eth2_IPv4", "SAP:br0_IPv4"},
     {"Antecedent", "Dependent"},
     {},
     {"", "", "", "", ""}},
    {"KVRNX_IPRemoteAccessAvailableToElement",
     "EP:eth2",
     {"SAP:eth2_IPv6", "SAP:eth2_IPv4"},
     {"Antecedent", "Dependent"},
     {"OrderOfAccess"},
     {"-", "-"}},
    {"KVRNX_IPRemoteAccessAvailableToElement",
     "SAP:eth2_IPv4",
     {"EP:eth2"},
     {"Antecedent", "Dependent"},
     {"OrderOfAccess"},
     {"-"}},
    {"KVRNX_IPElementCapabilities", "EP:br0", {"CAPS:br0"}, {"ManagedElement", "Capabilities"}, {}, {""}},
    {"KVRNX_IPElementCapabilities", "CAPS:usb0", {"EP:usb0/BMC"}, {"ManagedElement", "Capabilities"}, {}, {""}},
    {"KVRNX_IPHostedService", "SVC", {"CS"}, {"Antecedent", "Dependent"}, {}, {""}},
    {"KVRNX_IPHostedService", "CS", {"SVC"}, {"Antecedent", "Dependent"}, {}, {""}},
    {"KVRNX_IPServiceAffectsElement", "EP:eth0", {"SVC"}, {"AffectedElement", "AffectingElement"}, {}, {""}},
    {"KVRNX_IPServiceAffectsElement",
     "SVC",
     {"EP:eth0", "EP:eth1", "EP:eth2", "EP:br0"},
     {"AffectedElement", "AffectingElement"},
     {},
     {"", "", "", ""}},
};

std::string render(const ipif::Instance& instance, const std::vector<std::string>& names) {
    std::string out;
    for (const std::string& name : names) {
        const ipif::Value* v = instance.property(name);
        out += out.empty() ? "" : " ";
        out += v && !v->isNull() ? std::string(ipif::typeName(v->type())) + ":" + v->toText() : "-";
    }
    return out;
}

class AssociationEnds : public assoctest::AssocTest {};

TEST_F(AssociationEnds, EachAssociationFromEachEndGivesItsFarEndsAndInstances) {
    for (const FromEnd& row : kFromEachEnd) {
        SCOPED_TRACE(std::string(row.association) + " from " + row.source);
        const ipif::ObjectPath source = path(row.source);

        ipif::Result names = host().associatorNames(source, row.association);
        ASSERT_EQ(names.rc, 0) << names.message;
        EXPECT_TRUE(names.done);
        EXPECT_EQ(shortForms(names.paths), row.far);

        ipif::Result far = host().associators(source, row.association);
        ASSERT_EQ(far.rc, 0) << far.message;
        EXPECT_EQ(shortForms(far.instances), row.far);
        for (const ipif::Instance& instance : far.instances) EXPECT_FALSE(instance.properties.empty());

        ipif::Result refNames = host().referenceNames(source, row.association);
        ipif::Result refs = host().references(source, row.association);
        ASSERT_EQ(refNames.rc, 0) << refNames.message;
        ASSERT_EQ(refs.rc, 0) << refs.message;
        ASSERT_EQ(refNames.paths.size(), row.far.size());
        ASSERT_EQ(refs.instances.size(), row.far.size());
        for (size_t i = 0; i < row.far.size(); ++i) {
            const ipif::ObjectPath& assoc = refNames.paths[i];
            EXPECT_TRUE(ipif::equalsIgnoreCase(assoc.className, row.association)) << assoc.className;
            ASSERT_EQ(assoc.keys.size(), 2u);
            EXPECT_EQ(assoc.keys.at(0).first, row.references[0]);
            EXPECT_EQ(assoc.keys.at(1).first, row.references[1]);
            // One reference is the source itself, the other the far end.
            std::vector<std::string> ends = {shortForm(assoc.keys.at(0).second.asReference()),
                                             shortForm(assoc.keys.at(1).second.asReference())};
            EXPECT_TRUE((ends == std::vector<std::string>{row.source, row.far[i]}) ||
                        (ends == std::vector<std::string>{row.far[i], row.source}))
                << ends[0] << " | " << ends[1];

            const ipif::Instance& instance = refs.instances[i];
            EXPECT_TRUE(instance.path == assoc) << instance.path.toString();
            for (const std::string& reference : row.references) {
                const ipif::Value* v = instance.property(reference);
                ASSERT_TRUE(v && !v->isNull()) << reference;
                EXPECT_TRUE(v->asReference() == assoc.keys.find(reference)->asReference());
            }
            EXPECT_EQ(render(instance, row.properties), row.values[i]);
        }
    }
}

// The association classes enumerate through the instance entry points too.
TEST_F(AssociationEnds, AssociationClassesEnumerateAsInstances) {
    const std::vector<std::pair<const char*, size_t>> counts = {
        {"KVRNX_IPElementSettingData", 10},   {"KVRNX_StaticIPElementSettingData", 5},
        {"KVRNX_BindsToLanEndPoint", 5},      {"KVRNX_IPHostedAccessPoint", 4},
        {"KVRNX_SPHostedAccessPoint", 1},     {"KVRNX_RemoteHostedAccessPoint", 5},
        {"KVRNX_IPElementCapabilities", 5},   {"KVRNX_IPHostedService", 1},
        {"KVRNX_IPServiceAffectsElement", 4}, {"KVRNX_IPRemoteAccessAvailableToElement", 6},
        {"KVRNX_StaticOrderedComponent", 1}};
    for (const auto& [cls, count] : counts) {
        SCOPED_TRACE(cls);
        ipif::Result names = host().enumerateInstanceNames("root/cimv2", cls);
        ipif::Result instances = host().enumerateInstances("root/cimv2", cls);
        ASSERT_EQ(names.rc, 0) << names.message;
        ASSERT_EQ(instances.rc, 0) << instances.message;
        EXPECT_EQ(names.paths.size(), count);
        ASSERT_EQ(instances.instances.size(), count);
        for (const auto& p : names.paths) EXPECT_EQ(p.keys.size(), 2u) << p.toString();
    }
    // Walked over the service, its endpoints pair with it.
    ipif::Result affects = host().enumerateInstances("root/cimv2", "KVRNX_IPServiceAffectsElement");
    std::vector<std::string> affected;
    for (const auto& i : affects.instances) affected.push_back(shortForm(i.property("AffectedElement")->asReference()));
    EXPECT_EQ(affected, (std::vector<std::string>{"EP:eth0", "EP:eth1", "EP:eth2", "EP:br0"}));
    ipif::Result settings = host().enumerateInstances("root/cimv2", "KVRNX_IPElementSettingData");
    for (const auto& i : settings.instances) EXPECT_EQ(render(i, {"IsNext"}), "uint16:2");
}

}  // namespace
