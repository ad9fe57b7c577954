// CMPI helpers shared by the adapters, and the class registry.
#pragma once

#include <cmpidt.h>

#include <string>
#include <vector>

#include "Nx/Moniker.h"

namespace Nx {

class ProviderUtilities {
public:
    // Class identifiers of the provider's classes and of the three related classes other
    // providers serve; 255 for any other name. Case-sensitive.
    static unsigned short getClassId(const char* className);
    static unsigned short getClassId(const CMPIObjectPath* path);

    // Whether className is parent or derives from it in nameSpace, asked of the broker.
    static bool areClassesRelated(const CMPIBroker* broker, const std::string& nameSpace, const char* className,
                                  const char* parent);

    static std::string getNamespace(const CMPIObjectPath* path);
    static std::string getClassName(const CMPIObjectPath* path);
    static unsigned int getKeyCount(const CMPIObjectPath* path);
    // False when the key is absent, null or of another type.
    static bool getKeyProperty(const CMPIObjectPath* path, const char* name, std::string& value);
    static bool getKeyProperty(const CMPIObjectPath* path, const char* name, CMPIObjectPath*& value);
    static bool setKeyProperty(CMPIObjectPath* path, const char* name, const std::string& value);
    static bool setKeyProperty(CMPIObjectPath* path, const char* name, const CMPIObjectPath* value);

    // A new class path in nameSpace; null on failure.
    static CMPIObjectPath* createObjectPath(const CMPIBroker* broker, const char* className,
                                            const std::string& nameSpace);
    // A new instance of the path; properties (may be null) is handed to the broker's property filter.
    static CMPIInstance* createInstance(const CMPIBroker* broker, const CMPIObjectPath* path,
                                        const char** properties = nullptr);

    // Instance properties. Getters are false when the property is absent, null or of another type.
    // isArrayOrKey is accepted for compatibility and ignored.
    static bool getProperty(const CMPIInstance* instance, const char* name, std::string& value,
                            bool isArrayOrKey = false);
    static bool getProperty(const CMPIInstance* instance, const char* name, unsigned short& value);
    static bool getProperty(const CMPIInstance* instance, const char* name, std::vector<std::string>& value);
    static bool setProperty(CMPIInstance* instance, const char* name, const std::string& value);
    static bool setProperty(CMPIInstance* instance, const char* name, unsigned char value);       // uint8
    static bool setProperty(CMPIInstance* instance, const char* name, unsigned short value);      // uint16
    static bool setProperty(CMPIInstance* instance, const char* name, unsigned int value);        // uint32
    static bool setProperty(CMPIInstance* instance, const char* name, unsigned long long value);  // uint64
    static bool setProperty(CMPIInstance* instance, const char* name, bool value);                // boolean
    // The array setters need the broker to make the array: they use the broker last passed to
    // any function here that takes one (createObjectPath, createInstance, areClassesRelated,
    // setBroker) and fail when none was seen.
    static bool setProperty(CMPIInstance* instance, const char* name, const std::vector<unsigned short>& value);
    static bool setProperty(CMPIInstance* instance, const char* name, const std::vector<std::string>& value);
    static bool setProperty(CMPIInstance* instance, const char* name, const CMPIObjectPath* reference);

    // Keys of a path, in the path's order (references in their text form), and back.
    static Moniker transformObjectPathToMoniker(const CMPIObjectPath* path);
    static bool transformMonikerToObjectPath(Moniker& moniker, CMPIObjectPath* path);

    // The path's text form as the broker renders it; empty on failure.
    static std::string toString(const CMPIBroker* broker, const CMPIObjectPath* path);

    // Guards text that ends up in configuration files that shell scripts source as root: non-zero
    // when value consists only of ASCII letters, digits, '.' and the characters of extra. Nothing
    // that could end a line, quote, expand or split a shell word is ever allowed, whatever extra
    // says: extra characters outside a safe set are ignored. Dotted IPv4 passes with an empty
    // extra, IPv6 with ":". An empty value passes.
    static int ValidateInput(const std::string& value, const std::string& extra);

    // Makes the broker known to the array setters without another call that takes one.
    static void setBroker(const CMPIBroker* broker);
};

}  // namespace Nx
