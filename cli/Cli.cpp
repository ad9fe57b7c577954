#include "Cli.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <iostream>
#include <memory>
#include <sstream>

#include "Nx/HostModel.h"
#include "Nx/String.h"
#include "TALog/TALogger.h"
#include "ipif/Host.h"

namespace ipif {
namespace cli {

namespace {

const char* kUsage =
    "usage: ipif [options] COMMAND ARGUMENTS\n"
    "\n"
    "Commands (PATH is [namespace:]Class.Key=\"value\",...; CLASS is [namespace:]Class):\n"
    "  ein CLASS                      enumerate instance names\n"
    "  ei  CLASS                      enumerate instances\n"
    "  gi  PATH                       get instance\n"
    "  mi  PATH Prop=value ...        modify instance (the keys of PATH plus the given properties)\n"
    "  ci  PATH Prop=value ...        create instance\n"
    "  di  PATH                       delete instance\n"
    "  eq  CLASS QUERY [LANGUAGE]     execute a query (language WQL by default)\n"
    "  ai  PATH [-ac C] [-rc C] [-r R] [-rr R]   associators\n"
    "  ain PATH [-ac C] [-rc C] [-r R] [-rr R]   associator names\n"
    "  ri  PATH [-rc C] [-r R]        references (-rc: the association class)\n"
    "  rin PATH [-rc C] [-r R]        reference names\n"
    "  cm  PATH METHOD [Arg=value ...]  call a method\n"
    "\n"
    "Values are typed from the MOF: numbers, true/false, strings (quotes optional), datetimes\n"
    "in CIM form (00000000000100.000000:000), references as paths, arrays comma-separated\n"
    "(a quoted element may hold commas). Name:type=value forces a type (uint32, string, ref,\n"
    "uint16[] ...), also for names the MOF does not declare.\n"
    "\n"
    "Options:\n"
    "  --json               JSON output instead of MOF-style text\n"
    "  --host-model SEL     host model for the providers (sets IPIF_HOST_MODEL, e.g. fixture:PATH)\n"
    "  --mof PATH           MOF file or directory (repeatable, or colon-separated)\n"
    "  --reg PATH           registration file or directory (repeatable, or colon-separated)\n"
    "  --namespace NS       default namespace (root/cimv2)\n"
    "  -ac, -rc, -r, -rr    association filters: assoc class, result class, role, result role\n"
    "  -h, --help           this text\n"
    "\n"
    "Output: instances as 'instance of Class { Prop = value; };', paths one per line, and for\n"
    "cm 'ReturnValue = N;' followed by one 'Name = value;' line per out argument. Control\n"
    "characters and bytes that are not UTF-8 are escaped (\\n, \\x1B; \\u001b in JSON).\n"
    "Exit status: 0 ok; 1 the command line, MOF, registrations or host model were rejected;\n"
    "2 the request failed with a CMPI status; 3 cm: the method returned a nonzero ReturnValue.\n"
    "Every error is one line on stderr; what a request produced is printed all the same.\n";

// An error with its exit code; rc < 0 means a plain usage message.
struct Failure {
    int exitCode;
    int rc;
    std::string message;
};

[[noreturn]] void usage(const std::string& msg) { throw Failure{1, -1, msg + " (see ipif --help)"}; }
[[noreturn]] void rejected(int rc, const std::string& msg) { throw Failure{1, rc, msg}; }

struct Options {
    bool json = false;
    std::string hostModel;
    bool hostModelSet = false;
    std::vector<std::string> mofs;
    std::vector<std::string> regs;
    std::string nameSpace;
    std::string assocClass, resultClass, role, resultRole;
    std::vector<std::string> positional;
    bool help = false;
};

Options parseOptions(const std::vector<std::string>& args) {
    Options o;
    bool endOfOptions = false;
    for (std::size_t i = 0; i < args.size(); ++i) {
        const std::string& a = args[i];
        if (endOfOptions || a.empty() || a[0] != '-' || a == "-") {
            o.positional.push_back(a);
            continue;
        }
        auto value = [&](const std::string& name) -> std::string {
            std::string prefix = name + "=";
            if (a.compare(0, prefix.size(), prefix) == 0) return a.substr(prefix.size());
            if (i + 1 >= args.size()) usage("option " + name + " needs a value");
            return args[++i];
        };
        auto is = [&](const std::string& name) { return a == name || a.compare(0, name.size() + 1, name + "=") == 0; };
        if (a == "--") {
            endOfOptions = true;
        } else if (a == "--json") {
            o.json = true;
        } else if (a == "-h" || a == "--help") {
            o.help = true;
        } else if (is("--host-model")) {
            o.hostModel = value("--host-model");
            o.hostModelSet = true;
        } else if (is("--mof")) {
            for (const auto& p : HostOptions::splitList(value("--mof"))) o.mofs.push_back(p);
        } else if (is("--reg")) {
            for (const auto& p : HostOptions::splitList(value("--reg"))) o.regs.push_back(p);
        } else if (is("--namespace")) {
            o.nameSpace = value("--namespace");
        } else if (is("-ac")) {
            o.assocClass = value("-ac");
        } else if (is("-rc")) {
            o.resultClass = value("-rc");
        } else if (is("-rr")) {
            o.resultRole = value("-rr");
        } else if (is("-r")) {
            o.role = value("-r");
        } else {
            usage("unknown option " + a);
        }
    }
    return o;
}

// ---- Output --------------------------------------------------------------------------------

// s with each control character (C0, DEL, C1), each character of extra and each byte that is
// not part of well-formed UTF-8 replaced by escape(value): the code point, or the byte itself.
template <class Escape>
void escapeInto(std::string& out, const std::string& s, const char* extra, Escape escape) {
    // Printable ASCII that is not in extra goes out as it stands, a run at a time (most text is
    // one run).
    const auto plain = [extra](unsigned char c) {
        return c >= 0x20 && c < 0x7F && (!*extra || !std::strchr(extra, c));
    };
    const char* const text = s.data();
    const std::size_t size = s.size();
    for (std::size_t i = 0; i < size;) {
        const std::size_t run = static_cast<std::size_t>(std::find_if_not(text + i, text + size, plain) - text);
        out.append(text + i, run - i);
        i = run;
        if (i == size) break;
        char32_t cp = 0;
        const std::size_t n = Nx::utf8Length(s, i, cp);
        if (n == 0) {
            out += escape(static_cast<unsigned char>(s[i]));
            ++i;
        } else if (cp <= 0x9F) {  // a control character, DEL, C1 or one of extra
            out += escape(cp);
            i += n;
        } else {
            out.append(text + i, n);
            i += n;
        }
    }
}

template <class Escape>
std::string escapeText(const std::string& s, const char* extra, Escape escape) {
    std::string out;
    escapeInto(out, s, extra, escape);
    return out;
}

// One escaped character or byte: \n, \t, \r, \" and \\, else \u00XX (JSON) or \xXX.
std::string escapeOne(std::uint32_t c, bool json) {
    if (c == '\n') return "\\n";
    if (c == '\t') return "\\t";
    if (c == '\r') return "\\r";
    if (c == '"' || c == '\\') return std::string("\\") + static_cast<char>(c);
    char buf[12];
    std::snprintf(buf, sizeof buf, json ? "\\u%04x" : "\\x%02X", static_cast<unsigned>(c));
    return buf;
}

// Text for the terminal: nothing from a host or the command line moves the cursor or starts a
// terminal sequence. \xHH as MOF strings spell it.
std::string printable(const std::string& s) {
    return escapeText(s, "", [](std::uint32_t c) { return escapeOne(c, false); });
}

void appendPrintable(std::string& out, const std::string& s) {
    escapeInto(out, s, "", [](std::uint32_t c) { return escapeOne(c, false); });
}

// Value::toText() made printable, without building toText's string for the common scalars:
// most of an enumeration's output is strings and numbers. A string that toText would not escape
// (no '"' or '\\'; control characters are escaped alike either way) is the string in quotes.
void appendValueText(std::string& out, const Value& v) {
    if (!v.isArray() && v.size() == 1) {
        const Element& e = v.elements()[0];
        if (e.index() == 5) {
            const std::string& s = std::get<std::string>(e);
            if (std::none_of(s.begin(), s.end(), [](char c) { return c == '"' || c == '\\'; })) {
                out += '"';
                appendPrintable(out, s);
                out += '"';
                return;
            }
        } else if ((e.index() == 2 && v.type() != CimType::Char16) || e.index() == 3) {
            char digits[24];
            const auto written = e.index() == 2 ? std::to_chars(digits, digits + sizeof digits, std::get<std::uint64_t>(e))
                                                : std::to_chars(digits, digits + sizeof digits, std::get<std::int64_t>(e));
            out.append(digits, written.ptr);
            return;
        }
    }
    appendPrintable(out, v.toText());
}

// A JSON string that is valid whatever the bytes: control characters are escaped, and a byte
// that is not part of well-formed UTF-8 becomes \u00XX, the code point of the same number (so
// "e\xff" reads back as "e\u00ff").
std::string jsonString(const std::string& s) {
    return "\"" + escapeText(s, "\"\\", [](std::uint32_t c) { return escapeOne(c, true); }) + "\"";
}

std::string jsonInstance(const Instance& inst);

std::string jsonElement(CimType type, const Element& e) {
    switch (e.index()) {
    case 0: return "null";
    case 1: return std::get<bool>(e) ? "true" : "false";
    case 2: return std::to_string(std::get<std::uint64_t>(e));
    case 3: return std::to_string(std::get<std::int64_t>(e));
    case 4: {
        double d = std::get<double>(e);
        if (!std::isfinite(d)) return jsonString(Value::real64(d).toText());
        char buf[64];
        std::snprintf(buf, sizeof buf, type == CimType::Real32 ? "%.9g" : "%.17g", d);
        return buf;
    }
    case 5: return jsonString(std::get<std::string>(e));
    case 6: return jsonString(std::get<ObjectPathPtr>(e)->toString());
    case 7: return jsonInstance(*std::get<InstancePtr>(e));
    }
    return "null";
}

std::string jsonValue(const Value& v) {
    if (v.isNull()) return "null";
    if (!v.isArray()) return v.elements().empty() ? "null" : jsonElement(v.type(), v.elements()[0]);
    std::string out = "[";
    for (std::size_t i = 0; i < v.elements().size(); ++i) {
        if (i) out += ", ";
        out += jsonElement(v.type(), v.elements()[i]);
    }
    return out + "]";
}

std::string jsonNamed(const NamedValues& values) {
    std::string out = "{";
    bool first = true;
    for (const auto& p : values) {
        out += first ? "" : ", ";
        first = false;
        out += jsonString(p.first) + ": " + jsonValue(p.second);
    }
    return out + "}";
}

std::string jsonInstance(const Instance& inst) {
    return "{\"class\": " + jsonString(inst.className()) + ", \"path\": " + jsonString(inst.path.toString()) +
           ", \"properties\": " + jsonNamed(inst.properties) + "}";
}

// Prints instances as the provider returns them, one write each; JSON output is one array.
class InstancePrinter {
public:
    InstancePrinter(bool json, std::ostream& out)
        : json_(json), out_(out), sink_([this](const Instance& inst) { print(inst); }) {}
    InstancePrinter(const InstancePrinter&) = delete;
    InstancePrinter& operator=(const InstancePrinter&) = delete;

    const InstanceSink* sink() const { return &sink_; }
    std::size_t count() const { return count_; }
    // Ends the output, also when nothing came.
    void close() {
        if (json_) out_ << (count_ ? "]\n" : "[]\n");
    }

private:
    void print(const Instance& inst) {
        if (json_) {
            text_.assign(count_ ? ",\n " : "[");
            text_ += jsonInstance(inst);
        } else {
            // Instance::toMof's layout, with names and values made printable.
            text_.assign(count_ ? "\ninstance of " : "instance of ");
            appendPrintable(text_, inst.className());
            text_ += " {\n";
            for (const auto& p : inst.properties) {
                text_ += "    ";
                appendPrintable(text_, p.first);
                text_ += " = ";
                appendValueText(text_, p.second);
                text_ += ";\n";
            }
            text_ += "};\n";
        }
        out_.write(text_.data(), static_cast<std::streamsize>(text_.size()));
        ++count_;
    }

    bool json_;
    std::ostream& out_;
    InstanceSink sink_;
    std::string text_;
    std::size_t count_ = 0;
};

void printPaths(const std::vector<ObjectPath>& paths, bool json, std::ostream& out) {
    if (json) {
        out << "[";
        for (std::size_t i = 0; i < paths.size(); ++i) out << (i ? ",\n " : "") << jsonString(paths[i].toString());
        out << "]\n";
        return;
    }
    for (const auto& p : paths) out << printable(p.toString()) << "\n";
}

// ---- Command arguments ---------------------------------------------------------------------

ObjectPath classArgument(Host& host, const std::string& text) {
    ObjectPath p;
    try {
        p = ObjectPath::parse(text);
    } catch (const ParseError& e) {
        rejected(4, e.what());
    }
    if (!p.keys.empty()) rejected(4, "expected a class name, not an instance path: " + text);
    const ClassDecl* c = host.classes().find(p.className);
    if (!c) rejected(5, "unknown class " + p.className);
    p.className = c->name;
    if (p.nameSpace.empty()) p.nameSpace = host.options().defaultNamespace;
    return p;
}

ObjectPath pathArgument(Host& host, const std::string& text) {
    try {
        return host.parsePath(text);
    } catch (const ParseError& e) {
        rejected(4, e.what());
    } catch (const CimError& e) {
        rejected(e.rc(), e.what());
    }
}

void checkFilterClass(Host& host, const std::string& cls, const char* option) {
    if (!cls.empty() && !host.classes().exists(cls)) rejected(5, std::string("unknown class ") + cls + " (" + option + ")");
}

struct Assignment {
    std::string name;
    bool typed = false;  // Name:type=value
    CimType type = CimType::String;
    bool array = false;
    std::string text;
};

Assignment assignment(const std::string& arg) {
    std::size_t eq = arg.find('=');
    if (eq == std::string::npos || eq == 0) usage("expected Name=value, got '" + arg + "'");
    Assignment a;
    a.name = arg.substr(0, eq);
    a.text = arg.substr(eq + 1);
    std::size_t colon = a.name.find(':');
    if (colon != std::string::npos) {
        std::string t = a.name.substr(colon + 1);
        a.name = a.name.substr(0, colon);
        if (t.size() > 2 && t.compare(t.size() - 2, 2, "[]") == 0) {
            a.array = true;
            t = t.substr(0, t.size() - 2);
        }
        if (equalsIgnoreCase(t, "ref") || equalsIgnoreCase(t, "reference")) a.type = CimType::Reference;
        else if (!parseTypeName(t, a.type)) usage("unknown type '" + t + "' in '" + arg + "'");
        a.typed = true;
    }
    if (a.name.empty()) usage("expected Name=value, got '" + arg + "'");
    return a;
}

Value typedValue(Host& host, const Assignment& a, CimType type, bool array) {
    try {
        Value v = Value::parse(type, array, a.text);
        if (type != CimType::Reference) return v;
        // References name other classes: give their keys the declared types too.
        if (!array) return Value::reference(host.classes().exists(v.asReference().className)
                                                ? host.classes().typedPath(v.asReference())
                                                : v.asReference());
        std::vector<Element> typed;
        for (const auto& e : v.elements()) {
            const ObjectPath& p = *std::get<ObjectPathPtr>(e);
            typed.emplace_back(std::make_shared<const ObjectPath>(
                host.classes().exists(p.className) ? host.classes().typedPath(p) : p));
        }
        return Value::array(type, std::move(typed));
    } catch (const ParseError& e) {
        rejected(4, a.name + ": " + e.what());
    } catch (const CimError& e) {
        rejected(e.rc(), a.name + ": " + e.what());
    }
}

Instance instanceArgument(Host& host, const ObjectPath& path, const std::vector<std::string>& args, std::size_t from) {
    Instance inst;
    inst.path = path;
    for (const auto& k : path.keys) inst.properties.set(k.first, k.second);
    for (std::size_t i = from; i < args.size(); ++i) {
        Assignment a = assignment(args[i]);
        if (a.typed) {
            inst.properties.set(a.name, typedValue(host, a, a.type, a.array));
            continue;
        }
        const PropertyDecl* p = host.classes().property(path.className, a.name);
        if (!p) rejected(12, "class " + path.className + " has no property " + a.name);
        inst.properties.set(p->name, typedValue(host, a, p->type, p->array));
    }
    return inst;
}

Args methodArguments(Host& host, const ObjectPath& path, const std::string& method,
                     const std::vector<std::string>& args, std::size_t from) {
    const MethodDecl* m = host.classes().method(path.className, method);
    Args in;
    for (std::size_t i = from; i < args.size(); ++i) {
        Assignment a = assignment(args[i]);
        if (a.typed) {
            in.set(a.name, typedValue(host, a, a.type, a.array));
        } else if (!m) {
            in.set(a.name, typedValue(host, a, CimType::String, false));
        } else {
            const ParameterDecl* p = m->parameter(a.name);
            if (!p) rejected(4, "method " + path.className + "." + m->name + " has no parameter " + a.name);
            in.set(p->name, typedValue(host, a, p->type, p->array));
        }
    }
    return in;
}

void need(const Options& o, std::size_t min, std::size_t max, const char* form) {
    std::size_t n = o.positional.size() - 1;
    if (n < min || n > max) usage(std::string("usage: ipif ") + form);
}

bool nonzeroInteger(const Value& v) {
    if (v.isNull() || v.isArray()) return false;
    const Element& e = v.elements()[0];
    return (e.index() == 2 && std::get<std::uint64_t>(e) != 0) || (e.index() == 3 && std::get<std::int64_t>(e) != 0);
}

// Prints what a request produced, then fails with its status when it has one.
void finish(const Result& r) {
    if (!r.ok()) throw Failure{2, r.rc, r.message};
}

// Runs one command against the host and prints what it produced.
void dispatch(Host& host, const Options& o, std::ostream& out) {
    const std::vector<std::string>& a = o.positional;
    const std::string& cmd = a[0];
    bool json = o.json;
    Result r;
    if (cmd == "ein" || cmd == "ei") {
        need(o, 1, 1, (cmd + " CLASS").c_str());
        ObjectPath c = classArgument(host, a[1]);
        if (cmd == "ein") {
            r = host.enumerateInstanceNames(c.nameSpace, c.className);
            printPaths(r.paths, json, out);
        } else {
            InstancePrinter printer(json, out);
            r = host.enumerateInstances(c.nameSpace, c.className, nullptr, printer.sink());
            printer.close();
        }
        finish(r);
    } else if (cmd == "gi") {
        need(o, 1, 1, "gi PATH");
        ObjectPath p = pathArgument(host, a[1]);
        InstancePrinter printer(json, out);
        r = host.getInstance(p, nullptr, printer.sink());
        printer.close();
        finish(r);
        if (!printer.count()) throw Failure{2, 6, "no instance matches " + p.toString()};
    } else if (cmd == "mi" || cmd == "ci") {
        need(o, cmd == "mi" ? 2 : 1, a.size(), (cmd + " PATH Prop=value ...").c_str());
        ObjectPath p = pathArgument(host, a[1]);
        Instance inst = instanceArgument(host, p, a, 2);
        if (cmd == "mi") {
            r = host.modifyInstance(p, inst);
            if (json) out << "{}\n";
        } else {
            r = host.createInstance(p, inst);
            printPaths(r.paths, json, out);
        }
        finish(r);
    } else if (cmd == "di") {
        need(o, 1, 1, "di PATH");
        r = host.deleteInstance(pathArgument(host, a[1]));
        if (json) out << "{}\n";
        finish(r);
    } else if (cmd == "eq") {
        need(o, 2, 3, "eq CLASS QUERY [LANGUAGE]");
        ObjectPath c = classArgument(host, a[1]);
        InstancePrinter printer(json, out);
        r = host.execQuery(c.nameSpace, c.className, a[2], a.size() > 3 ? a[3] : "WQL", printer.sink());
        printer.close();
        finish(r);
    } else if (cmd == "ai" || cmd == "ain") {
        need(o, 1, 1, (cmd + " PATH [-ac CLASS] [-rc CLASS] [-r ROLE] [-rr ROLE]").c_str());
        ObjectPath p = pathArgument(host, a[1]);
        checkFilterClass(host, o.assocClass, "-ac");
        checkFilterClass(host, o.resultClass, "-rc");
        if (cmd == "ai") {
            InstancePrinter printer(json, out);
            r = host.associators(p, o.assocClass, o.resultClass, o.role, o.resultRole, nullptr, printer.sink());
            printer.close();
        } else {
            r = host.associatorNames(p, o.assocClass, o.resultClass, o.role, o.resultRole);
            printPaths(r.paths, json, out);
        }
        finish(r);
    } else if (cmd == "ri" || cmd == "rin") {
        need(o, 1, 1, (cmd + " PATH [-rc ASSOCCLASS] [-r ROLE]").c_str());
        ObjectPath p = pathArgument(host, a[1]);
        if (!o.resultRole.empty()) usage("-rr does not apply to " + cmd);
        if (!o.assocClass.empty() && !o.resultClass.empty()) usage("give the association class once (-rc)");
        std::string assoc = o.resultClass.empty() ? o.assocClass : o.resultClass;
        checkFilterClass(host, assoc, "-rc");
        if (cmd == "ri") {
            InstancePrinter printer(json, out);
            r = host.references(p, assoc, o.role, nullptr, printer.sink());
            printer.close();
        } else {
            r = host.referenceNames(p, assoc, o.role);
            printPaths(r.paths, json, out);
        }
        finish(r);
    } else if (cmd == "cm") {
        need(o, 2, a.size(), "cm PATH METHOD [Arg=value ...]");
        ObjectPath p = pathArgument(host, a[1]);
        Args in = methodArguments(host, p, a[2], a, 3);
        r = host.invokeMethod(p, a[2], in);
        if (json) {
            out << "{\"ReturnValue\": " << (r.hasReturnValue ? jsonValue(r.returnValue) : "null")
                << ", \"outArgs\": " << jsonNamed(r.outArgs) << "}\n";
        } else {
            if (r.hasReturnValue) out << "ReturnValue = " << printable(r.returnValue.toText()) << ";\n";
            for (const auto& arg : r.outArgs)
                out << printable(arg.first) << " = " << printable(arg.second.toText()) << ";\n";
        }
        finish(r);
        if (r.hasReturnValue && nonzeroInteger(r.returnValue))
            throw Failure{3, -1, p.className + "." + a[2] + " returned " + r.returnValue.toText()};
    } else {
        usage("unknown command '" + cmd + "'");
    }
}

// The providers treat a host model they cannot open as a host with nothing on it; a command
// line that names one is refused instead.
void checkHostModel() {
    const char* selector = std::getenv("IPIF_HOST_MODEL");
    if (!selector || !*selector || std::string(selector) == "live") return;
    try {
        Nx::HostModel::open(selector);
    } catch (const std::exception& e) {
        throw Failure{1, -1, std::string("host model: ") + e.what()};
    }
}

int execute(const Options& o, std::ostream& out, std::ostream& err) {
    if (o.hostModelSet) setenv("IPIF_HOST_MODEL", o.hostModel.c_str(), 1);
    checkHostModel();
    // A provider inside an object manager can only report a bad log setting; a command can refuse it.
    if (std::string bad = TALog::TALogger::configurationError(); !bad.empty()) throw Failure{1, -1, bad};
    HostOptions ho;
    ho.mofPaths = o.mofs;
    ho.regPaths = o.regs;
    if (!o.nameSpace.empty()) ho.defaultNamespace = o.nameSpace;
    std::unique_ptr<Host> hostPtr;
    try {
        hostPtr = std::make_unique<Host>(ho);
    } catch (const std::exception& e) {
        throw Failure{1, -1, e.what()};
    }
    Host& host = *hostPtr;
    // Whatever the outcome, the wait below must come first.
    std::exception_ptr failed;
    try {
        dispatch(host, o, out);
    } catch (...) {
        failed = std::current_exception();
    }
    out.flush();
    // A provider may have left a detached thread finishing its work (a reboot request).
    long waitMs = 60000;
    if (const char* w = std::getenv("IPIF_THREAD_WAIT_MS")) waitMs = std::strtol(w, nullptr, 10);
    if (!host.waitForProviderThreads(std::chrono::milliseconds(waitMs)))
        err << "ipif: warning: provider threads still running after " << waitMs << " ms\n";
    if (failed) std::rethrow_exception(failed);
    return 0;
}

}  // namespace

int run(const std::vector<std::string>& args, std::ostream& out, std::ostream& err) {
    try {
        Options o = parseOptions(args);
        if (o.help) {
            out << kUsage;
            return 0;
        }
        if (o.positional.empty()) usage("no command given");
        return execute(o, out, err);
    } catch (const Failure& f) {
        out.flush();
        std::string msg = printable(f.message);
        if (f.rc < 0)
            err << "ipif: error: " << msg << "\n";
        else
            err << "ipif: error: rc " << f.rc << " (" << rcName(f.rc) << ")" << (msg.empty() ? "" : ": ") << msg
                << "\n";
        return f.exitCode;
    } catch (const std::exception& e) {
        out.flush();
        err << "ipif: error: " << printable(e.what()) << "\n";
        return 1;
    }
}

}  // namespace cli
}  // namespace ipif
