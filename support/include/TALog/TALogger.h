// The logging library: records routed by level to a file or the system log.
//
// Environment:
//   IPIF_LOG_LEVEL  threshold, a whole number from 0 to 1000000; records below it are dropped
//                   (default 6000: failures only). Anything else is reported as an error record
//                   and the default holds; configurationError() tells callers that can refuse.
//   IPIF_LOG_FILE   append log records to this file, one line per record:
//                   "<UTC time, ms> <ERROR|WARNING|INFO|DEBUG> <pid> <text>";
//                   without it log records go to syslog (facility daemon, the process's own
//                   ident, text prefixed "IPInterfaceProvider: ")
//   IPIF_TRACE_FILE append trace records (the second copy of every record) to this file, one
//                   line each: "<pid> <tid> <level> <component> <function> <file>:<line>: <text>";
//                   without it trace records are dropped
// The threshold applies to both copies. Line breaks inside a text become blanks, so one record is
// always one line; each line is appended with a single write(2), safe across threads and processes.
#pragma once

#include <string>

namespace TALog {

class TALogger {
public:
    // function, file, line: where the record comes from; component: "Tarvo.IPInterfaceProvider";
    // level: 3000 entry/exit, 4000 markers and variables, 6000 failures. The next three arguments
    // are unused by this library and kept for the calling convention.
    static void logLevelMessage(const char* function, const char* file, int line, const std::string& component,
                                int level, const char* unused, int unused2, int unused3, const char* text);
    static void traceLevelMessage(const char* function, const char* file, int line, const std::string& component,
                                  int level, const char* unused, int unused2, int unused3, const char* text);

    // True when a record of level would be kept (it is not below the threshold), so that callers
    // format a record's text only when it is written somewhere.
    static bool isEnabled(int level);

    // Re-reads the environment (tests change it between cases).
    static void reconfigure();

    // Why the environment could not be used as given; empty when it could.
    static std::string configurationError();
};

}  // namespace TALog
