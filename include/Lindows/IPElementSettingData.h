// KVRNX_IPElementSettingData: an IP endpoint and its two assignment settings (static and DHCP).
#pragma once

#include "Lindows/AssociationModel.h"

namespace Nx {
namespace IPInterfaceProvider {

class IPElementSettingData : public SettingInForce {
public:
    // Setting (InstanceID "prefix%interface%kind") to its endpoint. Also records whether the
    // setting is the one in force on the endpoint (IsDefault and IsCurrent).
    Nx::Moniker getManagedElementMoniker(Nx::Moniker& setting);
    // Endpoint to its settings: an InstanceID that selects both settings of the interface
    // ("prefix%interface") when given to the assignment setting adapter loosely.
    Nx::Moniker getIPSettingDataMoniker(Nx::Moniker& endpoint);

    bool getIsNext(unsigned short& isNext);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
