#pragma once

#include <string>

namespace QX::Ipmi
{

/** Logger component of the platform's IPMI lines. */
constexpr const char* logComponent = "QX.Platform.IPMI";

/** Levels of the platform's IPMI lines: state changes and failures. */
constexpr int logLevelInfo = 4000;
constexpr int logLevelFailure = 6000;

/** Writes @p message on the logger's log channel. Callers never pass a
 *  password in it. */
void logLine(int level, const char* function, int line,
             const std::string& message);

} // namespace QX::Ipmi
