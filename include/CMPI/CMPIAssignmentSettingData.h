// KVRNX_IPAssignmentSettingData: the static and the DHCP setting of every interface.
#pragma once

#include <string>

#include "CMPI/CMPIAdapter.h"
#include "Lindows/IPAssignmentSettingData.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIAssignmentSettingData : public CMPIAdapter<IPAssignmentSettingData> {
public:
    CMPIAssignmentSettingData(const CMPIBroker* broker, const CMPIContext* context, const std::string& nameSpace);
    CMPIAssignmentSettingData(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

    // isCfg: the path names an endpoint's setting loosely (both views of the interface match).
    void setObjectPath(const CMPIObjectPath* path, bool isCfg);
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);
    // Only ConfigurationName can change.
    CMPIStatus modifyInstance(const CMPIInstance* newInstance);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
