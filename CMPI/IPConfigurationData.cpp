#include "CMPI/IPConfigurationData.h"

#include <cmpift.h>
#include <cmpimacs.h>
#include <strings.h>

#include <string>
#include <vector>

#include "CMPI/CMPIAdapter.h"
#include "Nx/ProviderUtilities.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerIPConfigurationData = "Tarvo.IPInterfaceProvider";

namespace {

CMPIStatus okStatus() { return CMPIStatus{CMPI_RC_OK, nullptr}; }
CMPIStatus failedStatus() { return CMPIStatus{CMPI_RC_ERR_FAILED, nullptr}; }

// A missing ConfigurationName counts as empty: the setting has no name to keep.
void noteConfigurationName(const CMPIInstance* setting, IP_CONFIG_DATA* cfg_data) {
    std::string configurationName;
    ProviderUtilities::getProperty(setting, "ConfigurationName", configurationName);
    if (configurationName.empty()) cfg_data->configNameEmpty = true;
}

// The assignment setting readers, traced as function with their parameters: a null setting or
// record fails; otherwise read fills the record and the setting's ConfigurationName is noted.
template <class Read>
CMPIStatus readSetting(const char* function, const CMPIBroker* broker, const CMPIContext* context,
                       CMPIInstance* setting, IP_CONFIG_DATA* cfg_data, Read read) {
    const AdapterTrace tracer(loggerIPConfigurationData, NX_FILE);
    const TraceParams params(" _broker=", broker, " _context=", context, " setting=", setting, " cfg_data=", cfg_data);
    tracer(function, __LINE__, ENTERING, params);
    const bool valid = setting && cfg_data;
    if (valid) {
        read(tracer, function);
        noteConfigurationName(setting, cfg_data);
    }
    tracer(function, __LINE__, EXITING, params);
    return valid ? okStatus() : failedStatus();
}

}  // namespace

CMPIStatus getStaticConfigurationDetails(const CMPIBroker* broker, const CMPIContext* context,
                                         CMPIInstance* setting, IP_CONFIG_DATA* cfg_data) {
    const auto read = [&](const AdapterTrace& tracer, const char* function) {
        cfg_data->addr_origin = 3;
        ProviderUtilities::getProperty(setting, "IPv6SubnetPrefixLength", cfg_data->ipv6_prefix);
        ProviderUtilities::getProperty(setting, "IPv6Address", cfg_data->ipv6Address);
        ProviderUtilities::getProperty(setting, "GatewayIPv6Address", cfg_data->ipv6Gateway);
        ProviderUtilities::getProperty(setting, "IPv4Address", cfg_data->ipAddress);
        ProviderUtilities::getProperty(setting, "SubnetMask", cfg_data->subnet_mask);
        ProviderUtilities::getProperty(setting, "GatewayIPv4Address", cfg_data->ipGateway);
        const std::string ipData = cfg_data->ipAddress + " " + cfg_data->subnet_mask + " " + cfg_data->ipGateway;
        tracer.variable(function, __LINE__, "ipData", ipData.c_str());
    };
    return readSetting(__func__, broker, context, setting, cfg_data, read);
}

CMPIStatus getDHCPConfigurationDetails(const CMPIBroker* broker, const CMPIContext* context,
                                       CMPIInstance* setting, IP_CONFIG_DATA* cfg_data) {
    return readSetting(__func__, broker, context, setting, cfg_data, [](const AdapterTrace&, const char*) {});
}

CMPIStatus getDNSConfigurationDetails(const CMPIBroker* broker, const CMPIContext* context,
                                      CMPIInstance* setting, CMPIObjectPath* endpoint,
                                      IP_CONFIG_DATA* cfg_data) {
    const TraceParams params(" _broker=", broker, " _context=", context, " setting=", setting, " endpoint=", endpoint,
                             " cfg_data=", cfg_data);
    NX_ENTER_PARAMS(loggerIPConfigurationData, params.c_str());
    const auto leave = [&](CMPIStatus status) {
        NX_EXIT_PARAMS(loggerIPConfigurationData, params.c_str());
        return status;
    };
    if (!broker || !setting || !endpoint || !cfg_data) return leave(failedStatus());

    const std::string objstring = ProviderUtilities::toString(broker, endpoint);
    NX_VAR(loggerIPConfigurationData, "objstring", objstring.c_str());

    // The DNS settings apply only to an endpoint that has a DNS client; the client itself is
    // not read.
    CMPIStatus status = okStatus();
    CMPIEnumeration* dnsEndpoints = CBAssociators(broker, context, endpoint, "KVRNX_DNSSAPSAPDependency",
                                                  "KVRNX_DNSProtocolEndpoint", nullptr, nullptr, nullptr, &status);
    if (status.rc != CMPI_RC_OK || !dnsEndpoints) {
        if (status.rc == CMPI_RC_OK) status = failedStatus();
        NX_MESSAGE(loggerIPConfigurationData, 6000, errorStatusText(status).c_str());
        NX_MESSAGE(loggerIPConfigurationData, 6000, "CBAssociators Failed for the target Class");
        return leave(status);
    }
    if (!CMHasNext(dnsEndpoints, nullptr)) return leave(okStatus());

    CMPIObjectPath* settingPath = CMGetObjectPath(setting, nullptr);
    const std::string settingClass = settingPath ? ProviderUtilities::getClassName(settingPath) : std::string();
    NX_VAR(loggerIPConfigurationData, "settingClass", settingClass.c_str());

    if (strcasecmp(settingClass.c_str(), "KVRNX_DNSSettingData") == 0) {
        std::string text;
        if (ProviderUtilities::getProperty(setting, "RequestedHostname", text)) cfg_data->dnsHostName = text;
        if (ProviderUtilities::getProperty(setting, "DomainName", text)) cfg_data->dnsDomainName = text;
        noteConfigurationName(setting, cfg_data);
        std::vector<std::string> servers;
        if (ProviderUtilities::getProperty(setting, "DNSServerAddresses", servers)) {
            for (const std::string& server : servers) {
                NX_VAR(loggerIPConfigurationData, "DNSServer", server.c_str());
                cfg_data->dnsServers.push_back(server);
            }
        }
    } else if (strcasecmp(settingClass.c_str(), "KVRNX_DNSGeneralSettingData") == 0) {
        // The general setting is shared by all interfaces: its name never marks the request.
        std::vector<std::string> suffixes;
        if (ProviderUtilities::getProperty(setting, "DNSSuffixesToAppend", suffixes))
            cfg_data->dnsSuffixes.insert(cfg_data->dnsSuffixes.end(), suffixes.begin(), suffixes.end());
    }
    return leave(okStatus());
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
