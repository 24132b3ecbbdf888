#pragma once

#include <ctime>

namespace QX
{

/**
 * @brief A calendar date and time with milliseconds and a UTC offset in
 *        whole hours, copied by value.
 *
 * The fields are stored as given: the type does no normalisation, so a
 * value built field by field may hold numbers a calendar would reject.
 */
class DateTime
{
  public:
    /** Zone selector: the time is expressed in UTC, offset 0. */
    static constexpr unsigned Utc = 0;
    /** Zone selector: the time is expressed in the local time zone of the
     *  process, with that zone's offset (rounded towards zero to hours). */
    static constexpr unsigned LocalTime = 3;

    /** 1970-01-01 00:00:00.000, offset 0. */
    DateTime() = default;

    /**
     * @brief Breaks a count of seconds since the epoch into calendar fields.
     * @param secondsSinceEpoch seconds since 1970-01-01 00:00:00 UTC
     * @param zone Utc or LocalTime; any other value is taken as LocalTime
     */
    DateTime(std::time_t secondsSinceEpoch, unsigned zone);

    /** Field-by-field constructor; stores every value unchanged. */
    DateTime(unsigned year, unsigned month, unsigned day, unsigned hour,
             unsigned minute, unsigned second, unsigned millisecond,
             int offsetHours);

    /** The current time of the system clock in whole seconds. */
    static DateTime now(unsigned zone = LocalTime);

    unsigned getYear() const
    {
        return year_;
    }
    unsigned getMonth() const
    {
        return month_;
    }
    unsigned getDay() const
    {
        return day_;
    }
    unsigned getHour() const
    {
        return hour_;
    }
    unsigned getMinute() const
    {
        return minute_;
    }
    unsigned getSecond() const
    {
        return second_;
    }
    unsigned getMillisecond() const
    {
        return millisecond_;
    }
    /** Offset from UTC in whole hours, east positive. */
    int getOffset() const
    {
        return offsetHours_;
    }

    friend bool operator==(const DateTime&, const DateTime&) = default;

  private:
    unsigned year_ = 1970;
    unsigned month_ = 1;
    unsigned day_ = 1;
    unsigned hour_ = 0;
    unsigned minute_ = 0;
    unsigned second_ = 0;
    unsigned millisecond_ = 0;
    int offsetHours_ = 0;
};

} // namespace QX
