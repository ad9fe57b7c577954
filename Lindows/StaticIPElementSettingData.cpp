#include "Lindows/StaticIPElementSettingData.h"

#include <vector>

#include "Lindows/AssociationModel.h"
#include "Lindows/StaticIPAssignmentSettingData.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerStaticIPElementSettingData = "Tarvo.IPInterfaceProvider";

// A static setting is named "prefix%interface" (Computer%eth0, BMC%usb0), so its tokens are the
// system prefix and the interface name, split at "%". Interface names may themselves hold ":"
// (aliases such as eth0:1) and "_", so those are not separators here.
Nx::Moniker StaticIPElementSettingData::getManagedElementMoniker(Nx::Moniker& setting) {
    NX_ENTER(loggerStaticIPElementSettingData);
    const std::vector<std::string> instance_tokens = settingTokens(setting, "Could not find 'InstanceID tokens");
    NX_VAR(loggerStaticIPElementSettingData, "instance_tokens[0]", instance_tokens[0].c_str());
    NX_VAR(loggerStaticIPElementSettingData, "instance_tokens[1]", instance_tokens[1].c_str());

    IPprotocolEndpoint endpoint;
    if (!findEndpointOfSetting(endpoint, instance_tokens[1], &instance_tokens[0]))
        throw Nx::FrameworkException("Could not get 'System Name' and  'Name' key");
    Nx::Moniker result;
    std::string systemName, name;
    if (endpoint.getSystemName(systemName)) result.addKey("SystemName", systemName);
    endpoint.getName(name);
    result.addKey("Name", name);

    resolveAgainst(endpoint, "static");
    NX_EXIT(loggerStaticIPElementSettingData);
    return result;
}

Nx::Moniker StaticIPElementSettingData::getStaticIPSettingDataMoniker(Nx::Moniker& endpoint) {
    NX_ENTER(loggerStaticIPElementSettingData);
    const std::string name = requireKey(endpoint, "Name", "Could not find 'Name' key in Moniker");
    std::string systemName;
    const bool systemGiven = findKey(endpoint, "SystemName", systemName);

    StaticIPAssignmentSettingData setting;
    std::vector<std::string> instance_tokens;
    for (; setting; ++setting) {
        std::string elementName, instanceId;
        setting.getElementName(elementName);
        if (elementName != name) continue;
        setting.getInstanceID(instanceId);
        std::vector<std::string> tokens;
        Tokenize(instanceId, tokens, "%");
        if (tokens.size() < 2 || (systemGiven && tokens[0] != settingPrefixOf(systemName))) continue;
        instance_tokens = tokens;
        break;
    }
    if (instance_tokens.empty()) throw Nx::FrameworkException("Could not get 'Instance ID' key");
    NX_VAR(loggerStaticIPElementSettingData, "instance_tokens[0]", instance_tokens[0].c_str());
    NX_VAR(loggerStaticIPElementSettingData, "instance_tokens[1]", instance_tokens[1].c_str());
    Nx::Moniker result;
    result.addKey("InstanceID", instance_tokens[0] + "%" + instance_tokens[1]);
    NX_EXIT(loggerStaticIPElementSettingData);
    return result;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
