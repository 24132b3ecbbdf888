#include "CVLogger.h"

#include <algorithm>
#include <atomic>
#include <mutex>
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
    // Copies of the two thresholds and of whether a sink is installed,
    // written under the mutex, so that a line below every threshold is
    // turned away without taking it.
    std::atomic<int> logThreshold{LoggerSettings{}.logLevel};
    std::atomic<int> traceThreshold{LoggerSettings{}.traceLevel};
    std::atomic<bool> hasSink{true};
};

LoggerState& state()
{
    static LoggerState instance;
    return instance;
}

bool lists(const std::vector<std::string>& components,
           std::string_view component)
{
    return std::any_of(components.begin(), components.end(),
                       [&](const std::string& listed)
                       { return listed == "*" || listed == component; });
}

bool passes(int threshold, int level)
{
    return threshold != 0 && level >= threshold;
}

/** Whether the line would be written; call with the mutex held. */
bool acceptsLocked(const LoggerState& logger, Channel channel,
                   std::string_view component, int level)
{
    const int threshold = channel == Channel::Log ? logger.settings.logLevel
                                                  : logger.settings.traceLevel;
    return passes(threshold, level) &&
           lists(logger.settings.components, component) && logger.sink;
}

void emit(Channel channel, const char* function, const char* file, int line,
          const std::string& component, int level, const std::string& message)
{
    LoggerState& logger = state();
    std::shared_ptr<LogSink> sink;
    {
        const std::lock_guard lock(logger.mutex);
        if (!acceptsLocked(logger, channel, component, level))
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
    logger.hasSink.store(sink != nullptr, std::memory_order_relaxed);
    return std::exchange(logger.sink, std::move(sink));
}

void CVLogger::configure(const LoggerSettings& settings)
{
    LoggerState& logger = state();
    const std::lock_guard lock(logger.mutex);
    logger.settings = settings;
    logger.logThreshold.store(settings.logLevel, std::memory_order_relaxed);
    logger.traceThreshold.store(settings.traceLevel, std::memory_order_relaxed);
}

LoggerSettings CVLogger::settings()
{
    LoggerState& logger = state();
    const std::lock_guard lock(logger.mutex);
    return logger.settings;
}

bool CVLogger::writes(Channel channel, std::string_view component, int level)
{
    LoggerState& logger = state();
    const int threshold =
        channel == Channel::Log
            ? logger.logThreshold.load(std::memory_order_relaxed)
            : logger.traceThreshold.load(std::memory_order_relaxed);
    if (!passes(threshold, level) ||
        !logger.hasSink.load(std::memory_order_relaxed))
    {
        return false;
    }
    const std::lock_guard lock(logger.mutex);
    return acceptsLocked(logger, channel, component, level);
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
