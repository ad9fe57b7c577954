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
    const std::string params = parameterList(" _broker=", broker_, " _context=", context_, " objectPath=", path);
    NX_ENTER_PARAMS(loggerCMPIIPHostedService, params.c_str());
    switch (requestedClassId) {
        case IPConfigurationServiceId:
            fromB(path, &CMPIIPHostedService::locateComputer);
            break;
        case IPHostedServiceId:
            if (!setObjectPath(path)) fromA(path, &CMPIIPHostedService::locateConfigurationService);
            break;
        case ComputerSystemId:
            fromA(path, &CMPIIPHostedService::locateConfigurationService);
            break;
        default:
            break;
    }
    NX_EXIT_PARAMS(loggerCMPIIPHostedService, params.c_str());
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
