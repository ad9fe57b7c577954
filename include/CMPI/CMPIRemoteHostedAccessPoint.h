// KVRNX_RemoteHostedAccessPoint: the host's computer system and its gateways.
#pragma once

#include "CMPI/CMPIAssociationAdapter.h"
#include "CMPI/CMPIIPComputerSystem.h"
#include "CMPI/CMPIRemoteServiceAccessPoint.h"
#include "Lindows/RemoteHostedAccessPoint.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIRemoteHostedAccessPoint : public CMPIAssociationAdapter<CMPIRemoteHostedAccessPoint, RemoteHostedAccessPoint,
                                                                  CMPIIPComputerSystem, CMPIRemoteServiceAccessPoint> {
    using Base = CMPIAssociationAdapter;
    friend Base;

public:
    CMPIRemoteHostedAccessPoint(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

    // A path of the association class: without keys, the computer system and its gateways; with keys,
    // positions what it can and returns false (see setAnchoredObjectPath).
    bool setObjectPath(const CMPIObjectPath* path);

protected:
    CMPIObjectPath* locateComputer(const CMPIObjectPath* path);
    CMPIObjectPath* locateRemoteSAP(const CMPIObjectPath* path);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
