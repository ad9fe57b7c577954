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

// Notices changes to the configuration files by comparing stat() results: each watched directory
// (entries added, removed or renamed) and every file in it (edited in place), and single files
// (followed through links). No inotify: closing an inotify instance that holds watches waits for
// the kernel to retire them (milliseconds), which a one-request process pays at every exit.
class ChangeWatch {
public:
    // Watches from now on; changes before this call are forgotten.
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
        bool operator==(const Stamp& o) const {
            return exists == o.exists && seconds == o.seconds && nanoseconds == o.nanoseconds && inode == o.inode &&
                   size == o.size;
        }
    };
    // Stamps the path; returns the time (ns) of its latest change, 0 when it does not exist.
    long long add(const std::string& path);
    long long stampAll(const std::vector<std::string>& directories, const std::vector<std::string>& files);

    std::vector<Stamp> stamps_;
};

}  // namespace Live
}  // namespace Nx
