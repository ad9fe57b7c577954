// KVRNX_StaticIPAssignmentSettingData: the static addresses of every interface, kept in its
// interface configuration file.
#pragma once

#include <string>

#include "CMPI/CMPIAdapter.h"
#include "Lindows/StaticIPAssignmentSettingData.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIStaticIPAssignmentSettingData : public CMPIAdapter<StaticIPAssignmentSettingData> {
public:
    CMPIStaticIPAssignmentSettingData(const CMPIBroker* broker, const CMPIContext* context,
                                      const std::string& nameSpace);
    CMPIStaticIPAssignmentSettingData(const CMPIBroker* broker, const CMPIContext* context,
                                      const CMPIObjectPath* path);

    void setObjectPath(const CMPIObjectPath* path);
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);
    CMPIStatus modifyInstance(const CMPIInstance* newInstance);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
