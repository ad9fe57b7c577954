#include "Lindows/IPConfigurationService.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerIPConfigurationService = "Tarvo.IPInterfaceProvider";

const std::string& IPConfigurationService::logger() { return loggerIPConfigurationService; }

IPConfigurationService::IPConfigurationService() : Base(NX_SITE), instanceCount(0) {}

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
    return fixed(NX_SITE, creationClassName, "KVRNX_IPConfigurationService");
}

bool IPConfigurationService::getName(std::string& name) {
    return fixed(NX_SITE, name, "IPConfigService");
}

bool IPConfigurationService::getElementName(std::string& elementName) {
    return fixed(NX_SITE, elementName, "IPConfigService");
}

// The service always belongs to the host, never to the service processor.
bool IPConfigurationService::getSystemCreationClassName(std::string& systemCreationClassName) {
    return fixed(NX_SITE, systemCreationClassName, "KVRNX_ComputerSystem");
}

bool IPConfigurationService::getSystemName(std::string& systemName) {
    return Base::systemName(NX_SITE, false, systemName);
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
