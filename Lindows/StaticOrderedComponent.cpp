#include "Lindows/StaticOrderedComponent.h"

#include "Lindows/AssociationModel.h"
#include "Lindows/IPAssignmentSettingData.h"
#include "Lindows/StaticIPAssignmentSettingData.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerStaticOrderedComponent = "Tarvo.IPInterfaceProvider";

StaticOrderedComponent::StaticOrderedComponent() = default;
StaticOrderedComponent::~StaticOrderedComponent() = default;

Nx::Moniker StaticOrderedComponent::getGroupComponentMoniker(Nx::Moniker& part) {
    NX_ENTER(loggerStaticOrderedComponent);
    const std::string staticId = requireKey(part, "InstanceID", "Could not find 'InstanceID' property");
    if (staticId.find('%') == std::string::npos) throw Nx::FrameworkException("Could not get 'Instance ID' key");
    // The group is the static view of the same interface in the assignment setting model.
    const std::string wanted = staticId + "%static";
    IPAssignmentSettingData setting;
    setting.setFilter(IPAssignmentSettingData::FilterType::ByInstanceID, wanted, false);
    if (!setting) throw Nx::FrameworkException("Could not get 'Instance ID' key");
    Nx::Moniker result;
    result.addKey("InstanceID", wanted);
    NX_EXIT(loggerStaticOrderedComponent);
    return result;
}

Nx::Moniker StaticOrderedComponent::getPartComponentMoniker(Nx::Moniker& group) {
    NX_ENTER(loggerStaticOrderedComponent);
    const std::string groupId = requireKey(group, "InstanceID", "Could not find 'Name' key in Moniker");
    const std::string::size_type cut = groupId.rfind('%');
    if (cut == std::string::npos || groupId.compare(cut + 1, std::string::npos, "static") != 0)
        throw Nx::FrameworkException("AssignmentSetting data is not static");
    const std::string wanted = groupId.substr(0, cut);
    StaticIPAssignmentSettingData setting;
    setting.setFilter(StaticIPAssignmentSettingData::FilterType::ByInstanceID, wanted);
    if (!setting) throw Nx::FrameworkException("Could not get InstanceID");
    Nx::Moniker result;
    result.addKey("InstanceID", wanted);
    NX_EXIT(loggerStaticOrderedComponent);
    return result;
}

bool StaticOrderedComponent::getAssignedSequence(unsigned long long& assignedSequence) {
    assignedSequence = 1;
    return true;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
