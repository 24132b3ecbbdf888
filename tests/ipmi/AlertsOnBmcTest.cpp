// Indications caused by real IPMI traffic: the provider's indication MI,
// loaded as an object manager loads it, on the IPMI source polling
// OpenIPMI's simulated BMC.

#include "AlertFixture.h"
#include "EventClasses.h"
#include "SystemEventRecord.h"

#include <chrono>
#include <optional>
#include <thread>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

using bmctest::number;
using bmctest::patience;
using bmctest::quietSpell;
using bmctest::recordIdKey;
using bmctest::temperatureRecord;
using bmctest::temperatureRecords;
using bmctest::text;
using ::testing::HasSubstr;

using namespace testevents;

class AlertsOnBmcTest : public bmctest::AlertTest
{
};

TEST_F(AlertsOnBmcTest, AddedRecordDeliversItsEntryEvent)
{
    launchSubscribed(2, entryEvent);

    const auto ids = bmc().addRecords({temperatureRecord(0, 0)});
    ASSERT_EQ(ids.size(), 1u);
    const auto indication = next();
    ASSERT_TRUE(indication.has_value()) << "no entry event";
    EXPECT_EQ(indication->instance.path.className, entryEvent);
    EXPECT_THAT(text(indication->instance, "AlertingManagedElement"),
                HasSubstr(recordIdKey(ids[0])));

    // The event names the record as the log entry instance does.
    const auto entries = enumerate("ZAN_MgmtHwLogEntry");
    ASSERT_EQ(entries.instances.size(), 3u);
    const host::Instance& entry = entries.instances.back();
    EXPECT_EQ(text(entry, "RecordID"), std::to_string(ids[0]));
    EXPECT_EQ(text(indication->instance, "IndicationIdentifier"),
              text(entry, "Description"));
    EXPECT_FALSE(text(indication->instance, "IndicationIdentifier").empty());

    EXPECT_TRUE(more().empty()) << "an event came twice";
}

TEST_F(AlertsOnBmcTest, TenRecordsAtOnceArriveInRecordOrder)
{
    launch({});
    subscribe(entryEvent);

    std::vector<bmcsim::Record> records(10, temperatureRecord(0, 0));
    const auto ids = bmc().addRecords(records);
    ASSERT_EQ(ids.size(), 10u);
    expectEntryEventsFor(ids);
}

TEST_F(AlertsOnBmcTest, ClearDeliversOneClearEvent)
{
    launchSubscribed(3, clearEvent);

    bmc().clearSel();
    const auto indication = next();
    ASSERT_TRUE(indication.has_value()) << "no clear event";
    EXPECT_EQ(indication->instance.path.className, clearEvent);
    EXPECT_EQ(text(indication->instance, "IndicationIdentifier"),
              "IMPI SEL Log");
    EXPECT_TRUE(more().empty());
}

TEST_F(AlertsOnBmcTest, FillingDeliversWarningThenCriticalOnceEach)
{
    bmcsim::Options options;
    options.maxRecords = 8; // warning at 75 %: 6 records; full at 8
    options.records = temperatureRecords(4);
    launch(options);
    subscribe(fullEvent);

    // One record per poll, so that every fill level is seen; the ninth is
    // refused by the full SEL.
    for (unsigned added = 0; added < 5; ++added)
    {
        try
        {
            bmc().addRecords({temperatureRecord(0, 0)});
        }
        catch (const std::runtime_error& error)
        {
            EXPECT_EQ(added, 4u) << error.what();
        }
        waitForPolls(2);
        ipmi().waitForAlerts(patience);
        host().broker().waitForThreads(patience);
    }
    const auto events = more();
    ASSERT_EQ(events.size(), 2u);
    EXPECT_EQ(events[0].instance.path.className, fullEvent);
    EXPECT_THAT(text(events[0].instance, "EventID"), HasSubstr("Warning"));
    EXPECT_EQ(number(events[0].instance, "PerceivedSeverity"), 3u);
    EXPECT_EQ(events[1].instance.path.className, fullEvent);
    EXPECT_THAT(text(events[1].instance, "EventID"), HasSubstr("Critical"));
    EXPECT_EQ(number(events[1].instance, "PerceivedSeverity"), 6u);
}

TEST_F(AlertsOnBmcTest, WatchdogExpiryDeliversOneRestartEventAcrossRestarts)
{
    if (!bmcsim::SimulatedBmc::moduleAvailable())
    {
        GTEST_SKIP() << "the simulator module was not built "
                        "(libopenipmi-dev missing)";
    }
    launch({});
    subscribe(restartEvent);

    bmc().startWatchdog(bmcsim::WatchdogAction::HardReset, 3);
    const auto indication = next();
    ASSERT_TRUE(indication.has_value()) << "no restart event";
    EXPECT_EQ(indication->instance.path.className, restartEvent);
    // Severity 4 is the watchdog cause; any other cause gives 2.
    EXPECT_EQ(number(indication->instance, "PerceivedSeverity"), 4u);
    EXPECT_TRUE(more().empty());

    // The BMC still says "watchdog" after a restart of the object
    // manager: that restart was announced already.
    expectNothingAfterRestart(restartEvent);
}

TEST_F(AlertsOnBmcTest, RestartCauseWithoutRecordIsAnnouncedOnceAtStart)
{
    if (!bmcsim::SimulatedBmc::moduleAvailable())
    {
        GTEST_SKIP() << "the simulator module was not built "
                        "(libopenipmi-dev missing)";
    }
    launch({});
    subscribe(restartEvent);
    EXPECT_TRUE(more().empty()); // cause "unknown"
    reload();

    // The watchdog restarts the server while the object manager is down,
    // and the SEL is cleared before it comes back.
    bmc().startWatchdog(bmcsim::WatchdogAction::PowerCycle, 2);
    std::this_thread::sleep_for(std::chrono::milliseconds(800));
    bmc().clearSel();
    reload();
    subscribe(restartEvent);
    const auto indication = next();
    ASSERT_TRUE(indication.has_value()) << "no restart event";
    EXPECT_EQ(number(indication->instance, "PerceivedSeverity"), 4u);
    EXPECT_TRUE(more().empty());

    expectNothingAfterRestart(restartEvent);
}

TEST_F(AlertsOnBmcTest, RecordsAddedWhileUnloadedArriveOnceAfterReload)
{
    launchSubscribed(2, entryEvent);
    reload(); // unloaded

    const auto ids =
        bmc().addRecords({temperatureRecord(0, 0), temperatureRecord(0, 0),
                          temperatureRecord(0, 0)});
    ASSERT_EQ(ids.size(), 3u);
    subscribe(entryEvent);
    expectEntryEventsFor(ids);

    // Another restart announces nothing old.
    expectNothingAfterRestart(entryEvent);
}

TEST_F(AlertsOnBmcTest, ClearWhileUnloadedYieldsOneClearEvent)
{
    launchSubscribed(3, clearEvent);
    reload();

    bmc().clearSel();
    subscribe(clearEvent);
    const auto indication = next();
    ASSERT_TRUE(indication.has_value()) << "no clear event";
    EXPECT_EQ(indication->instance.path.className, clearEvent);
    EXPECT_TRUE(more().empty());

    expectNothingAfterRestart(clearEvent);
}

TEST_F(AlertsOnBmcTest, PollerRecoversFromAFrozenBmc)
{
    constexpr unsigned timeoutMs = 500;
    launch({}, timeoutMs);
    subscribe(entryEvent);

    bmc().freeze();
    std::this_thread::sleep_for(std::chrono::milliseconds(3 * timeoutMs));
    bmc().thaw();
    const auto ids =
        bmc().addRecords({temperatureRecord(0, 0), temperatureRecord(0, 0)});
    expectEntryEventsFor(ids);
}

TEST_F(AlertsOnBmcTest, IdlePollsSendTwoRequestsEach)
{
    launchSubscribed(5, entryEvent);
    waitForPolls(1);

    const std::uint64_t requests = ipmi().requestCount();
    const std::uint64_t polls = ipmi().pollCount();
    waitForPolls(5);
    const std::uint64_t pollsDone = ipmi().pollCount() - polls;
    const std::uint64_t sent = ipmi().requestCount() - requests;
    // Get SEL Info and the newest record; a poll may be under way at
    // either end.
    EXPECT_GE(sent + 2, 2 * pollsDone);
    EXPECT_LE(sent, 2 * (pollsDone + 1));
}

TEST_F(AlertsOnBmcTest, LastUnsubscribeStopsThePoller)
{
    launch({});
    subscribe(entryEvent);
    ASSERT_EQ(host().disableIndications().rc, CMPI_RC_OK);
    EXPECT_FALSE(ipmi().polling());
    const std::uint64_t polls = ipmi().pollCount();
    std::this_thread::sleep_for(quietSpell);
    EXPECT_EQ(ipmi().pollCount(), polls);
}

} // namespace
