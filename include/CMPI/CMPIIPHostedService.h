// KVRNX_IPHostedService: the host's computer system and its IP configuration service.
#pragma once

#include "CMPI/CMPIAssociationAdapter.h"
#include "CMPI/CMPIIPComputerSystem.h"
#include "CMPI/CMPIIPConfigurationService.h"
#include "Lindows/IPHostedService.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIIPHostedService : public CMPIAssociationAdapter<CMPIIPHostedService, IPHostedService, CMPIIPComputerSystem,
                                                          CMPIIPConfigurationService> {
    using Base = CMPIAssociationAdapter;
    friend Base;

public:
    CMPIIPHostedService(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

    // A path of the association class: without keys, the computer system and its service; with keys,
    // positions what it can and returns false (see setAnchoredObjectPath).
    bool setObjectPath(const CMPIObjectPath* path);

protected:
    CMPIObjectPath* locateComputer(const CMPIObjectPath* path);
    CMPIObjectPath* locateConfigurationService(const CMPIObjectPath* path);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
