#include "MemorySource.h"

#include "Instrumentation.h"
#include "platform/TestTrees.h"

#include <chrono>
#include <mutex>
#include <stdexcept>
#include <thread>

#include <gtest/gtest.h>

using namespace QX;
using namespace QX::NodeLexicon;

namespace
{

struct Alert
{
    unsigned code;
    DateTime when;
    std::string path;
    const void* context;
};

std::mutex alertsMutex;
std::vector<Alert> alerts;

void recordAlert(unsigned code, DateTime when, std::string path,
                 const void* context)
{
    const std::lock_guard lock(alertsMutex);
    alerts.push_back(Alert{code, when, std::move(path), context});
}

class MemorySourceTest : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        alerts.clear();
    }

    std::shared_ptr<MemorySource> source =
        std::make_shared<MemorySource>(test::twoControllerTree());
};

} // namespace

TEST_F(MemorySourceTest, ClearCommandEmptiesTheLogsOfThatController)
{
    const int context = 0;
    source->startMonitoring(EventLog, &recordAlert, &context);
    const auto before = source->snapshot();
    const DateTime start = DateTime::now();

    EXPECT_TRUE(source->writeProperty("/bmc0", Command, ClearEventLogCommand));
    EXPECT_EQ(source->acceptedWrites(), 1u);

    ASSERT_TRUE(source->waitForAlerts(std::chrono::seconds(10)));
    const auto after = source->snapshot();
    EXPECT_TRUE(
        after->nodesOfKind(EventLogEntry, *after->find("/bmc0")).empty());
    EXPECT_EQ(after->nodesOfKind(EventLogEntry, *after->find("/bmc1")).size(),
              2u);
    for (const char* log : {"/bmc0/sel", "/bmc0/aux"})
    {
        const NodeRecord& node = after->node(*after->find(log));
        EXPECT_EQ(node.status, EventLogStatusCleared);
        ASSERT_NE(node.find(IsEmpty), nullptr);
        EXPECT_TRUE(std::get<bool>(*node.find(IsEmpty)));
    }
    EXPECT_EQ(after->node(*after->find("/bmc1/sel")).status, 2u);

    ASSERT_EQ(alerts.size(), 2u);
    EXPECT_EQ(alerts[0].code, AlertOnEventLog);
    EXPECT_EQ(alerts[0].path, "/bmc0/sel");
    EXPECT_EQ(alerts[1].path, "/bmc0/aux");
    EXPECT_EQ(alerts[0].context, &context);
    EXPECT_GE(alerts[0].when.getYear(), start.getYear());

    // The snapshot taken before is unchanged.
    EXPECT_EQ(before->nodesOfKind(EventLogEntry, *before->find("/bmc0")).size(),
              4u);
}

TEST_F(MemorySourceTest, ClearThroughACursorIsSeenByTheNextCursor)
{
    Instrumentation controller(source);
    controller.selectNode(ManagementController);
    unsigned command = ClearEventLogCommand;
    ASSERT_TRUE(controller.setProperty(Command, command));
    Instrumentation log(source);
    log.selectNode(std::string("/bmc0/sel"));
    bool empty = false;
    EXPECT_TRUE(log.getProperty(IsEmpty, empty));
    EXPECT_TRUE(empty);
    EXPECT_EQ(log.getNodeStatus(), EventLogStatusCleared);
    Instrumentation entries(source);
    entries.selectNode(EventLogEntry);
    entries.setFilter(Parent, "/bmc0/sel");
    EXPECT_FALSE(entries);
}

TEST_F(MemorySourceTest, OtherWritesAreRefused)
{
    source->startMonitoring(EventLog, &recordAlert, nullptr);
    EXPECT_FALSE(source->writeProperty("/bmc0", Command, 8));
    EXPECT_FALSE(source->writeProperty("/bmc0", MaxRecords, 9));
    EXPECT_FALSE(source->writeProperty("/bmc0/sel", Command, 9));
    EXPECT_FALSE(source->writeProperty("/nowhere", Command, 9));
    source->refuseWrites(true);
    EXPECT_FALSE(source->writeProperty("/bmc0", Command, 9));
    EXPECT_EQ(source->acceptedWrites(), 0u);
    EXPECT_TRUE(alerts.empty());
    EXPECT_EQ(source->snapshot()->nodesOfKind(EventLogEntry).size(), 6u);
    source->refuseWrites(false);
    EXPECT_TRUE(source->writeProperty("/bmc0", Command, 9));
}

TEST_F(MemorySourceTest, AppendEntryAddsTheNextPathAndAlerts)
{
    source->startMonitoring(EventLogEntry, &recordAlert, nullptr);
    source->startMonitoring(EventLog, &recordAlert, nullptr);
    const auto before = source->snapshot();
    const std::string path = source->appendEntry(
        "/bmc0/sel", 4, "2024-05-01 10:00:00", "04 00 02", "Fan FAN1: low");
    EXPECT_EQ(path, "/bmc0/sel/entry-00004");

    ASSERT_TRUE(source->waitForAlerts(std::chrono::seconds(10)));
    ASSERT_EQ(alerts.size(), 1u);
    EXPECT_EQ(alerts[0].code, AlertOnEventLogEntry);
    EXPECT_EQ(alerts[0].path, path);

    const auto after = source->snapshot();
    const NodeRecord& entry = after->node(*after->find(path));
    EXPECT_EQ(entry.description, "Fan FAN1: low");
    EXPECT_EQ(std::get<unsigned>(*entry.find(RecordId)), 4u);
    EXPECT_EQ(std::get<std::string>(*entry.find(Timestamp)),
              "2024-05-01 10:00:00");
    EXPECT_EQ(std::get<std::string>(*entry.find(RecordData)), "04 00 02");
    EXPECT_EQ(
        after->nodesOfKind(EventLogEntry, *after->find("/bmc0/sel")).size(),
        4u);
    EXPECT_FALSE(before->find(path).has_value());

    EXPECT_THROW(source->appendEntry("/bmc0", 5, "", "", ""),
                 std::invalid_argument);
    EXPECT_THROW(source->appendEntry("/bmc0/sel", 4, "", "", ""),
                 std::invalid_argument);
}

TEST_F(MemorySourceTest, RaiseAlertUsesTheCodeOfTheKind)
{
    source->startMonitoring(Watchdog, &recordAlert, nullptr);
    source->startMonitoring(EventLog, &recordAlert, nullptr);
    const DateTime when(2024, 3, 19, 17, 45, 3, 0, 1);
    source->raiseAlert("/bmc0/wdt", when);
    source->raiseAlert("/bmc1/sel", when);
    ASSERT_TRUE(source->waitForAlerts(std::chrono::seconds(10)));
    ASSERT_EQ(alerts.size(), 2u);
    EXPECT_EQ(alerts[0].code, AlertOnWatchdog);
    EXPECT_EQ(alerts[0].path, "/bmc0/wdt");
    EXPECT_EQ(alerts[0].when, when);
    EXPECT_EQ(alerts[1].code, AlertOnEventLog);
    EXPECT_THROW(source->raiseAlert("/missing", when), std::invalid_argument);
    EXPECT_THROW(source->raiseAlert("/bmc0", when), std::invalid_argument);
}

TEST_F(MemorySourceTest, StopMonitoringRemovesOneMatchingRegistration)
{
    int a = 0;
    int b = 0;
    source->startMonitoring(Watchdog, &recordAlert, &a);
    source->startMonitoring(Watchdog, &recordAlert, &b);
    EXPECT_EQ(source->monitorCount(Watchdog), 2u);
    EXPECT_EQ(source->monitorCount(EventLog), 0u);
    source->stopMonitoring(Watchdog, &recordAlert, &b);
    source->stopMonitoring(EventLog, &recordAlert, &a); // no such registration
    EXPECT_EQ(source->monitorCount(Watchdog), 1u);
    source->raiseAlert("/bmc0/wdt", DateTime());
    ASSERT_TRUE(source->waitForAlerts(std::chrono::seconds(10)));
    ASSERT_EQ(alerts.size(), 1u);
    EXPECT_EQ(alerts[0].context, &a);
}

namespace
{

MemorySource* reentrantSource = nullptr;

void reenter(unsigned, DateTime, std::string, const void*)
{
    // Callbacks run without the source's lock, so calling back works.
    reentrantSource->stopMonitoring(EventLogEntry, &reenter, nullptr);
    static_cast<void>(reentrantSource->snapshot());
}

} // namespace

TEST_F(MemorySourceTest, CallbacksMayCallBackIntoTheSource)
{
    reentrantSource = source.get();
    source->startMonitoring(EventLogEntry, &reenter, nullptr);
    source->appendEntry("/bmc1/sel", 3, "", "", "");
    ASSERT_TRUE(source->waitForAlerts(std::chrono::seconds(10)));
    EXPECT_EQ(source->monitorCount(EventLogEntry), 0u);
    reentrantSource = nullptr;
}

TEST_F(MemorySourceTest, ConcurrentReadersAndWritersAgree)
{
    std::vector<std::thread> threads;
    for (unsigned t = 0; t < 4; ++t)
    {
        threads.emplace_back(
            [this, t]
            {
                for (unsigned i = 0; i < 50; ++i)
                {
                    source->appendEntry("/bmc1/sel", 100 + t * 100 + i, "", "",
                                        "");
                    Instrumentation cursor(source);
                    cursor.selectNode(EventLogEntry);
                    while (cursor)
                    {
                        ++cursor;
                    }
                }
            });
    }
    for (auto& thread : threads)
    {
        thread.join();
    }
    EXPECT_EQ(source->snapshot()->nodesOfKind(EventLogEntry).size(), 206u);
}

TEST(MemorySource, EntryPathsSortInRecordOrder)
{
    EXPECT_EQ(MemorySource::entryPath("/bmc0/sel", 1), "/bmc0/sel/entry-00001");
    EXPECT_EQ(MemorySource::entryPath("/bmc0/sel", 65535),
              "/bmc0/sel/entry-65535");
    EXPECT_EQ(MemorySource::entryPath("/l", 123456), "/l/entry-123456");
    EXPECT_LT(MemorySource::entryPath("/l", 9),
              MemorySource::entryPath("/l", 10));
}

TEST(MemorySource, PrintablePathPrefixesAnyText)
{
    MemorySource source(nullptr);
    EXPECT_EQ(source.printablePath("/bmc0/sel"), "IPMI:/bmc0/sel");
    EXPECT_EQ(source.printablePath(""), "IPMI:");
    EXPECT_EQ(source.snapshot()->size(), 0u); // a null tree is an empty one
}
