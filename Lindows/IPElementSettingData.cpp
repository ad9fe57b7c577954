#include "Lindows/IPElementSettingData.h"

#include <vector>

#include "Lindows/AssociationModel.h"
#include "Lindows/IPAssignmentSettingData.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerIPElementSettingData = "Tarvo.IPInterfaceProvider";

Nx::Moniker IPElementSettingData::getManagedElementMoniker(Nx::Moniker& setting) {
    NX_ENTER(loggerIPElementSettingData);
    const std::vector<std::string> tokens = settingTokens(setting, "Instance ID Property value is not correct");

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
    resolveAgainst(endpoint, kind);
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
    for (; setting; ++setting) {
        std::string elementName, instanceId;
        setting.getElementName(elementName);
        if (elementName != name) continue;
        setting.getInstanceId(instanceId);
        if (systemGiven && instanceId.compare(0, wantedPrefix.size(), wantedPrefix) != 0) continue;
        found = instanceId.substr(0, instanceId.rfind('%'));
        break;
    }
    if (found.empty()) throw Nx::FrameworkException("Could not get 'Instance ID' key");
    NX_VAR(loggerIPElementSettingData, "InstanceID", found.c_str());
    Nx::Moniker result;
    result.addKey("InstanceID", found);
    NX_EXIT(loggerIPElementSettingData);
    return result;
}

bool IPElementSettingData::getIsNext(unsigned short& isNext) {
    isNext = 2;
    return true;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
