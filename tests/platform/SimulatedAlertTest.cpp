#include "SimulatedAlert.h"

#include "MemorySource.h"
#include "Platform.h"
#include "platform/TestTrees.h"

#include <chrono>
#include <mutex>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace QX;
using namespace QX::NodeLexicon;
using ::testing::HasSubstr;

namespace
{

struct Raised
{
    unsigned code;
    std::string path;
};

std::mutex raisedMutex;
std::vector<Raised> raised;

void record(unsigned code, DateTime, std::string path, const void*)
{
    const std::lock_guard lock(raisedMutex);
    raised.push_back(Raised{code, std::move(path)});
}

class SimulatedAlertTest : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        raised.clear();
        for (const NodeType kind : {EventLog, EventLogEntry, Watchdog})
        {
            source->startMonitoring(kind, &record, nullptr);
        }
    }

    void raise(SimulatedAlert alert)
    {
        source->raiseSimulatedAlert(alert);
        ASSERT_TRUE(source->waitForAlerts(std::chrono::seconds(10)));
    }

    const NodeRecord& node(const std::string& path)
    {
        tree_ = source->snapshot();
        return tree_->node(*tree_->find(path));
    }

    std::shared_ptr<MemorySource> source =
        std::make_shared<MemorySource>(test::twoControllerTree());

  private:
    std::shared_ptr<const NodeTree> tree_;
};

TEST_F(SimulatedAlertTest, RecordAddedAppendsTheNextRecordOfTheFirstLog)
{
    raise(SimulatedAlert::RecordAdded);
    ASSERT_EQ(raised.size(), 1u);
    EXPECT_EQ(raised[0].code, AlertOnEventLogEntry);
    EXPECT_EQ(raised[0].path, "/bmc0/sel/entry-00004");
    const NodeRecord& entry = node("/bmc0/sel/entry-00004");
    EXPECT_EQ(entry.kind, EventLogEntry);
    EXPECT_EQ(entry.description, "System Event: OEM System boot event");
    EXPECT_EQ(std::get<unsigned>(*entry.find(RecordId)), 4u);
    const std::string data = std::get<std::string>(*entry.find(RecordData));
    ASSERT_EQ(data.size(), 16u * 3 - 1);
    EXPECT_EQ(data.substr(0, 8), "04 00 02");
    EXPECT_EQ(data.substr(21), "20 00 04 12 83 6f 01 ff ff");
    const std::string timestamp = std::get<std::string>(*entry.find(Timestamp));
    EXPECT_EQ(timestamp.size(), 19u); // YYYY-MM-DD hh:mm:ss
    EXPECT_FALSE(std::get<bool>(*node("/bmc0/sel").find(IsEmpty)));
}

TEST_F(SimulatedAlertTest, LogClearedEmptiesTheLogsLikeTheClearCommand)
{
    raise(SimulatedAlert::LogCleared);
    ASSERT_EQ(raised.size(), 2u);
    EXPECT_EQ(raised[0].code, AlertOnEventLog);
    EXPECT_EQ(raised[0].path, "/bmc0/sel");
    EXPECT_EQ(raised[1].path, "/bmc0/aux");
    const NodeRecord& log = node("/bmc0/sel");
    EXPECT_EQ(log.status, EventLogStatusCleared);
    EXPECT_TRUE(std::get<bool>(*log.find(IsEmpty)));
    const auto tree = source->snapshot();
    EXPECT_TRUE(
        tree->nodesOfKind(EventLogEntry, *tree->find("/bmc0/sel")).empty());
    EXPECT_EQ(source->acceptedWrites(), 0u); // not a write through a cursor
}

TEST_F(SimulatedAlertTest, FillLevelsSetTheLogStatus)
{
    raise(SimulatedAlert::LogAlmostFull);
    EXPECT_EQ(node("/bmc0/sel").status, EventLogStatusAlmostFull);
    raise(SimulatedAlert::LogFull);
    EXPECT_EQ(node("/bmc0/sel").status, EventLogStatusFull);
    ASSERT_EQ(raised.size(), 2u);
    for (const Raised& alert : raised)
    {
        EXPECT_EQ(alert.code, AlertOnEventLog);
        EXPECT_EQ(alert.path, "/bmc0/sel");
    }
}

TEST_F(SimulatedAlertTest, WatchdogRestartAlertsOnTheWatchdog)
{
    raise(SimulatedAlert::WatchdogRestart);
    ASSERT_EQ(raised.size(), 1u);
    EXPECT_EQ(raised[0].code, AlertOnWatchdog);
    EXPECT_EQ(raised[0].path, "/bmc0/wdt");
    EXPECT_EQ(std::get<unsigned>(*node("/bmc0/wdt").find(RestartCause)), 4u);
}

TEST_F(SimulatedAlertTest, ARestartWithoutWatchdogAddsOne)
{
    NodeTreeBuilder tree;
    tree.addNode(ManagementController, "/bmc", "", "BMC", 1)
        .addNode(EventLog, "/bmc/sel", "/bmc", "SEL", 1);
    source->replaceTree(tree.build());
    raise(SimulatedAlert::WatchdogRestart);
    ASSERT_EQ(raised.size(), 1u);
    EXPECT_EQ(raised[0].path, "/bmc/wdt");
    const NodeRecord& watchdog = node("/bmc/wdt");
    EXPECT_EQ(watchdog.kind, Watchdog);
    EXPECT_EQ(std::get<unsigned>(*watchdog.find(RestartCause)), 4u);
}

TEST_F(SimulatedAlertTest, RecordIdsStayWithinSixteenBits)
{
    NodeTreeBuilder tree;
    tree.addNode(ManagementController, "/bmc", "", "BMC", 1)
        .addNode(EventLog, "/bmc/sel", "/bmc", "SEL", 1);
    for (const unsigned id : {1u, 2u, 0xfffeu})
    {
        const std::string path = MemorySource::entryPath("/bmc/sel", id);
        tree.addNode(EventLogEntry, path, "/bmc/sel", "", 0)
            .setProperty(path, RecordId, id);
    }
    source->replaceTree(tree.build());
    raise(SimulatedAlert::RecordAdded);
    ASSERT_EQ(raised.size(), 1u);
    EXPECT_EQ(raised[0].path, "/bmc/sel/entry-00003");
}

TEST_F(SimulatedAlertTest, ATreeWithoutLogCannotSimulate)
{
    source->replaceTree(nullptr);
    try
    {
        source->raiseSimulatedAlert(SimulatedAlert::LogFull);
        FAIL() << "no exception";
    }
    catch (const std::runtime_error& error)
    {
        EXPECT_THAT(error.what(), HasSubstr("no management controller"));
    }
}

/** A source of some other kind: it has no way to simulate. */
class PlainSource : public InstrumentationSource
{
  public:
    std::shared_ptr<const NodeTree> snapshot() override
    {
        return NodeTreeBuilder().build();
    }
    bool writeProperty(const std::string&, Properties, unsigned) override
    {
        return false;
    }
    void startMonitoring(NodeType, MonitorCallback, const void*) override {}
    void stopMonitoring(NodeType, MonitorCallback, const void*) override {}
};

TEST(SimulatedAlerts, SourcesThatCannotSimulateSaySo)
{
    Platform::overrideSource(std::make_shared<PlainSource>());
    try
    {
        raiseSimulatedAlert(*Platform::currentSource(),
                            SimulatedAlert::WatchdogRestart);
        FAIL() << "no exception";
    }
    catch (const std::runtime_error& error)
    {
        EXPECT_STREQ(error.what(),
                     "this instrumentation source cannot simulate alerts "
                     "(asked for \"restart\"); only source = memory can");
    }
    Platform::overrideSource(nullptr);
}

TEST(SimulatedAlerts, ThePlatformRaisesOnItsCurrentSource)
{
    auto source = std::make_shared<MemorySource>(test::twoControllerTree());
    Platform::overrideSource(source);
    raiseSimulatedAlert(*Platform::currentSource(), SimulatedAlert::LogFull);
    const auto tree = source->snapshot();
    EXPECT_EQ(tree->node(*tree->find("/bmc0/sel")).status, EventLogStatusFull);
    Platform::overrideSource(nullptr);
}

TEST(SimulatedAlerts, NamesRoundTrip)
{
    for (const SimulatedAlert alert :
         {SimulatedAlert::RecordAdded, SimulatedAlert::LogCleared,
          SimulatedAlert::LogAlmostFull, SimulatedAlert::LogFull,
          SimulatedAlert::WatchdogRestart})
    {
        EXPECT_EQ(simulatedAlertFromName(simulatedAlertName(alert)), alert);
    }
    EXPECT_STREQ(simulatedAlertName(SimulatedAlert::LogAlmostFull), "warning");
    EXPECT_EQ(simulatedAlertNames(), "entry, clear, warning, full, restart");
    EXPECT_FALSE(simulatedAlertFromName("Entry"));
    EXPECT_FALSE(simulatedAlertFromName("entry "));
    EXPECT_FALSE(simulatedAlertFromName(""));
}

} // namespace
