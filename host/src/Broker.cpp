// The broker a provider receives: up-calls routed back into the host, factories, OS services
// and the memory table.
#include <pthread.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <ctime>

#include "Internal.h"

namespace ipif {
namespace detail {

namespace {

std::vector<std::string> propertyList(const char** props) {
    std::vector<std::string> out;
    if (props)
        for (const char** p = props; *p; ++p) out.emplace_back(*p);
    return out;
}

std::string text(const char* s) { return s ? s : ""; }

// The caller's context entries, so a nested request sees the same principal, namespace...
const NamedValues* entriesOf(const CMPIContext* ctx) {
    ContextObj* c = asContext(ctx);
    return c ? &c->entries : nullptr;
}

// The path of an up-call with its namespace filled in: the path's own, else the caller
// context's initial namespace, else the host default.
bool upcallPath(HostImpl* h, const CMPIContext* ctx, const CMPIObjectPath* op, ObjectPath& out) {
    PathObj* p = asPath(op);
    if (!p) return false;
    out = p->path;
    if (out.nameSpace.empty()) {
        const NamedValues* e = entriesOf(ctx);
        const Value* ns = e ? e->find(CMPIInitNameSpace) : nullptr;
        if (ns && !ns->isNull() && ns->type() == CimType::String && !ns->asString().empty())
            out.nameSpace = ns->asString();
        else
            out.nameSpace = h->options.defaultNamespace;
    }
    return true;
}

// Common frame of every up-call: host check, nested request, exception fence. What the
// caller gets back (results, status messages) is made in out, the caller's arena: an up-call
// from outside any request runs in a request of its own, whose memory goes when it returns.
template <class R, class F>
R upcall(const CMPIBroker* mb, CMPIStatus* rc, R fallback, F&& f) noexcept {
    HostImpl* h = hostOf(mb);
    if (!h) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return fallback;
    }
    Arena* out = &h->arena();
    try {
        RequestScope scope(h);
        if (scope.tooDeep()) {
            setStatus(rc, h, CMPI_RC_ERR_FAILED, "up-calls nested too deep", out);
            return fallback;
        }
        return f(h, *out);
    } catch (const CimError& e) {
        setStatus(rc, h, static_cast<CMPIrc>(e.rc()), e.what(), out);
    } catch (const std::exception& e) {
        setStatus(rc, h, CMPI_RC_ERR_FAILED, e.what(), out);
    } catch (...) {
        setStatus(rc, CMPI_RC_ERR_FAILED);
    }
    return fallback;
}

CMPIEnumeration* enumerationOf(HostImpl* h, Arena& out, const Result& r, bool names, CMPIStatus* rc) {
    if (!r.ok()) {
        setStatus(rc, h, static_cast<CMPIrc>(r.rc), r.message, &out);
        return nullptr;
    }
    std::vector<Value> items;
    if (names)
        for (const auto& p : r.paths) items.push_back(Value::reference(p));
    else
        for (const auto& i : r.instances) items.push_back(Value::instance(i));
    setStatus(rc, CMPI_RC_OK);
    return makeIn<EnumObj>(out, h, std::move(items));
}

// ---- Up-calls ------------------------------------------------------------------------------

CMPIContext* bPrepareAttachThread(const CMPIBroker* mb, const CMPIContext* ctx) {
    HostImpl* h = hostOf(mb);
    if (!h) return nullptr;
    try {
        const NamedValues* e = entriesOf(ctx);
        // Owned like a clone: the parent request may end before the thread attaches.
        return makeClone<ContextObj>(h, e ? *e : NamedValues());
    } catch (...) {
        return nullptr;
    }
}

CMPIStatus bAttachThread(const CMPIBroker* mb, const CMPIContext*) {
    HostImpl* h = hostOf(mb);
    if (!h) return rcStatus(CMPI_RC_ERR_INVALID_HANDLE);
    try {
        h->attachThread();
    } catch (...) {
        return rcStatus(CMPI_RC_ERR_FAILED);
    }
    return okStatus();
}

CMPIStatus bDetachThread(const CMPIBroker* mb, const CMPIContext* ctx) {
    HostImpl* h = hostOf(mb);
    if (!h) return rcStatus(CMPI_RC_ERR_INVALID_HANDLE);
    bool attached = h->detachThread();
    clones::release(ctx);
    return rcStatus(attached ? CMPI_RC_OK : CMPI_RC_ERR_FAILED);
}

CMPIStatus bDeliverIndication(const CMPIBroker* mb, const CMPIContext*, const char*, const CMPIInstance*) {
    return rcStatus(hostOf(mb) ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_HANDLE);
}

CMPIEnumeration* bEnumInstanceNames(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                    CMPIStatus* rc) {
    return upcall<CMPIEnumeration*>(mb, rc, nullptr, [&](HostImpl* h, Arena& out) -> CMPIEnumeration* {
        ObjectPath p;
        if (!upcallPath(h, ctx, op, p)) return setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER), nullptr;
        return enumerationOf(h, out, h->enumerate(p, true, nullptr, entriesOf(ctx)), true, rc);
    });
}

CMPIEnumeration* bEnumInstances(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                const char** props, CMPIStatus* rc) {
    return upcall<CMPIEnumeration*>(mb, rc, nullptr, [&](HostImpl* h, Arena& out) -> CMPIEnumeration* {
        ObjectPath p;
        if (!upcallPath(h, ctx, op, p)) return setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER), nullptr;
        std::vector<std::string> pl = propertyList(props);
        return enumerationOf(h, out, h->enumerate(p, false, props ? &pl : nullptr, entriesOf(ctx)), false, rc);
    });
}

CMPIInstance* bGetInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                           const char** props, CMPIStatus* rc) {
    return upcall<CMPIInstance*>(mb, rc, nullptr, [&](HostImpl* h, Arena& out) -> CMPIInstance* {
        ObjectPath p;
        if (!upcallPath(h, ctx, op, p)) return setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER), nullptr;
        std::vector<std::string> pl = propertyList(props);
        Result r = h->get(p, props ? &pl : nullptr, entriesOf(ctx));
        if (!r.ok()) return setStatus(rc, h, static_cast<CMPIrc>(r.rc), r.message, &out), nullptr;
        if (r.instances.empty()) return setStatus(rc, h, CMPI_RC_ERR_NOT_FOUND, "no instance " + p.toString(), &out), nullptr;
        setStatus(rc, CMPI_RC_OK);
        return makeIn<InstanceObj>(out, h, r.instances.front());
    });
}

CMPIObjectPath* bCreateInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                const CMPIInstance* inst, CMPIStatus* rc) {
    return upcall<CMPIObjectPath*>(mb, rc, nullptr, [&](HostImpl* h, Arena& out) -> CMPIObjectPath* {
        ObjectPath p;
        InstanceObj* i = asInstance(inst);
        if (!upcallPath(h, ctx, op, p) || !i) return setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER), nullptr;
        Result r = h->create(p, i->inst, entriesOf(ctx));
        if (!r.ok()) return setStatus(rc, h, static_cast<CMPIrc>(r.rc), r.message, &out), nullptr;
        setStatus(rc, CMPI_RC_OK);
        return makeIn<PathObj>(out, h, r.paths.empty() ? p : r.paths.front());
    });
}

CMPIStatus bModifyInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                           const CMPIInstance* inst, const char** props) {
    CMPIStatus st = okStatus();
    upcall<int>(mb, &st, 0, [&](HostImpl* h, Arena& out) {
        ObjectPath p;
        InstanceObj* i = asInstance(inst);
        if (!upcallPath(h, ctx, op, p) || !i) return setStatus(&st, CMPI_RC_ERR_INVALID_PARAMETER), 0;
        std::vector<std::string> pl = propertyList(props);
        Result r = h->modify(p, i->inst, props ? &pl : nullptr, entriesOf(ctx));
        setStatus(&st, h, static_cast<CMPIrc>(r.rc), r.message, &out);
        return 0;
    });
    return st;
}

CMPIStatus bDeleteInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op) {
    CMPIStatus st = okStatus();
    upcall<int>(mb, &st, 0, [&](HostImpl* h, Arena& out) {
        ObjectPath p;
        if (!upcallPath(h, ctx, op, p)) return setStatus(&st, CMPI_RC_ERR_INVALID_PARAMETER), 0;
        Result r = h->remove(p, entriesOf(ctx));
        setStatus(&st, h, static_cast<CMPIrc>(r.rc), r.message, &out);
        return 0;
    });
    return st;
}

CMPIEnumeration* bExecQuery(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                            const char* query, const char* lang, CMPIStatus* rc) {
    return upcall<CMPIEnumeration*>(mb, rc, nullptr, [&](HostImpl* h, Arena& out) -> CMPIEnumeration* {
        ObjectPath p;
        if (!upcallPath(h, ctx, op, p) || !query) return setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER), nullptr;
        return enumerationOf(h, out, h->query(p, query, text(lang), entriesOf(ctx)), false, rc);
    });
}

CMPIEnumeration* assocUpcall(const CMPIBroker* mb, HostImpl::AssocOp op, const CMPIContext* ctx,
                             const CMPIObjectPath* source, const char* assocClass, const char* resultClass,
                             const char* role, const char* resultRole, const char** props, CMPIStatus* rc) {
    return upcall<CMPIEnumeration*>(mb, rc, nullptr, [&](HostImpl* h, Arena& out) -> CMPIEnumeration* {
        ObjectPath p;
        if (!upcallPath(h, ctx, source, p)) return setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER), nullptr;
        std::vector<std::string> pl = propertyList(props);
        Result r = h->assoc(op, p, text(assocClass), text(resultClass), text(role), text(resultRole),
                            props ? &pl : nullptr, entriesOf(ctx));
        bool names = op == HostImpl::AssocOp::AssociatorNames || op == HostImpl::AssocOp::ReferenceNames;
        return enumerationOf(h, out, r, names, rc);
    });
}

CMPIEnumeration* bAssociators(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                              const char* assocClass, const char* resultClass, const char* role,
                              const char* resultRole, const char** props, CMPIStatus* rc) {
    return assocUpcall(mb, HostImpl::AssocOp::Associators, ctx, op, assocClass, resultClass, role, resultRole,
                       props, rc);
}

CMPIEnumeration* bAssociatorNames(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                  const char* assocClass, const char* resultClass, const char* role,
                                  const char* resultRole, CMPIStatus* rc) {
    return assocUpcall(mb, HostImpl::AssocOp::AssociatorNames, ctx, op, assocClass, resultClass, role,
                       resultRole, nullptr, rc);
}

CMPIEnumeration* bReferences(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                             const char* resultClass, const char* role, const char** props, CMPIStatus* rc) {
    return assocUpcall(mb, HostImpl::AssocOp::References, ctx, op, nullptr, resultClass, role, nullptr, props, rc);
}

CMPIEnumeration* bReferenceNames(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                 const char* resultClass, const char* role, CMPIStatus* rc) {
    return assocUpcall(mb, HostImpl::AssocOp::ReferenceNames, ctx, op, nullptr, resultClass, role, nullptr,
                       nullptr, rc);
}

CMPIData bInvokeMethod(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                       const char* method, const CMPIArgs* in, CMPIArgs* out, CMPIStatus* rc) {
    return upcall<CMPIData>(mb, rc, nullData(), [&](HostImpl* h, Arena& arena) -> CMPIData {
        ObjectPath p;
        if (!upcallPath(h, ctx, op, p) || !method) return setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER), nullData();
        ArgsObj* inArgs = asArgs(in);
        if (in && !inArgs) return setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER), nullData();
        Result r = h->invoke(p, method, inArgs ? inArgs->args : Args(), entriesOf(ctx));
        if (ArgsObj* o = asArgs(out))
            for (const auto& a : r.outArgs) o->args.set(a.first, a.second);
        setStatus(rc, h, static_cast<CMPIrc>(r.rc), r.message, &arena);
        return r.hasReturnValue ? makeData(h, r.returnValue, 0, &arena) : nullData();
    });
}

CMPIStatus bSetProperty(const CMPIBroker* mb, const CMPIContext*, const CMPIObjectPath*, const char*,
                        const CMPIValue*, CMPIType) {
    return rcStatus(hostOf(mb) ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_HANDLE);
}

CMPIData bGetProperty(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op, const char* name,
                      CMPIStatus* rc) {
    return upcall<CMPIData>(mb, rc, nullData(), [&](HostImpl* h, Arena& out) -> CMPIData {
        ObjectPath p;
        if (!upcallPath(h, ctx, op, p) || !name) return setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER), nullData();
        Result r = h->get(p, nullptr, entriesOf(ctx));
        if (!r.ok()) return setStatus(rc, h, static_cast<CMPIrc>(r.rc), r.message, &out), nullData();
        const Value* v = r.instances.empty() ? nullptr : r.instances.front().property(name);
        if (!v) return setStatus(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY), nullData(CMPI_nullValue | CMPI_notFound);
        setStatus(rc, CMPI_RC_OK);
        return makeData(h, *v, 0, &out);
    });
}

// ---- Factories and helpers -----------------------------------------------------------------

template <class R, class F>
R factory(const CMPIBroker* mb, CMPIStatus* rc, F&& f) noexcept {
    HostImpl* h = hostOf(mb);
    if (!h) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    try {
        setStatus(rc, CMPI_RC_OK);
        return f(h);
    } catch (...) {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return nullptr;
    }
}

CMPIInstance* eNewInstance(const CMPIBroker* mb, const CMPIObjectPath* op, CMPIStatus* rc) {
    return factory<CMPIInstance*>(mb, rc, [&](HostImpl* h) -> CMPIInstance* {
        PathObj* p = asPath(op);
        if (!p) return setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER), nullptr;
        const ClassDecl* c = h->repo.find(p->path.className);
        if (!c) return setStatus(rc, h, CMPI_RC_ERR_NOT_FOUND, "unknown class " + p->path.className), nullptr;
        Instance inst;
        inst.path = p->path;
        inst.path.className = c->name;
        // Room for every declared property: a provider fills most of them.
        inst.properties.reserve(h->repo.properties(c->name).size());
        for (const auto& k : p->path.keys) inst.properties.set(k.first, k.second);
        return make<InstanceObj>(h, std::move(inst));
    });
}

CMPIObjectPath* eNewObjectPath(const CMPIBroker* mb, const char* ns, const char* cn, CMPIStatus* rc) {
    return factory<CMPIObjectPath*>(mb, rc, [&](HostImpl* h) -> CMPIObjectPath* {
        return make<PathObj>(h, ObjectPath(text(ns), text(cn)));
    });
}

CMPIArgs* eNewArgs(const CMPIBroker* mb, CMPIStatus* rc) {
    return factory<CMPIArgs*>(mb, rc, [&](HostImpl* h) -> CMPIArgs* { return make<ArgsObj>(h, Args()); });
}

CMPIString* eNewString(const CMPIBroker* mb, const char* data, CMPIStatus* rc) {
    return factory<CMPIString*>(mb, rc, [&](HostImpl* h) -> CMPIString* { return make<StringObj>(h, text(data)); });
}

CMPIArray* eNewArray(const CMPIBroker* mb, CMPICount max, CMPIType type, CMPIStatus* rc) {
    return factory<CMPIArray*>(mb, rc, [&](HostImpl* h) -> CMPIArray* {
        CimType t;
        bool array;
        if (!cimTypeOf(static_cast<CMPIType>(type & ~CMPI_ARRAY), t, array))
            return setStatus(rc, CMPI_RC_ERR_INVALID_DATA_TYPE), nullptr;
        if (max > (1u << 24)) return setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER), nullptr;
        return make<ArrayObj>(h, t, std::vector<Element>(max));
    });
}

CMPIDateTime* eNewDateTime(const CMPIBroker* mb, CMPIStatus* rc) {
    return factory<CMPIDateTime*>(mb, rc, [&](HostImpl* h) -> CMPIDateTime* {
        CMPIUint64 now = nowMicroseconds();
        return make<DateTimeObj>(h, dateTimeToText(now, false), now, false);
    });
}

CMPIDateTime* eNewDateTimeFromBinary(const CMPIBroker* mb, CMPIUint64 bin, CMPIBoolean interval, CMPIStatus* rc) {
    return factory<CMPIDateTime*>(mb, rc, [&](HostImpl* h) -> CMPIDateTime* {
        return make<DateTimeObj>(h, dateTimeToText(bin, interval != 0), bin, interval != 0);
    });
}

CMPIDateTime* eNewDateTimeFromChars(const CMPIBroker* mb, const char* chars, CMPIStatus* rc) {
    return factory<CMPIDateTime*>(mb, rc, [&](HostImpl* h) -> CMPIDateTime* {
        CMPIUint64 bin = 0;
        bool interval = false;
        if (!chars || !dateTimeFromText(chars, bin, interval)) return setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER), nullptr;
        return make<DateTimeObj>(h, chars, bin, interval);
    });
}

CMPISelectExp* eNewSelectExp(const CMPIBroker* mb, const char*, const char*, CMPIArray** projection, CMPIStatus* rc) {
    if (projection) *projection = nullptr;
    setStatus(rc, hostOf(mb) ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_HANDLE);
    return nullptr;
}

CMPIBoolean eClassPathIsA(const CMPIBroker* mb, const CMPIObjectPath* op, const char* type, CMPIStatus* rc) {
    HostImpl* h = hostOf(mb);
    PathObj* p = asPath(op);
    if (!h || !p || !type) {
        setStatus(rc, h ? CMPI_RC_ERR_INVALID_PARAMETER : CMPI_RC_ERR_INVALID_HANDLE);
        return 0;
    }
    try {
        if (!h->repo.exists(p->path.className)) {
            setStatus(rc, h, CMPI_RC_ERR_INVALID_CLASS, "unknown class " + p->path.className);
            return 0;
        }
        setStatus(rc, CMPI_RC_OK);
        return h->repo.isA(p->path.className, type) ? 1 : 0;
    } catch (...) {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return 0;
    }
}

CMPIString* eToString(const CMPIBroker* mb, const void* object, CMPIStatus* rc) {
    return factory<CMPIString*>(mb, rc, [&](HostImpl* h) -> CMPIString* {
        std::string s, type;
        if (!describeObject(object, s, type)) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), nullptr;
        return make<StringObj>(h, s);
    });
}

CMPIBoolean eIsOfType(const CMPIBroker* mb, const void* object, const char* type, CMPIStatus* rc) {
    std::string s, t;
    if (!hostOf(mb) || !type || !describeObject(object, s, t)) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return 0;
    }
    setStatus(rc, CMPI_RC_OK);
    return t == type ? 1 : 0;
}

CMPIString* eGetType(const CMPIBroker* mb, const void* object, CMPIStatus* rc) {
    return factory<CMPIString*>(mb, rc, [&](HostImpl* h) -> CMPIString* {
        std::string s, type;
        if (!describeObject(object, s, type)) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), nullptr;
        return make<StringObj>(h, type);
    });
}

// No message catalogues: the default message is the message.
CMPIString* eGetMessage(const CMPIBroker* mb, const char*, const char* defMsg, CMPIStatus* rc, CMPICount, ...) {
    return factory<CMPIString*>(mb, rc, [&](HostImpl* h) -> CMPIString* { return make<StringObj>(h, text(defMsg)); });
}

CMPIStatus eLogMessage(const CMPIBroker* mb, int, const char*, const char*, const CMPIString*) {
    return rcStatus(hostOf(mb) ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE);
}

CMPIStatus eTrace(const CMPIBroker* mb, int, const char*, const char*, const CMPIString*) {
    return rcStatus(hostOf(mb) ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE);
}

CMPIError* eNewCMPIError(const CMPIBroker* mb, const char*, const char*, const char*, const CMPIErrorSeverity,
                         const CMPIErrorProbableCause, const CMPIrc, CMPIStatus* rc) {
    setStatus(rc, hostOf(mb) ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_HANDLE);
    return nullptr;
}

CMPIStatus eOpenMessageFile(const CMPIBroker* mb, const char*, CMPIMsgFileHandle* handle) {
    if (handle) *handle = nullptr;
    return rcStatus(hostOf(mb) ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_HANDLE);
}

CMPIStatus eCloseMessageFile(const CMPIBroker* mb, const CMPIMsgFileHandle) {
    return rcStatus(hostOf(mb) ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_HANDLE);
}

CMPIString* eGetMessage2(const CMPIBroker* mb, const char*, const CMPIMsgFileHandle, const char* defMsg,
                         CMPIStatus* rc, CMPICount, ...) {
    return factory<CMPIString*>(mb, rc, [&](HostImpl* h) -> CMPIString* { return make<StringObj>(h, text(defMsg)); });
}

// ---- OS services ---------------------------------------------------------------------------

char* xResolveFileName(const char* name) {
    if (!name) return nullptr;
    std::string s = "lib" + std::string(name) + ".so";
    return strdup(s.c_str());
}

struct ThreadStart {
    void* (*start)(void*);
    void* arg;
};

void* threadTrampoline(void* p) {
    ThreadStart s = *static_cast<ThreadStart*>(p);
    delete static_cast<ThreadStart*>(p);
    return s.start(s.arg);
}

void* xNewThread(void* (*start)(void*), void* parm, int detached) {
    if (!start) return nullptr;
    auto* s = new (std::nothrow) ThreadStart{start, parm};
    if (!s) return nullptr;
    pthread_attr_t attr;
    pthread_attr_init(&attr);
    if (detached) pthread_attr_setdetachstate(&attr, PTHREAD_CREATE_DETACHED);
    pthread_t t;
    int rc = pthread_create(&t, &attr, threadTrampoline, s);
    pthread_attr_destroy(&attr);
    if (rc != 0) {
        delete s;
        return nullptr;
    }
    static_assert(sizeof(pthread_t) <= sizeof(void*), "pthread_t must fit a CMPI thread handle");
    void* handle = nullptr;
    std::memcpy(&handle, &t, sizeof t);
    return handle;
}

pthread_t threadOf(void* handle) {
    pthread_t t;
    std::memset(&t, 0, sizeof t);
    std::memcpy(&t, &handle, sizeof t);
    return t;
}

int xJoinThread(void* thread, void** ret) { return pthread_join(threadOf(thread), ret); }
int xExitThread(void* ret) { pthread_exit(ret); }
int xCancelThread(void* thread) { return pthread_cancel(threadOf(thread)); }

int xThreadSleep(CMPIUint32 msec) {
    struct timespec ts;
    ts.tv_sec = msec / 1000;
    ts.tv_nsec = static_cast<long>(msec % 1000) * 1000000L;
    while (nanosleep(&ts, &ts) != 0 && errno == EINTR) {
    }
    return 0;
}

int xThreadOnce(int* once, void (*init)(void)) {
    static std::mutex m;
    if (!once || !init) return EINVAL;
    std::lock_guard<std::mutex> lock(m);
    if (*once == 0) {
        *once = 1;
        init();
    }
    return 0;
}

int xCreateThreadKey(CMPI_THREAD_KEY_TYPE* key, void (*cleanup)(void*)) {
    static_assert(sizeof(pthread_key_t) == sizeof(CMPI_THREAD_KEY_TYPE), "thread key size");
    if (!key) return EINVAL;
    pthread_key_t k;
    int rc = pthread_key_create(&k, cleanup);
    if (rc == 0) std::memcpy(key, &k, sizeof k);
    return rc;
}
int xDestroyThreadKey(CMPI_THREAD_KEY_TYPE key) { return pthread_key_delete(static_cast<pthread_key_t>(key)); }
void* xGetThreadSpecific(CMPI_THREAD_KEY_TYPE key) { return pthread_getspecific(static_cast<pthread_key_t>(key)); }
int xSetThreadSpecific(CMPI_THREAD_KEY_TYPE key, void* value) {
    return pthread_setspecific(static_cast<pthread_key_t>(key), value);
}

void* xNewMutex(int) {
    auto* m = new (std::nothrow) pthread_mutex_t;
    if (!m) return nullptr;
    pthread_mutexattr_t attr;
    pthread_mutexattr_init(&attr);
    pthread_mutexattr_settype(&attr, PTHREAD_MUTEX_RECURSIVE);
    pthread_mutex_init(m, &attr);
    pthread_mutexattr_destroy(&attr);
    return m;
}
void xDestroyMutex(void* m) {
    if (!m) return;
    pthread_mutex_destroy(static_cast<pthread_mutex_t*>(m));
    delete static_cast<pthread_mutex_t*>(m);
}
void xLockMutex(void* m) {
    if (m) pthread_mutex_lock(static_cast<pthread_mutex_t*>(m));
}
void xUnlockMutex(void* m) {
    if (m) pthread_mutex_unlock(static_cast<pthread_mutex_t*>(m));
}
void* xNewCondition(int) {
    auto* c = new (std::nothrow) pthread_cond_t;
    if (c) pthread_cond_init(c, nullptr);
    return c;
}
void xDestroyCondition(void* c) {
    if (!c) return;
    pthread_cond_destroy(static_cast<pthread_cond_t*>(c));
    delete static_cast<pthread_cond_t*>(c);
}
int xCondWait(void* c, void* m) {
    if (!c || !m) return EINVAL;
    return pthread_cond_wait(static_cast<pthread_cond_t*>(c), static_cast<pthread_mutex_t*>(m));
}
int xTimedCondWait(void* c, void* m, struct timespec* ts) {
    if (!c || !m || !ts) return EINVAL;
    return pthread_cond_timedwait(static_cast<pthread_cond_t*>(c), static_cast<pthread_mutex_t*>(m), ts);
}
int xSignalCondition(void* c) {
    if (!c) return EINVAL;
    return pthread_cond_signal(static_cast<pthread_cond_t*>(c));
}

// ---- Memory --------------------------------------------------------------------------------

// mark/release need a request of the calling thread (or an attached thread): the host's own
// arena is shared by every thread outside a request, so a release there could take objects
// another thread still uses. The mark lives in the request's memory.
struct GcMark {
    Arena* arena;
    std::size_t count;
};

CMPIGcStat* mMark(const CMPIBroker* mb, CMPIStatus* rc) {
    HostImpl* h = hostOf(mb);
    Frame* f = currentFrame();
    if (!h || !f || f->host != h) {
        setStatus(rc, h ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    auto* m = static_cast<GcMark*>(f->arena.allocate(sizeof(GcMark), true));
    if (!m) {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return nullptr;
    }
    m->arena = &f->arena;
    m->count = f->arena.mark();
    setStatus(rc, CMPI_RC_OK);
    return m;
}

CMPIStatus mRelease(const CMPIBroker* mb, const CMPIGcStat* gc) {
    HostImpl* h = hostOf(mb);
    if (!h) return rcStatus(CMPI_RC_ERR_INVALID_HANDLE);
    Frame* f = currentFrame();
    const auto* m = static_cast<const GcMark*>(gc);
    if (!m || !f || f->host != h || m->arena != &f->arena) return rcStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    f->arena.releaseTo(m->count);
    return okStatus();
}

void* mMalloc(const CMPIBroker* mb, size_t size) {
    HostImpl* h = hostOf(mb);
    return h ? h->arena().allocate(size, false) : nullptr;
}
void* mCalloc(const CMPIBroker* mb, size_t n, size_t size) {
    HostImpl* h = hostOf(mb);
    if (!h || (size && n > static_cast<size_t>(-1) / size)) return nullptr;
    return h->arena().allocate(n * size, true);
}
void* mRealloc(const CMPIBroker* mb, void* p, size_t size) {
    HostImpl* h = hostOf(mb);
    return h ? h->arena().reallocate(p, size) : nullptr;
}
char* mStrDup(const CMPIBroker* mb, const char* s) {
    HostImpl* h = hostOf(mb);
    if (!h || !s) return nullptr;
    size_t n = std::strlen(s) + 1;
    char* p = static_cast<char*>(h->arena().allocate(n, false));
    if (p) std::memcpy(p, s, n);
    return p;
}
void mFree(const CMPIBroker* mb, void* p) {
    HostImpl* h = hostOf(mb);
    if (h && p) h->arena().free(p);
}
void mFreeInstance(const CMPIBroker*, CMPIInstance* o) { clones::release(o); }
void mFreeObjectPath(const CMPIBroker*, CMPIObjectPath* o) { clones::release(o); }
void mFreeArgs(const CMPIBroker*, CMPIArgs* o) { clones::release(o); }
void mFreeString(const CMPIBroker*, CMPIString* o) { clones::release(o); }
void mFreeArray(const CMPIBroker*, CMPIArray* o) { clones::release(o); }
void mFreeDateTime(const CMPIBroker*, CMPIDateTime* o) { clones::release(o); }
void mFreeSelectExp(const CMPIBroker*, CMPISelectExp*) {}

}  // namespace

CMPIBrokerFT brokerFT = [] {
    auto t = zeroed<CMPIBrokerFT>();
    t.brokerCapabilities = CMPI_MB_InstanceManipulation | CMPI_MB_AssociationTraversal |
                           CMPI_MB_OSEncapsulationSupport | CMPI_MB_Supports_MemEnhancements;
    t.brokerVersion = CMPICurrentVersion;
    t.brokerName = "ipif";
    t.prepareAttachThread = bPrepareAttachThread;
    t.attachThread = bAttachThread;
    t.detachThread = bDetachThread;
    t.deliverIndication = bDeliverIndication;
    t.enumerateInstanceNames = bEnumInstanceNames;
    t.getInstance = bGetInstance;
    t.createInstance = bCreateInstance;
    t.modifyInstance = bModifyInstance;
    t.deleteInstance = bDeleteInstance;
    t.execQuery = bExecQuery;
    t.enumerateInstances = bEnumInstances;
    t.associators = bAssociators;
    t.associatorNames = bAssociatorNames;
    t.references = bReferences;
    t.referenceNames = bReferenceNames;
    t.invokeMethod = bInvokeMethod;
    t.setProperty = bSetProperty;
    t.getProperty = bGetProperty;
    return t;
}();

CMPIBrokerEncFT brokerEncFT = [] {
    auto t = zeroed<CMPIBrokerEncFT>();
    t.ftVersion = CMPICurrentVersion;
    t.newInstance = eNewInstance;
    t.newObjectPath = eNewObjectPath;
    t.newArgs = eNewArgs;
    t.newString = eNewString;
    t.newArray = eNewArray;
    t.newDateTime = eNewDateTime;
    t.newDateTimeFromBinary = eNewDateTimeFromBinary;
    t.newDateTimeFromChars = eNewDateTimeFromChars;
    t.newSelectExp = eNewSelectExp;
    t.classPathIsA = eClassPathIsA;
    t.toString = eToString;
    t.isOfType = eIsOfType;
    t.getType = eGetType;
    t.getMessage = eGetMessage;
    t.logMessage = eLogMessage;
    t.trace = eTrace;
    t.newCMPIError = eNewCMPIError;
    t.openMessageFile = eOpenMessageFile;
    t.closeMessageFile = eCloseMessageFile;
    t.getMessage2 = eGetMessage2;
    return t;
}();

CMPIBrokerExtFT brokerExtFT = [] {
    auto t = zeroed<CMPIBrokerExtFT>();
    t.ftVersion = CMPICurrentVersion;
    t.resolveFileName = xResolveFileName;
    t.newThread = xNewThread;
    t.joinThread = xJoinThread;
    t.exitThread = xExitThread;
    t.cancelThread = xCancelThread;
    t.threadSleep = xThreadSleep;
    t.threadOnce = xThreadOnce;
    t.createThreadKey = xCreateThreadKey;
    t.destroyThreadKey = xDestroyThreadKey;
    t.getThreadSpecific = xGetThreadSpecific;
    t.setThreadSpecific = xSetThreadSpecific;
    t.newMutex = xNewMutex;
    t.destroyMutex = xDestroyMutex;
    t.lockMutex = xLockMutex;
    t.unlockMutex = xUnlockMutex;
    t.newCondition = xNewCondition;
    t.destroyCondition = xDestroyCondition;
    t.condWait = xCondWait;
    t.timedCondWait = xTimedCondWait;
    t.signalCondition = xSignalCondition;
    return t;
}();

// Positional: the table's ftVersion is const.
CMPIBrokerMemFT brokerMemFT = {CMPICurrentVersion, mMark,          mRelease,        mMalloc,      mCalloc,
                               mRealloc,           mStrDup,        mFree,           mFreeInstance, mFreeObjectPath,
                               mFreeArgs,          mFreeString,    mFreeArray,      mFreeDateTime, mFreeSelectExp};

}  // namespace detail
}  // namespace ipif
