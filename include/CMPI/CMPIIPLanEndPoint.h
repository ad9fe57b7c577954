// LAN endpoints, fetched through the broker from the provider that serves them.
//
// One-shot: after setObjectPath or setSingleObjectPath, operator bool is true exactly once, however
// many endpoints the enumeration holds.
#pragma once

#include <cmpidt.h>

#include <string>

namespace Nx {
namespace IPInterfaceProvider {

class CMPIIPLanEndPoint {
public:
    CMPIIPLanEndPoint(const CMPIBroker* broker, const CMPIContext* context, std::string nameSpace);
    CMPIIPLanEndPoint(const CMPIIPLanEndPoint&) = delete;
    CMPIIPLanEndPoint& operator=(const CMPIIPLanEndPoint&) = delete;

    // Fetches the one endpoint the path names. Throws Nx::ProviderException when the broker cannot.
    void setSingleObjectPath(const CMPIObjectPath* path);
    // Enumerates the path's class and keeps the first. Throws Nx::ProviderException likewise.
    void setObjectPath(const CMPIObjectPath* path);

    explicit operator bool();
    void operator++();
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);

private:
    const CMPIBroker* broker;
    const CMPIContext* context;
    std::string nameSpace;
    CMPIInstance* instance;
    CMPIEnumeration* enumeration;
    bool initialLoad;
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
