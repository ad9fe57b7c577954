// The configuration a client asked ApplySettingToIPProtocolEndpoint to apply, and the functions
// that collect it from the setting instances the client named.
#pragma once

#include <cmpidt.h>

#include <string>
#include <vector>

namespace Nx {
namespace IPInterfaceProvider {

// An empty field means: leave the host's value as it is.
struct IP_CONFIG_DATA {
    unsigned short addr_origin = 0;  // 3 static, 4 DHCP, 0 none
    unsigned short ipv6_prefix = 0;  // 0: not given
    std::string name;                // interface, from the endpoint's Name key
    std::string ipAddress;
    std::string subnet_mask;
    std::string ipGateway;
    std::string ipv6Gateway;
    std::string ipv6Address;
    std::string dnsHostName;
    std::string dnsDomainName;
    bool configNameEmpty = false;  // a setting read had an empty ConfigurationName
    std::vector<std::string> dnsServers;
    std::vector<std::string> dnsSuffixes;
};

// Each returns rc 0 on success; on failure what was filled before stays in cfg_data.

// A KVRNX_StaticIPAssignmentSettingData instance: origin, IPv4 and IPv6 addresses and gateways.
CMPIStatus getStaticConfigurationDetails(const CMPIBroker* broker, const CMPIContext* context,
                                         CMPIInstance* setting, IP_CONFIG_DATA* cfg_data);
// A KVRNX_DHCPSettingData instance: it carries no addresses, only its ConfigurationName counts.
CMPIStatus getDHCPConfigurationDetails(const CMPIBroker* broker, const CMPIContext* context,
                                       CMPIInstance* setting, IP_CONFIG_DATA* cfg_data);
// A KVRNX_DNSSettingData or KVRNX_DNSGeneralSettingData instance, read only when the endpoint
// has a KVRNX_DNSProtocolEndpoint.
CMPIStatus getDNSConfigurationDetails(const CMPIBroker* broker, const CMPIContext* context,
                                      CMPIInstance* setting, CMPIObjectPath* endpoint,
                                      IP_CONFIG_DATA* cfg_data);

}  // namespace IPInterfaceProvider
}  // namespace Nx
