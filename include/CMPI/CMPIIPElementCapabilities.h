// KVRNX_IPElementCapabilities: an IP endpoint and its capabilities.
#pragma once

#include "CMPI/CMPIAssociationAdapter.h"
#include "CMPI/CMPIIPEnabledLogicalElementCapabilities.h"
#include "CMPI/CMPIProtocolEndpoint.h"
#include "Lindows/IPElementCapabilities.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIIPElementCapabilities
    : public CMPIAssociationAdapter<CMPIIPElementCapabilities, IPElementCapabilities, CMPIProtocolEndpoint,
                                    CMPIIPEnabledLogicalElementCapabilities> {
    using Base = CMPIAssociationAdapter;
    friend Base;

public:
    CMPIIPElementCapabilities(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path);

protected:
    CMPIObjectPath* locateProtocolEndpt(const CMPIObjectPath* path);
    CMPIObjectPath* locateCapabilities(const CMPIObjectPath* path);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
