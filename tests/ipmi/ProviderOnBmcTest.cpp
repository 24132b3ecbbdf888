// The provider through its exported entry points on OpenIPMI's simulated
// BMC, checked against ipmitool's view of the same SEL.

#include "BmcFixture.h"
#include "Instrumentation.h"
#include "NodeLexicon.h"

#include <chrono>
#include <ctime>
#include <future>
#include <map>
#include <sstream>
#include <thread>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

using bmctest::BmcTest;
using bmctest::number;
using bmctest::text;
using namespace QX::NodeLexicon;
using ::testing::HasSubstr;

// "MM/DD/YY | hh:mm:ss" of ipmitool's sel list, as the CIM datetime text
// the provider reports: "20YYMMDDhhmmss.000000+000".
std::map<unsigned, std::string> ipmitoolTimes(const std::string& list)
{
    std::map<unsigned, std::string> times;
    std::istringstream lines(list);
    std::string line;
    while (std::getline(lines, line))
    {
        std::istringstream fields(line);
        std::string id, bar1, date, bar2, time;
        if (!(fields >> id >> bar1 >> date >> bar2 >> time) || date.size() != 8)
        {
            continue;
        }
        const std::string cim = "20" + date.substr(6, 2) + date.substr(0, 2) +
                                date.substr(3, 2) + time.substr(0, 2) +
                                time.substr(3, 2) + time.substr(6, 2) +
                                ".000000+000";
        times[static_cast<unsigned>(std::stoul(id, nullptr, 16))] = cim;
    }
    return times;
}

unsigned logStatus()
{
    QX::Instrumentation cursor;
    cursor.selectNode(EventLog);
    return cursor ? cursor.getNodeStatus() : 0;
}

bmcsim::Options sampleSel()
{
    bmcsim::Options options;
    options.records = bmcsim::fixtureRecords("");
    options.sensors = bmcsim::sampleSensors();
    return options;
}

TEST_F(BmcTest, EntriesAreTheRecordsIpmitoolReads)
{
    start(sampleSel());
    const auto outcome = enumerate("ZAN_MgmtHwLogEntry");
    ASSERT_EQ(outcome.rc, CMPI_RC_OK);
    const auto expected = ipmitoolRecords();
    ASSERT_EQ(expected.size(), bmcsim::fixtureRecords("").size());
    ASSERT_EQ(outcome.instances.size(), expected.size());
    const auto times = ipmitoolTimes(ipmitool("sel list"));
    for (std::size_t i = 0; i < expected.size(); ++i)
    {
        const host::Instance& entry = outcome.instances[i];
        EXPECT_EQ(text(entry, "RecordID"), std::to_string(expected[i].id));
        EXPECT_EQ(text(entry, "RecordData"), expected[i].bytes);
        EXPECT_EQ(text(entry, "MessageTimestamp"), times.at(expected[i].id));
        EXPECT_EQ(text(entry, "LogName"), "IPMI SEL Log");
        EXPECT_FALSE(text(entry, "Description").empty());
    }
    // Sensor names come from the BMC's SDR.
    EXPECT_THAT(text(outcome.instances[2], "Description"),
                HasSubstr("CPU1 Temp"));
    EXPECT_THAT(text(outcome.instances[12], "Description"),
                HasSubstr("Hard Reset"));
}

TEST_F(BmcTest, LogReportsTheBmcsSelSizeAndFill)
{
    bmcsim::Options options = sampleSel();
    options.maxRecords = 40; // more than the sample holds
    start(options);
    const auto outcome = enumerate("ZAN_MgmtHwLog");
    ASSERT_EQ(outcome.rc, CMPI_RC_OK);
    ASSERT_EQ(outcome.instances.size(), 1u);
    const host::Instance& log = outcome.instances[0];
    EXPECT_EQ(text(log, "Name"), "IPMI SEL Log");
    EXPECT_EQ(number(log, "MaxNumberOfRecords"), 40u);
    EXPECT_EQ(number(log, "CurrentNumberOfRecords"),
              bmcsim::fixtureRecords("").size());
    EXPECT_EQ(number(log, "OverWritePolicy"), 7u); // never overwrites
    EXPECT_EQ(number(log, "EnabledState"), 2u);
    EXPECT_EQ(logStatus(), 1u);
}

TEST_F(BmcTest, ClearLogEmptiesTheBmcsSel)
{
    start(sampleSel());
    ASSERT_FALSE(enumerate("ZAN_MgmtHwLogEntry").instances.empty());
    const auto outcome = clearLog();
    EXPECT_EQ(outcome.rc, CMPI_RC_OK);
    EXPECT_EQ(ipmitoolEntries(), 0u);
    EXPECT_TRUE(enumerate("ZAN_MgmtHwLogEntry").instances.empty());
    EXPECT_EQ(logStatus(), EventLogStatusCleared);
}

TEST_F(BmcTest, FullSelReportsStatus24AndFillingSelStatus21)
{
    bmcsim::Options options;
    options.maxRecords = 8;
    options.records = bmcsim::generatedRecords(
        6, 1, static_cast<std::uint32_t>(std::time(nullptr)));
    start(options);
    EXPECT_EQ(logStatus(), EventLogStatusAlmostFull); // 6 of 8: 75 %
    bmc().addRecords(bmcsim::generatedRecords(2, 7, 0x60000000));
    EXPECT_EQ(logStatus(), EventLogStatusFull);
    EXPECT_THROW(bmc().addRecords(bmcsim::generatedRecords(1, 9, 0x60000000)),
                 std::runtime_error);
    EXPECT_EQ(logStatus(), EventLogStatusFull);
    EXPECT_EQ(enumerate("ZAN_MgmtHwLogEntry").instances.size(), 8u);
}

TEST_F(BmcTest, PreInitTimestampsAreTheUnknownTime)
{
    bmcsim::Options options;
    options.setSelTime = false; // the simulator's clock counts from start
    start(options);
    bmc().addRecords(bmcsim::generatedRecords(2, 1, 0x60000000));
    EXPECT_THAT(ipmitool("sel list"), HasSubstr("Pre-Init"));
    const auto outcome = enumerate("ZAN_MgmtHwLogEntry");
    ASSERT_EQ(outcome.instances.size(), 2u);
    for (const host::Instance& entry : outcome.instances)
    {
        EXPECT_EQ(text(entry, "MessageTimestamp"), "99990101000000.000000+000");
    }
}

TEST_F(BmcTest, OnlyTheLogClearedRecordCountsAsEmpty)
{
    bmcsim::Options options;
    options.records = {
        bmcsim::parseRecord("01 00 02 1a 83 e5 65 20 00 04 10 01 6f 02 ff ff")};
    options.lastEraseTime = 0x65e5831a;
    start(options);
    QX::Instrumentation cursor;
    cursor.selectNode(EventLog);
    ASSERT_TRUE(cursor);
    bool empty = false;
    ASSERT_TRUE(cursor.getProperty(IsEmpty, empty));
    EXPECT_TRUE(empty);
    EXPECT_EQ(cursor.getNodeStatus(), EventLogStatusCleared);
    EXPECT_EQ(enumerate("ZAN_MgmtHwLogEntry").instances.size(), 1u);
}

TEST_F(BmcTest, RecordIdsStartingAgainAfterABmcRestartKeepSelOrder)
{
    bmcsim::Options options;
    options.records = bmcsim::generatedRecords(
        3, 5001, static_cast<std::uint32_t>(std::time(nullptr)) - 10);
    start(options);
    ASSERT_EQ(enumerate("ZAN_MgmtHwLogEntry").instances.size(), 3u);
    bmc().restart();
    const auto ids =
        bmc().addRecords(bmcsim::generatedRecords(2, 1, 0x60000000));
    ASSERT_EQ(ids, (std::vector<std::uint16_t>{1, 2}));

    // The session died with the old simulator: the first request may fail.
    enumerate("ZAN_MgmtHwLogEntry");
    const auto outcome = enumerate("ZAN_MgmtHwLogEntry");
    const auto expected = ipmitoolRecords();
    ASSERT_EQ(outcome.instances.size(), 5u);
    ASSERT_EQ(expected.size(), 5u);
    for (std::size_t i = 0; i < expected.size(); ++i)
    {
        EXPECT_EQ(text(outcome.instances[i], "RecordID"),
                  std::to_string(expected[i].id));
    }
    EXPECT_EQ(text(outcome.instances[3], "ElementName"),
              "IPMI:/bmc0/sel/entry-r00001-00001");
}

TEST_F(BmcTest, AddedRecordsShowUpInTheNextRequest)
{
    start(sampleSel());
    const std::size_t before = bmcsim::fixtureRecords("").size();
    ASSERT_EQ(enumerate("ZAN_MgmtHwLogEntry").instances.size(), before);
    bmc().addRecords(bmcsim::generatedRecords(
        3, 1, static_cast<std::uint32_t>(std::time(nullptr))));
    const auto outcome = enumerate("ZAN_MgmtHwLogEntry");
    ASSERT_EQ(outcome.instances.size(), before + 3);
    EXPECT_EQ(text(outcome.instances.back(), "RecordID"),
              std::to_string(ipmitoolRecords().back().id));
}

TEST_F(BmcTest, BmcWithoutRestartCauseGivesNoRestartCause)
{
    bmcsim::Options plain = sampleSel();
    plain.restartModule = false; // the simulator as OpenIPMI ships it
    start(plain);
    QX::Instrumentation cursor;
    cursor.selectNode(Watchdog);
    ASSERT_TRUE(cursor);
    unsigned cause = 77;
    EXPECT_FALSE(cursor.getProperty(RestartCause, cause));
    EXPECT_EQ(cause, 77u);
}

// Freezes or kills the simulator while an enumeration reads a SEL long
// enough to be caught in the middle.
class BmcFaultTest : public BmcTest
{
  protected:
    static constexpr unsigned timeoutMs = 1500;
    // Large enough that reading it takes about a second on an idle
    // machine, so the fault lands in the middle of the walk.
    static constexpr unsigned records = 8000;

    void SetUp() override
    {
        BmcTest::SetUp();
        if (IsSkipped())
        {
            return;
        }
        bmcsim::Options options;
        options.maxRecords = records + 10;
        options.records = bmcsim::generatedRecords(
            records, 1, static_cast<std::uint32_t>(std::time(nullptr)));
        start(options, timeoutMs);
    }

    // Starts an enumeration, does @p fault mid-request, and checks that
    // the request ends within the timeout with the gatherer's failure.
    template <typename Fault>
    void expectFailedRequest(Fault fault, const std::string& reason)
    {
        ::testing::internal::CaptureStderr();
        auto request = std::async(
            std::launch::async,
            [this]
            {
                const auto began = std::chrono::steady_clock::now();
                auto outcome = enumerate("ZAN_MgmtHwLogEntry");
                return std::make_pair(outcome,
                                      std::chrono::steady_clock::now() - began);
            });
        std::this_thread::sleep_for(std::chrono::milliseconds(200));
        const auto faultAt = std::chrono::steady_clock::now();
        fault();
        const auto [outcome, took] = request.get();
        const auto afterFault = std::chrono::steady_clock::now() - faultAt;
        const std::string stderrText = ::testing::internal::GetCapturedStderr();
        EXPECT_EQ(outcome.rc, CMPI_RC_OK);
        EXPECT_TRUE(outcome.instances.empty())
            << "the request finished before the fault ("
            << std::chrono::duration_cast<std::chrono::milliseconds>(took)
                   .count()
            << " ms)";
        EXPECT_THAT(stderrText, HasSubstr(reason));
        EXPECT_LT(afterFault, std::chrono::milliseconds(timeoutMs + 1000));
    }
};

TEST_F(BmcFaultTest, FrozenBmcEndsTheRequestWithinTheTimeout)
{
    expectFailedRequest([this] { bmc().freeze(); }, "timeout");
    bmc().thaw();
    EXPECT_EQ(enumerate("ZAN_MgmtHwLogEntry").instances.size(), records);
}

TEST_F(BmcFaultTest, KilledBmcEndsTheRequestAndARestartedOneServes)
{
    // A dead simulator may also be noticed by the socket ("system error").
    expectFailedRequest([this] { bmc().kill(); }, "ipmi_cmd_");
    bmc().restart();
    EXPECT_EQ(enumerate("ZAN_MgmtHwLogEntry").instances.size(), records);
}

} // namespace
