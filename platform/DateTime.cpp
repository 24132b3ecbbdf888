#include "DateTime.h"

namespace QX
{

DateTime::DateTime(std::time_t secondsSinceEpoch, unsigned zone)
{
    std::tm fields{};
    const bool utc = zone == Utc;
    const std::tm* broken = utc ? gmtime_r(&secondsSinceEpoch, &fields)
                                : localtime_r(&secondsSinceEpoch, &fields);
    if (broken == nullptr)
    {
        // The count does not fit a calendar year: keep the epoch.
        return;
    }
    year_ = static_cast<unsigned>(fields.tm_year + 1900);
    month_ = static_cast<unsigned>(fields.tm_mon + 1);
    day_ = static_cast<unsigned>(fields.tm_mday);
    hour_ = static_cast<unsigned>(fields.tm_hour);
    minute_ = static_cast<unsigned>(fields.tm_min);
    second_ = static_cast<unsigned>(fields.tm_sec);
    millisecond_ = 0;
    // Integer division truncates towards zero, as the offset contract asks.
    offsetHours_ = utc ? 0 : static_cast<int>(fields.tm_gmtoff / 3600);
}

DateTime::DateTime(unsigned year, unsigned month, unsigned day, unsigned hour,
                   unsigned minute, unsigned second, unsigned millisecond,
                   int offsetHours) :
    year_(year),
    month_(month), day_(day), hour_(hour), minute_(minute), second_(second),
    millisecond_(millisecond), offsetHours_(offsetHours)
{
}

DateTime DateTime::now(unsigned zone)
{
    return DateTime(std::time(nullptr), zone);
}

} // namespace QX
