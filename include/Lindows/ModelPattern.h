// The filter-and-walk cursor every model class is built on.
//
// A model object stands on one node of the host model (an IP endpoint node unless stated
// otherwise) and presents it as one CIM object. Filters accumulate: each setFilter narrows from
// where the cursor stands and never rewinds; initialize() starts over.
//
// Derived supplies:
//   static const std::string& logger();       its file's logging component
//   bool filterHolds(const Filter& filter);   one filter against the current object
// and may replace:
//   void advance();                           step to the next object (default: next node)
//   void skipRejected(const Filter& filter);  move forward past objects the filter certainly
//                                             rejects, never past one it may accept (default:
//                                             stay; the walk then evaluates every object)
// Keys supplies the class's FilterType enumeration (with a fixed underlying type, so that a
// filter type outside the enumeration can be stored; such a filter always holds).
#pragma once

#include <string>
#include <type_traits>
#include <vector>

#include "Nx/Instrumentation.h"
#include "Nx/NodeLexicon.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

// Where a model's function stands, so that a shared helper traces its lines as that function's.
struct Site {
    const char* function;
    const char* file;
    int line;
};
#define NX_SITE (::Nx::IPInterfaceProvider::Site{__func__, NX_FILE, __LINE__})

// The host name from gethostname; false (name untouched) when gethostname fails. Within a
// RequestScope the system is asked once and every later call gets the same answer.
bool localHostName(std::string& name);

// One provider request on this thread, from the entry point until it returns. The host name may
// change between requests, never within one. Scopes nest (an up-call that comes back into the
// provider belongs to the outer request).
class RequestScope {
public:
    RequestScope();
    ~RequestScope();
    RequestScope(const RequestScope&) = delete;
    RequestScope& operator=(const RequestScope&) = delete;

    // The request itself has changed the host name: the next localHostName asks the system.
    static void hostNameChanged();

private:
    friend bool localHostName(std::string& name);

    RequestScope* const outer_;  // null for the outermost scope, which holds what was learnt
    bool asked_ = false;
    bool known_ = false;  // gethostname succeeded
    std::string hostName_;
};

template <class Derived, class Keys, Nx::NodeLexicon::NodeType NodeTypeV = Nx::NodeLexicon::IPEndpointNode>
class ModelPattern : public Keys {
public:
    using FilterType = typename Keys::FilterType;

    struct Filter {
        FilterType filterType;
        std::string reference;
    };

    // Adds a filter and moves forward to the first object that satisfies all filters so far.
    void setFilter(FilterType filterType, const std::string& reference);
    // True when the current object satisfies every filter (an empty list always holds).
    bool evaluate();
    // Next object; with filters set, the next one that satisfies them.
    Derived& operator++();
    explicit operator bool() const { return static_cast<bool>(instrumentation); }
    // Drops the filters and rewinds to the first node.
    void initialize();

protected:
    ModelPattern() : filterSet(false) { instrumentation.selectNode(NodeTypeV); }
    // Traces the derived constructor at (ENTERING, EXITING).
    explicit ModelPattern(const Site& at) : ModelPattern() {
        traced(at, [] { return true; });
    }
    ModelPattern(const ModelPattern&) = default;
    ModelPattern& operator=(const ModelPattern&) = default;
    ~ModelPattern() = default;

    void advance() { ++instrumentation; }
    void skipRejected(const Filter&) {}

    // A getter's work, traced as the getter at: its ENTERING and EXITING lines (level 4000)
    // around body, whose answer it returns.
    template <class Body>
    static bool traced(const Site& at, Body body) {
        if (tracing(4000)) record(at, 4000, trace(at.file, at.function, at.line, ENTERING));
        const bool answered = body();
        if (tracing(4000)) record(at, 4000, trace(at.file, at.function, at.line, EXITING));
        return answered;
    }
    // Callers check tracing(level) before they format text.
    static void record(const Site& at, int level, const char* text) {
        logRecord(Derived::logger(), at.function, at.file, at.line, level, text);
    }
    // A getter of a fixed value.
    template <class Value, class Fixed>
    static bool fixed(const Site& at, Value& value, const Fixed& fixedValue) {
        return traced(at, [&] {
            value = fixedValue;
            return true;
        });
    }
    // A getter of a property of the current node, narrowed from the number the host keeps when
    // the getter's type is narrower. False, value untouched, when the host has none.
    template <class Value>
    bool readProperty(const Site& at, Nx::NodeLexicon::Properties property, Value& value) {
        return traced(at, [&] {
            if constexpr (std::is_same_v<Value, unsigned short>) {
                unsigned int code = 0;
                if (!instrumentation.getProperty(property, code)) return false;
                value = static_cast<unsigned short>(code);
                return true;
            } else {
                return instrumentation.getProperty(property, value);
            }
        });
    }
    // getSystemName: the service processor's name on it, the host name elsewhere; false when
    // gethostname fails.
    static bool systemName(const Site& at, bool onServiceProcessor, std::string& name) {
        return traced(at, [&] {
            if (onServiceProcessor) {
                name = "BMC:-1";
                return true;
            }
            if (localHostName(name)) return true;
            if (tracing(6000)) record(at, 6000, trace(at.file, "gethostname Failed", at.line, FREE_MESSAGE));
            return false;
        });
    }

    bool filterSet;
    std::vector<Filter> filters;
    Nx::Instrumentation instrumentation;

private:
    Derived& self() { return static_cast<Derived&>(*this); }
    // Lets each filter move the walk past what it rejects.
    void skipRejected() {
        for (const Filter& filter : filters) self().skipRejected(filter);
    }
};

template <class Derived, class Keys, Nx::NodeLexicon::NodeType NodeTypeV>
void ModelPattern<Derived, Keys, NodeTypeV>::setFilter(FilterType filterType, const std::string& reference) {
    const TraceParams list(" filterType=", static_cast<int>(filterType), " reference=", reference);
    NX_ENTER_PARAMS(Derived::logger(), list.c_str());

    filterSet = true;
    filters.push_back(Filter{filterType, reference});
    bool passed = false;
    while (instrumentation && !passed) {
        skipRejected();
        if (!instrumentation) break;
        passed = evaluate();
        NX_VAR(Derived::logger(), "evaluationPassed", static_cast<unsigned>(passed));
        if (!passed) self().advance();
    }

    NX_EXIT_PARAMS(Derived::logger(), list.c_str());
}

template <class Derived, class Keys, Nx::NodeLexicon::NodeType NodeTypeV>
bool ModelPattern<Derived, Keys, NodeTypeV>::evaluate() {
    NX_ENTER(Derived::logger());
    bool passed = true;
    for (const Filter& filter : filters) {
        if (!self().filterHolds(filter)) {
            passed = false;
            break;
        }
    }
    NX_EXIT(Derived::logger());
    return passed;
}

template <class Derived, class Keys, Nx::NodeLexicon::NodeType NodeTypeV>
Derived& ModelPattern<Derived, Keys, NodeTypeV>::operator++() {
    NX_ENTER(Derived::logger());
    do {
        self().advance();
        if (filterSet) skipRejected();
    } while (filterSet && instrumentation && !evaluate());
    NX_EXIT(Derived::logger());
    return self();
}

template <class Derived, class Keys, Nx::NodeLexicon::NodeType NodeTypeV>
void ModelPattern<Derived, Keys, NodeTypeV>::initialize() {
    NX_ENTER(Derived::logger());
    filterSet = false;
    instrumentation.selectNode(NodeTypeV);
    filters.clear();
    NX_EXIT(Derived::logger());
}

// Shared node facts used by several models.

// The grandparent of the cursor's node is the service processor (its description is exactly
// "BMC"). The cursor itself does not move.
bool isUnderServiceProcessor(const Nx::Instrumentation& cursor);

}  // namespace IPInterfaceProvider
}  // namespace Nx
