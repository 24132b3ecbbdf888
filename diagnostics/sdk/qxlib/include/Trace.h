#pragma once

#include "CVLogger.h"

#include <cstddef>
#include <cstdio>
#include <cstring>
#include <string>
#include <string_view>

namespace QX
{

/** Kinds of lines made by the message-kind trace formatter. The underlying
 *  type is fixed so that every int is a value of the type: callers may pass
 *  kinds outside the four names, which format as ENTERING lines. */
enum MessageType : int
{
    ENTRY_TRACE = 0,
    EXIT_TRACE = 1,
    METHOD_TRACE = 2,
    MESSAGE_TRACE = 3,
};

/** Logger levels the provider writes at. */
constexpr int LOG_LEVEL_PROGRESS = 3000;
constexpr int LOG_LEVEL_PROVIDER = 4000;
constexpr int LOG_LEVEL_FAILURE = 6000;

/** Size of each formatting buffer, terminator included. Longer lines are
 *  cut, never overrun. */
constexpr std::size_t TRACE_BUFFER_SIZE = 512;

/** Source path of this header; the marking routines report it as the
 *  location of their own lines. */
constexpr const char* TRACE_HEADER_PATH = __FILE__;

constexpr const char* TRACE_BANNER = "================================"
                                     "================================"
                                     "==============";

namespace detail
{

/**
 * One buffer per formatter. Each thread has its own set, so a line can never
 * be torn by a concurrent trace; the returned pointer stays valid until the
 * same formatter runs again on the same thread.
 */
struct TraceBuffers
{
    char messageKind[TRACE_BUFFER_SIZE];
    char textVariable[TRACE_BUFFER_SIZE];
    char numberVariable[TRACE_BUFFER_SIZE];
};

inline thread_local TraceBuffers traceBuffers{};

inline const char* printable(const char* text)
{
    return text != nullptr ? text : "(null)";
}

} // namespace detail

/**
 * @brief Formats an ENTERING, EXITING, METHOD or MESSAGE line.
 *
 * For MESSAGE_TRACE the first argument is the free text and is printed
 * last. Any kind other than EXIT_TRACE, METHOD_TRACE and MESSAGE_TRACE
 * gives an ENTERING line.
 */
inline const char* trace(const char* functionOrText, const char* file,
                         unsigned line, MessageType type)
{
    char* buffer = detail::traceBuffers.messageKind;
    std::memset(buffer, 0, TRACE_BUFFER_SIZE);
    const char* first = detail::printable(functionOrText);
    const char* where = detail::printable(file);
    // The line is printed with %d, as a signed number.
    const int lineNumber = static_cast<int>(line);
    if (type == METHOD_TRACE)
    {
        std::snprintf(buffer, TRACE_BUFFER_SIZE,
                      "METHOD: %s() was invoked in %s [Line: %d]", first, where,
                      lineNumber);
    }
    else if (type == MESSAGE_TRACE)
    {
        std::snprintf(buffer, TRACE_BUFFER_SIZE,
                      "MESSAGE [File: %s, Line: %d]: %s", where, lineNumber,
                      first);
    }
    else if (type == EXIT_TRACE)
    {
        std::snprintf(buffer, TRACE_BUFFER_SIZE,
                      "EXITING: %s() in %s [Line: %d]", first, where,
                      lineNumber);
    }
    else
    {
        std::snprintf(buffer, TRACE_BUFFER_SIZE,
                      "ENTERING: %s() in %s [Line: %d]", first, where,
                      lineNumber);
    }
    return buffer;
}

/** Formats a VARIABLE line for a text value. */
inline const char* trace(const char* name, const char* file, unsigned line,
                         const char* value)
{
    char* buffer = detail::traceBuffers.textVariable;
    std::memset(buffer, 0, TRACE_BUFFER_SIZE);
    std::snprintf(buffer, TRACE_BUFFER_SIZE,
                  "VARIABLE: '%s' has Value '%s' at line %d in %s",
                  detail::printable(name), detail::printable(value),
                  static_cast<int>(line), detail::printable(file));
    return buffer;
}

/** Formats a VARIABLE line for an unsigned value, printed as a signed
 *  decimal (4294967295 prints as -1). */
inline const char* trace(const char* name, const char* file, unsigned line,
                         unsigned value)
{
    char* buffer = detail::traceBuffers.numberVariable;
    std::memset(buffer, 0, TRACE_BUFFER_SIZE);
    std::snprintf(buffer, TRACE_BUFFER_SIZE,
                  "VARIABLE: '%s' has Value '%d' at line %d in %s",
                  detail::printable(name), static_cast<int>(value),
                  static_cast<int>(line), detail::printable(file));
    return buffer;
}

/**
 * @brief Hands one line to the logger twice: at log level, then at trace
 *        level, with the same location, component and level.
 *
 * @p format is called once per channel and returns the formatted line, so
 * each channel gets the line as freshly formatted. A channel that would
 * write nothing for this component and level gets no call: the line is not
 * formatted for it at all, which keeps routine lines nearly free while
 * their level is switched off.
 */
template <typename Format>
void logAndTrace(const char* function, const char* file, int line,
                 std::string_view component, int level, const Format& format)
{
    using CVLog::Channel;
    using CVLog::CVLogger;
    CVLog::CVMessageBuffer buffer;
    if (CVLogger::writes(Channel::Log, component, level))
    {
        buffer << format();
        CVLogger::logLevelMessage(function, file, line, std::string(component),
                                  level, nullptr, 0, 0,
                                  CVLog::CVMessageBuffer::str(buffer));
    }
    if (CVLogger::writes(Channel::Trace, component, level))
    {
        buffer << format();
        CVLogger::traceLevelMessage(function, file, line,
                                    std::string(component), level, nullptr, 0,
                                    0, CVLog::CVMessageBuffer::str(buffer));
    }
}

/** Logs and traces a MESSAGE line with @p text. */
inline void logMessage(const char* function, const char* file, int line,
                       std::string_view component, int level, const char* text)
{
    logAndTrace(function, file, line, component, level,
                [&] {
                    return trace(text, file, static_cast<unsigned>(line),
                                 MESSAGE_TRACE);
                });
}

/** Logs and traces a VARIABLE line at LOG_LEVEL_PROVIDER. */
template <typename Value>
void logVariable(const char* function, const char* file, int line,
                 std::string_view component, const char* name, Value value)
{
    logAndTrace(
        function, file, line, component, LOG_LEVEL_PROVIDER,
        [&] { return trace(name, file, static_cast<unsigned>(line), value); });
}

/** Logs and traces an ENTERING (or EXITING) line for @p function. */
inline void logFunctionEdge(const char* function, const char* file, int line,
                            std::string_view component, MessageType type)
{
    logAndTrace(
        function, file, line, component, LOG_LEVEL_PROVIDER,
        [&]
        { return trace(function, file, static_cast<unsigned>(line), type); });
}

/** Frames a provider operation: banner, then its ENTERING line. */
inline void markProviderEntry(std::string_view component, const char* function,
                              const char* file, unsigned line)
{
    logAndTrace("markProviderEntry", TRACE_HEADER_PATH, 336, component,
                LOG_LEVEL_PROVIDER, [] { return TRACE_BANNER; });
    logAndTrace("markProviderEntry", TRACE_HEADER_PATH, 337, component,
                LOG_LEVEL_PROVIDER,
                [&] { return trace(function, file, line, ENTRY_TRACE); });
}

/** Closes the frame: the operation's EXITING line, then a banner. */
inline void markProviderExit(std::string_view component, const char* function,
                             const char* file, unsigned line)
{
    logAndTrace("markProviderExit", TRACE_HEADER_PATH, 348, component,
                LOG_LEVEL_PROVIDER,
                [&] { return trace(function, file, line, EXIT_TRACE); });
    logAndTrace("markProviderExit", TRACE_HEADER_PATH, 349, component,
                LOG_LEVEL_PROVIDER, [] { return TRACE_BANNER; });
}

} // namespace QX
