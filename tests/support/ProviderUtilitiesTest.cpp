#include <cmpift.h>
#include <cmpimacs.h>

#include <map>
#include <memory>

#include "Nx/ProviderUtilities.h"
#include "SupportTestUtil.h"

using Nx::ProviderUtilities;

namespace {

// A minimal broker: strings, class paths and a class hierarchy for classPathIsA.
struct FakeString : CMPIString {
    std::string text;
};
struct FakePath : CMPIObjectPath {
    std::string nameSpace, className;
};

std::vector<std::unique_ptr<FakeString>> strings;
std::vector<std::unique_ptr<FakePath>> paths;
std::map<std::string, std::string> parentOf{{"KVRNX_HostedThing", "CIM_HostedAccessPoint"},
                                            {"CIM_HostedAccessPoint", "CIM_HostedDependency"}};
std::string lastNamespace;
bool failNewPath = false;

char* stringChars(const CMPIString* s, CMPIStatus* rc) {
    CMSetStatus(rc, CMPI_RC_OK);
    return const_cast<char*>(static_cast<const FakeString*>(s)->text.c_str());
}
CMPIStringFT stringFT = [] {
    CMPIStringFT ft{};
    ft.ftVersion = 200;
    ft.getCharPtr = stringChars;
    return ft;
}();

CMPIString* makeString(const std::string& text) {
    auto s = std::make_unique<FakeString>();
    s->hdl = s.get();
    s->ft = &stringFT;
    s->text = text;
    strings.push_back(std::move(s));
    return strings.back().get();
}

const FakePath* fake(const CMPIObjectPath* op) { return static_cast<const FakePath*>(op); }

CMPIString* pathClassName(const CMPIObjectPath* op, CMPIStatus* rc) {
    CMSetStatus(rc, CMPI_RC_OK);
    return makeString(fake(op)->className);
}
CMPIString* pathNameSpace(const CMPIObjectPath* op, CMPIStatus* rc) {
    CMSetStatus(rc, CMPI_RC_OK);
    return makeString(fake(op)->nameSpace);
}
CMPIObjectPathFT pathFT = [] {
    CMPIObjectPathFT ft{};
    ft.ftVersion = 200;
    ft.getClassName = pathClassName;
    ft.getNameSpace = pathNameSpace;
    return ft;
}();

CMPIObjectPath* newPath(const CMPIBroker*, const char* ns, const char* cn, CMPIStatus* rc) {
    lastNamespace = ns ? ns : "";
    if (failNewPath) {
        CMSetStatus(rc, CMPI_RC_ERR_FAILED);
        return nullptr;
    }
    auto path = std::make_unique<FakePath>();
    path->hdl = path.get();
    path->ft = &pathFT;
    path->nameSpace = ns ? ns : "";
    path->className = cn ? cn : "";
    paths.push_back(std::move(path));
    CMSetStatus(rc, CMPI_RC_OK);
    return paths.back().get();
}
CMPIBoolean classPathIsA(const CMPIBroker*, const CMPIObjectPath* op, const char* type, CMPIStatus* rc) {
    CMSetStatus(rc, CMPI_RC_OK);
    for (std::string name = fake(op)->className; !name.empty();) {
        if (name == type) return 1;
        auto parent = parentOf.find(name);
        name = parent == parentOf.end() ? std::string() : parent->second;
    }
    return 0;
}

CMPIBrokerEncFT encFT = [] {
    CMPIBrokerEncFT ft{};
    ft.ftVersion = 200;
    ft.newObjectPath = newPath;
    ft.classPathIsA = classPathIsA;
    return ft;
}();
CMPIBroker broker = [] {
    CMPIBroker b{};
    b.eft = &encFT;
    return b;
}();

}  // namespace

TEST(ProviderUtilities, ClassIdTable) {
    const std::pair<const char*, unsigned short> table[] = {
        {"KVRNX_IPProtocolEndpoint", 9},
        {"KVRNX_IPAssignmentSettingData", 66},
        {"KVRNX_BindsToLanEndPoint", 67},
        {"KVRNX_IPElementSettingData", 68},
        {"KVRNX_StaticIPAssignmentSettingData", 69},
        {"KVRNX_IPRemoteServiceAccessPoint", 70},
        {"KVRNX_StaticOrderedComponent", 71},
        {"KVRNX_IPHostedAccessPoint", 72},
        {"KVRNX_StaticIPElementSettingData", 73},
        {"KVRNX_RemoteHostedAccessPoint", 80},
        {"KVRNX_IPRemoteAccessAvailableToElement", 81},
        {"KVRNX_SPHostedAccessPoint", 120},
        {"KVRNX_IPElementCapabilities", 121},
        {"KVRNX_IPEnabledLogicalElementCapabilities", 128},
        {"KVRNX_IPConfigurationService", 129},
        {"KVRNX_IPHostedService", 130},
        {"KVRNX_IPServiceAffectsElement", 131},
        {"KVRNX_ComputerSystem", 1},
        {"KVRNX_LANEndpoint", 16},
        {"KVRNX_SPComputerSystem", 119},
        {"CIM_IPProtocolEndpoint", 255},
        {"kvrnx_ipprotocolendpoint", 255},
        {"KVRNX_IPProtocolEndpoint ", 255},
        {"", 255},
    };
    for (const auto& [name, id] : table) EXPECT_EQ(ProviderUtilities::getClassId(name), id) << name;
    EXPECT_EQ(ProviderUtilities::getClassId(static_cast<const char*>(nullptr)), 255);

    CMPIObjectPath* path = ProviderUtilities::createObjectPath(&broker, "KVRNX_SPHostedAccessPoint", "root/cimv2");
    ASSERT_NE(path, nullptr);
    EXPECT_EQ(ProviderUtilities::getClassId(path), 120);
    EXPECT_EQ(ProviderUtilities::getNamespace(path), "root/cimv2");
}

TEST(ProviderUtilities, ClassesRelatedByNameOrThroughTheBroker) {
    EXPECT_TRUE(ProviderUtilities::areClassesRelated(nullptr, "root/cimv2", "cim_hostedservice", "CIM_HostedService"));
    EXPECT_FALSE(ProviderUtilities::areClassesRelated(nullptr, "root/cimv2", "KVRNX_HostedThing", "CIM_HostedDependency"));
    EXPECT_TRUE(ProviderUtilities::areClassesRelated(&broker, "root/interop", "KVRNX_HostedThing", "CIM_HostedDependency"));
    EXPECT_EQ(lastNamespace, "root/interop");
    EXPECT_FALSE(ProviderUtilities::areClassesRelated(&broker, "root/interop", "CIM_HostedAccessPoint", "KVRNX_HostedThing"));
    failNewPath = true;
    EXPECT_FALSE(ProviderUtilities::areClassesRelated(&broker, "root/interop", "KVRNX_HostedThing", "CIM_HostedAccessPoint"));
    failNewPath = false;
}

TEST(ProviderUtilities, ValidateInputRefusesShellMetacharacters) {
    for (const char* good : {"192.168.1.10", "255.255.255.0", "", "eth0", "example.com"})
        EXPECT_NE(ProviderUtilities::ValidateInput(good, ""), 0) << good;
    for (const char* ipv6 : {"2001:db8::1", "fe80::1:2ff:fe03:405", "::"}) {
        EXPECT_NE(ProviderUtilities::ValidateInput(ipv6, ":"), 0) << ipv6;
        EXPECT_EQ(ProviderUtilities::ValidateInput(ipv6, ""), 0) << ipv6;
    }
    EXPECT_NE(ProviderUtilities::ValidateInput("fe80::1%eth0", ":%"), 0);
    EXPECT_NE(ProviderUtilities::ValidateInput("my-host_1", "-_"), 0);
    EXPECT_EQ(ProviderUtilities::ValidateInput("my-host_1", "-"), 0);

    // Every one of these could break out of KEY=value in a sourced file; naming the character in
    // extra must not let it through.
    const std::string everything = " \t\n\r$`;&|<>()'\"\\*?[]{}~!#=";
    for (const char* bad : {"$(reboot)", "`reboot`", "1.2.3.4;reboot", "1.2.3.4\nGATEWAY=6.6.6.6", "1.2.3.4\r",
                            "'x'", "\"x\"", "1.2.3.4 5", "1.2.3.*", "1.2.3.?", "[a]", "a|b", "a&b", "a>b",
                            "${IFS}", "~root", "a\\b", "a=b", "#x", "caf\xC3\xA9"}) {
        EXPECT_EQ(ProviderUtilities::ValidateInput(bad, ":"), 0) << bad;
        EXPECT_EQ(ProviderUtilities::ValidateInput(bad, everything + ":"), 0) << bad;
    }
    EXPECT_EQ(ProviderUtilities::ValidateInput(std::string("1.2\0.3", 6), std::string(1, '\0')), 0);
}
