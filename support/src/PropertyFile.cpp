#include "Nx/PropertyFile.h"

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

std::string unquote(const std::string& value) {
    if (value.size() >= 2 && (value.front() == '"' || value.front() == '\'') && value.back() == value.front())
        return value.substr(1, value.size() - 2);
    return value;
}

}  // namespace

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
        if (!key.empty()) values_.emplace(key, unquote(trim(line.substr(equals + 1))));
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
