// The host's one IP configuration service. It walks the endpoint nodes like the other models but
// presents a single instance, and none when the host has no endpoint.
#pragma once

#include <string>

#include "Lindows/ModelPattern.h"

namespace Nx {
namespace IPInterfaceProvider {

struct IPConfigurationServiceKeys {
    enum FilterType : int { BySystemName = 0 };
};

class IPConfigurationService : public ModelPattern<IPConfigurationService, IPConfigurationServiceKeys> {
    using Base = ModelPattern;
    friend Base;

public:
    IPConfigurationService();

    IPConfigurationService& operator++();
    explicit operator bool() const;
    void initialize();

    bool getCreationClassName(std::string& creationClassName);
    bool getName(std::string& name);
    bool getElementName(std::string& elementName);
    bool getSystemCreationClassName(std::string& systemCreationClassName);
    bool getSystemName(std::string& systemName);

private:
    static const std::string& logger();
    bool filterHolds(const Filter& filter);

    int instanceCount;  // how often the object has been advanced
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
