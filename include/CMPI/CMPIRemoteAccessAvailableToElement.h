// KVRNX_IPRemoteAccessAvailableToElement: a gateway and the IP endpoint it is reached through.
#pragma once

#include "CMPI/CMPIAssociationAdapter.h"
#include "CMPI/CMPIProtocolEndpoint.h"
#include "CMPI/CMPIRemoteServiceAccessPoint.h"
#include "Lindows/RemoteAccessAvailableToElement.h"

namespace Nx {
namespace IPInterfaceProvider {

class CMPIRemoteAccessAvailableToElement
    : public CMPIAssociationAdapter<CMPIRemoteAccessAvailableToElement, RemoteAccessAvailableToElement,
                                    CMPIRemoteServiceAccessPoint, CMPIProtocolEndpoint> {
    using Base = CMPIAssociationAdapter;
    friend Base;

public:
    CMPIRemoteAccessAvailableToElement(const CMPIBroker* broker, const CMPIContext* context,
                                       const CMPIObjectPath* path);

protected:
    CMPIObjectPath* locateRemoteSAP(const CMPIObjectPath* path);
    CMPIObjectPath* locateIPEndptPath(const CMPIObjectPath* path);

private:
    void setAssociationProperties(CMPIInstance* instance);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
