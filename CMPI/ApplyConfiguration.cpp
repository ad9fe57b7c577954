#include "CMPI/ApplyConfiguration.h"

#include <pthread.h>

#include <cstdio>
#include <exception>
#include <string>
#include <vector>

#include "CMPI/CMPIIPConfigurationService.h"
#include "Nx/Instrumentation.h"
#include "Nx/NodeLexicon.h"
#include "Nx/PlatformUtilities.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerApplyConfiguration = "Tarvo.IPInterfaceProvider";

namespace {

using NodeLexicon::Properties;

const char* const kNetworkRestartCommand = "/etc/init.d/network restart ";

// Property 24 codes for the requested origin; 0 means there is nothing to apply.
unsigned int requestedOriginOf(unsigned short addrOrigin) {
    switch (addrOrigin) {
        case 3: return 3;
        case 4: return 1;
        default: return 0;
    }
}

// Moves the cursor onto the endpoint node of the interface; remembers the addresses the node
// reports on the way.
bool findInterface(Instrumentation& node, const std::string& interfaceName, std::string& currentIPv4,
                   std::string& currentIPv6) {
    for (node.selectNode(NodeLexicon::IPEndpointNode); node; ++node) {
        std::string elementName;
        node.getProperty(NodeLexicon::ElementName, elementName);
        NX_VAR(loggerApplyConfiguration, "elementName", elementName.c_str());
        currentIPv4.clear();
        currentIPv6.clear();
        node.getProperty(NodeLexicon::IPv4Address, currentIPv4);
        node.getProperty(NodeLexicon::IPv6Address, currentIPv6);
        if (elementName == interfaceName) return true;
    }
    return false;
}

// Host name, domain and resolver settings belong to the whole host: the system node carries them.
void applyHostSettings(const IP_CONFIG_DATA* cfg_data) {
    Instrumentation system;
    system.selectNode(NodeLexicon::SystemNode);
    if (!cfg_data->dnsServers.empty()) {
        NX_VAR(loggerApplyConfiguration, "cfg_data->dnsServers.size()",
               static_cast<unsigned>(cfg_data->dnsServers.size()));
        system.setProperty(NodeLexicon::DNSServers, cfg_data->dnsServers);
    }
    if (!cfg_data->dnsSuffixes.empty()) {
        NX_VAR(loggerApplyConfiguration, "cfg_data->dnsSuffixes.size()",
               static_cast<unsigned>(cfg_data->dnsSuffixes.size()));
        system.setProperty(NodeLexicon::DNSSuffixes, cfg_data->dnsSuffixes);
    }
    std::string hostName;
    if (system.getProperty(NodeLexicon::HostName, hostName) && !cfg_data->dnsHostName.empty() &&
        cfg_data->dnsHostName != hostName) {
        NX_MESSAGE(loggerApplyConfiguration, 3000, "Applying the Hostname");
        system.setProperty(NodeLexicon::HostName, cfg_data->dnsHostName);
        RequestScope::hostNameChanged();
    }
    std::string domainName;
    if (system.getProperty(NodeLexicon::DomainName, domainName) && !cfg_data->dnsDomainName.empty() &&
        cfg_data->dnsDomainName != domainName) {
        NX_MESSAGE(loggerApplyConfiguration, 3000, "Applying the Domainname");
        system.setProperty(NodeLexicon::DomainName, cfg_data->dnsDomainName);
    }
}

void rebootSystem() {
    Instrumentation system;
    if (!system.selectNode(NodeLexicon::SystemNode)) return;
    const unsigned int reboot = 9;
    if (system.setProperty(NodeLexicon::AdminState, reboot))
        NX_MESSAGE(loggerApplyConfiguration, 3000, "Agent Restarted Successfully");
    else
        NX_MESSAGE(loggerApplyConfiguration, 6000, "Failed to Reboot");
}

}  // namespace

bool isSystemRebootRequired(IP_CONFIG_DATA* cfg_data) {
    NX_ENTER(loggerApplyConfiguration);
    const auto leave = [&](bool result) {
        NX_EXIT(loggerApplyConfiguration);
        return result;
    };
    if (!cfg_data) return leave(false);

    NX_VAR(loggerApplyConfiguration, "cfg_data->name", cfg_data->name.c_str());
    NX_VAR(loggerApplyConfiguration, "cfg_data->addr_origin", static_cast<unsigned>(cfg_data->addr_origin));
    NX_VAR(loggerApplyConfiguration, "cfg_data->subnet_mask", cfg_data->subnet_mask.c_str());
    NX_VAR(loggerApplyConfiguration, "cfg_data->ipAddress", cfg_data->ipAddress.c_str());
    NX_VAR(loggerApplyConfiguration, "cfg_data->ipGateway", cfg_data->ipGateway.c_str());
    NX_VAR(loggerApplyConfiguration, "cfg_data->ipv6_prefix", static_cast<unsigned>(cfg_data->ipv6_prefix));
    NX_VAR(loggerApplyConfiguration, "cfg_data->ipv6Address", cfg_data->ipv6Address.c_str());
    NX_VAR(loggerApplyConfiguration, "cfg_data->ipv6Gateway", cfg_data->ipv6Gateway.c_str());
    NX_VAR(loggerApplyConfiguration, "cfg_data->dnsHostName", cfg_data->dnsHostName.c_str());

    // "eth0_static" and the like address eth0.
    std::vector<std::string> name_tokens;
    Tokenize(cfg_data->name, name_tokens, "_");
    if (name_tokens.empty()) return leave(false);

    Instrumentation node;
    std::string currentIPv4, currentIPv6;
    if (!findInterface(node, name_tokens[0], currentIPv4, currentIPv6)) return leave(false);

    unsigned int currentOrigin = 0;
    node.getProperty(NodeLexicon::AddressOrigin, currentOrigin);
    const unsigned int requestedOrigin = requestedOriginOf(cfg_data->addr_origin);
    NX_VAR(loggerApplyConfiguration, "origin", requestedOrigin);
    if (requestedOrigin == 0) {
        NX_MESSAGE(loggerApplyConfiguration, 6000, "No Configuration to Apply for the interface");
        return leave(false);
    }
    if (requestedOrigin != currentOrigin) node.setProperty(NodeLexicon::AddressOrigin, requestedOrigin);

    applyHostSettings(cfg_data);

    bool brestart = false;
    if (!cfg_data->ipAddress.empty()) {
        NX_VAR(loggerApplyConfiguration, "ipv4_addr", cfg_data->ipAddress.c_str());
        node.setProperty(NodeLexicon::IPv4Address, cfg_data->ipAddress);
        if (cfg_data->ipAddress != currentIPv4) brestart = true;
    }
    if (!cfg_data->subnet_mask.empty()) node.setProperty(NodeLexicon::SubnetMask, cfg_data->subnet_mask);
    // A new gateway takes effect without a reboot.
    if (!cfg_data->ipGateway.empty()) {
        NX_VAR(loggerApplyConfiguration, "ipv4_gateway", cfg_data->ipGateway.c_str());
        node.setProperty(NodeLexicon::IPv4Gateway, cfg_data->ipGateway);
    }
    std::string ipv6_gateway;
    node.getProperty(NodeLexicon::IPv6Gateway, ipv6_gateway);
    NX_VAR(loggerApplyConfiguration, "ipv6_gateway", ipv6_gateway.c_str());
    if (!cfg_data->ipv6Gateway.empty() && cfg_data->ipv6Gateway != ipv6_gateway) {
        NX_MESSAGE(loggerApplyConfiguration, 3000, "Inside the Gateway Calling setProperty");
        node.setProperty(NodeLexicon::IPv6Gateway, cfg_data->ipv6Gateway);
    }
    if (!cfg_data->ipv6Address.empty()) {
        // The ESX 4.1 console takes the address with its prefix length.
        if (checkESX4_1Release()) {
            char prefix[16];
            std::snprintf(prefix, sizeof prefix, "%d", static_cast<int>(cfg_data->ipv6_prefix));
            cfg_data->ipv6Address += std::string("/") + prefix;
        }
        NX_VAR(loggerApplyConfiguration, "ipv6_addr", cfg_data->ipv6Address.c_str());
        node.setProperty(NodeLexicon::IPv6Address, cfg_data->ipv6Address);
        if (cfg_data->ipv6Address != currentIPv6) brestart = true;
    }
    if (cfg_data->ipv6_prefix != 0) {
        const unsigned int ipv6_prefixlen = cfg_data->ipv6_prefix;
        NX_VAR(loggerApplyConfiguration, "ipv6_prefixlen", ipv6_prefixlen);
        node.setProperty(NodeLexicon::PrefixLength, ipv6_prefixlen);
    }

    NX_VAR(loggerApplyConfiguration, "network_restart", 0u);
    // Leaving static addressing for DHCP only takes hold after a reboot.
    if (currentOrigin == 3 && requestedOrigin == 1) brestart = true;
    NX_VAR(loggerApplyConfiguration, "brestart", static_cast<unsigned>(brestart));

    // Only an interface whose origin was unknown is brought up by restarting the network here;
    // every other change waits for the interface's next start or for the reboot.
    if (!brestart && currentOrigin == 0) {
        std::string output;
        if (PlatformUtilities::runCommand(kNetworkRestartCommand, output))
            NX_MESSAGE(loggerApplyConfiguration, 3000, "Network Restarted Successfully");
    }
    return leave(brestart);
}

void* SystemRebootThread(void*) {
    NX_ENTER(loggerApplyConfiguration);
    // Nothing may escape a thread of the object manager's process.
    try {
        rebootSystem();
    } catch (const std::exception& e) {
        NX_MESSAGE(loggerApplyConfiguration, 6000, e.what());
    }
    NX_EXIT(loggerApplyConfiguration);
    pthread_exit(nullptr);
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
