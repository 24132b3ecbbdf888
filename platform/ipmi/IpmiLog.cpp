#include "IpmiLog.h"

#include "CVLogger.h"

namespace QX::Ipmi
{

void logLine(int level, const char* function, int line,
             const std::string& message)
{
    CVLog::CVLogger::logLevelMessage(function, "IPMI", line, logComponent,
                                     level, nullptr, 0, 0, message);
}

} // namespace QX::Ipmi
