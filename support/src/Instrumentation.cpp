#include "Nx/Instrumentation.h"

#include <string>

#include "Nx/Exceptions.h"

namespace Nx {

using HostModel::PropertyValue;

Instrumentation::Instrumentation() : backend_(HostModel::current()) {}

bool Instrumentation::selectNode(NodeLexicon::NodeType type) {
    tree_ = backend_->snapshot();
    index_ = -1;
    for (size_t i = 0; i < tree_->nodes.size(); ++i) {
        if (tree_->nodes[i].type == type) {
            index_ = static_cast<int>(i);
            break;
        }
    }
    return index_ >= 0;
}

bool Instrumentation::selectNode(const std::string& path) {
    tree_ = backend_->snapshot();
    index_ = tree_->find(path);
    return index_ >= 0;
}

Instrumentation& Instrumentation::operator++() {
    if (!node()) return *this;
    const unsigned int type = tree_->nodes[static_cast<size_t>(index_)].type;
    // Walk the same snapshot the cursor stands on, so one pass never sees a mix of two pictures.
    int next = -1;
    for (size_t i = static_cast<size_t>(index_) + 1; i < tree_->nodes.size(); ++i) {
        if (tree_->nodes[i].type == type) {
            next = static_cast<int>(i);
            break;
        }
    }
    index_ = next;
    return *this;
}

bool Instrumentation::seek(NodeLexicon::Properties property, const std::string& text) {
    if (!node()) return false;
    index_ = tree_->nextComparable(index_, property, text);
    return index_ >= 0;
}

bool Instrumentation::selectParent() {
    const HostModel::Node* current = node();
    index_ = current ? current->parent : -1;
    return index_ >= 0;
}

Instrumentation::operator bool() const { return node() != nullptr; }

const HostModel::Node* Instrumentation::node() const {
    if (!tree_ || index_ < 0 || static_cast<size_t>(index_) >= tree_->nodes.size()) return nullptr;
    return &tree_->nodes[static_cast<size_t>(index_)];
}

std::string Instrumentation::getNodeDescription() const {
    const HostModel::Node* current = node();
    return current ? current->description : std::string();
}

std::string Instrumentation::getPathToParentNode() const {
    const HostModel::Node* current = node();
    if (!current || current->parent < 0) return std::string();
    return tree_->nodes.at(static_cast<size_t>(current->parent)).path;
}

namespace {

const PropertyValue* readable(const HostModel::Node* node, NodeLexicon::Properties property,
                              PropertyValue::Kind kind) {
    if (!node) return nullptr;
    auto found = node->properties.find(property);
    if (found == node->properties.end()) return nullptr;
    if (found->second.failing)
        throw InstrumentationException("Property " + std::to_string(property) + " of " + node->path +
                                       " could not be read from the host");
    if (!found->second.readable || found->second.kind != kind) return nullptr;
    return &found->second;
}

}  // namespace

bool Instrumentation::getProperty(NodeLexicon::Properties property, std::string& value) const {
    const PropertyValue* found = readable(node(), property, PropertyValue::Kind::String);
    if (!found) return false;
    value = found->text;
    return true;
}

bool Instrumentation::getProperty(NodeLexicon::Properties property, unsigned int& value) const {
    const PropertyValue* found = readable(node(), property, PropertyValue::Kind::Unsigned);
    if (!found) return false;
    value = found->number;
    return true;
}

bool Instrumentation::getProperty(NodeLexicon::Properties property, std::vector<std::string>& value) const {
    const PropertyValue* found = readable(node(), property, PropertyValue::Kind::StringList);
    if (!found) return false;
    value = found->list;
    return true;
}

bool Instrumentation::setProperty(NodeLexicon::Properties property, const std::string& value) {
    return write(property, PropertyValue::ofText(value));
}

bool Instrumentation::setProperty(NodeLexicon::Properties property, const unsigned int& value) {
    return write(property, PropertyValue::ofNumber(value));
}

bool Instrumentation::setProperty(NodeLexicon::Properties property, const std::vector<std::string>& value) {
    return write(property, PropertyValue::ofList(value));
}

bool Instrumentation::isPropertyReadOnly(NodeLexicon::Properties property, bool& readOnly) const {
    const HostModel::Node* current = node();
    if (!current) return false;
    auto found = current->properties.find(property);
    if (found == current->properties.end()) return false;
    readOnly = found->second.readOnly;
    return true;
}

bool Instrumentation::write(NodeLexicon::Properties property, const PropertyValue& value) {
    const HostModel::Node* current = node();
    if (!current) return false;
    const std::string path = current->path;
    if (!backend_->write(path, property, value)) return false;
    // Show our own write at once and stay on the same node, wherever it now sits in the tree.
    tree_ = backend_->snapshot();
    index_ = tree_->find(path);
    return true;
}

}  // namespace Nx
