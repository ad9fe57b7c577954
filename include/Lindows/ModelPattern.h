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
// Keys supplies the class's FilterType enumeration (with a fixed underlying type, so that a
// filter type outside the enumeration can be stored; such a filter always holds).
#pragma once

#include <string>
#include <vector>

#include "Nx/Instrumentation.h"
#include "Nx/NodeLexicon.h"
#include "TALog/TAMessageBuffer.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

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
    ModelPattern(const ModelPattern&) = default;
    ModelPattern& operator=(const ModelPattern&) = default;
    ~ModelPattern() = default;

    void advance() { ++instrumentation; }

    bool filterSet;
    std::vector<Filter> filters;
    Nx::Instrumentation instrumentation;

private:
    Derived& self() { return static_cast<Derived&>(*this); }
};

template <class Derived, class Keys, Nx::NodeLexicon::NodeType NodeTypeV>
void ModelPattern<Derived, Keys, NodeTypeV>::setFilter(FilterType filterType, const std::string& reference) {
    TALog::TAMessageBuffer parameters;
    parameters << " filterType=" << static_cast<int>(filterType) << " reference=" << reference;
    const std::string list = parameters.str();
    NX_ENTER_PARAMS(Derived::logger(), list.c_str());

    filterSet = true;
    filters.push_back(Filter{filterType, reference});
    bool passed = false;
    while (instrumentation && !passed) {
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

// The host name from gethostname. False when gethostname fails.
bool localHostName(std::string& name);

}  // namespace IPInterfaceProvider
}  // namespace Nx
