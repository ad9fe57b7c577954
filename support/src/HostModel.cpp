#include "Nx/HostModel.h"

#include <algorithm>
#include <cstdlib>
#include <mutex>
#include <unordered_map>

#include "Nx/FixtureBackend.h"
#include "Nx/Exceptions.h"
#include "Nx/LiveBackend.h"

namespace Nx {
namespace HostModel {

PropertyValue PropertyValue::ofText(std::string v) {
    PropertyValue value;
    value.kind = Kind::String;
    value.text = std::move(v);
    return value;
}

PropertyValue PropertyValue::ofNumber(unsigned int v) {
    PropertyValue value;
    value.kind = Kind::Unsigned;
    value.number = v;
    return value;
}

PropertyValue PropertyValue::ofList(std::vector<std::string> v) {
    PropertyValue value;
    value.kind = Kind::StringList;
    value.list = std::move(v);
    return value;
}

int Tree::find(const std::string& path) const {
    for (size_t i = 0; i < nodes.size(); ++i)
        if (nodes[i].path == path) return static_cast<int>(i);
    return -1;
}

// The nodes of one type by the text of one property, each list in document order.
struct Tree::PropertyIndex {
    std::size_t nodeCount = 0;  // of the tree it was built from
    std::unordered_map<std::string, std::vector<int>> byText;
    std::vector<int> uncomparable;  // no readable text: a comparing walk has to look at them
};

Tree::Indexes::Indexes() = default;
Tree::Indexes::~Indexes() = default;

Tree::Indexes& Tree::Indexes::operator=(const Indexes&) {
    std::lock_guard<std::mutex> lock(mutex_);
    built_.clear();
    return *this;
}

const Tree::PropertyIndex& Tree::Indexes::of(const Tree& tree, unsigned int type, unsigned int property) {
    std::lock_guard<std::mutex> lock(mutex_);
    std::unique_ptr<PropertyIndex>& index = built_[{type, property}];
    if (index && index->nodeCount == tree.nodes.size()) return *index;
    index = std::make_unique<PropertyIndex>();
    index->nodeCount = tree.nodes.size();
    for (std::size_t i = 0; i < tree.nodes.size(); ++i) {
        const Node& node = tree.nodes[i];
        if (node.type != type) continue;
        const auto found = node.properties.find(property);
        const bool text = found != node.properties.end() && found->second.readable && !found->second.failing &&
                          found->second.kind == PropertyValue::Kind::String;
        (text ? index->byText[found->second.text] : index->uncomparable).push_back(static_cast<int>(i));
    }
    return *index;
}

int Tree::nextComparable(int from, unsigned int property, const std::string& text) const {
    if (from < 0 || static_cast<std::size_t>(from) >= nodes.size()) return -1;
    const PropertyIndex& index = indexes_.of(*this, nodes[static_cast<std::size_t>(from)].type, property);
    int next = -1;
    const auto consider = [&](const std::vector<int>& list) {
        const auto at = std::lower_bound(list.begin(), list.end(), from);
        if (at != list.end() && (next < 0 || *at < next)) next = *at;
    };
    const auto equal = index.byText.find(text);
    if (equal != index.byText.end()) consider(equal->second);
    consider(index.uncomparable);
    return next;
}

int Tree::add(int parent, unsigned int type, const std::string& name, const std::string& description) {
    Node node;
    node.type = type;
    node.name = name;
    node.description = description;
    node.parent = parent;
    node.path = (parent >= 0 ? nodes.at(static_cast<size_t>(parent)).path : std::string()) + "/" + name;
    nodes.push_back(std::move(node));
    return static_cast<int>(nodes.size() - 1);
}

std::shared_ptr<Backend> open(const std::string& selector) {
    static const std::string fixturePrefix = "fixture:";
    if (selector.compare(0, fixturePrefix.size(), fixturePrefix) == 0) {
        std::string path = selector.substr(fixturePrefix.size());
        if (path.empty()) throw InstrumentationException("host model selector \"fixture:\" names no file");
        return openFixtureBackend(path);
    }
    if (selector == "live") return openLiveBackend();
    throw InstrumentationException("unknown host model selector \"" + selector +
                                   "\" (expected \"live\" or \"fixture:PATH\")");
}

namespace {

std::mutex currentMutex;
std::shared_ptr<Backend> currentBackend;

}  // namespace

std::shared_ptr<Backend> current() {
    std::lock_guard<std::mutex> lock(currentMutex);
    if (!currentBackend) {
        const char* selector = std::getenv("IPIF_HOST_MODEL");
        // A failure is not remembered: the next call tries again and reports again.
        currentBackend = open(selector && *selector ? selector : "live");
    }
    return currentBackend;
}

void setCurrent(std::shared_ptr<Backend> backend) {
    std::lock_guard<std::mutex> lock(currentMutex);
    currentBackend = std::move(backend);
}

}  // namespace HostModel
}  // namespace Nx
