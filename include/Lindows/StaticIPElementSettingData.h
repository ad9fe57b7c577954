// KVRNX_StaticIPElementSettingData: an IP endpoint and its static setting.
#pragma once

#include "Nx/Moniker.h"

namespace Nx {
namespace IPInterfaceProvider {

class StaticIPElementSettingData {
public:
    StaticIPElementSettingData();
    ~StaticIPElementSettingData();

    // Static setting (InstanceID "prefix%interface") to its endpoint; records whether the static
    // setting is in force on the endpoint (IsDefault and IsCurrent).
    Nx::Moniker getManagedElementMoniker(Nx::Moniker& setting);
    // Endpoint to its static setting.
    Nx::Moniker getStaticIPSettingDataMoniker(Nx::Moniker& endpoint);

    bool getIsDefault(unsigned short& isDefault);
    bool getIsCurrent(unsigned short& isCurrent);
    void setIsDefault(unsigned short isDefault);
    void setIsCurrent(unsigned short isCurrent);

private:
    unsigned short IsDefault;
    unsigned short IsCurrent;
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
