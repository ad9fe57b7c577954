#include "Trace.h"

#include <cstdio>

namespace Nx {
namespace {

constexpr size_t kBufferSize = 512;

// One buffer per helper and thread: a returned text survives calls of the other helpers.
thread_local char variableTextBuffer[kBufferSize];
thread_local char variableNumberBuffer[kBufferSize];
thread_local char messageBuffer[kBufferSize];
thread_local char parameterBuffer[kBufferSize];

const char* orNull(const char* text) { return text ? text : "(null)"; }

const char* const kSeparator = "==============================================================================";
static_assert(sizeof("==============================================================================") == 79,
              "the marker separator is 78 characters");

}  // namespace

const char* trace(const char* name, const char* file, int line, const char* value) {
    std::snprintf(variableTextBuffer, kBufferSize, "VARIABLE: '%s' has Value '%s' at line %d in %s", orNull(name),
                  orNull(value), line, orNull(file));
    return variableTextBuffer;
}

const char* trace(const char* name, const char* file, int line, unsigned value) {
    std::snprintf(variableNumberBuffer, kBufferSize, "VARIABLE: '%s' has Value '%d' at line %d in %s", orNull(name),
                  static_cast<int>(value), line, orNull(file));
    return variableNumberBuffer;
}

const char* trace(const char* file, const char* function, int line, MessageType type) {
    messageBuffer[0] = '\0';  // an unknown type yields empty text
    switch (type) {
        case ENTERING:
            std::snprintf(messageBuffer, kBufferSize, "ENTERING: %s() in %s [Line: %d]", orNull(function),
                          orNull(file), line);
            break;
        case EXITING:
            std::snprintf(messageBuffer, kBufferSize, "EXITING: %s() in %s [Line: %d]", orNull(function),
                          orNull(file), line);
            break;
        case METHOD_INVOKED:
            std::snprintf(messageBuffer, kBufferSize, "METHOD: %s() was invoked in %s [Line: %d]", orNull(function),
                          orNull(file), line);
            break;
        case FREE_MESSAGE:
            // The free text travels in the function slot; the file comes first in this form.
            std::snprintf(messageBuffer, kBufferSize, "MESSAGE [File: %s, Line: %d]: %s", orNull(file), line,
                          orNull(function));
            break;
        default:
            break;
    }
    return messageBuffer;
}

const char* tracepara(const char* file, const char* function, int line, const char* parameters, MessageType type) {
    parameterBuffer[0] = '\0';  // an unknown type yields empty text
    switch (type) {
        case ENTERING:
            std::snprintf(parameterBuffer, kBufferSize, "ENTERING: %s() in %s [Line: %d],Parameters List: %s",
                          orNull(function), orNull(file), line, orNull(parameters));
            break;
        case EXITING:
            std::snprintf(parameterBuffer, kBufferSize, "EXITING: %s() in %s [Line: %d],Parameters List: %s",
                          orNull(function), orNull(file), line, orNull(parameters));
            break;
        case METHOD_INVOKED:
            std::snprintf(parameterBuffer, kBufferSize,
                          "METHOD: %s() was invoked in %s [Line: %d],Parameters List: %s", orNull(function),
                          orNull(file), line, orNull(parameters));
            break;
        case FREE_MESSAGE:
            std::snprintf(parameterBuffer, kBufferSize, "MESSAGE [File: %s, Line: %d]: %s,Parameters List: %s",
                          orNull(file), line, orNull(function), orNull(parameters));
            break;
        default:
            break;
    }
    return parameterBuffer;
}

void logRecord(const std::string& component, const char* function, const char* file, int line, int level,
               const char* text) {
    TALog::TALogger::logLevelMessage(function, file, line, component, level, nullptr, 0, 0, text);
    TALog::TALogger::traceLevelMessage(function, file, line, component, level, nullptr, 0, 0, text);
}

void markProviderEntry(const std::string& component, const char* file, const char* function, int line) {
    if (!tracing(4000)) return;
    logRecord(component, "markProviderEntry", NX_FILE, __LINE__, 4000, kSeparator);
    logRecord(component, "markProviderEntry", NX_FILE, __LINE__, 4000, trace(file, function, line, ENTERING));
}

void markProviderExit(const std::string& component, const char* file, const char* function, int line) {
    if (!tracing(4000)) return;
    logRecord(component, "markProviderExit", NX_FILE, __LINE__, 4000, trace(file, function, line, EXITING));
    logRecord(component, "markProviderExit", NX_FILE, __LINE__, 4000, kSeparator);
}

void Tokenize(const std::string& text, std::vector<std::string>& tokens, const std::string& delimiters) {
    std::string::size_type start = text.find_first_not_of(delimiters, 0);
    std::string::size_type end = text.find_first_of(delimiters, start);
    while (start != std::string::npos || end != std::string::npos) {
        tokens.push_back(text.substr(start, end == std::string::npos ? std::string::npos : end - start));
        start = text.find_first_not_of(delimiters, end);
        end = text.find_first_of(delimiters, start);
    }
}

}  // namespace Nx
