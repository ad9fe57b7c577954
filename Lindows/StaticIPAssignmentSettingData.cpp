#include "Lindows/StaticIPAssignmentSettingData.h"

#include "Lindows/ConfigurationFile.h"
#include "Nx/String.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerStaticIPAssignmentSettingData = "Tarvo.IPInterfaceProvider";

using Nx::NodeLexicon::Properties;

const std::string& StaticIPAssignmentSettingData::logger() { return loggerStaticIPAssignmentSettingData; }

StaticIPAssignmentSettingData::StaticIPAssignmentSettingData() : Base(NX_SITE) {}

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

bool StaticIPAssignmentSettingData::readSetting(const Site& at, const char* key, Properties fallback,
                                                std::string& value) {
    return traced(at, [&] {
        std::string path;
        if (!filePath(path) || !readConfigurationValue(path, key, value)) instrumentation.getProperty(fallback, value);
        return true;
    });
}

bool StaticIPAssignmentSettingData::writeSetting(const Site& at, const char* key, const std::string& value) {
    return traced(at, [&] {
        std::string path;
        if (filePath(path)) modifyValue(path, key, value);
        return true;
    });
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
    readProperty(NX_SITE, Properties::ElementName, elementName);
    return true;
}

bool StaticIPAssignmentSettingData::getAddressOrigin(unsigned short& addressOrigin) {
    return fixed(NX_SITE, addressOrigin, 3);
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
    return readProperty(NX_SITE, Properties::IPv6AddressType, addressType);
}

bool StaticIPAssignmentSettingData::getPrefixLength(unsigned int& prefixLength) {
    return readProperty(NX_SITE, Properties::PrefixLength, prefixLength);
}

// The address is read under "IPV4ADDR" but written under "IPv4ADDR": the two spellings are both
// in use and must stay as they are.
bool StaticIPAssignmentSettingData::getIPv4Address(std::string& address) {
    return readSetting(NX_SITE, "IPV4ADDR", Properties::IPv4Address, address);
}

bool StaticIPAssignmentSettingData::getSubnetMask(std::string& subnetMask) {
    return readSetting(NX_SITE, "NETMASK", Properties::SubnetMask, subnetMask);
}

bool StaticIPAssignmentSettingData::getGatewayIPv4Address(std::string& gateway) {
    return readSetting(NX_SITE, "GATEWAY", Properties::IPv4Gateway, gateway);
}

bool StaticIPAssignmentSettingData::getIPv6Address(std::string& address) {
    return readSetting(NX_SITE, "IPV6ADDR", Properties::IPv6Address, address);
}

bool StaticIPAssignmentSettingData::getGatewayIPv6Address(std::string& gateway) {
    return readSetting(NX_SITE, "IPV6GATEWAY", Properties::IPv6Gateway, gateway);
}

bool StaticIPAssignmentSettingData::getIPv6SubnetPrefixLength(unsigned short& prefixLength) {
    NX_ENTER(loggerStaticIPAssignmentSettingData);
    std::string path, text;
    if (filePath(path) && readConfigurationValue(path, "PREFIX", text)) {
        prefixLength = static_cast<unsigned short>(Nx::leadingDecimal(text));
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
    return writeSetting(NX_SITE, "CONFIG_NAME", configurationName);
}

bool StaticIPAssignmentSettingData::setIPv4Address(const std::string& address) {
    return writeSetting(NX_SITE, "IPv4ADDR", address);
}

bool StaticIPAssignmentSettingData::setSubnetMask(const std::string& subnetMask) {
    return writeSetting(NX_SITE, "NETMASK", subnetMask);
}

bool StaticIPAssignmentSettingData::setGatewayIPv4Address(const std::string& gateway) {
    return writeSetting(NX_SITE, "GATEWAY", gateway);
}

bool StaticIPAssignmentSettingData::setIPv6Address(const std::string& address) {
    return writeSetting(NX_SITE, "IPV6ADDR", address);
}

bool StaticIPAssignmentSettingData::setGatewayIPv6Address(const std::string& gateway) {
    return writeSetting(NX_SITE, "IPV6GATEWAY", gateway);
}

bool StaticIPAssignmentSettingData::setIPv6SubnetPrefixLength(unsigned short prefixLength) {
    return writeSetting(NX_SITE, "PREFIX", std::to_string(prefixLength));
}

bool StaticIPAssignmentSettingData::setAddressOrigin(unsigned short /*addressOrigin*/) {
    return writeSetting(NX_SITE, "BOOTPROTO", "static");
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
