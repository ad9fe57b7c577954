// The MOF reader, the class repository, registration files, and the project's own MOF.
#include <gtest/gtest.h>
#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <map>
#include <regex>
#include <set>
#include <sstream>

#include "HostTestSupport.h"
#include "TestFiles.h"
#include "ipif/Mof.h"
#include "ipif/Registration.h"

using namespace ipif;

TEST(Mof, ReadsTheClassDeclarationSubset) {
    const char* text = R"(
#pragma locale ("en_US")
// line comment
Qualifier Key : boolean = false, Scope(property, reference), Flavor(DisableOverride);
/* block
   comment */
[Abstract, Description ("A" " thing"), ValueMap {"0", "2", ".."} : ToSubclass Translatable]
class T_Base {
   [Key, MaxLen (64)] string Id;
   uint8 Levels[] = {1, 2};
   real64 Ratio = -1.5e3;
   char16 Letter = 'x';
};
[Association]
class T_Link : T_Base {
   [Key] T_Base REF Left;
   T_Base REF Right[];
   sint32 Go([IN] uint16 A, [IN, OUT] T_Base REF B, [OUT] string C[], [IN(false), OUT] datetime D, boolean E);
};
)";
    std::vector<ClassDecl> classes = parseMof(text, "t.mof");
    ASSERT_EQ(classes.size(), 2u);
    const ClassDecl& base = classes[0];
    EXPECT_EQ(base.name, "T_Base");
    EXPECT_EQ(base.line, 8);
    EXPECT_EQ(base.qualifiers.size(), 3u);
    EXPECT_EQ(base.qualifiers[1].value, "A thing");
    EXPECT_EQ(base.qualifiers[2].value, "{0, 2, ..}");
    ASSERT_EQ(base.properties.size(), 4u);
    EXPECT_TRUE(base.properties[0].key);
    EXPECT_TRUE(base.properties[1].array);
    EXPECT_EQ(base.properties[1].type, CimType::Uint8);
    EXPECT_EQ(base.properties[3].type, CimType::Char16);

    const ClassDecl& link = classes[1];
    EXPECT_TRUE(link.association);
    EXPECT_EQ(link.superclass, "T_Base");
    EXPECT_EQ(link.properties[1].refClass, "T_Base");
    EXPECT_TRUE(link.properties[1].array);
    ASSERT_EQ(link.methods.size(), 1u);
    const MethodDecl& go = link.methods[0];
    EXPECT_EQ(go.returnType, CimType::Sint32);
    ASSERT_EQ(go.parameters.size(), 5u);
    bool in[] = {true, true, false, false, true}, out[] = {false, true, true, true, false};
    for (int i = 0; i < 5; ++i) {
        EXPECT_EQ(go.parameters[i].in, in[i]) << i;
        EXPECT_EQ(go.parameters[i].out, out[i]) << i;
    }
    EXPECT_EQ(go.parameters[1].type, CimType::Reference);
    EXPECT_TRUE(go.parameters[2].array);
}

TEST(Mof, SyntaxErrorsNameFileAndLine) {
    struct Case {
        const char* text;
        const char* expected;
    } cases[] = {
        {"class A {\n  strin x;\n};", "f.mof:2: unknown data type 'strin'"},
        {"class A {\n  string x\n};", "f.mof:3: expected ';'"},
        {"class A {\n  string x;\n", "f.mof:3: missing '}' at the end of class A"},
        {"\n\nclass A { string x; }", "f.mof:3: expected ';'"},
        {"class A {\n string x;\n string X;\n};", "f.mof:3: 'X' declared twice in class A"},
        {"[Key\nclass A {};", "f.mof:2: expected ',' or ']' in the qualifier list, found 'class'"},
        {"instance of A { x = 1; };", "f.mof:1: instance declarations are not supported"},
        {"class A {\n string s = \"open\n};", "f.mof:2: unterminated string"},
        {"/* never closed\nclass A {};", "f.mof:1: unterminated comment"},
        {"#include \"x.mof\"\n", "f.mof:1: unknown directive"},
        {"class A { string REF x; };", "f.mof:1: REF needs a class name, not the data type 'string'"},
        {"class A {\n uint32 M(uint8 a b);\n};", "f.mof:2: expected ',' or ')' in the parameter list, found 'b'"},
        {"class A { @ };", "f.mof:1: unexpected character '@'"},
    };
    for (const auto& c : cases) {
        try {
            parseMof(c.text, "f.mof");
            ADD_FAILURE() << "accepted: " << c.text;
        } catch (const MofError& e) {
            EXPECT_EQ(std::string(e.what()).rfind(c.expected, 0), 0u) << e.what();
        }
    }
}

TEST(Mof, OnlyRegularFilesOfBoundedSizeAreRead) {
    testfiles::ScratchDir dir;
    const std::string device = dir.file("null.mof"), big = dir.file("big.mof");
    ASSERT_EQ(::symlink("/dev/null", device.c_str()), 0);
    std::ofstream(big).close();
    ASSERT_EQ(::truncate(big.c_str(), (16 << 20) + 1), 0);
    const auto failure = [](const std::function<void()>& load) {
        try {
            load();
        } catch (const std::exception& e) {
            return std::string(e.what());
        }
        return std::string();
    };
    ClassRepository repo;
    EXPECT_EQ(failure([&] { repo.addFile(device); }), device + ":0: not a regular file");
    EXPECT_EQ(failure([&] { repo.addFile(big); }), big + ":0: larger than 16 MiB");
    EXPECT_EQ(failure([&] { loadRegistrations(device); }), device + ":0: not a regular file");
}

TEST(Mof, RepositoryResolvesInheritanceAndRejectsDanglingNames) {
    ClassRepository repo;
    repo.addText("class P { [Key] string Id; string Name; uint32 M(); };", "p.mof");
    repo.addText("class C : P { [Override (\"Id\")] string Id; uint16 Name; string Extra; };", "c.mof");
    repo.resolve();
    EXPECT_TRUE(repo.isA("c", "P"));
    EXPECT_FALSE(repo.isA("P", "C"));
    EXPECT_FALSE(repo.isA("Nope", "P"));
    EXPECT_EQ(repo.ancestry("C"), (std::vector<std::string>{"C", "P"}));
    const auto& props = repo.properties("C");
    ASSERT_EQ(props.size(), 3u);  // redeclarations take the inherited slot
    EXPECT_EQ(props[0].name, "Id");
    EXPECT_TRUE(props[0].key);  // Key survives a redeclaration without it
    EXPECT_EQ(props[1].type, CimType::Uint16);
    EXPECT_EQ(props[1].origin, "C");
    EXPECT_EQ(repo.keyNames("C"), std::vector<std::string>{"Id"});
    EXPECT_NE(repo.method("C", "m"), nullptr);

    auto failure = [](std::vector<std::pair<const char*, const char*>> files) {
        ClassRepository r;
        try {
            for (const auto& f : files) r.addText(f.second, f.first);
            r.resolve();
        } catch (const MofError& e) {
            return std::string(e.what());
        }
        return std::string();
    };
    EXPECT_EQ(failure({{"a.mof", "\nclass A : B {};"}}), "a.mof:2: superclass B of A is not declared");
    EXPECT_EQ(failure({{"a.mof", "class A { B REF r; };"}}), "a.mof:1: reference A.r names the undeclared class B");
    EXPECT_EQ(failure({{"a.mof", "class A { uint8 m([IN] B REF p); };"}}).rfind("a.mof:1: parameter p", 0), 0u);
    EXPECT_EQ(failure({{"a.mof", "class A {};"}, {"b.mof", "\n\nclass a {};"}}),
              "b.mof:3: class a already declared at a.mof:1");
    EXPECT_NE(failure({{"a.mof", "class A : B {};\nclass B : A {};"}}).find("derives from itself"), std::string::npos);
}

TEST(Mof, ProjectClassesCarryTheProviderSchema) {
    ClassRepository repo;
    for (const auto& p : testfiles::projectMofPaths()) repo.addPath(p);
    repo.resolve();

    const std::vector<std::pair<const char*, CimType>> endpoint = {
        {"ElementName", CimType::String}, {"Description", CimType::String}, {"IPv4Address", CimType::String},
        {"IPv6Address", CimType::String}, {"SubnetMask", CimType::String}, {"PrefixLength", CimType::Uint8},
        {"IPv6SubnetPrefixLength", CimType::Uint16}, {"AddressType", CimType::Uint16},
        {"IPv6AddressType", CimType::Uint16}, {"IPVersionSupport", CimType::Uint16},
        {"ProtocolIFType", CimType::Uint16}, {"EnabledState", CimType::Uint16}, {"RequestedState", CimType::Uint16},
        {"AddressOrigin", CimType::Uint16}, {"SystemCreationClassName", CimType::String},
        {"SystemName", CimType::String}, {"CreationClassName", CimType::String}, {"Name", CimType::String},
        {"NameFormat", CimType::String}};
    for (const auto& p : endpoint) {
        const PropertyDecl* d = repo.property("KVRNX_IPProtocolEndpoint", p.first);
        ASSERT_NE(d, nullptr) << p.first;
        EXPECT_EQ(d->type, p.second) << p.first;
        EXPECT_FALSE(d->array) << p.first;
    }
    std::vector<std::string> keys = repo.keyNames("KVRNX_IPProtocolEndpoint");
    std::sort(keys.begin(), keys.end());
    EXPECT_EQ(keys, (std::vector<std::string>{"CreationClassName", "Name", "SystemCreationClassName", "SystemName"}));
    const MethodDecl* rsc = repo.method("KVRNX_IPProtocolEndpoint", "RequestStateChange");
    ASSERT_NE(rsc, nullptr);
    ASSERT_EQ(rsc->parameters.size(), 3u);
    EXPECT_EQ(rsc->parameters[0].type, CimType::Uint16);
    EXPECT_TRUE(!rsc->parameters[1].in && rsc->parameters[1].out);
    EXPECT_EQ(rsc->parameters[1].refClass, "CIM_ConcreteJob");
    EXPECT_EQ(rsc->parameters[2].type, CimType::DateTime);
    const MethodDecl* apply = repo.method("KVRNX_IPConfigurationService", "ApplySettingToIPProtocolEndpoint");
    ASSERT_NE(apply, nullptr);
    EXPECT_EQ(apply->parameters[0].refClass, "CIM_IPAssignmentSettingData");
    EXPECT_EQ(apply->parameters[1].refClass, "CIM_IPProtocolEndpoint");
    EXPECT_EQ(repo.keyNames("KVRNX_ConcreteJob"), std::vector<std::string>{"InstanceID"});
    EXPECT_EQ(repo.property("KVRNX_IPEnabledLogicalElementCapabilities", "RequestedStatesSupported")->array, true);
    EXPECT_EQ(repo.property("KVRNX_StaticOrderedComponent", "AssignedSequence")->type, CimType::Uint64);
    EXPECT_EQ(repo.property("KVRNX_IPElementSettingData", "IsNext")->type, CimType::Uint16);
    EXPECT_EQ(repo.property("KVRNX_IPRemoteAccessAvailableToElement", "OrderOfAccess")->type, CimType::Uint16);
    EXPECT_TRUE(repo.property("KVRNX_DNSSettingData", "DNSServerAddresses")->array);
    EXPECT_TRUE(repo.property("KVRNX_DNSGeneralSettingData", "DNSSuffixesToAppend")->array);

    // The eleven associations: reference names, far-end classes and the parents the provider
    // expands association filters by.
    struct Assoc {
        const char *name, *refA, *classA, *refB, *classB, *parent;
    } assocs[] = {
        {"KVRNX_BindsToLanEndPoint", "Antecedent", "KVRNX_LANEndpoint", "Dependent", "KVRNX_IPProtocolEndpoint",
         "cim_bindstolanendpoint"},
        {"KVRNX_IPElementSettingData", "ManagedElement", "KVRNX_IPProtocolEndpoint", "SettingData",
         "KVRNX_IPAssignmentSettingData", "CIM_ElementSettingData"},
        {"KVRNX_StaticIPElementSettingData", "ManagedElement", "KVRNX_IPProtocolEndpoint", "SettingData",
         "KVRNX_StaticIPAssignmentSettingData", "CIM_ElementSettingData"},
        {"KVRNX_StaticOrderedComponent", "GroupComponent", "KVRNX_IPAssignmentSettingData", "PartComponent",
         "KVRNX_StaticIPAssignmentSettingData", "CIM_OrderedComponent"},
        {"KVRNX_IPHostedAccessPoint", "Antecedent", "KVRNX_ComputerSystem", "Dependent", "KVRNX_IPProtocolEndpoint",
         "CIM_HostedAccessPoint"},
        {"KVRNX_SPHostedAccessPoint", "Antecedent", "KVRNX_SPComputerSystem", "Dependent",
         "KVRNX_IPProtocolEndpoint", "CIM_HostedAccessPoint"},
        {"KVRNX_RemoteHostedAccessPoint", "Antecedent", "KVRNX_ComputerSystem", "Dependent",
         "KVRNX_IPRemoteServiceAccessPoint", "CIM_HostedAccessPoint"},
        {"KVRNX_IPRemoteAccessAvailableToElement", "Antecedent", "KVRNX_IPRemoteServiceAccessPoint", "Dependent",
         "KVRNX_IPProtocolEndpoint", "CIM_RemoteAccessAvailableToElement"},
        {"KVRNX_IPElementCapabilities", "ManagedElement", "KVRNX_IPProtocolEndpoint", "Capabilities",
         "KVRNX_IPEnabledLogicalElementCapabilities", "CIM_ElementCapabilities"},
        {"KVRNX_IPHostedService", "Antecedent", "KVRNX_ComputerSystem", "Dependent", "KVRNX_IPConfigurationService",
         "CIM_HostedService"},
        {"KVRNX_IPServiceAffectsElement", "AffectedElement", "KVRNX_IPProtocolEndpoint", "AffectingElement",
         "KVRNX_IPConfigurationService", "CIM_ServiceAffectsElement"},
    };
    for (const auto& a : assocs) {
        EXPECT_TRUE(repo.isAssociation(a.name)) << a.name;
        EXPECT_TRUE(repo.isA(a.name, a.parent)) << a.name;
        for (auto ref : {std::make_pair(a.refA, a.classA), std::make_pair(a.refB, a.classB)}) {
            const PropertyDecl* d = repo.property(a.name, ref.first);
            ASSERT_NE(d, nullptr) << a.name << "." << ref.first;
            EXPECT_EQ(d->type, CimType::Reference);
            EXPECT_EQ(d->refClass, ref.second) << a.name << "." << ref.first;
            EXPECT_TRUE(d->key);
        }
    }
    EXPECT_FALSE(repo.isA("KVRNX_IPHostedService", "CIM_HostedAccessPoint"));
    EXPECT_TRUE(repo.isA("KVRNX_DNSSAPSAPDependency", "CIM_SAPSAPDependency"));
}

// An object manager is given every mof/*.mof on top of its own DMTF schema: those files must
// declare no CIM_ class or qualifier of their own, and may derive from or refer to only their
// own classes and the CIM_ classes the embedded host stands in for.
TEST(Mof, ObjectManagerFilesLeaveTheSchemaAlone) {
    auto lower = [](std::string s) {
        for (auto& c : s) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
        return s;
    };
    auto classesIn = [&](const std::string& dir, std::vector<ClassDecl>& out) {
        std::set<std::string> names;
        for (const auto& e : std::filesystem::directory_iterator(dir)) {
            if (lower(e.path().extension().string()) != ".mof") continue;
            std::string text = testfiles::readFile(e.path().string());
            std::istringstream lines(text);
            for (std::string word; lines >> word;) EXPECT_NE(lower(word), "qualifier") << e.path();
            for (auto& c : parseMof(text, e.path().string())) {
                names.insert(lower(c.name));
                out.push_back(std::move(c));
            }
        }
        return names;
    };
    std::vector<ClassDecl> staged, standIns;
    std::set<std::string> own = classesIn(IPIF_SOURCE_DIR "/mof", staged);
    std::set<std::string> parents = classesIn(IPIF_SOURCE_DIR "/mof/embedded", standIns);
    ASSERT_FALSE(staged.empty());
    for (const auto& c : standIns) EXPECT_EQ(lower(c.name).rfind("cim_", 0), 0u) << c.name;
    auto known = [&](const std::string& cls) { return own.count(lower(cls)) + parents.count(lower(cls)) > 0; };
    for (const auto& c : staged) {
        EXPECT_NE(lower(c.name).rfind("cim_", 0), 0u) << c.name << " in " << c.file;
        EXPECT_FALSE(c.superclass.empty()) << c.name;
        EXPECT_TRUE(known(c.superclass)) << c.name << " : " << c.superclass;
        for (const auto& p : c.properties) EXPECT_TRUE(p.refClass.empty() || known(p.refClass)) << c.name << "." << p.name;
        for (const auto& m : c.methods)
            for (const auto& p : m.parameters) EXPECT_TRUE(p.refClass.empty() || known(p.refClass)) << c.name << "." << m.name;
    }
}

TEST(Registration, ReadsSfcbFilesAndRejectsMalformedOnes) {
    auto regs = parseRegistrations(
        "# c\n[A_B]\n provider: Prov\n location: Lib\n type: instance  association\n namespace: root/a root/b\n"
        "group: g\n\n[C]\nprovider: P2\nlocation: L2\ntype: method\n",
        "x.reg");
    ASSERT_EQ(regs.size(), 2u);
    EXPECT_EQ(regs[0].className, "A_B");
    EXPECT_TRUE(regs[0].instance && regs[0].association && !regs[0].method);
    EXPECT_TRUE(regs[0].servesNamespace("ROOT/b"));
    EXPECT_EQ(regs[1].namespaces, std::vector<std::string>{"root/cimv2"});
    EXPECT_EQ(regs[1].line, 9);

    auto failure = [](const char* text) {
        try {
            parseRegistrations(text, "x.reg");
        } catch (const RegistrationError& e) {
            return std::string(e.what());
        }
        return std::string();
    };
    EXPECT_EQ(failure("provider: P\n"), "x.reg:1: entry outside a [class] section");
    EXPECT_EQ(failure("[A]\nlocation: L\ntype: instance\n"), "x.reg:1: [A] has no provider:");
    EXPECT_EQ(failure("[A]\nprovider: P\nlocation: L\ntype: instanse\n"), "x.reg:4: unknown provider type 'instanse'");
    EXPECT_EQ(failure("[A\n"), "x.reg:1: missing ']' in section header");
    EXPECT_EQ(failure("[A]\nprovider P\n"), "x.reg:2: expected 'key: value'");
    EXPECT_EQ(failure("[A]\nprovider: P\nlocation: ../L\ntype: method\n"), "x.reg:3: bad location '../L'");

    ClassRepository repo;
    for (const auto& p : testfiles::projectMofPaths()) repo.addPath(p);
    repo.resolve();
    auto project = loadRegistrations(IPIF_SOURCE_DIR "/mof/IPInterfaceProvider.reg");
    ASSERT_EQ(project.size(), 17u);
    std::set<std::string> names;
    int methods = 0, associations = 0;
    for (const auto& r : project) {
        names.insert(r.className);
        EXPECT_TRUE(repo.exists(r.className)) << r.className;
        EXPECT_EQ(r.providerName, "IPInterfaceProvider");
        EXPECT_EQ(r.location, "IPInterfaceProvider");
        EXPECT_TRUE(r.instance) << r.className;
        EXPECT_EQ(r.association, repo.isAssociation(r.className)) << r.className;
        EXPECT_EQ(r.namespaces, std::vector<std::string>{"root/cimv2"});
        methods += r.method;
        associations += r.association;
    }
    EXPECT_EQ(names.size(), 17u);
    EXPECT_EQ(associations, 11);
    EXPECT_EQ(methods, 2);
}

// Each provider library's OpenPegasus registration says what its sfcb .reg file says: one CMPI
// 2.0 module at the library's location, one provider, and per class the same namespaces and
// provider types (2 instance, 3 association, 5 method).
TEST(Registration, PegasusFilesMatchTheSfcbFiles) {
    using Props = std::map<std::string, std::string>;
    auto instances = [](const std::string& text) {
        std::vector<std::pair<std::string, Props>> out;
        std::regex head(R"(instance\s+of\s+(\w+)\s*\{)"), prop(R"((\w+)\s*=\s*(\{[^}]*\}|"[^"]*"|\w+)\s*;)");
        for (std::sregex_iterator h(text.begin(), text.end(), head), end; h != end; ++h) {
            out.emplace_back((*h)[1], Props());
            auto next = std::next(h);
            std::string body = text.substr(h->position() + h->length(),
                                           (next == end ? text.size() : next->position()) - h->position() - h->length());
            for (std::sregex_iterator p(body.begin(), body.end(), prop); p != end; ++p) {
                std::string v = (*p)[2];
                v.erase(std::remove_if(v.begin(), v.end(), [](char c) { return std::strchr("{}\" ", c); }), v.end());
                out.back().second[(*p)[1]] = v;
            }
        }
        return out;
    };
    for (std::string lib : {"IPInterfaceProvider", "IPInterfaceCompanion"}) {
        auto regs = loadRegistrations(IPIF_SOURCE_DIR "/mof/" + lib + ".reg");
        ASSERT_FALSE(regs.empty());
        std::map<std::string, std::string> expected, got;  // class: namespaces|types
        for (const auto& r : regs) {
            EXPECT_EQ(r.location, lib);
            std::string ns;
            for (const auto& n : r.namespaces) ns += (ns.empty() ? "" : ",") + n;
            expected[r.className] = ns + "|" + (r.instance ? "2," : "") + (r.association ? "3," : "") +
                                    (r.method ? "5," : "");
        }
        std::string module;
        std::set<std::string> ids;
        int modules = 0, providers = 0;
        for (auto& [cls, p] : instances(testfiles::readFile(IPIF_SOURCE_DIR "/mof/pegasus/" + lib + ".mof"))) {
            if (cls == "PG_ProviderModule") {
                ++modules;
                module = p["Name"];
                EXPECT_EQ(p["Location"], lib);
                EXPECT_EQ(p["InterfaceType"], "CMPI");
                EXPECT_EQ(p["InterfaceVersion"], "2.0.0");
                EXPECT_EQ(p["Version"], IPIF_VERSION);
                EXPECT_FALSE(p["Vendor"].empty());
            } else if (cls == "PG_Provider") {
                ++providers;
                EXPECT_EQ(p["Name"], regs[0].providerName);
                EXPECT_EQ(p["ProviderModuleName"], module);
            } else {
                EXPECT_EQ(cls, "PG_ProviderCapabilities");
                EXPECT_EQ(p["ProviderModuleName"], module);
                EXPECT_EQ(p["ProviderName"], regs[0].providerName);
                EXPECT_TRUE(ids.insert(p["CapabilityID"]).second) << p["CapabilityID"];
                got[p["ClassName"]] = p["Namespaces"] + "|" + p["ProviderType"] + ",";
            }
        }
        EXPECT_EQ(modules, 1) << lib;
        EXPECT_EQ(providers, 1) << lib;
        EXPECT_FALSE(module.empty());
        EXPECT_EQ(got, expected) << lib;
    }
}
