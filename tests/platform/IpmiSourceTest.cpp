#include "ipmi/IpmiSource.h"

#include "CVLogger.h"
#include "Instrumentation.h"
#include "platform/CapturedLog.h"
#include "platform/FakeBmc.h"

#include <atomic>
#include <chrono>
#include <future>
#include <thread>

#include <gtest/gtest.h>

using namespace QX;
using namespace QX::Ipmi;
using namespace QX::NodeLexicon;
using QX::test::CountingDescriber;
using QX::test::FakeBmc;
using QX::test::logClearedRecord;
using QX::test::selRecord;

namespace
{

void ignoreAlert(unsigned, DateTime, std::string, const void*) {}

class IpmiSourceTest : public ::testing::Test
{
  protected:
    // The source owns its BMC; the test keeps a pointer to steer it.
    void make(const Settings& settings = {})
    {
        auto fake = std::make_unique<FakeBmc>();
        bmc = fake.get();
        for (const auto& record : initial)
        {
            bmc->add(record);
        }
        source = std::make_shared<IpmiSource>(
            std::move(fake), std::make_unique<CountingDescriber>(), settings,
            "BMC");
    }

    struct Log
    {
        unsigned status = 0;
        unsigned maxRecords = 0;
        unsigned overwritePolicy = 0;
        bool isEmpty = false;
    };
    Log log()
    {
        Instrumentation cursor(source);
        cursor.selectNode(EventLog);
        EXPECT_TRUE(cursor);
        Log result;
        result.status = cursor.getNodeStatus();
        EXPECT_TRUE(cursor.getProperty(MaxRecords, result.maxRecords));
        EXPECT_TRUE(
            cursor.getProperty(OverwritePolicy, result.overwritePolicy));
        EXPECT_TRUE(cursor.getProperty(IsEmpty, result.isEmpty));
        return result;
    }

    QX::test::CapturedLog captured;
    std::vector<Ipmi::SelRecordBytes> initial;
    FakeBmc* bmc = nullptr;
    std::shared_ptr<IpmiSource> source;
};

TEST_F(IpmiSourceTest, TreeHasControllerLogEntriesAndWatchdog)
{
    initial = {selRecord(1), selRecord(2, 0x17c)};
    make();
    Instrumentation cursor(source);
    cursor.selectNode(ManagementController);
    ASSERT_TRUE(cursor);
    EXPECT_EQ(cursor.getPathToNode(), "/bmc0");
    cursor.selectNode(EventLog);
    std::string text;
    ASSERT_TRUE(cursor.getProperty(Name, text));
    EXPECT_EQ(text, "IPMI SEL Log");
    ASSERT_TRUE(cursor.getProperty(DataFormat, text));
    EXPECT_FALSE(text.empty());

    cursor.selectNode(EventLogEntry);
    ASSERT_TRUE(cursor);
    EXPECT_EQ(cursor.getPathToNode(), "/bmc0/sel/entry-00001");
    EXPECT_EQ(cursor.convertPathToString(cursor.getPathToNode()),
              "IPMI:/bmc0/sel/entry-00001");
    EXPECT_EQ(cursor.getNodeDescription(), "event 1");
    unsigned id = 0;
    ASSERT_TRUE(cursor.getProperty(RecordId, id));
    EXPECT_EQ(id, 1u);
    ASSERT_TRUE(cursor.getProperty(RecordData, text));
    EXPECT_EQ(text, "01 00 02 1a 83 e5 65 20 00 04 01 30 01 57 52 50");
    ASSERT_TRUE(cursor.getProperty(Timestamp, text));
    EXPECT_EQ(text, "2024-03-04 08:15:22");
    ++cursor;
    ASSERT_TRUE(cursor.getProperty(Timestamp, text));
    EXPECT_EQ(text, "9999-01-01 00:00:00");
    ++cursor;
    EXPECT_FALSE(cursor);

    cursor.selectNode(Watchdog);
    EXPECT_TRUE(cursor);
}

TEST_F(IpmiSourceTest, UnchangedSelGivesTheSameTree)
{
    initial = {selRecord(1), selRecord(2)};
    make();
    // Each snapshot stands for a request of its own: the first is let go.
    const NodeTree* const first = source->snapshot().get();
    bmc->resetCounters();
    const auto second = source->snapshot();
    EXPECT_EQ(second.get(), first);
    // Get SEL Info and the newest record.
    EXPECT_EQ(bmc->exchanges(), 2u);
}

TEST_F(IpmiSourceTest, CursorsOfOneRequestShareOneLookAtTheBmc)
{
    initial = {selRecord(1), selRecord(2)};
    make();
    source->snapshot();
    bmc->resetCounters();
    {
        Instrumentation logCursor(source);
        Instrumentation entryCursor(source);
        logCursor.selectNode(EventLog);
        entryCursor.selectNode(EventLogEntry);
        EXPECT_TRUE(entryCursor);
        // Get SEL Info and the newest record, for both cursors.
        EXPECT_EQ(bmc->exchanges(), 2u);
        // Another thread's request looks again.
        std::thread other(
            [this]
            {
                Instrumentation cursor(source);
                cursor.selectNode(EventLog);
            });
        other.join();
        EXPECT_EQ(bmc->exchanges(), 4u);
    }
    // The cursors are gone: the next request looks again and sees a
    // record added meanwhile.
    bmc->add(selRecord(3));
    Instrumentation next(source);
    next.selectNode(EventLogEntry);
    EXPECT_GT(bmc->exchanges(), 4u);
    unsigned entries = 0;
    for (; next; ++next)
    {
        ++entries;
    }
    EXPECT_EQ(entries, 3u);
}

TEST_F(IpmiSourceTest, ClearingTheLogEndsTheSharedLook)
{
    initial = {selRecord(1), selRecord(2)};
    make();
    Instrumentation held(source);
    held.selectNode(EventLogEntry);
    ASSERT_TRUE(held);
    ASSERT_TRUE(source->writeProperty(IpmiSource::controllerPath, Command,
                                      ClearEventLogCommand));
    Instrumentation after(source);
    after.selectNode(EventLogEntry);
    EXPECT_FALSE(after);
}

TEST_F(IpmiSourceTest, AddedRecordsExtendTheTree)
{
    initial = {selRecord(1)};
    make();
    // Each snapshot stands for a request of its own: the first is let go.
    const std::size_t before =
        source->snapshot()->nodesOfKind(EventLogEntry).size();
    bmc->add(selRecord(2));
    const auto after = source->snapshot();
    EXPECT_EQ(before, 1u);
    EXPECT_EQ(after->nodesOfKind(EventLogEntry).size(), 2u);
}

TEST_F(IpmiSourceTest, EntryPathsFollowSelOrderWhenIdsStartAgain)
{
    initial = {selRecord(5001), selRecord(5002), selRecord(1)};
    make();
    const auto tree = source->snapshot();
    std::vector<std::string> paths;
    for (const auto id : tree->nodesOfKind(EventLogEntry))
    {
        paths.push_back(tree->node(id).path);
    }
    EXPECT_EQ(paths, (std::vector<std::string>{
                         "/bmc0/sel/entry-05001", "/bmc0/sel/entry-05002",
                         "/bmc0/sel/entry-r00001-00001"}));
    EXPECT_TRUE(std::is_sorted(paths.begin(), paths.end()));
}

TEST_F(IpmiSourceTest, LogStatusFollowsTheFill)
{
    make();
    bmc->freeSpace = 8 * 16;
    for (std::uint16_t id = 1; id <= 5; ++id)
    {
        bmc->sel.push_back(selRecord(id));
    }
    ++bmc->lastAddition;
    // 5 of 13: normal.
    EXPECT_EQ(log().status, 1u);
    EXPECT_EQ(log().maxRecords, 13u);
    EXPECT_FALSE(log().isEmpty);
    EXPECT_EQ(log().overwritePolicy, 2u);

    // 10 of 13: at or above 75 %.
    for (std::uint16_t id = 6; id <= 10; ++id)
    {
        bmc->add(selRecord(id));
    }
    bmc->freeSpace = 3 * 16;
    EXPECT_EQ(log().status, EventLogStatusAlmostFull);

    // No room for another record.
    bmc->freeSpace = 0;
    ++bmc->lastAddition;
    EXPECT_EQ(log().status, EventLogStatusFull);
}

TEST_F(IpmiSourceTest, OverflowFlagMeansFull)
{
    initial = {selRecord(1)};
    make();
    bmc->overflow = true;
    EXPECT_EQ(log().status, EventLogStatusFull);
}

TEST_F(IpmiSourceTest, FreeSpaceOfAtLeast64KiBIsNotFull)
{
    initial = {selRecord(1)};
    make();
    bmc->freeSpace = 0xFFFF;
    EXPECT_EQ(log().maxRecords, 1u + 4095u);
    EXPECT_EQ(log().status, 1u);
}

TEST_F(IpmiSourceTest, ConfiguredCapacityAndWrappingWin)
{
    initial = {selRecord(1), selRecord(2)};
    Settings settings;
    settings.selCapacity = 4;
    settings.selWraps = true;
    settings.warningFillPercent = 50;
    make(settings);
    bmc->freeSpace = 160; // a wrapped 16-bit field would say anything
    EXPECT_EQ(log().maxRecords, 4u);
    EXPECT_EQ(log().overwritePolicy, 1u);
    EXPECT_EQ(log().status, EventLogStatusAlmostFull);
}

TEST_F(IpmiSourceTest, ClearedLogIsEmptyWithStatus14)
{
    initial = {selRecord(1)};
    make();
    EXPECT_EQ(log().status, 1u);
    unsigned command = ClearEventLogCommand;
    Instrumentation cursor(source);
    cursor.selectNode(ManagementController);
    EXPECT_TRUE(cursor.setProperty(Command, command));
    EXPECT_TRUE(bmc->sel.empty());
    EXPECT_TRUE(log().isEmpty);
    EXPECT_EQ(log().status, EventLogStatusCleared);

    // Many BMCs log that they were cleared: still empty.
    bmc->add(logClearedRecord(1));
    EXPECT_TRUE(log().isEmpty);
    EXPECT_EQ(log().status, EventLogStatusCleared);

    bmc->add(selRecord(2));
    EXPECT_FALSE(log().isEmpty);
    EXPECT_EQ(log().status, 1u);
}

TEST_F(IpmiSourceTest, OnlyTheClearCommandOnTheControllerIsAccepted)
{
    initial = {selRecord(1)};
    make();
    EXPECT_FALSE(source->writeProperty("/bmc0", Command, 8));
    EXPECT_FALSE(source->writeProperty("/bmc0/sel", Command, 9));
    EXPECT_FALSE(source->writeProperty("/bmc0", MaxRecords, 9));
    EXPECT_EQ(bmc->sel.size(), 1u);
    EXPECT_EQ(bmc->eraseCalls, 0u);
}

TEST_F(IpmiSourceTest, FailedClearThrowsTheIpmiError)
{
    initial = {selRecord(1)};
    make();
    bmc->failure.emplace("ipmi_cmd_get_sel_info", ErrorCategory::Timeout,
                         "session timeout");
    EXPECT_THROW(source->writeProperty("/bmc0", Command, 9), IpmiError);
    // The failure is logged with its category.
    const auto records = captured.records();
    ASSERT_FALSE(records.empty());
    EXPECT_EQ(records.back().level, 6000);
    EXPECT_EQ(records.back().message,
              "Clearing the SEL failed: ipmi_cmd_get_sel_info: timeout: "
              "session timeout");
}

TEST_F(IpmiSourceTest, RestartCauseIsAbsentWhenTheBmcLacksTheCommand)
{
    make();
    Instrumentation cursor(source);
    cursor.selectNode(Watchdog);
    unsigned cause = 99;
    EXPECT_FALSE(cursor.getProperty(RestartCause, cause));
    EXPECT_EQ(cause, 99u);
}

TEST_F(IpmiSourceTest, RestartCauseIsReadOncePerSessionOrSelChange)
{
    make();
    bmc->restartCause = 4; // watchdog
    {
        Instrumentation cursor(source);
        cursor.selectNode(Watchdog);
        unsigned cause = 0;
        ASSERT_TRUE(cursor.getProperty(RestartCause, cause));
        EXPECT_EQ(cause, 4u);
    }
    bmc->resetCounters();
    source->snapshot();
    EXPECT_EQ(bmc->restartCauseCalls, 0u);
    ++bmc->generation;
    source->snapshot();
    EXPECT_EQ(bmc->restartCauseCalls, 1u);
}

TEST_F(IpmiSourceTest, UnreachableBmcMakesTheCursorThrow)
{
    make();
    bmc->failure.emplace("ipmi_ctx_open_outofband_2_0", ErrorCategory::Timeout,
                         "connection timeout");
    Instrumentation cursor(source);
    EXPECT_THROW(cursor.selectNode(ManagementController), IpmiError);
    bmc->failure.reset();
    Instrumentation again(source);
    again.selectNode(ManagementController);
    EXPECT_TRUE(again);
}

TEST_F(IpmiSourceTest, ConcurrentRequestsTakeTurnsOnTheBmc)
{
    initial = {selRecord(1), selRecord(2)};
    make();
    const auto walk = [this]
    {
        std::size_t entries = 0;
        for (int i = 0; i < 50; ++i)
        {
            Instrumentation cursor(source);
            cursor.selectNode(EventLogEntry);
            for (; cursor; ++cursor)
            {
                ++entries;
            }
        }
        return entries;
    };
    auto other = std::async(std::launch::async, walk);
    EXPECT_EQ(walk(), 100u);
    EXPECT_EQ(other.get(), 100u);
}

// A BMC whose Get SEL Info hangs until released, making no progress.
class HangingBmc : public FakeBmc
{
  public:
    SelInfo getSelInfo() override
    {
        if (hang.load())
        {
            entered.store(true);
            while (hang.load())
            {
                std::this_thread::sleep_for(std::chrono::milliseconds(5));
            }
        }
        return FakeBmc::getSelInfo();
    }
    std::chrono::steady_clock::time_point lastActivity() const override
    {
        return since;
    }

    std::atomic<bool> hang{false};
    std::atomic<bool> entered{false};
    const std::chrono::steady_clock::time_point since =
        std::chrono::steady_clock::now();
};

TEST_F(IpmiSourceTest, RequestBehindAStuckOneGivesUpAfterTheTimeout)
{
    auto fake = std::make_unique<HangingBmc>();
    HangingBmc& hanging = *fake;
    Settings settings;
    settings.timeoutMs = 200;
    source = std::make_shared<IpmiSource>(std::move(fake),
                                          std::make_unique<CountingDescriber>(),
                                          settings, "BMC");
    hanging.hang.store(true);
    auto stuck = std::async(std::launch::async, [this] { source->snapshot(); });
    while (!hanging.entered.load())
    {
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
    const auto began = std::chrono::steady_clock::now();
    try
    {
        source->snapshot();
        ADD_FAILURE() << "no error";
    }
    catch (const IpmiError& error)
    {
        EXPECT_EQ(error.category(), ErrorCategory::Busy);
    }
    EXPECT_LT(std::chrono::steady_clock::now() - began,
              std::chrono::milliseconds(2000));
    hanging.hang.store(false);
    stuck.get();
    EXPECT_NO_THROW(source->snapshot());
}

TEST_F(IpmiSourceTest, MonitoringRegistrationsAreKept)
{
    make();
    source->startMonitoring(EventLog, ignoreAlert, nullptr);
    source->startMonitoring(EventLogEntry, ignoreAlert, nullptr);
    EXPECT_EQ(source->monitorCount(EventLog), 1u);
    source->stopMonitoring(EventLog, ignoreAlert, nullptr);
    EXPECT_EQ(source->monitorCount(EventLog), 0u);
    EXPECT_EQ(source->monitorCount(EventLogEntry), 1u);
}

} // namespace
