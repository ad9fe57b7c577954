#include "Lindows/IPprotocolEndpoint.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerIPprotocolEndpoint = "Tarvo.IPInterfaceProvider";

using Nx::NodeLexicon::Properties;

const std::string& IPprotocolEndpoint::logger() { return loggerIPprotocolEndpoint; }

IPprotocolEndpoint::IPprotocolEndpoint() : Base(NX_SITE) {}

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

void IPprotocolEndpoint::skipRejected(const Filter& filter) {
    // ByName compares the element name as getName reads it; the host model skips exactly the
    // endpoints whose readable name differs.
    if (filter.filterType == ByName) instrumentation.seek(Properties::ElementName, filter.reference);
}

bool IPprotocolEndpoint::onServiceProcessor() const {
    return instrumentation.getNodeDescription().find("BMC ") != std::string::npos;
}

bool IPprotocolEndpoint::getName(std::string& name) {
    readProperty(NX_SITE, Properties::ElementName, name);
    return true;
}

bool IPprotocolEndpoint::getElementName(std::string& elementName) {
    readProperty(NX_SITE, Properties::ElementName, elementName);
    return true;
}

bool IPprotocolEndpoint::getCreationClassName(std::string& creationClassName) {
    return fixed(NX_SITE, creationClassName, "KVRNX_IPProtocolEndpoint");
}

bool IPprotocolEndpoint::getNameFormat(std::string& nameFormat) {
    return fixed(NX_SITE, nameFormat, "NIC Name");
}

bool IPprotocolEndpoint::getDescription(std::string& description) {
    return fixed(NX_SITE, description, instrumentation.getNodeDescription());
}

bool IPprotocolEndpoint::getSystemCreationClassName(std::string& systemCreationClassName) {
    return fixed(NX_SITE, systemCreationClassName,
                 onServiceProcessor() ? "KVRNX_SPComputerSystem" : "KVRNX_ComputerSystem");
}

bool IPprotocolEndpoint::getSystemName(std::string& systemName) {
    return Base::systemName(NX_SITE, onServiceProcessor(), systemName);
}

bool IPprotocolEndpoint::getIPv4Address(std::string& address) {
    return readProperty(NX_SITE, Properties::IPv4Address, address);
}

bool IPprotocolEndpoint::getSubnetMask(std::string& subnetMask) {
    return readProperty(NX_SITE, Properties::SubnetMask, subnetMask);
}

bool IPprotocolEndpoint::getIPv6Address(std::string& address) {
    return readProperty(NX_SITE, Properties::IPv6Address, address);
}

bool IPprotocolEndpoint::getIPv6AddressType(unsigned short& addressType) {
    return readProperty(NX_SITE, Properties::IPv6AddressType, addressType);
}

bool IPprotocolEndpoint::getProtocolIFType(unsigned short& protocolIFType) {
    return readProperty(NX_SITE, Properties::ProtocolIFType, protocolIFType);
}

bool IPprotocolEndpoint::getPrefixLength(unsigned int& prefixLength) {
    return readProperty(NX_SITE, Properties::PrefixLength, prefixLength);
}

bool IPprotocolEndpoint::getIPv6SubnetPrefixLength(unsigned short& prefixLength) {
    return readProperty(NX_SITE, Properties::PrefixLength, prefixLength);
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
    const TraceParams list(" addressOrigin=", addressOrigin);
    NX_ENTER_PARAMS(loggerIPprotocolEndpoint, list.c_str());
    // Only static (3) and DHCP (4) have a node code; anything else is stored as unknown.
    unsigned int code = addressOrigin == 3 ? 3u : addressOrigin == 4 ? 1u : 0u;
    instrumentation.setProperty(Properties::AddressOrigin, code);
    NX_EXIT_PARAMS(loggerIPprotocolEndpoint, list.c_str());
    return true;
}

bool IPprotocolEndpoint::setIPv4Address(const std::string& address) {
    const TraceParams list(" address=", address);
    NX_ENTER_PARAMS(loggerIPprotocolEndpoint, list.c_str());
    bool written = instrumentation.setProperty(Properties::IPv4Address, address);
    NX_EXIT_PARAMS(loggerIPprotocolEndpoint, list.c_str());
    return written;
}

bool IPprotocolEndpoint::setSubnetMask(const std::string& subnetMask) {
    const TraceParams list(" subnetMask=", subnetMask);
    NX_ENTER_PARAMS(loggerIPprotocolEndpoint, list.c_str());
    bool written = instrumentation.setProperty(Properties::SubnetMask, subnetMask);
    NX_EXIT_PARAMS(loggerIPprotocolEndpoint, list.c_str());
    return written;
}

bool IPprotocolEndpoint::setEnabledState(unsigned short requestedState) {
    const TraceParams list(" requestedState=", requestedState);
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
