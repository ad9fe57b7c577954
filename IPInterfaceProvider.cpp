// Entry points, function tables, class registry and request dispatch of the IP interface provider.
#include "IPInterfaceProvider.h"

#include <cmpimacs.h>

#include <cstring>
#include <exception>

#include "CMPI/CMPIAssignmentSettingData.h"
#include "CMPI/CMPIBindsToLanEndpoint.h"
#include "CMPI/CMPIIPConfigurationService.h"
#include "CMPI/CMPIIPElementCapabilities.h"
#include "CMPI/CMPIIPElementSettingData.h"
#include "CMPI/CMPIIPEnabledLogicalElementCapabilities.h"
#include "CMPI/CMPIIPHostedAccessPoint.h"
#include "CMPI/CMPIIPHostedService.h"
#include "CMPI/CMPIProtocolEndpoint.h"
#include "CMPI/CMPIRemoteAccessAvailableToElement.h"
#include "CMPI/CMPIRemoteHostedAccessPoint.h"
#include "CMPI/CMPIRemoteServiceAccessPoint.h"
#include "CMPI/CMPISPHostedAccessPoint.h"
#include "CMPI/CMPIServiceAffectsElement.h"
#include "CMPI/CMPIStaticElementSettingData.h"
#include "CMPI/CMPIStaticIPAssignmentSettingData.h"
#include "CMPI/CMPIStaticOrderedComponent.h"
#include "Nx/ProviderUtilities.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

const std::string loggerIPInterfaceProvider = "Tarvo.IPInterfaceProvider";

const CMPIBroker* broker = nullptr;

// An object manager may call a factory again (another interface, a reload) while requests run on
// other threads: every access to broker is atomic, and a factory handing over the broker that is
// already set writes nothing.
static const CMPIBroker* currentBroker() { return __atomic_load_n(&broker, __ATOMIC_ACQUIRE); }
static void storeBroker(const CMPIBroker* given) {
    if (currentBroker() != given) __atomic_store_n(&broker, given, __ATOMIC_RELEASE);
}
const char* slpClassName = "PG_WBEMSLPTemplate";
const char* slpMethodName = "update";
const char* slpNameSpace = "root/PG_Internal";
const char COPYRIGHT[] = "IP Interface Provider. Copyright (c) 2026 the IP Interface Provider authors.";

CMPIInstanceMIFT instMIFT__ = {
    CMPICurrentVersion, CMPICurrentVersion, "instanceIPInterfaceProvider",
    IPInterface_Cleanup, IPInterface_EnumInstanceNames, IPInterface_EnumInstances, IPInterface_GetInstance,
    IPInterface_CreateInstance, IPInterface_ModifyInstance, IPInterface_DeleteInstance, IPInterface_ExecQuery,
};

CMPIAssociationMIFT assocMIFT__ = {
    CMPICurrentVersion, CMPICurrentVersion, "associationIPInterfaceProvider",
    IPInterface_AssociationCleanup, IPInterface_Associators, IPInterface_AssociatorNames,
    IPInterface_References, IPInterface_ReferenceNames,
};

CMPIMethodMIFT methMIFT__ = {
    CMPICurrentVersion, CMPICurrentVersion, "methodIPInterfaceProvider",
    IPInterface_MethodCleanup, IPInterface_InvokeMethod,
};

namespace {

#define ENTRY_MARK() markProviderEntry(loggerIPInterfaceProvider, NX_FILE, __func__, __LINE__)
#define EXIT_MARK() markProviderExit(loggerIPInterfaceProvider, NX_FILE, __func__, __LINE__)

const char* orEmpty(const char* text) { return text ? text : ""; }

// Builds an adapter over cop for the request and hands it to use; it is destroyed on every path.
template <class Adapter, class Use>
bool serveWith(const CMPIContext* ctx, const CMPIObjectPath* cop, Use& use) {
    Adapter adapter(currentBroker(), ctx, cop);
    use(adapter);
    return true;
}

// The association adapter of classId over cop (the request's source object). False when classId is
// not an association.
template <class Use>
bool withAssociationAdapter(unsigned short classId, const CMPIContext* ctx, const CMPIObjectPath* cop, Use&& use) {
    switch (classId) {
    case BindsToLanEndPointId: return serveWith<CMPIBindsToLanEndpoint>(ctx, cop, use);
    case IPElementSettingDataId: return serveWith<CMPIIPElementSettingData>(ctx, cop, use);
    case StaticOrderedComponentId: return serveWith<CMPIStaticOrderedComponent>(ctx, cop, use);
    case IPHostedAccessPointId: return serveWith<CMPIIPHostedAccessPoint>(ctx, cop, use);
    case StaticIPElementSettingDataId: return serveWith<CMPIStaticElementSettingData>(ctx, cop, use);
    case RemoteHostedAccessPointId: return serveWith<CMPIRemoteHostedAccessPoint>(ctx, cop, use);
    case IPRemoteAccessAvailableToElementId: return serveWith<CMPIRemoteAccessAvailableToElement>(ctx, cop, use);
    case SPHostedAccessPointId: return serveWith<CMPISPHostedAccessPoint>(ctx, cop, use);
    case IPElementCapabilitiesId: return serveWith<CMPIIPElementCapabilities>(ctx, cop, use);
    case IPHostedServiceId: return serveWith<CMPIIPHostedService>(ctx, cop, use);
    case IPServiceAffectsElementId: return serveWith<CMPIServiceAffectsElement>(ctx, cop, use);
    default: return false;
    }
}

// The adapter that modifies instances of classId. False for the classes that cannot be modified.
template <class Use>
bool withModifiableAdapter(unsigned short classId, const CMPIContext* ctx, const CMPIObjectPath* cop, Use&& use) {
    switch (classId) {
    case IPProtocolEndpointId: return serveWith<CMPIProtocolEndpoint>(ctx, cop, use);
    case IPAssignmentSettingDataId: return serveWith<CMPIAssignmentSettingData>(ctx, cop, use);
    case StaticIPAssignmentSettingDataId: return serveWith<CMPIStaticIPAssignmentSettingData>(ctx, cop, use);
    case IPRemoteServiceAccessPointId: return serveWith<CMPIRemoteServiceAccessPoint>(ctx, cop, use);
    default: return false;
    }
}

// The adapter that enumerates instances of classId; the association classes are enumerated (and
// got) through their association adapters over the class path. False when none serves the class.
template <class Use>
bool withInstanceAdapter(unsigned short classId, const CMPIContext* ctx, const CMPIObjectPath* cop, Use&& use) {
    switch (classId) {
    case IPEnabledLogicalElementCapabilitiesId:
        return serveWith<CMPIIPEnabledLogicalElementCapabilities>(ctx, cop, use);
    case IPConfigurationServiceId: return serveWith<CMPIIPConfigurationService>(ctx, cop, use);
    default:
        return withModifiableAdapter(classId, ctx, cop, use) || withAssociationAdapter(classId, ctx, cop, use);
    }
}

// A null instance or path (the broker could not build one) is not handed on: an object manager
// would have to cope with it, and some do not.
void returnInstance(const CMPIResult* rslt, CMPIInstance* instance) {
    if (instance) CMReturnInstance(rslt, instance);
}
void returnObjectPath(const CMPIResult* rslt, CMPIObjectPath* path) {
    if (path) CMReturnObjectPath(rslt, path);
}

// Produces one result per element of the adapter, then signals the end of results. An exception
// leaves before the end signal.
template <class Adapter, class Produce>
void returnEach(Adapter& adapter, const CMPIResult* rslt, Produce& produce) {
    while (adapter) {
        produce(adapter);
        ++adapter;
    }
    CMReturnDone(rslt);
}

void logCaught(const std::exception& e) { NX_MESSAGE(loggerIPInterfaceProvider, 4000, e.what()); }

// Get, enumerate and enumerate names: the class of cop picks the adapter. A get whose path leaves
// keys out gets every matching instance; one whose keys match nothing gets none, and still rc 0.
template <class Produce>
CMPIStatus serveInstances(const CMPIContext* ctx, const CMPIResult* rslt, const CMPIObjectPath* cop, bool isGet,
                          Produce&& produce) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    try {
        unsigned short classId = ProviderUtilities::getClassId(cop);
        NX_VAR(loggerIPInterfaceProvider, "classId", static_cast<unsigned>(classId));
        if (isGet && classId == IPElementCapabilitiesId) {
            status.rc = CMPI_RC_ERR_NOT_SUPPORTED;
        } else if (!withInstanceAdapter(classId, ctx, cop, [&](auto& adapter) { returnEach(adapter, rslt, produce); })) {
            status.rc = CMPI_RC_ERR_INVALID_CLASS;
        }
    } catch (const std::exception& e) {
        logCaught(e);
    }
    return status;
}

// References and reference names: the result class names the association.
template <class Produce>
CMPIStatus serveReferences(const CMPIContext* ctx, const CMPIResult* rslt, const CMPIObjectPath* cop,
                           const char* resultClass, Produce&& produce) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    try {
        unsigned short classId = ProviderUtilities::getClassId(resultClass);
        NX_VAR(loggerIPInterfaceProvider, "classId", static_cast<unsigned>(classId));
        NX_VAR(loggerIPInterfaceProvider, "resultClass", orEmpty(resultClass));
        if (!withAssociationAdapter(classId, ctx, cop, [&](auto& adapter) { returnEach(adapter, rslt, produce); }))
            status.rc = CMPI_RC_ERR_INVALID_CLASS;
    } catch (const std::exception& e) {
        logCaught(e);
    }
    return status;
}

// Associators and associator names over the identifiers the association class expands to. An
// association class the provider does not know gives success and no results. What the walk set
// stands when an adapter throws.
template <class Produce>
CMPIStatus serveAssociators(const CMPIContext* ctx, const CMPIResult* rslt, const CMPIObjectPath* cop,
                            const char* assocClass, const char* resultClass, Produce&& produce) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    try {
        NX_VAR(loggerIPInterfaceProvider, "resultClass", orEmpty(resultClass));
        NX_VAR(loggerIPInterfaceProvider, "associationClass", orEmpty(assocClass));
        std::vector<unsigned short> ids;
        if (!getClassId(assocClass, ProviderUtilities::getNamespace(cop).c_str(), ids)) {
            NX_VAR(loggerIPInterfaceProvider, "CMPI_RC_ERR_INVALID_CLASS",
                   static_cast<unsigned>(CMPI_RC_ERR_INVALID_CLASS));
        }
        for (unsigned short id : ids) {
            bool served = withAssociationAdapter(id, ctx, cop, [&](auto& adapter) {
                // An empty result class filters as little as none.
                if (resultClass && *resultClass && adapter.isNotTargetClass(resultClass)) return;
                while (adapter) {
                    produce(adapter);
                    ++adapter;
                }
            });
            if (!served) status.rc = CMPI_RC_ERR_INVALID_CLASS;
            NX_VAR(loggerIPInterfaceProvider, "rcode", static_cast<unsigned>(status.rc));
        }
        CMReturnDone(rslt);
    } catch (const std::exception& e) {
        logCaught(e);
    }
    return status;
}

}  // namespace

bool getClassId(const char* className, const char* nameSpace, std::vector<unsigned short>& ids) {
    unsigned short id = ProviderUtilities::getClassId(className);
    if (id != UnknownClassId) {
        ids.push_back(id);
        return true;
    }
    struct Parent {
        const char* name;
        std::vector<unsigned short> ids;
    };
    static const Parent parents[] = {
        {"CIM_ElementSettingData", {IPElementSettingDataId, StaticIPElementSettingDataId}},
        {"CIM_OrderedComponent", {StaticOrderedComponentId}},
        {"CIM_BindsToLanEndPoint", {BindsToLanEndPointId}},
        {"CIM_HostedAccessPoint", {IPHostedAccessPointId, SPHostedAccessPointId, RemoteHostedAccessPointId}},
        {"CIM_RemoteAccessAvailableToElement", {IPRemoteAccessAvailableToElementId}},
        {"CIM_ElementCapabilities", {IPElementCapabilitiesId}},
        {"CIM_HostedService", {IPHostedServiceId}},
        {"CIM_ServiceAffectsElement", {IPServiceAffectsElementId}},
    };
    bool appended = false;
    const std::string ns = orEmpty(nameSpace);
    for (const Parent& parent : parents) {
        if (!ProviderUtilities::areClassesRelated(currentBroker(), ns, className, parent.name)) continue;
        if (parent.ids.front() == IPHostedAccessPointId) {
            NX_VAR(loggerIPInterfaceProvider, "0x48", 72u);
            NX_VAR(loggerIPInterfaceProvider, "0x78", 120u);
            NX_VAR(loggerIPInterfaceProvider, "0x50", 80u);
        }
        ids.insert(ids.end(), parent.ids.begin(), parent.ids.end());
        appended = true;
    }
    return appended;
}

CMPIStatus IPInterface_Cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    return status;
}

CMPIStatus IPInterface_AssociationCleanup(CMPIAssociationMI*, const CMPIContext*, CMPIBoolean) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    return status;
}

CMPIStatus IPInterface_MethodCleanup(CMPIMethodMI*, const CMPIContext*, CMPIBoolean) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    return status;
}

CMPIStatus IPInterface_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* ctx, const CMPIResult* rslt,
                                         const CMPIObjectPath* cop) {
    const RequestScope scope;
    ENTRY_MARK();
    CMPIStatus status =
        serveInstances(ctx, rslt, cop, false, [&](auto& adapter) { returnObjectPath(rslt, adapter.getObjectPath()); });
    EXIT_MARK();
    return status;
}

CMPIStatus IPInterface_EnumInstances(CMPIInstanceMI*, const CMPIContext* ctx, const CMPIResult* rslt,
                                     const CMPIObjectPath* cop, const char** properties) {
    const RequestScope scope;
    ENTRY_MARK();
    CMPIStatus status = serveInstances(
        ctx, rslt, cop, false, [&](auto& adapter) { returnInstance(rslt, adapter.getCMPIInstance(properties)); });
    EXIT_MARK();
    return status;
}

CMPIStatus IPInterface_GetInstance(CMPIInstanceMI*, const CMPIContext* ctx, const CMPIResult* rslt,
                                   const CMPIObjectPath* cop, const char** properties) {
    const RequestScope scope;
    ENTRY_MARK();
    CMPIStatus status = serveInstances(
        ctx, rslt, cop, true, [&](auto& adapter) { returnInstance(rslt, adapter.getCMPIInstance(properties)); });
    EXIT_MARK();
    return status;
}

CMPIStatus IPInterface_CreateInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                                      const CMPIInstance*) {
    const RequestScope scope;
    ENTRY_MARK();
    CMPIStatus status = {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
    EXIT_MARK();
    return status;
}

CMPIStatus IPInterface_ModifyInstance(CMPIInstanceMI*, const CMPIContext* ctx, const CMPIResult* rslt,
                                      const CMPIObjectPath* cop, const CMPIInstance* ci, const char**) {
    const RequestScope scope;
    ENTRY_MARK();
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    try {
        unsigned short classId = ProviderUtilities::getClassId(cop);
        NX_VAR(loggerIPInterfaceProvider, "classId", static_cast<unsigned>(classId));
        bool served = withModifiableAdapter(classId, ctx, cop, [&](auto& adapter) {
            NX_VAR(loggerIPInterfaceProvider, "objectPath", ProviderUtilities::toString(currentBroker(), cop).c_str());
            if (adapter) status = adapter.modifyInstance(ci);
            CMReturnDone(rslt);
        });
        if (!served) status.rc = CMPI_RC_ERR_NOT_SUPPORTED;
    } catch (const std::exception& e) {
        logCaught(e);
    }
    EXIT_MARK();
    return status;
}

CMPIStatus IPInterface_DeleteInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*) {
    NX_METHOD(loggerIPInterfaceProvider);
    CMPIStatus status = {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
    return status;
}

CMPIStatus IPInterface_ExecQuery(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                                 const char*, const char*) {
    NX_METHOD(loggerIPInterfaceProvider);
    CMPIStatus status = {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
    return status;
}

CMPIStatus IPInterface_References(CMPIAssociationMI*, const CMPIContext* ctx, const CMPIResult* rslt,
                                  const CMPIObjectPath* cop, const char* resultClass, const char*,
                                  const char** properties) {
    const RequestScope scope;
    ENTRY_MARK();
    CMPIStatus status = serveReferences(ctx, rslt, cop, resultClass, [&](auto& adapter) {
        returnInstance(rslt, adapter.getCMPIInstance(properties));
    });
    EXIT_MARK();
    return status;
}

CMPIStatus IPInterface_ReferenceNames(CMPIAssociationMI*, const CMPIContext* ctx, const CMPIResult* rslt,
                                      const CMPIObjectPath* cop, const char* resultClass, const char*) {
    const RequestScope scope;
    ENTRY_MARK();
    CMPIStatus status = serveReferences(ctx, rslt, cop, resultClass,
                                        [&](auto& adapter) { returnObjectPath(rslt, adapter.getObjectPath()); });
    EXIT_MARK();
    return status;
}

CMPIStatus IPInterface_Associators(CMPIAssociationMI*, const CMPIContext* ctx, const CMPIResult* rslt,
                                   const CMPIObjectPath* cop, const char* assocClass, const char* resultClass,
                                   const char*, const char*, const char** properties) {
    const RequestScope scope;
    ENTRY_MARK();
    CMPIStatus status = serveAssociators(ctx, rslt, cop, assocClass, resultClass, [&](auto& adapter) {
        returnInstance(rslt, adapter.getAssociator(properties));
    });
    EXIT_MARK();
    return status;
}

CMPIStatus IPInterface_AssociatorNames(CMPIAssociationMI*, const CMPIContext* ctx, const CMPIResult* rslt,
                                       const CMPIObjectPath* cop, const char* assocClass, const char* resultClass,
                                       const char*, const char*) {
    const RequestScope scope;
    ENTRY_MARK();
    CMPIStatus status = serveAssociators(ctx, rslt, cop, assocClass, resultClass, [&](auto& adapter) {
        returnObjectPath(rslt, adapter.getAssociatorNames());
    });
    EXIT_MARK();
    return status;
}

CMPIStatus IPInterface_InvokeMethod(CMPIMethodMI*, const CMPIContext* ctx, const CMPIResult* rslt,
                                    const CMPIObjectPath* cop, const char* method, const CMPIArgs* in,
                                    CMPIArgs* out) {
    const RequestScope scope;
    ENTRY_MARK();
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIUint32 ret = 0;
    try {
        unsigned short classId = ProviderUtilities::getClassId(cop);
        if (classId == IPProtocolEndpointId) {
            CMPIProtocolEndpoint endpoint(currentBroker(), ctx, cop);
            if (endpoint) {
                if (method && std::strcmp(method, "RequestStateChange") == 0) {
                    ret = endpoint.executeMethod(in, out, &status);
                    NX_VAR(loggerIPInterfaceProvider, "ret", static_cast<unsigned>(ret));
                } else {
                    status.rc = CMPI_RC_ERR_METHOD_NOT_FOUND;
                    ret = CMPI_RC_ERR_METHOD_NOT_FOUND;
                }
            }
        } else if (classId == IPConfigurationServiceId) {
            // The one service needs no lookup: the method is run whatever the path names.
            CMPIIPConfigurationService service(currentBroker(), ctx, cop);
            if (method && std::strcmp(method, "ApplySettingToIPProtocolEndpoint") == 0) {
                ret = service.executeMethod(in, out, &status);
                NX_VAR(loggerIPInterfaceProvider, "ret", static_cast<unsigned>(ret));
            } else {
                status.rc = CMPI_RC_ERR_METHOD_NOT_FOUND;
                ret = CMPI_RC_ERR_METHOD_NOT_FOUND;
            }
        } else {
            status.rc = CMPI_RC_ERR_INVALID_CLASS;
            ret = CMPI_RC_ERR_INVALID_CLASS;
        }
    } catch (const std::exception& e) {
        status.rc = CMPI_RC_ERR_FAILED;
        if (const CMPIBroker* b = currentBroker()) status.msg = CMNewString(b, e.what(), nullptr);
    }
    CMReturnData(rslt, &ret, CMPI_uint32);
    CMReturnDone(rslt);
    // No exit marker here: the method handler has always ended without one.
    return status;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx

using namespace Nx::IPInterfaceProvider;

extern "C" {

CMPIInstanceMI* IPInterfaceProvider_Create_InstanceMI(const CMPIBroker* brkr, const CMPIContext*, CMPIStatus*) {
    static CMPIInstanceMI mi = {nullptr, &instMIFT__};
    storeBroker(brkr);
    return &mi;
}

CMPIAssociationMI* IPInterfaceProvider_Create_AssociationMI(const CMPIBroker* brkr, const CMPIContext*, CMPIStatus*) {
    static CMPIAssociationMI mi = {nullptr, &assocMIFT__};
    storeBroker(brkr);
    return &mi;
}

CMPIMethodMI* IPInterfaceProvider_Create_MethodMI(const CMPIBroker* brkr, const CMPIContext*, CMPIStatus*) {
    static CMPIMethodMI mi = {nullptr, &methMIFT__};
    storeBroker(brkr);
    return &mi;
}

}
