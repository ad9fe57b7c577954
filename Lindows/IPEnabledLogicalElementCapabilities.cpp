#include "Lindows/IPEnabledLogicalElementCapabilities.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerIPEnabledLogicalElementCapabilities = "Tarvo.IPInterfaceProvider";

using Nx::NodeLexicon::Properties;

const std::string& IPEnabledLogicalElementCapabilities::logger() { return loggerIPEnabledLogicalElementCapabilities; }

IPEnabledLogicalElementCapabilities::IPEnabledLogicalElementCapabilities() : Base(NX_SITE) {}

bool IPEnabledLogicalElementCapabilities::filterHolds(const Filter& filter) {
    if (filter.filterType != ByInstanceID) return true;
    // An unreadable name compares as empty.
    std::string name;
    instrumentation.getProperty(Properties::ElementName, name);
    return name == filter.reference;
}

bool IPEnabledLogicalElementCapabilities::getInstanceID(std::string& instanceID) {
    return readProperty(NX_SITE, Properties::ElementName, instanceID);
}

bool IPEnabledLogicalElementCapabilities::getElementName(std::string& elementName) {
    return readProperty(NX_SITE, Properties::ElementName, elementName);
}

bool IPEnabledLogicalElementCapabilities::getElementNameEditSupported(bool& editSupported) {
    NX_ENTER(loggerIPEnabledLogicalElementCapabilities);
    bool readOnly = false;
    bool answered = instrumentation.isPropertyReadOnly(Properties::ElementName, readOnly);
    if (answered) editSupported = !readOnly;
    NX_EXIT(loggerIPEnabledLogicalElementCapabilities);
    return answered;
}

// No maximum is reported.
bool IPEnabledLogicalElementCapabilities::getMaxElementNameLen(unsigned short& /*maxLength*/) {
    NX_ENTER(loggerIPEnabledLogicalElementCapabilities);
    NX_EXIT(loggerIPEnabledLogicalElementCapabilities);
    return false;
}

// Exactly the states an endpoint accepts: Enabled, Disabled, Reset.
bool IPEnabledLogicalElementCapabilities::getRequestedStatesSupported(std::vector<unsigned short>& states) {
    NX_ENTER(loggerIPEnabledLogicalElementCapabilities);
    states.push_back(2);
    states.push_back(3);
    states.push_back(11);
    NX_EXIT(loggerIPEnabledLogicalElementCapabilities);
    return true;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
