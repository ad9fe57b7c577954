// The host's configuration files as the live backend reads and rewrites them: ifcfg-<interface>
// KEY=value files, the resolver configuration, and noticing when any of them changes.
#pragma once

#include <map>
#include <string>
#include <sys/types.h>
#include <vector>

namespace Nx {
namespace Live {

// KEY=value lines: the value of every key (the last assignment wins, as when sourced), unquoted as
// Nx::unquoteValue says (Nx/PropertyFile.h, where the quoting rule lives); blank lines and
// comments skipped.
std::map<std::string, std::string> parseAssignments(const std::string& content);

// Sets KEY=value in the content: the first assignment of the key is replaced and later ones are
// dropped; a key not yet assigned is appended. An empty value removes the key. Other lines are
// kept as they were. The value is written as it is: the caller quotes it (Nx::quoteValue).
std::string assign(const std::string& content, const std::string& key, const std::string& value);

struct ResolverConfig {
    std::vector<std::string> nameServers;
    std::vector<std::string> search;  // the last "search" line, as the resolver reads it
    std::string domain;               // the last "domain" line
};

ResolverConfig parseResolver(const std::string& content);

// Replaces the lines we own ("nameserver", "search", "domain") by the configuration: domain first,
// then search (the resolver takes the later of the two for its search list), then the name
// servers, where the first owned line stood (at the end when there was none). Comments, options
// and every other line are kept in order.
std::string rewriteResolver(const std::string& content, const ResolverConfig& config);

// The assignments of every ifcfg-<interface> file in the directory, by interface (the name's
// bytes as they stand in the file name).
std::map<std::string, std::map<std::string, std::string>> readInterfaceFiles(const std::string& directory);

// Creates the directory and its missing parents (mode 0755). False when it cannot.
bool makeDirectories(const std::string& path);

// Notices changes to files in a set of directories: inotify where the kernel offers it, otherwise
// (and for directories that do not exist yet) by comparing stat() results.
class ChangeWatch {
public:
    ChangeWatch();
    ~ChangeWatch();
    ChangeWatch(const ChangeWatch&) = delete;
    ChangeWatch& operator=(const ChangeWatch&) = delete;

    // Watches the directories from now on, and, without inotify, these files too. Changes before
    // this call are forgotten.
    void watch(const std::vector<std::string>& directories, const std::vector<std::string>& files);
    // True when something watched changed since watch() or the previous call.
    bool changed();

private:
    struct Stamp {
        std::string path;
        bool exists = false;
        long long seconds = 0;
        long nanoseconds = 0;
        ino_t inode = 0;
        off_t size = 0;
    };
    static Stamp stamp(const std::string& path);

    int fd_ = -1;
    std::map<std::string, int> watches_;  // directory -> watch descriptor
    std::vector<Stamp> stamps_;
};

}  // namespace Live
}  // namespace Nx
