#include "CMPI/CMPIStaticElementSettingData.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIStaticElementSettingData = "Tarvo.IPInterfaceProvider";

namespace {

const AssociationClass kAssociation = {
    "KVRNX_StaticIPElementSettingData",
    {IPProtocolEndpointId, "KVRNX_IPProtocolEndpoint", "CIM_IPProtocolEndpoint", "ManagedElement"},
    {StaticIPAssignmentSettingDataId, "KVRNX_StaticIPAssignmentSettingData", "CIM_StaticIPAssignmentSettingData",
     "SettingData"},
    true,
};

}  // namespace

CMPIStaticElementSettingData::CMPIStaticElementSettingData(const CMPIBroker* broker_, const CMPIContext* context_,
                                                           const CMPIObjectPath* path)
    : Base(broker_, context_, path, kAssociation, loggerCMPIStaticElementSettingData, NX_FILE) {
    construct(__func__, path, [&] {
        switch (requestedClassId) {
            case StaticIPAssignmentSettingDataId:
                fromB(path, &CMPIStaticElementSettingData::locateIPEndptPath);
                break;
            case StaticIPElementSettingDataId:
                walkB(&CMPIStaticElementSettingData::locateIPEndptPath);
                break;
            case IPProtocolEndpointId:
                fromA(path, &CMPIStaticElementSettingData::locateStaticSettingDataPath);
                break;
            default:
                break;
        }
    });
}

CMPIObjectPath* CMPIStaticElementSettingData::locateIPEndptPath(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPProtocolEndpoint", &StaticIPElementSettingData::getManagedElementMoniker,
                  "getManagedElementMoniker");
}

CMPIObjectPath* CMPIStaticElementSettingData::locateStaticSettingDataPath(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_StaticIPAssignmentSettingData",
                  &StaticIPElementSettingData::getStaticIPSettingDataMoniker, "getStaticIPSettingDataMoniker");
}

void CMPIStaticElementSettingData::setAssociationProperties(CMPIInstance* instance) {
    // As for the assignment settings: resolve the pair's static setting against its endpoint.
    CMPIObjectPath* setting = endB.getObjectPath();
    if (ProviderUtilities::getKeyCount(setting) != 0) {
        Nx::Moniker moniker = ProviderUtilities::transformObjectPathToMoniker(setting);
        model.getManagedElementMoniker(moniker);
    }
    copyProperty<unsigned short>(instance, "IsDefault", &StaticIPElementSettingData::getIsDefault);
    copyProperty<unsigned short>(instance, "IsCurrent", &StaticIPElementSettingData::getIsCurrent);
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
