#include "Lindows/IPAssignmentSettingData.h"

#include "Lindows/ConfigurationFile.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerIPAssignmentSettingData = "Tarvo.IPInterfaceProvider";

using Nx::NodeLexicon::Properties;

const std::string& IPAssignmentSettingData::logger() { return loggerIPAssignmentSettingData; }

IPAssignmentSettingData::IPAssignmentSettingData() : Base(NX_SITE), assignmentKind(1), isCfg(false) {}

void IPAssignmentSettingData::setFilter(FilterType filterType, const std::string& reference, bool cfg) {
    isCfg = cfg;
    Base::setFilter(filterType, reference);
}

void IPAssignmentSettingData::initialize() {
    Base::initialize();
    assignmentKind = 1;
    isCfg = false;
}

void IPAssignmentSettingData::advance() {
    if (assignmentKind == 2) {
        ++instrumentation;
        assignmentKind = 1;
    } else {
        assignmentKind = 2;
    }
}

bool IPAssignmentSettingData::filterHolds(const Filter& filter) {
    if (filter.filterType != ByInstanceID) return true;
    std::string instanceId;
    if (!getInstanceId(instanceId)) return true;
    if (!isCfg) return instanceId == filter.reference;
    // Both views of an endpoint are wanted: compare only prefix and element name, and accept them
    // anywhere in the reference.
    std::string::size_type cut = instanceId.rfind('%');
    const std::string endpoint = cut == std::string::npos ? instanceId : instanceId.substr(0, cut);
    NX_VAR(loggerIPAssignmentSettingData, "ip_endpt", endpoint.c_str());
    return filter.reference.find(endpoint) != std::string::npos;
}

bool IPAssignmentSettingData::getInstanceId(std::string& instanceId) {
    NX_ENTER(loggerIPAssignmentSettingData);
    std::string name;
    instrumentation.getProperty(Properties::ElementName, name);
    instanceId = (isUnderServiceProcessor(instrumentation) ? "BMC%" : "Computer%") + name +
                 (assignmentKind == 1 ? "%static" : "%dhcp");
    NX_EXIT(loggerIPAssignmentSettingData);
    return true;
}

bool IPAssignmentSettingData::getElementName(std::string& elementName) {
    readProperty(NX_SITE, Properties::ElementName, elementName);
    return true;
}

bool IPAssignmentSettingData::getAddressOrigin(unsigned short& addressOrigin) {
    return fixed(NX_SITE, addressOrigin, 2);
}

bool IPAssignmentSettingData::getConfigurationName(std::string& configurationName) {
    NX_ENTER(loggerIPAssignmentSettingData);
    std::string name, path, value;
    instrumentation.getProperty(Properties::ElementName, name);
    if (configurationFilePath(name, path)) {
        NX_VAR(loggerIPAssignmentSettingData, "l_cFileName", path.c_str());
        if (readConfigurationValue(path, "CONFIG_NAME", value)) configurationName = value;
    }
    NX_EXIT(loggerIPAssignmentSettingData);
    return true;
}

bool IPAssignmentSettingData::setConfigurationName(const std::string& configurationName) {
    const TraceParams list(" configurationName=", configurationName);
    NX_ENTER_PARAMS(loggerIPAssignmentSettingData, list.c_str());
    std::string name, path;
    instrumentation.getProperty(Properties::ElementName, name);
    if (configurationFilePath(name, path)) {
        NX_VAR(loggerIPAssignmentSettingData, "fileName", path.c_str());
        modifyValue(path, "CONFIG_NAME", configurationName);
    }
    NX_EXIT_PARAMS(loggerIPAssignmentSettingData, list.c_str());
    return true;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
