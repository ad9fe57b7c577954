#include "Lindows/IPElementSettingData.h"

#include <vector>

#include "Lindows/AssociationModel.h"
#include "Lindows/IPAssignmentSettingData.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerIPElementSettingData = "Tarvo.IPInterfaceProvider";

// 0 (Unknown) until a setting has been resolved against its endpoint.
IPElementSettingData::IPElementSettingData() : IsDefault(0), IsCurrent(0) {}
IPElementSettingData::~IPElementSettingData() = default;

Nx::Moniker IPElementSettingData::getManagedElementMoniker(Nx::Moniker& setting) {
    NX_ENTER(loggerIPElementSettingData);
    std::string instanceId;
    if (!findKey(setting, "InstanceID", instanceId))
        throw Nx::FrameworkException("Could not find 'Name' key in Moniker");
    std::vector<std::string> tokens;
    Tokenize(instanceId, tokens, "%");
    if (tokens.size() < 2) throw Nx::FrameworkException("Instance ID Property value is not correct");

    // The setting model writes prefix%interface%kind; an ID without the prefix reads as
    // interface%kind and may name an interface of either system.
    const std::string& kind = tokens.back();
    const std::string& name = tokens[tokens.size() - 2];
    NX_VAR(loggerIPElementSettingData, "Name", name.c_str());
    IPprotocolEndpoint endpoint;
    if (!findEndpointOfSetting(endpoint, name, tokens.size() >= 3 ? &tokens.front() : nullptr))
        throw Nx::FrameworkException("Could not get 'System Name' and  'Name' key");

    Nx::Moniker result;
    addEndpointKeys(result, endpoint);
    unsigned short origin = 0;
    endpoint.getAddressOrigin(origin);
    // IsDefault and IsCurrent always move together.
    const bool inForce = (origin == 4 && kind == "dhcp") || (origin == 3 && kind == "static");
    setIsDefault(inForce ? 1 : 2);
    setIsCurrent(inForce ? 1 : 2);
    NX_EXIT(loggerIPElementSettingData);
    return result;
}

Nx::Moniker IPElementSettingData::getIPSettingDataMoniker(Nx::Moniker& endpoint) {
    NX_ENTER(loggerIPElementSettingData);
    const std::string name = requireKey(endpoint, "Name", "Could not find 'Name' key in Moniker");
    std::string systemName;
    const bool systemGiven = findKey(endpoint, "SystemName", systemName);
    const std::string wantedPrefix = settingPrefixOf(systemName) + "%";

    // Both settings of an interface share everything up to their last "%".
    IPAssignmentSettingData setting;
    std::string found;
    for (; setting && found.empty(); ++setting) {
        std::string elementName, instanceId;
        setting.getElementName(elementName);
        setting.getInstanceId(instanceId);
        if (elementName != name || (systemGiven && instanceId.compare(0, wantedPrefix.size(), wantedPrefix) != 0))
            continue;
        found = instanceId.substr(0, instanceId.rfind('%'));
    }
    if (found.empty()) throw Nx::FrameworkException("Could not get 'Instance ID' key");
    NX_VAR(loggerIPElementSettingData, "InstanceID", found.c_str());
    Nx::Moniker result;
    result.addKey("InstanceID", found);
    NX_EXIT(loggerIPElementSettingData);
    return result;
}

bool IPElementSettingData::getIsDefault(unsigned short& isDefault) {
    isDefault = IsDefault;
    return true;
}

bool IPElementSettingData::getIsCurrent(unsigned short& isCurrent) {
    isCurrent = IsCurrent;
    return true;
}

bool IPElementSettingData::getIsNext(unsigned short& isNext) {
    isNext = 2;
    return true;
}

void IPElementSettingData::setIsDefault(unsigned short isDefault) { IsDefault = isDefault; }
void IPElementSettingData::setIsCurrent(unsigned short isCurrent) { IsCurrent = isCurrent; }

}  // namespace IPInterfaceProvider
}  // namespace Nx
