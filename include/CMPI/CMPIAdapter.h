// What the adapters share: the request's broker, context and namespace, the model an instance
// adapter owns, the forwarding iteration, the lookup of instances other providers serve, and the
// small CMPI and trace helpers the adapters are written with.
#pragma once

#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <functional>
#include <initializer_list>
#include <string>
#include <type_traits>
#include <utility>

#include "Nx/Exceptions.h"
#include "Nx/ProviderUtilities.h"
#include "TALog/TAMessageBuffer.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

// A broker status as the failure lines trace it: "Error Status: rc", then the message if any.
inline std::string errorStatusText(const CMPIStatus& status) {
    std::string text = "Error Status: " + std::to_string(status.rc);
    const char* message = status.msg ? CMGetCharPtr(status.msg) : nullptr;
    if (message) text += std::string(" ") + message;
    return text;
}

// The lines a shared base traces for an adapter, read as the adapter's own NX_ lines would: they
// name the adapter's function and source file. logger must outlive the tracer (each source keeps
// it as a static).
class AdapterTrace {
public:
    AdapterTrace(const std::string& logger, const char* file) : logger_(logger), file_(file) {}

    // ENTERING, EXITING...: level 4000 plain, 3000 with a parameter list.
    void operator()(const char* function, int line, MessageType type) const {
        if (tracing(4000)) logRecord(logger_, function, file_, line, 4000, trace(file_, function, line, type));
    }
    void operator()(const char* function, int line, MessageType type, const TraceParams& params) const {
        if (tracing(3000))
            logRecord(logger_, function, file_, line, 3000, tracepara(file_, function, line, params.c_str(), type));
    }
    template <class Value>
    void variable(const char* function, int line, const char* name, Value value) const {
        if (tracing(4000)) logRecord(logger_, function, file_, line, 4000, trace(name, file_, line, value));
    }
    void message(const char* function, int line, int level, const char* text) const {
        if (tracing(level)) logRecord(logger_, function, file_, line, level, trace(file_, text, line, FREE_MESSAGE));
    }
    // The trace of an adapter's constructor function taking (broker, context, last): ENTERING,
    // then body, then EXITING; lastLabel names the last parameter.
    template <class Last, class Body>
    void construction(const char* function, const CMPIBroker* broker, const CMPIContext* context,
                      const char* lastLabel, const Last& last, Body body) const {
        const TraceParams params(" _broker=", broker, " _context=", context, lastLabel, last);
        (*this)(function, __LINE__, ENTERING, params);
        body();
        (*this)(function, __LINE__, EXITING, params);
    }

private:
    const std::string& logger_;
    const char* file_;
};

// Asks a model's getter for a Value; when it succeeds, sets the value on the instance with the
// CIM type of As (the property's declared type, which may be narrower than Value).
template <class Value, class As = Value, class Model, class Getter>
void copyModelProperty(Model& model, CMPIInstance* instance, const char* name, Getter getter) {
    Value value{};
    if (!std::invoke(getter, model, value)) return;
    if constexpr (std::is_same_v<Value, As>)
        ProviderUtilities::setProperty(instance, name, value);
    else
        ProviderUtilities::setProperty(instance, name, static_cast<As>(value));
}

// Model is the instrumentation class the adapter walks. Adapters live for one request and are
// neither copied nor moved: the model holds a cursor into the host picture of that request.
template <class Model>
class CMPIAdapter {
public:
    CMPIAdapter(const CMPIAdapter&) = delete;
    CMPIAdapter& operator=(const CMPIAdapter&) = delete;

    // True while the model stands on an element.
    explicit operator bool() const {
        tracer(__func__, __LINE__, ENTERING);
        const bool valid = static_cast<bool>(model);
        tracer(__func__, __LINE__, EXITING);
        return valid;
    }

    void operator++() {
        tracer(__func__, __LINE__, ENTERING);
        ++model;
        tracer(__func__, __LINE__, EXITING);
    }

    // Drops the model's filters and rewinds it, so one adapter can serve a second search.
    void initialize() {
        tracer(__func__, __LINE__, ENTERING);
        model.initialize();
        tracer(__func__, __LINE__, EXITING);
    }

protected:
    // logger and file name the adapter's own source for the lines traced here. function is the
    // adapter's constructor (__func__), traced with the namespace it is given.
    CMPIAdapter(const CMPIBroker* broker_, const CMPIContext* context_, std::string nameSpace_,
                const std::string& logger, const char* file, const char* function)
        : broker(broker_), context(context_), nameSpace(std::move(nameSpace_)), model(), tracer(logger, file) {
        tracer.construction(function, broker, context, " _namespace=", nameSpace, [] {});
    }
    // The path form: the adapter's namespace is the path's; the constructor positions the model
    // with constructedAt.
    CMPIAdapter(const CMPIBroker* broker_, const CMPIContext* context_, const CMPIObjectPath* path,
                const std::string& logger, const char* file)
        : broker(broker_),
          context(context_),
          nameSpace(ProviderUtilities::getNamespace(path)),
          model(),
          tracer(logger, file) {}
    ~CMPIAdapter() = default;

    // The trace of the path constructor function around positioning the model with select.
    template <class Select>
    void constructedAt(const char* function, const CMPIObjectPath* path, Select select) {
        tracer.construction(function, broker, context, " objectPath=", path, select);
    }

    // setObjectPath's usual work (function and params: its name and parameter list): each of
    // keys that the path holds (a class path holds none) is traced and made the model's filter,
    // setFilter taking extra after the value.
    template <class M = Model, class... Extra>
    void filterByKeys(const char* function, const TraceParams& params, const CMPIObjectPath* path,
                      std::initializer_list<std::pair<const char*, typename M::FilterType>> keys, Extra... extra) {
        tracer(function, __LINE__, ENTERING, params);
        if (ProviderUtilities::getKeyCount(path) != 0) {
            std::string value;
            for (const auto& key : keys)
                if (ProviderUtilities::getKeyProperty(path, key.first, value)) {
                    tracer.variable(function, __LINE__, key.first, value.c_str());
                    model.setFilter(key.second, value, extra...);
                }
        }
        tracer(function, __LINE__, EXITING, params);
    }

    // getObjectPath's work (function: its name): a class path of className, null when the broker
    // makes none, with the keys setKeys sets.
    template <class SetKeys>
    CMPIObjectPath* objectPath(const char* function, const char* className, SetKeys setKeys) {
        tracer(function, __LINE__, ENTERING);
        CMPIObjectPath* path = newClassPath(className);
        if (path) setKeys(path);
        tracer(function, __LINE__, EXITING);
        return path;
    }
    // The same for the settings, keyed by their InstanceID alone, which is traced.
    template <class Getter>
    CMPIObjectPath* instanceIdPath(const char* function, const char* className, Getter getInstanceId) {
        return objectPath(function, className, [&](CMPIObjectPath* path) {
            std::string instanceId;
            if (!std::invoke(getInstanceId, model, instanceId)) return;
            tracer.variable(function, __LINE__, "instanceID", instanceId.c_str());
            ProviderUtilities::setKeyProperty(path, "InstanceID", instanceId);
        });
    }

    // getCMPIInstance's work (function: its name, properties: its list): an instance at self's
    // getObjectPath, with applied as the property list it keeps (null: every property), and the
    // properties fill sets.
    template <class Self, class Fill>
    CMPIInstance* instanceOf(const char* function, const char** properties, const char** applied, Self* self,
                             Fill fill) {
        const TraceParams params(" properties=", properties);
        tracer(function, __LINE__, ENTERING, params);
        CMPIInstance* instance = ProviderUtilities::createInstance(broker, self->getObjectPath(), applied);
        if (instance) fill(instance);
        tracer(function, __LINE__, EXITING, params);
        return instance;
    }

    // A class path of className in the adapter's namespace; null when the broker makes none.
    CMPIObjectPath* newClassPath(const char* className) const {
        return ProviderUtilities::createObjectPath(broker, className, nameSpace);
    }

    template <class Value, class As = Value, class Getter>
    void copyProperty(CMPIInstance* instance, const char* name, Getter getter) {
        copyModelProperty<Value, As>(model, instance, name, getter);
    }

    // The same for a string key of an object path.
    template <class Getter>
    void copyKey(CMPIObjectPath* path, const char* name, Getter getter) {
        std::string value;
        if (std::invoke(getter, model, value)) ProviderUtilities::setKeyProperty(path, name, value);
    }

    // A status whose message the broker makes from text; the message is null without a broker.
    CMPIStatus makeStatus(CMPIrc rc, const char* text) const {
        CMPIStatus status = {rc, nullptr};
        if (broker && text) status.msg = CMNewString(broker, text, nullptr);
        return status;
    }

    // The answer to a modification carrying a value that may not be written into the host's
    // configuration: the client learns which property it was.
    CMPIStatus refuseProperty(const char* name) const {
        const std::string text = std::string(name) + ": the value holds characters that may not be written to the host configuration";
        return makeStatus(CMPI_RC_ERR_INVALID_PARAMETER, text.c_str());
    }

    // A method argument; an absent argument (or no argument list) reads as untyped.
    static CMPIData argument(const CMPIArgs* in, const char* name) {
        CMPIData data = {};
        data.type = CMPI_null;
        data.state = CMPI_notFound;
        if (!in) return data;
        CMPIStatus rc = {CMPI_RC_OK, nullptr};
        CMPIData found = CMGetArg(in, name, &rc);
        if (rc.rc != CMPI_RC_OK || (found.state & CMPI_notFound)) return data;
        return found;
    }

    // The methods' job: a fixed name, never tracked, since the change is made before the method
    // returns. Added to out as Job when there is one; false when the broker makes no path.
    bool returnJob(CMPIArgs* out) const {
        CMPIObjectPath* job = newClassPath("KVRNX_ConcreteJob");
        if (!job) return false;
        ProviderUtilities::setKeyProperty(job, "InstanceID", std::string("IPConfigSvcJob:1"));
        if (out) {
            CMPIValue reference;
            reference.ref = job;
            CMAddArg(out, "Job", &reference, CMPI_ref);
        }
        return true;
    }

    const CMPIBroker* broker;
    const CMPIContext* context;
    std::string nameSpace;
    Model model;
    AdapterTrace tracer;
};

// What the lookup adapters share (CMPIIPComputerSystem, CMPIIPLanEndPoint): instances of a
// class another provider serves, fetched through the broker; the current one and the
// enumeration it came from.
class CMPILookupAdapter {
public:
    CMPILookupAdapter(const CMPILookupAdapter&) = delete;
    CMPILookupAdapter& operator=(const CMPILookupAdapter&) = delete;

    void operator++() {
        tracer(__func__, __LINE__, ENTERING);
        instance = nullptr;
        if (enumeration) {
            CMPIStatus next = {CMPI_RC_OK, nullptr};
            CMPIData data = CMGetNext(enumeration, &next);
            instance = instanceOf(data, next);
            if (stepMessage) tracer.message(__func__, __LINE__, 3000, stepMessage);
        }
        tracer(__func__, __LINE__, EXITING);
    }

    CMPIObjectPath* getObjectPath() {
        tracer(__func__, __LINE__, ENTERING);
        CMPIObjectPath* path = nullptr;
        if (instance) {
            CMPIStatus rc = {CMPI_RC_OK, nullptr};
            path = CMGetObjectPath(instance, &rc);
            if (rc.rc != CMPI_RC_OK) path = nullptr;
        }
        tracer(__func__, __LINE__, EXITING);
        return path;
    }

    // The current instance as fetched; properties is not applied.
    CMPIInstance* getCMPIInstance(const char** properties) {
        const TraceParams params(" properties=", properties);
        tracer(__func__, __LINE__, ENTERING, params);
        tracer(__func__, __LINE__, EXITING, params);
        return instance;
    }

protected:
    // function is the adapter's constructor (__func__); stepMessage, when not null, is traced at
    // each step of the iteration.
    CMPILookupAdapter(const CMPIBroker* broker_, const CMPIContext* context_, std::string nameSpace_,
                      const std::string& logger, const char* file, const char* function,
                      const char* stepMessage_ = nullptr)
        : broker(broker_), context(context_), nameSpace(std::move(nameSpace_)), tracer(logger, file),
          stepMessage(stepMessage_) {
        tracer.construction(function, broker, context, " _namespace=", nameSpace, [] {});
    }
    ~CMPILookupAdapter() = default;

    // The instance an enumeration element carries; null when the fetch failed or it is no instance.
    static CMPIInstance* instanceOf(const CMPIData& data, const CMPIStatus& rc) {
        if (rc.rc != CMPI_RC_OK || data.type != CMPI_instance || (data.state & CMPI_nullValue)) return nullptr;
        return data.value.inst;
    }

    // Enumerates the path's class. Throws Nx::ProviderException when the broker cannot, with the
    // text callers match on.
    void enumerate(const CMPIObjectPath* path) {
        CMPIStatus rc = {CMPI_RC_OK, nullptr};
        enumeration = broker ? CBEnumInstances(broker, context, path, nullptr, &rc) : nullptr;
        if (!broker || rc.rc != CMPI_RC_OK) throw Nx::ProviderException(lookupFailed);
    }

    // The enumeration's first instance, if any, reported once by the initial-load rule.
    void takeFirst() {
        if (!enumeration || !CMHasNext(enumeration, nullptr)) return;
        CMPIStatus next = {CMPI_RC_OK, nullptr};
        CMPIData data = CMGetNext(enumeration, &next);
        if (CMPIInstance* first = instanceOf(data, next)) {
            instance = first;
            initialLoad = true;
        }
    }

    static constexpr const char* lookupFailed = "Could not obtain an instance of Computer System";

    const CMPIBroker* broker;
    const CMPIContext* context;
    std::string nameSpace;
    CMPIInstance* instance = nullptr;
    CMPIEnumeration* enumeration = nullptr;
    bool initialLoad = false;
    AdapterTrace tracer;

private:
    const char* stepMessage;
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
