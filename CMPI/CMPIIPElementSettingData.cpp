#include "CMPI/CMPIIPElementSettingData.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIIPElementSettingData = "Tarvo.IPInterfaceProvider";

namespace {

const AssociationClass kAssociation = {
    "KVRNX_IPElementSettingData",
    {IPProtocolEndpointId, "KVRNX_IPProtocolEndpoint", "CIM_IPProtocolEndpoint", "ManagedElement"},
    {IPAssignmentSettingDataId, "KVRNX_IPAssignmentSettingData", "CIM_IPAssignmentSettingData", "SettingData"},
    true,
};

}  // namespace

CMPIIPElementSettingData::CMPIIPElementSettingData(const CMPIBroker* broker_, const CMPIContext* context_,
                                                   const CMPIObjectPath* path)
    : Base(broker_, context_, path, kAssociation, loggerCMPIIPElementSettingData, NX_FILE) {
    const TraceParams params(" _broker=", broker_, " _context=", context_, " objectPath=", path);
    NX_ENTER_PARAMS(loggerCMPIIPElementSettingData, params.c_str());
    switch (requestedClassId) {
        case IPAssignmentSettingDataId:
            fromB(path, &CMPIIPElementSettingData::locateIPEndptPath);
            break;
        case IPElementSettingDataId:
            walkB(&CMPIIPElementSettingData::locateIPEndptPath);
            break;
        case IPProtocolEndpointId:
            // The located InstanceID names the interface, not a kind: both settings match loosely.
            endB.setObjectPath(locateAssignSettingDataPath(path), true);
            endA.setObjectPath(path);
            walk(Side::B);
            break;
        default:
            break;
    }
    NX_EXIT_PARAMS(loggerCMPIIPElementSettingData, params.c_str());
}

CMPIObjectPath* CMPIIPElementSettingData::locateIPEndptPath(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPProtocolEndpoint", &IPElementSettingData::getManagedElementMoniker,
                  "getManagedElementMoniker");
}

CMPIObjectPath* CMPIIPElementSettingData::locateAssignSettingDataPath(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPAssignmentSettingData", &IPElementSettingData::getIPSettingDataMoniker,
                  "getIPSettingDataMoniker");
}

void CMPIIPElementSettingData::setAssociationProperties(CMPIInstance* instance) {
    // IsDefault and IsCurrent describe the pair's setting against its endpoint; the pair at hand
    // need not be the one the constructor resolved, so it is resolved again here.
    CMPIObjectPath* setting = endB.getObjectPath();
    if (ProviderUtilities::getKeyCount(setting) != 0) {
        Nx::Moniker moniker = ProviderUtilities::transformObjectPathToMoniker(setting);
        model.getManagedElementMoniker(moniker);
    }
    copyProperty<unsigned short>(instance, "IsDefault", &IPElementSettingData::getIsDefault);
    copyProperty<unsigned short>(instance, "IsCurrent", &IPElementSettingData::getIsCurrent);
    copyProperty<unsigned short>(instance, "IsNext", &IPElementSettingData::getIsNext);
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
