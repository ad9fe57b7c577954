// KVRNX_IPConfigurationService: the host's one IP configuration service and its method
// ApplySettingToIPProtocolEndpoint.
#pragma once

#include <string>

#include "CMPI/CMPIAdapter.h"
#include "Lindows/IPConfigurationService.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIIPConfigurationService : public CMPIAdapter<IPConfigurationService> {
public:
    CMPIIPConfigurationService(const CMPIBroker* broker, const CMPIContext* context, const std::string& nameSpace);
    CMPIIPConfigurationService(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

    // Only SystemName selects: any path naming the host's system addresses the one service.
    void setObjectPath(const CMPIObjectPath* path);
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);
    // ApplySettingToIPProtocolEndpoint. status may be null.
    CMPIUint32 executeMethod(const CMPIArgs* in, CMPIArgs* out, CMPIStatus* status);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
