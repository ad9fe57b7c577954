// The companion provider's view of the host: the classes the IP interface provider meets at the far
// end of its associations or reads while applying a setting, produced from the host model.
//
// Setting InstanceIDs, with P "Computer%" ("BMC%" for the service processor's interfaces):
//   KVRNX_DHCPSettingData         P<if>%dhcp
//   KVRNX_DNSSettingData          P<if>%
//   KVRNX_DNSGeneralSettingData   Computer%dnsgeneral (one per host)
// A client applies P<if>%static or P<if>%dhcp (the interface's IP assignment settings); the
// configuration service takes each setting whose InstanceID that name contains, so either name
// brings the interface's DNS setting with it, and only the DHCP name its DHCP setting.
//
// ModifyInstance of the DHCP and DNS settings does not touch the host: the values wait in
// <data directory>/kvrnx-companion.settings and are what the settings show and what applying
// them writes. A value is dropped once the host reports it, so the setting follows the host again.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <utility>
#include <variant>
#include <vector>

namespace Nx {
namespace IPInterfaceCompanion {

// The key names and values of an object another object refers to.
struct Reference {
    std::string className;
    std::vector<std::pair<std::string, std::string>> keys;
};

using Value =
    std::variant<std::string, unsigned short, std::vector<std::string>, std::vector<unsigned short>, Reference>;

struct Property {
    std::string name;
    Value value;
};

// One CIM object: keys (strings, or references for associations) and the other properties.
struct Object {
    std::string className;
    std::vector<Property> keys;
    std::vector<Property> properties;
};

// One IP interface (an endpoint node) as the IP interface provider names it.
struct Interface {
    std::string name;           // property 108
    bool serviceProcessor;      // endpoint described "BMC ...": its system is the service processor
    std::string settingPrefix;  // "BMC%" when the endpoint sits under the "BMC" node, else "Computer%"
};

struct LanPort {
    std::string name;  // property 108
    bool underServiceProcessor;
};

// What one request needs of the host, read once.
struct HostPicture {
    std::string hostName;                                // gethostname, as the IP interface provider reports SystemName
    std::optional<std::string> modelHostName;            // system node 97
    std::optional<std::string> domainName;               // 98
    std::optional<std::vector<std::string>> dnsServers;  // 94
    std::optional<std::vector<std::string>> dnsSuffixes;  // 99
    bool hasServiceProcessor = false;
    std::string serviceProcessorDescription;
    std::vector<LanPort> lanPorts;
    std::vector<Interface> interfaces;
};

// Reads the host model. Throws Nx::InstrumentationException when it cannot be read.
HostPicture readHost();

// Values a client set on a setting before applying it, by InstanceID and property; a scalar is a
// list of one. They live in a small file in the data directory, shared by every process.
class Settings {
public:
    using Entries = std::map<std::string, std::map<std::string, std::vector<std::string>>>;

    static std::string path();
    static Settings load();
    static Entries parse(const std::string& content);
    static std::string format(const Entries& entries);

    // The value stored for (id, property), else hostValue. A stored value the host now reports
    // has been applied: it is remembered as stale so that forgetStale drops it.
    std::optional<std::vector<std::string>> valueOr(const std::string& id, const std::string& property,
                                                    const std::optional<std::vector<std::string>>& hostValue);
    // Drops the stale values, if the host still reports them. False when the file could not be written.
    bool forgetStale();

private:
    struct Stale {
        std::string id;
        std::string property;
        std::vector<std::string> value;
    };
    Entries entries_;
    std::vector<Stale> stale_;
};

// A property a client may change with ModifyInstance.
struct Modifiable {
    const char* name;
    bool list;
    bool allowEmpty;     // an empty value (or list) is accepted
    const char* extras;  // characters allowed besides letters, digits and '.'
};

struct ClassEntry {
    const char* name;
    bool association;
    std::vector<Object> (*produce)(const HostPicture&, Settings&);
    std::vector<Modifiable> modifiable;
};

const std::vector<ClassEntry>& classTable();
// Case-insensitive; null when the class is not served here.
const ClassEntry* findClass(const std::string& className);

bool equalsIgnoreCase(const std::string& a, const std::string& b);

// The fixed texts other providers rely on.
extern const char* const kServiceProcessorName;  // "BMC:-1"
extern const char* const kJobInstanceId;         // "IPConfigSvcJob:1"

}  // namespace IPInterfaceCompanion
}  // namespace Nx
