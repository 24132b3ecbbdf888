#include "PlatformFixture.h"
#include "SEL.h"

#include <gtest/gtest.h>

namespace
{

using namespace QX::NodeLexicon;
using QX::SELComposite::EntryMap;
using QX::SELComposite::LogMap;
using testsupport::addEntry;
using testsupport::PlatformTest;
using testsupport::standardTree;

class GatheringTest : public PlatformTest
{
};

TEST_F(GatheringTest, LogCountsItsEntries)
{
    install(standardTree(125, 500));
    LogMap logs;
    ASSERT_EQ(QX::SELComposite::getMgmtHwLogInstances(logs), 0);
    ASSERT_EQ(logs.size(), 1u);
    auto& log = logs.at("IPMI SEL Log");
    EXPECT_EQ(log.getName(), "IPMI SEL Log");
    EXPECT_EQ(log.getElementName(), "IPMI SEL Log");
    EXPECT_EQ(log.maxNumberOfRecords, 500u);
    EXPECT_EQ(log.currentNumberOfRecords, 125u);
    EXPECT_EQ(log.getPercentageNearFull(), 25);
    EXPECT_EQ(log.getNode(), 1);
    EXPECT_EQ(log.overwritePolicy, 2);
    EXPECT_EQ(log.enabledState, 2);
    EXPECT_EQ(log.requestedState, 2);
    EXPECT_EQ(log.getStatus(), "OK");
}

TEST_F(GatheringTest, EntryAndExitTracesOfTheLogWalk)
{
    install(standardTree(1));
    LogMap logs;
    ASSERT_EQ(QX::SELComposite::getMgmtHwLogInstances(logs), 0);
    const auto entering = recordsContaining(
        "ENTERING: getMgmtHwLogInstances() in SEL.cpp [Line: 364]");
    const auto exiting = recordsContaining(
        "EXITING: getMgmtHwLogInstances() in SEL.cpp [Line: 540]");
    ASSERT_EQ(entering.size(), 2u);
    ASSERT_EQ(exiting.size(), 2u);
    EXPECT_EQ(entering[0].channel, CVLog::Channel::Log);
    EXPECT_EQ(entering[1].channel, CVLog::Channel::Trace);
    EXPECT_EQ(entering[0].level, 4000);
    EXPECT_EQ(entering[0].line, 364);
    EXPECT_EQ(entering[0].file, "SEL.cpp");
    EXPECT_EQ(entering[0].component, "Corvane.SELProvider");
    EXPECT_EQ(exiting[1].line, 540);
}

QX::NodeTreeBuilder twoLogs(bool firstNamed, bool secondNamed,
                            const std::string& secondName = "Second")
{
    QX::NodeTreeBuilder tree;
    tree.addNode(ManagementController, "/bmc0", "", "BMC", 1);
    tree.addNode(EventLog, "/bmc0/a", "/bmc0", "first", 1);
    tree.addNode(EventLog, "/bmc0/b", "/bmc0", "second", 12);
    if (firstNamed)
    {
        tree.setProperty("/bmc0/a", Name, std::string("First"));
    }
    if (secondNamed)
    {
        tree.setProperty("/bmc0/b", Name, secondName);
    }
    tree.setProperty("/bmc0/a", MaxRecords, 10u);
    tree.setProperty("/bmc0/b", MaxRecords, 20u);
    addEntry(tree, "/bmc0/a", 1, "2011-01-02 03:04:05");
    addEntry(tree, "/bmc0/b", 1, "2011-01-02 03:04:05");
    addEntry(tree, "/bmc0/b", 2, "2011-01-02 03:04:06");
    return tree;
}

TEST_F(GatheringTest, TwoNamedLogsGiveTwoRecordsWithOrdinals)
{
    install(twoLogs(true, true));
    LogMap logs;
    ASSERT_EQ(QX::SELComposite::getMgmtHwLogInstances(logs), 0);
    ASSERT_EQ(logs.size(), 2u);
    EXPECT_EQ(logs.at("First").getNode(), 1);
    EXPECT_EQ(logs.at("First").currentNumberOfRecords, 1u);
    EXPECT_EQ(logs.at("Second").getNode(), 2);
    EXPECT_EQ(logs.at("Second").currentNumberOfRecords, 2u);
    EXPECT_EQ(logs.at("Second").enabledState, 6);
}

TEST_F(GatheringTest, UnnamedLogReplacesThePreviousOne)
{
    install(twoLogs(true, false));
    LogMap logs;
    ASSERT_EQ(QX::SELComposite::getMgmtHwLogInstances(logs), 0);
    ASSERT_EQ(logs.size(), 1u);
    auto& log = logs.at("First");
    EXPECT_EQ(log.getNode(), 2) << "the second log's record";
    EXPECT_EQ(log.getName(), "") << "its names were never read";
    EXPECT_EQ(log.maxNumberOfRecords, 20u);
}

TEST_F(GatheringTest, SharedNameKeepsTheLaterLog)
{
    install(twoLogs(true, true, "First"));
    LogMap logs;
    ASSERT_EQ(QX::SELComposite::getMgmtHwLogInstances(logs), 0);
    ASSERT_EQ(logs.size(), 1u);
    EXPECT_EQ(logs.at("First").getNode(), 2);
}

TEST_F(GatheringTest, TwoUnnamedLogsShareTheEmptyKey)
{
    install(twoLogs(false, false));
    LogMap logs;
    ASSERT_EQ(QX::SELComposite::getMgmtHwLogInstances(logs), 0);
    ASSERT_EQ(logs.size(), 1u);
    EXPECT_EQ(logs.at("").getNode(), 2);
}

TEST_F(GatheringTest, OverwritePolicyMapping)
{
    const std::pair<unsigned, std::uint16_t> cases[] = {
        {0, 0}, {1, 2}, {2, 7}, {3, 0}, {4294967295u, 0}};
    for (const auto& [raw, expected] : cases)
    {
        auto tree = standardTree(1);
        tree.setProperty("/bmc0/sel", OverwritePolicy, raw);
        install(tree);
        LogMap logs;
        ASSERT_EQ(QX::SELComposite::getMgmtHwLogInstances(logs), 0);
        EXPECT_EQ(logs.at("IPMI SEL Log").overwritePolicy, expected)
            << "raw " << raw;
    }
}

TEST_F(GatheringTest, MissingPropertiesKeepDefaults)
{
    auto tree = standardTree(1);
    tree.removeProperty("/bmc0/sel", OverwritePolicy);
    tree.removeProperty("/bmc0/sel", MaxRecords);
    install(tree);
    LogMap logs;
    ASSERT_EQ(QX::SELComposite::getMgmtHwLogInstances(logs), 0);
    EXPECT_EQ(logs.at("IPMI SEL Log").overwritePolicy, 0);
    EXPECT_EQ(logs.at("IPMI SEL Log").maxNumberOfRecords, 0u);
}

class NodeStatusMapping :
    public PlatformTest,
    public ::testing::WithParamInterface<
        std::tuple<unsigned, std::uint16_t, std::uint16_t>>
{
};

TEST_P(NodeStatusMapping, MapsToEnabledAndRequestedState)
{
    const auto [status, enabled, requested] = GetParam();
    auto tree = standardTree(0);
    tree.setStatus("/bmc0/sel", status);
    install(tree);
    LogMap logs;
    ASSERT_EQ(QX::SELComposite::getMgmtHwLogInstances(logs), 0);
    EXPECT_EQ(logs.at("IPMI SEL Log").enabledState, enabled);
    EXPECT_EQ(logs.at("IPMI SEL Log").requestedState, requested);
}

INSTANTIATE_TEST_SUITE_P(
    AllStatuses, NodeStatusMapping,
    ::testing::Values(std::make_tuple(0u, 0, 0), std::make_tuple(1u, 2, 2),
                      std::make_tuple(2u, 10, 12), std::make_tuple(3u, 5, 12),
                      std::make_tuple(4u, 5, 12), std::make_tuple(5u, 5, 12),
                      std::make_tuple(6u, 5, 12), std::make_tuple(7u, 5, 12),
                      std::make_tuple(8u, 5, 12), std::make_tuple(9u, 5, 11),
                      std::make_tuple(10u, 5, 12), std::make_tuple(11u, 5, 12),
                      std::make_tuple(12u, 6, 6), std::make_tuple(13u, 5, 12),
                      std::make_tuple(14u, 5, 12), std::make_tuple(15u, 5, 12),
                      std::make_tuple(16u, 3, 3), std::make_tuple(17u, 5, 12),
                      std::make_tuple(40u, 5, 12),
                      std::make_tuple(4294967295u, 5, 12)));

TEST_F(GatheringTest, NoControllerLeavesTheMapsUntouched)
{
    QX::NodeTreeBuilder tree;
    tree.addNode(EventLog, "/sel", "", "orphan", 1);
    install(tree);
    LogMap logs;
    logs["kept"] = QX::SELComposite::MgmtHwLog();
    EntryMap entries;
    EXPECT_EQ(QX::SELComposite::getMgmtHwLogInstances(logs), 1);
    EXPECT_EQ(QX::SELComposite::getMgmtHwLogEntryInstances(entries), 1);
    EXPECT_EQ(logs.size(), 1u);
    EXPECT_TRUE(entries.empty());
    EXPECT_EQ(recordsContaining("EXITING: getMgmtHwLogInstances()").size(), 2u);
    EXPECT_EQ(
        recordsContaining("EXITING: getMgmtHwLogEntryInstances() in SEL.cpp "
                          "[Line: 682]")
            .size(),
        2u);
}

TEST_F(GatheringTest, NoLogGivesStatusOne)
{
    QX::NodeTreeBuilder tree;
    tree.addNode(ManagementController, "/bmc0", "", "BMC", 1);
    install(tree);
    LogMap logs;
    EntryMap entries;
    EXPECT_EQ(QX::SELComposite::getMgmtHwLogInstances(logs), 1);
    EXPECT_EQ(QX::SELComposite::getMgmtHwLogEntryInstances(entries), 1);
    EXPECT_TRUE(logs.empty());
}

TEST_F(GatheringTest, LogWithoutEntriesGivesStatusOneForEntries)
{
    install(standardTree(0));
    EntryMap entries;
    EXPECT_EQ(QX::SELComposite::getMgmtHwLogEntryInstances(entries), 1);
    EXPECT_TRUE(entries.empty());
    LogMap logs;
    EXPECT_EQ(QX::SELComposite::getMgmtHwLogInstances(logs), 0);
    EXPECT_EQ(logs.at("IPMI SEL Log").currentNumberOfRecords, 0u);
}

TEST_F(GatheringTest, EntriesCarryTheirFields)
{
    auto tree = standardTree(0);
    addEntry(tree, "/bmc0/sel", 7, "2008-05-23 04:48:11", "Fan FAN3 low");
    addEntry(tree, "/bmc0/sel", 9, "2011-01-02 03:04:05", "Voltage 12V low");
    install(tree);
    EntryMap entries;
    ASSERT_EQ(QX::SELComposite::getMgmtHwLogEntryInstances(entries), 0);
    ASSERT_EQ(entries.size(), 2u);
    const std::string key = source->printablePath("/bmc0/sel/entry-00007");
    auto& entry = entries.at(key);
    EXPECT_EQ(entry.getElementName(), key);
    EXPECT_EQ(entry.getDescription(), "Fan FAN3 low");
    EXPECT_EQ(entry.getNode(), 1);
    EXPECT_EQ(entry.recordID, "7");
    EXPECT_EQ(entry.logName, "IPMI SEL Log");
    EXPECT_EQ(entry.dataFormat, "hex bytes");
    EXPECT_EQ(entry.recordData,
              "01 00 02 00 00 00 00 20 00 04 01 30 01 59 50 52");
    EXPECT_EQ(entry.messageTimestamp, "20080523044811.000000+000");
    EXPECT_EQ(
        entries.at(source->printablePath("/bmc0/sel/entry-00009")).getNode(),
        2);
}

TEST_F(GatheringTest, EntryWalkTraces)
{
    install(standardTree(2));
    EntryMap entries;
    ASSERT_EQ(QX::SELComposite::getMgmtHwLogEntryInstances(entries), 0);
    EXPECT_EQ(recordsContaining("ENTERING: getMgmtHwLogEntryInstances() in "
                                "SEL.cpp [Line: 548]")
                  .size(),
              2u);
    EXPECT_EQ(recordsContaining("EXITING: getMgmtHwLogEntryInstances() in "
                                "SEL.cpp [Line: 682]")
                  .size(),
              2u);
}

TEST_F(GatheringTest, FailedEntryReadsLeaveFieldsEmpty)
{
    auto tree = standardTree(1);
    const std::string path = QX::MemorySource::entryPath("/bmc0/sel", 1);
    tree.removeProperty(path, RecordId);
    tree.removeProperty(path, RecordData);
    tree.removeProperty(path, Timestamp);
    tree.removeProperty("/bmc0/sel", DataFormat);
    tree.removeProperty("/bmc0/sel", Name);
    install(tree);
    EntryMap entries;
    ASSERT_EQ(QX::SELComposite::getMgmtHwLogEntryInstances(entries), 0);
    auto& entry = entries.begin()->second;
    EXPECT_EQ(entry.recordID, "");
    EXPECT_EQ(entry.recordData, "");
    EXPECT_EQ(entry.dataFormat, "");
    EXPECT_EQ(entry.messageTimestamp, "");
    EXPECT_EQ(entry.logName, "");
}

TEST_F(GatheringTest, EmptyDescriptionStopsTheEntryWalk)
{
    auto tree = standardTree(0);
    addEntry(tree, "/bmc0/sel", 1, "2011-01-02 03:04:05", "first");
    addEntry(tree, "/bmc0/sel", 2, "2011-01-02 03:04:05", "");
    addEntry(tree, "/bmc0/sel", 3, "2011-01-02 03:04:05", "third");
    install(tree);
    EntryMap entries;
    ::testing::internal::CaptureStderr();
    const int status = QX::SELComposite::getMgmtHwLogEntryInstances(entries);
    const std::string err = ::testing::internal::GetCapturedStderr();
    EXPECT_EQ(status, 1);
    EXPECT_EQ(err, "Failed while setting Description\n");
    ASSERT_EQ(entries.size(), 1u);
    EXPECT_EQ(entries.begin()->second.getDescription(), "first");
    EXPECT_TRUE(
        recordsContaining("EXITING: getMgmtHwLogEntryInstances()").empty())
        << "an exception skips the exit trace";
}

TEST_F(GatheringTest, InstrumentationExceptionIsReportedAndStopsTheWalk)
{
    install(standardTree(5));
    // Each entry reads three properties; fail the fifth read overall.
    source->armFault(
        {QX::CursorOperation::GetProperty, 4, false, "BMC stopped answering"});
    EntryMap entries;
    ::testing::internal::CaptureStderr();
    const int status = QX::SELComposite::getMgmtHwLogEntryInstances(entries);
    const std::string err = ::testing::internal::GetCapturedStderr();
    EXPECT_EQ(status, 1);
    EXPECT_EQ(err, "BMC stopped answering\n");
    EXPECT_LE(entries.size(), 1u);
}

TEST_F(GatheringTest, FaultInTheLogWalkReturnsOne)
{
    install(standardTree(3));
    source->armFault({QX::CursorOperation::Next, 0, false, "step failed"});
    LogMap logs;
    ::testing::internal::CaptureStderr();
    EXPECT_EQ(QX::SELComposite::getMgmtHwLogInstances(logs), 1);
    EXPECT_EQ(::testing::internal::GetCapturedStderr(), "step failed\n");
}

TEST_F(GatheringTest, EntryKeysSortInRecordOrder)
{
    install(standardTree(12));
    EntryMap entries;
    ASSERT_EQ(QX::SELComposite::getMgmtHwLogEntryInstances(entries), 0);
    unsigned expected = 1;
    for (auto& [key, entry] : entries)
    {
        EXPECT_EQ(entry.recordID, std::to_string(expected)) << key;
        EXPECT_EQ(entry.getNode(), expected);
        ++expected;
    }
}

TEST_F(GatheringTest, ExistingKeysAreReplacedNotKept)
{
    install(standardTree(1));
    EntryMap entries;
    const std::string key =
        source->printablePath(QX::MemorySource::entryPath("/bmc0/sel", 1));
    entries[key].recordID = "stale";
    entries["IPMI:/other"].recordID = "other";
    ASSERT_EQ(QX::SELComposite::getMgmtHwLogEntryInstances(entries), 0);
    EXPECT_EQ(entries.at(key).recordID, "1");
    EXPECT_EQ(entries.at("IPMI:/other").recordID, "other");
}

TEST_F(GatheringTest, ClearLogEmptiesTheLog)
{
    install(standardTree(4));
    EXPECT_EQ(QX::SELComposite::clearLog(), 0);
    EXPECT_EQ(source->acceptedWrites(), 1u);
    LogMap logs;
    ASSERT_EQ(QX::SELComposite::getMgmtHwLogInstances(logs), 0);
    EXPECT_EQ(logs.at("IPMI SEL Log").currentNumberOfRecords, 0u);
    EXPECT_TRUE(recordsContaining("Failed to Clear Log").empty());
}

TEST_F(GatheringTest, RefusedClearReturnsTwoAndLogsAtLevel6000)
{
    install(standardTree(4));
    source->refuseWrites(true);
    EXPECT_EQ(QX::SELComposite::clearLog(), 2);
    const auto lines = recordsContaining("Failed to Clear Log");
    ASSERT_EQ(lines.size(), 2u);
    EXPECT_EQ(lines[0].message,
              "MESSAGE [File: SEL.cpp, Line: 697]: Failed to Clear Log\n");
    EXPECT_EQ(lines[0].level, 6000);
    EXPECT_EQ(lines[0].function, "clearLog");
    EXPECT_EQ(lines[0].channel, CVLog::Channel::Log);
    EXPECT_EQ(lines[1].channel, CVLog::Channel::Trace);
}

TEST_F(GatheringTest, ClearWithoutControllerIsRefused)
{
    QX::NodeTreeBuilder tree;
    install(tree);
    EXPECT_EQ(QX::SELComposite::clearLog(), 2);
}

TEST(ConvertUintToString, Extremes)
{
    EXPECT_EQ(QX::SELComposite::convertUintToString(0), "0");
    EXPECT_EQ(QX::SELComposite::convertUintToString(4294967295u), "4294967295");
    EXPECT_EQ(QX::SELComposite::convertUintToString(100), "100");
}

TEST(ConvertTimestamp, Forms)
{
    using QX::SELComposite::convertTimestampToCIM;
    EXPECT_EQ(convertTimestampToCIM("2011-01-02 03:04:05"),
              "20110102030405.000000+000");
    EXPECT_EQ(convertTimestampToCIM("2008-05-23 04:48:11"),
              "20080523044811.000000+000");
    EXPECT_EQ(convertTimestampToCIM("20110102030405"),
              "20110102030405.000000+000");
    EXPECT_EQ(convertTimestampToCIM(""), ".000000+000");
    EXPECT_EQ(convertTimestampToCIM("--::  2011--01"), "201101.000000+000");
}

TEST(ConvertTimestamp, LongTextsAreCutTo63Characters)
{
    const std::string longText(200, '7');
    EXPECT_EQ(QX::SELComposite::convertTimestampToCIM(longText),
              std::string(63, '7') + ".000000+000");
}

} // namespace
