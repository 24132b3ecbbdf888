// The one SEL record type: fields, bytes and hex forms.

#include "ipmi/SelRecord.h"

#include <gtest/gtest.h>

using QX::Ipmi::SelRecord;
using QX::Ipmi::SelRecordBytes;

namespace
{

const SelRecordBytes watchdogReset{0x2a, 0x01, 0x02, 0x1a, 0x83, 0xe5,
                                   0x65, 0x20, 0x00, 0x04, 0x23, 0x71,
                                   0x6f, 0xc1, 0x04, 0xff};

TEST(SelRecordTest, ParsesTheFieldsOfASystemEventRecord)
{
    const SelRecord record = SelRecord::parse(watchdogReset);
    EXPECT_EQ(record.recordId, 0x012a);
    EXPECT_TRUE(record.isSystemEvent());
    EXPECT_EQ(record.timestamp, 0x65e5831au);
    EXPECT_EQ(record.generatorId, SelRecord::bmcGenerator);
    EXPECT_EQ(record.evmRev, SelRecord::evmRevIpmi);
    EXPECT_EQ(record.sensorType, 0x23);
    EXPECT_EQ(record.sensorNumber, 0x71);
    EXPECT_EQ(record.eventType(), 0x6f);
    EXPECT_TRUE(record.asserted());
    EXPECT_EQ(record.offset(), 0x01);
    EXPECT_EQ(record.eventData[1], 0x04);
}

TEST(SelRecordTest, BuildsTheBytesItWasParsedFrom)
{
    EXPECT_EQ(SelRecord::parse(watchdogReset).bytes(), watchdogReset);
    // An OEM record keeps its bytes although its fields mean other things.
    const SelRecordBytes oem{1, 0, 0xe0, 9, 8,    7,    6, 5,
                             4, 3, 2,    1, 0xff, 0x80, 0, 0x11};
    EXPECT_EQ(SelRecord::parse(oem).bytes(), oem);
    EXPECT_EQ(SelRecord::systemEvent(0x012a, 0x65e5831a, 0x23, 0x71, 0x6f,
                                     {0xc1, 0x04, 0xff})
                  .bytes(),
              watchdogReset);
}

TEST(SelRecordTest, DeassertionIsTheHighBitOfTheEventType)
{
    SelRecord record = SelRecord::parse(watchdogReset);
    record.eventDirType = 0xef;
    EXPECT_FALSE(record.asserted());
    EXPECT_EQ(record.eventType(), 0x6f);
}

TEST(SelRecordTest, HexFormsAndBack)
{
    const SelRecord record = SelRecord::parse(watchdogReset);
    EXPECT_EQ(record.hex(), "2a 01 02 1a 83 e5 65 20 00 04 23 71 6f c1 04 ff");
    EXPECT_EQ(record.compactHex(), "2a01021a83e56520000423716fc104ff");
    EXPECT_EQ(SelRecord::parseHex(record.hex()), record);
    EXPECT_EQ(SelRecord::parseHex(record.compactHex()), record);
    EXPECT_EQ(SelRecord::parseHex("2A01021A83E56520000423716FC104FF"), record);
}

TEST(SelRecordTest, ParseHexRefusesAnythingButSixteenPairs)
{
    EXPECT_FALSE(SelRecord::parseHex(""));
    EXPECT_FALSE(SelRecord::parseHex("2a 01"));
    EXPECT_FALSE(SelRecord::parseHex("2a01021a83e56520000423716fc104ff00"));
    EXPECT_FALSE(SelRecord::parseHex("2a01021a83e56520000423716fc104fg"));
    EXPECT_FALSE(SelRecord::parseHex(" 2a01021a83e56520000423716fc104ff"));
    EXPECT_FALSE(SelRecord::parseHex("2a01021a83e56520000423716fc104f"));
}

} // namespace
