#include "DateTimeText.h"

#include <chrono>
#include <cstdio>

namespace host
{
namespace
{

constexpr std::size_t length = 25;
constexpr std::uint64_t microsPerSecond = 1'000'000;
constexpr std::uint64_t secondsPerDay = 86'400;

bool isDigit(char c)
{
    return c >= '0' && c <= '9';
}

std::int64_t number(std::string_view text, std::size_t pos, std::size_t n)
{
    std::int64_t value = 0;
    for (std::size_t i = pos; i < pos + n; ++i)
    {
        value = value * 10 + (text[i] - '0');
    }
    return value;
}

// Days since 1970-01-01 of a proleptic Gregorian date (month may be out of
// range: only digits are checked, and the arithmetic stays defined).
std::int64_t daysFromCivil(std::int64_t y, std::int64_t m, std::int64_t d)
{
    y -= m <= 2 ? 1 : 0;
    const std::int64_t era = (y >= 0 ? y : y - 399) / 400;
    const std::int64_t yoe = y - era * 400;
    const std::int64_t mp = (m + 9) % 12;
    const std::int64_t doy = (153 * mp + 2) / 5 + d - 1;
    const std::int64_t doe = yoe * 365 + yoe / 4 - yoe / 100 + doy;
    return era * 146097 + doe - 719468;
}

void civilFromDays(std::int64_t z, std::int64_t& y, unsigned& m, unsigned& d)
{
    z += 719468;
    const std::int64_t era = (z >= 0 ? z : z - 146096) / 146097;
    const std::int64_t doe = z - era * 146097;
    const std::int64_t yoe =
        (doe - doe / 1460 + doe / 36524 - doe / 146096) / 365;
    const std::int64_t doy = doe - (365 * yoe + yoe / 4 - yoe / 100);
    const std::int64_t mp = (5 * doy + 2) / 153;
    d = static_cast<unsigned>(doy - (153 * mp + 2) / 5 + 1);
    m = static_cast<unsigned>(mp < 10 ? mp + 3 : mp - 9);
    y = yoe + era * 400 + (m <= 2 ? 1 : 0);
}

} // namespace

bool isCimDateTime(std::string_view text)
{
    if (text.size() != length || text[14] != '.')
    {
        return false;
    }
    const char sign = text[21];
    if (sign != '+' && sign != '-' && sign != ':')
    {
        return false;
    }
    if (sign == ':' && text.substr(22) != "000")
    {
        return false;
    }
    for (std::size_t i = 0; i < length; ++i)
    {
        if (i != 14 && i != 21 && !isDigit(text[i]))
        {
            return false;
        }
    }
    return true;
}

bool isCimInterval(std::string_view text)
{
    return isCimDateTime(text) && text[21] == ':';
}

std::optional<std::uint64_t> cimDateTimeToBinary(std::string_view text)
{
    if (!isCimDateTime(text))
    {
        return std::nullopt;
    }
    const std::int64_t micros = number(text, 15, 6);
    const std::int64_t clock = number(text, 8, 2) * 3600 +
                               number(text, 10, 2) * 60 + number(text, 12, 2);
    if (text[21] == ':')
    {
        const std::int64_t days = number(text, 0, 8);
        return static_cast<std::uint64_t>(
            (days * static_cast<std::int64_t>(secondsPerDay) + clock) *
                static_cast<std::int64_t>(microsPerSecond) +
            micros);
    }
    const std::int64_t days = daysFromCivil(
        number(text, 0, 4), number(text, 4, 2), number(text, 6, 2));
    std::int64_t offset = number(text, 22, 3) * 60;
    if (text[21] == '-')
    {
        offset = -offset;
    }
    const std::int64_t seconds =
        days * static_cast<std::int64_t>(secondsPerDay) + clock - offset;
    if (seconds < 0)
    {
        return 0;
    }
    return static_cast<std::uint64_t>(seconds) * microsPerSecond +
           static_cast<std::uint64_t>(micros);
}

std::optional<std::string> cimDateTimeFromBinary(std::uint64_t micros,
                                                 bool interval)
{
    const std::uint64_t seconds = micros / microsPerSecond;
    const auto fraction = static_cast<unsigned>(micros % microsPerSecond);
    const std::uint64_t days = seconds / secondsPerDay;
    const auto clock = static_cast<unsigned>(seconds % secondsPerDay);
    char buf[40];
    if (interval)
    {
        if (days > 99'999'999)
        {
            return std::nullopt;
        }
        std::snprintf(buf, sizeof buf, "%08llu%02u%02u%02u.%06u:000",
                      static_cast<unsigned long long>(days), clock / 3600,
                      clock / 60 % 60, clock % 60, fraction);
        return std::string(buf);
    }
    std::int64_t year = 0;
    unsigned month = 0;
    unsigned day = 0;
    civilFromDays(static_cast<std::int64_t>(days), year, month, day);
    if (year > 9999)
    {
        return std::nullopt;
    }
    std::snprintf(buf, sizeof buf, "%04lld%02u%02u%02u%02u%02u.%06u+000",
                  static_cast<long long>(year), month, day, clock / 3600,
                  clock / 60 % 60, clock % 60, fraction);
    return std::string(buf);
}

std::string cimDateTimeNow()
{
    const auto now = std::chrono::duration_cast<std::chrono::microseconds>(
        std::chrono::system_clock::now().time_since_epoch());
    return cimDateTimeFromBinary(static_cast<std::uint64_t>(now.count()), false)
        .value_or("19700101000000.000000+000");
}

} // namespace host
