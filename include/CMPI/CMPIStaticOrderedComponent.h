// KVRNX_StaticOrderedComponent: the static assignment setting of an interface (group) and its static IP setting (part).
#pragma once

#include "CMPI/CMPIAssignmentSettingData.h"
#include "CMPI/CMPIAssociationAdapter.h"
#include "CMPI/CMPIStaticIPAssignmentSettingData.h"
#include "Lindows/StaticOrderedComponent.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIStaticOrderedComponent
    : public CMPIAssociationAdapter<CMPIStaticOrderedComponent, StaticOrderedComponent, CMPIAssignmentSettingData,
                                    CMPIStaticIPAssignmentSettingData> {
    using Base = CMPIAssociationAdapter;
    friend Base;

public:
    CMPIStaticOrderedComponent(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

    // A path of the association class: without keys, the group (an assignment setting) and its part; with keys,
    // positions what it can and returns false (see setAnchoredObjectPath).
    bool setObjectPath(const CMPIObjectPath* path);

protected:
    CMPIObjectPath* locateAssignmentSetting(const CMPIObjectPath* path);
    CMPIObjectPath* locateStaticAssignmentSetting(const CMPIObjectPath* path);

private:
    void setAssociationProperties(CMPIInstance* instance);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
