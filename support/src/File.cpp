#include "Nx/File.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <cstdlib>
#include <mutex>
#include <vector>

#include "Nx/String.h"

namespace Nx {
namespace {

// Owns a descriptor.
class Descriptor {
public:
    explicit Descriptor(int fd = -1) : fd_(fd) {}
    ~Descriptor() { reset(); }
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;
    int get() const { return fd_; }
    explicit operator bool() const { return fd_ >= 0; }
    void reset(int fd = -1) {
        if (fd_ >= 0) ::close(fd_);
        fd_ = fd;
    }
    // Closes and reports whether the close succeeded (a failed close may mean lost data).
    bool close() {
        int fd = fd_;
        fd_ = -1;
        return fd < 0 || ::close(fd) == 0;
    }

private:
    int fd_;
};

// Removes a temporary file unless it was renamed into place.
class TemporaryName {
public:
    explicit TemporaryName(std::string name) : name_(std::move(name)) {}
    ~TemporaryName() {
        if (!name_.empty()) ::unlink(name_.c_str());
    }
    TemporaryName(const TemporaryName&) = delete;
    TemporaryName& operator=(const TemporaryName&) = delete;
    const std::string& name() const { return name_; }
    void release() { name_.clear(); }

private:
    std::string name_;
};

std::mutex hookMutex;
File::FailureHook failureHook;

File::FailureHook currentHook() {
    std::lock_guard<std::mutex> lock(hookMutex);
    return failureHook;
}

bool injected(const File::FailureHook& hook, const char* step) {
    if (hook && hook(step)) {
        errno = EIO;
        return true;
    }
    return false;
}

void splitPath(const std::string& path, std::string& directory, std::string& base) {
    std::string::size_type slash = path.rfind('/');
    if (slash == std::string::npos) {
        directory = ".";
        base = path;
    } else {
        directory = slash == 0 ? "/" : path.substr(0, slash);
        base = path.substr(slash + 1);
    }
}

std::string sibling(const std::string& directory, const std::string& name) {
    return directory == "/" ? "/" + name : directory + "/" + name;
}

bool writeAll(int fd, const char* data, size_t size) {
    while (size > 0) {
        ssize_t n = ::write(fd, data, size);
        if (n < 0) {
            if (errno == EINTR) continue;
            return false;
        }
        data += n;
        size -= static_cast<size_t>(n);
    }
    return true;
}

// A symbolic link (resolv.conf often is one) is written through, not replaced by a plain file.
std::string resolveLink(const std::string& path) {
    struct stat info;
    if (::lstat(path.c_str(), &info) != 0 || !S_ISLNK(info.st_mode)) return path;
    char resolved[PATH_MAX];
    if (::realpath(path.c_str(), resolved) == nullptr) return path;
    return resolved;
}

}  // namespace

File::Path::Path(const std::wstring& path) : path_(make_string(path)) {}

bool File::exists(const std::wstring& path) { return exists(make_string(path)); }

bool File::exists(const std::string& path) {
    struct stat info;
    return ::stat(path.c_str(), &info) == 0;
}

bool File::read(const std::string& path, std::string& content) {
    Descriptor fd(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
    if (!fd) return false;
    std::string data;
    char buffer[8192];
    for (;;) {
        ssize_t n = ::read(fd.get(), buffer, sizeof buffer);
        if (n < 0) {
            if (errno == EINTR) continue;
            return false;
        }
        if (n == 0) break;
        data.append(buffer, static_cast<size_t>(n));
    }
    content = std::move(data);
    return true;
}

bool File::writeAtomically(const std::string& requested, const std::string& content) {
    const FailureHook hook = currentHook();
    const std::string path = resolveLink(requested);
    std::string directory, base;
    splitPath(path, directory, base);
    if (base.empty()) return false;

    struct stat old;
    const bool existed = ::stat(path.c_str(), &old) == 0;
    if (existed && !S_ISREG(old.st_mode)) return false;

    std::string pattern = sibling(directory, "." + base + ".XXXXXX");
    std::vector<char> name(pattern.begin(), pattern.end());
    name.push_back('\0');
    if (injected(hook, "create")) return false;
    Descriptor fd(::mkostemp(name.data(), O_CLOEXEC));
    if (!fd) return false;
    TemporaryName temporary(name.data());

    if (injected(hook, "write")) {
        // Leave a half-written temporary behind the failure, as a full disk would.
        writeAll(fd.get(), content.data(), content.size() / 2);
        return false;
    }
    if (!writeAll(fd.get(), content.data(), content.size())) return false;

    const mode_t mode = existed ? (old.st_mode & 07777) : 0644;
    if (::fchmod(fd.get(), mode) != 0) return false;
    if (existed) {
        struct stat mine;
        if (::fstat(fd.get(), &mine) != 0) return false;
        if ((mine.st_uid != old.st_uid || mine.st_gid != old.st_gid) &&
            ::fchown(fd.get(), old.st_uid, old.st_gid) != 0)
            return false;
    }
    if (injected(hook, "fsync") || ::fsync(fd.get()) != 0) return false;
    if (!fd.close()) return false;
    if (injected(hook, "rename") || ::rename(temporary.name().c_str(), path.c_str()) != 0) return false;
    temporary.release();

    // Make the rename itself durable. The new content is in place whatever this says.
    Descriptor dir(::open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (dir) ::fsync(dir.get());
    return true;
}

bool File::update(const std::string& path, const std::function<bool(std::string& content, bool exists)>& edit) {
    // The lock lives on a hidden sibling that is never replaced: the target itself is renamed over
    // on every write, so a lock on it would not be seen by the next writer.
    std::string directory, base;
    splitPath(resolveLink(path), directory, base);
    if (base.empty()) return false;
    const std::string lockName = sibling(directory, "." + base + ".lock");
    Descriptor lock(::open(lockName.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0644));
    if (!lock) lock.reset(::open(lockName.c_str(), O_RDONLY | O_CLOEXEC));
    if (!lock) return false;
    while (::flock(lock.get(), LOCK_EX) != 0) {
        if (errno != EINTR) return false;
    }

    std::string content;
    bool present = exists(path);
    if (present && !read(path, content)) return false;
    if (!edit(content, present)) return false;
    return writeAtomically(path, content);
    // The lock goes with the descriptor.
}

void File::setFailureHook(FailureHook hook) {
    std::lock_guard<std::mutex> lock(hookMutex);
    failureHook = std::move(hook);
}

}  // namespace Nx
