// Files the provider reads and rewrites.
#pragma once

#include <sys/stat.h>

#include <cstddef>
#include <functional>
#include <string>

namespace Nx {

class File {
public:
    // A file-system path; kept narrow, built from wide or narrow text.
    class Path {
    public:
        Path() = default;
        explicit Path(const std::string& path) : path_(path) {}
        explicit Path(const std::wstring& path);
        const std::string& str() const { return path_; }

    private:
        std::string path_;
    };

    static bool exists(const std::wstring& path);
    static bool exists(const std::string& path);

    // The largest file read() accepts. Every text file we read (ifcfg, resolver, settings, host
    // model fixture, MOF, registration) is far smaller; the cap keeps a wrong path from eating memory.
    static constexpr std::size_t kMaxReadSize = std::size_t(16) << 20;

    // Reads a whole regular file of at most kMaxReadSize bytes. A symbolic link is followed to
    // wherever it points, since reading changes nothing and a host's resolv.conf is often a link
    // into /run, but only to a regular file: a FIFO would block and a device may never end. False
    // when the file cannot be read; error then says why ("not a regular file", "larger than ...",
    // or the system's reason). info, when given, receives the status of the file that was read.
    static bool read(const std::string& path, std::string& content);
    static bool read(const std::string& path, std::string& content, std::string& error, struct stat* info = nullptr);

    // Where a write may land. Host: the real path of the file's directory lies under IPIF_ROOT, or
    // under IPIF_DATA_DIR when that is set elsewhere (always true for the root "/"). Named: a file
    // the user named outright, such as the host model fixture, wherever it is.
    enum class Scope { Host, Named };

    // Replaces the file's content so that readers see either the old or the new file, never a torn
    // one, even if the process dies midway: the content goes to a sibling temporary file
    // ".<name>.XXXXXX" that is flushed to disk and renamed over the target; the target's mode and
    // owner are kept (0644 for a new file). A target that is a symbolic link is refused, not
    // written through nor replaced, and so is a path outside the scope (Host when not given).
    // Temporaries of the same target left by a killed writer are removed on the way. False, with
    // the old file untouched, on any failure or refusal.
    static bool writeAtomically(const std::string& path, const std::string& content, Scope scope = Scope::Host);

    // Read-modify-write under an exclusive lock shared by every thread and process that updates
    // the same path through this call, so no update is lost. edit receives the current content
    // (empty and exists=false when there is no file) and returns false to leave the file alone.
    // True when the edited content was written; false when edit declined, the write was refused
    // as writeAtomically refuses it, or anything failed. The lock is a hidden sibling
    // ".<name>.lock" that its holder removes again.
    static bool update(const std::string& path, const std::function<bool(std::string& content, bool exists)>& edit,
                       Scope scope = Scope::Host);

    // Tests only: called with the step name ("create", "write", "fsync", "rename") before each step
    // of writeAtomically; returning true makes that step fail as the system call would (a failed
    // "write" leaves a half-written temporary behind it first). nullptr removes the hook.
    using FailureHook = std::function<bool(const std::string& step)>;
    static void setFailureHook(FailureHook hook);
};

}  // namespace Nx
