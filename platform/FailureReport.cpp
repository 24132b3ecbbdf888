#include "FailureReport.h"

#include "CVLogger.h"

#include <iostream>

namespace QX::Platform
{

void reportFailure(const char* function, int line,
                   const std::string& message) noexcept
{
    try
    {
        std::cerr << message << std::endl;
        CVLog::CVLogger::logLevelMessage(function, "Platform", line,
                                         logComponent, logLevelFailure, nullptr,
                                         0, 0, message);
    }
    catch (...)
    {
        // Out of memory while reporting: nothing more can be said.
    }
}

} // namespace QX::Platform
