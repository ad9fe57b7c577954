#include "Nx/File.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/random.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <memory>
#include <mutex>

#include "Nx/PlatformUtilities.h"
#include "Nx/String.h"
#include "Trace.h"

namespace Nx {
namespace {

const std::string kComponent = "Tarvo.IPInterfaceProvider";

// A temporary this much older than now and not locked was left by a writer that died. The age
// only covers the instant between a writer creating its temporary and locking it.
constexpr time_t kStaleTemporaryAge = 10;
const char kTemporaryAlphabet[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789";
constexpr size_t kTemporarySuffix = 6;

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

private:
    int fd_;
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

bool failWith(int code) {
    errno = code;
    return false;
}

bool failWith(int code, std::string& error, const std::string& reason = std::string()) {
    error = reason.empty() ? std::strerror(code) : reason;
    return failWith(code);
}

void logRefusal(const std::string& path, const char* reason) {
    const std::string text = "Not writing " + path + ": " + reason;
    logRecord(kComponent, "File", NX_FILE, __LINE__, 6000, trace(NX_FILE, text.c_str(), __LINE__, FREE_MESSAGE));
}

bool sameFile(const struct stat& a, const struct stat& b) { return a.st_dev == b.st_dev && a.st_ino == b.st_ino; }

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

std::string realPath(const std::string& path) {
    char resolved[PATH_MAX];
    return ::realpath(path.c_str(), resolved) ? std::string(resolved) : std::string();
}

bool within(const std::string& path, const std::string& root) {
    return root == "/" || (path.compare(0, root.size(), root) == 0 &&
                           (path.size() == root.size() || path[root.size()] == '/'));
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

// Opens a regular file for reading. Looks before opening, since opening a FIFO waits for a writer
// and a device may act on being opened (a watchdog starts counting); readOpen checks again what
// was actually opened.
bool openRegular(int directory, const std::string& name, bool followLink, Descriptor& fd, std::string& error) {
    struct stat info;
    if (::fstatat(directory, name.c_str(), &info, followLink ? 0 : AT_SYMLINK_NOFOLLOW) != 0)
        return failWith(errno, error);
    if (S_ISLNK(info.st_mode)) return failWith(ELOOP, error, "a symbolic link");
    if (!S_ISREG(info.st_mode)) return failWith(EINVAL, error, "not a regular file");
    fd.reset(::openat(directory, name.c_str(),
                      O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC | (followLink ? 0 : O_NOFOLLOW)));
    return fd || failWith(errno, error);
}

// Reads what openRegular opened: a regular file of at most kMaxReadSize bytes.
bool readOpen(int fd, std::string& content, std::string& error, struct stat* info) {
    struct stat status;
    if (::fstat(fd, &status) != 0) return failWith(errno, error);
    if (!S_ISREG(status.st_mode)) return failWith(EINVAL, error, "not a regular file");
    const auto tooLarge = [&] {
        return failWith(EFBIG, error, "larger than " + std::to_string(File::kMaxReadSize >> 20) + " MiB");
    };
    if (static_cast<unsigned long long>(status.st_size) > File::kMaxReadSize) return tooLarge();
    std::string data;
    data.reserve(static_cast<size_t>(status.st_size));
    char buffer[8192];
    for (;;) {
        // One byte past the cap tells a file that grew since fstat.
        const size_t room = File::kMaxReadSize + 1 - data.size();
        ssize_t n = ::read(fd, buffer, room < sizeof buffer ? room : sizeof buffer);
        if (n < 0) {
            if (errno == EINTR) continue;
            return failWith(errno, error);
        }
        if (n == 0) break;
        data.append(buffer, static_cast<size_t>(n));
        if (data.size() > File::kMaxReadSize) return tooLarge();
    }
    content = std::move(data);
    if (info) *info = status;
    return true;
}

// The directory of a file about to be written, opened once so that every later step works in the
// directory that was checked, whatever happens to the path meanwhile.
struct Directory {
    Descriptor fd;
    std::string base;
};

bool openDirectory(const std::string& path, File::Scope scope, Directory& dir) {
    std::string directory;
    splitPath(path, directory, dir.base);
    if (dir.base.empty() || dir.base == "." || dir.base == "..") return failWith(EISDIR);
    dir.fd.reset(::open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!dir.fd) return false;
    if (scope == File::Scope::Named) return true;
    // Judge the directory by its real path, so a linked directory cannot lead a write elsewhere.
    const std::string real = realPath(directory);
    struct stat opened, named;
    if (real.empty() || ::fstat(dir.fd.get(), &opened) != 0 || ::stat(real.c_str(), &named) != 0) return false;
    if (!sameFile(opened, named)) return failWith(EAGAIN);  // moved while we looked
    for (const std::string& root : {PlatformUtilities::hostPath("/"), PlatformUtilities::getMerrowDataDir()}) {
        const std::string realRoot = realPath(root);
        if (!realRoot.empty() && within(real, realRoot)) return true;
    }
    logRefusal(path, "outside IPIF_ROOT and IPIF_DATA_DIR");
    return failWith(EACCES);
}

// A locked file beside the target that its owner removes when done: the name goes first, then
// the descriptor (and with it the lock), so nobody can lock a name that is about to vanish.
class OwnedSibling {
public:
    explicit OwnedSibling(int directory) : directory_(directory) {}
    ~OwnedSibling() {
        if (!name_.empty()) ::unlinkat(directory_, name_.c_str(), 0);
    }
    OwnedSibling(const OwnedSibling&) = delete;
    OwnedSibling& operator=(const OwnedSibling&) = delete;

protected:
    int directory_;
    std::string name_;  // empty: nothing to remove
    Descriptor fd_;     // destroyed after the destructor body removed the name
};

// A temporary sibling of the target, locked from creation until it is renamed into place or
// removed, so that removeStaleTemporaries can tell it from one a killed writer left.
class Temporary : public OwnedSibling {
public:
    using OwnedSibling::OwnedSibling;

    bool create(const std::string& base) {
        for (int attempt = 0; attempt < 100; ++attempt) {
            unsigned char random[kTemporarySuffix];
            if (::getrandom(random, sizeof random, 0) != static_cast<ssize_t>(sizeof random)) return false;
            std::string name = "." + base + ".";
            for (unsigned char r : random) name += kTemporaryAlphabet[r % (sizeof kTemporaryAlphabet - 1)];
            fd_.reset(::openat(directory_, name.c_str(), O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600));
            if (!fd_) {
                if (errno == EEXIST) continue;
                return false;
            }
            name_ = name;
            return ::flock(fd_.get(), LOCK_EX | LOCK_NB) == 0;
        }
        return failWith(EEXIST);
    }
    int fd() const { return fd_.get(); }
    const std::string& name() const { return name_; }
    void release() { name_.clear(); }
};

bool isTemporaryOf(const std::string& entry, const std::string& base) {
    const size_t prefix = base.size() + 2;
    return entry.size() == prefix + kTemporarySuffix && entry[0] == '.' && entry.compare(1, base.size(), base) == 0 &&
           entry[prefix - 1] == '.' && entry.find_first_not_of(kTemporaryAlphabet, prefix) == std::string::npos;
}

// Removes the temporaries of base that writers killed midway left: old and not locked by anyone.
void removeStaleTemporaries(int directory, const std::string& base) {
    // A descriptor of its own: reading the listing moves the offset of the descriptor it uses.
    const int listingFd = ::openat(directory, ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (listingFd < 0) return;
    std::unique_ptr<DIR, int (*)(DIR*)> listing(::fdopendir(listingFd), ::closedir);
    if (!listing) {
        ::close(listingFd);
        return;
    }
    const time_t now = ::time(nullptr);
    while (const dirent* entry = ::readdir(listing.get())) {
        const std::string name = entry->d_name;
        if (!isTemporaryOf(name, base)) continue;
        Descriptor fd(::openat(directory, name.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
        struct stat held, named;
        if (!fd || ::fstat(fd.get(), &held) != 0 || !S_ISREG(held.st_mode) || now - held.st_mtime < kStaleTemporaryAge)
            continue;
        if (::flock(fd.get(), LOCK_EX | LOCK_NB) != 0) continue;  // a live writer's
        if (::fstatat(directory, name.c_str(), &named, AT_SYMLINK_NOFOLLOW) == 0 && sameFile(held, named))
            ::unlinkat(directory, name.c_str(), 0);
    }
}

// Puts content in place of dir.base: see writeAtomically.
bool replace(const std::string& path, const Directory& dir, const std::string& content) {
    const File::FailureHook hook = currentHook();
    const int directory = dir.fd.get();
    struct stat old;
    const bool existed = ::fstatat(directory, dir.base.c_str(), &old, AT_SYMLINK_NOFOLLOW) == 0;
    if (!existed && errno != ENOENT) return false;
    if (existed && S_ISLNK(old.st_mode)) {
        // Writing through would reach wherever the link points; replacing would silently undo a
        // link someone made on purpose. Neither is ours to decide.
        logRefusal(path, "a symbolic link");
        return failWith(ELOOP);
    }
    if (existed && !S_ISREG(old.st_mode)) return failWith(S_ISDIR(old.st_mode) ? EISDIR : EINVAL);

    removeStaleTemporaries(directory, dir.base);
    if (injected(hook, "create")) return false;
    Temporary temporary(directory);
    if (!temporary.create(dir.base)) return false;

    if (injected(hook, "write")) {
        // Leave a half-written temporary behind the failure, as a full disk would.
        writeAll(temporary.fd(), content.data(), content.size() / 2);
        return false;
    }
    if (!writeAll(temporary.fd(), content.data(), content.size())) return false;

    const mode_t mode = existed ? (old.st_mode & 07777) : 0644;
    if (::fchmod(temporary.fd(), mode) != 0) return false;
    if (existed) {
        struct stat mine;
        if (::fstat(temporary.fd(), &mine) != 0) return false;
        if ((mine.st_uid != old.st_uid || mine.st_gid != old.st_gid) &&
            ::fchown(temporary.fd(), old.st_uid, old.st_gid) != 0)
            return false;
    }
    // Flushed before the rename; the descriptor stays open (and the temporary locked) until then.
    if (injected(hook, "fsync") || ::fsync(temporary.fd()) != 0) return false;
    if (injected(hook, "rename") || ::renameat(directory, temporary.name().c_str(), directory, dir.base.c_str()) != 0)
        return false;
    temporary.release();

    // Make the rename itself durable. The new content is in place whatever this says.
    ::fsync(directory);
    return true;
}

// The lock of update(): a hidden sibling ".<name>.lock" (the target cannot carry it, since every
// write renames a new file over it). Its holder removes it while still holding the lock; a waiter
// that then gets the lock finds the name gone or on another file and starts again, so exactly one
// holder at a time has the lock on the file the name refers to.
class UpdateLock : public OwnedSibling {
public:
    using OwnedSibling::OwnedSibling;

    bool acquire(const std::string& name) {
        for (;;) {
            fd_.reset(::openat(directory_, name.c_str(), O_RDWR | O_CREAT | O_NOFOLLOW | O_CLOEXEC, 0600));
            if (!fd_) return false;
            while (::flock(fd_.get(), LOCK_EX) != 0) {
                if (errno != EINTR) return false;
            }
            struct stat locked, named;
            if (::fstat(fd_.get(), &locked) != 0) return false;
            if (::fstatat(directory_, name.c_str(), &named, AT_SYMLINK_NOFOLLOW) == 0) {
                if (sameFile(locked, named)) break;
            } else if (errno != ENOENT) {
                return false;
            }
        }
        name_ = name;
        return true;
    }
};

}  // namespace

File::Path::Path(const std::wstring& path) : path_(make_string(path)) {}

bool File::exists(const std::wstring& path) { return exists(make_string(path)); }

bool File::exists(const std::string& path) {
    struct stat info;
    return ::stat(path.c_str(), &info) == 0;
}

bool File::read(const std::string& path, std::string& content) {
    std::string error;
    return read(path, content, error);
}

bool File::read(const std::string& path, std::string& content, std::string& error, struct stat* info) {
    Descriptor fd;
    return openRegular(AT_FDCWD, path, true, fd, error) && readOpen(fd.get(), content, error, info);
}

bool File::writeAtomically(const std::string& path, const std::string& content, Scope scope) {
    Directory dir;
    return openDirectory(path, scope, dir) && replace(path, dir, content);
}

bool File::update(const std::string& path, const std::function<bool(std::string& content, bool exists)>& edit,
                  Scope scope) {
    Directory dir;
    if (!openDirectory(path, scope, dir)) return false;
    UpdateLock lock(dir.fd.get());
    if (!lock.acquire("." + dir.base + ".lock")) return false;

    std::string content, error;
    Descriptor fd;
    const bool present = openRegular(dir.fd.get(), dir.base, false, fd, error);
    if (!present && errno != ENOENT) {
        if (errno == ELOOP) logRefusal(path, "a symbolic link");
        return false;
    }
    if (present && !readOpen(fd.get(), content, error, nullptr)) return false;
    fd.reset();
    if (!edit(content, present)) return false;
    return replace(path, dir, content);
}

void File::setFailureHook(FailureHook hook) {
    std::lock_guard<std::mutex> lock(hookMutex);
    failureHook = std::move(hook);
}

}  // namespace Nx
