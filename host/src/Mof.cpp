#include "ipif/Mof.h"

#include <algorithm>
#include <cctype>
#include <functional>
#include <set>
#include <sstream>
#include <unordered_map>

#include "TextFiles.h"

namespace ipif {

namespace {

std::string lower(std::string s) {
    for (auto& c : s) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return s;
}

// ---- Lexer ---------------------------------------------------------------------------------

enum class Tok { Ident, String, Char, Number, Punct, End };

struct Token {
    Tok kind = Tok::End;
    std::string text;  // identifier, decoded string, number text, or the punctuation character
    int line = 0;
};

class Lexer {
public:
    Lexer(const std::string& text, const std::string& file) : s_(text), file_(file) {}

    [[noreturn]] void fail(int line, const std::string& msg) const {
        throw MofError(file_ + ":" + std::to_string(line) + ": " + msg);
    }

    Token next() {
        skipSpaceAndComments();
        Token t;
        t.line = line_;
        if (pos_ >= s_.size()) return t;
        char c = s_[pos_];
        if (std::isalpha(static_cast<unsigned char>(c)) || c == '_') {
            std::size_t start = pos_;
            while (pos_ < s_.size() && (std::isalnum(static_cast<unsigned char>(s_[pos_])) || s_[pos_] == '_')) ++pos_;
            t.kind = Tok::Ident;
            t.text = s_.substr(start, pos_ - start);
            return t;
        }
        if (std::isdigit(static_cast<unsigned char>(c)) ||
            ((c == '-' || c == '+' || c == '.') && pos_ + 1 < s_.size() &&
             std::isdigit(static_cast<unsigned char>(s_[pos_ + 1])))) {
            std::size_t start = pos_++;
            while (pos_ < s_.size() && (std::isalnum(static_cast<unsigned char>(s_[pos_])) || s_[pos_] == '.' ||
                                        ((s_[pos_] == '-' || s_[pos_] == '+') &&
                                         (s_[pos_ - 1] == 'e' || s_[pos_ - 1] == 'E'))))
                ++pos_;
            t.kind = Tok::Number;
            t.text = s_.substr(start, pos_ - start);
            return t;
        }
        if (c == '"') {
            t.kind = Tok::String;
            t.text = quoted('"');
            return t;
        }
        if (c == '\'') {
            t.kind = Tok::Char;
            t.text = quoted('\'');
            return t;
        }
        if (std::string("[](){},;:=").find(c) != std::string::npos) {
            ++pos_;
            t.kind = Tok::Punct;
            t.text = std::string(1, c);
            return t;
        }
        fail(line_, std::string("unexpected character '") + c + "'");
    }

private:
    void skipSpaceAndComments() {
        while (pos_ < s_.size()) {
            char c = s_[pos_];
            if (c == '\n') {
                ++line_;
                ++pos_;
                atLineStart_ = true;
            } else if (std::isspace(static_cast<unsigned char>(c))) {
                ++pos_;
            } else if (c == '/' && pos_ + 1 < s_.size() && s_[pos_ + 1] == '/') {
                while (pos_ < s_.size() && s_[pos_] != '\n') ++pos_;
            } else if (c == '/' && pos_ + 1 < s_.size() && s_[pos_ + 1] == '*') {
                int startLine = line_;
                pos_ += 2;
                while (pos_ + 1 < s_.size() && !(s_[pos_] == '*' && s_[pos_ + 1] == '/')) {
                    if (s_[pos_] == '\n') ++line_;
                    ++pos_;
                }
                if (pos_ + 1 >= s_.size()) fail(startLine, "unterminated comment");
                pos_ += 2;
            } else if (c == '#' && atLineStart_) {
                std::size_t end = s_.find('\n', pos_);
                std::string directive = s_.substr(pos_, end == std::string::npos ? std::string::npos : end - pos_);
                if (lower(directive).compare(0, 7, "#pragma") != 0) fail(line_, "unknown directive: " + directive);
                pos_ = end == std::string::npos ? s_.size() : end;
            } else {
                atLineStart_ = false;
                return;
            }
        }
    }

    std::string quoted(char q) {
        int startLine = line_;
        ++pos_;
        std::string out;
        while (true) {
            if (pos_ >= s_.size() || s_[pos_] == '\n') fail(startLine, "unterminated string");
            char c = s_[pos_++];
            if (c == q) break;
            if (c == '\\') {
                if (pos_ >= s_.size()) fail(startLine, "unterminated string");
                char n = s_[pos_++];
                switch (n) {
                case 'n': out += '\n'; break;
                case 't': out += '\t'; break;
                case 'r': out += '\r'; break;
                case 'b': out += '\b'; break;
                case 'f': out += '\f'; break;
                default: out += n;
                }
            } else {
                out += c;
            }
        }
        return out;
    }

    const std::string& s_;
    const std::string& file_;
    std::size_t pos_ = 0;
    int line_ = 1;
    bool atLineStart_ = true;
};

// ---- Parser --------------------------------------------------------------------------------

bool qualifierTrue(const std::vector<Qualifier>& qs, const char* name, bool* present = nullptr) {
    for (const auto& q : qs)
        if (equalsIgnoreCase(q.name, name)) {
            if (present) *present = true;
            return !equalsIgnoreCase(q.value, "false");
        }
    if (present) *present = false;
    return false;
}

class Parser {
public:
    Parser(const std::string& text, const std::string& file) : lex_(text, file), file_(file) { advance(); }

    std::vector<ClassDecl> parse() {
        std::vector<ClassDecl> classes;
        while (tok_.kind != Tok::End) {
            std::vector<Qualifier> quals;
            if (isPunct("[")) quals = qualifierList();
            if (isWord("qualifier")) {
                skipDeclaration();
                continue;
            }
            if (isWord("class")) {
                classes.push_back(classDecl(std::move(quals)));
                continue;
            }
            if (isWord("instance")) fail("instance declarations are not supported");
            fail("expected a class declaration, found " + describe());
        }
        return classes;
    }

private:
    [[noreturn]] void fail(const std::string& msg) { lex_.fail(tok_.line, msg); }

    void advance() { tok_ = lex_.next(); }
    bool isPunct(const char* p) const { return tok_.kind == Tok::Punct && tok_.text == p; }
    bool isWord(const char* w) const { return tok_.kind == Tok::Ident && equalsIgnoreCase(tok_.text, w); }

    std::string describe() const {
        switch (tok_.kind) {
        case Tok::End: return "end of file";
        case Tok::String: return "a string";
        case Tok::Char: return "a character literal";
        default: return "'" + tok_.text + "'";
        }
    }

    void expectPunct(const char* p) {
        if (!isPunct(p)) fail(std::string("expected '") + p + "', found " + describe());
        advance();
    }

    std::string identifier(const char* what) {
        if (tok_.kind != Tok::Ident) fail(std::string("expected ") + what + ", found " + describe());
        std::string s = tok_.text;
        advance();
        return s;
    }

    // Skips a qualifier declaration up to its terminating ';'.
    void skipDeclaration() {
        int depth = 0;
        while (tok_.kind != Tok::End) {
            if (tok_.kind == Tok::Punct) {
                if (tok_.text == "(" || tok_.text == "{" || tok_.text == "[") ++depth;
                if (tok_.text == ")" || tok_.text == "}" || tok_.text == "]") --depth;
                if (tok_.text == ";" && depth <= 0) {
                    advance();
                    return;
                }
            }
            advance();
        }
        fail("missing ';' at the end of the qualifier declaration");
    }

    std::string literal() {
        if (tok_.kind == Tok::String) {
            std::string s;
            while (tok_.kind == Tok::String) {  // adjacent strings concatenate
                s += tok_.text;
                advance();
            }
            return s;
        }
        if (tok_.kind == Tok::Number || tok_.kind == Tok::Ident || tok_.kind == Tok::Char) {
            std::string s = tok_.text;
            advance();
            return s;
        }
        fail("expected a value, found " + describe());
    }

    std::vector<Qualifier> qualifierList() {
        expectPunct("[");
        std::vector<Qualifier> qs;
        while (true) {
            Qualifier q;
            q.name = identifier("a qualifier name");
            q.value = "true";
            if (isPunct("(")) {
                advance();
                q.value = literal();
                expectPunct(")");
            } else if (isPunct("{")) {
                advance();
                std::string v = "{";
                while (!isPunct("}")) {
                    if (v.size() > 1) expectPunct(",");
                    v += (v.size() > 1 ? ", " : "") + literal();
                }
                advance();
                q.value = v + "}";
            }
            if (isPunct(":")) {  // flavors
                advance();
                identifier("a flavor");
                while (tok_.kind == Tok::Ident) advance();
            }
            qs.push_back(std::move(q));
            if (isPunct("]")) break;
            if (!isPunct(",")) fail("expected ',' or ']' in the qualifier list, found " + describe());
            advance();
        }
        advance();
        return qs;
    }

    // `[ ]` or `[N]` after a name.
    bool arraySuffix() {
        if (!isPunct("[")) return false;
        advance();
        if (tok_.kind == Tok::Number) advance();
        expectPunct("]");
        return true;
    }

    void skipDefault() {
        if (!isPunct("=")) return;
        advance();
        if (isPunct("{")) {
            advance();
            while (!isPunct("}")) {
                if (tok_.kind == Tok::End) fail("unterminated default value");
                advance();
            }
            advance();
        } else {
            literal();
        }
    }

    // A data type keyword or `Class REF`; fills type/refClass.
    void typeSpec(CimType& type, std::string& refClass, const char* context) {
        int line = tok_.line;
        std::string word = identifier(context);
        if (isWord("ref")) {
            CimType dataType;
            if (parseTypeName(word, dataType)) lex_.fail(line, "REF needs a class name, not the data type '" + word + "'");
            advance();
            type = CimType::Reference;
            refClass = word;
            return;
        }
        if (!parseTypeName(word, type)) lex_.fail(line, "unknown data type '" + word + "'");
    }

    ClassDecl classDecl(std::vector<Qualifier> quals) {
        ClassDecl c;
        c.file = file_;
        c.line = tok_.line;
        advance();  // 'class'
        c.name = identifier("a class name");
        if (isPunct(":")) {
            advance();
            c.superclass = identifier("a superclass name");
        }
        c.qualifiers = std::move(quals);
        c.association = qualifierTrue(c.qualifiers, "Association");
        expectPunct("{");
        while (!isPunct("}")) {
            if (tok_.kind == Tok::End) fail("missing '}' at the end of class " + c.name);
            feature(c);
        }
        advance();
        expectPunct(";");
        return c;
    }

    void feature(ClassDecl& c) {
        std::vector<Qualifier> quals;
        if (isPunct("[")) quals = qualifierList();
        int line = tok_.line;
        CimType type;
        std::string refClass;
        typeSpec(type, refClass, "a property or method declaration");
        std::string name = identifier("a property or method name");
        auto duplicate = [&](const std::string& n) {
            for (const auto& p : c.properties)
                if (equalsIgnoreCase(p.name, n)) return true;
            for (const auto& m : c.methods)
                if (equalsIgnoreCase(m.name, n)) return true;
            return false;
        };
        if (duplicate(name)) lex_.fail(line, "'" + name + "' declared twice in class " + c.name);
        if (isPunct("(")) {
            if (type == CimType::Reference) lex_.fail(line, "a method cannot return a reference");
            MethodDecl m;
            m.name = name;
            m.returnType = type;
            m.qualifiers = std::move(quals);
            m.origin = c.name;
            advance();
            while (!isPunct(")")) {
                if (!m.parameters.empty()) {
                    if (!isPunct(",")) fail("expected ',' or ')' in the parameter list, found " + describe());
                    advance();
                }
                m.parameters.push_back(parameter());
            }
            advance();
            expectPunct(";");
            c.methods.push_back(std::move(m));
            return;
        }
        PropertyDecl p;
        p.name = name;
        p.type = type;
        p.refClass = refClass;
        p.array = arraySuffix();
        p.key = qualifierTrue(quals, "Key");
        p.qualifiers = std::move(quals);
        p.origin = c.name;
        skipDefault();
        expectPunct(";");
        c.properties.push_back(std::move(p));
    }

    ParameterDecl parameter() {
        ParameterDecl p;
        if (isPunct("[")) p.qualifiers = qualifierList();
        typeSpec(p.type, p.refClass, "a parameter type");
        p.name = identifier("a parameter name");
        p.array = arraySuffix();
        bool inGiven = false, outGiven = false;
        bool in = qualifierTrue(p.qualifiers, "In", &inGiven);
        p.out = qualifierTrue(p.qualifiers, "Out", &outGiven);
        p.in = inGiven ? in : !p.out;
        return p;
    }

    Lexer lex_;
    std::string file_;
    Token tok_;
};

}  // namespace

const ParameterDecl* MethodDecl::parameter(const std::string& n) const {
    for (const auto& p : parameters)
        if (equalsIgnoreCase(p.name, n)) return &p;
    return nullptr;
}

std::vector<ClassDecl> parseMof(const std::string& text, const std::string& fileName) {
    return Parser(text, fileName).parse();
}

// ---- Repository ----------------------------------------------------------------------------

// Maps by a name that ignore its case. The keys are views of names the repository keeps (a
// declaration's, a resolved property's), which never move.
template <class T>
using ByName = std::unordered_map<std::string_view, T, HashIgnoreCase, EqualIgnoreCase>;

struct ClassRepository::ResolvedClass {
    const ClassDecl* decl = nullptr;
    std::vector<PropertyDecl> properties;
    std::vector<MethodDecl> methods;
    std::vector<std::string> chain;
    bool association = false;
    // Where each of properties is, by name: a lookup per property set on an instance.
    ByName<std::size_t> propertyAt;
};

struct ClassRepository::Data {
    using Resolved = ResolvedClass;
    std::vector<std::unique_ptr<ClassDecl>> classes;
    ByName<const ClassDecl*> byName;
    ByName<Resolved> resolved;
    bool isResolved = false;

    const Resolved* get(std::string_view cls) const {
        auto it = resolved.find(cls);
        return it == resolved.end() ? nullptr : &it->second;
    }
};

ClassRepository::ClassRepository() : d_(std::make_unique<Data>()) {}
ClassRepository::~ClassRepository() = default;
ClassRepository::ClassRepository(ClassRepository&&) noexcept = default;
ClassRepository& ClassRepository::operator=(ClassRepository&&) noexcept = default;

void ClassRepository::addText(const std::string& text, const std::string& fileName) {
    std::vector<ClassDecl> parsed = parseMof(text, fileName);
    for (auto& c : parsed) {
        auto it = d_->byName.find(c.name);
        if (it != d_->byName.end())
            throw MofError(c.file + ":" + std::to_string(c.line) + ": class " + c.name + " already declared at " +
                           it->second->file + ":" + std::to_string(it->second->line));
        d_->classes.push_back(std::make_unique<ClassDecl>(std::move(c)));
        d_->byName.emplace(d_->classes.back()->name, d_->classes.back().get());
    }
    d_->isResolved = false;
}

void ClassRepository::addFile(const std::string& path) {
    std::string text;
    std::string error;
    if (!Nx::File::read(path, text, error)) throw MofError(path + ":0: " + error);
    addText(text, path);
}

void ClassRepository::addPath(const std::string& path) {
    std::vector<std::string> files;
    if (!detail::filesAt(path, ".mof", true, files)) throw MofError(path + ":0: no such file or directory");
    for (const auto& f : files) addFile(f);
}

void ClassRepository::resolve() {
    auto where = [](const ClassDecl& c) { return c.file + ":" + std::to_string(c.line) + ": "; };
    for (const auto& c : d_->classes) {
        if (!c->superclass.empty() && !find(c->superclass))
            throw MofError(where(*c) + "superclass " + c->superclass + " of " + c->name + " is not declared");
        for (const auto& p : c->properties)
            if (p.type == CimType::Reference && !find(p.refClass))
                throw MofError(where(*c) + "reference " + c->name + "." + p.name + " names the undeclared class " +
                               p.refClass);
        for (const auto& m : c->methods)
            for (const auto& p : m.parameters)
                if (p.type == CimType::Reference && !find(p.refClass))
                    throw MofError(where(*c) + "parameter " + p.name + " of " + c->name + "." + m.name +
                                   " names the undeclared class " + p.refClass);
    }
    d_->resolved.clear();
    std::set<std::string> inProgress;
    std::function<const Data::Resolved&(const ClassDecl&)> build = [&](const ClassDecl& c) -> const Data::Resolved& {
        const std::string key = lower(c.name);
        auto done = d_->resolved.find(c.name);
        if (done != d_->resolved.end()) return done->second;
        if (!inProgress.insert(key).second) throw MofError(where(c) + "class " + c.name + " derives from itself");
        Data::Resolved r;
        r.decl = &c;
        if (!c.superclass.empty()) {
            const Data::Resolved& parent = build(*find(c.superclass));
            r.properties = parent.properties;
            r.methods = parent.methods;
            r.chain = parent.chain;
            r.association = parent.association;
        }
        r.chain.insert(r.chain.begin(), c.name);
        r.association = r.association || c.association;
        for (const auto& p : c.properties) {
            auto it = std::find_if(r.properties.begin(), r.properties.end(),
                                   [&](const PropertyDecl& q) { return equalsIgnoreCase(q.name, p.name); });
            if (it == r.properties.end()) {
                r.properties.push_back(p);
            } else {
                bool wasKey = it->key;
                *it = p;
                it->key = it->key || wasKey;
            }
        }
        for (const auto& m : c.methods) {
            auto it = std::find_if(r.methods.begin(), r.methods.end(),
                                   [&](const MethodDecl& q) { return equalsIgnoreCase(q.name, m.name); });
            if (it == r.methods.end())
                r.methods.push_back(m);
            else
                *it = m;
        }
        inProgress.erase(key);
        Data::Resolved& made = d_->resolved.emplace(c.name, std::move(r)).first->second;
        for (std::size_t i = 0; i < made.properties.size(); ++i) made.propertyAt.emplace(made.properties[i].name, i);
        return made;
    };
    for (const auto& c : d_->classes) build(*c);
    d_->isResolved = true;
}

const ClassDecl* ClassRepository::find(std::string_view cls) const {
    auto it = d_->byName.find(cls);
    return it == d_->byName.end() ? nullptr : it->second;
}

bool ClassRepository::isA(const std::string& cls, const std::string& parent) const {
    const Data::Resolved* r = d_->get(cls);
    if (!r) return false;
    for (const auto& c : r->chain)
        if (equalsIgnoreCase(c, parent)) return true;
    return false;
}

std::vector<std::string> ClassRepository::classNames() const {
    std::vector<std::string> names;
    for (const auto& c : d_->classes) names.push_back(c->name);
    std::sort(names.begin(), names.end());
    return names;
}

std::vector<std::string> ClassRepository::ancestry(const std::string& cls) const {
    const Data::Resolved* r = d_->get(cls);
    return r ? r->chain : std::vector<std::string>{};
}

const std::vector<PropertyDecl>& ClassRepository::properties(const std::string& cls) const {
    static const std::vector<PropertyDecl> none;
    const Data::Resolved* r = d_->get(cls);
    return r ? r->properties : none;
}

const PropertyDecl* ClassRepository::property(std::string_view cls, std::string_view name) const {
    return property(resolved(cls), name);
}

const ClassRepository::ResolvedClass* ClassRepository::resolved(std::string_view cls) const { return d_->get(cls); }

const PropertyDecl* ClassRepository::property(const ResolvedClass* cls, std::string_view name) const {
    if (!cls) return nullptr;
    auto it = cls->propertyAt.find(name);
    return it == cls->propertyAt.end() ? nullptr : &cls->properties[it->second];
}

const std::vector<MethodDecl>& ClassRepository::methods(const std::string& cls) const {
    static const std::vector<MethodDecl> none;
    const Data::Resolved* r = d_->get(cls);
    return r ? r->methods : none;
}

const MethodDecl* ClassRepository::method(const std::string& cls, const std::string& name) const {
    for (const auto& m : methods(cls))
        if (equalsIgnoreCase(m.name, name)) return &m;
    return nullptr;
}

std::vector<std::string> ClassRepository::keyNames(const std::string& cls) const {
    std::vector<std::string> keys;
    for (const auto& p : properties(cls))
        if (p.key) keys.push_back(p.name);
    return keys;
}

bool ClassRepository::isAssociation(const std::string& cls) const {
    const Data::Resolved* r = d_->get(cls);
    return r && r->association;
}

namespace {

// Plain text of a scalar element for re-reading as another type.
std::string plainText(const Element& e) {
    switch (e.index()) {
    case 1: return std::get<bool>(e) ? "true" : "false";
    case 2: return std::to_string(std::get<std::uint64_t>(e));
    case 3: return std::to_string(std::get<std::int64_t>(e));
    case 4: {
        std::ostringstream ss;
        ss.precision(17);
        ss << std::get<double>(e);
        return ss.str();
    }
    case 5: return std::get<std::string>(e);
    case 6: return std::get<ObjectPathPtr>(e)->toString();
    default: return "";
    }
}

}  // namespace

Value ClassRepository::convert(const Value& value, CimType type, bool array, const std::string& what) const {
    if (value.isNull()) return Value::null(type, array);
    if (value.isArray() != array)
        throw CimError(4, what + ": expected " + (array ? "an array" : "a single value") + " of " + typeName(type));
    auto one = [&](const Element& e) -> Element {
        if (e.index() == 0) return e;
        if (type == CimType::Reference) {
            ObjectPath p;
            if (e.index() == 6) {
                p = *std::get<ObjectPathPtr>(e);
            } else if (e.index() == 5) {
                try {
                    p = ObjectPath::parse(std::get<std::string>(e));
                } catch (const ParseError& err) {
                    throw CimError(4, what + ": " + err.what());
                }
            } else {
                throw CimError(4, what + ": expected a reference");
            }
            return std::make_shared<const ObjectPath>(exists(p.className) ? typedPath(p) : p);
        }
        if (type == CimType::Instance) {
            if (e.index() != 7) throw CimError(4, what + ": expected an embedded instance");
            return e;
        }
        if (type == CimType::String) return plainText(e);
        try {
            Value v = Value::parse(type, false, plainText(e));
            return v.elements()[0];
        } catch (const ParseError& err) {
            throw CimError(4, what + ": " + err.what());
        }
    };
    if (!array) {
        if (value.type() == type && type != CimType::Reference) return value;
        return Value::scalar(type, one(value.elements().at(0)));
    }
    if (value.type() == type && type != CimType::Reference) return value;
    std::vector<Element> out;
    for (const auto& e : value.elements()) out.push_back(one(e));
    return Value::array(type, std::move(out));
}

ObjectPath ClassRepository::typedPath(const ObjectPath& path) const {
    const ClassDecl* c = find(path.className);
    if (!c) throw CimError(5, "unknown class " + path.className);
    ObjectPath out(path.nameSpace, c->name);
    for (const auto& key : path.keys) {
        const PropertyDecl* p = property(c->name, key.first);
        if (!p) throw CimError(12, "class " + c->name + " has no property " + key.first);
        out.keys.set(p->name, convert(key.second, p->type, p->array, "key " + c->name + "." + p->name));
    }
    return out;
}

}  // namespace ipif
