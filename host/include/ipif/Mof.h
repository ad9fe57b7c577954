// Class declarations read from MOF, and the questions the host asks of them: which classes
// exist, how they derive, which properties, keys, references and methods they carry.
//
// The reader understands the class-declaration subset of MOF:
//   [Qualifier, Qualifier(value), Qualifier{v1, v2} : flavors, ...]
//   class Name [: Superclass] { features };
// where a feature is a property (`type Name[];` with an optional `= default`), a reference
// (`Class REF Name;`) or a method (`type Name([IN, OUT] type Param[], [IN] Class REF Param);`).
// `//` and `/* */` comments are skipped, `#pragma` lines ignored, `qualifier` declarations
// skipped. Any other construct is a syntax error reported as "file:line: message".
//
// Names compare case-insensitively everywhere. A subclass may redeclare an inherited
// property or reference (typically with Override) to narrow its type or add qualifiers; the
// Key qualifier cannot be taken away by a redeclaration.
//
// Parameters: a parameter is IN unless it carries only OUT; [IN, OUT] is both.
#pragma once

#include <map>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include "ipif/Value.h"

namespace ipif {

class MofError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;  // message: "file:line: text"
};

struct Qualifier {
    std::string name;
    std::string value;  // "true" for a bare flag; the text of a string; "{a, b}" for lists
};

struct PropertyDecl {
    std::string name;
    CimType type = CimType::String;
    bool array = false;
    std::string refClass;  // the referenced class, for references
    bool key = false;
    std::vector<Qualifier> qualifiers;
    std::string origin;  // the class that declared it last
};

struct ParameterDecl {
    std::string name;
    CimType type = CimType::String;
    bool array = false;
    std::string refClass;
    bool in = true;
    bool out = false;
    std::vector<Qualifier> qualifiers;
};

struct MethodDecl {
    std::string name;
    CimType returnType = CimType::Uint32;
    std::vector<ParameterDecl> parameters;
    std::vector<Qualifier> qualifiers;
    std::string origin;

    const ParameterDecl* parameter(const std::string& name) const;
};

struct ClassDecl {
    std::string name;
    std::string superclass;  // empty for a root class
    bool association = false;
    std::vector<Qualifier> qualifiers;
    std::vector<PropertyDecl> properties;  // declared in this class only
    std::vector<MethodDecl> methods;       // declared in this class only
    std::string file;
    int line = 0;
};

// Reads one MOF text; fileName is used in error messages. Throws MofError.
std::vector<ClassDecl> parseMof(const std::string& text, const std::string& fileName);

class ClassRepository {
public:
    ClassRepository();
    ~ClassRepository();
    ClassRepository(ClassRepository&&) noexcept;
    ClassRepository& operator=(ClassRepository&&) noexcept;

    // Adds the classes of a MOF text / file / every *.mof of a directory (in name order).
    // Superclasses and referenced classes may come from any file added before resolve().
    void addText(const std::string& text, const std::string& fileName);
    void addFile(const std::string& path);
    void addPath(const std::string& fileOrDirectory);
    // Checks that every superclass and referenced class is declared and that no class derives
    // from itself, then computes the inherited features. Throws MofError naming the file and
    // line of the offending declaration. Queries are valid after it.
    void resolve();

    const ClassDecl* find(std::string_view className) const;
    bool exists(std::string_view className) const { return find(className) != nullptr; }
    // True when cls is parent or derives from it; false when either is unknown.
    bool isA(const std::string& cls, const std::string& parent) const;
    std::vector<std::string> classNames() const;  // declared spelling, sorted
    // The chain from the class up to its root: {cls, super, super's super, ...}.
    std::vector<std::string> ancestry(const std::string& cls) const;

    // Effective features, inherited ones included: root-most declaration first, a
    // redeclaration merged into the inherited slot. Empty / null when the class is unknown.
    const std::vector<PropertyDecl>& properties(const std::string& cls) const;
    const PropertyDecl* property(std::string_view cls, std::string_view name) const;
    // A class found once for many lookups of its properties, as when an instance is filled;
    // null for an unknown class. Valid until the repository changes.
    struct ResolvedClass;
    const ResolvedClass* resolved(std::string_view cls) const;
    const PropertyDecl* property(const ResolvedClass* cls, std::string_view name) const;  // null cls: null
    const std::vector<MethodDecl>& methods(const std::string& cls) const;
    const MethodDecl* method(const std::string& cls, const std::string& name) const;
    std::vector<std::string> keyNames(const std::string& cls) const;
    bool isAssociation(const std::string& cls) const;

    // Converts the keys of a path to the declared types of its class (nested reference keys
    // recursively). Throws CimError: CMPI_RC_ERR_INVALID_CLASS for an unknown class,
    // CMPI_RC_ERR_NO_SUCH_PROPERTY for a key the class does not declare,
    // CMPI_RC_ERR_INVALID_PARAMETER for a value that does not convert.
    ObjectPath typedPath(const ObjectPath& path) const;
    // Converts a value read from text (string, uint64, sint64, real64, boolean as ObjectPath::parse
    // makes them, or any properly typed value) to the given declaration. Throws CimError
    // (CMPI_RC_ERR_INVALID_PARAMETER) when it does not convert.
    Value convert(const Value& value, CimType type, bool array, const std::string& what) const;

private:
    struct Data;
    std::unique_ptr<Data> d_;
};

}  // namespace ipif
