// The host model: the machine as a tree of typed nodes with numbered properties, and the
// backends that supply it (a fixture file, or the live Linux host).
#pragma once

#include <algorithm>
#include <map>
#include <memory>
#include <mutex>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

namespace Nx {
namespace HostModel {

struct PropertyValue {
    enum class Kind { String, Unsigned, StringList };
    Kind kind = Kind::String;
    std::string text;
    unsigned int number = 0;
    std::vector<std::string> list;
    bool readable = true;   // false: the host cannot report it, every read fails
    bool readOnly = false;  // true: writes are refused and isPropertyReadOnly says so
    bool failing = false;   // true: the host errors on reading it; a read throws InstrumentationException

    static PropertyValue ofText(std::string v);
    static PropertyValue ofNumber(unsigned int v);
    static PropertyValue ofList(std::vector<std::string> v);
};

// A node's properties by number, in ascending order: a map kept in one sorted vector, so that a
// node costs one allocation rather than one per property (a large host has tens of thousands).
class PropertyMap {
public:
    using value_type = std::pair<unsigned int, PropertyValue>;
    using iterator = std::vector<value_type>::iterator;
    using const_iterator = std::vector<value_type>::const_iterator;

    iterator begin() { return items_.begin(); }
    iterator end() { return items_.end(); }
    const_iterator begin() const { return items_.begin(); }
    const_iterator end() const { return items_.end(); }
    std::size_t size() const { return items_.size(); }
    bool empty() const { return items_.empty(); }
    void reserve(std::size_t count) { items_.reserve(count); }

    iterator find(unsigned int property) {
        auto at = slot(items_, property);
        return at != items_.end() && at->first == property ? at : items_.end();
    }
    const_iterator find(unsigned int property) const {
        auto at = slot(items_, property);
        return at != items_.end() && at->first == property ? at : items_.end();
    }
    std::size_t count(unsigned int property) const { return find(property) == end() ? 0 : 1; }
    const PropertyValue& at(unsigned int property) const {
        auto found = find(property);
        if (found == end()) throw std::out_of_range("no property " + std::to_string(property));
        return found->second;
    }
    PropertyValue& at(unsigned int property) {
        return const_cast<PropertyValue&>(static_cast<const PropertyMap*>(this)->at(property));
    }
    // Inserts value unless the property is there; the second member says whether it was inserted.
    std::pair<iterator, bool> emplace(unsigned int property, PropertyValue value) {
        if (items_.empty() || items_.back().first < property) {  // filled in ascending order
            items_.emplace_back(property, std::move(value));
            return {items_.end() - 1, true};
        }
        auto at = slot(items_, property);
        if (at != items_.end() && at->first == property) return {at, false};
        return {items_.emplace(at, property, std::move(value)), true};
    }
    PropertyValue& operator[](unsigned int property) { return emplace(property, PropertyValue()).first->second; }
    std::size_t erase(unsigned int property) {
        auto found = find(property);
        if (found == end()) return 0;
        items_.erase(found);
        return 1;
    }

private:
    static bool before(const value_type& item, unsigned int property) { return item.first < property; }
    static iterator slot(std::vector<value_type>& items, unsigned int property) {
        return std::lower_bound(items.begin(), items.end(), property, before);
    }
    static const_iterator slot(const std::vector<value_type>& items, unsigned int property) {
        return std::lower_bound(items.begin(), items.end(), property, before);
    }
    std::vector<value_type> items_;
};

struct Node {
    unsigned int type = 0;
    std::string name;         // unique among its siblings
    std::string description;
    std::string path;         // "/" + the names from the root down, joined by "/"
    int parent = -1;          // index into Tree::nodes; -1 for the root
    PropertyMap properties;
};

// An immutable picture of the host. Nodes are in document order (a parent before its children,
// siblings in order), which is the order in which a cursor walks the nodes of one type.
struct Tree {
    std::vector<Node> nodes;

    int find(const std::string& path) const;  // index of the node at path, -1 when none
    // Appends a node under parent (-1 for the root) and fills its path; returns its index.
    int add(int parent, unsigned int type, const std::string& name, const std::string& description);

    // The first node from index `from` on (from itself included) of from's type that a walk
    // comparing property with text must not skip: its property is readable text equal to text,
    // or no text to compare (absent, unreadable, failing, another kind). -1 when there is none.
    // Answered from an index built on first use for each type and property, so that a lookup by
    // name costs no walk; the tree must not change once it is asked (a copy starts afresh).
    int nextComparable(int from, unsigned int property, const std::string& text) const;

private:
    struct PropertyIndex;
    // Indexes built so far; a copy of the tree starts without any.
    class Indexes {
    public:
        Indexes();
        ~Indexes();
        Indexes(const Indexes&) : Indexes() {}
        Indexes& operator=(const Indexes&);
        const PropertyIndex& of(const Tree& tree, unsigned int type, unsigned int property);

    private:
        std::mutex mutex_;
        std::map<std::pair<unsigned int, unsigned int>, std::unique_ptr<PropertyIndex>> built_;
    };
    mutable Indexes indexes_;
};

class Backend {
public:
    virtual ~Backend() = default;
    // A consistent picture of the host. Cheap to call repeatedly; a picture handed out never changes.
    virtual std::shared_ptr<const Tree> snapshot() = 0;
    // Carries out a property write on the host. False when the node or property is unknown, the
    // property is read-only, the value has the wrong kind, or the host refused the change.
    // Snapshots taken after a successful write show the new value, except where the host applies
    // it later: on the live host an interface's addresses, mask, gateways and prefix are written to
    // its ifcfg file and take effect at the interface's next start (the IPv6 address and prefix
    // read back from the file at once).
    virtual bool write(const std::string& nodePath, unsigned int property, const PropertyValue& value) = 0;
    // "fixture:<path>" or "live", for diagnostics.
    virtual std::string describe() const = 0;
};

// Opens a backend from a selector: "fixture:PATH" or "live". Throws Nx::InstrumentationException
// with a readable message when the selector or the fixture file is bad.
std::shared_ptr<Backend> open(const std::string& selector);

// The backend this process uses, chosen once from IPIF_HOST_MODEL (default "live").
std::shared_ptr<Backend> current();

// Replaces the process's backend (tests, embedded hosts). nullptr returns to the environment's choice.
void setCurrent(std::shared_ptr<Backend> backend);

}  // namespace HostModel
}  // namespace Nx
