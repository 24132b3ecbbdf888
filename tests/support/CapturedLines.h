#pragma once

// Reading the diagnostic lines a test captured.

#include "CVLogger.h"
#include "CaptureSink.h"

#include <string>
#include <vector>

namespace testsupport
{

/** The captured records whose message contains @p text, in order. */
inline std::vector<CVLog::LogRecord>
recordsContaining(const testsupport::CaptureSink& capture,
                  const std::string& text)
{
    std::vector<CVLog::LogRecord> found;
    for (const auto& record : capture.records())
    {
        if (record.message.find(text) != std::string::npos)
        {
            found.push_back(record);
        }
    }
    return found;
}

} // namespace testsupport
