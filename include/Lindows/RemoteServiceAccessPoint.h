// The default gateway of an IP endpoint as a remote service access point. An endpoint with both
// an IPv4 and an IPv6 gateway is presented twice: first as its IPv6 gateway, then as its IPv4 one.
#pragma once

#include <string>

#include "Lindows/ModelPattern.h"

namespace Nx {
namespace IPInterfaceProvider {

struct RemoteServiceAccessPointKeys {
    enum FilterType : int { BySystemName = 0, ByName = 1 };
};

class RemoteServiceAccessPoint : public ModelPattern<RemoteServiceAccessPoint, RemoteServiceAccessPointKeys> {
    using Base = ModelPattern;
    friend Base;

public:
    // Stands on the first endpoint that has a gateway.
    RemoteServiceAccessPoint();

    void setFilter(FilterType filterType, const std::string& reference);
    RemoteServiceAccessPoint& operator++();
    void initialize();

    bool getCreationClassName(std::string& creationClassName);
    bool getName(std::string& name);
    bool getElementName(std::string& elementName);
    bool getSystemCreationClassName(std::string& systemCreationClassName);
    bool getSystemName(std::string& systemName);
    bool getAccessInfo(std::string& accessInfo);
    bool getInfoFormat(unsigned short& infoFormat);
    bool getAccessContext(unsigned short& accessContext);
    bool getOtherAccessContext(std::string& otherAccessContext);
    // Writes the gateway of the protocol the interface runs, whichever gateway is presented.
    bool setAccessInfo(const std::string& accessInfo);

    // Recomputes which gateways the current node has.
    void setProtocol();
    // Points the name filter at the IPv4 presentation of the same node.
    void changeFilterReference();

private:
    static const std::string& logger();
    bool filterHolds(const Filter& filter);
    void advance();  // next node, with its gateways
    void skipToGateway();
    bool presentsIPv6() const { return protocol == 2 || protocol == 3; }

    // 0 no gateway, 1 IPv4, 2 IPv6, 3 both (IPv6 presented; IPv4 next).
    int protocol;
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
