// Test provider: IPIFTEST_Widget (instances and methods) and the IPIFTEST_WidgetGadget
// association, which finds its gadgets through up-calls to the gadget provider and its
// widgets through up-calls to itself.
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <pthread.h>
#include <strings.h>
#include <unistd.h>

#include <cstdio>
#include <atomic>
#include <cstring>
#include <mutex>
#include <stdexcept>
#include <string>
#include <vector>

namespace {

const CMPIBroker* broker;

struct Widget {
    std::string id;
    std::string name;
    CMPIUint16 size;
    std::vector<std::string> tags;
};

std::mutex widgetsMutex;
std::vector<Widget> widgets = {
    {"w1", "first", 10, {"a", "b,c"}},
    {"w\"2\\x", "awkward, \"one\"", 20, {}},
};
CMPIInstance* stashed = nullptr;
std::atomic<unsigned> factoryCalls{0};

std::string text(const CMPIData& d) {
    if (d.type != CMPI_string || (d.state & CMPI_nullValue) || !d.value.string) return "";
    const char* c = CMGetCharPtr(d.value.string);
    return c ? c : "";
}

std::string nameSpace(const CMPIObjectPath* cop) { return CMGetCharPtr(CMGetNameSpace(cop, NULL)); }

CMPIObjectPath* widgetPath(const std::string& ns, const Widget& w) {
    CMPIObjectPath* op = CMNewObjectPath(broker, ns.c_str(), "IPIFTEST_Widget", NULL);
    CMAddKey(op, "InstanceID", w.id.c_str(), CMPI_chars);
    return op;
}

CMPIInstance* widgetInstance(const std::string& ns, const Widget& w, const char** props) {
    CMPIInstance* inst = CMNewInstance(broker, widgetPath(ns, w), NULL);
    if (props) CMSetPropertyFilter(inst, props, NULL);
    CMSetProperty(inst, "ElementName", w.name.c_str(), CMPI_chars);
    CMSetProperty(inst, "Size", &w.size, CMPI_uint16);
    CMPIArray* tags = CMNewArray(broker, static_cast<CMPICount>(w.tags.size()), CMPI_string, NULL);
    for (CMPICount i = 0; i < w.tags.size(); ++i) CMSetArrayElementAt(tags, i, w.tags[i].c_str(), CMPI_chars);
    CMSetProperty(inst, "Tags", &tags, CMPI_stringA);
    CMPIDateTime* created = CMNewDateTimeFromChars(broker, "20240102030405.000006+060", NULL);
    CMSetProperty(inst, "Created", &created, CMPI_dateTime);
    CMPIBoolean enabled = 1;
    CMSetProperty(inst, "Enabled", &enabled, CMPI_boolean);
    CMPISint32 offset = -5;
    CMSetProperty(inst, "Offset", &offset, CMPI_sint32);
    CMPIReal64 ratio = 0.5;
    CMSetProperty(inst, "Ratio", &ratio, CMPI_real64);
    return inst;
}

Widget* findWidget(const std::string& id) {
    for (auto& w : widgets)
        if (w.id == id) return &w;
    return nullptr;
}

std::string keyOf(const CMPIObjectPath* cop, const char* key) {
    CMPIStatus rc = {CMPI_RC_OK, NULL};
    CMPIData d = CMGetKey(cop, key, &rc);
    return rc.rc == CMPI_RC_OK ? text(d) : "";
}

// ---- Instances -----------------------------------------------------------------------------

CMPIStatus WidgetCleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) { CMReturn(CMPI_RC_OK); }

CMPIStatus WidgetEnumInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* rslt,
                                   const CMPIObjectPath* cop) {
    std::lock_guard<std::mutex> lock(widgetsMutex);
    for (const auto& w : widgets) CMReturnObjectPath(rslt, widgetPath(nameSpace(cop), w));
    CMReturnDone(rslt);
    CMReturn(CMPI_RC_OK);
}

CMPIStatus WidgetEnumInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* rslt,
                               const CMPIObjectPath* cop, const char** props) {
    std::lock_guard<std::mutex> lock(widgetsMutex);
    for (const auto& w : widgets) CMReturnInstance(rslt, widgetInstance(nameSpace(cop), w, props));
    CMReturnDone(rslt);
    CMReturn(CMPI_RC_OK);
}

CMPIStatus WidgetGetInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* rslt,
                             const CMPIObjectPath* cop, const char** props) {
    std::lock_guard<std::mutex> lock(widgetsMutex);
    Widget* w = findWidget(keyOf(cop, "InstanceID"));
    if (!w) CMReturnWithChars(broker, CMPI_RC_ERR_NOT_FOUND, "no such widget");
    CMReturnInstance(rslt, widgetInstance(nameSpace(cop), *w, props));
    CMReturnDone(rslt);
    CMReturn(CMPI_RC_OK);
}

CMPIStatus WidgetCreateInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* rslt,
                                const CMPIObjectPath* cop, const CMPIInstance* ci) {
    std::lock_guard<std::mutex> lock(widgetsMutex);
    Widget w{text(CMGetProperty(ci, "InstanceID", NULL)), text(CMGetProperty(ci, "ElementName", NULL)), 0, {}};
    if (w.id.empty()) CMReturnWithChars(broker, CMPI_RC_ERR_INVALID_PARAMETER, "InstanceID missing");
    if (findWidget(w.id)) CMReturn(CMPI_RC_ERR_ALREADY_EXISTS);
    widgets.push_back(w);
    CMReturnObjectPath(rslt, widgetPath(nameSpace(cop), w));
    CMReturnDone(rslt);
    CMReturn(CMPI_RC_OK);
}

CMPIStatus WidgetModifyInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath* cop,
                                const CMPIInstance* ci, const char**) {
    std::lock_guard<std::mutex> lock(widgetsMutex);
    Widget* w = findWidget(keyOf(cop, "InstanceID"));
    if (!w) CMReturn(CMPI_RC_ERR_NOT_FOUND);
    CMPIStatus rc = {CMPI_RC_OK, NULL};
    CMPIData size = CMGetProperty(ci, "Size", &rc);
    if (rc.rc == CMPI_RC_OK) {
        if (size.type != CMPI_uint16) CMReturnWithChars(broker, CMPI_RC_ERR_TYPE_MISMATCH, "Size must be uint16");
        if (size.value.uint16 > 1000) CMReturnWithChars(broker, CMPI_RC_ERR_INVALID_PARAMETER, "Size too large");
        w->size = size.value.uint16;
    }
    CMPIData name = CMGetProperty(ci, "ElementName", &rc);
    if (rc.rc == CMPI_RC_OK) w->name = text(name);
    CMReturn(CMPI_RC_OK);
}

CMPIStatus WidgetDeleteInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath* cop) {
    std::lock_guard<std::mutex> lock(widgetsMutex);
    std::string id = keyOf(cop, "InstanceID");
    for (auto it = widgets.begin(); it != widgets.end(); ++it)
        if (it->id == id) {
            widgets.erase(it);
            CMReturn(CMPI_RC_OK);
        }
    CMReturn(CMPI_RC_ERR_NOT_FOUND);
}

CMPIStatus WidgetExecQuery(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* rslt, const CMPIObjectPath* cop,
                           const char* query, const char* lang) {
    if (!lang || std::strcmp(lang, "WQL") != 0) CMReturn(CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED);
    std::lock_guard<std::mutex> lock(widgetsMutex);
    for (const auto& w : widgets)
        if (std::strstr(query, w.name.c_str())) CMReturnInstance(rslt, widgetInstance(nameSpace(cop), w, NULL));
    CMReturnDone(rslt);
    CMReturn(CMPI_RC_OK);
}

// ---- Association ---------------------------------------------------------------------------

CMPIObjectPath* linkPath(const std::string& ns, CMPIObjectPath* widget, CMPIObjectPath* gadget) {
    CMPIObjectPath* op = CMNewObjectPath(broker, ns.c_str(), "IPIFTEST_WidgetGadget", NULL);
    CMAddKey(op, "Widget", &widget, CMPI_ref);
    CMAddKey(op, "Gadget", &gadget, CMPI_ref);
    return op;
}

// Calls back for each (widget path, gadget instance) pair the source path takes part in.
template <class F>
CMPIStatus eachLink(const CMPIContext* ctx, const CMPIObjectPath* cop, const char* assocClass, F&& f) {
    std::string ns = nameSpace(cop);
    if (assocClass) {
        CMPIObjectPath* self = CMNewObjectPath(broker, ns.c_str(), "IPIFTEST_WidgetGadget", NULL);
        if (!CMClassPathIsA(broker, self, assocClass, NULL)) CMReturn(CMPI_RC_OK);
    }
    CMPIStatus rc = {CMPI_RC_OK, NULL};
    CMPIObjectPath* gadgets = CMNewObjectPath(broker, ns.c_str(), "IPIFTEST_Gadget", NULL);
    if (CMClassPathIsA(broker, cop, "IPIFTEST_Widget", NULL)) {
        std::string id = keyOf(cop, "InstanceID");
        CMPIEnumeration* en = CBEnumInstances(broker, ctx, gadgets, NULL, &rc);
        if (rc.rc != CMPI_RC_OK) return rc;
        while (CMHasNext(en, NULL)) {
            CMPIInstance* g = CMGetNext(en, NULL).value.inst;
            if (text(CMGetProperty(g, "Owner", NULL)) == id) f(const_cast<CMPIObjectPath*>(cop), g, true);
        }
    } else if (CMClassPathIsA(broker, cop, "IPIFTEST_Gadget", NULL)) {
        CMPIInstance* g = CBGetInstance(broker, ctx, cop, NULL, &rc);
        if (rc.rc != CMPI_RC_OK) return rc;
        Widget owner;
        bool found = false;
        {
            std::lock_guard<std::mutex> lock(widgetsMutex);
            if (Widget* w = findWidget(text(CMGetProperty(g, "Owner", NULL)))) {
                owner = *w;
                found = true;
            }
        }
        if (found) f(widgetPath(ns, owner), g, false);  // unlocked: f may call back into us
    }
    CMReturn(CMPI_RC_OK);
}

bool wanted(const CMPIObjectPath* far, const char* resultClass) {
    return !resultClass || CMClassPathIsA(broker, far, resultClass, NULL);
}

CMPIStatus WidgetAssociationCleanup(CMPIAssociationMI*, const CMPIContext*, CMPIBoolean) { CMReturn(CMPI_RC_OK); }

CMPIStatus WidgetAssociators(CMPIAssociationMI*, const CMPIContext* ctx, const CMPIResult* rslt,
                             const CMPIObjectPath* cop, const char* assocClass, const char* resultClass,
                             const char*, const char*, const char**) {
    CMPIStatus st = eachLink(ctx, cop, assocClass, [&](CMPIObjectPath* widget, CMPIInstance* gadget, bool fromWidget) {
        if (fromWidget) {
            if (wanted(CMGetObjectPath(gadget, NULL), resultClass)) CMReturnInstance(rslt, gadget);
            return;
        }
        CMPIStatus rc = {CMPI_RC_OK, NULL};
        CMPIInstance* w = CBGetInstance(broker, ctx, widget, NULL, &rc);  // back into this provider
        if (w && wanted(widget, resultClass)) CMReturnInstance(rslt, w);
    });
    if (st.rc == CMPI_RC_OK) CMReturnDone(rslt);
    return st;
}

CMPIStatus WidgetAssociatorNames(CMPIAssociationMI*, const CMPIContext* ctx, const CMPIResult* rslt,
                                 const CMPIObjectPath* cop, const char* assocClass, const char* resultClass,
                                 const char*, const char*) {
    CMPIStatus st = eachLink(ctx, cop, assocClass, [&](CMPIObjectPath* widget, CMPIInstance* gadget, bool fromWidget) {
        CMPIObjectPath* far = fromWidget ? CMGetObjectPath(gadget, NULL) : widget;
        if (wanted(far, resultClass)) CMReturnObjectPath(rslt, far);
    });
    if (st.rc == CMPI_RC_OK) CMReturnDone(rslt);
    return st;
}

CMPIStatus WidgetReferences(CMPIAssociationMI*, const CMPIContext* ctx, const CMPIResult* rslt,
                            const CMPIObjectPath* cop, const char* resultClass, const char*, const char**) {
    std::string ns = nameSpace(cop);
    CMPIStatus st = eachLink(ctx, cop, resultClass, [&](CMPIObjectPath* widget, CMPIInstance* gadget, bool) {
        CMPIObjectPath* gp = CMGetObjectPath(gadget, NULL);
        CMPIInstance* link = CMNewInstance(broker, linkPath(ns, widget, gp), NULL);
        CMPIUint16 weight = static_cast<CMPIUint16>(CMGetKey(gp, "Slot", NULL).value.uint32 * 10);
        CMSetProperty(link, "Weight", &weight, CMPI_uint16);
        CMReturnInstance(rslt, link);
    });
    if (st.rc == CMPI_RC_OK) CMReturnDone(rslt);
    return st;
}

CMPIStatus WidgetReferenceNames(CMPIAssociationMI*, const CMPIContext* ctx, const CMPIResult* rslt,
                                const CMPIObjectPath* cop, const char* resultClass, const char*) {
    std::string ns = nameSpace(cop);
    CMPIStatus st = eachLink(ctx, cop, resultClass, [&](CMPIObjectPath* widget, CMPIInstance* gadget, bool) {
        CMReturnObjectPath(rslt, linkPath(ns, widget, CMGetObjectPath(gadget, NULL)));
    });
    if (st.rc == CMPI_RC_OK) CMReturnDone(rslt);
    return st;
}

// ---- Methods -------------------------------------------------------------------------------

struct SpawnArgs {
    CMPIContext* ctx;
    unsigned millis;
    std::string file;
};

void* spawned(void* p) {
    SpawnArgs* a = static_cast<SpawnArgs*>(p);
    CBAttachThread(broker, a->ctx);
    usleep(a->millis * 1000);
    CMPIString* s = CMNewString(broker, "done", NULL);
    if (FILE* f = std::fopen(a->file.c_str(), "w")) {
        std::fputs(CMGetCharPtr(s), f);
        std::fclose(f);
    }
    CBDetachThread(broker, a->ctx);
    delete a;
    return NULL;
}

// The host frees clones nobody released when it goes; forget ours before that.
CMPIStatus WidgetMethodCleanup(CMPIMethodMI*, const CMPIContext*, CMPIBoolean) {
    stashed = NULL;
    CMReturn(CMPI_RC_OK);
}

CMPIStatus WidgetInvokeMethod(CMPIMethodMI*, const CMPIContext* ctx, const CMPIResult* rslt,
                              const CMPIObjectPath* cop, const char* method, const CMPIArgs* in, CMPIArgs* out) {
    CMPIStatus rc = {CMPI_RC_OK, NULL};
    CMPIUint32 ret = 0;
    std::string ns = nameSpace(cop);
    if (std::strcmp(method, "Resize") == 0) {
        CMPIData size = CMGetArg(in, "NewSize", &rc);
        if (rc.rc != CMPI_RC_OK || size.type != CMPI_uint16) {
            ret = 4;
            CMReturnData(rslt, &ret, CMPI_uint32);
            CMReturnWithChars(broker, CMPI_RC_ERR_INVALID_PARAMETER, "NewSize must be uint16");
        }
        {
            std::lock_guard<std::mutex> lock(widgetsMutex);
            if (Widget* w = findWidget(keyOf(cop, "InstanceID"))) w->size = size.value.uint16;
        }
        CMPIData gadget = CMGetArg(in, "Gadget", &rc);
        CMPIObjectPath* g = NULL;
        if (rc.rc == CMPI_RC_OK && gadget.type == CMPI_ref) {
            g = gadget.value.ref;
        } else {
            g = CMNewObjectPath(broker, ns.c_str(), "IPIFTEST_Gadget", NULL);
            CMAddKey(g, "Name", "made", CMPI_chars);
            CMPIUint32 slot = 7;
            CMAddKey(g, "Slot", &slot, CMPI_uint32);
        }
        CMAddArg(out, "Gadget", &g, CMPI_ref);
        CMPIArray* log = CMNewArray(broker, 2, CMPI_string, NULL);
        CMSetArrayElementAt(log, 0, "resized", CMPI_chars);
        CMPIString* id = CMNewString(broker, keyOf(cop, "InstanceID").c_str(), NULL);
        CMSetArrayElementAt(log, 1, &id, CMPI_string);
        CMAddArg(out, "Log", &log, CMPI_stringA);
    } else if (std::strcmp(method, "Stash") == 0) {
        CMPIData release = CMGetArg(in, "Release", NULL);
        if (release.type == CMPI_boolean && release.value.boolean) {
            if (stashed) CMRelease(stashed);
            stashed = NULL;
        } else {
            std::lock_guard<std::mutex> lock(widgetsMutex);
            stashed = CMClone(widgetInstance(ns, widgets.front(), NULL), NULL);
        }
    } else if (std::strcmp(method, "Spawn") == 0) {
        SpawnArgs* a = new SpawnArgs{CBPrepareAttachThread(broker, ctx), CMGetArg(in, "Millis", NULL).value.uint32,
                                     text(CMGetArg(in, "File", NULL))};
        pthread_t t;
        if (pthread_create(&t, NULL, spawned, a) != 0) {
            delete a;
            CMReturn(CMPI_RC_ERR_FAILED);
        }
        pthread_detach(t);
    } else if (std::strcmp(method, "Fail") == 0) {
        CMReturnWithChars(broker, CMPI_RC_ERR_ACCESS_DENIED, "denied\nby the widget");
    } else if (std::strcmp(method, "Throw") == 0) {
        throw std::runtime_error("widget exploded");
    } else if (std::strcmp(method, "Probe") == 0) {
        std::string cls = text(CMGetArg(in, "ClassName", NULL));
        CMPIBoolean isA = CMClassPathIsA(broker, cop, cls.c_str(), &rc);
        CMAddArg(out, "IsA", &isA, CMPI_boolean);
        CMPIString* s = CDToString(broker, cop, NULL);
        CMAddArg(out, "Text", CMGetCharPtr(s), CMPI_chars);
        CMPIString* type = CDGetType(broker, cop, NULL);
        CMAddArg(out, "Type", &type, CMPI_string);
        CMPIUint32 calls = factoryCalls.load();
        CMAddArg(out, "Factories", &calls, CMPI_uint32);
    } else if (std::strcmp(method, "Deep") == 0) {
        CMPIUint32 levels = CMGetArg(in, "Levels", NULL).value.uint32;
        if (levels > 0) {
            CMPIArgs* next = CMNewArgs(broker, NULL);
            CMPIUint32 fewer = levels - 1;
            CMAddArg(next, "Levels", &fewer, CMPI_uint32);
            CMPIData r = CBInvokeMethod(broker, ctx, cop, "Deep", next, CMNewArgs(broker, NULL), &rc);
            if (rc.rc != CMPI_RC_OK) return rc;
            ret = r.value.uint32 + 1;
        }
    } else {
        CMReturn(CMPI_RC_ERR_METHOD_NOT_FOUND);
    }
    CMReturnData(rslt, &ret, CMPI_uint32);
    CMReturnDone(rslt);
    CMReturn(CMPI_RC_OK);
}

}  // namespace

CMInstanceMIStub(Widget, IpifTestWidget, broker, ++factoryCalls)
CMAssociationMIStub(Widget, IpifTestWidget, broker, ++factoryCalls)
CMMethodMIStub(Widget, IpifTestWidget, broker, ++factoryCalls)
