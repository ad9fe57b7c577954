#include "TALog/TALogger.h"

#include <fcntl.h>
#include <sys/syscall.h>
#include <syslog.h>
#include <time.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <mutex>
#include <string>

namespace TALog {
namespace {

constexpr int kDefaultThreshold = 6000;

// An append-only descriptor, closed when the last configuration using it goes away.
class AppendFile {
public:
    explicit AppendFile(const char* path) : fd_(::open(path, O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0644)) {}
    ~AppendFile() {
        if (fd_ >= 0) ::close(fd_);
    }
    AppendFile(const AppendFile&) = delete;
    AppendFile& operator=(const AppendFile&) = delete;

    // One write(2) per line: with O_APPEND, lines from several threads and processes never interleave.
    void writeLine(const std::string& line) const {
        if (fd_ < 0) return;
        const char* data = line.data();
        size_t left = line.size();
        while (left > 0) {
            ssize_t n = ::write(fd_, data, left);
            if (n < 0) {
                if (errno == EINTR) continue;
                return;
            }
            data += n;
            left -= static_cast<size_t>(n);
        }
    }

private:
    int fd_;
};

struct Config {
    int threshold = kDefaultThreshold;
    std::string error;                      // what was wrong with the environment, if anything
    std::unique_ptr<AppendFile> logFile;    // null: syslog
    std::unique_ptr<AppendFile> traceFile;  // null: trace records are dropped
};

std::shared_ptr<const Config> readEnvironment() {
    auto config = std::make_shared<Config>();
    if (const char* level = std::getenv("IPIF_LOG_LEVEL"); level && *level) {
        char* end = nullptr;
        errno = 0;
        long value = std::strtol(level, &end, 10);
        if (errno == 0 && end != level && *end == '\0' && value >= 0 && value <= 1000000) {
            config->threshold = static_cast<int>(value);
        } else {
            std::string shown;
            for (const char* c = level; *c && shown.size() < 40; ++c)
                shown += (static_cast<unsigned char>(*c) < 0x20 || *c == 0x7f) ? '?' : *c;
            config->error = "IPIF_LOG_LEVEL=\"" + shown + "\" is not a level (a whole number from 0 to 1000000); using " +
                            std::to_string(kDefaultThreshold);
        }
    }
    if (const char* path = std::getenv("IPIF_LOG_FILE"); path && *path) config->logFile = std::make_unique<AppendFile>(path);
    if (const char* path = std::getenv("IPIF_TRACE_FILE"); path && *path)
        config->traceFile = std::make_unique<AppendFile>(path);
    return config;
}

std::mutex configMutex;
std::shared_ptr<const Config> configuration;
// configuration->threshold, readable without the lock: most records fall below it and are
// dropped without touching the mutex.
std::atomic<int> activeThreshold{kDefaultThreshold};
std::once_flag loaded;
// Set once the environment has been read. Checked before std::call_once, which touches
// several thread-locals on every call: every trace point of a request asks for the level.
std::atomic<bool> isLoaded{false};

void reportConfigurationError(const Config& config);

void install(std::shared_ptr<const Config> fresh) {
    reportConfigurationError(*fresh);
    std::lock_guard<std::mutex> lock(configMutex);
    activeThreshold.store(fresh->threshold, std::memory_order_relaxed);
    configuration = std::move(fresh);
}

void loadOnce() {
    if (isLoaded.load(std::memory_order_acquire)) return;
    std::call_once(loaded, [] {
        install(readEnvironment());
        isLoaded.store(true, std::memory_order_release);
    });
}

bool dropped(int level) {
    loadOnce();
    return level < activeThreshold.load(std::memory_order_relaxed);
}

std::shared_ptr<const Config> currentConfig() {
    std::lock_guard<std::mutex> lock(configMutex);
    return configuration;
}

// A record is one line: embedded line breaks would let a value forge further records.
std::string oneLine(const char* text) {
    std::string line = text ? text : "";
    for (char& c : line)
        if (c == '\n' || c == '\r') c = ' ';
    return line;
}

int syslogPriority(int level) {
    if (level >= 6000) return LOG_ERR;
    if (level >= 5000) return LOG_WARNING;
    if (level >= 4000) return LOG_INFO;
    return LOG_DEBUG;
}

const char* levelName(int level) {
    if (level >= 6000) return "ERROR";
    if (level >= 5000) return "WARNING";
    if (level >= 4000) return "INFO";
    return "DEBUG";
}

// No openlog(): inside an object manager that would re-tag every later syslog line of the host
// process. The host's own ident stays; our records say where they come from.
void toSyslog(int level, const std::string& line) {
    ::syslog(LOG_DAEMON | syslogPriority(level), "IPInterfaceProvider: %s", line.c_str());
}

// "2026-11-23T10:15:02.123Z ERROR 4711 " : when, how bad, which process.
std::string fileLinePrefix(int level) {
    struct timespec now {};
    ::clock_gettime(CLOCK_REALTIME, &now);
    struct tm utc {};
    ::gmtime_r(&now.tv_sec, &utc);
    char head[96];
    size_t n = std::strftime(head, sizeof head, "%Y-%m-%dT%H:%M:%S", &utc);
    std::snprintf(head + n, sizeof head - n, ".%03ldZ %s %ld ", static_cast<long>(now.tv_nsec / 1000000),
                  levelName(level), static_cast<long>(::getpid()));
    return head;
}

// A bad environment is reported once per configuration, whatever the threshold.
void reportConfigurationError(const Config& config) {
    if (config.error.empty()) return;
    if (config.logFile)
        config.logFile->writeLine(fileLinePrefix(6000) + config.error + "\n");
    else
        toSyslog(6000, config.error);
}

}  // namespace

void TALogger::logLevelMessage(const char* /*function*/, const char* /*file*/, int /*line*/,
                               const std::string& /*component*/, int level, const char*, int, int,
                               const char* text) {
    if (dropped(level)) return;
    auto config = currentConfig();
    if (level < config->threshold) return;
    if (config->logFile) {
        std::string line = fileLinePrefix(level);
        line += oneLine(text);
        line += '\n';
        config->logFile->writeLine(line);
    } else {
        toSyslog(level, oneLine(text));
    }
}

void TALogger::traceLevelMessage(const char* function, const char* file, int line, const std::string& component,
                                 int level, const char*, int, int, const char* text) {
    if (dropped(level)) return;
    auto config = currentConfig();
    if (level < config->threshold || !config->traceFile) return;
    char head[256];
    std::snprintf(head, sizeof head, "%ld %ld %d %s %s %s:%d: ", static_cast<long>(::getpid()),
                  static_cast<long>(::syscall(SYS_gettid)), level, component.c_str(), function ? function : "?",
                  file ? file : "?", line);
    std::string record = head;
    record += oneLine(text);
    record += '\n';
    config->traceFile->writeLine(record);
}

bool TALogger::isEnabled(int level) { return !dropped(level); }

void TALogger::reconfigure() {
    loadOnce();
    install(readEnvironment());
}

std::string TALogger::configurationError() {
    loadOnce();
    return currentConfig()->error;
}

}  // namespace TALog
