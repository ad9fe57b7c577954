#include "Nx/ProviderUtilities.h"

#include <cmpift.h>
#include <cmpimacs.h>
#include <strings.h>

#include <atomic>
#include <cstring>

namespace Nx {
namespace {

struct ClassEntry {
    const char* name;
    unsigned short id;
};

// The dispatch tables of the provider are keyed by these numbers; they are not contiguous.
const ClassEntry kClasses[] = {
    {"KVRNX_IPProtocolEndpoint", 0x09},
    {"KVRNX_IPAssignmentSettingData", 0x42},
    {"KVRNX_BindsToLanEndPoint", 0x43},
    {"KVRNX_IPElementSettingData", 0x44},
    {"KVRNX_StaticIPAssignmentSettingData", 0x45},
    {"KVRNX_IPRemoteServiceAccessPoint", 0x46},
    {"KVRNX_StaticOrderedComponent", 0x47},
    {"KVRNX_IPHostedAccessPoint", 0x48},
    {"KVRNX_StaticIPElementSettingData", 0x49},
    {"KVRNX_RemoteHostedAccessPoint", 0x50},
    {"KVRNX_IPRemoteAccessAvailableToElement", 0x51},
    {"KVRNX_SPHostedAccessPoint", 0x78},
    {"KVRNX_IPElementCapabilities", 0x79},
    {"KVRNX_IPEnabledLogicalElementCapabilities", 0x80},
    {"KVRNX_IPConfigurationService", 0x81},
    {"KVRNX_IPHostedService", 0x82},
    {"KVRNX_IPServiceAffectsElement", 0x83},
    {"KVRNX_ComputerSystem", 0x01},
    {"KVRNX_LANEndpoint", 0x10},
    {"KVRNX_SPComputerSystem", 0x77},
};
constexpr unsigned short kUnknownClass = 255;

// Arrays can only be made by the broker, and the property setters are not given one: use the
// broker of the latest call that had one. A provider process talks to a single broker.
std::atomic<const CMPIBroker*> knownBroker{nullptr};

void remember(const CMPIBroker* broker) {
    if (broker) knownBroker.store(broker, std::memory_order_relaxed);
}

bool ok(const CMPIStatus& status) { return status.rc == CMPI_RC_OK; }

std::string text(const CMPIString* string) {
    if (!string) return std::string();
    const char* chars = CMGetCharPtr(string);
    return chars ? chars : std::string();
}

bool usable(const CMPIData& data, const CMPIStatus& status) {
    return ok(status) && !(data.state & (CMPI_nullValue | CMPI_notFound | CMPI_badValue));
}

// The text of a string-typed value; false for any other type.
bool stringOf(const CMPIData& data, std::string& value) {
    if (data.type == CMPI_string && data.value.string) {
        value = text(data.value.string);
        return true;
    }
    if (data.type == CMPI_chars && data.value.chars) {
        value = data.value.chars;
        return true;
    }
    return false;
}

// A key value as text, for monikers: strings as they are, references in their text form,
// numbers in decimal, booleans as true/false.
std::string keyText(const CMPIData& data) {
    std::string value;
    if (stringOf(data, value)) return value;
    switch (data.type) {
        case CMPI_ref: {
            if (!data.value.ref) return std::string();
            CMPIStatus status = {CMPI_RC_OK, nullptr};
            return text(CMObjectPathToString(data.value.ref, &status));
        }
        case CMPI_boolean:
            return data.value.boolean ? "true" : "false";
        case CMPI_uint8:
            return std::to_string(data.value.uint8);
        case CMPI_uint16:
            return std::to_string(data.value.uint16);
        case CMPI_uint32:
            return std::to_string(data.value.uint32);
        case CMPI_uint64:
            return std::to_string(data.value.uint64);
        case CMPI_sint8:
            return std::to_string(data.value.sint8);
        case CMPI_sint16:
            return std::to_string(data.value.sint16);
        case CMPI_sint32:
            return std::to_string(data.value.sint32);
        case CMPI_sint64:
            return std::to_string(data.value.sint64);
        default:
            return std::string();
    }
}

template <typename T>
bool setScalar(CMPIInstance* instance, const char* name, T value, CMPIType type) {
    if (!instance || !name) return false;
    return ok(CMSetProperty(instance, name, &value, type));
}

}  // namespace

unsigned short ProviderUtilities::getClassId(const char* className) {
    if (!className) return kUnknownClass;
    for (const ClassEntry& entry : kClasses)
        if (std::strcmp(entry.name, className) == 0) return entry.id;
    return kUnknownClass;
}

unsigned short ProviderUtilities::getClassId(const CMPIObjectPath* path) {
    std::string name = getClassName(path);
    return name.empty() ? kUnknownClass : getClassId(name.c_str());
}

bool ProviderUtilities::areClassesRelated(const CMPIBroker* broker, const std::string& nameSpace,
                                          const char* className, const char* parent) {
    if (!className || !parent) return false;
    if (::strcasecmp(className, parent) == 0) return true;
    if (!broker) return false;
    remember(broker);
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIObjectPath* classPath = CMNewObjectPath(broker, nameSpace.c_str(), className, &status);
    if (!ok(status) || !classPath) return false;
    status = {CMPI_RC_OK, nullptr};
    CMPIBoolean related = CMClassPathIsA(broker, classPath, parent, &status);
    return ok(status) && related;
}

std::string ProviderUtilities::getNamespace(const CMPIObjectPath* path) {
    if (!path) return std::string();
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIString* value = CMGetNameSpace(path, &status);
    return ok(status) ? text(value) : std::string();
}

std::string ProviderUtilities::getClassName(const CMPIObjectPath* path) {
    if (!path) return std::string();
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIString* value = CMGetClassName(path, &status);
    return ok(status) ? text(value) : std::string();
}

unsigned int ProviderUtilities::getKeyCount(const CMPIObjectPath* path) {
    if (!path) return 0;
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPICount count = CMGetKeyCount(path, &status);
    return ok(status) ? count : 0;
}

bool ProviderUtilities::getKeyProperty(const CMPIObjectPath* path, const char* name, std::string& value) {
    if (!path || !name) return false;
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIData data = CMGetKey(path, name, &status);
    return usable(data, status) && stringOf(data, value);
}

bool ProviderUtilities::getKeyProperty(const CMPIObjectPath* path, const char* name, CMPIObjectPath*& value) {
    if (!path || !name) return false;
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIData data = CMGetKey(path, name, &status);
    if (!usable(data, status) || data.type != CMPI_ref || !data.value.ref) return false;
    value = data.value.ref;
    return true;
}

bool ProviderUtilities::setKeyProperty(CMPIObjectPath* path, const char* name, const std::string& value) {
    if (!path || !name) return false;
    return ok(CMAddKey(path, name, value.c_str(), CMPI_chars));
}

bool ProviderUtilities::setKeyProperty(CMPIObjectPath* path, const char* name, const CMPIObjectPath* value) {
    if (!path || !name || !value) return false;
    CMPIValue reference;
    reference.ref = const_cast<CMPIObjectPath*>(value);
    return ok(CMAddKey(path, name, &reference, CMPI_ref));
}

CMPIObjectPath* ProviderUtilities::createObjectPath(const CMPIBroker* broker, const char* className,
                                                    const std::string& nameSpace) {
    if (!broker || !className) return nullptr;
    remember(broker);
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIObjectPath* path = CMNewObjectPath(broker, nameSpace.c_str(), className, &status);
    return ok(status) ? path : nullptr;
}

CMPIInstance* ProviderUtilities::createInstance(const CMPIBroker* broker, const CMPIObjectPath* path,
                                                const char** properties) {
    if (!broker || !path) return nullptr;
    remember(broker);
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIInstance* instance = CMNewInstance(broker, path, &status);
    if (!ok(status) || !instance) return nullptr;
    if (properties) {
        // The keys always survive the filter.
        std::vector<std::string> keys;
        const unsigned int count = getKeyCount(path);
        for (unsigned int i = 0; i < count; ++i) {
            CMPIString* name = nullptr;
            CMPIStatus keyStatus = {CMPI_RC_OK, nullptr};
            CMGetKeyAt(path, i, &name, &keyStatus);
            if (ok(keyStatus) && name) keys.push_back(text(name));
        }
        std::vector<const char*> keyList;
        for (const std::string& key : keys) keyList.push_back(key.c_str());
        keyList.push_back(nullptr);
        CMSetPropertyFilter(instance, properties, keyList.data());
    }
    return instance;
}

bool ProviderUtilities::getProperty(const CMPIInstance* instance, const char* name, std::string& value,
                                    bool /*isArrayOrKey*/) {
    if (!instance || !name) return false;
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIData data = CMGetProperty(instance, name, &status);
    return usable(data, status) && stringOf(data, value);
}

bool ProviderUtilities::getProperty(const CMPIInstance* instance, const char* name, unsigned short& value) {
    if (!instance || !name) return false;
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIData data = CMGetProperty(instance, name, &status);
    if (!usable(data, status) || data.type != CMPI_uint16) return false;
    value = data.value.uint16;
    return true;
}

bool ProviderUtilities::getProperty(const CMPIInstance* instance, const char* name, std::vector<std::string>& value) {
    if (!instance || !name) return false;
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIData data = CMGetProperty(instance, name, &status);
    if (!usable(data, status) || (data.type != CMPI_stringA && data.type != CMPI_charsA) || !data.value.array)
        return false;
    CMPIStatus sizeStatus = {CMPI_RC_OK, nullptr};
    CMPICount size = CMGetArrayCount(data.value.array, &sizeStatus);
    if (!ok(sizeStatus)) return false;
    std::vector<std::string> items;
    for (CMPICount i = 0; i < size; ++i) {
        CMPIStatus elementStatus = {CMPI_RC_OK, nullptr};
        CMPIData element = CMGetArrayElementAt(data.value.array, i, &elementStatus);
        std::string item;
        // A null element reads as an empty text, so positions stay where they were.
        if (usable(element, elementStatus) && !stringOf(element, item)) return false;
        items.push_back(std::move(item));
    }
    value = std::move(items);
    return true;
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, const std::string& value) {
    if (!instance || !name) return false;
    return ok(CMSetProperty(instance, name, value.c_str(), CMPI_chars));
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, unsigned char value) {
    return setScalar<CMPIUint8>(instance, name, value, CMPI_uint8);
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, unsigned short value) {
    return setScalar<CMPIUint16>(instance, name, value, CMPI_uint16);
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, unsigned int value) {
    return setScalar<CMPIUint32>(instance, name, value, CMPI_uint32);
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, unsigned long long value) {
    return setScalar<CMPIUint64>(instance, name, value, CMPI_uint64);
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, bool value) {
    return setScalar<CMPIBoolean>(instance, name, value ? 1 : 0, CMPI_boolean);
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, const std::vector<unsigned short>& value) {
    const CMPIBroker* broker = knownBroker.load(std::memory_order_relaxed);
    if (!instance || !name || !broker) return false;
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIArray* array = CMNewArray(broker, static_cast<CMPICount>(value.size()), CMPI_uint16, &status);
    if (!ok(status) || !array) return false;
    for (size_t i = 0; i < value.size(); ++i) {
        CMPIUint16 element = value[i];
        if (!ok(CMSetArrayElementAt(array, static_cast<CMPICount>(i), &element, CMPI_uint16))) return false;
    }
    CMPIValue property;
    property.array = array;
    return ok(CMSetProperty(instance, name, &property, CMPI_uint16A));
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, const std::vector<std::string>& value) {
    const CMPIBroker* broker = knownBroker.load(std::memory_order_relaxed);
    if (!instance || !name || !broker) return false;
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIArray* array = CMNewArray(broker, static_cast<CMPICount>(value.size()), CMPI_string, &status);
    if (!ok(status) || !array) return false;
    for (size_t i = 0; i < value.size(); ++i)
        if (!ok(CMSetArrayElementAt(array, static_cast<CMPICount>(i), value[i].c_str(), CMPI_chars))) return false;
    CMPIValue property;
    property.array = array;
    return ok(CMSetProperty(instance, name, &property, CMPI_stringA));
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, const CMPIObjectPath* reference) {
    if (!instance || !name || !reference) return false;
    CMPIValue property;
    property.ref = const_cast<CMPIObjectPath*>(reference);
    return ok(CMSetProperty(instance, name, &property, CMPI_ref));
}

Moniker ProviderUtilities::transformObjectPathToMoniker(const CMPIObjectPath* path) {
    Moniker moniker;
    const unsigned int count = getKeyCount(path);
    for (unsigned int i = 0; i < count; ++i) {
        CMPIString* name = nullptr;
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        CMPIData data = CMGetKeyAt(path, i, &name, &status);
        if (!ok(status) || !name) continue;
        moniker.addKey(text(name), (data.state & CMPI_nullValue) ? std::string() : keyText(data));
    }
    return moniker;
}

bool ProviderUtilities::transformMonikerToObjectPath(Moniker& moniker, CMPIObjectPath* path) {
    if (!path) return false;
    bool all = true;
    for (unsigned int i = 0; i < moniker.getKeyCount(); ++i) {
        moniker.selectKey(i);
        if (!setKeyProperty(path, moniker.getName().c_str(), moniker.getValue())) all = false;
    }
    return all;
}

std::string ProviderUtilities::toString(const CMPIBroker* broker, const CMPIObjectPath* path) {
    if (!path) return std::string();
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIString* rendered = CMObjectPathToString(path, &status);
    if (ok(status) && rendered) return text(rendered);
    if (!broker) return std::string();
    status = {CMPI_RC_OK, nullptr};
    rendered = CDToString(broker, path, &status);
    return ok(status) ? text(rendered) : std::string();
}

// The rule: ASCII letters, digits and '.' always pass; a character of extra passes only when it
// is one of ": - _ / % , @ +" (IPv6 colons, interface and host names, prefix notation, zone ids).
// Blanks, quotes, backslash, '$', '`', ';', '&', '|', '<', '>', '(', ')', '*', '?', '[', ']', '{',
// '}', '~', '!', '#', '=', line breaks, control and non-ASCII bytes never pass, even when extra
// names them: they could end a KEY=value line, quote, expand or split a shell word in a file that
// network scripts source as root.
int ProviderUtilities::ValidateInput(const std::string& value, const std::string& extra) {
    static const std::string safeExtras = ":-_/%,@+";
    for (unsigned char c : value) {
        if ((c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '.') continue;
        if (c != '\0' && safeExtras.find(static_cast<char>(c)) != std::string::npos &&
            extra.find(static_cast<char>(c)) != std::string::npos)
            continue;
        return 0;
    }
    return 1;
}

void ProviderUtilities::setBroker(const CMPIBroker* broker) { remember(broker); }

}  // namespace Nx
