// The IP assignment settings of each endpoint: every endpoint node is presented twice, as its
// static setting (InstanceID ending in "%static") and as its DHCP setting ("%dhcp").
#pragma once

#include <string>

#include "Lindows/ModelPattern.h"

namespace Nx {
namespace IPInterfaceProvider {

struct IPAssignmentSettingDataKeys {
    enum FilterType : int { ByInstanceID = 0 };
};

class IPAssignmentSettingData : public ModelPattern<IPAssignmentSettingData, IPAssignmentSettingDataKeys> {
    using Base = ModelPattern;
    friend Base;

public:
    IPAssignmentSettingData();

    // With isCfg the filter selects both settings of the endpoint whose prefix and element name
    // occur in reference; without it the InstanceID must equal reference.
    void setFilter(FilterType filterType, const std::string& reference, bool isCfg);
    void initialize();

    bool getInstanceId(std::string& instanceId);
    bool getElementName(std::string& elementName);
    bool getAddressOrigin(unsigned short& addressOrigin);
    bool getConfigurationName(std::string& configurationName);
    bool setConfigurationName(const std::string& configurationName);

private:
    static const std::string& logger();
    bool filterHolds(const Filter& filter);
    void advance();  // static view, then DHCP view, then the next node

    int assignmentKind;  // 1 static, 2 DHCP
    bool isCfg;
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
