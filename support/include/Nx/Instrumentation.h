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
    // Moves forward (staying when the current node qualifies) to the next node of the current type
    // whose property may equal text: one holding text as readable text, or one whose property
    // cannot be read as text. The nodes passed over are exactly those whose property is readable
    // text other than text. False (past the end) when no node is left.
    bool seek(NodeLexicon::Properties property, const std::string& text);
    // The parent of the current node, in the same picture. False (past the end) for the root.
    bool selectParent();
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
