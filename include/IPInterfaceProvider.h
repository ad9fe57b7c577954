// Entry points, function tables and class registry of the IP interface provider.
#pragma once

#include <cmpidt.h>
#include <cmpift.h>

#include <string>
#include <vector>

#define IPIF_EXPORT __attribute__((visibility("default")))

namespace Nx {
namespace IPInterfaceProvider {

extern IPIF_EXPORT const CMPIBroker* broker;
extern IPIF_EXPORT CMPIInstanceMIFT instMIFT__;
extern IPIF_EXPORT CMPIAssociationMIFT assocMIFT__;
extern IPIF_EXPORT CMPIMethodMIFT methMIFT__;
extern IPIF_EXPORT const char* slpClassName;
extern IPIF_EXPORT const char* slpMethodName;
extern IPIF_EXPORT const char* slpNameSpace;
extern IPIF_EXPORT const char COPYRIGHT[];

// Class identifiers of the provider's classes and of the three related classes.
enum ClassId : unsigned short {
    ComputerSystemId = 1,
    IPProtocolEndpointId = 9,
    LANEndpointId = 16,
    IPAssignmentSettingDataId = 66,
    BindsToLanEndPointId = 67,
    IPElementSettingDataId = 68,
    StaticIPAssignmentSettingDataId = 69,
    IPRemoteServiceAccessPointId = 70,
    StaticOrderedComponentId = 71,
    IPHostedAccessPointId = 72,
    StaticIPElementSettingDataId = 73,
    RemoteHostedAccessPointId = 80,
    IPRemoteAccessAvailableToElementId = 81,
    SPComputerSystemId = 119,
    SPHostedAccessPointId = 120,
    IPElementCapabilitiesId = 121,
    IPEnabledLogicalElementCapabilitiesId = 128,
    IPConfigurationServiceId = 129,
    IPHostedServiceId = 130,
    IPServiceAffectsElementId = 131,
    UnknownClassId = 255,
};

// Appends the identifiers a request naming className must be served for: the class's own, or those
// of the provider's classes below a standard parent it names. False when nothing was appended.
bool getClassId(const char* className, const char* nameSpace, std::vector<unsigned short>& ids);

// Request handlers (the function table entries).
CMPIStatus IPInterface_Cleanup(CMPIInstanceMI* mi, const CMPIContext* ctx, CMPIBoolean terminating);
CMPIStatus IPInterface_EnumInstanceNames(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                         const CMPIObjectPath* cop);
CMPIStatus IPInterface_EnumInstances(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                     const CMPIObjectPath* cop, const char** properties);
CMPIStatus IPInterface_GetInstance(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                   const CMPIObjectPath* cop, const char** properties);
CMPIStatus IPInterface_CreateInstance(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                      const CMPIObjectPath* cop, const CMPIInstance* ci);
CMPIStatus IPInterface_ModifyInstance(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                      const CMPIObjectPath* cop, const CMPIInstance* ci, const char** properties);
CMPIStatus IPInterface_DeleteInstance(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                      const CMPIObjectPath* cop);
CMPIStatus IPInterface_ExecQuery(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                 const CMPIObjectPath* cop, const char* query, const char* language);

CMPIStatus IPInterface_AssociationCleanup(CMPIAssociationMI* mi, const CMPIContext* ctx, CMPIBoolean terminating);
CMPIStatus IPInterface_Associators(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                   const CMPIObjectPath* cop, const char* assocClass, const char* resultClass,
                                   const char* role, const char* resultRole, const char** properties);
CMPIStatus IPInterface_AssociatorNames(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                       const CMPIObjectPath* cop, const char* assocClass, const char* resultClass,
                                       const char* role, const char* resultRole);
CMPIStatus IPInterface_References(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                  const CMPIObjectPath* cop, const char* resultClass, const char* role,
                                  const char** properties);
CMPIStatus IPInterface_ReferenceNames(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                      const CMPIObjectPath* cop, const char* resultClass, const char* role);

CMPIStatus IPInterface_MethodCleanup(CMPIMethodMI* mi, const CMPIContext* ctx, CMPIBoolean terminating);
CMPIStatus IPInterface_InvokeMethod(CMPIMethodMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                    const CMPIObjectPath* cop, const char* method, const CMPIArgs* in,
                                    CMPIArgs* out);

}  // namespace IPInterfaceProvider
}  // namespace Nx

extern "C" {
IPIF_EXPORT CMPIInstanceMI* IPInterfaceProvider_Create_InstanceMI(const CMPIBroker* broker, const CMPIContext* context,
                                                                  CMPIStatus* status);
IPIF_EXPORT CMPIAssociationMI* IPInterfaceProvider_Create_AssociationMI(const CMPIBroker* broker,
                                                                        const CMPIContext* context, CMPIStatus* status);
IPIF_EXPORT CMPIMethodMI* IPInterfaceProvider_Create_MethodMI(const CMPIBroker* broker, const CMPIContext* context,
                                                              CMPIStatus* status);
}
