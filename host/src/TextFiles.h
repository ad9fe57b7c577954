// Finding the host's text inputs (MOF and registration files), which Nx::File::read reads. Not
// installed; host sources only.
#pragma once

#include <dirent.h>
#include <sys/stat.h>

#include <algorithm>
#include <cctype>
#include <string>
#include <vector>

#include "Nx/File.h"
#include "ipif/Value.h"

namespace ipif {
namespace detail {

inline std::string trim(const std::string& s) {
    std::size_t b = 0, e = s.size();
    while (b < e && std::isspace(static_cast<unsigned char>(s[b]))) ++b;
    while (e > b && std::isspace(static_cast<unsigned char>(s[e - 1]))) --e;
    return s.substr(b, e - b);
}

// The files a path names: the path itself, or a directory's entries whose names end in suffix
// (in any case when ignoreCase), sorted. False when the path does not exist.
inline bool filesAt(const std::string& path, const std::string& suffix, bool ignoreCase,
                    std::vector<std::string>& files) {
    struct stat st {};
    if (stat(path.c_str(), &st) != 0) return false;
    if (!S_ISDIR(st.st_mode)) {
        files.push_back(path);
        return true;
    }
    if (DIR* dir = opendir(path.c_str())) {
        while (dirent* e = readdir(dir)) {
            std::string n = e->d_name;
            if (n.size() <= suffix.size()) continue;
            std::string end = n.substr(n.size() - suffix.size());
            if (ignoreCase ? equalsIgnoreCase(end, suffix) : end == suffix) files.push_back(path + "/" + n);
        }
        closedir(dir);
    }
    std::sort(files.begin(), files.end());
    return true;
}

}  // namespace detail
}  // namespace ipif
