// The host core: loading providers, routing requests to them, the public API.
#include <dirent.h>
#include <dlfcn.h>
#include <pthread.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <thread>

#include "DefaultPaths.h"
#include "Internal.h"

namespace ipif {

using namespace detail;

namespace {

const char* kindName(int kind) {
    static const char* names[] = {"Instance", "Association", "Method"};
    return names[kind];
}

std::vector<long> currentTasks() {
    std::vector<long> tids;
    if (DIR* dir = opendir("/proc/self/task")) {
        while (dirent* e = readdir(dir))
            if (e->d_name[0] != '.') tids.push_back(std::strtol(e->d_name, nullptr, 10));
        closedir(dir);
    }
    std::sort(tids.begin(), tids.end());
    return tids;
}

// Property lists as providers take them: NULL-terminated, or NULL for "all".
class CharList {
public:
    explicit CharList(const std::vector<std::string>* list) {
        if (!list) return;
        for (const auto& s : *list) ptrs_.push_back(s.c_str());
        ptrs_.push_back(nullptr);
    }
    const char** get() { return ptrs_.empty() ? nullptr : ptrs_.data(); }

private:
    std::vector<const char*> ptrs_;
};

const char* orNull(const std::string& s) { return s.empty() ? nullptr : s.c_str(); }

// Calls into a provider; an exception escaping it becomes CMPI_RC_ERR_FAILED.
template <class F>
CMPIStatus callProvider(HostImpl* h, F&& f) {
    try {
        return f();
    } catch (const std::exception& e) {
        return status(h, CMPI_RC_ERR_FAILED, std::string("provider threw: ") + e.what());
    } catch (...) {
        return status(h, CMPI_RC_ERR_FAILED, "provider threw an exception");
    }
}

// Calls a factory found with dlsym through its exact type (a call through any other type is
// undefined): the generic one if there is one, else the provider's own.
template <class MI>
MI* createMI(void* genericSym, void* specificSym, const CMPIBroker* broker, const CMPIContext* ctx,
             const char* providerName, CMPIStatus* st) {
    using Generic = MI* (*)(const CMPIBroker*, const CMPIContext*, const char*, CMPIStatus*);
    using Specific = MI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
    if (genericSym) return reinterpret_cast<Generic>(genericSym)(broker, ctx, providerName, st);
    return reinterpret_cast<Specific>(specificSym)(broker, ctx, st);
}

Result failure(int rc, const std::string& message) {
    Result r;
    r.rc = rc;
    r.message = message;
    return r;
}

// The host serves the namespaces its registrations name; a request for any other fails with
// CMPI_RC_ERR_INVALID_NAMESPACE (set in result, and true returned).
bool unknownNamespace(const std::vector<Registration>& regs, const std::string& ns, Result& result) {
    if (std::any_of(regs.begin(), regs.end(), [&](const Registration& r) { return r.servesNamespace(ns); }))
        return false;
    result = failure(CMPI_RC_ERR_INVALID_NAMESPACE, "unknown namespace " + ns);
    return true;
}

}  // namespace

std::vector<std::string> HostOptions::splitList(const std::string& list) {
    std::vector<std::string> out;
    std::size_t start = 0;
    while (start <= list.size()) {
        std::size_t end = list.find(':', start);
        if (end == std::string::npos) end = list.size();
        if (end > start) out.push_back(list.substr(start, end - start));
        start = end + 1;
    }
    return out;
}

struct Host::Impl::Provider {
    std::string name;
    std::string location;
    std::recursive_mutex mutex;
    void* handle = nullptr;
    std::string loadError;
    void* mi[3] = {nullptr, nullptr, nullptr};
    bool tried[3] = {false, false, false};
    bool creating[3] = {false, false, false};
    std::string error[3];
};

Host::Impl::Impl(HostOptions o) : options(std::move(o)) {
    broker.hdl = this;
    broker.bft = &brokerFT;
    broker.eft = &brokerEncFT;
    broker.xft = &brokerExtFT;
    broker.mft = &brokerMemFT;

    std::vector<std::string> mofs = options.mofPaths;
    if (mofs.empty()) {
        const char* env = std::getenv("IPIF_MOF_DIR");
        mofs = env && *env ? HostOptions::splitList(env) : defaultMofPaths();
    }
    for (const auto& m : mofs) repo.addPath(m);
    repo.resolve();

    std::vector<std::string> regPaths = options.regPaths;
    if (regPaths.empty()) {
        const char* env = std::getenv("IPIF_REG");
        regPaths = env && *env ? HostOptions::splitList(env) : std::vector<std::string>{defaultDataDir()};
    }
    for (const auto& p : regPaths) {
        auto more = loadRegistrations(p);
        regs.insert(regs.end(), more.begin(), more.end());
    }
    for (const auto& r : regs) {
        bool known = std::any_of(providers_.begin(), providers_.end(), [&](const std::unique_ptr<Provider>& p) {
            return p->name == r.providerName && p->location == r.location;
        });
        if (known) continue;
        providers_.push_back(std::make_unique<Provider>());
        providers_.back()->name = r.providerName;
        providers_.back()->location = r.location;
    }
    baseline_ = currentTasks();
}

Host::Impl::~Impl() {
    bool keepLoaded = false;
    {
        RequestScope scope(this);
        for (auto& p : providers_) {
            for (int k = 0; k < 3; ++k) {
                if (!p->mi[k]) continue;
                CMPIContext* ctx = nullptr;
                try {
                    ctx = newContext(options.defaultNamespace, nullptr);
                } catch (...) {
                    continue;
                }
                auto cleanup = [&](auto* mi) {
                    return mi->ft && mi->ft->cleanup ? mi->ft->cleanup(mi, ctx, 1) : okStatus();
                };
                CMPIStatus st = callProvider(this, [&]() -> CMPIStatus {
                    if (k == 0) return cleanup(static_cast<CMPIInstanceMI*>(p->mi[k]));
                    if (k == 1) return cleanup(static_cast<CMPIAssociationMI*>(p->mi[k]));
                    return cleanup(static_cast<CMPIMethodMI*>(p->mi[k]));
                });
                if (st.rc == CMPI_RC_DO_NOT_UNLOAD || st.rc == CMPI_RC_NEVER_UNLOAD) keepLoaded = true;
            }
        }
    }
    // A provider thread still running would lose its code under it.
    if (!keepLoaded && onlyBaselineThreads())
        for (auto& p : providers_)
            if (p->handle) dlclose(p->handle);
    clones::releaseAll(this);
    {
        std::lock_guard<std::mutex> lock(framesMutex_);
        attached_.clear();
    }
    hostArena_.clear();
}

Arena& Host::Impl::arena() {
    Frame* f = currentFrame();
    return f && f->host == this ? f->arena : hostArena_;
}

std::string Host::Impl::nameSpaceOf(const ObjectPath& path) const {
    return path.nameSpace.empty() ? options.defaultNamespace : path.nameSpace;
}

CMPIContext* Host::Impl::newContext(const std::string& ns, const NamedValues* ctx) {
    NamedValues entries = ctx ? *ctx : NamedValues();
    entries.set(CMPIInitNameSpace, Value::string(ns));
    if (!entries.find(CMPIInvocationFlags)) entries.set(CMPIInvocationFlags, Value::uint32(0));
    return make<ContextObj>(this, std::move(entries));
}

void Host::Impl::attachThread() {
    auto frame = std::make_unique<Frame>();
    frame->host = this;
    frame->depth = 1;
    frame->previous = currentFrame();
    currentFrame() = frame.get();
    std::lock_guard<std::mutex> lock(framesMutex_);
    attached_[static_cast<unsigned long>(pthread_self())] = std::move(frame);
}

bool Host::Impl::detachThread() {
    std::unique_ptr<Frame> frame;
    {
        std::lock_guard<std::mutex> lock(framesMutex_);
        auto it = attached_.find(static_cast<unsigned long>(pthread_self()));
        if (it == attached_.end() || currentFrame() != it->second.get()) return false;
        frame = std::move(it->second);
        attached_.erase(it);
    }
    currentFrame() = frame->previous;
    return true;
}

bool Host::Impl::onlyBaselineThreads() const {
    for (long tid : currentTasks())
        if (!std::binary_search(baseline_.begin(), baseline_.end(), tid)) return false;
    return true;
}

bool Host::Impl::waitForThreads(std::chrono::milliseconds timeout) {
    auto deadline = std::chrono::steady_clock::now() + timeout;
    while (true) {
        if (onlyBaselineThreads()) return true;
        if (std::chrono::steady_clock::now() >= deadline) return false;
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
}

Host::Impl::Provider* Host::Impl::providerOf(const Registration& r) {
    for (auto& p : providers_)
        if (p->name == r.providerName && p->location == r.location) return p.get();
    return nullptr;
}

void* Host::Impl::miFor(Provider& p, Kind kind, std::string& error) {
    int k = static_cast<int>(kind);
    std::lock_guard<std::recursive_mutex> lock(p.mutex);
    if (p.mi[k]) return p.mi[k];
    if (p.tried[k]) {
        error = p.error[k];
        return nullptr;
    }
    if (p.creating[k]) {
        error = "provider " + p.name + " is still starting";
        return nullptr;
    }
    if (!p.handle) {
        if (!p.loadError.empty()) {
            error = p.loadError;
            return nullptr;
        }
        std::string file = "lib" + p.location + ".so";
        std::vector<std::string> dirs = options.providerDirs;
        if (const char* env = std::getenv("IPIF_PROVIDER_PATH")) {
            auto more = HostOptions::splitList(env);
            dirs.insert(dirs.end(), more.begin(), more.end());
        }
        dirs.push_back(defaultProviderDir());
        for (const auto& d : dirs) {
            std::string path = d + "/" + file;
            if (access(path.c_str(), F_OK) != 0) continue;
            p.handle = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
            if (!p.handle) {
                const char* e = dlerror();
                p.loadError = "cannot load provider library " + path + ": " + (e ? e : "unknown error");
            }
            break;
        }
        if (!p.handle && p.loadError.empty()) {
            p.handle = dlopen(file.c_str(), RTLD_NOW | RTLD_LOCAL);
            if (!p.handle) {
                const char* e = dlerror();
                p.loadError = "cannot find provider library " + file + ": " + (e ? e : "unknown error");
            }
        }
        if (!p.handle) {
            error = p.loadError;
            return nullptr;
        }
    }
    p.creating[k] = true;
    std::string generic = std::string("_Generic_Create_") + kindName(k) + "MI";
    std::string specific = p.name + "_Create_" + kindName(k) + "MI";
    void* genericSym = dlsym(p.handle, generic.c_str());
    void* specificSym = genericSym ? nullptr : dlsym(p.handle, specific.c_str());
    void* mi = nullptr;
    CMPIStatus st = okStatus();
    if (genericSym || specificSym) {
        CMPIContext* ctx = newContext(options.defaultNamespace, nullptr);
        CMPIStatus thrown = callProvider(this, [&]() -> CMPIStatus {
            const char* name = p.name.c_str();
            if (kind == Kind::Instance)
                mi = createMI<CMPIInstanceMI>(genericSym, specificSym, &broker, ctx, name, &st);
            else if (kind == Kind::Association)
                mi = createMI<CMPIAssociationMI>(genericSym, specificSym, &broker, ctx, name, &st);
            else
                mi = createMI<CMPIMethodMI>(genericSym, specificSym, &broker, ctx, name, &st);
            return okStatus();
        });
        if (thrown.rc != CMPI_RC_OK) st = thrown;
    }
    p.creating[k] = false;
    p.tried[k] = true;
    if (!genericSym && !specificSym) {
        p.error[k] = "provider library lib" + p.location + ".so has no " + specific;
    } else if (!mi || st.rc != CMPI_RC_OK) {
        std::string text = statusText(st);
        p.error[k] = specific + " failed (rc " + std::to_string(st.rc) + (text.empty() ? "" : ": " + text) + ")";
        mi = nullptr;
    }
    if (!mi) {
        error = p.error[k];
        return nullptr;
    }
    p.mi[k] = mi;
    return mi;
}

const Registration* Host::Impl::registrationFor(const std::string& ns, const std::string& cls, Kind kind) const {
    std::vector<std::string> chain = repo.ancestry(cls);
    if (chain.empty()) chain.push_back(cls);
    for (const auto& c : chain)
        for (const auto& r : regs) {
            bool serves = kind == Kind::Instance ? r.instance : kind == Kind::Association ? r.association : r.method;
            if (serves && equalsIgnoreCase(r.className, c) && r.servesNamespace(ns)) return &r;
        }
    return nullptr;
}

void Host::Impl::finish(Result& r, Collector& c, const CMPIStatus& st) {
    if (c.sinkFailure) std::rethrow_exception(c.sinkFailure);
    for (auto& i : c.instances) r.instances.push_back(std::move(i));
    for (auto& p : c.paths) r.paths.push_back(std::move(p));
    r.done = r.done || c.done;
    if (st.rc != CMPI_RC_OK && r.rc == 0) {
        r.rc = st.rc;
        r.message = statusText(st);
    }
}

// One call into a provider: the context, result and object path it is handed, and what it
// hands back.
struct Host::Impl::Call {
    Call(Impl* h, const ObjectPath& path, const NamedValues* entries, const InstanceSink* sink = nullptr) : host(h) {
        col.nameSpace = h->nameSpaceOf(path);
        col.sink = sink;
        ctx = h->newContext(col.nameSpace, entries);
        res = make<ResultObj>(h, &col);
        ObjectPath full = path;
        full.nameSpace = col.nameSpace;
        cop = make<PathObj>(h, full);
    }
    // inst as modify and create hand it to the provider: with its path set to the request's.
    InstanceObj* instance(const Instance& inst) {
        Instance copy = inst;
        copy.path = cop->path;
        return make<InstanceObj>(host, std::move(copy));
    }
    // Calls the MI function fn (CMPI_RC_ERR_NOT_SUPPORTED when the provider lacks it, with
    // noTable as the message when it has no function table) and adds its results to result.
    template <class MI, class Fn, class... A>
    void run(Result& result, MI* mi, Fn fn, const char* noTable, A... args) {
        CMPIStatus st = callProvider(host, [&]() -> CMPIStatus {
            if (!mi->ft) return status(host, CMPI_RC_ERR_NOT_SUPPORTED, noTable);
            if (!(mi->ft->*fn)) return status(host, CMPI_RC_ERR_NOT_SUPPORTED, "");
            return (mi->ft->*fn)(mi, ctx, res, cop, args...);
        });
        res->sink = nullptr;
        host->finish(result, col, st);
    }

    Impl* host;
    Collector col;
    CMPIContext* ctx;
    ResultObj* res;
    PathObj* cop;
};

template <class MI>
MI* Host::Impl::miOf(Provider& p, Kind kind, Result& result) {
    std::string error;
    auto* mi = static_cast<MI*>(miFor(p, kind, error));
    if (!mi) result = failure(CMPI_RC_ERR_FAILED, error);
    return mi;
}

template <class MI>
MI* Host::Impl::serving(const ObjectPath& path, Kind kind, CMPIrc none, Result& result) {
    std::string ns = nameSpaceOf(path);
    if (unknownNamespace(regs, ns, result)) return nullptr;
    if (!repo.exists(path.className)) {
        result = failure(CMPI_RC_ERR_INVALID_CLASS, "unknown class " + path.className);
        return nullptr;
    }
    if (const Registration* reg = registrationFor(ns, path.className, kind))
        return miOf<MI>(*providerOf(*reg), kind, result);
    result = failure(none, std::string("no ") + (kind == Kind::Method ? "method" : "instance") + " provider for " +
                               path.className + " in " + ns);
    return nullptr;
}

Result Host::Impl::enumerate(const ObjectPath& classPath, bool names, const std::vector<std::string>* props,
                             const NamedValues* ctx, const InstanceSink* sink) {
    std::string ns = nameSpaceOf(classPath);
    Result result;
    if (unknownNamespace(regs, ns, result)) return result;
    if (!repo.exists(classPath.className)) return failure(CMPI_RC_ERR_INVALID_CLASS, "unknown class " + classPath.className);
    std::vector<const Registration*> targets;
    for (const auto& r : regs) {
        if (!r.instance || !r.servesNamespace(ns) || !repo.isA(r.className, classPath.className)) continue;
        bool seen = std::any_of(targets.begin(), targets.end(),
                                [&](const Registration* t) { return equalsIgnoreCase(t->className, r.className); });
        if (!seen) targets.push_back(&r);
    }
    for (const Registration* reg : targets) {
        auto* mi = miOf<CMPIInstanceMI>(*providerOf(*reg), Kind::Instance, result);
        if (!mi) return result;
        Call call(this, ObjectPath(ns, repo.find(reg->className)->name), ctx, sink);
        CharList pl(props);
        const char* noTable = "provider has no function table";
        if (names)
            call.run(result, mi, &CMPIInstanceMIFT::enumerateInstanceNames, noTable);
        else
            call.run(result, mi, &CMPIInstanceMIFT::enumerateInstances, noTable, pl.get());
        if (!result.ok()) break;
    }
    return result;
}

Result Host::Impl::get(const ObjectPath& path, const std::vector<std::string>* props, const NamedValues* ctx,
                       const InstanceSink* sink) {
    Result result;
    if (auto* mi = serving<CMPIInstanceMI>(path, Kind::Instance, CMPI_RC_ERR_NOT_FOUND, result)) {
        Call call(this, path, ctx, sink);
        CharList pl(props);
        call.run(result, mi, &CMPIInstanceMIFT::getInstance, "", pl.get());
    }
    return result;
}

Result Host::Impl::modify(const ObjectPath& path, const Instance& inst, const std::vector<std::string>* props,
                          const NamedValues* ctx) {
    Result result;
    if (auto* mi = serving<CMPIInstanceMI>(path, Kind::Instance, CMPI_RC_ERR_NOT_SUPPORTED, result)) {
        Call call(this, path, ctx);
        InstanceObj* ci = call.instance(inst);
        CharList pl(props);
        call.run(result, mi, &CMPIInstanceMIFT::modifyInstance, "", ci, pl.get());
    }
    return result;
}

Result Host::Impl::create(const ObjectPath& path, const Instance& inst, const NamedValues* ctx) {
    Result result;
    if (auto* mi = serving<CMPIInstanceMI>(path, Kind::Instance, CMPI_RC_ERR_NOT_SUPPORTED, result)) {
        Call call(this, path, ctx);
        call.run(result, mi, &CMPIInstanceMIFT::createInstance, "", call.instance(inst));
    }
    return result;
}

Result Host::Impl::remove(const ObjectPath& path, const NamedValues* ctx) {
    Result result;
    if (auto* mi = serving<CMPIInstanceMI>(path, Kind::Instance, CMPI_RC_ERR_NOT_FOUND, result))
        Call(this, path, ctx).run(result, mi, &CMPIInstanceMIFT::deleteInstance, "");
    return result;
}

Result Host::Impl::query(const ObjectPath& classPath, const std::string& queryText, const std::string& language,
                         const NamedValues* ctx, const InstanceSink* sink) {
    Result result;
    if (auto* mi = serving<CMPIInstanceMI>(classPath, Kind::Instance, CMPI_RC_ERR_NOT_SUPPORTED, result))
        Call(this, ObjectPath(classPath.nameSpace, classPath.className), ctx, sink)
            .run(result, mi, &CMPIInstanceMIFT::execQuery, "", queryText.c_str(), orNull(language));
    return result;
}

Result Host::Impl::assoc(AssocOp op, const ObjectPath& path, const std::string& assocClass,
                         const std::string& resultClass, const std::string& role, const std::string& resultRole,
                         const std::vector<std::string>* props, const NamedValues* ctx, const InstanceSink* sink) {
    std::string ns = nameSpaceOf(path);
    Result result;
    if (unknownNamespace(regs, ns, result)) return result;
    if (!repo.exists(path.className)) return failure(CMPI_RC_ERR_INVALID_CLASS, "unknown class " + path.className);
    bool associators = op == AssocOp::Associators || op == AssocOp::AssociatorNames;
    const std::string& filter = associators ? assocClass : resultClass;
    bool knownFilter = !filter.empty() && repo.exists(filter);

    // Association classes of this namespace that can hold the source object.
    auto canHoldSource = [&](const std::string& assocCls) {
        if (!repo.exists(assocCls)) return true;
        for (const auto& p : repo.properties(assocCls)) {
            if (p.type != CimType::Reference) continue;
            if (!role.empty() && !equalsIgnoreCase(p.name, role)) continue;
            if (repo.isA(path.className, p.refClass) || repo.isA(p.refClass, path.className)) return true;
        }
        return false;
    };
    std::vector<std::pair<Provider*, std::vector<std::string>>> groups;
    for (const auto& r : regs) {
        if (!r.association || !r.servesNamespace(ns)) continue;
        if (knownFilter && !repo.isA(r.className, filter)) continue;
        if (!canHoldSource(r.className)) continue;
        Provider* p = providerOf(r);
        auto g = std::find_if(groups.begin(), groups.end(), [&](const auto& e) { return e.first == p; });
        if (g == groups.end()) {
            groups.emplace_back(p, std::vector<std::string>{});
            g = groups.end() - 1;
        }
        if (std::none_of(g->second.begin(), g->second.end(),
                         [&](const std::string& c) { return equalsIgnoreCase(c, r.className); }))
            g->second.push_back(r.className);
    }

    ObjectPath full = path;
    full.nameSpace = ns;
    for (auto& group : groups) {
        auto* mi = miOf<CMPIAssociationMI>(*group.first, Kind::Association, result);
        if (!mi) return result;
        std::vector<std::string> filters = filter.empty() ? group.second : std::vector<std::string>{filter};
        for (const auto& f : filters) {
            Call call(this, full, ctx, sink);
            CharList pl(props);
            const char* noTable = "provider has no function table";
            switch (op) {
            case AssocOp::Associators:
                call.run(result, mi, &CMPIAssociationMIFT::associators, noTable, f.c_str(), orNull(resultClass),
                         orNull(role), orNull(resultRole), pl.get());
                break;
            case AssocOp::AssociatorNames:
                call.run(result, mi, &CMPIAssociationMIFT::associatorNames, noTable, f.c_str(), orNull(resultClass),
                         orNull(role), orNull(resultRole));
                break;
            case AssocOp::References:
                call.run(result, mi, &CMPIAssociationMIFT::references, noTable, f.c_str(), orNull(role), pl.get());
                break;
            case AssocOp::ReferenceNames:
                call.run(result, mi, &CMPIAssociationMIFT::referenceNames, noTable, f.c_str(), orNull(role));
            }
            if (!result.ok()) return result;
        }
    }
    return result;
}

Result Host::Impl::invoke(const ObjectPath& path, const std::string& method, const Args& in, const NamedValues* ctx) {
    Result result;
    auto* mi = serving<CMPIMethodMI>(path, Kind::Method, CMPI_RC_ERR_NOT_SUPPORTED, result);
    if (!mi) return result;
    Call call(this, path, ctx);
    ArgsObj* inArgs = make<ArgsObj>(this, in);
    ArgsObj* outArgs = make<ArgsObj>(this, Args());
    call.run(result, mi, &CMPIMethodMIFT::invokeMethod, "", method.c_str(), inArgs, outArgs);
    result.outArgs = outArgs->args;
    if (!call.col.data.empty()) {
        result.hasReturnValue = true;
        result.returnValue = call.col.data.front();
    }
    return result;
}

// ---- Public API ----------------------------------------------------------------------------

namespace {
template <class F>
Result run(Host::Impl* impl, F&& f) {
    try {
        RequestScope scope(impl);
        return f();
    } catch (const CimError& e) {
        return failure(e.rc(), e.what());
    } catch (const ParseError& e) {
        return failure(CMPI_RC_ERR_INVALID_PARAMETER, e.what());
    } catch (const std::exception& e) {
        return failure(CMPI_RC_ERR_FAILED, e.what());
    }
}
}  // namespace

Host::Host(HostOptions options) : impl_(std::make_unique<Impl>(std::move(options))) {}
Host::~Host() = default;

const ClassRepository& Host::classes() const { return impl_->repo; }
const std::vector<Registration>& Host::registrations() const { return impl_->regs; }
const HostOptions& Host::options() const { return impl_->options; }
const _CMPIBroker* Host::broker() const { return &impl_->broker; }

HostStats Host::stats() const {
    HostStats s;
    s.liveObjects = impl_->liveObjects.load();
    s.liveClones = impl_->liveClones.load();
    return s;
}

ObjectPath Host::parsePath(const std::string& text) const {
    ObjectPath p = ObjectPath::parse(text);
    if (p.nameSpace.empty()) p.nameSpace = impl_->options.defaultNamespace;
    return impl_->repo.typedPath(p);
}

namespace {
ObjectPath typed(Host::Impl* impl, const ObjectPath& path) {
    ObjectPath p = impl->repo.typedPath(path);
    if (p.nameSpace.empty()) p.nameSpace = impl->options.defaultNamespace;
    return p;
}
}  // namespace

Result Host::enumerateInstanceNames(const std::string& ns, const std::string& cls) {
    return run(impl_.get(), [&] { return impl_->enumerate(ObjectPath(ns, cls), true, nullptr, nullptr); });
}

Result Host::enumerateInstances(const std::string& ns, const std::string& cls, const std::vector<std::string>* props,
                                const InstanceSink* sink) {
    return run(impl_.get(), [&] { return impl_->enumerate(ObjectPath(ns, cls), false, props, nullptr, sink); });
}

Result Host::getInstance(const ObjectPath& path, const std::vector<std::string>* props, const InstanceSink* sink) {
    return run(impl_.get(), [&] { return impl_->get(typed(impl_.get(), path), props, nullptr, sink); });
}

Result Host::modifyInstance(const ObjectPath& path, const Instance& instance, const std::vector<std::string>* props) {
    return run(impl_.get(), [&] { return impl_->modify(typed(impl_.get(), path), instance, props, nullptr); });
}

Result Host::createInstance(const ObjectPath& path, const Instance& instance) {
    return run(impl_.get(), [&] { return impl_->create(typed(impl_.get(), path), instance, nullptr); });
}

Result Host::deleteInstance(const ObjectPath& path) {
    return run(impl_.get(), [&] { return impl_->remove(typed(impl_.get(), path), nullptr); });
}

Result Host::execQuery(const std::string& ns, const std::string& cls, const std::string& query,
                       const std::string& language, const InstanceSink* sink) {
    return run(impl_.get(), [&] { return impl_->query(ObjectPath(ns, cls), query, language, nullptr, sink); });
}

Result Host::associators(const ObjectPath& path, const std::string& assocClass, const std::string& resultClass,
                         const std::string& role, const std::string& resultRole,
                         const std::vector<std::string>* props, const InstanceSink* sink) {
    return run(impl_.get(), [&] {
        return impl_->assoc(Impl::AssocOp::Associators, typed(impl_.get(), path), assocClass, resultClass, role,
                            resultRole, props, nullptr, sink);
    });
}

Result Host::associatorNames(const ObjectPath& path, const std::string& assocClass, const std::string& resultClass,
                             const std::string& role, const std::string& resultRole) {
    return run(impl_.get(), [&] {
        return impl_->assoc(Impl::AssocOp::AssociatorNames, typed(impl_.get(), path), assocClass, resultClass, role,
                            resultRole, nullptr, nullptr);
    });
}

Result Host::references(const ObjectPath& path, const std::string& resultClass, const std::string& role,
                        const std::vector<std::string>* props, const InstanceSink* sink) {
    return run(impl_.get(), [&] {
        return impl_->assoc(Impl::AssocOp::References, typed(impl_.get(), path), "", resultClass, role, "", props,
                            nullptr, sink);
    });
}

Result Host::referenceNames(const ObjectPath& path, const std::string& resultClass, const std::string& role) {
    return run(impl_.get(), [&] {
        return impl_->assoc(Impl::AssocOp::ReferenceNames, typed(impl_.get(), path), "", resultClass, role, "",
                            nullptr, nullptr);
    });
}

Result Host::invokeMethod(const ObjectPath& path, const std::string& method, const Args& in) {
    return run(impl_.get(), [&] { return impl_->invoke(typed(impl_.get(), path), method, in, nullptr); });
}

bool Host::waitForProviderThreads(std::chrono::milliseconds timeout) { return impl_->waitForThreads(timeout); }

}  // namespace ipif
