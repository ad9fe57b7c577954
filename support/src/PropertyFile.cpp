#include "Nx/PropertyFile.h"

#include <cstring>

#include "Nx/String.h"

namespace Nx {
namespace {

const char* const kBlanks = " \t\r\n";

std::string trim(const std::string& text) {
    std::string::size_type first = text.find_first_not_of(kBlanks);
    if (first == std::string::npos) return std::string();
    std::string::size_type last = text.find_last_not_of(kBlanks);
    return text.substr(first, last - first + 1);
}

bool oneOf(const char* set, char c) { return c != '\0' && std::strchr(set, c) != nullptr; }

}  // namespace

bool isPlainValue(const std::string& value) {
    for (const char c : value) {
        const bool alnum = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9');
        if (!alnum && !oneOf(".:-_/%,@+", c)) return false;
    }
    return true;
}

bool quoteValue(const std::string& value, std::string& written) {
    if (value.find_first_of(std::string("\n\r\0", 3)) != std::string::npos) return false;
    if (isPlainValue(value)) {
        written = value;
        return true;
    }
    written = "'";
    for (const char c : value) {
        if (c == '\'')
            written += "'\\''";
        else
            written += c;
    }
    written += '\'';
    return true;
}

std::string unquoteValue(const std::string& text) {
    std::string value;
    for (std::string::size_type i = 0; i < text.size(); ++i) {
        if (text[i] == '\'') {
            const std::string::size_type close = text.find('\'', i + 1);
            if (close == std::string::npos) return text;
            value.append(text, i + 1, close - i - 1);
            i = close;
        } else if (text[i] == '"') {
            for (++i; i < text.size() && text[i] != '"'; ++i) {
                if (text[i] == '\\' && i + 1 < text.size() && oneOf("\"\\$`", text[i + 1])) ++i;
                value += text[i];
            }
            if (i == text.size()) return text;
        } else {
            if (text[i] == '\\' && i + 1 < text.size()) ++i;
            value += text[i];
        }
    }
    return value;
}

PropertyFile::PropertyFile(const File::Path& path) : path_(path) {}

PropertyFile::~PropertyFile() { close(); }

bool PropertyFile::open(unsigned long /*mode: reading is the only use*/) {
    close();
    std::string content;
    if (!File::read(path_.str(), content)) return false;
    std::string::size_type start = 0;
    while (start < content.size()) {
        std::string::size_type end = content.find('\n', start);
        if (end == std::string::npos) end = content.size();
        std::string line = trim(content.substr(start, end - start));
        start = end + 1;
        if (line.empty() || line[0] == '#') continue;
        std::string::size_type equals = line.find('=');
        if (equals == std::string::npos) continue;
        std::string key = trim(line.substr(0, equals));
        // The first occurrence wins, as a reader scanning from the top would find it.
        if (!key.empty()) values_.emplace(key, unquoteValue(trim(line.substr(equals + 1))));
    }
    open_ = true;
    return true;
}

std::wstring PropertyFile::getValue(const std::wstring& key) const {
    if (!open_) return std::wstring();
    auto found = values_.find(make_string(key));
    return found == values_.end() ? std::wstring() : make_wstring(found->second);
}

void PropertyFile::close() {
    values_.clear();
    open_ = false;
}

}  // namespace Nx
