#include "CMPI/CMPIStaticIPAssignmentSettingData.h"
#include "Lindows/ConfigurationFile.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIStaticIPAssignmentSettingData = "Tarvo.IPInterfaceProvider";

CMPIStaticIPAssignmentSettingData::CMPIStaticIPAssignmentSettingData(const CMPIBroker* broker,
                                                                     const CMPIContext* context,
                                                                     const std::string& nameSpace)
    : CMPIAdapter(broker, context, nameSpace, loggerCMPIStaticIPAssignmentSettingData, NX_FILE, __func__) {}

CMPIStaticIPAssignmentSettingData::CMPIStaticIPAssignmentSettingData(const CMPIBroker* broker,
                                                                     const CMPIContext* context,
                                                                     const CMPIObjectPath* path)
    : CMPIAdapter(broker, context, path, loggerCMPIStaticIPAssignmentSettingData, NX_FILE) {
    constructedAt(__func__, path, [&] { setObjectPath(path); });
}

void CMPIStaticIPAssignmentSettingData::setObjectPath(const CMPIObjectPath* path) {
    filterByKeys(__func__, TraceParams(" objectPath=", path), path,
                 {{"InstanceID", StaticIPAssignmentSettingData::FilterType::ByInstanceID}});
}

CMPIObjectPath* CMPIStaticIPAssignmentSettingData::getObjectPath() {
    return instanceIdPath(__func__, "KVRNX_StaticIPAssignmentSettingData",
                          &StaticIPAssignmentSettingData::getInstanceID);
}

CMPIInstance* CMPIStaticIPAssignmentSettingData::getCMPIInstance(const char** properties) {
    return instanceOf(__func__, properties, nullptr, this, [this](CMPIInstance* instance) {
        using M = StaticIPAssignmentSettingData;
        copyProperty<std::string>(instance, "InstanceID", &M::getInstanceID);
        copyProperty<std::string>(instance, "ElementName", &M::getElementName);
        copyProperty<unsigned short>(instance, "AddressOrigin", &M::getAddressOrigin);
        copyProperty<std::string>(instance, "IPv4Address", &M::getIPv4Address);
        copyProperty<std::string>(instance, "IPv6Address", &M::getIPv6Address);
        copyProperty<std::string>(instance, "SubnetMask", &M::getSubnetMask);
        copyProperty<std::string>(instance, "GatewayIPv4Address", &M::getGatewayIPv4Address);
        copyProperty<unsigned short>(instance, "IPv6SubnetPrefixLength", &M::getIPv6SubnetPrefixLength);
        // Both type getters land in IPv6AddressType, the IPv6 one last; the instance has never
        // carried an AddressType and clients read the type from here.
        copyProperty<unsigned short>(instance, "IPv6AddressType", &M::getAddressType);
        copyProperty<unsigned short>(instance, "IPv6AddressType", &M::getIPv6AddressType);
        copyProperty<std::string>(instance, "GatewayIPv6Address", &M::getGatewayIPv6Address);
        copyProperty<std::string>(instance, "ConfigurationName", &M::getConfigurationName);
    });
}

CMPIStatus CMPIStaticIPAssignmentSettingData::modifyInstance(const CMPIInstance* newInstance) {
    const TraceParams params(" newInstance=", newInstance);
    NX_ENTER_PARAMS(loggerCMPIStaticIPAssignmentSettingData, params.c_str());
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    if (newInstance) {
        const CMPIObjectPath* path = CMGetObjectPath(newInstance, nullptr);
        setObjectPath(path);
        NX_VAR(loggerCMPIStaticIPAssignmentSettingData, "objstring", ProviderUtilities::toString(broker, path).c_str());

        using M = StaticIPAssignmentSettingData;
        // Applies one address property if present and safe to write into the interface file.
        // Values go in one by one: a rejection leaves the earlier ones written.
        const auto apply = [&](const char* name, auto setter, bool ipv6) {
            std::string value;
            if (!ProviderUtilities::getProperty(newInstance, name, value)) return true;
            NX_VAR(loggerCMPIStaticIPAssignmentSettingData, name, value.c_str());
            if (ProviderUtilities::ValidateInput(value, ipv6 ? ":" : "") == 0) {
                if (ipv6)
                    NX_MESSAGE(loggerCMPIStaticIPAssignmentSettingData, 6000,
                               "Invalid Security data passed in the property value");
                status = refuseProperty(name);
                return false;
            }
            std::invoke(setter, model, value);
            return true;
        };
        if (apply("IPv4Address", &M::setIPv4Address, false) && apply("SubnetMask", &M::setSubnetMask, false) &&
            apply("GatewayIPv4Address", &M::setGatewayIPv4Address, false) &&
            apply("IPv6Address", &M::setIPv6Address, true) &&
            apply("GatewayIPv6Address", &M::setGatewayIPv6Address, true)) {
            unsigned short prefixLength = 0;
            if (ProviderUtilities::getProperty(newInstance, "IPv6SubnetPrefixLength", prefixLength))
                model.setIPv6SubnetPrefixLength(prefixLength);
            // A modification that leaves ConfigurationName out clears it.
            std::string configurationName;
            ProviderUtilities::getProperty(newInstance, "ConfigurationName", configurationName);
            if (isSafeConfigurationValue(configurationName))
                model.setConfigurationName(configurationName);
            else
                status = refuseProperty("ConfigurationName");
        }
    }
    NX_EXIT_PARAMS(loggerCMPIStaticIPAssignmentSettingData, params.c_str());
    return status;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
