// KVRNX_IPConfigurationService: the host's one IP configuration service and its method
// ApplySettingToIPProtocolEndpoint.
#pragma once

#include <string>

#include "CMPI/CMPIAdapter.h"
#include "CMPI/IPConfigurationData.h"
#include "Lindows/IPConfigurationService.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIIPConfigurationService : public CMPIAdapter<IPConfigurationService> {
public:
    CMPIIPConfigurationService(const CMPIBroker* broker, const CMPIContext* context, const std::string& nameSpace);
    CMPIIPConfigurationService(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

    // Only SystemName selects: any path naming the host's system addresses the one service.
    void setObjectPath(const CMPIObjectPath* path);
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);
    // ApplySettingToIPProtocolEndpoint. status may be null.
    CMPIUint32 executeMethod(const CMPIArgs* in, CMPIArgs* out, CMPIStatus* status);

    // The first instance of className whose InstanceID occurs in instanceId; null when none.
    // Passed DNSGeneralSettingDataClass itself (the pointer, not the text), the first instance
    // with any InstanceID matches: there is one general DNS setting for the whole host.
    CMPIInstance* getConfiguartionSetting(const char* className, const std::string& instanceId);
    // The same search over the static settings, walked here rather than asked of the broker.
    CMPIInstance* getStaticConfiguration(CMPIObjectPath* classPath, const std::string& instanceId);

    static const char DNSGeneralSettingDataClass[];
};

// Host checks of ApplySettingToIPProtocolEndpoint. Any failure reads as false.
bool checkNetworkManagerStatus();             // a NetworkManager package is installed
bool checkIfbridgeInteface(std::string name);  // the interface is a bridge
bool checkESX4_1Release();                    // the host is an ESX 4.1 service console
// Whether the configuration can be applied on this Red Hat host: the interface exists and, when
// NetworkManager is installed, the request keeps the interface's addresses (NetworkManager owns
// them). False for a null record.
bool isConfigurationSupportedOnRedhat(const IP_CONFIG_DATA* cfg_data);

}  // namespace IPInterfaceProvider
}  // namespace Nx
