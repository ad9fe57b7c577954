// LAN endpoints, fetched through the broker from the provider that serves them.
//
// One-shot: after setObjectPath or setSingleObjectPath, operator bool is true exactly once, however
// many endpoints the enumeration holds.
#pragma once

#include <string>

#include "CMPI/CMPIAdapter.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIIPLanEndPoint : public CMPILookupAdapter {
public:
    CMPIIPLanEndPoint(const CMPIBroker* broker, const CMPIContext* context, std::string nameSpace);

    // Fetches the one endpoint the path names. Throws Nx::ProviderException when the broker cannot.
    void setSingleObjectPath(const CMPIObjectPath* path);
    // Enumerates the path's class and keeps the first. Throws Nx::ProviderException likewise.
    void setObjectPath(const CMPIObjectPath* path);

    explicit operator bool();
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
