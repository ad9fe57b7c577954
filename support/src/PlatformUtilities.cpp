#include "Nx/PlatformUtilities.h"

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <mutex>

#include "Nx/File.h"
#include "Trace.h"

namespace Nx {
namespace {

const std::string kComponent = "Tarvo.IPInterfaceProvider";
const char* const kRebootCommand = "/sbin/reboot";

std::mutex runnerMutex;
PlatformUtilities::CommandRunner installedRunner;

std::string environment(const char* name) {
    const char* value = std::getenv(name);
    return value ? value : "";
}

bool appendLine(const std::string& path, const std::string& text) {
    int fd = ::open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0644);
    if (fd < 0) return false;
    std::string line = text + "\n";
    // One write, so lines recorded by concurrent callers never interleave.
    ssize_t n;
    do {
        n = ::write(fd, line.data(), line.size());
    } while (n < 0 && errno == EINTR);
    bool ok = n == static_cast<ssize_t>(line.size());
    return ::close(fd) == 0 && ok;
}

struct PipeCloser {
    int* status;
    void operator()(FILE* pipe) const {
        int rc = ::pclose(pipe);
        if (status) *status = rc;
    }
};

// Runs through popen; status receives pclose's result.
bool runShell(const std::string& command, std::string& output, int& status) {
    status = -1;
    std::unique_ptr<FILE, PipeCloser> pipe(::popen(command.c_str(), "re"), PipeCloser{&status});
    if (!pipe) return false;
    output.clear();
    char buffer[512];
    while (std::fgets(buffer, sizeof buffer, pipe.get())) output += buffer;
    return true;
}

enum class Mode { Run, Record, Refuse };

// IPIF_COMMANDS: unset or "run" runs commands; "record:PATH" only writes them down. Anything else
// refuses to run: a misspelt "record" must not end up changing the real host.
Mode commandMode(std::string& recordPath) {
    std::string setting = environment("IPIF_COMMANDS");
    if (setting.empty() || setting == "run") return Mode::Run;
    static const std::string prefix = "record:";
    if (setting.compare(0, prefix.size(), prefix) == 0 && setting.size() > prefix.size()) {
        recordPath = setting.substr(prefix.size());
        return Mode::Record;
    }
    return Mode::Refuse;
}

// Under record mode, IPIF_COMMAND_ANSWERS may name a file of "COMMAND<TAB>OUTPUT" lines: a recorded
// command listed there prints OUTPUT (one line), so a dry run can show how a request reacts to a host
// where, say, NetworkManager is installed.
void recordedAnswer(const std::string& command, std::string& output) {
    const std::string answers = environment("IPIF_COMMAND_ANSWERS");
    if (answers.empty()) return;
    std::string content;
    if (!File::read(answers, content)) return;
    for (std::string::size_type start = 0, end; start < content.size(); start = end + 1) {
        end = content.find('\n', start);
        if (end == std::string::npos) end = content.size();
        const std::string line = content.substr(start, end - start);
        const auto tab = line.find('\t');
        if (tab == command.size() && line.compare(0, tab, command) == 0) {
            output = line.substr(tab + 1) + "\n";
            return;
        }
    }
}

PlatformUtilities::CommandRunner runner() {
    std::lock_guard<std::mutex> lock(runnerMutex);
    return installedRunner;
}

void logFailure(const std::string& text) {
    logRecord(kComponent, "PlatformUtilities", NX_FILE, __LINE__, 6000,
              trace(NX_FILE, text.c_str(), __LINE__, FREE_MESSAGE));
}

}  // namespace

std::string PlatformUtilities::getMerrowDataDir() {
    std::string directory = environment("IPIF_DATA_DIR");
    if (directory.empty()) return hostPath("/etc/sysconfig/network-scripts/");
    if (directory.back() != '/') directory += '/';
    return directory;
}

std::string PlatformUtilities::hostPath(const std::string& absolutePath) {
    std::string root = environment("IPIF_ROOT");
    while (!root.empty() && root.back() == '/') root.pop_back();
    if (root.empty()) return absolutePath;
    if (absolutePath.empty() || absolutePath.front() != '/') return root + "/" + absolutePath;
    return root + absolutePath;
}

bool PlatformUtilities::runCommand(const std::string& command, std::string& output) {
    output.clear();
    if (CommandRunner custom = runner()) return custom(command, output);
    std::string recordPath;
    switch (commandMode(recordPath)) {
        case Mode::Record:
            if (!appendLine(recordPath, command)) return false;
            recordedAnswer(command, output);
            return true;
        case Mode::Refuse:
            logFailure("IPIF_COMMANDS is neither \"run\" nor \"record:PATH\"; not running: " + command);
            return false;
        case Mode::Run:
            break;
    }
    int status;
    return runShell(command, output, status);
}

bool PlatformUtilities::requestReboot() {
    std::string output;
    if (CommandRunner custom = runner()) return custom("reboot", output);
    std::string recordPath;
    switch (commandMode(recordPath)) {
        case Mode::Record:
            return appendLine(recordPath, "reboot");
        case Mode::Refuse:
            logFailure("IPIF_COMMANDS is neither \"run\" nor \"record:PATH\"; not rebooting");
            return false;
        case Mode::Run:
            break;
    }
    int status;
    if (!runShell(kRebootCommand, output, status)) return false;
    if (status == -1 || !WIFEXITED(status) || WEXITSTATUS(status) != 0) {
        logFailure(std::string(kRebootCommand) + " failed");
        return false;
    }
    return true;
}

void PlatformUtilities::setCommandRunner(CommandRunner newRunner) {
    std::lock_guard<std::mutex> lock(runnerMutex);
    installedRunner = std::move(newRunner);
}

}  // namespace Nx
