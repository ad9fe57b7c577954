// An in-memory host model for tests: build a node tree in code, install it as the process's
// backend for the scope of a test, and look at what the code under test wrote to it.
//
//   testhost::HostBuilder host;                       // root: system node "/host"
//   int eth0 = host.endpoint(host.root(), "eth0", "eth0");
//   host.text(eth0, Nx::NodeLexicon::IPv4Address, "192.168.1.10").number(eth0, 123, 1);
//   testhost::ScopedHostModel model(host);            // Nx::Instrumentation now sees this tree
//   model.backend().number("/host/eth0/ip", 123);     // read back after the code wrote
#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <stdexcept>
#include <string>
#include <vector>

#include "Nx/HostModel.h"

namespace testhost {

using Nx::HostModel::Node;
using Nx::HostModel::PropertyValue;
using Nx::HostModel::Tree;

// A backend over a tree held in memory. Writes follow the rules of the real backends: unknown
// node or property, read-only property or wrong kind is refused. Every accepted write is logged.
class TestBackend : public Nx::HostModel::Backend {
public:
    struct Write {
        std::string path;
        unsigned int property;
        PropertyValue value;
    };

    explicit TestBackend(Tree tree) : tree_(std::make_shared<const Tree>(std::move(tree))) {}

    std::shared_ptr<const Tree> snapshot() override {
        std::lock_guard<std::mutex> lock(mutex_);
        return tree_;
    }

    bool write(const std::string& nodePath, unsigned int property, const PropertyValue& value) override {
        std::lock_guard<std::mutex> lock(mutex_);
        int index = tree_->find(nodePath);
        if (index < 0) return false;
        auto next = std::make_shared<Tree>(*tree_);
        auto found = next->nodes[static_cast<size_t>(index)].properties.find(property);
        if (found == next->nodes[static_cast<size_t>(index)].properties.end()) return false;
        PropertyValue& stored = found->second;
        if (stored.readOnly || stored.kind != value.kind) return false;
        stored.text = value.text;
        stored.number = value.number;
        stored.list = value.list;
        stored.readable = true;
        tree_ = std::move(next);
        writes_.push_back(Write{nodePath, property, value});
        return true;
    }

    std::string describe() const override { return "test"; }

    std::vector<Write> writes() const {
        std::lock_guard<std::mutex> lock(mutex_);
        return writes_;
    }

    // Current value of a property; throws when the node or property does not exist.
    PropertyValue value(const std::string& path, unsigned int property) const {
        std::lock_guard<std::mutex> lock(mutex_);
        int index = tree_->find(path);
        if (index < 0) throw std::out_of_range("no node " + path);
        const auto& properties = tree_->nodes[static_cast<size_t>(index)].properties;
        auto found = properties.find(property);
        if (found == properties.end()) throw std::out_of_range("no property " + std::to_string(property));
        return found->second;
    }
    unsigned int number(const std::string& path, unsigned int property) const { return value(path, property).number; }
    std::string text(const std::string& path, unsigned int property) const { return value(path, property).text; }

private:
    mutable std::mutex mutex_;
    std::shared_ptr<const Tree> tree_;
    std::vector<Write> writes_;
};

// Builds a tree shaped like the host: a system node at the root, LAN port nodes (12) under the
// system or the service processor, and an IP endpoint node (29) "ip" under each port.
class HostBuilder {
public:
    explicit HostBuilder(const std::string& description = "Host computer system") {
        root_ = tree_.add(-1, 40, "host", description);
    }
    // A tree without any node at all.
    static HostBuilder empty() { return HostBuilder(EmptyTag{}); }

    int root() const { return root_; }

    int node(int parent, unsigned int type, const std::string& name, const std::string& description) {
        return tree_.add(parent, type, name, description);
    }
    // The service processor node (type 41) under the system node.
    int serviceProcessor(const std::string& description = "BMC", const std::string& name = "bmc") {
        return tree_.add(root_, 41, name, description);
    }
    // A LAN port named after the interface and its endpoint node; returns the endpoint. The
    // endpoint's interface name (108) is set to ifname.
    int endpoint(int parent, const std::string& ifname, const std::string& description) {
        int lan = tree_.add(parent, 12, ifname, ifname);
        text(lan, 108, ifname);
        int ip = tree_.add(lan, 29, "ip", description);
        text(ip, 108, ifname);
        return ip;
    }

    HostBuilder& text(int node, unsigned int property, const std::string& value) {
        return set(node, property, PropertyValue::ofText(value));
    }
    HostBuilder& number(int node, unsigned int property, unsigned int value) {
        return set(node, property, PropertyValue::ofNumber(value));
    }
    HostBuilder& list(int node, unsigned int property, const std::vector<std::string>& value) {
        return set(node, property, PropertyValue::ofList(value));
    }
    // Flags on a property set before.
    HostBuilder& unreadable(int node, unsigned int property) {
        at(node).properties.at(property).readable = false;
        return *this;
    }
    HostBuilder& readOnly(int node, unsigned int property) {
        at(node).properties.at(property).readOnly = true;
        return *this;
    }
    HostBuilder& remove(int node, unsigned int property) {
        at(node).properties.erase(property);
        return *this;
    }

    const std::string& path(int node) const { return tree_.nodes.at(static_cast<size_t>(node)).path; }
    const Tree& tree() const { return tree_; }

private:
    struct EmptyTag {};
    explicit HostBuilder(EmptyTag) {}

    Node& at(int node) { return tree_.nodes.at(static_cast<size_t>(node)); }
    HostBuilder& set(int node, unsigned int property, PropertyValue value) {
        at(node).properties[property] = std::move(value);
        return *this;
    }

    Tree tree_;
    int root_ = -1;
};

// Installs a TestBackend over the builder's tree for the scope; the environment's choice comes
// back afterwards.
class ScopedHostModel {
public:
    explicit ScopedHostModel(const HostBuilder& builder)
        : backend_(std::make_shared<TestBackend>(builder.tree())) {
        Nx::HostModel::setCurrent(backend_);
    }
    ~ScopedHostModel() { Nx::HostModel::setCurrent(nullptr); }
    ScopedHostModel(const ScopedHostModel&) = delete;
    ScopedHostModel& operator=(const ScopedHostModel&) = delete;

    TestBackend& backend() { return *backend_; }

private:
    std::shared_ptr<TestBackend> backend_;
};

}  // namespace testhost
