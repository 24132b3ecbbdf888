#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace host
{

// The 25-character CIM datetime forms:
//   point in time  yyyymmddhhmmss.mmmmmm[+-]ooo (offset in minutes)
//   interval       ddddddddhhmmss.mmmmmm:000
// Every other character must be a digit.
bool isCimDateTime(std::string_view text);
bool isCimInterval(std::string_view text); // a valid interval form

// Microseconds since 1970-01-01 00:00 UTC (points in time, clamped at 0),
// or the interval's length. nullopt if the text is not a CIM datetime.
std::optional<std::uint64_t> cimDateTimeToBinary(std::string_view text);
// UTC (+000) text for a point in time, or interval text; nullopt when the
// value does not fit the 4-digit year or 8-digit day count.
std::optional<std::string> cimDateTimeFromBinary(std::uint64_t micros,
                                                 bool interval);
std::string cimDateTimeNow();

} // namespace host
