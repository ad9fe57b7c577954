// The capabilities of each IP endpoint: one object per endpoint node.
#pragma once

#include <string>
#include <vector>

#include "Lindows/ModelPattern.h"

namespace Nx {
namespace IPInterfaceProvider {

struct IPEnabledLogicalElementCapabilitiesKeys {
    enum FilterType : int { ByInstanceID = 0 };
};

class IPEnabledLogicalElementCapabilities
    : public ModelPattern<IPEnabledLogicalElementCapabilities, IPEnabledLogicalElementCapabilitiesKeys> {
    using Base = ModelPattern;
    friend Base;

public:
    IPEnabledLogicalElementCapabilities();

    bool getInstanceID(std::string& instanceID);
    bool getElementName(std::string& elementName);
    bool getElementNameEditSupported(bool& editSupported);
    bool getMaxElementNameLen(unsigned short& maxLength);
    // Appends the states an endpoint accepts; the vector is not cleared first.
    bool getRequestedStatesSupported(std::vector<unsigned short>& states);

private:
    static const std::string& logger();
    bool filterHolds(const Filter& filter);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
