#include "CompanionModel.h"

#include <strings.h>
#include <unistd.h>

#include "Nx/Exceptions.h"
#include "Nx/File.h"
#include "Nx/Instrumentation.h"
#include "Nx/PlatformUtilities.h"

namespace Nx {
namespace IPInterfaceCompanion {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;

const char* const kServiceProcessorName = "BMC:-1";
const char* const kJobInstanceId = "IPConfigSvcJob:1";

namespace {

const char* const kComputerSystem = "KVRNX_ComputerSystem";
const char* const kServiceProcessor = "KVRNX_SPComputerSystem";
const char* const kIPEndpoint = "KVRNX_IPProtocolEndpoint";
const char* const kDNSEndpoint = "KVRNX_DNSProtocolEndpoint";
// Every character a stored value may hold besides letters, digits and '.'.
const char* const kAnyExtra = ":-_/%,@+";

bool localHostName(std::string& name) {
    char buffer[256] = {};
    if (::gethostname(buffer, sizeof buffer) != 0) return false;
    buffer[sizeof buffer - 1] = '\0';
    name = buffer;
    return true;
}

// Description of the node `levels` generations above the cursor's node; empty when there is none.
std::string ancestorDescription(const Instrumentation& cursor, int levels) {
    Instrumentation probe(cursor);
    std::string path = cursor.getPathToParentNode();
    for (int i = 1; i < levels && !path.empty(); ++i) {
        if (!probe.selectNode(path)) return std::string();
        path = probe.getPathToParentNode();
    }
    if (path.empty() || !probe.selectNode(path)) return std::string();
    return probe.getNodeDescription();
}

bool parentIsRoot(const Instrumentation& cursor) {
    Instrumentation probe(cursor);
    const std::string path = cursor.getPathToParentNode();
    return !path.empty() && probe.selectNode(path) && probe.getPathToParentNode().empty();
}

template <class T>
std::optional<T> read(const Instrumentation& cursor, Properties property) {
    T value{};
    if (!cursor.getProperty(property, value)) return std::nullopt;
    return value;
}

std::optional<std::vector<std::string>> asList(const std::optional<std::string>& value) {
    if (!value) return std::nullopt;
    return std::vector<std::string>{*value};
}

Property text(const char* name, std::string value) { return Property{name, Value(std::move(value))}; }
Property number(const char* name, unsigned short value) { return Property{name, Value(value)}; }

void addScalar(std::vector<Property>& properties, const char* name,
               const std::optional<std::vector<std::string>>& value) {
    if (value && value->size() == 1) properties.push_back(text(name, value->front()));
}

void addList(std::vector<Property>& properties, const char* name,
             const std::optional<std::vector<std::string>>& value) {
    if (value) properties.push_back(Property{name, Value(*value)});
}

std::vector<Property> keysOf(const Reference& reference) {
    std::vector<Property> keys;
    for (const auto& key : reference.keys) keys.push_back(text(key.first.c_str(), key.second));
    return keys;
}

// An interface's endpoints carry the keys the IP interface provider gives its IP endpoint.
Reference endpointOf(const HostPicture& host, const Interface& iface, const char* creationClassName) {
    return Reference{creationClassName,
                     {{"SystemCreationClassName", iface.serviceProcessor ? kServiceProcessor : kComputerSystem},
                      {"SystemName", iface.serviceProcessor ? kServiceProcessorName : host.hostName},
                      {"CreationClassName", creationClassName},
                      {"Name", iface.name}}};
}

// The closing '%' of the DNS stem keeps eth0's setting out of eth01's configuration names.
std::string dhcpSettingId(const Interface& iface) { return iface.settingPrefix + iface.name + "%dhcp"; }
std::string dnsSettingId(const Interface& iface) { return iface.settingPrefix + iface.name + "%"; }
const char* const kDNSGeneralSettingId = "Computer%dnsgeneral";

std::string configurationName(Settings& settings, const std::string& id) {
    auto value = settings.valueOr(id, "ConfigurationName", std::vector<std::string>{id});
    return value && value->size() == 1 ? value->front() : id;
}

std::vector<Object> computerSystems(const HostPicture& host, Settings&) {
    return {Object{kComputerSystem,
                   {text("CreationClassName", kComputerSystem), text("Name", host.hostName)},
                   {text("ElementName", host.hostName), text("NameFormat", "IP"),
                    Property{"Dedicated", Value(std::vector<unsigned short>{0})},  // not dedicated
                    number("EnabledState", 2), number("RequestedState", 12)}}};
}

std::vector<Object> serviceProcessors(const HostPicture& host, Settings&) {
    if (!host.hasServiceProcessor) return {};
    return {Object{kServiceProcessor,
                   {text("CreationClassName", kServiceProcessor), text("Name", kServiceProcessorName)},
                   {text("ElementName", host.serviceProcessorDescription), text("NameFormat", "Other"),
                    Property{"Dedicated", Value(std::vector<unsigned short>{14})}}}};  // management
}

// Keyed exactly as the LAN binding association names them: it always says KVRNX_ComputerSystem and
// carries over the IP endpoint's SystemName, which is "BMC:-1" on the service processor.
std::vector<Object> lanEndpoints(const HostPicture& host, Settings&) {
    std::vector<Object> objects;
    for (const LanPort& port : host.lanPorts) {
        objects.push_back(
            Object{"KVRNX_LANEndpoint",
                   {text("SystemCreationClassName", kComputerSystem),
                    text("SystemName", port.underServiceProcessor ? kServiceProcessorName : host.hostName),
                    text("CreationClassName", "KVRNX_LANEndpoint"), text("Name", port.name)},
                   {text("ElementName", port.name), number("ProtocolIFType", 6)}});  // Ethernet
    }
    return objects;
}

std::vector<Object> dhcpSettings(const HostPicture& host, Settings& settings) {
    std::vector<Object> objects;
    for (const Interface& iface : host.interfaces) {
        const std::string id = dhcpSettingId(iface);
        objects.push_back(Object{"KVRNX_DHCPSettingData",
                                 {text("InstanceID", id)},
                                 {text("ElementName", iface.name), number("AddressOrigin", 4),
                                  text("ConfigurationName", configurationName(settings, id))}});
    }
    return objects;
}

std::vector<Object> dnsSettings(const HostPicture& host, Settings& settings) {
    std::vector<Object> objects;
    for (const Interface& iface : host.interfaces) {
        const std::string id = dnsSettingId(iface);
        std::vector<Property> properties = {text("ElementName", iface.name), number("AddressOrigin", 3)};
        addScalar(properties, "RequestedHostname",
                  settings.valueOr(id, "RequestedHostname", asList(host.modelHostName)));
        addScalar(properties, "DomainName", settings.valueOr(id, "DomainName", asList(host.domainName)));
        addList(properties, "DNSServerAddresses", settings.valueOr(id, "DNSServerAddresses", host.dnsServers));
        properties.push_back(text("ConfigurationName", configurationName(settings, id)));
        objects.push_back(Object{"KVRNX_DNSSettingData", {text("InstanceID", id)}, std::move(properties)});
    }
    return objects;
}

std::vector<Object> dnsGeneralSettings(const HostPicture& host, Settings& settings) {
    std::vector<Property> properties = {text("ElementName", "DNS suffixes")};
    addList(properties, "DNSSuffixesToAppend",
            settings.valueOr(kDNSGeneralSettingId, "DNSSuffixesToAppend", host.dnsSuffixes));
    properties.push_back(text("ConfigurationName", configurationName(settings, kDNSGeneralSettingId)));
    return {Object{"KVRNX_DNSGeneralSettingData", {text("InstanceID", kDNSGeneralSettingId)}, std::move(properties)}};
}

std::vector<Object> dnsEndpoints(const HostPicture& host, Settings&) {
    std::vector<Object> objects;
    for (const Interface& iface : host.interfaces) {
        std::vector<Property> properties = {text("ElementName", iface.name), number("ProtocolIFType", 1)};  // other
        if (host.modelHostName) properties.push_back(text("Hostname", *host.modelHostName));
        objects.push_back(Object{kDNSEndpoint, keysOf(endpointOf(host, iface, kDNSEndpoint)), std::move(properties)});
    }
    return objects;
}

std::vector<Object> dnsDependencies(const HostPicture& host, Settings&) {
    std::vector<Object> objects;
    for (const Interface& iface : host.interfaces) {
        objects.push_back(Object{"KVRNX_DNSSAPSAPDependency",
                                 {Property{"Antecedent", Value(endpointOf(host, iface, kIPEndpoint))},
                                  Property{"Dependent", Value(endpointOf(host, iface, kDNSEndpoint))}},
                                 {}});
    }
    return objects;
}

// The job the configuration methods name: they finish before returning.
std::vector<Object> jobs(const HostPicture&, Settings&) {
    return {Object{"KVRNX_ConcreteJob",
                   {text("InstanceID", kJobInstanceId)},
                   {text("ElementName", "IP configuration"), number("JobState", 7), text("JobStatus", "Completed"),
                    Property{"OperationalStatus", Value(std::vector<unsigned short>{2, 17})}}}};  // OK, completed
}

void splitFields(const std::string& line, std::vector<std::string>& fields) {
    std::string::size_type start = 0;
    for (;;) {
        std::string::size_type tab = line.find('\t', start);
        fields.push_back(line.substr(start, tab == std::string::npos ? std::string::npos : tab - start));
        if (tab == std::string::npos) return;
        start = tab + 1;
    }
}

}  // namespace

bool equalsIgnoreCase(const std::string& a, const std::string& b) {
    return a.size() == b.size() && ::strcasecmp(a.c_str(), b.c_str()) == 0;
}

HostPicture readHost() {
    HostPicture host;
    if (!localHostName(host.hostName)) throw InstrumentationException("The host name could not be read");
    Instrumentation cursor;
    if (cursor.selectNode(NodeType::SystemNode)) {
        host.modelHostName = read<std::string>(cursor, Properties::HostName);
        host.domainName = read<std::string>(cursor, Properties::DomainName);
        host.dnsServers = read<std::vector<std::string>>(cursor, Properties::DNSServers);
        host.dnsSuffixes = read<std::vector<std::string>>(cursor, Properties::DNSSuffixes);
    }
    for (bool at = cursor.selectNode(NodeType::ServiceProcessorNode); at; at = static_cast<bool>(++cursor)) {
        if (cursor.getNodeDescription() == "BMC" && parentIsRoot(cursor)) {
            host.hasServiceProcessor = true;
            host.serviceProcessorDescription = cursor.getNodeDescription();
            break;
        }
    }
    // Nodes whose name cannot be read are passed over, as the association models do.
    std::string name;
    for (bool at = cursor.selectNode(NodeType::LanEndpointNode); at; at = static_cast<bool>(++cursor)) {
        if (cursor.getProperty(Properties::ElementName, name))
            host.lanPorts.push_back(LanPort{name, ancestorDescription(cursor, 1) == "BMC"});
    }
    for (bool at = cursor.selectNode(NodeType::IPEndpointNode); at; at = static_cast<bool>(++cursor)) {
        if (!cursor.getProperty(Properties::ElementName, name)) continue;
        host.interfaces.push_back(Interface{name, cursor.getNodeDescription().find("BMC ") != std::string::npos,
                                            ancestorDescription(cursor, 2) == "BMC" ? "BMC%" : "Computer%"});
    }
    return host;
}

std::string Settings::path() { return PlatformUtilities::getMerrowDataDir() + "kvrnx-companion.settings"; }

Settings Settings::load() {
    Settings settings;
    std::string content;
    if (File::read(path(), content)) settings.entries_ = parse(content);
    return settings;
}

// One line per value: InstanceID, property and the elements, separated by tabs. Stored values
// never hold a tab or a line break (they are validated), so the format needs no quoting.
Settings::Entries Settings::parse(const std::string& content) {
    Entries entries;
    std::string::size_type start = 0;
    while (start < content.size()) {
        std::string::size_type end = content.find('\n', start);
        if (end == std::string::npos) end = content.size();
        const std::string line = content.substr(start, end - start);
        start = end + 1;
        if (line.empty() || line[0] == '#') continue;
        std::vector<std::string> fields;
        splitFields(line, fields);
        if (fields.size() < 2 || fields[0].empty() || fields[1].empty()) continue;
        entries[fields[0]][fields[1]].assign(fields.begin() + 2, fields.end());
    }
    return entries;
}

std::string Settings::format(const Entries& entries) {
    std::string content = "# Setting values set through the IP interface companion provider\n";
    for (const auto& setting : entries) {
        for (const auto& property : setting.second) {
            content += setting.first + "\t" + property.first;
            for (const std::string& element : property.second) content += "\t" + element;
            content += "\n";
        }
    }
    return content;
}

std::optional<std::vector<std::string>> Settings::valueOr(const std::string& id, const std::string& property,
                                                          const std::optional<std::vector<std::string>>& hostValue) {
    auto setting = entries_.find(id);
    if (setting == entries_.end()) return hostValue;
    auto stored = setting->second.find(property);
    if (stored == setting->second.end()) return hostValue;
    if (hostValue && *hostValue == stored->second) stale_.push_back(Stale{id, property, stored->second});
    return stored->second;
}

bool Settings::forgetStale() {
    if (stale_.empty()) return true;
    bool declined = false;
    bool written = File::update(path(), [&](std::string& content, bool exists) {
        declined = true;
        if (!exists) return false;
        Entries entries = parse(content);
        bool changed = false;
        for (const Stale& stale : stale_) {
            auto setting = entries.find(stale.id);
            if (setting == entries.end()) continue;
            auto stored = setting->second.find(stale.property);
            // Only what was seen: a value set again meanwhile stays.
            if (stored == setting->second.end() || stored->second != stale.value) continue;
            setting->second.erase(stored);
            if (setting->second.empty()) entries.erase(setting);
            changed = true;
        }
        if (!changed) return false;
        content = format(entries);
        declined = false;
        return true;
    });
    stale_.clear();
    return written || declined;
}

// Built when the library is loaded, before any request thread can look at it.
const std::vector<ClassEntry> kClassTable = {
    {kComputerSystem, false, computerSystems, {}},
    {kServiceProcessor, false, serviceProcessors, {}},
    {"KVRNX_LANEndpoint", false, lanEndpoints, {}},
    {"KVRNX_DHCPSettingData", false, dhcpSettings, {{"ConfigurationName", false, true, kAnyExtra}}},
    {"KVRNX_DNSSettingData",
     false,
     dnsSettings,
     {{"RequestedHostname", false, false, "-_"},
      {"DomainName", false, false, "-_"},
      {"DNSServerAddresses", true, false, ":%"},
      {"ConfigurationName", false, true, kAnyExtra}}},
    {"KVRNX_DNSGeneralSettingData",
     false,
     dnsGeneralSettings,
     {{"DNSSuffixesToAppend", true, false, "-_"}, {"ConfigurationName", false, true, kAnyExtra}}},
    {kDNSEndpoint, false, dnsEndpoints, {}},
    {"KVRNX_DNSSAPSAPDependency", true, dnsDependencies, {}},
    {"KVRNX_ConcreteJob", false, jobs, {}},
};

const std::vector<ClassEntry>& classTable() { return kClassTable; }

const ClassEntry* findClass(const std::string& className) {
    for (const ClassEntry& entry : classTable())
        if (equalsIgnoreCase(entry.name, className)) return &entry;
    return nullptr;
}

}  // namespace IPInterfaceCompanion
}  // namespace Nx
