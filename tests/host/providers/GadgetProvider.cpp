// Test provider: read-only IPIFTEST_Gadget and IPIFTEST_Gizmo instances. The widget provider
// reaches the gadgets through broker up-calls.
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <strings.h>

#include <cstring>
#include <string>

namespace {

const CMPIBroker* broker;

struct Gadget {
    const char* name;
    CMPIUint32 slot;
    const char* owner;
};

const Gadget kGadgets[] = {
    {"g1", 1, "w1"},
    {"g,2=\"x\"", 2, "w1"},
    {"g3", 3, "w\"2\\x"},
};

bool isClass(const CMPIObjectPath* cop, const char* name) {
    CMPIString* cn = CMGetClassName(cop, NULL);
    return cn && strcasecmp(CMGetCharPtr(cn), name) == 0;
}

CMPIObjectPath* gadgetPath(const CMPIObjectPath* cop, const Gadget& g) {
    CMPIString* ns = CMGetNameSpace(cop, NULL);
    CMPIObjectPath* op = CMNewObjectPath(broker, CMGetCharPtr(ns), "IPIFTEST_Gadget", NULL);
    CMAddKey(op, "Name", g.name, CMPI_chars);
    CMAddKey(op, "Slot", &g.slot, CMPI_uint32);
    return op;
}

CMPIInstance* gadgetInstance(const CMPIObjectPath* cop, const Gadget& g) {
    CMPIInstance* inst = CMNewInstance(broker, gadgetPath(cop, g), NULL);
    CMSetProperty(inst, "Owner", g.owner, CMPI_chars);
    return inst;
}

CMPIObjectPath* gizmoPath(const CMPIObjectPath* cop) {
    CMPIString* ns = CMGetNameSpace(cop, NULL);
    CMPIObjectPath* op = CMNewObjectPath(broker, CMGetCharPtr(ns), "IPIFTEST_Gizmo", NULL);
    CMAddKey(op, "InstanceID", "gz1", CMPI_chars);
    return op;
}

CMPIStatus GadgetCleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) { CMReturn(CMPI_RC_OK); }

CMPIStatus GadgetEnumInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* rslt,
                                   const CMPIObjectPath* cop) {
    if (isClass(cop, "IPIFTEST_Gizmo")) {
        CMReturnObjectPath(rslt, gizmoPath(cop));
    } else {
        for (const auto& g : kGadgets) CMReturnObjectPath(rslt, gadgetPath(cop, g));
    }
    CMReturnDone(rslt);
    CMReturn(CMPI_RC_OK);
}

CMPIStatus GadgetEnumInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* rslt,
                               const CMPIObjectPath* cop, const char**) {
    if (isClass(cop, "IPIFTEST_Gizmo")) {
        CMPIInstance* inst = CMNewInstance(broker, gizmoPath(cop), NULL);
        CMSetProperty(inst, "ElementName", "the gizmo", CMPI_chars);
        CMReturnInstance(rslt, inst);
    } else {
        for (const auto& g : kGadgets) CMReturnInstance(rslt, gadgetInstance(cop, g));
    }
    CMReturnDone(rslt);
    CMReturn(CMPI_RC_OK);
}

CMPIStatus GadgetGetInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* rslt, const CMPIObjectPath* cop,
                             const char**) {
    CMPIStatus rc = {CMPI_RC_OK, NULL};
    CMPIData name = CMGetKey(cop, "Name", &rc);
    if (rc.rc != CMPI_RC_OK || name.type != CMPI_string) CMReturn(CMPI_RC_ERR_INVALID_PARAMETER);
    CMPIData slot = CMGetKey(cop, "Slot", &rc);
    if (rc.rc != CMPI_RC_OK || slot.type != CMPI_uint32) CMReturn(CMPI_RC_ERR_INVALID_PARAMETER);
    for (const auto& g : kGadgets) {
        if (std::strcmp(CMGetCharPtr(name.value.string), g.name) == 0 && slot.value.uint32 == g.slot) {
            CMReturnInstance(rslt, gadgetInstance(cop, g));
            CMReturnDone(rslt);
            CMReturn(CMPI_RC_OK);
        }
    }
    CMReturn(CMPI_RC_ERR_NOT_FOUND);
}

CMPIStatus GadgetCreateInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                                const CMPIInstance*) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus GadgetModifyInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                                const CMPIInstance*, const char**) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus GadgetDeleteInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus GadgetExecQuery(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                           const char*, const char*) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

}  // namespace

CMInstanceMIStub(Gadget, IpifTestGadget, broker, CMNoHook)
