// KVRNX_StaticIPElementSettingData: an IP endpoint and its static setting.
#pragma once

#include "Lindows/AssociationModel.h"

namespace Nx {
namespace IPInterfaceProvider {

class StaticIPElementSettingData : public SettingInForce {
public:
    // Static setting (InstanceID "prefix%interface") to its endpoint; records whether the static
    // setting is in force on the endpoint (IsDefault and IsCurrent).
    Nx::Moniker getManagedElementMoniker(Nx::Moniker& setting);
    // Endpoint to its static setting.
    Nx::Moniker getStaticIPSettingDataMoniker(Nx::Moniker& endpoint);

};

}  // namespace IPInterfaceProvider
}  // namespace Nx
