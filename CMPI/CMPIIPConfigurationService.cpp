#include "CMPI/CMPIIPConfigurationService.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIIPConfigurationService = "Tarvo.IPInterfaceProvider";

CMPIIPConfigurationService::CMPIIPConfigurationService(const CMPIBroker* broker, const CMPIContext* context,
                                                       const std::string& nameSpace)
    : CMPIAdapter(broker, context, nameSpace, loggerCMPIIPConfigurationService, NX_FILE) {
    const std::string params =
        parameterList(" _broker=", broker, " _context=", context, " _namespace=", nameSpace);
    NX_ENTER_PARAMS(loggerCMPIIPConfigurationService, params.c_str());
    NX_EXIT_PARAMS(loggerCMPIIPConfigurationService, params.c_str());
}

CMPIIPConfigurationService::CMPIIPConfigurationService(const CMPIBroker* broker, const CMPIContext* context,
                                                       const CMPIObjectPath* path)
    : CMPIAdapter(broker, context, ProviderUtilities::getNamespace(path), loggerCMPIIPConfigurationService,
                  NX_FILE) {
    const std::string params = parameterList(" _broker=", broker, " _context=", context, " objectPath=", path);
    NX_ENTER_PARAMS(loggerCMPIIPConfigurationService, params.c_str());
    setObjectPath(path);
    NX_EXIT_PARAMS(loggerCMPIIPConfigurationService, params.c_str());
}

void CMPIIPConfigurationService::setObjectPath(const CMPIObjectPath* path) {
    const std::string params = parameterList(" objectPath=", path);
    NX_ENTER_PARAMS(loggerCMPIIPConfigurationService, params.c_str());
    std::string systemName;
    if (ProviderUtilities::getKeyCount(path) != 0 && ProviderUtilities::getKeyProperty(path, "SystemName", systemName)) {
        NX_VAR(loggerCMPIIPConfigurationService, "SystemName", systemName.c_str());
        model.setFilter(IPConfigurationService::FilterType::BySystemName, systemName);
    }
    NX_EXIT_PARAMS(loggerCMPIIPConfigurationService, params.c_str());
}

CMPIObjectPath* CMPIIPConfigurationService::getObjectPath() {
    NX_ENTER(loggerCMPIIPConfigurationService);
    CMPIObjectPath* path = newClassPath("KVRNX_IPConfigurationService");
    if (path) {
        using M = IPConfigurationService;
        copyKey(path, "SystemCreationClassName", &M::getSystemCreationClassName);
        copyKey(path, "SystemName", &M::getSystemName);
        copyKey(path, "CreationClassName", &M::getCreationClassName);
        copyKey(path, "Name", &M::getName);
    }
    NX_EXIT(loggerCMPIIPConfigurationService);
    return path;
}

CMPIInstance* CMPIIPConfigurationService::getCMPIInstance(const char** properties) {
    const std::string params = parameterList(" properties=", properties);
    NX_ENTER_PARAMS(loggerCMPIIPConfigurationService, params.c_str());
    CMPIInstance* instance = ProviderUtilities::createInstance(broker, getObjectPath());
    if (instance) {
        using M = IPConfigurationService;
        copyProperty<std::string>(instance, "ElementName", &M::getElementName);
        copyProperty<std::string>(instance, "SystemCreationClassName", &M::getSystemCreationClassName);
        copyProperty<std::string>(instance, "SystemName", &M::getSystemName);
        copyProperty<std::string>(instance, "CreationClassName", &M::getCreationClassName);
        copyProperty<std::string>(instance, "Name", &M::getName);
    }
    NX_EXIT_PARAMS(loggerCMPIIPConfigurationService, params.c_str());
    return instance;
}

CMPIUint32 CMPIIPConfigurationService::executeMethod(const CMPIArgs*, CMPIArgs*, CMPIStatus* status) {
    // Not built yet: ApplySettingToIPProtocolEndpoint is refused until its implementation lands.
    NX_METHOD(loggerCMPIIPConfigurationService);
    if (status) *status = CMPIStatus{CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
    return CMPI_RC_ERR_NOT_SUPPORTED;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
