#pragma once

#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

namespace CVLog
{

/** Which of the logger's two channels a line was written to. */
enum class Channel
{
    Log,
    Trace,
};

/** One line handed to the logger. */
struct LogRecord
{
    Channel channel;
    std::string function;
    std::string file;
    int line;
    std::string component;
    int level;
    std::string message;
};

/** Where written lines go. Implementations must be thread-safe. */
class LogSink
{
  public:
    virtual ~LogSink() = default;
    virtual void write(const LogRecord& record) = 0;
};

/** Writes to syslog (ident "SELProvider", facility daemon): level 6000 and
 *  up as LOG_ERR, 4000 and up as LOG_INFO, lower as LOG_DEBUG. */
std::shared_ptr<LogSink> makeSyslogSink();
/** Writes one line per record to standard error. */
std::shared_ptr<LogSink> makeStderrSink();
/** Appends one line per record to a file. Throws std::runtime_error when
 *  the file cannot be opened. */
std::shared_ptr<LogSink> makeFileSink(const std::string& path);

/** Which lines are written. A channel writes a line when its threshold is
 *  non-zero, the line's level is at least the threshold and the component
 *  is listed ("*" lists all). */
struct LoggerSettings
{
    int logLevel = 6000;
    int traceLevel = 0;
    std::vector<std::string> components{"*"};
};

/**
 * @brief The platform logger: two channels (log, trace) sharing one sink.
 *
 * Thread-safe; lines are written whole, one at a time.
 */
class CVLogger
{
  public:
    static void logLevelMessage(const char* function, const char* file,
                                int line, const std::string& component,
                                int level, char* extra, int reserved1,
                                int reserved2, const std::string& message);
    static void traceLevelMessage(const char* function, const char* file,
                                  int line, const std::string& component,
                                  int level, char* extra, int reserved1,
                                  int reserved2, const std::string& message);

    /** Installs @p sink (null: discard) and returns the previous one. */
    static std::shared_ptr<LogSink> setSink(std::shared_ptr<LogSink> sink);
    static void configure(const LoggerSettings& settings);
    static LoggerSettings settings();
    /**
     * Whether a line of @p component at @p level written to @p channel now
     * would reach a sink. Lets callers skip formatting lines that nobody
     * receives; the write calls decide again for themselves.
     */
    static bool writes(Channel channel, std::string_view component, int level);
};

/** A growable text buffer; str() hands out the text and empties it. */
class CVMessageBuffer
{
  public:
    CVMessageBuffer() = default;
    ~CVMessageBuffer() = default;

    CVMessageBuffer& operator<<(const char* text);
    static std::string str(CVMessageBuffer& buffer);

  private:
    std::string text_;
};

} // namespace CVLog
