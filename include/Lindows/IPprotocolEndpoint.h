// One IP protocol endpoint (a network interface of the host or of the service processor).
#pragma once

#include <string>

#include "Lindows/ModelPattern.h"

namespace Nx {
namespace IPInterfaceProvider {

struct IPprotocolEndpointKeys {
    enum FilterType : int { BySystemName = 0, ByName = 1 };
};

class IPprotocolEndpoint : public ModelPattern<IPprotocolEndpoint, IPprotocolEndpointKeys> {
    using Base = ModelPattern;
    friend Base;

public:
    IPprotocolEndpoint();

    bool getName(std::string& name);
    bool getElementName(std::string& elementName);
    bool getCreationClassName(std::string& creationClassName);
    bool getNameFormat(std::string& nameFormat);
    bool getDescription(std::string& description);
    bool getSystemCreationClassName(std::string& systemCreationClassName);
    bool getSystemName(std::string& systemName);
    bool getIPv4Address(std::string& address);
    bool getSubnetMask(std::string& subnetMask);
    bool getIPv6Address(std::string& address);
    bool getIPv6AddressType(unsigned short& addressType);
    bool getProtocolIFType(unsigned short& protocolIFType);
    bool getPrefixLength(unsigned int& prefixLength);
    bool getIPv6SubnetPrefixLength(unsigned short& prefixLength);
    bool getIPVersionSupport(unsigned short& versionSupport);
    bool getAddressType(unsigned short& addressType);
    bool getEnabledState(unsigned short& enabledState);
    bool getRequestedState(unsigned short& requestedState);
    bool getAddressOrigin(unsigned short& addressOrigin);

    bool setAddressOrigin(unsigned short addressOrigin);
    bool setIPv4Address(const std::string& address);
    bool setSubnetMask(const std::string& subnetMask);
    // Accepts 2 (Enabled), 3 (Disabled) and 11 (Reset); true only when the state was written.
    bool setEnabledState(unsigned short requestedState);

private:
    static const std::string& logger();
    bool filterHolds(const Filter& filter);
    void skipRejected(const Filter& filter);  // a name goes straight to the endpoints of that name
    bool onServiceProcessor() const;
    bool stateFromNode(unsigned short& state);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
