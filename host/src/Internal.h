// The host's CMPI side: the encapsulated objects it hands to providers, request arenas, and
// the conversions between CMPI data and host values. Not installed; host sources only.
#pragma once

#include <cmpidt.h>
#include <cmpift.h>

#include <atomic>
#include <cstring>
#include <exception>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <unordered_map>
#include <vector>

#include "ipif/Host.h"

namespace ipif {
namespace detail {

using HostImpl = Host::Impl;

// Base of every CMPI object the host creates. Counted per host for HostStats.
struct EncObject {
    explicit EncObject(HostImpl* h);
    virtual ~EncObject();
    EncObject(const EncObject&) = delete;
    EncObject& operator=(const EncObject&) = delete;
    HostImpl* host;
};

// The function tables (one per type, shared by every host).
extern CMPIStringFT stringFT;
extern CMPIInstanceFT instanceFT;
extern CMPIObjectPathFT objectPathFT;
extern CMPIArgsFT argsFT;
extern CMPIArrayFT arrayFT;
extern CMPIEnumerationFT enumerationFT;
extern CMPIDateTimeFT dateTimeFT;
extern CMPIContextFT contextFT;
extern CMPIResultFT resultFT;
extern CMPIBrokerFT brokerFT;
extern CMPIBrokerEncFT brokerEncFT;
extern CMPIBrokerExtFT brokerExtFT;
extern CMPIBrokerMemFT brokerMemFT;

struct StringObj : CMPIString, EncObject {
    using CmpiType = CMPIString;
    StringObj(HostImpl* h, std::string s);
    std::string text;  // hdl points at its characters; never changed after construction
};

struct InstanceObj : CMPIInstance, EncObject {
    using CmpiType = CMPIInstance;
    InstanceObj(HostImpl* h, Instance i);
    Instance inst;
    bool filtered = false;
    std::vector<std::string> filter;
    // inst's class in the repository, for the property sets; follows the path's class.
    const ClassRepository::ResolvedClass* resolved;
};

struct PathObj : CMPIObjectPath, EncObject {
    using CmpiType = CMPIObjectPath;
    PathObj(HostImpl* h, ObjectPath p);
    ObjectPath path;
    std::string hostname;
};

struct ArgsObj : CMPIArgs, EncObject {
    using CmpiType = CMPIArgs;
    ArgsObj(HostImpl* h, Args a);
    Args args;
};

struct ArrayObj : CMPIArray, EncObject {
    using CmpiType = CMPIArray;
    ArrayObj(HostImpl* h, CimType t, std::vector<Element> e);
    CimType type;
    std::vector<Element> elements;  // std::monostate: a null element
};

struct EnumObj : CMPIEnumeration, EncObject {
    using CmpiType = CMPIEnumeration;
    EnumObj(HostImpl* h, std::vector<Value> v);
    std::vector<Value> items;  // instances or references
    mutable std::size_t next = 0;
};

struct DateTimeObj : CMPIDateTime, EncObject {
    using CmpiType = CMPIDateTime;
    DateTimeObj(HostImpl* h, std::string text, CMPIUint64 binary, bool interval);
    std::string text;
    CMPIUint64 binary;
    bool interval;
};

struct ContextObj : CMPIContext, EncObject {
    using CmpiType = CMPIContext;
    ContextObj(HostImpl* h, NamedValues e);
    mutable NamedValues entries;
};

// What a provider hands back through a CMPIResult.
struct Collector {
    std::string nameSpace;  // given to returned instances and paths that have none
    std::vector<Instance> instances;
    std::vector<ObjectPath> paths;
    std::vector<Value> data;
    bool done = false;
    const InstanceSink* sink = nullptr;  // takes the instances instead, when the caller gave one
    std::exception_ptr sinkFailure;      // what the sink threw; the request fails with it
};

struct ResultObj : CMPIResult, EncObject {
    using CmpiType = CMPIResult;
    ResultObj(HostImpl* h, Collector* c);
    Collector* sink;  // cleared when the provider call returns
};

// The objects a request owns. Freed, newest first, when the arena goes.
class Arena {
public:
    Arena() = default;
    ~Arena();
    Arena(const Arena&) = delete;
    Arena& operator=(const Arena&) = delete;

    template <class T>
    T* adopt(std::unique_ptr<T> obj) {
        T* raw = obj.get();
        std::lock_guard<std::mutex> lock(mutex_);
        objects_.push_back(std::move(obj));
        return raw;
    }
    std::size_t mark();
    void releaseTo(std::size_t mark);  // frees the objects made after mark
    void* allocate(std::size_t size, bool zero);
    void* reallocate(void* block, std::size_t size);
    bool free(void* block);  // false: not a block of this arena
    void clear();

private:
    std::mutex mutex_;
    std::vector<std::unique_ptr<EncObject>> objects_;
    std::unordered_map<void*, std::size_t> blocks_;
};

// A request in progress on this thread. Up-calls of the same host nest into it.
struct Frame {
    HostImpl* host = nullptr;
    Arena arena;
    int depth = 0;
    Frame* previous = nullptr;
};

class RequestScope {
public:
    explicit RequestScope(HostImpl* host);
    ~RequestScope();
    RequestScope(const RequestScope&) = delete;
    RequestScope& operator=(const RequestScope&) = delete;
    bool tooDeep() const;

private:
    std::unique_ptr<Frame> own_;
    Frame* frame_;
};

Frame*& currentFrame();

// Clones, owned by the provider: keyed by the CMPI struct pointer so release() never has to
// look inside a pointer it does not know.
namespace clones {
void adopt(const void* key, std::unique_ptr<EncObject> obj);
bool release(const void* key);  // false: not a clone (request- or host-owned)
void releaseAll(HostImpl* host);
}  // namespace clones

// A function table with every entry null.
template <class T>
T zeroed() {
    T t;
    std::memset(&t, 0, sizeof t);
    return t;
}

// Creates an object in the current arena of host (the request's, or the host's own).
template <class T, class... A>
T* make(HostImpl* host, A&&... args);

template <class T, class... A>
T* makeIn(Arena& arena, HostImpl* host, A&&... args);

// Creates a clone owned by the provider.
template <class T, class... A>
T* makeClone(HostImpl* host, A&&... args);

// Checked views of objects a provider passes in: null when the pointer is null or not ours.
StringObj* asString(const CMPIString* s);
InstanceObj* asInstance(const CMPIInstance* i);
PathObj* asPath(const CMPIObjectPath* p);
ArgsObj* asArgs(const CMPIArgs* a);
ArrayObj* asArray(const CMPIArray* a);
DateTimeObj* asDateTime(const CMPIDateTime* d);
ContextObj* asContext(const CMPIContext* c);
HostImpl* hostOf(const CMPIBroker* b);

// Type mapping. cmpiTypeOf never fails; cimTypeOf is false for args, enumerations, pointers...
CMPIType cmpiTypeOf(CimType t, bool array);
bool cimTypeOf(CMPIType t, CimType& out, bool& array);

// Reads what a provider passes as (value, type), following the brokers' convention that a
// CMPI_chars value is the char* itself. Returns the CMPI rc.
CMPIrc readValue(const CMPIValue* value, CMPIType type, Value& out);
// A CMPIData of a host value; strings, paths, arrays... are created in arena, by default the
// host's current one.
CMPIData makeData(HostImpl* host, const Value& v, CMPIValueState extraState = 0, Arena* arena = nullptr);
CMPIData nullData(CMPIValueState state = CMPI_nullValue);

CMPIStatus rcStatus(CMPIrc rc);  // no message
CMPIStatus okStatus();
CMPIStatus status(HostImpl* host, CMPIrc rc, const std::string& message, Arena* arena = nullptr);
void setStatus(CMPIStatus* st, CMPIrc rc);
void setStatus(CMPIStatus* st, HostImpl* host, CMPIrc rc, const std::string& message, Arena* arena = nullptr);
// The text of a status message of any provider-made string (ours or not).
std::string statusText(const CMPIStatus& st);

// CIM datetime text <-> microseconds.
bool dateTimeFromText(const std::string& text, CMPIUint64& binary, bool& interval);
std::string dateTimeToText(CMPIUint64 binary, bool interval);
CMPIUint64 nowMicroseconds();

// toString / getType of any encapsulated object; false when the object is not ours.
bool describeObject(const void* object, std::string& text, std::string& typeName);

}  // namespace detail

// The host core: repository, registrations, providers, broker.
class Host::Impl {
public:
    explicit Impl(HostOptions options);
    ~Impl();

    HostOptions options;
    ClassRepository repo;
    std::vector<Registration> regs;
    std::atomic<long> liveObjects{0};
    std::atomic<long> liveClones{0};
    CMPIBroker broker{};

    detail::Arena& arena();  // the current request's, or hostArena outside requests

    // Operations. The caller holds a RequestScope. ctx: the caller's context entries (up-calls).
    // sink: the caller's InstanceSink (none for up-calls).
    Result enumerate(const ObjectPath& classPath, bool names, const std::vector<std::string>* props,
                     const NamedValues* ctx, const InstanceSink* sink = nullptr);
    Result get(const ObjectPath& path, const std::vector<std::string>* props, const NamedValues* ctx,
               const InstanceSink* sink = nullptr);
    Result modify(const ObjectPath& path, const Instance& inst, const std::vector<std::string>* props,
                  const NamedValues* ctx);
    Result create(const ObjectPath& path, const Instance& inst, const NamedValues* ctx);
    Result remove(const ObjectPath& path, const NamedValues* ctx);
    Result query(const ObjectPath& classPath, const std::string& query, const std::string& language,
                 const NamedValues* ctx, const InstanceSink* sink = nullptr);
    enum class AssocOp { Associators, AssociatorNames, References, ReferenceNames };
    Result assoc(AssocOp op, const ObjectPath& path, const std::string& assocClass, const std::string& resultClass,
                 const std::string& role, const std::string& resultRole, const std::vector<std::string>* props,
                 const NamedValues* ctx, const InstanceSink* sink = nullptr);
    Result invoke(const ObjectPath& path, const std::string& method, const Args& in, const NamedValues* ctx);

    // Namespace of a path or, when it has none, the default.
    std::string nameSpaceOf(const ObjectPath& path) const;

    // Threads attached with attachThread.
    void attachThread();
    bool detachThread();

    bool waitForThreads(std::chrono::milliseconds timeout);
    bool onlyBaselineThreads() const;

private:
    struct Provider;
    enum class Kind { Instance, Association, Method };

    struct Call;

    Provider* providerOf(const Registration& r);
    void* miFor(Provider& p, Kind kind, std::string& error);
    // The MI, or null with the failure set in result.
    template <class MI>
    MI* miOf(Provider& p, Kind kind, Result& result);
    // The MI of the provider serving path's class; none registered fails with rc none.
    template <class MI>
    MI* serving(const ObjectPath& path, Kind kind, CMPIrc none, Result& result);
    const Registration* registrationFor(const std::string& ns, const std::string& cls, Kind kind) const;
    void finish(Result& r, detail::Collector& c, const CMPIStatus& st);
    CMPIContext* newContext(const std::string& ns, const NamedValues* ctx);

    std::vector<std::unique_ptr<Provider>> providers_;
    std::vector<long> baseline_;
    std::mutex framesMutex_;
    std::map<unsigned long, std::unique_ptr<detail::Frame>> attached_;
    detail::Arena hostArena_;
};

namespace detail {

template <class T, class... A>
T* make(HostImpl* host, A&&... args) {
    return host->arena().adopt(std::unique_ptr<T>(new T(host, std::forward<A>(args)...)));
}

template <class T, class... A>
T* makeIn(Arena& arena, HostImpl* host, A&&... args) {
    return arena.adopt(std::unique_ptr<T>(new T(host, std::forward<A>(args)...)));
}

template <class T, class... A>
T* makeClone(HostImpl* host, A&&... args) {
    std::unique_ptr<T> obj(new T(host, std::forward<A>(args)...));
    T* raw = obj.get();
    clones::adopt(static_cast<const void*>(static_cast<typename T::CmpiType*>(raw)), std::move(obj));
    return raw;
}

}  // namespace detail
}  // namespace ipif
