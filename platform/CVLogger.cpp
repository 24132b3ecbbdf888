#include "CVLogger.h"

#include <algorithm>
#include <utility>

namespace CVLog
{

namespace
{

struct LoggerState
{
    std::mutex mutex;
    std::shared_ptr<LogSink> sink = makeSyslogSink();
    LoggerSettings settings;
};

LoggerState& state()
{
    static LoggerState instance;
    return instance;
}

bool lists(const std::vector<std::string>& components,
           const std::string& component)
{
    return std::any_of(components.begin(), components.end(),
                       [&](const std::string& listed)
                       { return listed == "*" || listed == component; });
}

void emit(Channel channel, const char* function, const char* file, int line,
          const std::string& component, int level, const std::string& message)
{
    LoggerState& logger = state();
    std::shared_ptr<LogSink> sink;
    {
        const std::lock_guard lock(logger.mutex);
        const int threshold = channel == Channel::Log
                                  ? logger.settings.logLevel
                                  : logger.settings.traceLevel;
        if (threshold == 0 || level < threshold ||
            !lists(logger.settings.components, component) || !logger.sink)
        {
            return;
        }
        sink = logger.sink;
    }
    // Sinks serialise their own output, so writing needs no logger lock.
    sink->write(LogRecord{channel, function != nullptr ? function : "",
                          file != nullptr ? file : "", line, component, level,
                          message});
}

} // namespace

void CaptureSink::write(const LogRecord& record)
{
    const std::lock_guard lock(mutex_);
    records_.push_back(record);
}

std::vector<LogRecord> CaptureSink::records() const
{
    const std::lock_guard lock(mutex_);
    return records_;
}

void CaptureSink::clear()
{
    const std::lock_guard lock(mutex_);
    records_.clear();
}

void CVLogger::logLevelMessage(const char* function, const char* file, int line,
                               const std::string& component, int level,
                               char* /*extra*/, int /*reserved1*/,
                               int /*reserved2*/, const std::string& message)
{
    emit(Channel::Log, function, file, line, component, level, message);
}

void CVLogger::traceLevelMessage(const char* function, const char* file,
                                 int line, const std::string& component,
                                 int level, char* /*extra*/, int /*reserved1*/,
                                 int /*reserved2*/, const std::string& message)
{
    emit(Channel::Trace, function, file, line, component, level, message);
}

std::shared_ptr<LogSink> CVLogger::setSink(std::shared_ptr<LogSink> sink)
{
    LoggerState& logger = state();
    const std::lock_guard lock(logger.mutex);
    return std::exchange(logger.sink, std::move(sink));
}

void CVLogger::configure(const LoggerSettings& settings)
{
    LoggerState& logger = state();
    const std::lock_guard lock(logger.mutex);
    logger.settings = settings;
}

LoggerSettings CVLogger::settings()
{
    LoggerState& logger = state();
    const std::lock_guard lock(logger.mutex);
    return logger.settings;
}

CVMessageBuffer& CVMessageBuffer::operator<<(const char* text)
{
    if (text != nullptr)
    {
        text_ += text;
    }
    return *this;
}

std::string CVMessageBuffer::str(CVMessageBuffer& buffer)
{
    return std::exchange(buffer.text_, std::string());
}

} // namespace CVLog
