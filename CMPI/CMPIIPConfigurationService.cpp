#include "CMPI/CMPIIPConfigurationService.h"

#include <pthread.h>
#include <sys/stat.h>

#include <memory>
#include <string>
#include <vector>

#include "CMPI/ApplyConfiguration.h"
#include "CMPI/CMPIStaticIPAssignmentSettingData.h"
#include "Nx/Instrumentation.h"
#include "Nx/NodeLexicon.h"
#include "Nx/PlatformUtilities.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIIPConfigurationService = "Tarvo.IPInterfaceProvider";

CMPIIPConfigurationService::CMPIIPConfigurationService(const CMPIBroker* broker, const CMPIContext* context,
                                                       const std::string& nameSpace)
    : CMPIAdapter(broker, context, nameSpace, loggerCMPIIPConfigurationService, NX_FILE, __func__) {}

CMPIIPConfigurationService::CMPIIPConfigurationService(const CMPIBroker* broker, const CMPIContext* context,
                                                       const CMPIObjectPath* path)
    : CMPIAdapter(broker, context, path, loggerCMPIIPConfigurationService, NX_FILE) {
    constructedAt(__func__, path, [&] { setObjectPath(path); });
}

void CMPIIPConfigurationService::setObjectPath(const CMPIObjectPath* path) {
    filterByKeys(__func__, TraceParams(" objectPath=", path), path,
                 {{"SystemName", IPConfigurationService::FilterType::BySystemName}});
}

CMPIObjectPath* CMPIIPConfigurationService::getObjectPath() {
    return objectPath(__func__, "KVRNX_IPConfigurationService", [this](CMPIObjectPath* path) {
        using M = IPConfigurationService;
        copyKey(path, "SystemCreationClassName", &M::getSystemCreationClassName);
        copyKey(path, "SystemName", &M::getSystemName);
        copyKey(path, "CreationClassName", &M::getCreationClassName);
        copyKey(path, "Name", &M::getName);
    });
}

CMPIInstance* CMPIIPConfigurationService::getCMPIInstance(const char** properties) {
    return instanceOf(__func__, properties, nullptr, this, [this](CMPIInstance* instance) {
        using M = IPConfigurationService;
        copyProperty<std::string>(instance, "ElementName", &M::getElementName);
        copyProperty<std::string>(instance, "SystemCreationClassName", &M::getSystemCreationClassName);
        copyProperty<std::string>(instance, "SystemName", &M::getSystemName);
        copyProperty<std::string>(instance, "CreationClassName", &M::getCreationClassName);
        copyProperty<std::string>(instance, "Name", &M::getName);
    });
}

const char CMPIIPConfigurationService::DNSGeneralSettingDataClass[] = "KVRNX_DNSGeneralSettingData";

CMPIUint32 CMPIIPConfigurationService::executeMethod(const CMPIArgs* in, CMPIArgs* out, CMPIStatus* status) {
    NX_METHOD(loggerCMPIIPConfigurationService);
    const auto setStatus = [&](CMPIrc rc, const char* text) {
        if (status) *status = makeStatus(rc, text);
    };

    const CMPIData configurationArg = argument(in, "Configuration");
    const CMPIData endpointArg = argument(in, "Endpoint");
    if (configurationArg.type != CMPI_ref || endpointArg.type != CMPI_ref) {
        setStatus(CMPI_RC_ERR_INVALID_PARAMETER, "Invalid Type of Parameter");
        return 4;
    }
    CMPIObjectPath* configuration = (configurationArg.state & CMPI_nullValue) ? nullptr : configurationArg.value.ref;
    if (!configuration) {
        setStatus(CMPI_RC_ERR_INVALID_PARAMETER, "Configuration Parameter passed has NULL value");
        return 4;
    }
    CMPIObjectPath* endpoint = (endpointArg.state & CMPI_nullValue) ? nullptr : endpointArg.value.ref;
    if (!endpoint) {
        // Clients have always seen "failed" here, unlike for a null Configuration.
        setStatus(CMPI_RC_ERR_FAILED, "Endpoint Parameter passed has NULL value");
        return 4;
    }

    std::string name;
    ProviderUtilities::getKeyProperty(endpoint, "Name", name);
    NX_VAR(loggerCMPIIPConfigurationService, "name", name.c_str());
    // A bridge's addresses belong to its ports: nothing is done and nothing is reported.
    if (checkIfbridgeInteface(name)) return 1;

    CMSetNameSpace(endpoint, nameSpace.c_str());
    if (!CMNewInstance(broker, endpoint, nullptr)) {
        setStatus(CMPI_RC_ERR_FAILED, "Failed to get the IP Protocol instance");
        return 2;
    }

    CMSetNameSpace(configuration, nameSpace.c_str());
    std::string instanceId;
    ProviderUtilities::getKeyProperty(configuration, "InstanceID", instanceId);
    NX_VAR(loggerCMPIIPConfigurationService, "instanceId", instanceId.c_str());

    auto cfg_data = std::make_unique<IP_CONFIG_DATA>();
    cfg_data->name = name;
    const auto freeRecord = [&]() {
        cfg_data.reset();
        NX_MESSAGE(loggerCMPIIPConfigurationService, 3000, "Memory Freed Successfully");
    };

    // Gathering failures are only logged: whatever was gathered is applied.
    if (instanceId.find("static") != std::string::npos) {
        CMPIObjectPath* staticPath = newClassPath("KVRNX_StaticIPAssignmentSettingData");
        CMPIInstance* setting = staticPath ? getStaticConfiguration(staticPath, instanceId) : nullptr;
        if (setting && getStaticConfigurationDetails(broker, context, setting, cfg_data.get()).rc != CMPI_RC_OK)
            NX_MESSAGE(loggerCMPIIPConfigurationService, 6000,
                       "modifyStaticConfiguration for KVRNX_StaticIPAssignmentSettingData Failed");
    } else if (CMPIInstance* setting = getConfiguartionSetting("KVRNX_DHCPSettingData", instanceId)) {
        NX_MESSAGE(loggerCMPIIPConfigurationService, 3000,
                   "InstanceID matched for KVRNX_DHCPSettingData class association");
        if (getDHCPConfigurationDetails(broker, context, setting, cfg_data.get()).rc != CMPI_RC_OK)
            NX_MESSAGE(loggerCMPIIPConfigurationService, 6000, "getDHCPConfigurationDetails Failed");
        else
            cfg_data->addr_origin = 4;
    }

    if (CMPIInstance* dns = getConfiguartionSetting("KVRNX_DNSSettingData", instanceId)) {
        NX_MESSAGE(loggerCMPIIPConfigurationService, 3000,
                   "InstanceID matched for KVRNX_DNSSettingData class association");
        if (getDNSConfigurationDetails(broker, context, dns, endpoint, cfg_data.get()).rc != CMPI_RC_OK)
            NX_MESSAGE(loggerCMPIIPConfigurationService, 6000,
                       "modifyDNSConfiguration for KVRNX_DNSSettingData Failed");
    }
    if (CMPIInstance* general = getConfiguartionSetting(DNSGeneralSettingDataClass, instanceId)) {
        NX_MESSAGE(loggerCMPIIPConfigurationService, 3000,
                   "InstanceID matched for KVRNX_DNSGenralSettingData class association");
        if (getDNSConfigurationDetails(broker, context, general, endpoint, cfg_data.get()).rc != CMPI_RC_OK)
            NX_MESSAGE(loggerCMPIIPConfigurationService, 6000,
                       "modifyDNSConfiguration for KVRNX_DNSGenralSettingData Failed");
    }

    // NetworkManager would undo whatever is written to the interface files.
    if (checkNetworkManagerStatus()) {
        setStatus(CMPI_RC_ERR_FAILED,
                  "Configuration Cannot be Applied since NetworkManager Tool is present in Endpoint");
        freeRecord();
        return 4;
    }
    if (cfg_data->dnsHostName.empty()) {
        setStatus(CMPI_RC_ERR_FAILED, "Configuration Cannot be applied since hostname is empty");
        freeRecord();
        return 4;
    }

    returnJob(out);

    const bool reboot = isSystemRebootRequired(cfg_data.get());
    const bool configNameEmpty = cfg_data->configNameEmpty;
    freeRecord();

    // A named configuration is left for the administrator to reboot into (5); an unnamed one
    // reboots the host at once.
    if (!configNameEmpty) return reboot ? 5 : 0;
    if (reboot) {
        pthread_t thread;
        if (pthread_create(&thread, nullptr, SystemRebootThread, nullptr) == 0)
            pthread_detach(thread);
        else
            NX_MESSAGE(loggerCMPIIPConfigurationService, 6000, "Failed to create IPConfigurationThread");
    }
    return 0;
}

CMPIInstance* CMPIIPConfigurationService::getConfiguartionSetting(const char* className,
                                                                  const std::string& instanceId) {
    const TraceParams params(" className=", className, " instanceId=", instanceId);
    NX_ENTER_PARAMS(loggerCMPIIPConfigurationService, params.c_str());
    const auto leave = [&](CMPIInstance* found) {
        NX_EXIT_PARAMS(loggerCMPIIPConfigurationService, params.c_str());
        return found;
    };
    CMPIObjectPath* classPath = className ? newClassPath(className) : nullptr;
    if (!classPath) return leave(nullptr);

    CMPIStatus rc = {CMPI_RC_OK, nullptr};
    CMPIEnumeration* instances = CBEnumInstances(broker, context, classPath, nullptr, &rc);
    if (rc.rc != CMPI_RC_OK || !instances) {
        NX_MESSAGE(loggerCMPIIPConfigurationService, 6000, errorStatusText(rc).c_str());
        NX_MESSAGE(loggerCMPIIPConfigurationService, 6000, "CBAssociators Failed for the CIM_OrderedComponent");
        return leave(nullptr);
    }
    NX_MESSAGE(loggerCMPIIPConfigurationService, 3000, "CBEnumInstances Success for the CIM_OrderedComponent");

    const bool anyGeneralSetting = className == DNSGeneralSettingDataClass;
    while (CMHasNext(instances, nullptr)) {
        NX_MESSAGE(loggerCMPIIPConfigurationService, 3000, "Inside While");
        CMPIData next = CMGetNext(instances, nullptr);
        CMPIInstance* instance = next.value.inst;
        if (!instance) continue;
        NX_MESSAGE(loggerCMPIIPConfigurationService, 3000, "ObjectPath is not NULL");
        std::string settingId;
        if (!ProviderUtilities::getProperty(instance, "InstanceID", settingId)) continue;
        if (anyGeneralSetting || instanceId.find(settingId) != std::string::npos) {
            NX_MESSAGE(loggerCMPIIPConfigurationService, 3000, "InstanceID matched for SettingData class association");
            return leave(instance);
        }
    }
    return leave(nullptr);
}

CMPIInstance* CMPIIPConfigurationService::getStaticConfiguration(CMPIObjectPath* classPath,
                                                                 const std::string& instanceId) {
    const TraceParams params(" classPath=", classPath, " instanceId=", instanceId);
    NX_ENTER_PARAMS(loggerCMPIIPConfigurationService, params.c_str());
    CMPIInstance* found = nullptr;
    CMPIStaticIPAssignmentSettingData settings(broker, context, classPath);
    for (; settings && !found; ++settings) {
        CMPIInstance* instance = settings.getCMPIInstance(nullptr);
        std::string settingId;
        if (instance && ProviderUtilities::getProperty(instance, "InstanceID", settingId) &&
            instanceId.find(settingId) != std::string::npos)
            found = instance;
    }
    NX_EXIT_PARAMS(loggerCMPIIPConfigurationService, params.c_str());
    return found;
}

bool checkNetworkManagerStatus() {
    NX_ENTER(loggerCMPIIPConfigurationService);
    static const char* const command = "rpm -qa | grep NetworkManager*";
    std::string output;
    bool installed = false;
    if (!PlatformUtilities::runCommand(command, output))
        NX_MESSAGE(loggerCMPIIPConfigurationService, 6000, "rpm -qa | grep NetworkManager* failed");
    else
        installed = !output.empty();  // any package line at all, the library alone included
    NX_EXIT(loggerCMPIIPConfigurationService);
    return installed;
}

bool checkESX4_1Release() {
    NX_ENTER(loggerCMPIIPConfigurationService);
    bool esx = false;
    struct stat release;
    if (::stat(PlatformUtilities::hostPath("/etc/vmware-release").c_str(), &release) == 0) {
        std::string output;
        // Any release text with a 4 in it is taken for 4.1.
        esx = PlatformUtilities::runCommand("cat /etc/vmware-release | grep 4", output) && !output.empty();
    }
    NX_EXIT(loggerCMPIIPConfigurationService);
    return esx;
}

bool checkIfbridgeInteface(std::string name) {
    NX_ENTER(loggerCMPIIPConfigurationService);
    bool bridge = false;
    Instrumentation node;
    for (node.selectNode(NodeLexicon::IPEndpointNode); node && !bridge; ++node) {
        std::string elementName;
        node.getProperty(NodeLexicon::ElementName, elementName);
        if (elementName != name) continue;
        const std::string description = node.getNodeDescription();
        NX_VAR(loggerCMPIIPConfigurationService, "bridge", description.c_str());
        bridge = description == "Bridge";
    }
    NX_EXIT(loggerCMPIIPConfigurationService);
    return bridge;
}

bool isConfigurationSupportedOnRedhat(const IP_CONFIG_DATA* cfg_data) {
    NX_ENTER(loggerCMPIIPConfigurationService);
    const auto leave = [&](bool supported) {
        NX_EXIT(loggerCMPIIPConfigurationService);
        return supported;
    };
    if (!cfg_data) return leave(false);
    std::vector<std::string> l_vInterfaceName;
    Tokenize(cfg_data->name, l_vInterfaceName, "_");
    if (l_vInterfaceName.empty()) return leave(false);
    NX_VAR(loggerCMPIIPConfigurationService, "l_vInterfaceName[0]", l_vInterfaceName[0].c_str());

    Instrumentation node;
    for (node.selectNode(NodeLexicon::IPEndpointNode); node; ++node) {
        std::string l_strElementName;
        node.getProperty(NodeLexicon::ElementName, l_strElementName);
        NX_VAR(loggerCMPIIPConfigurationService, "l_strElementName", l_strElementName.c_str());
        if (l_strElementName == l_vInterfaceName[0]) break;
    }
    if (!node) return leave(false);
    std::string currentIPv4, currentIPv6;
    node.getProperty(NodeLexicon::IPv4Address, currentIPv4);
    node.getProperty(NodeLexicon::IPv6Address, currentIPv6);
    const bool keepsAddresses = (cfg_data->ipAddress.empty() || cfg_data->ipAddress == currentIPv4) &&
                                (cfg_data->ipv6Address.empty() || cfg_data->ipv6Address == currentIPv6);
    return leave(keepsAddresses || !checkNetworkManagerStatus());
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
