#pragma once

#include <string>

namespace QX::Platform
{

/** Logger component of the platform's own lines (the IPMI source has its
 *  own, "QX.Platform.IPMI"). */
constexpr const char* logComponent = "QX.Platform";

/** Level of the platform's failure lines. */
constexpr int logLevelFailure = 6000;

/**
 * Reports a failure the platform recovers from on standard error and on
 * the logger's log channel: inside an object manager standard error is
 * often lost, a log line is not. Never throws.
 */
void reportFailure(const char* function, int line,
                   const std::string& message) noexcept;

} // namespace QX::Platform
