// KVRNX_IPHostedAccessPoint: the host's computer system and its IP endpoints.
#pragma once

#include "CMPI/CMPIAssociationAdapter.h"
#include "CMPI/CMPIIPComputerSystem.h"
#include "CMPI/CMPIProtocolEndpoint.h"
#include "Lindows/IPHostedAccessPoint.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIIPHostedAccessPoint : public CMPIAssociationAdapter<CMPIIPHostedAccessPoint, IPHostedAccessPoint,
                                                              CMPIIPComputerSystem, CMPIProtocolEndpoint> {
    using Base = CMPIAssociationAdapter;
    friend Base;

public:
    CMPIIPHostedAccessPoint(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

    // A path of the association class: without keys, the computer system and its endpoints; with keys,
    // positions what it can and returns false (see setAnchoredObjectPath).
    bool setObjectPath(const CMPIObjectPath* path);

protected:
    CMPIObjectPath* locateComputer(const CMPIObjectPath* path);
    CMPIObjectPath* locateProtocolEndpoint(const CMPIObjectPath* path);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
