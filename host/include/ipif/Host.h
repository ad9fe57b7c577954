// An in-process CIM object manager core for CMPI 2.0 providers.
//
//   ipif::Host host;                                   // MOF, registrations from the defaults
//   auto r = host.enumerateInstances("root/cimv2", "KVRNX_IPProtocolEndpoint");
//   if (r.ok()) for (const auto& inst : r.instances) std::cout << inst.toMof();
//   auto p = host.parsePath("KVRNX_IPProtocolEndpoint.Name=\"eth0\",...");
//   ipif::Args in;  in.set("RequestedState", ipif::Value::uint16(3));
//   auto m = host.invokeMethod(p, "RequestStateChange", in);   // m.returnValue, m.outArgs
//
// Classes come from MOF files, and which provider serves which class from sfcb .reg files (see
// Mof.h and Registration.h). A provider library "lib<location>.so" is loaded with dlopen
// (RTLD_NOW | RTLD_LOCAL) on the first request that needs it, from the first of:
//   HostOptions::providerDirs, the directories of IPIF_PROVIDER_PATH (colon-separated), the
//   provider directory beside the program (../lib/cmpi from bin/ when installed; the build tree
//   mirrors it), then the plain dlopen search.
// Each MI factory (_Generic_Create_<T>MI if the library has it, else <provider>_Create_<T>MI)
// is called once per provider per Host, with this Host's broker. The MI cleanups are called
// when the Host is destroyed.
//
// Routing:
//   - enumerate (names): every provider registered (instance) for the class or a subclass of
//     it in the namespace, each called with its own registered class; a known class that no
//     provider serves yields nothing; an unknown class is CMPI_RC_ERR_INVALID_CLASS.
//   - get, modify, create, delete, query: the provider registered for the path's class, or
//     for its nearest superclass that has one. None: get/delete CMPI_RC_ERR_NOT_FOUND,
//     modify/create/query CMPI_RC_ERR_NOT_SUPPORTED.
//   - invokeMethod: the method provider of the class or its nearest registered superclass;
//     none is CMPI_RC_ERR_NOT_SUPPORTED. Arguments are passed exactly as given (no coercion).
//   - associators, associatorNames (filter: assocClass), references, referenceNames (filter:
//     resultClass): the association providers of the namespace whose registered class derives
//     from the filter class and has a reference (matching role, when given) that can point at
//     the source object's class. With a filter each such provider is called once with the
//     filter exactly as given; without one, once per registered association class with that
//     class as the filter. A filter naming a class the MOF does not know goes to every
//     association provider of the namespace unchanged (the provider decides). Role, result
//     role and result class are passed on; the host does not post-filter results.
// Registrations naming a class the MOF does not declare are kept but never routed to. A
// namespace no registration names is CMPI_RC_ERR_INVALID_NAMESPACE for every operation.
// Paths given to the API are typed through the MOF (ClassRepository::typedPath) before they
// reach a provider; an empty namespace means HostOptions::defaultNamespace.
//
// Requests and memory: every CMPI object the host hands to a provider or a provider creates
// through the broker during a request (instances, paths, strings, arrays, args, datetimes,
// enumerations, contexts, results, cmpiMalloc blocks) belongs to the request and is freed
// when the outermost request ends; up-calls a provider makes during a request are nested
// requests and share that memory. release() of such an object is accepted and does nothing
// (the memory goes with the request), so a provider that releases early cannot pull an object
// from under the host. Objects a provider clone()s are the provider's: release() frees them at
// once, and any clone never released is freed when the Host is destroyed. Objects created
// outside any request (from a provider's own thread) belong to the Host until it is destroyed,
// unless the thread brackets its work with attachThread/detachThread, which gives it a
// request of its own ending at detachThread.
//
// Threads: requests may run concurrently from any number of threads. Up-calls nest at most
// 64 deep (CMPI_RC_ERR_FAILED beyond). A provider keeps one global broker, so a process should
// not drive the same provider library from two Hosts at once.
#pragma once

#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "ipif/Mof.h"
#include "ipif/Registration.h"
#include "ipif/Value.h"

struct _CMPIBroker;

namespace ipif {

struct HostOptions {
    // MOF files or directories (every *.mof). Empty: IPIF_MOF_DIR (colon-separated) if set,
    // else the data directory's embedded/ (the DMTF parents) and the data directory itself.
    // The data directory is IPIF_SHARE_DIR, else the one beside the program (../share/ipif
    // from bin/ when installed; the build tree mirrors it onto the source tree's mof/).
    std::vector<std::string> mofPaths;
    // .reg files or directories (every *.reg). Empty: IPIF_REG (colon-separated) if set, else
    // every *.reg of the data directory.
    std::vector<std::string> regPaths;
    // Searched before IPIF_PROVIDER_PATH and the directory beside the program.
    std::vector<std::string> providerDirs;
    std::string defaultNamespace = "root/cimv2";
    // Provider setProperty calls naming a property the class does not declare fail with
    // CMPI_RC_ERR_NO_SUCH_PROPERTY, and ones whose type differs from the declaration with
    // CMPI_RC_ERR_TYPE_MISMATCH. Off: stored as given.
    bool strictProperties = false;

    // Splits a colon-separated list, dropping empty entries.
    static std::vector<std::string> splitList(const std::string& list);
};

// Receives each instance a provider returns, at the moment it returns it, in place of
// Result::instances. An exception it throws ends the request once the provider has returned
// (the provider's later returns fail): a CimError with its rc, another std::exception as
// CMPI_RC_ERR_FAILED with its text, anything else reaches the caller as thrown.
using InstanceSink = std::function<void(const Instance&)>;

struct Result {
    int rc = 0;               // CMPI status code of the operation
    std::string message;      // the status message, if any
    std::vector<Instance> instances;  // none when the request was given an InstanceSink
    std::vector<ObjectPath> paths;
    bool hasReturnValue = false;
    Value returnValue;        // invokeMethod: the data the provider returned
    Args outArgs;             // invokeMethod: the out arguments, in the provider's order
    bool done = false;        // the provider signalled the end of results

    bool ok() const { return rc == 0; }
    std::string rcName() const { return ipif::rcName(rc); }
};

struct HostStats {
    long liveObjects = 0;  // CMPI objects alive now (request-owned, clones, host-owned)
    long liveClones = 0;   // of which clones a provider still holds
};

class Host {
public:
    // Loads the MOF and registrations. Throws MofError or RegistrationError.
    explicit Host(HostOptions options = HostOptions());
    ~Host();
    Host(const Host&) = delete;
    Host& operator=(const Host&) = delete;

    const ClassRepository& classes() const;
    const std::vector<Registration>& registrations() const;
    const HostOptions& options() const;

    // Parses path text, applies the default namespace when it has none and types the keys.
    // Throws ParseError (bad text) or CimError (unknown class or key, bad key value).
    ObjectPath parsePath(const std::string& text) const;

    Result enumerateInstanceNames(const std::string& nameSpace, const std::string& className);
    // sink: where the instances go as they arrive; null collects them in Result::instances.
    // Printing a large enumeration this way never holds the whole answer twice.
    Result enumerateInstances(const std::string& nameSpace, const std::string& className,
                              const std::vector<std::string>* propertyList = nullptr,
                              const InstanceSink* sink = nullptr);
    Result getInstance(const ObjectPath& path, const std::vector<std::string>* propertyList = nullptr,
                       const InstanceSink* sink = nullptr);
    // The instance's path is set to path; the provider receives both.
    Result modifyInstance(const ObjectPath& path, const Instance& instance,
                          const std::vector<std::string>* propertyList = nullptr);
    Result createInstance(const ObjectPath& path, const Instance& instance);  // paths: the new path
    Result deleteInstance(const ObjectPath& path);
    Result execQuery(const std::string& nameSpace, const std::string& className, const std::string& query,
                     const std::string& language, const InstanceSink* sink = nullptr);
    // Empty strings for the filters mean "none" (NULL to the provider).
    Result associators(const ObjectPath& path, const std::string& assocClass = "",
                       const std::string& resultClass = "", const std::string& role = "",
                       const std::string& resultRole = "",
                       const std::vector<std::string>* propertyList = nullptr, const InstanceSink* sink = nullptr);
    Result associatorNames(const ObjectPath& path, const std::string& assocClass = "",
                           const std::string& resultClass = "", const std::string& role = "",
                           const std::string& resultRole = "");
    Result references(const ObjectPath& path, const std::string& resultClass = "", const std::string& role = "",
                      const std::vector<std::string>* propertyList = nullptr, const InstanceSink* sink = nullptr);
    Result referenceNames(const ObjectPath& path, const std::string& resultClass = "", const std::string& role = "");
    Result invokeMethod(const ObjectPath& path, const std::string& method, const Args& in);

    // Waits until the process runs no thread that did not exist when this Host was created
    // (threads that providers started and detached, such as a reboot request). Polls
    // /proc/self/task. True when that state was reached within timeout.
    bool waitForProviderThreads(std::chrono::milliseconds timeout);

    // The broker providers receive, for tests that drive an MI or the broker directly. Objects
    // made through it outside a request belong to the Host.
    const _CMPIBroker* broker() const;
    HostStats stats() const;

    class Impl;

private:
    std::unique_ptr<Impl> impl_;
};

}  // namespace ipif
