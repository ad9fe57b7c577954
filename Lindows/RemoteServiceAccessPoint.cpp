#include "Lindows/RemoteServiceAccessPoint.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerRemoteServiceAccessPoint = "Tarvo.IPInterfaceProvider";

using Nx::NodeLexicon::Properties;

namespace {

// The part of a name before its last "_"; false when there is no "_".
bool stem(const std::string& name, std::string& before, std::string& after) {
    std::string::size_type cut = name.rfind('_');
    if (cut == std::string::npos) return false;
    before = name.substr(0, cut);
    after = name.substr(cut + 1);
    return true;
}

}  // namespace

const std::string& RemoteServiceAccessPoint::logger() { return loggerRemoteServiceAccessPoint; }

RemoteServiceAccessPoint::RemoteServiceAccessPoint() : protocol(0) {
    NX_ENTER(loggerRemoteServiceAccessPoint);
    skipToGateway();
    NX_EXIT(loggerRemoteServiceAccessPoint);
}

void RemoteServiceAccessPoint::skipToGateway() {
    while (instrumentation) {
        setProtocol();
        if (protocol != 0) break;
        ++instrumentation;
    }
}

void RemoteServiceAccessPoint::initialize() {
    Base::initialize();
    protocol = 0;
    skipToGateway();
}

void RemoteServiceAccessPoint::advance() {
    ++instrumentation;
    protocol = 0;
    if (instrumentation) setProtocol();
}

void RemoteServiceAccessPoint::setFilter(FilterType filterType, const std::string& reference) {
    Base::setFilter(filterType, reference);
    // Names are matched without their protocol suffix, so a lookup of a node with both gateways
    // lands on its IPv6 presentation; a reference asking for the IPv4 one gets that instead.
    if (protocol != 3) return;
    for (const Filter& filter : filters) {
        std::string before, after;
        if (filter.filterType == ByName && stem(filter.reference, before, after)) {
            if (after == "IPv4") protocol = 1;
            break;
        }
    }
}

RemoteServiceAccessPoint& RemoteServiceAccessPoint::operator++() {
    NX_ENTER(loggerRemoteServiceAccessPoint);
    if (protocol == 3) {
        // The IPv6 gateway has been presented; present the same node again as its IPv4 gateway.
        protocol = 1;
        if (filterSet) changeFilterReference();
        if (!filterSet || !instrumentation || evaluate()) {
            NX_EXIT(loggerRemoteServiceAccessPoint);
            return *this;
        }
    }
    // Unlike construction, this walk presents endpoints without a gateway too.
    Base::operator++();
    NX_EXIT(loggerRemoteServiceAccessPoint);
    return *this;
}

void RemoteServiceAccessPoint::setProtocol() {
    NX_ENTER(loggerRemoteServiceAccessPoint);
    protocol = 0;
    std::string ipv4, ipv6;
    if (instrumentation.getProperty(Properties::IPv4Gateway, ipv4) && !ipv4.empty()) {
        protocol = instrumentation.getProperty(Properties::IPv6Gateway, ipv6) && !ipv6.empty() ? 3 : 1;
    } else if (instrumentation.getProperty(Properties::IPv6Gateway, ipv6) && !ipv6.empty()) {
        protocol = 2;
    }
    NX_VAR(loggerRemoteServiceAccessPoint, "protocol", static_cast<unsigned>(protocol));
    NX_EXIT(loggerRemoteServiceAccessPoint);
}

void RemoteServiceAccessPoint::changeFilterReference() {
    NX_ENTER(loggerRemoteServiceAccessPoint);
    for (Filter& filter : filters) {
        if (filter.filterType != ByName) continue;
        std::string::size_type cut = filter.reference.rfind('_');
        if (cut == std::string::npos) continue;
        filter.reference.replace(cut + 1, 5, "IPv4");
        NX_VAR(loggerRemoteServiceAccessPoint, "reference", filter.reference.c_str());
        break;
    }
    NX_EXIT(loggerRemoteServiceAccessPoint);
}

bool RemoteServiceAccessPoint::filterHolds(const Filter& filter) {
    std::string value;
    switch (filter.filterType) {
        case BySystemName:
            return !getSystemName(value) || value == filter.reference;
        case ByName: {
            if (!getName(value)) return true;
            // Only the interface part counts; the protocol suffix picks a presentation, not a node.
            std::string nameStem, nameSuffix, referenceStem, referenceSuffix;
            if (!stem(value, nameStem, nameSuffix) || !stem(filter.reference, referenceStem, referenceSuffix))
                return false;
            NX_VAR(loggerRemoteServiceAccessPoint, "nameSuffix", nameSuffix.c_str());
            NX_VAR(loggerRemoteServiceAccessPoint, "referenceSuffix", referenceSuffix.c_str());
            return nameStem == referenceStem;
        }
    }
    return true;
}

bool RemoteServiceAccessPoint::getCreationClassName(std::string& creationClassName) {
    return fixed(NX_SITE, creationClassName, "KVRNX_IPRemoteServiceAccessPoint");
}

bool RemoteServiceAccessPoint::getName(std::string& name) {
    NX_ENTER(loggerRemoteServiceAccessPoint);
    std::string interfaceName;
    bool found = instrumentation.getProperty(Properties::ElementName, interfaceName);
    if (found) name = interfaceName + (presentsIPv6() ? "_IPv6" : "_IPv4");
    NX_EXIT(loggerRemoteServiceAccessPoint);
    return found;
}

bool RemoteServiceAccessPoint::getElementName(std::string& elementName) {
    return readProperty(NX_SITE, Properties::ElementName, elementName);
}

// The service processor is recognised by its own node here, not by the endpoint's description.
bool RemoteServiceAccessPoint::getSystemCreationClassName(std::string& systemCreationClassName) {
    return fixed(NX_SITE, systemCreationClassName,
                 isUnderServiceProcessor(instrumentation) ? "KVRNX_SPComputerSystem" : "KVRNX_ComputerSystem");
}

bool RemoteServiceAccessPoint::getSystemName(std::string& systemName) {
    return Base::systemName(NX_SITE, isUnderServiceProcessor(instrumentation), systemName);
}

bool RemoteServiceAccessPoint::getAccessInfo(std::string& accessInfo) {
    NX_ENTER(loggerRemoteServiceAccessPoint);
    instrumentation.getProperty(presentsIPv6() ? Properties::IPv6Gateway : Properties::IPv4Gateway, accessInfo);
    NX_EXIT(loggerRemoteServiceAccessPoint);
    return true;
}

bool RemoteServiceAccessPoint::getInfoFormat(unsigned short& infoFormat) {
    return fixed(NX_SITE, infoFormat, presentsIPv6() ? 4 : 3);  // IPv6 address : IPv4 address
}

bool RemoteServiceAccessPoint::getAccessContext(unsigned short& accessContext) {
    return fixed(NX_SITE, accessContext, 2);  // default gateway
}

bool RemoteServiceAccessPoint::getOtherAccessContext(std::string& /*otherAccessContext*/) {
    NX_ENTER(loggerRemoteServiceAccessPoint);
    NX_EXIT(loggerRemoteServiceAccessPoint);
    return false;
}

bool RemoteServiceAccessPoint::setAccessInfo(const std::string& accessInfo) {
    const TraceParams list(" accessInfo=", accessInfo);
    NX_ENTER_PARAMS(loggerRemoteServiceAccessPoint, list.c_str());
    bool accepted = true;
    unsigned int protocolIFType = 0;
    instrumentation.getProperty(Properties::ProtocolIFType, protocolIFType);
    if (protocolIFType == 4096) {
        instrumentation.setProperty(Properties::IPv4Gateway, accessInfo);
    } else if (protocolIFType == 4097 || protocolIFType == 4098) {
        instrumentation.setProperty(Properties::IPv6Gateway, accessInfo);
    } else {
        NX_MESSAGE(loggerRemoteServiceAccessPoint, 6000, "IP Protocol value does not exist ");
        accepted = false;
    }
    NX_EXIT_PARAMS(loggerRemoteServiceAccessPoint, list.c_str());
    return accepted;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
