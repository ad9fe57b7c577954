// Where the host's files live, and the one seam through which the provider runs commands.
#pragma once

#include <functional>
#include <string>

namespace Nx {

class PlatformUtilities {
public:
    // Directory of the ifcfg-<interface> files, ending with '/': IPIF_DATA_DIR when set, otherwise
    // $IPIF_ROOT/etc/sysconfig/network-scripts/ (IPIF_ROOT defaults to "/").
    static std::string getMerrowDataDir();

    // A host path under IPIF_ROOT: hostPath("/etc/resolv.conf") is "/etc/resolv.conf" by default.
    static std::string hostPath(const std::string& absolutePath);

    // Runs a shell command as popen(command, "r") would. False when it could not be started;
    // otherwise output holds what it printed. Under IPIF_COMMANDS=record:PATH the command is only
    // appended as one line to PATH and prints nothing, or the line IPIF_COMMAND_ANSWERS gives it
    // (a file of "COMMAND<TAB>OUTPUT" lines).
    static bool runCommand(const std::string& command, std::string& output);

    // IPIF_COMMANDS unset or "run" runs commands; any value other than "run" or "record:PATH"
    // refuses every command and reboot (false, logged), so a misspelt setting never reaches the host.

    // Asks the host to reboot by running /sbin/reboot (false unless it exits 0). Under
    // IPIF_COMMANDS=record:PATH the line "reboot" is appended to PATH instead. False when the
    // request could not be made.
    static bool requestReboot();

    // Tests replace how commands run and reboots are requested. The runner gets the command (or
    // "reboot") and returns whether it started, filling output. nullptr restores the default.
    using CommandRunner = std::function<bool(const std::string& command, std::string& output)>;
    static void setCommandRunner(CommandRunner runner);
};

}  // namespace Nx
