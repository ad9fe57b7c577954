// Each association from each of its ends, through the provider's association entry points as the
// embedded host drives them: the far ends (associator names and associators), and the association
// instances (reference names and references) with their references in order and their own
// properties.
#include <map>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "assoc_fixture.h"

namespace {

std::vector<std::string> words(const std::string& text) {
    std::vector<std::string> out;
    std::istringstream in(text);
    for (std::string word; in >> word;) out.push_back(word);
    return out;
}

// Per association: its reference keys in path order, and the properties of its own to show.
const std::map<std::string, std::pair<std::string, std::string>> kShapes = {
    {"KVRNX_IPElementSettingData", {"SettingData ManagedElement", "IsDefault IsCurrent IsNext"}},
    {"KVRNX_StaticIPElementSettingData", {"SettingData ManagedElement", "IsDefault IsCurrent IsNext"}},
    {"KVRNX_StaticOrderedComponent", {"PartComponent GroupComponent", "AssignedSequence"}},
    {"KVRNX_BindsToLanEndPoint", {"Dependent Antecedent", ""}},
    {"KVRNX_IPHostedAccessPoint", {"Antecedent Dependent", ""}},
    {"KVRNX_SPHostedAccessPoint", {"Antecedent Dependent", ""}},
    {"KVRNX_RemoteHostedAccessPoint", {"Antecedent Dependent", ""}},
    {"KVRNX_IPRemoteAccessAvailableToElement", {"Antecedent Dependent", "OrderOfAccess"}},
    {"KVRNX_IPElementCapabilities", {"ManagedElement Capabilities", ""}},
    {"KVRNX_IPHostedService", {"Antecedent Dependent", ""}},
    {"KVRNX_IPServiceAffectsElement", {"AffectedElement AffectingElement", ""}},
};

struct FromEnd {
    const char* association;
    const char* source;
    const char* far;     // in the order they arrive
    const char* values;  // the association's own properties, per far end ("-" when absent)
};

const FromEnd kFromEachEnd[] = {
    {"KVRNX_IPElementSettingData", "EP:eth0", "ASD:Computer%eth0%static ASD:Computer%eth0%dhcp",
     "uint16:1 uint16:1 uint16:2 | uint16:2 uint16:2 uint16:2"},
    {"KVRNX_IPElementSettingData", "ASD:Computer%eth1%dhcp", "EP:eth1", "uint16:1 uint16:1 uint16:2"},
    {"KVRNX_IPElementSettingData", "ASD:BMC%usb0%dhcp", "EP:usb0/BMC", "uint16:2 uint16:2 uint16:2"},
    {"KVRNX_StaticIPElementSettingData", "EP:eth2", "ST:Computer%eth2", "uint16:1 uint16:1 -"},
    {"KVRNX_StaticIPElementSettingData", "ST:Computer%eth1", "EP:eth1", "uint16:2 uint16:2 -"},
    {"KVRNX_StaticOrderedComponent", "ASD:Computer%eth0%static", "ST:Computer%eth0", "uint64:1"},
    {"KVRNX_StaticOrderedComponent", "ST:BMC%usb0", "ASD:BMC%usb0%static", "uint64:1"},
    {"KVRNX_BindsToLanEndPoint", "EP:eth2", "LAN:eth2", ""},
    {"KVRNX_BindsToLanEndPoint", "LAN:usb0/BMC", "EP:usb0/BMC", ""},
    {"KVRNX_IPHostedAccessPoint", "EP:eth1", "CS", ""},
    {"KVRNX_IPHostedAccessPoint", "CS", "EP:eth0 EP:eth1 EP:eth2 EP:br0", ""},
    {"KVRNX_SPHostedAccessPoint", "EP:usb0/BMC", "SP", ""},
    {"KVRNX_SPHostedAccessPoint", "SP", "EP:usb0/BMC", ""},
    {"KVRNX_RemoteHostedAccessPoint", "SAP:eth0_IPv4", "CS", ""},
    {"KVRNX_RemoteHostedAccessPoint", "CS", "SAP:eth0_IPv4 SAP:eth1_IPv4 SAP:eth2_IPv6 SAP:eth2_IPv4 SAP:br0_IPv4", ""},
    {"KVRNX_IPRemoteAccessAvailableToElement", "EP:eth2", "SAP:eth2_IPv6 SAP:eth2_IPv4", "- | -"},
    {"KVRNX_IPRemoteAccessAvailableToElement", "SAP:eth2_IPv4", "EP:eth2", "-"},
    {"KVRNX_IPElementCapabilities", "EP:br0", "CAPS:br0", ""},
    {"KVRNX_IPElementCapabilities", "CAPS:usb0", "EP:usb0/BMC", ""},
    {"KVRNX_IPHostedService", "SVC", "CS", ""},
    {"KVRNX_IPHostedService", "CS", "SVC", ""},
    {"KVRNX_IPServiceAffectsElement", "EP:eth0", "SVC", ""},
    {"KVRNX_IPServiceAffectsElement", "SVC", "EP:eth0 EP:eth1 EP:eth2 EP:br0", ""},
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
        const std::vector<std::string> far = words(row.far), references = words(kShapes.at(row.association).first),
                                       properties = words(kShapes.at(row.association).second);

        ipif::Result names = host().associatorNames(source, row.association);
        ASSERT_EQ(names.rc, 0) << names.message;
        EXPECT_TRUE(names.done);
        EXPECT_EQ(shortForms(names.paths), far);

        ipif::Result farEnds = host().associators(source, row.association);
        ASSERT_EQ(farEnds.rc, 0) << farEnds.message;
        EXPECT_EQ(shortForms(farEnds.instances), far);
        for (const ipif::Instance& instance : farEnds.instances) EXPECT_FALSE(instance.properties.empty());

        ipif::Result refNames = host().referenceNames(source, row.association);
        ipif::Result refs = host().references(source, row.association);
        ASSERT_EQ(refNames.rc, 0) << refNames.message;
        ASSERT_EQ(refs.rc, 0) << refs.message;
        ASSERT_EQ(refNames.paths.size(), far.size());
        ASSERT_EQ(refs.instances.size(), far.size());
        std::string values;
        for (size_t i = 0; i < far.size(); ++i) {
            const ipif::ObjectPath& assoc = refNames.paths[i];
            EXPECT_TRUE(ipif::equalsIgnoreCase(assoc.className, row.association)) << assoc.className;
            ASSERT_EQ(assoc.keys.size(), 2u);
            EXPECT_EQ(assoc.keys.at(0).first, references[0]);
            EXPECT_EQ(assoc.keys.at(1).first, references[1]);
            // One reference is the source itself, the other the far end.
            std::vector<std::string> ends = {shortForm(assoc.keys.at(0).second.asReference()),
                                             shortForm(assoc.keys.at(1).second.asReference())};
            EXPECT_TRUE((ends == std::vector<std::string>{row.source, far[i]}) ||
                        (ends == std::vector<std::string>{far[i], row.source}))
                << ends[0] << " | " << ends[1];

            const ipif::Instance& instance = refs.instances[i];
            EXPECT_TRUE(instance.path == assoc) << instance.path.toString();
            for (const std::string& reference : references) {
                const ipif::Value* v = instance.property(reference);
                ASSERT_TRUE(v && !v->isNull()) << reference;
                EXPECT_TRUE(v->asReference() == assoc.keys.find(reference)->asReference());
            }
            if (!properties.empty()) values += (i ? " | " : "") + render(instance, properties);
        }
        EXPECT_EQ(values, row.values);
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
        EXPECT_EQ(instances.instances.size(), count);
        for (const auto& p : names.paths) EXPECT_EQ(p.keys.size(), 2u) << p.toString();
    }
}

}  // namespace
