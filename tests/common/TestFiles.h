// Scratch directories, scoped environment variables and whole-file access for tests.
#pragma once

#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

namespace testfiles {

// A fresh directory under the system's temporary directory, removed with its content.
class ScratchDir {
public:
    ScratchDir() {
        std::string pattern = (std::filesystem::temp_directory_path() / "ipif-test-XXXXXX").string();
        std::vector<char> name(pattern.begin(), pattern.end());
        name.push_back('\0');
        if (::mkdtemp(name.data()) == nullptr) throw std::runtime_error("mkdtemp failed");
        path_ = name.data();
    }
    ~ScratchDir() {
        std::error_code ignored;
        std::filesystem::remove_all(path_, ignored);
    }
    ScratchDir(const ScratchDir&) = delete;
    ScratchDir& operator=(const ScratchDir&) = delete;

    const std::string& path() const { return path_; }
    std::string file(const std::string& name) const { return path_ + "/" + name; }

private:
    std::string path_;
};

// Sets (or, with unset, removes) an environment variable for the scope.
class ScopedEnv {
public:
    ScopedEnv(const char* name, const std::string& value) : name_(name) {
        save();
        ::setenv(name, value.c_str(), 1);
    }
    ~ScopedEnv() {
        if (hadOld_)
            ::setenv(name_.c_str(), old_.c_str(), 1);
        else
            ::unsetenv(name_.c_str());
    }
    ScopedEnv(const ScopedEnv&) = delete;
    ScopedEnv& operator=(const ScopedEnv&) = delete;

private:
    void save() {
        if (const char* old = ::getenv(name_.c_str())) {
            hadOld_ = true;
            old_ = old;
        }
    }
    std::string name_;
    bool hadOld_ = false;
    std::string old_;
};

inline void writeFile(const std::string& path, const std::string& content) {
    std::ofstream out(path, std::ios::binary | std::ios::trunc);
    out << content;
    if (!out) throw std::runtime_error("cannot write " + path);
}

// The whole file; empty when it cannot be read.
inline std::string readFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::ostringstream content;
    content << in.rdbuf();
    return content.str();
}

inline bool fileExists(const std::string& path) { return std::filesystem::exists(path); }

// The texts of a log file's records, one per line, without the "<time> <level> <pid> " head.
inline std::string readLogTexts(const std::string& path) {
    std::istringstream in(readFile(path));
    std::string texts;
    for (std::string line; std::getline(in, line);) {
        size_t at = 0;
        for (int field = 0; field < 3 && at != std::string::npos; ++field) {
            at = line.find(' ', at);
            if (at != std::string::npos) ++at;
        }
        if (at == std::string::npos) throw std::runtime_error("log line without its head: " + line);
        texts += line.substr(at) + "\n";
    }
    return texts;
}

// What the embedded host loads for the project: the stand-ins for the DMTF parents, then the
// classes an object manager is given.
inline std::vector<std::string> projectMofPaths() {
    return {IPIF_SOURCE_DIR "/mof/embedded", IPIF_SOURCE_DIR "/mof"};
}

}  // namespace testfiles
