#include "MgmtHwLog.h"
#include "MgmtHwLogEntry.h"

#include <thread>

#include <gtest/gtest.h>

namespace
{

using QX::SELComposite::MgmtHwLog;
using QX::SELComposite::MgmtHwLogEntry;

TEST(MgmtHwLogTest, FixedAnswers)
{
    MgmtHwLog log;
    EXPECT_EQ(log.getHeaderFormat(), "");
    EXPECT_EQ(log.getRecordHeaderFormat(),
              "2 byte Record ID and 1 byte Record Type");
    EXPECT_EQ(log.getOtherPolicyDescription(), "");
    EXPECT_EQ(log.getOtherEnableState(), "");
    EXPECT_EQ(log.getCharacterSet(), 7);
    EXPECT_EQ(log.getEnableDefault(), 2);
    EXPECT_EQ(log.getMaxLogSize(), 10240u);
    EXPECT_EQ(log.getSizeOfHeader(), 0u);
    EXPECT_EQ(log.getMaxRecordSize(), 0u);
    EXPECT_EQ(log.getSizeOfRecordHeader(), 0u);
    EXPECT_EQ(log.getRecordLastChanged(), 0u);
    EXPECT_FALSE(log.getIsFrozen());
    EXPECT_EQ(log.getCapabilities(), std::vector<std::uint16_t>{6});
}

TEST(MgmtHwLogTest, DefaultsAreZero)
{
    MgmtHwLog log;
    EXPECT_EQ(log.getNode(), 0);
    EXPECT_EQ(log.maxNumberOfRecords, 0u);
    EXPECT_EQ(log.currentNumberOfRecords, 0u);
    EXPECT_EQ(log.overwritePolicy, 0);
    EXPECT_EQ(log.enabledState, 0);
    EXPECT_EQ(log.requestedState, 0);
    EXPECT_EQ(log.getName(), "");
}

TEST(MgmtHwLogTest, PercentageNearFull)
{
    MgmtHwLog log;
    log.currentNumberOfRecords = 17;
    EXPECT_EQ(log.getPercentageNearFull(), 0) << "no maximum";
    log.maxNumberOfRecords = 512;
    log.currentNumberOfRecords = 512;
    EXPECT_EQ(log.getPercentageNearFull(), 100);
    log.maxNumberOfRecords = 3;
    log.currentNumberOfRecords = 1;
    EXPECT_EQ(log.getPercentageNearFull(), 33);
    log.maxNumberOfRecords = 500;
    log.currentNumberOfRecords = 125;
    EXPECT_EQ(log.getPercentageNearFull(), 25);
    // 300 % is cut to its low 8 bits.
    log.maxNumberOfRecords = 1;
    log.currentNumberOfRecords = 3;
    EXPECT_EQ(log.getPercentageNearFull(), 300 % 256);
}

TEST(MgmtHwLogTest, EnabledLogReportsOk)
{
    MgmtHwLog log;
    log.enabledState = 2;
    EXPECT_EQ(log.getStatus(), "OK");
    EXPECT_EQ(log.getOperationalStatus(), (std::vector<std::uint16_t>{2, 11}));
    EXPECT_EQ(log.getStatusDescriptions(),
              (std::vector<std::string>{"OK", "Service"}));
}

TEST(MgmtHwLogTest, OtherStatesReportUnknown)
{
    for (const std::uint16_t state : {0, 3, 5, 6, 10})
    {
        MgmtHwLog log;
        log.enabledState = state;
        EXPECT_EQ(log.getStatus(), "Unknown") << state;
        EXPECT_EQ(log.getOperationalStatus(), std::vector<std::uint16_t>{0});
        EXPECT_EQ(log.getStatusDescriptions(),
                  std::vector<std::string>{"Unknown"});
    }
}

TEST(MgmtHwLogTest, RepeatedCallsDoNotGrowTheVectors)
{
    MgmtHwLog log;
    log.enabledState = 2;
    log.getOperationalStatus();
    log.getStatusDescriptions();
    log.getCapabilities();
    EXPECT_EQ(log.getOperationalStatus().size(), 2u);
    EXPECT_EQ(log.getStatusDescriptions().size(), 2u);
    EXPECT_EQ(log.getCapabilities().size(), 1u);
}

TEST(MgmtHwLogTest, SettersAlwaysSucceedAndNamesAreStripped)
{
    MgmtHwLog log;
    EXPECT_TRUE(log.setElementName(""));
    EXPECT_TRUE(log.setName("  IPMI SEL Log \t"));
    EXPECT_EQ(log.getName(), "IPMI SEL Log");
    EXPECT_TRUE(log.setNode(65535));
    EXPECT_EQ(log.getNode(), 65535);
}

TEST(MgmtHwLogTest, TimeGettersReadTheClock)
{
    MgmtHwLog log;
    const QX::DateTime first = log.getInstallDate();
    EXPECT_GE(first.getYear(), 2024u);
    std::this_thread::sleep_for(std::chrono::milliseconds(1100));
    EXPECT_NE(log.getTimeOfLastChange(), first);
    EXPECT_NE(log.getTimeWhenOutdated(), first);
}

TEST(MgmtHwLogTest, CopiesKeepEveryField)
{
    MgmtHwLog log;
    log.setName("n");
    log.setElementName("e");
    log.setNode(4);
    log.maxNumberOfRecords = 9;
    log.currentNumberOfRecords = 3;
    log.overwritePolicy = 7;
    log.enabledState = 2;
    log.requestedState = 11;
    MgmtHwLog copy = log;
    EXPECT_EQ(copy.getName(), "n");
    EXPECT_EQ(copy.getElementName(), "e");
    EXPECT_EQ(copy.getNode(), 4);
    EXPECT_EQ(copy.maxNumberOfRecords, 9u);
    EXPECT_EQ(copy.currentNumberOfRecords, 3u);
    EXPECT_EQ(copy.overwritePolicy, 7);
    EXPECT_EQ(copy.requestedState, 11);
    EXPECT_EQ(copy.getStatus(), "OK");
}

TEST(MgmtHwLogEntryTest, FixedAnswersWhateverTheData)
{
    MgmtHwLogEntry entry;
    entry.recordData = "ff ff";
    entry.messageTimestamp = "20260101000000.000000+000";
    EXPECT_EQ(entry.getMessageTimestampstr(), "04:48:11");
    EXPECT_EQ(entry.getMessageDatestampstr(), "2008-05-23");
    EXPECT_EQ(entry.getSource(), "IPMI");
    EXPECT_EQ(entry.getOriginalRecordData(),
              "On/Off Source assert State Asserted");
    EXPECT_EQ(entry.getSeverity(), "");
    EXPECT_EQ(entry.getSeverityNumber(), 0);
}

TEST(MgmtHwLogEntryTest, EmptyNamesAndDescriptionsAreRefused)
{
    MgmtHwLogEntry entry;
    EXPECT_FALSE(entry.setElementName(""));
    EXPECT_EQ(entry.getElementName(), "");
    EXPECT_FALSE(entry.setDescription(""));
    EXPECT_EQ(entry.getDescription(), "");
    EXPECT_TRUE(entry.setElementName("  IPMI:/bmc0/sel/entry-00001  "));
    EXPECT_EQ(entry.getElementName(), "IPMI:/bmc0/sel/entry-00001");
    EXPECT_TRUE(entry.setDescription(" x "));
    EXPECT_EQ(entry.getDescription(), "x");
}

TEST(MgmtHwLogEntryTest, CopiesKeepAllFields)
{
    MgmtHwLogEntry entry;
    entry.setElementName("p");
    entry.setDescription("d");
    entry.setNode(3);
    entry.recordID = "12";
    entry.logName = "IPMI SEL Log";
    entry.recordData = "00 11";
    entry.dataFormat = "hex";
    entry.messageTimestamp = "20110102030405.000000+000";
    MgmtHwLogEntry copy;
    copy = entry;
    EXPECT_EQ(copy.getElementName(), "p");
    EXPECT_EQ(copy.getDescription(), "d");
    EXPECT_EQ(copy.getNode(), 3);
    EXPECT_EQ(copy.recordID, "12");
    EXPECT_EQ(copy.logName, "IPMI SEL Log");
    EXPECT_EQ(copy.recordData, "00 11");
    EXPECT_EQ(copy.dataFormat, "hex");
    EXPECT_EQ(copy.messageTimestamp, "20110102030405.000000+000");
}

} // namespace
