#include "Lindows/StaticIPAssignmentSettingData.h"

#include "Lindows/ConfigurationFile.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerStaticIPAssignmentSettingData = "Tarvo.IPInterfaceProvider";

using Nx::NodeLexicon::Properties;

const std::string& StaticIPAssignmentSettingData::logger() { return loggerStaticIPAssignmentSettingData; }

StaticIPAssignmentSettingData::StaticIPAssignmentSettingData() {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
}

bool StaticIPAssignmentSettingData::filterHolds(const Filter& filter) {
    if (filter.filterType != ByInstanceID) return true;
    std::string instanceID;
    return !getInstanceID(instanceID) || instanceID == filter.reference;
}

bool StaticIPAssignmentSettingData::filePath(std::string& path) {
    std::string name;
    instrumentation.getProperty(Properties::ElementName, name);
    if (!configurationFilePath(name, path)) return false;
    NX_VAR(loggerStaticIPAssignmentSettingData, "l_cFileName", path.c_str());
    return true;
}

void StaticIPAssignmentSettingData::readSetting(const char* key, Properties fallback, std::string& value) {
    std::string path;
    if (filePath(path) && readConfigurationValue(path, key, value)) return;
    instrumentation.getProperty(fallback, value);
}

void StaticIPAssignmentSettingData::writeSetting(const char* key, const std::string& value) {
    std::string path;
    if (filePath(path)) modifyValue(path, key, value);
}

bool StaticIPAssignmentSettingData::getInstanceID(std::string& instanceID) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    std::string name;
    instrumentation.getProperty(Properties::ElementName, name);
    instanceID = (isUnderServiceProcessor(instrumentation) ? "BMC%" : "Computer%") + name;
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::getElementName(std::string& elementName) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    instrumentation.getProperty(Properties::ElementName, elementName);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::getAddressOrigin(unsigned short& addressOrigin) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    addressOrigin = 3;
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

// These codes differ from the ones the endpoint maps; the setting reports its own.
bool StaticIPAssignmentSettingData::getAddressType(unsigned short& addressType) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    unsigned int code = 0;
    instrumentation.getProperty(Properties::IPVersion, code);
    addressType = code == 4 ? 1 : code == 6 ? 2 : 0;
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::getIPv6AddressType(unsigned short& addressType) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    unsigned int code = 0;
    bool found = instrumentation.getProperty(Properties::IPv6AddressType, code);
    if (found) addressType = static_cast<unsigned short>(code);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return found;
}

bool StaticIPAssignmentSettingData::getPrefixLength(unsigned int& prefixLength) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    bool found = instrumentation.getProperty(Properties::PrefixLength, prefixLength);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return found;
}

// The address is read under "IPV4ADDR" but written under "IPv4ADDR": the two spellings are both
// in use and must stay as they are.
bool StaticIPAssignmentSettingData::getIPv4Address(std::string& address) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    readSetting("IPV4ADDR", Properties::IPv4Address, address);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::getSubnetMask(std::string& subnetMask) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    readSetting("NETMASK", Properties::SubnetMask, subnetMask);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::getGatewayIPv4Address(std::string& gateway) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    readSetting("GATEWAY", Properties::IPv4Gateway, gateway);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::getIPv6Address(std::string& address) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    readSetting("IPV6ADDR", Properties::IPv6Address, address);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::getGatewayIPv6Address(std::string& gateway) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    readSetting("IPV6GATEWAY", Properties::IPv6Gateway, gateway);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::getIPv6SubnetPrefixLength(unsigned short& prefixLength) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    std::string path, text;
    if (filePath(path) && readConfigurationValue(path, "PREFIX", text)) {
        // Decimal digits up to the first other character; nothing readable gives 0.
        unsigned long parsed = 0;
        for (char c : text) {
            if (c < '0' || c > '9') break;
            parsed = parsed * 10 + static_cast<unsigned long>(c - '0');
            if (parsed > 1000000UL) break;  // no prefix is that long; stop before overflowing
        }
        prefixLength = static_cast<unsigned short>(parsed);
    } else {
        unsigned int length = 0;
        if (instrumentation.getProperty(Properties::PrefixLength, length))
            prefixLength = static_cast<unsigned short>(length);
    }
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::getConfigurationName(std::string& configurationName) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    std::string path, value;
    if (filePath(path) && readConfigurationValue(path, "CONFIG_NAME", value)) configurationName = value;
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::setConfigurationName(const std::string& configurationName) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    writeSetting("CONFIG_NAME", configurationName);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::setIPv4Address(const std::string& address) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    writeSetting("IPv4ADDR", address);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::setSubnetMask(const std::string& subnetMask) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    writeSetting("NETMASK", subnetMask);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::setGatewayIPv4Address(const std::string& gateway) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    writeSetting("GATEWAY", gateway);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::setIPv6Address(const std::string& address) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    writeSetting("IPV6ADDR", address);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::setGatewayIPv6Address(const std::string& gateway) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    writeSetting("IPV6GATEWAY", gateway);
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::setIPv6SubnetPrefixLength(unsigned short prefixLength) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    writeSetting("PREFIX", std::to_string(prefixLength));
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

bool StaticIPAssignmentSettingData::setAddressOrigin(unsigned short /*addressOrigin*/) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    writeSetting("BOOTPROTO", "static");
    NX_EXIT(loggerStaticIPAssignmentSettingData);
    return true;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
