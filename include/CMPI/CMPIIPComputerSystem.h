// The host's computer system and the service processor, fetched through the broker from the
// provider that serves them.
//
// Iteration: after setObjectPath the first fetched system is reported once by the initial-load
// rule, then every further one while the enumeration yields instances. With
// findServiceProcessor the system whose Name equals the path's Name key is kept; when none does,
// the last one enumerated is.
#pragma once

#include <cmpidt.h>

#include <string>

namespace Nx {
namespace IPInterfaceProvider {

class CMPIIPComputerSystem {
public:
    CMPIIPComputerSystem(const CMPIBroker* broker, const CMPIContext* context, std::string nameSpace);
    CMPIIPComputerSystem(const CMPIIPComputerSystem&) = delete;
    CMPIIPComputerSystem& operator=(const CMPIIPComputerSystem&) = delete;

    // Enumerates the path's class. Throws Nx::ProviderException when the broker cannot.
    void setObjectPath(const CMPIObjectPath* path, bool findServiceProcessor);
    // Drains enumeration, keeping the system named as path's Name key (see above).
    void findSP(CMPIEnumeration* enumeration, const CMPIObjectPath* path);

    explicit operator bool();
    void operator++();
    CMPIObjectPath* getObjectPath();
    // The current system as fetched; properties is not applied.
    CMPIInstance* getCMPIInstance(const char** properties);

private:
    const CMPIBroker* broker;
    const CMPIContext* context;
    std::string nameSpace;
    CMPIInstance* instance;
    CMPIEnumeration* enumeration;
    bool initialLoad;
    bool findServiceProcessor;
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
