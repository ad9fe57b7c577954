#include "Lindows/IPConfigurationService.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerIPConfigurationService = "Tarvo.IPInterfaceProvider";

const std::string& IPConfigurationService::logger() { return loggerIPConfigurationService; }

IPConfigurationService::IPConfigurationService() : instanceCount(0) {
    NX_ENTER(loggerIPConfigurationService);
    NX_EXIT(loggerIPConfigurationService);
}

IPConfigurationService& IPConfigurationService::operator++() {
    ++instanceCount;
    Base::operator++();
    return *this;
}

IPConfigurationService::operator bool() const {
    return instanceCount <= 0 && static_cast<bool>(instrumentation);
}

void IPConfigurationService::initialize() {
    Base::initialize();
    instanceCount = 0;
}

bool IPConfigurationService::filterHolds(const Filter& filter) {
    if (filter.filterType != BySystemName) return true;
    std::string systemName;
    return !getSystemName(systemName) || systemName == filter.reference;
}

bool IPConfigurationService::getCreationClassName(std::string& creationClassName) {
    NX_ENTER(loggerIPConfigurationService);
    creationClassName = "KVRNX_IPConfigurationService";
    NX_EXIT(loggerIPConfigurationService);
    return true;
}

bool IPConfigurationService::getName(std::string& name) {
    NX_ENTER(loggerIPConfigurationService);
    name = "IPConfigService";
    NX_EXIT(loggerIPConfigurationService);
    return true;
}

bool IPConfigurationService::getElementName(std::string& elementName) {
    NX_ENTER(loggerIPConfigurationService);
    elementName = "IPConfigService";
    NX_EXIT(loggerIPConfigurationService);
    return true;
}

// The service always belongs to the host, never to the service processor.
bool IPConfigurationService::getSystemCreationClassName(std::string& systemCreationClassName) {
    NX_ENTER(loggerIPConfigurationService);
    systemCreationClassName = "KVRNX_ComputerSystem";
    NX_EXIT(loggerIPConfigurationService);
    return true;
}

bool IPConfigurationService::getSystemName(std::string& systemName) {
    NX_ENTER(loggerIPConfigurationService);
    bool found = localHostName(systemName);
    if (!found) NX_MESSAGE(loggerIPConfigurationService, 6000, "gethostname Failed");
    NX_EXIT(loggerIPConfigurationService);
    return found;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
