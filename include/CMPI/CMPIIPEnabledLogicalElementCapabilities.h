// KVRNX_IPEnabledLogicalElementCapabilities: what can be asked of each interface.
#pragma once

#include <string>

#include "CMPI/CMPIAdapter.h"
#include "Lindows/IPEnabledLogicalElementCapabilities.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIIPEnabledLogicalElementCapabilities : public CMPIAdapter<IPEnabledLogicalElementCapabilities> {
public:
    CMPIIPEnabledLogicalElementCapabilities(const CMPIBroker* broker, const CMPIContext* context,
                                            const std::string& nameSpace);
    CMPIIPEnabledLogicalElementCapabilities(const CMPIBroker* broker, const CMPIContext* context,
                                            const CMPIObjectPath* path);

    void setObjectPath(const CMPIObjectPath* path);
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
