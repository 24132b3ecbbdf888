#include "CVLogger.h"

#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <stdexcept>
#include <syslog.h>

namespace CVLog
{

namespace
{

/** "2024-03-05T14:02:11.123+0100": local time with milliseconds. */
std::string isoTimeNow()
{
    using namespace std::chrono;
    const auto now = system_clock::now();
    const std::time_t seconds = system_clock::to_time_t(now);
    const auto millis =
        duration_cast<milliseconds>(now.time_since_epoch()).count() % 1000;
    std::tm fields{};
    localtime_r(&seconds, &fields);
    char date[32];
    char zone[8];
    std::strftime(date, sizeof date, "%Y-%m-%dT%H:%M:%S", &fields);
    std::strftime(zone, sizeof zone, "%z", &fields);
    char text[48];
    std::snprintf(text, sizeof text, "%s.%03d%s", date,
                  static_cast<int>(millis), zone);
    return text;
}

/** One line of the stderr and file sinks, ending in a newline. */
std::string formatLine(const LogRecord& record)
{
    return isoTimeNow() +
           (record.channel == Channel::Log ? " LOG " : " TRACE ") +
           std::to_string(record.level) + " [" + record.component + "] " +
           record.message + " (" + record.function + ", " + record.file + ":" +
           std::to_string(record.line) + ")\n";
}

int syslogPriority(int level)
{
    if (level >= 6000)
    {
        return LOG_ERR;
    }
    return level >= 4000 ? LOG_INFO : LOG_DEBUG;
}

class SyslogSink : public LogSink
{
  public:
    SyslogSink()
    {
        static std::once_flag opened;
        std::call_once(opened,
                       [] { openlog("SELProvider", LOG_PID, LOG_DAEMON); });
    }

    void write(const LogRecord& record) override
    {
        const std::string line = "[" + record.component + "] " +
                                 record.message + " (" + record.function +
                                 ", " + record.file + ":" +
                                 std::to_string(record.line) + ")";
        syslog(syslogPriority(record.level), "%s", line.c_str());
    }
};

/** Writes whole lines to a C stream under a lock. */
class StreamSink : public LogSink
{
  public:
    using FileHandle = std::unique_ptr<std::FILE, int (*)(std::FILE*)>;

    explicit StreamSink(FileHandle stream) : stream_(std::move(stream)) {}

    void write(const LogRecord& record) override
    {
        const std::string line = formatLine(record);
        const std::lock_guard lock(mutex_);
        std::fwrite(line.data(), 1, line.size(), stream_.get());
        std::fflush(stream_.get());
    }

  private:
    std::mutex mutex_;
    FileHandle stream_;
};

int keepOpen(std::FILE*)
{
    return 0;
}

int closeFile(std::FILE* file)
{
    return std::fclose(file);
}

} // namespace

std::shared_ptr<LogSink> makeSyslogSink()
{
    return std::make_shared<SyslogSink>();
}

std::shared_ptr<LogSink> makeStderrSink()
{
    return std::make_shared<StreamSink>(
        StreamSink::FileHandle(stderr, &keepOpen));
}

std::shared_ptr<LogSink> makeFileSink(const std::string& path)
{
    StreamSink::FileHandle file(std::fopen(path.c_str(), "a"), &closeFile);
    if (!file)
    {
        throw std::runtime_error("cannot open log file " + path + ": " +
                                 std::strerror(errno));
    }
    return std::make_shared<StreamSink>(std::move(file));
}

} // namespace CVLog
