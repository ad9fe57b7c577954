// Set-up of the adapter tests: the embedded host's broker with the provider's classes declared
// strictly (a property of the wrong CIM type is refused), a scratch copy of a host model
// fixture, a scratch ifcfg directory, a captured log, and CMPI data rendered as "type:value".
#pragma once

#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <initializer_list>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "Nx/HostModel.h"
#include "TALog/TALogger.h"
#include "ipif/Host.h"
#include "models_fixture.h"

namespace adaptertest {

inline const char* const kMof = R"(
class KVRNX_IPProtocolEndpoint {
  [Key] string SystemCreationClassName; [Key] string SystemName; [Key] string CreationClassName;
  [Key] string Name; string ElementName; string Description; string IPv4Address; string IPv6Address;
  string SubnetMask; uint8 PrefixLength; uint16 IPv6SubnetPrefixLength; uint16 AddressType;
  uint16 IPv6AddressType; uint16 IPVersionSupport; uint16 ProtocolIFType; uint16 EnabledState;
  uint16 RequestedState; uint16 AddressOrigin; string NameFormat; };
class KVRNX_IPAssignmentSettingData {
  [Key] string InstanceID; string ElementName; uint16 AddressOrigin; string ConfigurationName; };
class KVRNX_StaticIPAssignmentSettingData {
  [Key] string InstanceID; string ElementName; uint16 AddressOrigin; string IPv4Address;
  string IPv6Address; string SubnetMask; string GatewayIPv4Address; uint16 IPv6SubnetPrefixLength;
  uint16 AddressType; uint16 IPv6AddressType; string GatewayIPv6Address; string ConfigurationName; };
class KVRNX_IPRemoteServiceAccessPoint {
  [Key] string SystemCreationClassName; [Key] string SystemName; [Key] string CreationClassName;
  [Key] string Name; string ElementName; string AccessInfo; string OtherAccessContext;
  uint16 InfoFormat; uint16 AccessContext; };
class KVRNX_IPEnabledLogicalElementCapabilities {
  [Key] string InstanceID; string ElementName; boolean ElementNameEditSupported;
  uint16 MaxElementNameLen; uint16 RequestedStatesSupported[]; };
class KVRNX_IPConfigurationService {
  [Key] string SystemCreationClassName; [Key] string SystemName; [Key] string CreationClassName;
  [Key] string Name; string ElementName; };
)";

inline const char* const kNamespace = "root/cimv2";
using Texts = std::initializer_list<std::pair<const char*, std::string>>;

inline std::string charsOf(const CMPIString* s) {
    const char* chars = s ? CMGetCharPtr(s) : nullptr;
    return chars ? chars : "(null)";
}

inline std::string scalar(CMPIType type, const CMPIValue& v) {
    switch (type) {
        case CMPI_string: return "string:" + charsOf(v.string);
        case CMPI_uint8: return "uint8:" + std::to_string(v.uint8);
        case CMPI_uint16: return "uint16:" + std::to_string(v.uint16);
        case CMPI_boolean: return v.boolean ? "boolean:true" : "boolean:false";
        default: return "type" + std::to_string(type);
    }
}

// "uint16:3", "string:eth0", "uint16[]:2,3,11", "absent".
inline std::string render(const CMPIData& d, const CMPIStatus& rc) {
    if (rc.rc != CMPI_RC_OK || (d.state & CMPI_notFound)) return "absent";
    if (!(d.type & CMPI_ARRAY)) return scalar(d.type, d.value);
    std::string out = "uint16[]:";
    if (d.type != CMPI_uint16A) return "array" + std::to_string(d.type);
    for (CMPICount i = 0, n = CMGetArrayCount(d.value.array, nullptr); i < n; ++i)
        out += (i ? "," : "") + std::to_string(CMGetArrayElementAt(d.value.array, i, nullptr).value.uint16);
    return out;
}

inline std::string prop(const CMPIInstance* instance, const char* name) {
    CMPIStatus rc = {CMPI_RC_OK, nullptr};
    return render(CMGetProperty(instance, name, &rc), rc);
}

inline std::string key(const CMPIObjectPath* path, const char* name) {
    CMPIStatus rc = {CMPI_RC_OK, nullptr};
    return render(CMGetKey(path, name, &rc), rc);
}

inline std::vector<std::string> keyNames(const CMPIObjectPath* path) {
    std::vector<std::string> names;
    for (CMPICount i = 0, n = CMGetKeyCount(path, nullptr); i < n; ++i) {
        CMPIString* name = nullptr;
        CMGetKeyAt(path, i, &name, nullptr);
        names.push_back(charsOf(name));
    }
    return names;
}

// Every instance an adapter yields, walked as the request handlers walk it.
template <class Adapter>
std::vector<CMPIInstance*> walk(Adapter& adapter) {
    std::vector<CMPIInstance*> found;
    for (int guard = 0; adapter && guard < 50; ++guard, ++adapter) found.push_back(adapter.getCMPIInstance(nullptr));
    return found;
}

inline std::string statusText(const CMPIStatus& status) {
    return std::to_string(status.rc) + ":" + (status.msg ? charsOf(status.msg) : "(null)");
}

class AdapterTest : public modeltest::ModelTest {
protected:
    AdapterTest() : host(options(scratch)), broker(host.broker()) { TALog::TALogger::reconfigure(); }
    ~AdapterTest() override {
        Nx::HostModel::setCurrent(nullptr);
        logEnv.clear();
        TALog::TALogger::reconfigure();
    }

    static ipif::HostOptions options(const testfiles::ScratchDir& dir) {
        testfiles::writeFile(dir.file("adapters.mof"), kMof);
        ipif::HostOptions o;
        o.mofPaths = {dir.file("adapters.mof")};
        o.regPaths = {dir.path()};
        o.strictProperties = true;
        return o;
    }

    // A scratch copy of tests/fixtures/<name>: writes never reach the source tree.
    void useFixture(const std::string& name) {
        fixture = scratch.file(name);
        std::filesystem::copy_file(std::string(IPIF_TEST_FIXTURES) + "/" + name, fixture);
        Nx::HostModel::setCurrent(Nx::HostModel::open("fixture:" + fixture));
    }

    // A node property as the fixture file holds it now.
    Nx::HostModel::PropertyValue node(const std::string& path, unsigned int property) const {
        auto tree = Nx::HostModel::open("fixture:" + fixture)->snapshot();
        return tree->nodes.at(static_cast<size_t>(tree->find(path))).properties.at(property);
    }

    CMPIObjectPath* path(const char* className, Texts keys = {}) const {
        CMPIObjectPath* p = CMNewObjectPath(broker, kNamespace, className, nullptr);
        for (const auto& k : keys) CMAddKey(p, k.first, k.second.c_str(), CMPI_chars);
        return p;
    }

    // A modification's instance: the path's keys plus string properties.
    CMPIInstance* instance(CMPIObjectPath* p, Texts texts) const {
        CMPIInstance* i = CMNewInstance(broker, p, nullptr);
        for (const auto& t : texts) CMSetProperty(i, t.first, t.second.c_str(), CMPI_chars);
        return i;
    }

    // How many records (failures only are kept) carried text.
    size_t logged(const std::string& text) const {
        const std::string all = testfiles::readFile(scratch.file("trace"));
        size_t count = 0;
        for (size_t at = all.find(text); at != std::string::npos; at = all.find(text, at + 1)) ++count;
        return count;
    }

    testfiles::ScratchDir scratch;
    std::vector<std::shared_ptr<testfiles::ScopedEnv>> logEnv = {
        std::make_shared<testfiles::ScopedEnv>("IPIF_LOG_LEVEL", "6000"),
        std::make_shared<testfiles::ScopedEnv>("IPIF_LOG_FILE", scratch.file("log")),
        std::make_shared<testfiles::ScopedEnv>("IPIF_TRACE_FILE", scratch.file("trace"))};
    ipif::Host host;
    const CMPIBroker* broker;
    std::string fixture;
    const std::string hostName = modeltest::hostName();
};

}  // namespace adaptertest
