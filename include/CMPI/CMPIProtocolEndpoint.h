// KVRNX_IPProtocolEndpoint: the host's IP interfaces as CMPI paths and instances, their
// modification and the RequestStateChange method.
#pragma once

#include <string>

#include "CMPI/CMPIAdapter.h"
#include "Lindows/IPprotocolEndpoint.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIProtocolEndpoint : public CMPIAdapter<IPprotocolEndpoint> {
public:
    // Every interface; association adapters position it later with setObjectPath.
    CMPIProtocolEndpoint(const CMPIBroker* broker, const CMPIContext* context, const std::string& nameSpace);
    // The interfaces the path's keys name (all of them for a class path).
    CMPIProtocolEndpoint(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

    void setObjectPath(const CMPIObjectPath* path);
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);
    CMPIStatus modifyInstance(const CMPIInstance* newInstance);
    // RequestStateChange. status may be null.
    CMPIUint32 executeMethod(const CMPIArgs* in, CMPIArgs* out, CMPIStatus* status);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
