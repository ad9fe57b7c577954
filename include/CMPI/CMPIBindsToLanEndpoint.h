// KVRNX_BindsToLanEndPoint: an IP endpoint and the LAN endpoint it runs over.
#pragma once

#include "CMPI/CMPIAssociationAdapter.h"
#include "CMPI/CMPIIPLanEndPoint.h"
#include "CMPI/CMPIProtocolEndpoint.h"
#include "Lindows/BindsToLANEndpoint.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIBindsToLanEndpoint : public CMPIAssociationAdapter<CMPIBindsToLanEndpoint, BindsToLANEndpoint,
                                                             CMPIProtocolEndpoint, CMPIIPLanEndPoint> {
    using Base = CMPIAssociationAdapter;
    friend Base;

public:
    CMPIBindsToLanEndpoint(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

protected:
    CMPIObjectPath* getIPEndptPath(const CMPIObjectPath* path);
    CMPIObjectPath* getLanEndptPath(const CMPIObjectPath* path);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
