// KVRNX_SPHostedAccessPoint: the service processor's computer system and its IP endpoints.
#pragma once

#include "CMPI/CMPIAssociationAdapter.h"
#include "CMPI/CMPIIPComputerSystem.h"
#include "CMPI/CMPIProtocolEndpoint.h"
#include "Lindows/SPHostedAccessPoint.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPISPHostedAccessPoint : public CMPIAssociationAdapter<CMPISPHostedAccessPoint, SPHostedAccessPoint,
                                                              CMPIIPComputerSystem, CMPIProtocolEndpoint> {
    using Base = CMPIAssociationAdapter;
    friend Base;

public:
    CMPISPHostedAccessPoint(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

protected:
    CMPIObjectPath* locateBMC(const CMPIObjectPath* path);
    CMPIObjectPath* locateProtocolEndpoint(const CMPIObjectPath* path);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
