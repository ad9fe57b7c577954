// The fixture backend: the host model read from a hand-written text file (format in
// support/FIXTURES.md). Writes go back into the file, keeping its comments and layout: only the
// line of the written property is rewritten.
#include "Nx/FixtureBackend.h"

#include <sys/stat.h>

#include <cerrno>
#include <climits>
#include <cstdlib>
#include <map>
#include <mutex>
#include <utility>

#include "Nx/Exceptions.h"
#include "Nx/File.h"
#include "Nx/NodeLexicon.h"
#include "Nx/PlatformUtilities.h"
#include "Trace.h"

namespace Nx {
namespace HostModel {
namespace {

const std::string kComponent = "Tarvo.IPInterfaceProvider";

struct Token {
    std::string text;
    bool quoted = false;
    size_t end = 0;  // column just past the token
};

// One parsed line: indentation, tokens, and where a trailing comment (with the blanks before it)
// starts, so a rewritten property line keeps its comment.
struct Line {
    size_t indent = 0;
    std::vector<Token> tokens;
    size_t commentStart = std::string::npos;
};

[[noreturn]] void fail(const std::string& origin, size_t line, const std::string& reason) {
    throw InstrumentationException(origin + ":" + std::to_string(line) + ": " + reason);
}

Line splitLine(const std::string& text, const std::string& origin, size_t number) {
    Line line;
    size_t i = 0;
    while (i < text.size() && (text[i] == ' ' || text[i] == '\t')) {
        if (text[i] == '\t') fail(origin, number, "a tab in the indentation (indent with blanks)");
        ++i;
    }
    line.indent = i;
    while (i < text.size()) {
        char c = text[i];
        if (c == ' ' || c == '\t' || c == '\r') {
            ++i;
            continue;
        }
        if (c == '#') {
            size_t start = i;
            while (start > 0 && (text[start - 1] == ' ' || text[start - 1] == '\t')) --start;
            line.commentStart = start;
            break;
        }
        Token token;
        if (c == '"') {
            token.quoted = true;
            ++i;
            bool closed = false;
            while (i < text.size()) {
                char q = text[i++];
                if (q == '"') {
                    closed = true;
                    break;
                }
                if (q != '\\') {
                    token.text += q;
                    continue;
                }
                if (i >= text.size()) break;
                char escaped = text[i++];
                switch (escaped) {
                    case '"':
                    case '\\':
                        token.text += escaped;
                        break;
                    case 'n':
                        token.text += '\n';
                        break;
                    case 't':
                        token.text += '\t';
                        break;
                    default:
                        fail(origin, number, std::string("unknown escape \\") + escaped + " in a quoted text");
                }
            }
            if (!closed) fail(origin, number, "a quoted text is not closed");
            if (i < text.size() && text[i] != ' ' && text[i] != '\t' && text[i] != '\r' && text[i] != '#')
                fail(origin, number, "a quoted text must be followed by a blank");
        } else {
            while (i < text.size() && text[i] != ' ' && text[i] != '\t' && text[i] != '\r' && text[i] != '#') {
                if (text[i] == '"') fail(origin, number, "a quote inside an unquoted word");
                token.text += text[i++];
            }
        }
        token.end = i;
        line.tokens.push_back(std::move(token));
    }
    return line;
}

bool parseNumber(const std::string& text, unsigned int& value) {
    if (text.empty() || text[0] == '-' || text[0] == '+') return false;
    char* end = nullptr;
    errno = 0;
    unsigned long long parsed = std::strtoull(text.c_str(), &end, 0);
    if (errno != 0 || !end || *end != '\0' || parsed > UINT_MAX) return false;
    value = static_cast<unsigned int>(parsed);
    return true;
}

bool isWord(const Token& token, const char* word) { return !token.quoted && token.text == word; }

std::string quote(const std::string& text) {
    bool bare = !text.empty();
    for (char c : text)
        if (c == ' ' || c == '\t' || c == '"' || c == '#' || c == '\\' || c == '\n' || c == '\r') bare = false;
    if (bare) return text;
    std::string out = "\"";
    for (char c : text) {
        switch (c) {
            case '"':
                out += "\\\"";
                break;
            case '\\':
                out += "\\\\";
                break;
            case '\n':
                out += "\\n";
                break;
            case '\t':
                out += "\\t";
                break;
            default:
                out += c;
        }
    }
    return out + "\"";
}

const char* kindWord(PropertyValue::Kind kind) {
    switch (kind) {
        case PropertyValue::Kind::String:
            return "string";
        case PropertyValue::Kind::Unsigned:
            return "unsigned";
        case PropertyValue::Kind::StringList:
            return "list";
    }
    return "string";
}

std::string formatValue(const PropertyValue& value) {
    switch (value.kind) {
        case PropertyValue::Kind::String:
            return quote(value.text);
        case PropertyValue::Kind::Unsigned:
            return std::to_string(value.number);
        case PropertyValue::Kind::StringList: {
            std::string out;
            for (const std::string& item : value.list) {
                if (!out.empty()) out += ' ';
                out += quote(item);
            }
            return out;
        }
    }
    return std::string();
}

// A fixture file as text lines plus the tree they describe, with each property's line.
struct Document {
    struct PropertyLine {
        size_t line;       // index into lines
        std::string head;  // the line up to and including the kind word
        std::string tail;  // the trailing comment, with the blanks before it
    };
    std::vector<std::string> lines;
    bool finalNewline = true;
    Tree tree;
    std::map<std::pair<int, unsigned int>, PropertyLine> propertyLines;

    std::string render() const {
        std::string out;
        for (size_t i = 0; i < lines.size(); ++i) {
            out += lines[i];
            if (i + 1 < lines.size() || finalNewline) out += '\n';
        }
        return out;
    }
};

Document parseDocument(const std::string& text, const std::string& origin) {
    Document doc;
    std::string::size_type start = 0;
    while (start < text.size()) {
        std::string::size_type end = text.find('\n', start);
        if (end == std::string::npos) {
            doc.lines.push_back(text.substr(start));
            doc.finalNewline = false;
            break;
        }
        doc.lines.push_back(text.substr(start, end - start));
        start = end + 1;
    }

    std::vector<std::pair<size_t, int>> open;  // (indentation, node) from the root down
    bool haveRoot = false;
    for (size_t index = 0; index < doc.lines.size(); ++index) {
        const size_t number = index + 1;
        Line line = splitLine(doc.lines[index], origin, number);
        if (line.tokens.empty()) continue;
        while (!open.empty() && open.back().first >= line.indent) open.pop_back();
        const std::vector<Token>& t = line.tokens;

        if (isWord(t[0], "node")) {
            if (t.size() < 3 || t.size() > 4) fail(origin, number, "expected: node TYPE NAME [DESCRIPTION]");
            unsigned int type;
            if (!parseNumber(t[1].text, type)) fail(origin, number, "node type \"" + t[1].text + "\" is not a number");
            const std::string& name = t[2].text;
            if (name.empty() || name.find('/') != std::string::npos)
                fail(origin, number, "node name \"" + name + "\" is empty or holds a '/'");
            int parent = open.empty() ? -1 : open.back().second;
            if (parent < 0) {
                if (haveRoot) fail(origin, number, "a second top-level node (indent it under the system node)");
                haveRoot = true;
            } else {
                for (const Node& node : doc.tree.nodes)
                    if (node.parent == parent && node.name == name)
                        fail(origin, number, "a second node named \"" + name + "\" under the same parent");
            }
            int added = doc.tree.add(parent, type, name, t.size() == 4 ? t[3].text : std::string());
            open.emplace_back(line.indent, added);
            continue;
        }

        // [readonly] [unreadable] NUMBER KIND VALUE...
        if (open.empty()) fail(origin, number, "a property outside any node (indent it under its node)");
        PropertyValue value;
        size_t i = 0;
        for (; i < t.size(); ++i) {
            if (isWord(t[i], "readonly"))
                value.readOnly = true;
            else if (isWord(t[i], "unreadable"))
                value.readable = false;
            else if (isWord(t[i], "failing"))
                value.failing = true;
            else
                break;
        }
        if (i + 1 >= t.size()) fail(origin, number, "expected: [readonly] [unreadable] [failing] NUMBER KIND VALUE...");
        unsigned int property;
        if (t[i].quoted || !parseNumber(t[i].text, property))
            fail(origin, number, "expected \"node\" or a property number, found \"" + t[i].text + "\"");
        const Token& kind = t[i + 1];
        const size_t values = t.size() - (i + 2);
        if (isWord(kind, "string")) {
            if (values != 1) fail(origin, number, "a string property takes exactly one value (quote it if it has blanks)");
            value.kind = PropertyValue::Kind::String;
            value.text = t[i + 2].text;
        } else if (isWord(kind, "unsigned")) {
            if (values != 1 || !parseNumber(t[i + 2].text, value.number))
                fail(origin, number, "an unsigned property takes exactly one number from 0 to 4294967295");
            value.kind = PropertyValue::Kind::Unsigned;
        } else if (isWord(kind, "list")) {
            value.kind = PropertyValue::Kind::StringList;
            for (size_t v = i + 2; v < t.size(); ++v) value.list.push_back(t[v].text);
        } else {
            fail(origin, number, "unknown property kind \"" + kind.text + "\" (string, unsigned or list)");
        }
        const int owner = open.back().second;
        Node& node = doc.tree.nodes[static_cast<size_t>(owner)];
        if (!node.properties.emplace(property, value).second)
            fail(origin, number, "property " + std::to_string(property) + " given twice for node " + node.path);
        const std::string& raw = doc.lines[index];
        doc.propertyLines[{owner, property}] =
            Document::PropertyLine{index, raw.substr(0, kind.end),
                                   line.commentStart == std::string::npos ? std::string()
                                                                          : raw.substr(line.commentStart)};
    }
    return doc;
}

struct Stamp {
    dev_t device = 0;
    ino_t inode = 0;
    off_t size = -1;
    struct timespec modified = {0, 0};
    struct timespec changed = {0, 0};

    static Stamp of(const struct stat& info) {
        Stamp stamp;
        stamp.device = info.st_dev;
        stamp.inode = info.st_ino;
        stamp.size = info.st_size;
        stamp.modified = info.st_mtim;
        stamp.changed = info.st_ctim;
        return stamp;
    }
    bool operator==(const Stamp& other) const {
        return device == other.device && inode == other.inode && size == other.size &&
               modified.tv_sec == other.modified.tv_sec && modified.tv_nsec == other.modified.tv_nsec &&
               changed.tv_sec == other.changed.tv_sec && changed.tv_nsec == other.changed.tv_nsec;
    }
};

void logFailure(const std::string& text) {
    logRecord(kComponent, "FixtureBackend", NX_FILE, __LINE__, 6000,
              trace(NX_FILE, text.c_str(), __LINE__, FREE_MESSAGE));
}

class FixtureBackend : public Backend {
public:
    explicit FixtureBackend(std::string path) : path_(std::move(path)) {
        std::string error;
        if (!reload(&error)) throw InstrumentationException(error);
    }

    std::shared_ptr<const Tree> snapshot() override {
        std::lock_guard<std::mutex> lock(mutex_);
        std::string error;
        // Another process (or a person) may have changed the file: keep the last good picture when
        // the new one cannot be read.
        if (!reload(&error)) logFailure(error);
        return tree_;
    }

    bool write(const std::string& nodePath, unsigned int property, const PropertyValue& value) override {
        std::shared_ptr<const Tree> tree = snapshot();
        int index = tree->find(nodePath);
        if (index < 0) return false;
        const Node& node = tree->nodes[static_cast<size_t>(index)];
        if (node.type == NodeLexicon::SystemNode && property == NodeLexicon::AdminState &&
            value.kind == PropertyValue::Kind::Unsigned && value.number == 9) {
            auto found = node.properties.find(property);
            if (found != node.properties.end() && found->second.readOnly) return false;
            return PlatformUtilities::requestReboot();
        }

        bool written = false;
        try {
            // The fixture lies wherever the user keeps it, not under IPIF_ROOT.
            written = File::update(path_, [&](std::string& content, bool exists) {
                if (!exists) return false;
                Document doc = parseDocument(content, path_);
                int at = doc.tree.find(nodePath);
                if (at < 0) return false;
                Node& target = doc.tree.nodes[static_cast<size_t>(at)];
                auto found = target.properties.find(property);
                if (found == target.properties.end() || found->second.readOnly || found->second.kind != value.kind)
                    return false;
                const Document::PropertyLine& line = doc.propertyLines.at({at, property});
                doc.lines[line.line] = line.head + (value.kind == PropertyValue::Kind::StringList && value.list.empty()
                                                        ? std::string()
                                                        : " " + formatValue(value)) +
                                       line.tail;
                content = doc.render();
                return true;
            }, File::Scope::Named);
        } catch (const std::exception& error) {
            logFailure(error.what());
            return false;
        }
        if (written) {
            std::lock_guard<std::mutex> lock(mutex_);
            stamp_ = Stamp();  // the next snapshot reads the file we wrote
        }
        return written;
    }

    std::string describe() const override { return "fixture:" + path_; }

private:
    // Re-reads the file when it is not the one last read. Caller holds mutex_ (or is the constructor).
    bool reload(std::string* error) {
        struct stat info;
        if (tree_ && ::stat(path_.c_str(), &info) == 0 && Stamp::of(info) == stamp_) return true;
        // Stamp and content come from the same open file, so they always belong together.
        std::string content, reason;
        if (!File::read(path_, content, reason, &info)) {
            *error = path_ + ": cannot read the host model fixture: " + reason;
            return false;
        }
        const Stamp stamp = Stamp::of(info);
        if (tree_ && stamp == stamp_) return true;
        try {
            tree_ = std::make_shared<const Tree>(parseDocument(content, path_).tree);
        } catch (const std::exception& parseError) {
            *error = parseError.what();
            return false;
        }
        stamp_ = stamp;
        return true;
    }

    const std::string path_;
    std::mutex mutex_;
    std::shared_ptr<const Tree> tree_;
    Stamp stamp_;
};

}  // namespace

Tree parseFixture(const std::string& text, const std::string& origin) { return parseDocument(text, origin).tree; }

std::string formatFixture(const Tree& tree) {
    std::string out;
    std::vector<size_t> depth(tree.nodes.size(), 0);
    for (size_t i = 0; i < tree.nodes.size(); ++i) {
        const Node& node = tree.nodes[i];
        if (node.parent >= 0) depth[i] = depth[static_cast<size_t>(node.parent)] + 1;
        const std::string indent(depth[i] * 2, ' ');
        out += indent + "node " + std::to_string(node.type) + " " + quote(node.name);
        if (!node.description.empty()) out += " " + quote(node.description);
        out += '\n';
        for (const auto& [number, value] : node.properties) {
            out += indent + "  ";
            if (value.readOnly) out += "readonly ";
            if (!value.readable) out += "unreadable ";
            if (value.failing) out += "failing ";
            out += std::to_string(number) + " " + kindWord(value.kind);
            std::string text = formatValue(value);
            if (!text.empty()) out += " " + text;  // only an empty list has no value text
            out += '\n';
        }
    }
    return out;
}

std::shared_ptr<Backend> openFixtureBackend(const std::string& path) {
    // Keep working on the same file when the process later changes directory. Only the directory
    // is resolved: a fixture that is a link stays one, so writes refuse it rather than follow it.
    const std::string::size_type slash = path.rfind('/');
    const std::string directory = slash == std::string::npos ? "." : slash == 0 ? "/" : path.substr(0, slash);
    char resolved[PATH_MAX];
    if (::realpath(directory.c_str(), resolved) == nullptr) return std::make_shared<FixtureBackend>(path);
    const std::string base = path.substr(slash == std::string::npos ? 0 : slash + 1);
    return std::make_shared<FixtureBackend>(std::string(resolved) == "/" ? "/" + base : resolved + ("/" + base));
}

}  // namespace HostModel
}  // namespace Nx
