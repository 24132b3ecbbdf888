#pragma once

// A logger sink that keeps what it is given, for tests that check the lines
// the library writes.

#include "CVLogger.h"

#include <mutex>
#include <vector>

namespace testsupport
{

/** Keeps every record in memory; thread-safe, as every sink must be. */
class CaptureSink : public CVLog::LogSink
{
  public:
    void write(const CVLog::LogRecord& record) override
    {
        const std::lock_guard lock(mutex_);
        records_.push_back(record);
    }

    /** The records written so far, in order. */
    std::vector<CVLog::LogRecord> records() const
    {
        const std::lock_guard lock(mutex_);
        return records_;
    }

    void clear()
    {
        const std::lock_guard lock(mutex_);
        records_.clear();
    }

  private:
    mutable std::mutex mutex_;
    std::vector<CVLog::LogRecord> records_;
};

} // namespace testsupport
