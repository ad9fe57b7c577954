#include "ipif/Value.h"

#include <cctype>
#include <cerrno>
#include <cinttypes>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <limits>

#include "TextFiles.h"

namespace ipif {

namespace {

struct TypeEntry {
    CimType type;
    const char* name;
};

const TypeEntry kTypes[] = {
    {CimType::Boolean, "boolean"}, {CimType::Char16, "char16"},     {CimType::Uint8, "uint8"},
    {CimType::Uint16, "uint16"},   {CimType::Uint32, "uint32"},     {CimType::Uint64, "uint64"},
    {CimType::Sint8, "sint8"},     {CimType::Sint16, "sint16"},     {CimType::Sint32, "sint32"},
    {CimType::Sint64, "sint64"},   {CimType::Real32, "real32"},     {CimType::Real64, "real64"},
    {CimType::String, "string"},   {CimType::DateTime, "datetime"}, {CimType::Reference, "ref"},
    {CimType::Instance, "instance"},
};

[[noreturn]] void wrongKind(const char* what) {
    throw std::logic_error(std::string("value is not ") + what);
}

std::uint64_t unsignedMax(CimType t) {
    switch (t) {
    case CimType::Uint8: return 0xFFu;
    case CimType::Uint16:
    case CimType::Char16: return 0xFFFFu;
    case CimType::Uint32: return 0xFFFFFFFFu;
    default: return std::numeric_limits<std::uint64_t>::max();
    }
}

std::int64_t signedMin(CimType t) {
    switch (t) {
    case CimType::Sint8: return -128;
    case CimType::Sint16: return -32768;
    case CimType::Sint32: return std::numeric_limits<std::int32_t>::min();
    default: return std::numeric_limits<std::int64_t>::min();
    }
}

std::int64_t signedMax(CimType t) {
    switch (t) {
    case CimType::Sint8: return 127;
    case CimType::Sint16: return 32767;
    case CimType::Sint32: return std::numeric_limits<std::int32_t>::max();
    default: return std::numeric_limits<std::int64_t>::max();
    }
}

bool elementFits(CimType type, const Element& e) {
    switch (e.index()) {
    case 0: return true;
    case 1: return type == CimType::Boolean;
    case 2: return isUnsigned(type) && std::get<std::uint64_t>(e) <= unsignedMax(type);
    case 3: return isSigned(type) && std::get<std::int64_t>(e) >= signedMin(type) &&
                   std::get<std::int64_t>(e) <= signedMax(type);
    case 4: return isReal(type);
    case 5: return isTextual(type);
    case 6: return type == CimType::Reference && std::get<ObjectPathPtr>(e) != nullptr;
    case 7: return type == CimType::Instance && std::get<InstancePtr>(e) != nullptr;
    }
    return false;
}

std::string realText(double v, CimType t) {
    if (std::isnan(v)) return "NaN";
    if (std::isinf(v)) return v < 0 ? "-Inf" : "Inf";
    char buf[64];
    std::snprintf(buf, sizeof buf, t == CimType::Real32 ? "%.9g" : "%.17g", v);
    return buf;
}

// Text of one element; quoted marks the form used in paths and MOF (strings in quotes).
std::string elementText(CimType type, const Element& e, bool mof) {
    switch (e.index()) {
    case 0: return "NULL";
    case 1: return std::get<bool>(e) ? "true" : "false";
    case 2: {
        std::uint64_t u = std::get<std::uint64_t>(e);
        if (type == CimType::Char16 && mof && u >= 0x20 && u < 0x7f && u != '\'' && u != '\\')
            return std::string("'") + static_cast<char>(u) + "'";
        return std::to_string(u);
    }
    case 3: return std::to_string(std::get<std::int64_t>(e));
    case 4: return realText(std::get<double>(e), type);
    case 5: return quote(std::get<std::string>(e), mof);
    case 6: return quote(std::get<ObjectPathPtr>(e)->toString(), mof);
    case 7: return quote(std::get<InstancePtr>(e)->path.toString(), mof);
    }
    return "";
}

bool elementsEqual(const Element& a, const Element& b) {
    if (a.index() != b.index()) return false;
    switch (a.index()) {
    case 6: return *std::get<ObjectPathPtr>(a) == *std::get<ObjectPathPtr>(b);
    case 7: {
        const Instance& x = *std::get<InstancePtr>(a);
        const Instance& y = *std::get<InstancePtr>(b);
        return x.path == y.path && x.properties.sameAs(y.properties);
    }
    default: return a == b;
    }
}

using detail::trim;

// Removes surrounding double quotes and resolves backslash escapes; text without quotes is
// returned as it is.
std::string unquoteLiteral(const std::string& text) {
    if (text.size() < 2 || text.front() != '"' || text.back() != '"') return text;
    std::string out;
    for (std::size_t i = 1; i + 1 < text.size(); ++i) {
        char c = text[i];
        if (c == '\\' && i + 2 < text.size()) {
            char n = text[++i];
            switch (n) {
            case 'n': out += '\n'; break;
            case 't': out += '\t'; break;
            case 'r': out += '\r'; break;
            default: out += n;
            }
        } else if (c == '"') {
            throw ParseError("unescaped quote inside " + text);
        } else {
            out += c;
        }
    }
    return out;
}

// Splits at commas that are outside double quotes.
std::vector<std::string> splitTopLevel(const std::string& text) {
    std::vector<std::string> parts;
    std::string cur;
    bool inQuote = false;
    for (std::size_t i = 0; i < text.size(); ++i) {
        char c = text[i];
        if (inQuote && c == '\\' && i + 1 < text.size()) {
            cur += c;
            cur += text[++i];
            continue;
        }
        if (c == '"') inQuote = !inQuote;
        if (c == ',' && !inQuote) {
            parts.push_back(cur);
            cur.clear();
        } else {
            cur += c;
        }
    }
    if (inQuote) throw ParseError("unterminated quote in " + text);
    parts.push_back(cur);
    return parts;
}

// Decimal, or hexadecimal with 0x; never octal, so "010" is ten.
int numberBase(const std::string& digits) {
    return digits.size() > 2 && digits[0] == '0' && (digits[1] == 'x' || digits[1] == 'X') ? 16 : 10;
}

bool parseUnsignedText(const std::string& s, std::uint64_t& out) {
    if (s.empty() || s[0] == '-' || s[0] == '+' || std::isspace(static_cast<unsigned char>(s[0])))
        return false;
    errno = 0;
    char* end = nullptr;
    unsigned long long v = std::strtoull(s.c_str(), &end, numberBase(s));
    if (errno != 0 || end == s.c_str() || *end != '\0') return false;
    out = v;
    return true;
}

bool parseSignedText(const std::string& s, std::int64_t& out) {
    if (s.empty() || std::isspace(static_cast<unsigned char>(s[0]))) return false;
    errno = 0;
    char* end = nullptr;
    const char* digits = s.c_str() + ((s[0] == '-' || s[0] == '+') ? 1 : 0);
    long long v = std::strtoll(s.c_str(), &end, numberBase(digits));
    if (errno != 0 || end == s.c_str() || *end != '\0') return false;
    out = v;
    return true;
}

bool parseRealText(const std::string& s, double& out) {
    if (s.empty()) return false;
    for (char c : s)
        if (!std::isdigit(static_cast<unsigned char>(c)) && c != '.' && c != '-' && c != '+' && c != 'e' && c != 'E')
            return false;
    errno = 0;
    char* end = nullptr;
    double v = std::strtod(s.c_str(), &end);
    if (errno == ERANGE || end == s.c_str() || *end != '\0') return false;
    out = v;
    return true;
}

bool validDateTime(const std::string& s) {
    if (s.size() != 25 || s[14] != '.') return false;
    char sign = s[21];
    if (sign != '+' && sign != '-' && sign != ':') return false;
    for (std::size_t i = 0; i < 25; ++i) {
        if (i == 14 || i == 21) continue;
        if (!std::isdigit(static_cast<unsigned char>(s[i])) && s[i] != '*') return false;
    }
    return true;
}

Element parseElement(CimType type, const std::string& raw) {
    std::string text = trim(raw);
    switch (type) {
    case CimType::Boolean: {
        std::string t = unquoteLiteral(text);
        if (equalsIgnoreCase(t, "true") || t == "1") return true;
        if (equalsIgnoreCase(t, "false") || t == "0") return false;
        throw ParseError("not a boolean: " + text);
    }
    case CimType::Char16: {
        std::string t = text;
        if (t.size() == 3 && t.front() == '\'' && t.back() == '\'') return std::uint64_t(static_cast<unsigned char>(t[1]));
        std::uint64_t u = 0;
        if (parseUnsignedText(t, u) && u <= 0xFFFF) return u;
        t = unquoteLiteral(t);
        if (t.size() == 1) return std::uint64_t(static_cast<unsigned char>(t[0]));
        throw ParseError("not a char16: " + text);
    }
    case CimType::Uint8:
    case CimType::Uint16:
    case CimType::Uint32:
    case CimType::Uint64: {
        std::uint64_t u = 0;
        if (!parseUnsignedText(unquoteLiteral(text), u)) throw ParseError("not an unsigned integer: " + text);
        if (u > unsignedMax(type))
            throw ParseError("out of range for " + std::string(typeName(type)) + ": " + text);
        return u;
    }
    case CimType::Sint8:
    case CimType::Sint16:
    case CimType::Sint32:
    case CimType::Sint64: {
        std::int64_t v = 0;
        if (!parseSignedText(unquoteLiteral(text), v)) throw ParseError("not an integer: " + text);
        if (v < signedMin(type) || v > signedMax(type))
            throw ParseError("out of range for " + std::string(typeName(type)) + ": " + text);
        return v;
    }
    case CimType::Real32:
    case CimType::Real64: {
        double d = 0;
        if (!parseRealText(unquoteLiteral(text), d)) throw ParseError("not a real number: " + text);
        return d;
    }
    case CimType::String: return unquoteLiteral(text.empty() ? raw : text);
    case CimType::DateTime: {
        std::string t = unquoteLiteral(text);
        if (!validDateTime(t))
            throw ParseError("not a CIM datetime (yyyymmddhhmmss.mmmmmm+utc or ddddddddhhmmss.mmmmmm:000): " + text);
        return t;
    }
    case CimType::Reference:
        return std::make_shared<const ObjectPath>(ObjectPath::parse(unquoteLiteral(text)));
    case CimType::Instance: throw ParseError("embedded instances cannot be written on the command line");
    }
    throw ParseError("unsupported type");
}

}  // namespace

const char* typeName(CimType type) {
    for (const auto& e : kTypes)
        if (e.type == type) return e.name;
    return "?";
}

bool parseTypeName(const std::string& word, CimType& type) {
    for (const auto& e : kTypes) {
        if (e.type == CimType::Reference || e.type == CimType::Instance) continue;
        if (equalsIgnoreCase(word, e.name)) {
            type = e.type;
            return true;
        }
    }
    return false;
}

bool isUnsigned(CimType t) {
    return t == CimType::Uint8 || t == CimType::Uint16 || t == CimType::Uint32 || t == CimType::Uint64 ||
           t == CimType::Char16;
}
bool isSigned(CimType t) {
    return t == CimType::Sint8 || t == CimType::Sint16 || t == CimType::Sint32 || t == CimType::Sint64;
}
bool isReal(CimType t) { return t == CimType::Real32 || t == CimType::Real64; }
bool isTextual(CimType t) { return t == CimType::String || t == CimType::DateTime; }

std::string rcName(int rc) {
    switch (rc) {
    case 0: return "CMPI_RC_OK";
    case 1: return "CMPI_RC_ERR_FAILED";
    case 2: return "CMPI_RC_ERR_ACCESS_DENIED";
    case 3: return "CMPI_RC_ERR_INVALID_NAMESPACE";
    case 4: return "CMPI_RC_ERR_INVALID_PARAMETER";
    case 5: return "CMPI_RC_ERR_INVALID_CLASS";
    case 6: return "CMPI_RC_ERR_NOT_FOUND";
    case 7: return "CMPI_RC_ERR_NOT_SUPPORTED";
    case 8: return "CMPI_RC_ERR_CLASS_HAS_CHILDREN";
    case 9: return "CMPI_RC_ERR_CLASS_HAS_INSTANCES";
    case 10: return "CMPI_RC_ERR_INVALID_SUPERCLASS";
    case 11: return "CMPI_RC_ERR_ALREADY_EXISTS";
    case 12: return "CMPI_RC_ERR_NO_SUCH_PROPERTY";
    case 13: return "CMPI_RC_ERR_TYPE_MISMATCH";
    case 14: return "CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED";
    case 15: return "CMPI_RC_ERR_INVALID_QUERY";
    case 16: return "CMPI_RC_ERR_METHOD_NOT_AVAILABLE";
    case 17: return "CMPI_RC_ERR_METHOD_NOT_FOUND";
    case 50: return "CMPI_RC_DO_NOT_UNLOAD";
    case 51: return "CMPI_RC_NEVER_UNLOAD";
    case 60: return "CMPI_RC_ERR_INVALID_HANDLE";
    case 61: return "CMPI_RC_ERR_INVALID_DATA_TYPE";
    case 100: return "CMPI_RC_ERROR_SYSTEM";
    case 200: return "CMPI_RC_ERROR";
    }
    return "CMPI_RC_" + std::to_string(rc);
}

std::size_t HashIgnoreCase::operator()(std::string_view name) const {
    // Eight bytes at a time, each with bit 5 set: every upper-case letter hashes as its lower-case
    // one (a few other characters do too, which costs a comparison, never a wrong answer).
    constexpr std::uint64_t kFold = 0x2020202020202020ull;
    std::uint64_t hash = 14695981039346656037ull ^ name.size();
    std::size_t at = 0;
    for (; at + 8 <= name.size(); at += 8) {
        std::uint64_t word;
        std::memcpy(&word, name.data() + at, 8);
        hash = (hash ^ (word | kFold)) * 1099511628211ull;
        hash ^= hash >> 29;
    }
    const std::size_t rest = name.size() - at;
    std::uint64_t tail = 0;
    std::memcpy(&tail, name.data() + at, rest);
    hash = (hash ^ (tail | (rest ? kFold >> (8 * (8 - rest)) : 0))) * 1099511628211ull;
    return static_cast<std::size_t>(hash ^ (hash >> 32));
}

std::string quote(const std::string& text, bool mof) {
    std::string out;
    out.reserve(text.size() + 2);
    out += '"';
    std::size_t plain = 0;  // where the run of characters copied as they are began
    for (std::size_t i = 0; i < text.size(); ++i) {
        const auto c = static_cast<unsigned char>(text[i]);
        if (c != '"' && c != '\\' && !(mof && c < 0x20)) continue;
        out.append(text, plain, i - plain);
        plain = i + 1;
        if (c == '"' || c == '\\') {
            out += '\\';
            out += static_cast<char>(c);
        } else if (c == '\n') {
            out += "\\n";
        } else if (c == '\t') {
            out += "\\t";
        } else if (c == '\r') {
            out += "\\r";
        } else {
            char buf[8];
            std::snprintf(buf, sizeof buf, "\\x%02X", c);
            out += buf;
        }
    }
    out.append(text, plain, std::string::npos);
    out += '"';
    return out;
}

// ---- Value ---------------------------------------------------------------------------------

Value::Value() = default;

Value Value::null(CimType type, bool array) {
    Value v;
    v.type_ = type;
    v.array_ = array;
    v.null_ = true;
    return v;
}

Value Value::boolean(bool b) { return scalar(CimType::Boolean, b); }

Value Value::char16(std::uint16_t c) { return fromUnsigned(CimType::Char16, c); }

Value Value::real32(float f) { return scalar(CimType::Real32, static_cast<double>(f)); }

Value Value::real64(double d) { return scalar(CimType::Real64, d); }

Value Value::fromUnsigned(CimType type, std::uint64_t u) {
    if (!isUnsigned(type)) throw std::logic_error("fromUnsigned needs an unsigned type");
    if (u > unsignedMax(type)) throw std::out_of_range(std::string("value out of range for ") + typeName(type));
    return scalar(type, u);
}

Value Value::fromSigned(CimType type, std::int64_t s) {
    if (!isSigned(type)) throw std::logic_error("fromSigned needs a signed type");
    if (s < signedMin(type) || s > signedMax(type))
        throw std::out_of_range(std::string("value out of range for ") + typeName(type));
    return scalar(type, s);
}

Value Value::string(std::string s) { return scalar(CimType::String, std::move(s)); }

Value Value::dateTime(std::string s) { return scalar(CimType::DateTime, std::move(s)); }

Value Value::reference(ObjectPath path) {
    return scalar(CimType::Reference, std::make_shared<const ObjectPath>(std::move(path)));
}

Value Value::instance(Instance inst) {
    return scalar(CimType::Instance, std::make_shared<const Instance>(std::move(inst)));
}

Value Value::array(CimType type, std::vector<Element> elements) {
    for (const auto& e : elements)
        if (!elementFits(type, e))
            throw std::logic_error(std::string("array element does not fit ") + typeName(type));
    Value v;
    v.type_ = type;
    v.array_ = true;
    v.null_ = false;
    v.elements_ = std::move(elements);
    return v;
}

Value Value::scalar(CimType type, Element element) {
    if (!elementFits(type, element)) throw std::logic_error(std::string("element does not fit ") + typeName(type));
    return Value(type, std::move(element));
}

bool Value::asBool() const {
    if (null_ || array_ || scalar_.index() != 1) wrongKind("a boolean");
    return std::get<bool>(scalar_);
}

std::uint64_t Value::asUnsigned() const {
    if (null_ || array_ || scalar_.index() != 2) wrongKind("unsigned");
    return std::get<std::uint64_t>(scalar_);
}

std::int64_t Value::asSigned() const {
    if (null_ || array_ || scalar_.index() != 3) wrongKind("signed");
    return std::get<std::int64_t>(scalar_);
}

double Value::asReal() const {
    if (null_ || array_ || scalar_.index() != 4) wrongKind("a real");
    return std::get<double>(scalar_);
}

const std::string& Value::asString() const {
    if (null_ || array_ || scalar_.index() != 5) wrongKind("text");
    return std::get<std::string>(scalar_);
}

const ObjectPath& Value::asReference() const {
    if (null_ || array_ || scalar_.index() != 6) wrongKind("a reference");
    return *std::get<ObjectPathPtr>(scalar_);
}

const Instance& Value::asInstance() const {
    if (null_ || array_ || scalar_.index() != 7) wrongKind("an instance");
    return *std::get<InstancePtr>(scalar_);
}

std::string Value::toText() const {
    if (null_) return "NULL";
    if (!array_) return scalar_.index() == 0 ? "NULL" : elementText(type_, scalar_, true);
    std::string out = "{";
    for (std::size_t i = 0; i < elements_.size(); ++i) {
        if (i) out += ", ";
        out += elementText(type_, elements_[i], true);
    }
    return out + "}";
}

Value Value::parse(CimType type, bool array, const std::string& text) {
    if (!array) {
        if (type == CimType::String) return Value::string(unquoteLiteral(text));
        Value v;
        v.type_ = type;
        v.null_ = false;
        v.scalar_ = parseElement(type, text);
        return v;
    }
    std::string body = trim(text);
    if (body.size() >= 2 && body.front() == '{' && body.back() == '}') body = trim(body.substr(1, body.size() - 2));
    std::vector<Element> elements;
    if (!body.empty())
        for (const auto& part : splitTopLevel(body)) elements.push_back(parseElement(type, part));
    return Value::array(type, std::move(elements));
}

bool Value::operator==(const Value& other) const {
    if (type_ != other.type_ || array_ != other.array_ || null_ != other.null_) return false;
    if (null_) return true;
    const ElementRange mine = elements(), theirs = other.elements();
    if (mine.size() != theirs.size()) return false;
    for (std::size_t i = 0; i < mine.size(); ++i)
        if (!elementsEqual(mine[i], theirs[i])) return false;
    return true;
}

// ---- NamedValues ---------------------------------------------------------------------------

const Value* NamedValues::find(std::string_view name) const {
    for (const auto& item : items_)
        if (equalsIgnoreCase(item.first, name)) return &item.second;
    return nullptr;
}

Value* NamedValues::find(std::string_view name) {
    return const_cast<Value*>(static_cast<const NamedValues*>(this)->find(name));
}

void NamedValues::set(std::string_view name, const Value& value) { set(name, Value(value)); }

void NamedValues::set(std::string_view name, Value&& value) {
    if (Value* v = find(name)) {
        *v = std::move(value);
        return;
    }
    items_.emplace_back(name, std::move(value));
}

bool NamedValues::erase(std::string_view name) {
    for (auto it = items_.begin(); it != items_.end(); ++it)
        if (equalsIgnoreCase(it->first, name)) {
            items_.erase(it);
            return true;
        }
    return false;
}

bool NamedValues::sameAs(const NamedValues& other) const {
    if (items_.size() != other.items_.size()) return false;
    for (const auto& item : items_) {
        const Value* v = other.find(item.first);
        if (!v || !(*v == item.second)) return false;
    }
    return true;
}

// ---- ObjectPath ----------------------------------------------------------------------------

std::string ObjectPath::toStringWithoutNamespace() const {
    std::string out = className;
    bool first = true;
    for (const auto& key : keys) {
        out += first ? "." : ",";
        first = false;
        out += key.first;
        out += '=';
        const Value& v = key.second;
        if (v.isNull() || v.elements().empty())
            out += "\"\"";
        else
            out += elementText(v.type(), v.elements()[0], false);
    }
    return out;
}

std::string ObjectPath::toString() const {
    if (nameSpace.empty()) return toStringWithoutNamespace();
    return nameSpace + ":" + toStringWithoutNamespace();
}

namespace {

class PathParser {
public:
    explicit PathParser(const std::string& text) : s_(text) {}

    ObjectPath parse() {
        ObjectPath path;
        // A namespace is everything before a ':' that comes ahead of the first '.', '=' or quote.
        std::size_t colon = std::string::npos;
        for (std::size_t i = 0; i < s_.size(); ++i) {
            char c = s_[i];
            if (c == '.' || c == '=' || c == '"') break;
            if (c == ':') {
                colon = i;
                break;
            }
        }
        if (colon != std::string::npos) {
            path.nameSpace = s_.substr(0, colon);
            if (path.nameSpace.empty()) fail(0, "empty namespace before ':'");
            for (char c : path.nameSpace)
                if (std::isspace(static_cast<unsigned char>(c))) fail(0, "white space in namespace");
            pos_ = colon + 1;
        }
        path.className = identifier("class name");
        if (pos_ == s_.size()) return path;
        if (s_[pos_] != '.') fail(pos_, "expected '.' after the class name");
        ++pos_;
        while (true) {
            std::string name = identifier("key name");
            if (pos_ >= s_.size() || s_[pos_] != '=') fail(pos_, "expected '=' after key " + name);
            ++pos_;
            Value v = keyValue();
            if (path.keys.find(name)) fail(pos_, "key " + name + " given twice");
            path.keys.set(name, std::move(v));
            if (pos_ == s_.size()) break;
            if (s_[pos_] != ',') fail(pos_, "expected ',' between keys");
            ++pos_;
        }
        return path;
    }

private:
    [[noreturn]] void fail(std::size_t at, const std::string& what) {
        throw ParseError("bad object path '" + s_ + "' at offset " + std::to_string(at) + ": " + what);
    }

    std::string identifier(const char* what) {
        std::size_t start = pos_;
        while (pos_ < s_.size() &&
               (std::isalnum(static_cast<unsigned char>(s_[pos_])) || s_[pos_] == '_'))
            ++pos_;
        if (pos_ == start) fail(start, std::string("expected a ") + what);
        if (std::isdigit(static_cast<unsigned char>(s_[start]))) fail(start, std::string("a ") + what + " cannot start with a digit");
        return s_.substr(start, pos_ - start);
    }

    Value keyValue() {
        if (pos_ < s_.size() && s_[pos_] == '"') {
            ++pos_;
            std::string out;
            while (true) {
                if (pos_ >= s_.size()) fail(pos_, "unterminated quoted value");
                char c = s_[pos_++];
                if (c == '"') break;
                if (c == '\\') {
                    if (pos_ >= s_.size()) fail(pos_, "unterminated escape");
                    out += s_[pos_++];
                } else {
                    out += c;
                }
            }
            return Value::string(std::move(out));
        }
        std::size_t start = pos_;
        while (pos_ < s_.size() && s_[pos_] != ',') ++pos_;
        std::string word = s_.substr(start, pos_ - start);
        if (word.empty()) fail(start, "missing key value");
        if (equalsIgnoreCase(word, "true")) return Value::boolean(true);
        if (equalsIgnoreCase(word, "false")) return Value::boolean(false);
        std::uint64_t u = 0;
        if (parseUnsignedText(word, u)) return Value::uint64(u);
        std::int64_t i = 0;
        if (parseSignedText(word, i)) return Value::sint64(i);
        double d = 0;
        if (parseRealText(word, d)) return Value::real64(d);
        for (char c : word)
            if (c == '"' || c == '=' || std::isspace(static_cast<unsigned char>(c)))
                fail(start, "unquoted key value '" + word + "' (quote values holding spaces, quotes or '=')");
        return Value::string(word);
    }

    const std::string& s_;
    std::size_t pos_ = 0;
};

}  // namespace

ObjectPath ObjectPath::parse(const std::string& text) { return PathParser(text).parse(); }

bool ObjectPath::operator==(const ObjectPath& other) const {
    if (!nameSpace.empty() && !other.nameSpace.empty() && !equalsIgnoreCase(nameSpace, other.nameSpace))
        return false;
    return equalsIgnoreCase(className, other.className) && keys.sameAs(other.keys);
}

// ---- Instance ------------------------------------------------------------------------------

std::string Instance::toMof() const {
    std::string out = "instance of " + path.className + " {\n";
    for (const auto& p : properties) {
        out += "    ";
        out += p.first;
        out += " = ";
        out += p.second.toText();
        out += ";\n";
    }
    out += "};\n";
    return out;
}

}  // namespace ipif
