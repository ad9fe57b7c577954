#include "CMPI/CMPIIPHostedService.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIIPHostedService = "Tarvo.IPInterfaceProvider";

namespace {

const AssociationClass kAssociation = {
    "KVRNX_IPHostedService",
    {ComputerSystemId, "KVRNX_ComputerSystem", "CIM_ComputerSystem", "Antecedent"},
    {IPConfigurationServiceId, "KVRNX_IPConfigurationService", "CIM_IPConfigurationService", "Dependent"},
    false,
};

}  // namespace

CMPIIPHostedService::CMPIIPHostedService(const CMPIBroker* broker_, const CMPIContext* context_,
                                         const CMPIObjectPath* path)
    : Base(broker_, context_, path, kAssociation, loggerCMPIIPHostedService, NX_FILE) {
    constructAnchored(__func__, path, IPHostedServiceId, &CMPIIPHostedService::locateComputer,
                      &CMPIIPHostedService::locateConfigurationService);
}

bool CMPIIPHostedService::setObjectPath(const CMPIObjectPath* path) {
    return setAnchoredObjectPath<Side::A>(path, "Name", &CMPIIPHostedService::locateConfigurationService,
                                          &CMPIIPHostedService::locateComputer);
}

CMPIObjectPath* CMPIIPHostedService::locateComputer(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_ComputerSystem", &IPHostedService::getComputerSystemMoniker, "getComputerSystemMoniker");
}

CMPIObjectPath* CMPIIPHostedService::locateConfigurationService(const CMPIObjectPath* path) {
    return locate(path, "KVRNX_IPConfigurationService", &IPHostedService::getIPConfigurationServiceMoniker,
                  "getIPConfigurationServiceMoniker");
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
