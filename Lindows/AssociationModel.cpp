#include "Lindows/AssociationModel.h"

#include "Lindows/ModelPattern.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerAssociationModel = "Tarvo.IPInterfaceProvider";

const char* const ServiceProcessorName = "BMC:-1";
const char* const ComputerSystemClass = "KVRNX_ComputerSystem";
const char* const SPComputerSystemClass = "KVRNX_SPComputerSystem";
const char* const IPProtocolEndpointClass = "KVRNX_IPProtocolEndpoint";

bool findKey(Nx::Moniker& moniker, const char* name, std::string& value) {
    for (unsigned int i = 0; i < moniker.getKeyCount(); ++i) {
        moniker.selectKey(i);
        if (moniker.getName() == name) {
            value = moniker.getValue();
            return true;
        }
    }
    return false;
}

std::string requireKey(Nx::Moniker& moniker, const char* name, const char* missing) {
    std::string value;
    if (!findKey(moniker, name, value)) throw Nx::FrameworkException(missing);
    NX_VAR(loggerAssociationModel, name, value.c_str());
    return value;
}

Nx::Moniker computerSystemMoniker(Nx::Moniker& element, Nx::Instrumentation& cursor) {
    NX_ENTER(loggerAssociationModel);
    requireKey(element, "SystemName", "Could not find 'System Name' Key in Moniker");
    if (!cursor.selectNode(Nx::NodeLexicon::SystemNode))
        throw Nx::InstrumentationException("Concerned Computer Could Not Be Found.");
    // The host's endpoints, gateways and service name their system with the host name, so the
    // computer carries that name too; the model's own host-name property may lag behind it.
    std::string name;
    if (!localHostName(name) || name.empty())
        throw Nx::InstrumentationException("Name Property on computer not available.");
    Nx::Moniker computer;
    computer.addKey("Name", name);
    NX_EXIT(loggerAssociationModel);
    return computer;
}

void requireHostComputer(const std::string& name) {
    std::string hostName;
    if (!localHostName(hostName) || hostName != name)
        throw Nx::FrameworkException("Could not match 'System Name' key with 'Name' key in Computer Moniker");
}

Nx::Moniker hostedByComputerMoniker(Nx::Moniker& computer) {
    const std::string name = requireKey(computer, "Name", "Could not find 'Name' key in Moniker");
    requireHostComputer(name);
    Nx::Moniker result;
    result.addKey("SystemName", name);
    return result;
}

std::string settingPrefixOf(const std::string& systemName) {
    return systemName == ServiceProcessorName ? "BMC" : "Computer";
}

bool findEndpoint(IPprotocolEndpoint& endpoint, const std::string& name, const std::string* systemName) {
    if (systemName) endpoint.setFilter(IPprotocolEndpoint::FilterType::BySystemName, *systemName);
    endpoint.setFilter(IPprotocolEndpoint::FilterType::ByName, name);
    return static_cast<bool>(endpoint);
}

bool findEndpointOfSetting(IPprotocolEndpoint& endpoint, const std::string& name, const std::string* prefix) {
    endpoint.setFilter(IPprotocolEndpoint::FilterType::ByName, name);
    if (!prefix) return static_cast<bool>(endpoint);
    const std::string wanted = *prefix == "BMC" ? SPComputerSystemClass : ComputerSystemClass;
    for (; endpoint; ++endpoint) {
        std::string systemClass;
        endpoint.getSystemCreationClassName(systemClass);
        if (systemClass == wanted) return true;
    }
    return false;
}

std::vector<std::string> settingTokens(Nx::Moniker& setting, const char* malformed) {
    std::string instanceId;
    if (!findKey(setting, "InstanceID", instanceId))
        throw Nx::FrameworkException("Could not find 'Name' key in Moniker");
    std::vector<std::string> tokens;
    Tokenize(instanceId, tokens, "%");
    if (tokens.size() < 2) throw Nx::FrameworkException(malformed);
    return tokens;
}

bool SettingInForce::getIsDefault(unsigned short& isDefault) {
    isDefault = IsDefault;
    return true;
}

bool SettingInForce::getIsCurrent(unsigned short& isCurrent) {
    isCurrent = IsCurrent;
    return true;
}

void SettingInForce::setIsDefault(unsigned short isDefault) { IsDefault = isDefault; }
void SettingInForce::setIsCurrent(unsigned short isCurrent) { IsCurrent = isCurrent; }

void SettingInForce::resolveAgainst(IPprotocolEndpoint& endpoint, const std::string& kind) {
    unsigned short origin = 0;
    endpoint.getAddressOrigin(origin);
    const bool inForce = (origin == 4 && kind == "dhcp") || (origin == 3 && kind == "static");
    setIsDefault(inForce ? 1 : 2);
    setIsCurrent(inForce ? 1 : 2);
}

void addEndpointKeys(Nx::Moniker& result, IPprotocolEndpoint& endpoint) {
    std::string systemClass, systemName, name;
    endpoint.getSystemCreationClassName(systemClass);
    result.addKey("SystemCreationClassName", systemClass);
    if (endpoint.getSystemName(systemName)) result.addKey("SystemName", systemName);
    endpoint.getName(name);
    result.addKey("Name", name);
    result.addKey("CreationClassName", IPProtocolEndpointClass);
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
