#include "DateTime.h"

#include "platform/EnvironmentGuard.h"

#include <array>
#include <ctime>

#include <gtest/gtest.h>

using QX::DateTime;

namespace
{

using Fields = std::array<unsigned, 7>;

/** Year, month, day, hour, minute, second and millisecond of @p value. */
Fields fieldsOf(const DateTime& value)
{
    return {value.getYear(),       value.getMonth(),  value.getDay(),
            value.getHour(),       value.getMinute(), value.getSecond(),
            value.getMillisecond()};
}

} // namespace

TEST(DateTime, DefaultIsTheEpoch)
{
    const DateTime epoch;
    EXPECT_EQ(fieldsOf(epoch), (Fields{1970, 1, 1, 0, 0, 0, 0}));
    EXPECT_EQ(epoch.getOffset(), 0);
    EXPECT_EQ(epoch, DateTime(std::time_t{0}, DateTime::Utc));
}

TEST(DateTime, FieldConstructorStoresValuesUnchanged)
{
    const DateTime value(2024, 13, 40, 25, 61, 62, 999, -5);
    EXPECT_EQ(fieldsOf(value), (Fields{2024, 13, 40, 25, 61, 62, 999}));
    EXPECT_EQ(value.getOffset(), -5);
    EXPECT_NE(value, DateTime(2024, 13, 40, 25, 61, 62, 999, -4));
}

TEST(DateTime, BreaksDownUtcSeconds)
{
    EXPECT_EQ(DateTime(std::time_t{1262304000}, DateTime::Utc),
              DateTime(2010, 1, 1, 0, 0, 0, 0, 0));
    EXPECT_EQ(DateTime(std::time_t{1709651331}, DateTime::Utc),
              DateTime(2024, 3, 5, 15, 8, 51, 0, 0));
    EXPECT_EQ(DateTime(std::time_t{951782400}, DateTime::Utc),
              DateTime(2000, 2, 29, 0, 0, 0, 0, 0));
}

TEST(DateTime, LocalTimeUsesTheZoneOffsetInWholeHours)
{
    {
        QX::test::EnvironmentGuard environment;
        environment.set("TZ", "UTC-5:30"); // five and a half hours east
        tzset();
        const DateTime local(std::time_t{1262304000}, DateTime::LocalTime);
        EXPECT_EQ(local, DateTime(2010, 1, 1, 5, 30, 0, 0, 5));
        // Any zone other than Utc is local time.
        EXPECT_EQ(DateTime(std::time_t{1262304000}, 7u), local);

        environment.set("TZ", "UTC+3:30"); // west: the offset truncates to -3
        tzset();
        EXPECT_EQ(
            DateTime(std::time_t{1262304000}, DateTime::LocalTime).getOffset(),
            -3);
    }
    tzset(); // back to the zone of the environment
}

TEST(DateTime, NowIsCurrent)
{
    const std::time_t before = std::time(nullptr);
    const DateTime now = DateTime::now(DateTime::Utc);
    const DateTime expected(before, DateTime::Utc);
    EXPECT_EQ(now.getYear(), expected.getYear());
    EXPECT_EQ(now.getOffset(), 0);
    EXPECT_GE(now.getYear(), 2024u);
}
