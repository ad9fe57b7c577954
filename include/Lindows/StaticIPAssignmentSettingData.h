// The static IP settings of each endpoint, kept in its interface configuration file, with the
// live values of the node standing in while the interface has no such file.
#pragma once

#include <string>

#include "Lindows/ModelPattern.h"
#include "Nx/NodeLexicon.h"

namespace Nx {
namespace IPInterfaceProvider {

struct StaticIPAssignmentSettingDataKeys {
    enum FilterType : int { ByInstanceID = 0 };
};

class StaticIPAssignmentSettingData
    : public ModelPattern<StaticIPAssignmentSettingData, StaticIPAssignmentSettingDataKeys> {
    using Base = ModelPattern;
    friend Base;

public:
    StaticIPAssignmentSettingData();

    bool getInstanceID(std::string& instanceID);
    bool getElementName(std::string& elementName);
    bool getAddressOrigin(unsigned short& addressOrigin);
    bool getAddressType(unsigned short& addressType);
    bool getIPv6AddressType(unsigned short& addressType);
    bool getPrefixLength(unsigned int& prefixLength);
    bool getIPv4Address(std::string& address);
    bool getSubnetMask(std::string& subnetMask);
    bool getGatewayIPv4Address(std::string& gateway);
    bool getIPv6Address(std::string& address);
    bool getGatewayIPv6Address(std::string& gateway);
    bool getIPv6SubnetPrefixLength(unsigned short& prefixLength);
    bool getConfigurationName(std::string& configurationName);

    bool setConfigurationName(const std::string& configurationName);
    bool setIPv4Address(const std::string& address);
    bool setSubnetMask(const std::string& subnetMask);
    bool setGatewayIPv4Address(const std::string& gateway);
    bool setIPv6Address(const std::string& address);
    bool setGatewayIPv6Address(const std::string& gateway);
    bool setIPv6SubnetPrefixLength(unsigned short prefixLength);
    // Always records "static", whatever is asked.
    bool setAddressOrigin(unsigned short addressOrigin);

private:
    static const std::string& logger();
    bool filterHolds(const Filter& filter);
    // The file path of the current interface; false when it has none we may use.
    bool filePath(std::string& path);
    // The getters and setters of the file's keys, traced as at; true. A read falls back on the
    // node property while the interface has no file; a write then goes nowhere.
    bool readSetting(const Site& at, const char* key, Nx::NodeLexicon::Properties fallback, std::string& value);
    bool writeSetting(const Site& at, const char* key, const std::string& value);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
