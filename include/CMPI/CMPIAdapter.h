// What every instance adapter shares: the request's broker, context and namespace, the model it
// owns, the forwarding iteration and the small CMPI helpers the adapters are written with.
#pragma once

#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <functional>
#include <string>
#include <type_traits>
#include <utility>

#include "Nx/ProviderUtilities.h"
#include "TALog/TAMessageBuffer.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

// The text of a trace parameter list: labels as given, pointers as their addresses.
template <class... Parts>
std::string parameterList(const Parts&... parts) {
    TALog::TAMessageBuffer buffer;
    (void)(buffer << ... << parts);
    return buffer.str();
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
        traceLine(__func__, __LINE__, ENTERING);
        const bool valid = static_cast<bool>(model);
        traceLine(__func__, __LINE__, EXITING);
        return valid;
    }

    void operator++() {
        traceLine(__func__, __LINE__, ENTERING);
        ++model;
        traceLine(__func__, __LINE__, EXITING);
    }

    // Drops the model's filters and rewinds it, so one adapter can serve a second search.
    void initialize() {
        traceLine(__func__, __LINE__, ENTERING);
        model.initialize();
        traceLine(__func__, __LINE__, EXITING);
    }

protected:
    // logger and file name the adapter's own source for the lines traced here; logger must
    // outlive the adapter (each source keeps it as a static).
    CMPIAdapter(const CMPIBroker* broker_, const CMPIContext* context_, std::string nameSpace_,
                const std::string& logger_, const char* file_)
        : broker(broker_), context(context_), nameSpace(std::move(nameSpace_)), model(), logger(logger_),
          file(file_) {}
    ~CMPIAdapter() = default;

    // A class path of className in the adapter's namespace; null when the broker makes none.
    CMPIObjectPath* newClassPath(const char* className) const {
        return ProviderUtilities::createObjectPath(broker, className, nameSpace);
    }

    // Asks the model's getter for a Value; when it succeeds, sets the value on the instance with
    // the CIM type of As (the property's declared type, which may be narrower than Value).
    template <class Value, class As = Value, class Getter>
    void copyProperty(CMPIInstance* instance, const char* name, Getter getter) {
        Value value{};
        if (!std::invoke(getter, model, value)) return;
        if constexpr (std::is_same_v<Value, As>)
            ProviderUtilities::setProperty(instance, name, value);
        else
            ProviderUtilities::setProperty(instance, name, static_cast<As>(value));
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

    const CMPIBroker* broker;
    const CMPIContext* context;
    std::string nameSpace;
    Model model;

private:
    void traceLine(const char* function, int line, MessageType type) const {
        logRecord(logger, function, file, line, 4000, trace(file, function, line, type));
    }

    const std::string& logger;
    const char* file;
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
