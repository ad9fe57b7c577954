#include "CMPI/CMPIStaticOrderedComponent.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIStaticOrderedComponent = "Tarvo.IPInterfaceProvider";

namespace {

const AssociationClass kAssociation = {
    "KVRNX_StaticOrderedComponent",
    {IPAssignmentSettingDataId, "KVRNX_IPAssignmentSettingData", "CIM_IPAssignmentSettingData", "GroupComponent"},
    {StaticIPAssignmentSettingDataId, "KVRNX_StaticIPAssignmentSettingData", "CIM_StaticIPAssignmentSettingData",
     "PartComponent"},
    true,
};

}  // namespace

CMPIStaticOrderedComponent::CMPIStaticOrderedComponent(const CMPIBroker* broker_, const CMPIContext* context_,
                                                       const CMPIObjectPath* path)
    : Base(broker_, context_, path, kAssociation, loggerCMPIStaticOrderedComponent, NX_FILE) {
    constructAnchored(__func__, path, StaticOrderedComponentId, &CMPIStaticOrderedComponent::locateAssignmentSetting,
                      &CMPIStaticOrderedComponent::locateStaticAssignmentSetting);
}

bool CMPIStaticOrderedComponent::setObjectPath(const CMPIObjectPath* path) {
    return setAnchoredObjectPath<Side::A>(path, "InstanceID",
                                          &CMPIStaticOrderedComponent::locateStaticAssignmentSetting,
                                          &CMPIStaticOrderedComponent::locateAssignmentSetting);
}

CMPIObjectPath* CMPIStaticOrderedComponent::locateAssignmentSetting(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPAssignmentSettingData", &StaticOrderedComponent::getGroupComponentMoniker,
                  "getGroupComponentMoniker");
}

CMPIObjectPath* CMPIStaticOrderedComponent::locateStaticAssignmentSetting(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_StaticIPAssignmentSettingData", &StaticOrderedComponent::getPartComponentMoniker,
                  "getPartComponentMoniker");
}

void CMPIStaticOrderedComponent::setAssociationProperties(CMPIInstance* instance) {
    copyProperty<unsigned long long>(instance, "AssignedSequence", &StaticOrderedComponent::getAssignedSequence);
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
