// The host's computer system and the service processor, fetched through the broker from the
// provider that serves them.
//
// Iteration: after setObjectPath the first fetched system is reported once by the initial-load
// rule, then every further one while the enumeration yields instances. With
// findServiceProcessor the system whose Name equals the path's Name key is kept; when none does,
// the last one enumerated is.
#pragma once

#include <string>

#include "CMPI/CMPIAdapter.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIIPComputerSystem : public CMPILookupAdapter {
public:
    CMPIIPComputerSystem(const CMPIBroker* broker, const CMPIContext* context, std::string nameSpace);

    // Enumerates the path's class. Throws Nx::ProviderException when the broker cannot.
    void setObjectPath(const CMPIObjectPath* path, bool findServiceProcessor);
    // Drains enumeration, keeping the system named as path's Name key (see above).
    void findSP(CMPIEnumeration* enumeration, const CMPIObjectPath* path);

    explicit operator bool();

private:
    bool findServiceProcessor;
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
