#include "ipmi/SelRecordText.h"

#include "platform/EnvironmentGuard.h"
#include "platform/FakeBmc.h"

#include <ctime>

#include <gtest/gtest.h>

using namespace QX::Ipmi;
using QX::test::logClearedRecord;
using QX::test::selRecord;

namespace
{

TEST(SelRecordText, RecordDataIsSixteenHexPairs)
{
    EXPECT_EQ(hexText(selRecord(0x1234, 0x65e5831a)),
              "34 12 02 1a 83 e5 65 20 00 04 01 30 01 57 52 50");
    EXPECT_EQ(recordIdOf(selRecord(0x1234)), 0x1234u);
}

TEST(SelRecordText, TimestampIsTheRecordsOwnTimeInUtc)
{
    // 0x65e5831a is 2024-03-04 08:15:22 UTC.
    EXPECT_EQ(timestampText(selRecord(1, 0x65e5831a), SelClock::Utc),
              "2024-03-04 08:15:22");
}

TEST(SelRecordText, PreInitTimestampsAreTheUnknownTime)
{
    // Seconds since the BMC started, not since 1970.
    EXPECT_EQ(timestampText(selRecord(1, 0x17c), SelClock::Utc),
              "9999-01-01 00:00:00");
    EXPECT_EQ(timestampText(selRecord(1, lastPreInitTimestamp), SelClock::Utc),
              "9999-01-01 00:00:00");
    EXPECT_EQ(
        timestampText(selRecord(1, lastPreInitTimestamp + 1), SelClock::Utc),
        "1987-01-05 18:48:33");
    EXPECT_EQ(timestampText(selRecord(1, 0xFFFFFFFF), SelClock::Utc),
              "9999-01-01 00:00:00");
}

TEST(SelRecordText, LocalSelClockIsTurnedIntoUtc)
{
    QX::test::EnvironmentGuard environment;
    environment.set("TZ", "EST5"); // five hours behind UTC, no summer time
    tzset();
    // The BMC's clock read 08:15:22 local time: 13:15:22 UTC.
    EXPECT_EQ(timestampText(selRecord(1, 0x65e5831a), SelClock::Local),
              "2024-03-04 13:15:22");
    EXPECT_EQ(timestampText(selRecord(1, 0x65e5831a), SelClock::Utc),
              "2024-03-04 08:15:22");
    environment.unset("TZ");
    tzset();
}

TEST(SelRecordText, RecordsWithoutTimeHaveTheUnknownTime)
{
    auto oem = selRecord(1, 0x65e5831a);
    oem[2] = 0xE0; // non-timestamped OEM: bytes 3-6 are OEM data
    EXPECT_EQ(timestampText(oem, SelClock::Utc), "9999-01-01 00:00:00");
    oem[2] = 0xC0; // timestamped OEM
    EXPECT_EQ(timestampText(oem, SelClock::Utc), "2024-03-04 08:15:22");
    oem[2] = 0x30; // reserved record type
    EXPECT_EQ(timestampText(oem, SelClock::Utc), "9999-01-01 00:00:00");
}

TEST(SelRecordText, LogClearedRecordIsRecognised)
{
    EXPECT_TRUE(isLogClearedRecord(logClearedRecord(1)));
    EXPECT_FALSE(isLogClearedRecord(selRecord(1)));
    auto deasserted = logClearedRecord(1);
    deasserted[12] = 0xEF;
    EXPECT_FALSE(isLogClearedRecord(deasserted));
    auto otherOffset = logClearedRecord(1);
    otherOffset[13] = 0x04; // "SEL full"
    EXPECT_FALSE(isLogClearedRecord(otherOffset));
}

TEST(SelRecordText, FallbackDescriptionNamesTypeAndData)
{
    auto record = selRecord(1);
    record[2] = 0x30;
    EXPECT_EQ(fallbackDescription(record),
              "SEL record type 30h: 1a 83 e5 65 20 00 04 01 30 01 57 52 50");
}

} // namespace
