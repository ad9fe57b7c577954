// A cursor over the host model's node tree.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "Nx/HostModel.h"
#include "Nx/NodeLexicon.h"

namespace Nx {

class Instrumentation {
public:
    // Binds to the process's host model; the cursor stands on no node until selectNode. Throws
    // Nx::InstrumentationException when the host model cannot be opened (bad IPIF_HOST_MODEL,
    // unreadable fixture, live backend unavailable).
    Instrumentation();

    // First node of the type, in document order. False (and past the end) when there is none.
    bool selectNode(NodeLexicon::NodeType type);
    // The node at a path as getPathToParentNode returns it. False (and past the end) when absent.
    bool selectNode(const std::string& path);

    // Next node of the current node's type.
    Instrumentation& operator++();
    explicit operator bool() const;

    std::string getNodeDescription() const;   // empty past the end
    std::string getPathToParentNode() const;  // empty for the root and past the end

    bool getProperty(NodeLexicon::Properties property, std::string& value) const;
    bool getProperty(NodeLexicon::Properties property, unsigned int& value) const;
    bool getProperty(NodeLexicon::Properties property, std::vector<std::string>& value) const;
    bool setProperty(NodeLexicon::Properties property, const std::string& value);
    bool setProperty(NodeLexicon::Properties property, const unsigned int& value);
    bool setProperty(NodeLexicon::Properties property, const std::vector<std::string>& value);
    // True when the question could be answered (the node has the property).
    bool isPropertyReadOnly(NodeLexicon::Properties property, bool& readOnly) const;

private:
    const HostModel::Node* node() const;
    bool write(NodeLexicon::Properties property, const HostModel::PropertyValue& value);

    std::shared_ptr<HostModel::Backend> backend_;
    std::shared_ptr<const HostModel::Tree> tree_;
    int index_ = -1;
};

}  // namespace Nx
