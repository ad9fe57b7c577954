// KVRNX_IPRemoteServiceAccessPoint: the default gateways of the interfaces.
#pragma once

#include <string>

#include "CMPI/CMPIAdapter.h"
#include "Lindows/RemoteServiceAccessPoint.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIRemoteServiceAccessPoint : public CMPIAdapter<RemoteServiceAccessPoint> {
public:
    CMPIRemoteServiceAccessPoint(const CMPIBroker* broker, const CMPIContext* context, const std::string& nameSpace);
    CMPIRemoteServiceAccessPoint(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

    void setObjectPath(const CMPIObjectPath* path);
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);
    // Only AccessInfo (the gateway address) can change.
    CMPIStatus modifyInstance(const CMPIInstance* newInstance);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
