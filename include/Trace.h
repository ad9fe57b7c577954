// Trace and log helpers shared by every source file of the provider.
#pragma once

#include <string>
#include <vector>

#include "TALog/TALogger.h"
#include "TALog/TAMessageBuffer.h"

namespace Nx {

// Fixed to int so that any int a caller passes is a value of the type (the helpers give an
// unknown one empty text); without it a value beyond 0..3 would be undefined.
enum MessageType : int { ENTERING = 0, EXITING = 1, METHOD_INVOKED = 2, FREE_MESSAGE = 3 };

// Each helper formats into a 512-byte buffer of its own (one per thread) and returns it; the text
// stays valid until the same helper is called again on the same thread. Over-long texts are cut.
const char* trace(const char* name, const char* file, int line, const char* value);
const char* trace(const char* name, const char* file, int line, unsigned value);
const char* trace(const char* file, const char* function, int line, MessageType type);
const char* tracepara(const char* file, const char* function, int line, const char* parameters, MessageType type);

void markProviderEntry(const std::string& component, const char* file, const char* function, int line);
void markProviderExit(const std::string& component, const char* file, const char* function, int line);

// Appends the tokens of text separated by any of the delimiter characters; never clears tokens.
void Tokenize(const std::string& text, std::vector<std::string>& tokens, const std::string& delimiters = " ");

// One record, written to log and then to trace with identical arguments.
void logRecord(const std::string& component, const char* function, const char* file, int line, int level,
               const char* text);

// True when a record of level would be written: text for a dropped record is never formatted.
inline bool tracing(int level) { return TALog::TALogger::isEnabled(level); }

// The text of a trace parameter list: labels as given, pointers as their addresses.
template <class... Parts>
std::string parameterList(const Parts&... parts) {
    TALog::TAMessageBuffer buffer;
    (void)(buffer << ... << parts);
    return buffer.str();
}

// A parameter list for the entry and exit lines of a function (level 3000), formatted only when
// such lines are written; empty otherwise.
class TraceParams {
public:
    template <class... Parts>
    explicit TraceParams(const Parts&... parts) {
        if (tracing(3000)) text_ = parameterList(parts...);
    }
    const char* c_str() const { return text_.c_str(); }

private:
    std::string text_;
};

}  // namespace Nx

// Shorthands used throughout the provider. `logger` is the file's component text.
#define NX_FILE __FILE_NAME__
// The text (and the logger) are evaluated only when the record is written.
#define NX_TRACE_LOG(logger, level, text)                                                \
    do {                                                                                 \
        const int nxLevel = (level);                                                     \
        if (::Nx::tracing(nxLevel))                                                      \
            ::Nx::logRecord((logger), __func__, NX_FILE, __LINE__, nxLevel, (text));     \
    } while (0)
// ENTERING/EXITING with a parameter list, level 3000.
#define NX_ENTER_PARAMS(logger, params) \
    NX_TRACE_LOG(logger, 3000, ::Nx::tracepara(NX_FILE, __func__, __LINE__, (params), ::Nx::ENTERING))
#define NX_EXIT_PARAMS(logger, params) \
    NX_TRACE_LOG(logger, 3000, ::Nx::tracepara(NX_FILE, __func__, __LINE__, (params), ::Nx::EXITING))
// Plain ENTERING/EXITING, level 4000.
#define NX_ENTER(logger) NX_TRACE_LOG(logger, 4000, ::Nx::trace(NX_FILE, __func__, __LINE__, ::Nx::ENTERING))
#define NX_EXIT(logger) NX_TRACE_LOG(logger, 4000, ::Nx::trace(NX_FILE, __func__, __LINE__, ::Nx::EXITING))
#define NX_METHOD(logger) NX_TRACE_LOG(logger, 4000, ::Nx::trace(NX_FILE, __func__, __LINE__, ::Nx::METHOD_INVOKED))
// VARIABLE lines, level 4000; value is a const char* or an unsigned number.
#define NX_VAR(logger, name, value) NX_TRACE_LOG(logger, 4000, ::Nx::trace((name), NX_FILE, __LINE__, (value)))
// MESSAGE lines at a chosen level (3000 ordinary, 4000 caught exceptions, 6000 failures).
#define NX_MESSAGE(logger, level, text) \
    NX_TRACE_LOG(logger, level, ::Nx::trace(NX_FILE, (text), __LINE__, ::Nx::FREE_MESSAGE))
