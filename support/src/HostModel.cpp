#include "Nx/HostModel.h"

#include <cstdlib>
#include <mutex>

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
