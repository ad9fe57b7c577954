// KVRNX_StaticIPElementSettingData: an IP endpoint and its static IP setting.
#pragma once

#include "CMPI/CMPIAssociationAdapter.h"
#include "CMPI/CMPIProtocolEndpoint.h"
#include "CMPI/CMPIStaticIPAssignmentSettingData.h"
#include "Lindows/StaticIPElementSettingData.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIStaticElementSettingData
    : public CMPIAssociationAdapter<CMPIStaticElementSettingData, StaticIPElementSettingData, CMPIProtocolEndpoint,
                                    CMPIStaticIPAssignmentSettingData> {
    using Base = CMPIAssociationAdapter;
    friend Base;

public:
    CMPIStaticElementSettingData(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

protected:
    CMPIObjectPath* locateIPEndptPath(const CMPIObjectPath* path);
    CMPIObjectPath* locateStaticSettingDataPath(const CMPIObjectPath* path);

private:
    void setAssociationProperties(CMPIInstance* instance);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
