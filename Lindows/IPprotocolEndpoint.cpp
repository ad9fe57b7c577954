#include "Lindows/IPprotocolEndpoint.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerIPprotocolEndpoint = "Tarvo.IPInterfaceProvider";

using Nx::NodeLexicon::Properties;

const std::string& IPprotocolEndpoint::logger() { return loggerIPprotocolEndpoint; }

IPprotocolEndpoint::IPprotocolEndpoint() {
    NX_ENTER(loggerIPprotocolEndpoint);
    NX_EXIT(loggerIPprotocolEndpoint);
}

bool IPprotocolEndpoint::filterHolds(const Filter& filter) {
    std::string value;
    switch (filter.filterType) {
        case BySystemName:
            // A host name we cannot learn must not hide the node.
            return !getSystemName(value) || value == filter.reference;
        case ByName:
            return !getName(value) || value == filter.reference;
    }
    return true;
}

bool IPprotocolEndpoint::onServiceProcessor() const {
    return instrumentation.getNodeDescription().find("BMC ") != std::string::npos;
}

bool IPprotocolEndpoint::getName(std::string& name) {
    NX_ENTER(loggerIPprotocolEndpoint);
    instrumentation.getProperty(Properties::ElementName, name);
    NX_EXIT(loggerIPprotocolEndpoint);
    return true;
}

bool IPprotocolEndpoint::getElementName(std::string& elementName) {
    NX_ENTER(loggerIPprotocolEndpoint);
    instrumentation.getProperty(Properties::ElementName, elementName);
    NX_EXIT(loggerIPprotocolEndpoint);
    return true;
}

bool IPprotocolEndpoint::getCreationClassName(std::string& creationClassName) {
    NX_ENTER(loggerIPprotocolEndpoint);
    creationClassName = "KVRNX_IPProtocolEndpoint";
    NX_EXIT(loggerIPprotocolEndpoint);
    return true;
}

bool IPprotocolEndpoint::getNameFormat(std::string& nameFormat) {
    NX_ENTER(loggerIPprotocolEndpoint);
    nameFormat = "NIC Name";
    NX_EXIT(loggerIPprotocolEndpoint);
    return true;
}

bool IPprotocolEndpoint::getDescription(std::string& description) {
    NX_ENTER(loggerIPprotocolEndpoint);
    description = instrumentation.getNodeDescription();
    NX_EXIT(loggerIPprotocolEndpoint);
    return true;
}

bool IPprotocolEndpoint::getSystemCreationClassName(std::string& systemCreationClassName) {
    NX_ENTER(loggerIPprotocolEndpoint);
    systemCreationClassName = onServiceProcessor() ? "KVRNX_SPComputerSystem" : "KVRNX_ComputerSystem";
    NX_EXIT(loggerIPprotocolEndpoint);
    return true;
}

bool IPprotocolEndpoint::getSystemName(std::string& systemName) {
    NX_ENTER(loggerIPprotocolEndpoint);
    bool found = true;
    if (onServiceProcessor()) {
        systemName = "BMC:-1";
    } else if (!localHostName(systemName)) {
        NX_MESSAGE(loggerIPprotocolEndpoint, 6000, "gethostname Failed");
        found = false;
    }
    NX_EXIT(loggerIPprotocolEndpoint);
    return found;
}

bool IPprotocolEndpoint::getIPv4Address(std::string& address) {
    NX_ENTER(loggerIPprotocolEndpoint);
    bool found = instrumentation.getProperty(Properties::IPv4Address, address);
    NX_EXIT(loggerIPprotocolEndpoint);
    return found;
}

bool IPprotocolEndpoint::getSubnetMask(std::string& subnetMask) {
    NX_ENTER(loggerIPprotocolEndpoint);
    bool found = instrumentation.getProperty(Properties::SubnetMask, subnetMask);
    NX_EXIT(loggerIPprotocolEndpoint);
    return found;
}

bool IPprotocolEndpoint::getIPv6Address(std::string& address) {
    NX_ENTER(loggerIPprotocolEndpoint);
    bool found = instrumentation.getProperty(Properties::IPv6Address, address);
    NX_EXIT(loggerIPprotocolEndpoint);
    return found;
}

bool IPprotocolEndpoint::getIPv6AddressType(unsigned short& addressType) {
    NX_ENTER(loggerIPprotocolEndpoint);
    unsigned int code = 0;
    bool found = instrumentation.getProperty(Properties::IPv6AddressType, code);
    if (found) addressType = static_cast<unsigned short>(code);
    NX_EXIT(loggerIPprotocolEndpoint);
    return found;
}

bool IPprotocolEndpoint::getProtocolIFType(unsigned short& protocolIFType) {
    NX_ENTER(loggerIPprotocolEndpoint);
    unsigned int code = 0;
    bool found = instrumentation.getProperty(Properties::ProtocolIFType, code);
    if (found) protocolIFType = static_cast<unsigned short>(code);
    NX_EXIT(loggerIPprotocolEndpoint);
    return found;
}

bool IPprotocolEndpoint::getPrefixLength(unsigned int& prefixLength) {
    NX_ENTER(loggerIPprotocolEndpoint);
    bool found = instrumentation.getProperty(Properties::PrefixLength, prefixLength);
    NX_EXIT(loggerIPprotocolEndpoint);
    return found;
}

bool IPprotocolEndpoint::getIPv6SubnetPrefixLength(unsigned short& prefixLength) {
    NX_ENTER(loggerIPprotocolEndpoint);
    unsigned int length = 0;
    bool found = instrumentation.getProperty(Properties::PrefixLength, length);
    if (found) prefixLength = static_cast<unsigned short>(length);
    NX_EXIT(loggerIPprotocolEndpoint);
    return found;
}

bool IPprotocolEndpoint::getIPVersionSupport(unsigned short& versionSupport) {
    NX_ENTER(loggerIPprotocolEndpoint);
    unsigned int code = 0;
    if (instrumentation.getProperty(Properties::IPVersion, code) && code >= 1 && code <= 3)
        versionSupport = static_cast<unsigned short>(code);
    NX_EXIT(loggerIPprotocolEndpoint);
    return true;
}

bool IPprotocolEndpoint::getAddressType(unsigned short& addressType) {
    NX_ENTER(loggerIPprotocolEndpoint);
    unsigned int code = 0;
    instrumentation.getProperty(Properties::IPVersion, code);
    addressType = (code == 1 || code == 2) ? static_cast<unsigned short>(code) : 0;
    NX_EXIT(loggerIPprotocolEndpoint);
    return true;
}

// Node state 1 is up, 12 and 16 are down; anything else (a pending reset, say) is not applicable.
bool IPprotocolEndpoint::stateFromNode(unsigned short& state) {
    unsigned int code = 0;
    if (instrumentation.getProperty(Properties::AdminState, code)) {
        if (code == 12 || code == 16)
            state = 3;
        else if (code == 1)
            state = 2;
        else
            state = 5;
    }
    return true;
}

bool IPprotocolEndpoint::getEnabledState(unsigned short& enabledState) {
    NX_ENTER(loggerIPprotocolEndpoint);
    bool result = stateFromNode(enabledState);
    NX_EXIT(loggerIPprotocolEndpoint);
    return result;
}

// The host keeps no separate request, so the request is reported as the state reached.
bool IPprotocolEndpoint::getRequestedState(unsigned short& requestedState) {
    NX_ENTER(loggerIPprotocolEndpoint);
    bool result = stateFromNode(requestedState);
    NX_EXIT(loggerIPprotocolEndpoint);
    return result;
}

bool IPprotocolEndpoint::getAddressOrigin(unsigned short& addressOrigin) {
    NX_ENTER(loggerIPprotocolEndpoint);
    static const unsigned short byNodeCode[] = {0, 4, 5, 3, 6, 1, 1};
    unsigned int code = 0;
    instrumentation.getProperty(Properties::AddressOrigin, code);
    NX_VAR(loggerIPprotocolEndpoint, "IPOrigin in IP Protocol", code);
    addressOrigin = code < sizeof byNodeCode / sizeof byNodeCode[0] ? byNodeCode[code] : 0;
    NX_EXIT(loggerIPprotocolEndpoint);
    return true;
}

bool IPprotocolEndpoint::setAddressOrigin(unsigned short addressOrigin) {
    TALog::TAMessageBuffer parameters;
    parameters << " addressOrigin=" << addressOrigin;
    const std::string list = parameters.str();
    NX_ENTER_PARAMS(loggerIPprotocolEndpoint, list.c_str());
    // Only static (3) and DHCP (4) have a node code; anything else is stored as unknown.
    unsigned int code = addressOrigin == 3 ? 3u : addressOrigin == 4 ? 1u : 0u;
    instrumentation.setProperty(Properties::AddressOrigin, code);
    NX_EXIT_PARAMS(loggerIPprotocolEndpoint, list.c_str());
    return true;
}

bool IPprotocolEndpoint::setIPv4Address(const std::string& address) {
    TALog::TAMessageBuffer parameters;
    parameters << " address=" << address;
    const std::string list = parameters.str();
    NX_ENTER_PARAMS(loggerIPprotocolEndpoint, list.c_str());
    bool written = instrumentation.setProperty(Properties::IPv4Address, address);
    NX_EXIT_PARAMS(loggerIPprotocolEndpoint, list.c_str());
    return written;
}

bool IPprotocolEndpoint::setSubnetMask(const std::string& subnetMask) {
    TALog::TAMessageBuffer parameters;
    parameters << " subnetMask=" << subnetMask;
    const std::string list = parameters.str();
    NX_ENTER_PARAMS(loggerIPprotocolEndpoint, list.c_str());
    bool written = instrumentation.setProperty(Properties::SubnetMask, subnetMask);
    NX_EXIT_PARAMS(loggerIPprotocolEndpoint, list.c_str());
    return written;
}

bool IPprotocolEndpoint::setEnabledState(unsigned short requestedState) {
    TALog::TAMessageBuffer parameters;
    parameters << " requestedState=" << requestedState;
    const std::string list = parameters.str();
    NX_ENTER_PARAMS(loggerIPprotocolEndpoint, list.c_str());

    std::string name;
    instrumentation.getProperty(Properties::ElementName, name);
    NX_VAR(loggerIPprotocolEndpoint, "requestedState", static_cast<unsigned>(requestedState));
    NX_VAR(loggerIPprotocolEndpoint, "name", name.c_str());

    bool written = false;
    unsigned int code = 0;
    switch (requestedState) {
        case 2: code = 1; break;    // Enabled
        case 3: code = 12; break;   // Disabled
        case 11: code = 9; break;   // Reset
        default: break;
    }
    if (code != 0) written = instrumentation.setProperty(Properties::AdminState, code);

    NX_EXIT_PARAMS(loggerIPprotocolEndpoint, list.c_str());
    return written;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
