#pragma once

// Captures every line the logger writes while one test runs.

#include "CVLogger.h"
#include "CaptureSink.h"

#include <memory>
#include <vector>

namespace QX::test
{

/** Installs a fresh capturing sink for its lifetime and puts the sink that
 *  was installed before back when it goes. Declare it before anything that
 *  may still log while being destroyed, so those lines are captured too. */
class CapturedLog
{
  public:
    CapturedLog() : previous_(CVLog::CVLogger::setSink(sink_)) {}
    CapturedLog(const CapturedLog&) = delete;
    CapturedLog& operator=(const CapturedLog&) = delete;
    ~CapturedLog()
    {
        CVLog::CVLogger::setSink(previous_);
    }

    /** The lines written so far, in order. */
    std::vector<CVLog::LogRecord> records() const
    {
        return sink_->records();
    }

  private:
    std::shared_ptr<testsupport::CaptureSink> sink_ =
        std::make_shared<testsupport::CaptureSink>();
    std::shared_ptr<CVLog::LogSink> previous_;
};

} // namespace QX::test
