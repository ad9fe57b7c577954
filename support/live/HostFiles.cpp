#include "HostFiles.h"

#include <algorithm>
#include <cerrno>
#include <ctime>
#include <dirent.h>
#include <sstream>
#include <sys/stat.h>
#include <unistd.h>

#include "Nx/File.h"
#include "Nx/PropertyFile.h"

namespace Nx {
namespace Live {

namespace {

const char* const kBlanks = " \t\r";

std::vector<std::string> splitLines(const std::string& content) {
    std::vector<std::string> lines;
    std::size_t start = 0;
    while (start < content.size()) {
        std::size_t end = content.find('\n', start);
        if (end == std::string::npos) end = content.size();
        lines.push_back(content.substr(start, end - start));
        start = end + 1;
    }
    return lines;
}

std::string joinLines(const std::vector<std::string>& lines) {
    std::string content;
    for (const std::string& line : lines) content += line + "\n";
    return content;
}

std::vector<std::string> words(const std::string& line) {
    std::vector<std::string> result;
    std::istringstream in(line);
    for (std::string word; in >> word;) result.push_back(word);
    return result;
}

// The key a KEY=value line assigns, empty for comments and other lines.
std::string assignedKey(const std::string& line) {
    const std::size_t start = line.find_first_not_of(kBlanks);
    if (start == std::string::npos || line[start] == '#') return std::string();
    const std::size_t equals = line.find('=', start);
    if (equals == std::string::npos) return std::string();
    const std::string key = line.substr(start, equals - start);
    return key.find_first_of(kBlanks) == std::string::npos ? key : std::string();
}

// The resolver keyword a line starts with, for the lines we own.
bool isOwnedResolverLine(const std::string& line) {
    const std::vector<std::string> w = words(line);
    return !w.empty() && (w[0] == "nameserver" || w[0] == "search" || w[0] == "domain");
}

}  // namespace

std::map<std::string, std::string> parseAssignments(const std::string& content) {
    std::map<std::string, std::string> values;
    for (const std::string& line : splitLines(content)) {
        const std::string key = assignedKey(line);
        if (key.empty()) continue;
        std::string value = line.substr(line.find('=') + 1);
        const std::size_t end = value.find_last_not_of(kBlanks);
        value.erase(end == std::string::npos ? 0 : end + 1);
        values[key] = unquoteValue(value);
    }
    return values;
}

std::string assign(const std::string& content, const std::string& key, const std::string& value) {
    std::vector<std::string> lines;
    bool done = false;
    for (std::string& line : splitLines(content)) {
        if (assignedKey(line) != key) {
            lines.push_back(std::move(line));
        } else if (!done) {
            if (!value.empty()) lines.push_back(key + "=" + value);
            done = true;
        }
    }
    if (!done && !value.empty()) lines.push_back(key + "=" + value);
    return joinLines(lines);
}

ResolverConfig parseResolver(const std::string& content) {
    ResolverConfig config;
    for (const std::string& line : splitLines(content)) {
        std::vector<std::string> w = words(line);
        if (w.size() < 2) continue;
        if (w[0] == "nameserver") {
            config.nameServers.push_back(w[1]);
        } else if (w[0] == "search") {
            config.search.assign(w.begin() + 1, w.end());
        } else if (w[0] == "domain") {
            config.domain = w[1];
        }
    }
    return config;
}

std::string rewriteResolver(const std::string& content, const ResolverConfig& config) {
    std::vector<std::string> owned;
    if (!config.domain.empty()) owned.push_back("domain " + config.domain);
    if (!config.search.empty()) {
        std::string line = "search";
        for (const std::string& suffix : config.search) line += " " + suffix;
        owned.push_back(line);
    }
    for (const std::string& server : config.nameServers) owned.push_back("nameserver " + server);

    std::vector<std::string> lines;
    std::size_t insertAt = std::string::npos;
    for (std::string& line : splitLines(content)) {
        if (isOwnedResolverLine(line)) {
            if (insertAt == std::string::npos) insertAt = lines.size();
        } else {
            lines.push_back(std::move(line));
        }
    }
    if (insertAt == std::string::npos) insertAt = lines.size();
    lines.insert(lines.begin() + static_cast<std::ptrdiff_t>(insertAt), owned.begin(), owned.end());
    return joinLines(lines);
}

std::map<std::string, std::map<std::string, std::string>> readInterfaceFiles(const std::string& directory) {
    std::map<std::string, std::map<std::string, std::string>> result;
    DIR* dir = ::opendir(directory.c_str());
    if (!dir) return result;
    while (const dirent* entry = ::readdir(dir)) {
        const std::string name = entry->d_name;
        if (name.compare(0, 6, "ifcfg-") != 0 || name.size() == 6) continue;
        std::string content;
        if (File::read(directory + "/" + name, content)) result[name.substr(6)] = parseAssignments(content);
    }
    ::closedir(dir);
    return result;
}

bool makeDirectories(const std::string& path) {
    struct stat info {};
    if (::stat(path.c_str(), &info) == 0) return S_ISDIR(info.st_mode);
    const std::size_t slash = path.find_last_of('/', path.size() > 1 ? path.size() - 2 : 0);
    if (slash != std::string::npos && slash > 0 && !makeDirectories(path.substr(0, slash))) return false;
    return ::mkdir(path.c_str(), 0755) == 0 || errno == EEXIST;
}

namespace {

// File times come from a clock that advances in ticks of a few milliseconds: a second change
// within the tick of a stamp would leave the stamp as it is.
constexpr long long kTickNs = 20 * 1000 * 1000;

long long nanoseconds(const struct timespec& t) { return t.tv_sec * 1000000000LL + t.tv_nsec; }

long long realtimeNs() {
    struct timespec now {};
    ::clock_gettime(CLOCK_REALTIME, &now);
    return nanoseconds(now);
}

}  // namespace

long long ChangeWatch::add(const std::string& path) {
    Stamp s;
    s.path = path;
    struct stat info {};
    long long latest = 0;
    if (::stat(path.c_str(), &info) == 0) {
        s.exists = true;
        s.seconds = info.st_mtim.tv_sec;
        s.nanoseconds = info.st_mtim.tv_nsec;
        s.inode = info.st_ino;
        s.size = info.st_size;
        latest = std::max(nanoseconds(info.st_mtim), nanoseconds(info.st_ctim));
    }
    stamps_.push_back(std::move(s));
    return latest;
}

long long ChangeWatch::stampAll(const std::vector<std::string>& directories, const std::vector<std::string>& files) {
    stamps_.clear();
    long long latest = 0;
    for (const std::string& directory : directories) {
        latest = std::max(latest, add(directory));
        DIR* dir = ::opendir(directory.c_str());
        if (!dir) continue;
        while (const dirent* entry = ::readdir(dir)) {
            const std::string name = entry->d_name;
            if (name != "." && name != "..") latest = std::max(latest, add(directory + "/" + name));
        }
        ::closedir(dir);
    }
    for (const std::string& path : files) latest = std::max(latest, add(path));
    return latest;
}

void ChangeWatch::watch(const std::vector<std::string>& directories, const std::vector<std::string>& files) {
    const long long latest = stampAll(directories, files);
    // Something changed within the current tick: let the tick pass and stamp again, so that any
    // later change, even one right after the caller's reading, carries a newer time.
    const long long wait = latest + kTickNs - realtimeNs();
    if (wait > 0 && wait <= kTickNs) {
        struct timespec pause {0, static_cast<long>(wait)};
        while (::nanosleep(&pause, &pause) != 0 && errno == EINTR) {
        }
        stampAll(directories, files);
    }
}

bool ChangeWatch::changed() {
    const std::vector<Stamp> before = std::move(stamps_);
    stamps_.clear();
    bool result = false;
    for (const Stamp& was : before) {
        add(was.path);
        result = result || !(stamps_.back() == was);
    }
    return result;
}

}  // namespace Live
}  // namespace Nx
