// The companion provider's CMPI face: one implementation of the instance and association operations
// over the class table, so that each class only says how its objects come from the host.
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <atomic>
#include <exception>
#include <string>
#include <vector>

#include "CompanionModel.h"
#include "Nx/Exceptions.h"
#include "Nx/File.h"
#include "Nx/ProviderUtilities.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceCompanion {
namespace {

const std::string loggerCompanion = "Tarvo.IPInterfaceCompanion";

// Set by the factories before any request; every factory of a load receives the same broker.
std::atomic<const CMPIBroker*> brokerHandle{nullptr};
const CMPIBroker* broker() { return brokerHandle.load(std::memory_order_acquire); }

void logFailure(const char* function, const std::string& text) {
    logRecord(loggerCompanion, function, NX_FILE, __LINE__, 6000, text.c_str());
}

CMPIStatus status(CMPIrc rc, const std::string& message = std::string()) {
    CMPIStatus st = {rc, nullptr};
    if (!message.empty()) st.msg = CMNewString(broker(), message.c_str(), nullptr);
    return st;
}

std::string chars(const CMPIString* s) {
    const char* c = s ? CMGetCharPtr(s) : nullptr;
    return c ? c : std::string();
}

std::string nameSpaceOf(const CMPIObjectPath* op) { return chars(CMGetNameSpace(op, nullptr)); }
std::string classNameOf(const CMPIObjectPath* op) { return chars(CMGetClassName(op, nullptr)); }

// ---- Objects to CMPI ------------------------------------------------------------------------

CMPIObjectPath* makePath(const std::string& ns, const std::string& className, const std::vector<Property>& keys);

CMPIObjectPath* makePath(const std::string& ns, const Reference& reference) {
    std::vector<Property> keys;
    for (const auto& key : reference.keys) keys.push_back(Property{key.first, Value(key.second)});
    return makePath(ns, reference.className, keys);
}

CMPIObjectPath* makePath(const std::string& ns, const std::string& className, const std::vector<Property>& keys) {
    CMPIStatus st = {CMPI_RC_OK, nullptr};
    CMPIObjectPath* path = CMNewObjectPath(broker(), ns.c_str(), className.c_str(), &st);
    if (!path || st.rc != CMPI_RC_OK) throw ProviderException("Could not create an object path of " + className);
    for (const Property& key : keys) {
        if (const auto* text = std::get_if<std::string>(&key.value)) {
            st = CMAddKey(path, key.name.c_str(), text->c_str(), CMPI_chars);
        } else if (const auto* reference = std::get_if<Reference>(&key.value)) {
            CMPIObjectPath* target = makePath(ns, *reference);
            st = CMAddKey(path, key.name.c_str(), &target, CMPI_ref);
        }
        if (st.rc != CMPI_RC_OK) throw ProviderException("Could not set the key " + key.name + " of " + className);
    }
    return path;
}

CMPIArray* newArray(size_t size, CMPIType type) {
    CMPIStatus st = {CMPI_RC_OK, nullptr};
    CMPIArray* array = CMNewArray(broker(), static_cast<CMPICount>(size), type, &st);
    if (!array || st.rc != CMPI_RC_OK) throw ProviderException("Could not create an array");
    return array;
}

// Properties outside the request's property list are dropped by the instance's filter.
void setProperty(CMPIInstance* instance, const std::string& ns, const Property& property) {
    const char* name = property.name.c_str();
    if (const auto* text = std::get_if<std::string>(&property.value)) {
        CMSetProperty(instance, name, text->c_str(), CMPI_chars);
    } else if (const auto* number = std::get_if<unsigned short>(&property.value)) {
        CMPIUint16 value = *number;
        CMSetProperty(instance, name, &value, CMPI_uint16);
    } else if (const auto* texts = std::get_if<std::vector<std::string>>(&property.value)) {
        CMPIArray* array = newArray(texts->size(), CMPI_string);
        for (size_t i = 0; i < texts->size(); ++i)
            CMSetArrayElementAt(array, static_cast<CMPICount>(i), (*texts)[i].c_str(), CMPI_chars);
        CMSetProperty(instance, name, &array, CMPI_stringA);
    } else if (const auto* numbers = std::get_if<std::vector<unsigned short>>(&property.value)) {
        CMPIArray* array = newArray(numbers->size(), CMPI_uint16);
        for (size_t i = 0; i < numbers->size(); ++i) {
            CMPIUint16 value = (*numbers)[i];
            CMSetArrayElementAt(array, static_cast<CMPICount>(i), &value, CMPI_uint16);
        }
        CMSetProperty(instance, name, &array, CMPI_uint16A);
    } else if (const auto* reference = std::get_if<Reference>(&property.value)) {
        CMPIObjectPath* target = makePath(ns, *reference);
        CMSetProperty(instance, name, &target, CMPI_ref);
    }
}

CMPIInstance* makeInstance(const std::string& ns, const Object& object, const char** properties) {
    CMPIStatus st = {CMPI_RC_OK, nullptr};
    CMPIInstance* instance = CMNewInstance(broker(), makePath(ns, object.className, object.keys), &st);
    if (!instance || st.rc != CMPI_RC_OK)
        throw ProviderException("Could not create an instance of " + object.className);
    if (properties) CMSetPropertyFilter(instance, properties, nullptr);
    for (const Property& key : object.keys) setProperty(instance, ns, key);
    for (const Property& property : object.properties) setProperty(instance, ns, property);
    return instance;
}

// ---- Matching request paths -----------------------------------------------------------------

bool isCreationClassKey(const std::string& name) {
    const std::string suffix = "CreationClassName";
    return name.size() >= suffix.size() && equalsIgnoreCase(name.substr(name.size() - suffix.size()), suffix);
}

bool pathMatches(const CMPIObjectPath* path, const std::vector<Property>& keys, bool allKeys);

bool keyMatches(const CMPIData& data, const Property& key) {
    if (data.state & CMPI_nullValue) return false;
    if (const auto* text = std::get_if<std::string>(&key.value)) {
        std::string given;
        if (data.type == CMPI_string)
            given = chars(data.value.string);
        else if (data.type == CMPI_chars && data.value.chars)
            given = data.value.chars;
        else
            return false;
        // Class names are not case-sensitive; every other key value is.
        return isCreationClassKey(key.name) ? equalsIgnoreCase(given, *text) : given == *text;
    }
    if (const auto* reference = std::get_if<Reference>(&key.value)) {
        if (data.type != CMPI_ref || !data.value.ref) return false;
        if (!equalsIgnoreCase(classNameOf(data.value.ref), reference->className)) return false;
        std::vector<Property> keys;
        for (const auto& k : reference->keys) keys.push_back(Property{k.first, Value(k.second)});
        return pathMatches(data.value.ref, keys, true);
    }
    return false;
}

// Every key of the path must be one of keys with the same value; with allKeys the path must also
// carry all of them. A path with fewer keys names every object that agrees on the ones it has.
bool pathMatches(const CMPIObjectPath* path, const std::vector<Property>& keys, bool allKeys) {
    CMPICount count = CMGetKeyCount(path, nullptr);
    if (allKeys && count != keys.size()) return false;
    for (CMPICount i = 0; i < count; ++i) {
        CMPIString* name = nullptr;
        CMPIStatus st = {CMPI_RC_OK, nullptr};
        CMPIData data = CMGetKeyAt(path, i, &name, &st);
        if (st.rc != CMPI_RC_OK) return false;
        const Property* key = nullptr;
        for (const Property& candidate : keys)
            if (equalsIgnoreCase(candidate.name, chars(name))) key = &candidate;
        if (!key || !keyMatches(data, *key)) return false;
    }
    return true;
}

// Whether className is filter or derives from it; no filter admits every class.
bool isA(const std::string& ns, const std::string& className, const char* filter) {
    if (!filter || !*filter || equalsIgnoreCase(className, filter)) return true;
    CMPIStatus st = {CMPI_RC_OK, nullptr};
    CMPIObjectPath* path = CMNewObjectPath(broker(), ns.c_str(), className.c_str(), &st);
    return path && st.rc == CMPI_RC_OK && CMClassPathIsA(broker(), path, filter, &st);
}

// The objects of a class as the host shows them now. Setting values the host has taken on are
// dropped from the settings file on the way.
std::vector<Object> objectsOf(const ClassEntry& entry) {
    HostPicture host = readHost();
    Settings settings = Settings::load();
    std::vector<Object> objects = entry.produce(host, settings);
    if (!settings.forgetStale()) logFailure(__func__, "Could not update " + Settings::path());
    return objects;
}

const Object* findObject(const std::vector<Object>& objects, const CMPIObjectPath* path) {
    for (const Object& object : objects)
        if (pathMatches(path, object.keys, true)) return &object;
    return nullptr;
}

template <class Body>
CMPIStatus guarded(const char* function, Body&& body) {
    try {
        return body();
    } catch (const std::exception& e) {
        logFailure(function, e.what());
        return status(CMPI_RC_ERR_FAILED, e.what());
    }
}

// Runs body with the class table entry of the request's class.
template <class Body>
CMPIStatus withClass(const char* function, const CMPIObjectPath* op, Body&& body) {
    return guarded(function, [&]() {
        const std::string className = classNameOf(op);
        const ClassEntry* entry = findClass(className);
        if (!entry) return status(CMPI_RC_ERR_INVALID_CLASS, "Class " + className + " is not served here");
        return body(*entry, nameSpaceOf(op));
    });
}

// ---- Instances ------------------------------------------------------------------------------

CMPIStatus Cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) { return status(CMPI_RC_OK); }

CMPIStatus EnumInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* rslt, const CMPIObjectPath* op) {
    return withClass(__func__, op, [&](const ClassEntry& entry, const std::string& ns) {
        for (const Object& object : objectsOf(entry))
            CMReturnObjectPath(rslt, makePath(ns, object.className, object.keys));
        CMReturnDone(rslt);
        return status(CMPI_RC_OK);
    });
}

CMPIStatus EnumInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* rslt, const CMPIObjectPath* op,
                         const char** properties) {
    return withClass(__func__, op, [&](const ClassEntry& entry, const std::string& ns) {
        for (const Object& object : objectsOf(entry)) CMReturnInstance(rslt, makeInstance(ns, object, properties));
        CMReturnDone(rslt);
        return status(CMPI_RC_OK);
    });
}

CMPIStatus GetInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* rslt, const CMPIObjectPath* op,
                       const char** properties) {
    return withClass(__func__, op, [&](const ClassEntry& entry, const std::string& ns) {
        const std::vector<Object> objects = objectsOf(entry);
        const Object* object = findObject(objects, op);
        if (!object) return status(CMPI_RC_ERR_NOT_FOUND, "No such " + std::string(entry.name));
        CMReturnInstance(rslt, makeInstance(ns, *object, properties));
        CMReturnDone(rslt);
        return status(CMPI_RC_OK);
    });
}

CMPIStatus CreateInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                          const CMPIInstance*) {
    return status(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus DeleteInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*) {
    return status(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus ExecQuery(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*,
                     const char*) {
    return status(CMPI_RC_ERR_NOT_SUPPORTED);
}

bool listed(const char** properties, const char* name) {
    for (const char** p = properties; p && *p; ++p)
        if (equalsIgnoreCase(*p, name)) return true;
    return false;
}

// One property of a modify request: the values to keep, or none to go back to the host's value.
struct Change {
    std::string property;
    bool clear;
    std::vector<std::string> values;
};

// Reads and checks the modifiable property; false (with the refusal in st) when it is not acceptable.
bool readChange(const CMPIInstance* instance, const char** properties, const Modifiable& modifiable,
                std::vector<Change>& changes, CMPIStatus& st) {
    if (properties && !listed(properties, modifiable.name)) return true;
    CMPIStatus rc = {CMPI_RC_OK, nullptr};
    CMPIData data = CMGetProperty(instance, modifiable.name, &rc);
    const bool absent = rc.rc != CMPI_RC_OK;
    if (absent && !properties) return true;  // not given: left as it is
    if (absent || (data.state & CMPI_nullValue)) {
        changes.push_back(Change{modifiable.name, true, {}});
        return true;
    }
    Change change{modifiable.name, false, {}};
    if (modifiable.list) {
        if (data.type != CMPI_stringA || !data.value.array) {
            st = status(CMPI_RC_ERR_TYPE_MISMATCH, std::string(modifiable.name) + " must be a string array");
            return false;
        }
        CMPICount count = CMGetArrayCount(data.value.array, nullptr);
        for (CMPICount i = 0; i < count; ++i) {
            CMPIData element = CMGetArrayElementAt(data.value.array, i, nullptr);
            if ((element.state & CMPI_nullValue) || element.type != CMPI_string) {
                st = status(CMPI_RC_ERR_INVALID_PARAMETER, std::string(modifiable.name) + " holds a null element");
                return false;
            }
            change.values.push_back(chars(element.value.string));
        }
    } else if (data.type == CMPI_string) {
        change.values.push_back(chars(data.value.string));
    } else if (data.type == CMPI_chars && data.value.chars) {
        change.values.push_back(data.value.chars);
    } else {
        st = status(CMPI_RC_ERR_TYPE_MISMATCH, std::string(modifiable.name) + " must be a string");
        return false;
    }
    bool valid = modifiable.allowEmpty || !change.values.empty();
    for (const std::string& value : change.values)
        valid = valid && (modifiable.allowEmpty || !value.empty()) &&
                ProviderUtilities::ValidateInput(value, modifiable.extras) != 0;
    if (!valid) {
        st = status(CMPI_RC_ERR_INVALID_PARAMETER, std::string("Invalid value for ") + modifiable.name);
        return false;
    }
    changes.push_back(std::move(change));
    return true;
}

// The new values are kept in the settings file until the host reports them: the configuration
// service reads them from here when a client applies the setting.
CMPIStatus ModifyInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath* op,
                          const CMPIInstance* instance, const char** properties) {
    return withClass(__func__, op, [&](const ClassEntry& entry, const std::string&) {
        if (entry.modifiable.empty() || !instance) return status(CMPI_RC_ERR_NOT_SUPPORTED);
        const std::vector<Object> objects = objectsOf(entry);
        const Object* object = findObject(objects, op);
        if (!object) return status(CMPI_RC_ERR_NOT_FOUND, "No such " + std::string(entry.name));
        const std::string* id = std::get_if<std::string>(&object->keys.front().value);
        if (!id) return status(CMPI_RC_ERR_NOT_SUPPORTED);

        std::vector<Change> changes;
        CMPIStatus refused = status(CMPI_RC_OK);
        for (const Modifiable& modifiable : entry.modifiable)
            if (!readChange(instance, properties, modifiable, changes, refused)) return refused;
        if (changes.empty()) return status(CMPI_RC_OK);

        bool stored = File::update(Settings::path(), [&](std::string& content, bool) {
            Settings::Entries entries = Settings::parse(content);
            for (const Change& change : changes) {
                if (change.clear)
                    entries[*id].erase(change.property);
                else
                    entries[*id][change.property] = change.values;
            }
            if (entries[*id].empty()) entries.erase(*id);
            content = Settings::format(entries);
            return true;
        });
        if (!stored) return status(CMPI_RC_ERR_FAILED, "Could not store the setting in " + Settings::path());
        return status(CMPI_RC_OK);
    });
}

// ---- Associations ---------------------------------------------------------------------------

// Calls use(association object, source reference key, far reference key) for every association
// object that links the source path to something, honouring the class and role filters.
template <class Use>
void eachLink(const CMPIObjectPath* op, const char* assocClass, const char* role, const char* resultRole, Use&& use) {
    const std::string ns = nameSpaceOf(op);
    const std::string sourceClass = classNameOf(op);
    for (const ClassEntry& entry : classTable()) {
        if (!entry.association || !isA(ns, entry.name, assocClass)) continue;
        for (const Object& association : objectsOf(entry)) {
            for (const Property& source : association.keys) {
                const auto* reference = std::get_if<Reference>(&source.value);
                if (!reference || (role && *role && !equalsIgnoreCase(source.name, role))) continue;
                if (!isA(ns, reference->className, sourceClass.c_str())) continue;
                std::vector<Property> keys;
                for (const auto& k : reference->keys) keys.push_back(Property{k.first, Value(k.second)});
                if (!pathMatches(op, keys, false)) continue;
                for (const Property& far : association.keys) {
                    if (&far == &source || !std::get_if<Reference>(&far.value)) continue;
                    if (resultRole && *resultRole && !equalsIgnoreCase(far.name, resultRole)) continue;
                    use(association, std::get<Reference>(far.value));
                }
            }
        }
    }
}

CMPIStatus AssociationCleanup(CMPIAssociationMI*, const CMPIContext*, CMPIBoolean) { return status(CMPI_RC_OK); }

CMPIStatus Associators(CMPIAssociationMI*, const CMPIContext* ctx, const CMPIResult* rslt, const CMPIObjectPath* op,
                       const char* assocClass, const char* resultClass, const char* role, const char* resultRole,
                       const char** properties) {
    return guarded(__func__, [&]() {
        const std::string ns = nameSpaceOf(op);
        eachLink(op, assocClass, role, resultRole, [&](const Object&, const Reference& far) {
            if (!isA(ns, far.className, resultClass)) return;
            // The far end may be another provider's: ask the object manager for it.
            CMPIStatus st = {CMPI_RC_OK, nullptr};
            CMPIInstance* instance = CBGetInstance(broker(), ctx, makePath(ns, far), properties, &st);
            if (instance && st.rc == CMPI_RC_OK)
                CMReturnInstance(rslt, instance);
            else
                logFailure(__func__, "Could not get the associated " + far.className);
        });
        CMReturnDone(rslt);
        return status(CMPI_RC_OK);
    });
}

CMPIStatus AssociatorNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* rslt, const CMPIObjectPath* op,
                           const char* assocClass, const char* resultClass, const char* role, const char* resultRole) {
    return guarded(__func__, [&]() {
        const std::string ns = nameSpaceOf(op);
        eachLink(op, assocClass, role, resultRole, [&](const Object&, const Reference& far) {
            if (isA(ns, far.className, resultClass)) CMReturnObjectPath(rslt, makePath(ns, far));
        });
        CMReturnDone(rslt);
        return status(CMPI_RC_OK);
    });
}

CMPIStatus References(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* rslt, const CMPIObjectPath* op,
                      const char* resultClass, const char* role, const char** properties) {
    return guarded(__func__, [&]() {
        const std::string ns = nameSpaceOf(op);
        eachLink(op, resultClass, role, nullptr, [&](const Object& association, const Reference&) {
            CMReturnInstance(rslt, makeInstance(ns, association, properties));
        });
        CMReturnDone(rslt);
        return status(CMPI_RC_OK);
    });
}

CMPIStatus ReferenceNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* rslt, const CMPIObjectPath* op,
                          const char* resultClass, const char* role) {
    return guarded(__func__, [&]() {
        const std::string ns = nameSpaceOf(op);
        eachLink(op, resultClass, role, nullptr, [&](const Object& association, const Reference&) {
            CMReturnObjectPath(rslt, makePath(ns, association.className, association.keys));
        });
        CMReturnDone(rslt);
        return status(CMPI_RC_OK);
    });
}

CMPIInstanceMIFT instanceFT = {
    CMPICurrentVersion,
    CMPICurrentVersion,
    "instanceIPInterfaceCompanion",
    Cleanup,
    EnumInstanceNames,
    EnumInstances,
    GetInstance,
    CreateInstance,
    ModifyInstance,
    DeleteInstance,
    ExecQuery,
};

CMPIAssociationMIFT associationFT = {
    CMPICurrentVersion, CMPICurrentVersion, "associationIPInterfaceCompanion",
    AssociationCleanup, Associators,        AssociatorNames,
    References,         ReferenceNames,
};

}  // namespace
}  // namespace IPInterfaceCompanion
}  // namespace Nx

using namespace Nx::IPInterfaceCompanion;

CMPI_EXTERN_C CMPIInstanceMI* IPInterfaceCompanion_Create_InstanceMI(const CMPIBroker* brkr, const CMPIContext*,
                                                                     CMPIStatus* rc) {
    static CMPIInstanceMI mi = {nullptr, &instanceFT};
    brokerHandle.store(brkr, std::memory_order_release);
    if (rc) *rc = CMPIStatus{CMPI_RC_OK, nullptr};
    return &mi;
}

CMPI_EXTERN_C CMPIAssociationMI* IPInterfaceCompanion_Create_AssociationMI(const CMPIBroker* brkr, const CMPIContext*,
                                                                           CMPIStatus* rc) {
    static CMPIAssociationMI mi = {nullptr, &associationFT};
    brokerHandle.store(brkr, std::memory_order_release);
    if (rc) *rc = CMPIStatus{CMPI_RC_OK, nullptr};
    return &mi;
}
