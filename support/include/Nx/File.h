// Files the provider reads and rewrites.
#pragma once

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

    // Reads a whole file. False when it cannot be opened.
    static bool read(const std::string& path, std::string& content);

    // Replaces the file's content so that readers see either the old or the new file, never a torn
    // one, even if the process dies midway: the content goes to a sibling temporary file that is
    // flushed to disk and renamed over the target; the target's mode and owner are kept (0644 for a
    // new file). False, with the old file untouched, on any failure.
    static bool writeAtomically(const std::string& path, const std::string& content);

    // Read-modify-write under an exclusive lock shared by every thread and process that updates
    // the same path through this call, so no update is lost. edit receives the current content
    // (empty and exists=false when there is no file) and returns false to leave the file alone.
    // True when the edited content was written; false when edit declined or anything failed. The
    // lock is a hidden sibling ".<name>.lock" that stays in the directory.
    static bool update(const std::string& path,
                       const std::function<bool(std::string& content, bool exists)>& edit);

    // Tests only: called with the step name ("create", "write", "fsync", "rename") before each step
    // of writeAtomically; returning true makes that step fail as the system call would (a failed
    // "write" leaves a half-written temporary behind it first). nullptr removes the hook.
    using FailureHook = std::function<bool(const std::string& step)>;
    static void setFailureHook(FailureHook hook);
};

}  // namespace Nx
