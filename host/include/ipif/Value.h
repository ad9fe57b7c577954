// Host-side CIM values: typed values, object paths, instances and named value lists, with the
// textual forms the host and the ipif command line read and write.
//
// Object path text:  [namespace:]Class[.Key=value{,Key=value}]
//   - string, datetime and char16 keys are written in double quotes; '"' and '\' inside are
//     escaped with a backslash;
//   - numbers and booleans are written bare (true / false);
//   - a reference key is the referenced path's own text, quoted and escaped like a string, so
//     paths nest to any depth.
//   Parsing accepts the same, plus bare words as strings. Keys read from text carry the type
//   their spelling suggests (quoted: string, digits: uint64/sint64, true/false: boolean) until
//   ClassRepository::typedPath gives them the types the class declares.
#pragma once

#include <cstdint>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

namespace ipif {

enum class CimType {
    Boolean, Char16,
    Uint8, Uint16, Uint32, Uint64,
    Sint8, Sint16, Sint32, Sint64,
    Real32, Real64,
    String, DateTime, Reference, Instance
};

// MOF spelling: "boolean", "uint16", "string", "datetime"; "ref" for references, "instance".
const char* typeName(CimType type);
// MOF data type keyword (case-insensitive) to type; false for anything else (also for "ref").
bool parseTypeName(const std::string& word, CimType& type);
bool isUnsigned(CimType type);  // uint8..uint64 and char16
bool isSigned(CimType type);
bool isReal(CimType type);
bool isTextual(CimType type);   // string, datetime

// Thrown for text that is not a well-formed path or value.
class ParseError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

// A failure with a CIM status code (the CMPIrc numbers): unknown class or property, a value of
// the wrong type, a provider that cannot be loaded.
class CimError : public std::runtime_error {
public:
    CimError(int rc, const std::string& message) : std::runtime_error(message), rc_(rc) {}
    int rc() const { return rc_; }

private:
    int rc_;
};

// "CMPI_RC_ERR_NOT_FOUND" for 6 and so on; "CMPI_RC_<n>" for a number CMPI does not name.
std::string rcName(int rc);

// Case-insensitive ASCII comparison, as CIM compares names; ASCII only, so that the answer does
// not depend on the locale. Inline: name searches call it for every name they pass, and most
// of those differ in length.
inline bool equalsIgnoreCase(std::string_view a, std::string_view b) {
    if (a.size() != b.size()) return false;
    if (a == b) return true;  // names mostly come spelt as declared
    const auto folded = [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c; };
    for (std::size_t i = 0; i < a.size(); ++i)
        if (folded(a[i]) != folded(b[i])) return false;
    return true;
}
// Hash and equality of names that ignore ASCII case, for maps keyed by name.
struct HashIgnoreCase {
    std::size_t operator()(std::string_view name) const;
};
struct EqualIgnoreCase {
    bool operator()(std::string_view a, std::string_view b) const { return equalsIgnoreCase(a, b); }
};

struct ObjectPath;
struct Instance;
using ObjectPathPtr = std::shared_ptr<const ObjectPath>;
using InstancePtr = std::shared_ptr<const Instance>;

// One scalar or array element. std::monostate is a null element. Unsigned integers and char16
// are held as uint64, signed ones as int64, reals as double, strings and datetimes as text.
using Element = std::variant<std::monostate, bool, std::uint64_t, std::int64_t, double, std::string,
                             ObjectPathPtr, InstancePtr>;

// A read-only view of a value's elements.
class ElementRange {
public:
    ElementRange(const Element* first, std::size_t count) : first_(first), count_(count) {}
    const Element* begin() const { return first_; }
    const Element* end() const { return first_ + count_; }
    std::size_t size() const { return count_; }
    bool empty() const { return count_ == 0; }
    const Element& operator[](std::size_t i) const { return first_[i]; }
    const Element& at(std::size_t i) const {
        if (i >= count_) throw std::out_of_range("element index");
        return first_[i];
    }
    std::vector<Element> vector() const { return std::vector<Element>(begin(), end()); }

private:
    const Element* first_;
    std::size_t count_;
};

class Value {
public:
    Value();  // a null string

    static Value null(CimType type, bool array = false);
    static Value boolean(bool v);
    static Value char16(std::uint16_t v);
    static Value uint8(std::uint8_t v) { return fromUnsigned(CimType::Uint8, v); }
    static Value uint16(std::uint16_t v) { return fromUnsigned(CimType::Uint16, v); }
    static Value uint32(std::uint32_t v) { return fromUnsigned(CimType::Uint32, v); }
    static Value uint64(std::uint64_t v) { return fromUnsigned(CimType::Uint64, v); }
    static Value sint8(std::int8_t v) { return fromSigned(CimType::Sint8, v); }
    static Value sint16(std::int16_t v) { return fromSigned(CimType::Sint16, v); }
    static Value sint32(std::int32_t v) { return fromSigned(CimType::Sint32, v); }
    static Value sint64(std::int64_t v) { return fromSigned(CimType::Sint64, v); }
    static Value real32(float v);
    static Value real64(double v);
    static Value fromUnsigned(CimType type, std::uint64_t v);  // type: an unsigned type or char16
    static Value fromSigned(CimType type, std::int64_t v);
    static Value string(std::string v);
    static Value dateTime(std::string cimText);
    static Value reference(ObjectPath path);
    static Value instance(Instance inst);
    // An array of type; each element must fit the type (or be std::monostate).
    static Value array(CimType type, std::vector<Element> elements);
    // A scalar of type holding element (std::monostate: null). Throws std::logic_error when the
    // element does not fit the type.
    static Value scalar(CimType type, Element element);

    CimType type() const { return type_; }
    bool isArray() const { return array_; }
    bool isNull() const { return null_; }

    // Arrays: the elements. Scalars: one element (none when null).
    ElementRange elements() const {
        return array_ ? ElementRange(elements_.data(), elements_.size()) : ElementRange(&scalar_, null_ ? 0 : 1);
    }
    std::size_t size() const { return elements().size(); }

    // Scalar accessors. They throw std::logic_error when the value is null, an array, or of
    // another kind (asUnsigned on a signed value and the like).
    bool asBool() const;
    std::uint64_t asUnsigned() const;
    std::int64_t asSigned() const;
    double asReal() const;
    const std::string& asString() const;  // string and datetime
    const ObjectPath& asReference() const;
    const Instance& asInstance() const;

    // MOF-style text: "quoted" strings and datetimes, bare numbers, true/false, references as
    // quoted path text, arrays as {a, b}, NULL for null.
    std::string toText() const;

    // Reads a command-line literal of the given type. Arrays are comma-separated (optionally in
    // braces); an element in double quotes may contain commas and uses backslash escapes; a
    // reference is path text. Throws ParseError.
    static Value parse(CimType type, bool array, const std::string& text);

    bool operator==(const Value& other) const;
    bool operator!=(const Value& other) const { return !(*this == other); }

private:
    // A scalar holding element, which fits type.
    Value(CimType type, Element&& element)
        : type_(type), null_(element.index() == 0), scalar_(std::move(element)) {}

    CimType type_ = CimType::String;
    bool array_ = false;
    bool null_ = true;
    // A scalar's element is held in place: a value is made for every property a provider sets,
    // and nearly all are scalars.
    Element scalar_;
    std::vector<Element> elements_;  // an array's
};

// An ordered list of named values; names compare case-insensitively and keep the spelling they
// were first set with. Used for keys, properties, method arguments and context entries.
class NamedValues {
public:
    using Item = std::pair<std::string, Value>;

    const Value* find(std::string_view name) const;
    Value* find(std::string_view name);
    // Replaces the value of an existing name (keeping its position) or appends.
    void set(std::string_view name, const Value& value);
    void set(std::string_view name, Value&& value);
    bool erase(std::string_view name);
    void clear() { items_.clear(); }
    void reserve(std::size_t count) { items_.reserve(count); }

    std::size_t size() const { return items_.size(); }
    bool empty() const { return items_.empty(); }
    const Item& at(std::size_t i) const { return items_.at(i); }
    std::vector<Item>::const_iterator begin() const { return items_.begin(); }
    std::vector<Item>::const_iterator end() const { return items_.end(); }

    // Same names (in any order) with equal values.
    bool sameAs(const NamedValues& other) const;

private:
    std::vector<Item> items_;
};

struct ObjectPath {
    std::string nameSpace;  // empty: the default namespace of whoever resolves the path
    std::string className;
    NamedValues keys;

    ObjectPath() = default;
    ObjectPath(std::string ns, std::string cls) : nameSpace(std::move(ns)), className(std::move(cls)) {}

    std::string toString() const;  // with the namespace when there is one
    std::string toStringWithoutNamespace() const;
    static ObjectPath parse(const std::string& text);  // throws ParseError

    // Namespace and class case-insensitively (an empty namespace matches any), keys by sameAs.
    bool operator==(const ObjectPath& other) const;
    bool operator!=(const ObjectPath& other) const { return !(*this == other); }
};

struct Instance {
    ObjectPath path;  // class, namespace and keys
    NamedValues properties;

    const std::string& className() const { return path.className; }
    const Value* property(std::string_view name) const { return properties.find(name); }

    // instance of Class {
    //     Prop = value;
    // };
    std::string toMof() const;
};

using Args = NamedValues;

// Quotes text for path keys and MOF: "..." with '"' and '\' escaped (and control characters as
// \n, \t, \r, \xHH in MOF mode).
std::string quote(const std::string& text, bool mof = false);

}  // namespace ipif
