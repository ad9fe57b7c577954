// KVRNX_IPElementSettingData: an IP endpoint and its static and DHCP assignment settings.
#pragma once

#include "CMPI/CMPIAssignmentSettingData.h"
#include "CMPI/CMPIAssociationAdapter.h"
#include "CMPI/CMPIProtocolEndpoint.h"
#include "Lindows/IPElementSettingData.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIIPElementSettingData : public CMPIAssociationAdapter<CMPIIPElementSettingData, IPElementSettingData,
                                                               CMPIProtocolEndpoint, CMPIAssignmentSettingData> {
    using Base = CMPIAssociationAdapter;
    friend Base;

public:
    CMPIIPElementSettingData(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

protected:
    CMPIObjectPath* locateIPEndptPath(const CMPIObjectPath* path);
    CMPIObjectPath* locateAssignSettingDataPath(const CMPIObjectPath* path);

private:
    void setAssociationProperties(CMPIInstance* instance);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
