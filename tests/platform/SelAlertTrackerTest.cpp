#include "ipmi/SelAlertTracker.h"

#include "NodeLexicon.h"
#include "ipmi/IpmiSource.h"
#include "platform/FakeBmc.h"

#include <gtest/gtest.h>

using namespace QX;
using namespace QX::Ipmi;
using namespace QX::NodeLexicon;
using QX::test::logClearedRecord;
using QX::test::selRecord;

namespace
{

// A Watchdog 2 record: hard reset (offset 1), asserted.
SelRecordBytes watchdogRecord(std::uint16_t id, std::uint8_t offset = 1)
{
    SelRecordBytes record = selRecord(id, 0x65e58400 + id, 0x23);
    record[11] = 0x00;
    record[12] = 0x6f;
    record[13] = static_cast<std::uint8_t>(0xc0 | offset);
    record[14] = 0x04;
    record[15] = 0xff;
    return record;
}

// The alerts the IPMI source raises for the events of @p result.
std::vector<PendingAlert> alerts(const TrackerResult& result)
{
    std::vector<PendingAlert> found;
    for (const SelEvent& event : result.events)
    {
        found.push_back(IpmiSource::alertOf(event));
    }
    return found;
}

class SelAlertTrackerTest : public ::testing::Test
{
  protected:
    void add(const SelRecordBytes& bytes)
    {
        test::appendCached(records, bytes);
        ++addition;
        ++version;
    }
    void addRecords(unsigned count)
    {
        for (unsigned i = 0; i < count; ++i)
        {
            const std::uint16_t id = nextId++;
            add(selRecord(id, 0x65e58300 + id));
        }
    }
    void clear()
    {
        records.clear();
        ++erase;
        ++version;
    }
    SelObservation now() const
    {
        SelObservation observation;
        observation.records = &records;
        observation.version = version;
        observation.info.entries = static_cast<std::uint16_t>(records.size());
        observation.info.mostRecentAddition = addition;
        observation.info.mostRecentErase = erase;
        observation.logStatus = status;
        observation.restartCause = cause;
        return observation;
    }

    static std::vector<std::string> paths(const TrackerResult& result,
                                          NodeType kind)
    {
        std::vector<std::string> found;
        for (const PendingAlert& alert : alerts(result))
        {
            if (alert.kind == kind)
            {
                found.push_back(alert.path);
            }
        }
        return found;
    }

    std::vector<CachedRecord> records;
    std::uint32_t addition = 0x65000000;
    std::uint32_t erase = 0x64000000;
    unsigned status = 1;
    std::optional<std::uint8_t> cause = 0;
    std::uint16_t nextId = 1;
    std::uint64_t version = 0;
    SelAlertTracker tracker;
};

TEST_F(SelAlertTrackerTest, WithoutKeptStateNothingPresentIsAnnounced)
{
    addRecords(3);
    status = EventLogStatusAlmostFull;
    cause = SelAlertTracker::restartCauseWatchdog;
    const TrackerResult result = tracker.start(std::nullopt, now());
    EXPECT_TRUE(alerts(result).empty());
    EXPECT_TRUE(result.stateChanged);
    EXPECT_EQ(tracker.state().lastRecord, records.back().bytes);
    EXPECT_EQ(tracker.state().lastAddition, addition);
    EXPECT_EQ(tracker.state().lastErase, erase);
}

TEST_F(SelAlertTrackerTest, NewRecordsAreAnnouncedOnceInSelOrder)
{
    addRecords(2);
    tracker.start(std::nullopt, now());
    addRecords(3);
    const TrackerResult result = tracker.observe(now());
    EXPECT_EQ(paths(result, EventLogEntry),
              (std::vector<std::string>{"/bmc0/sel/entry-00003",
                                        "/bmc0/sel/entry-00004",
                                        "/bmc0/sel/entry-00005"}));
    EXPECT_EQ(alerts(result).size(), 3u);
    for (const PendingAlert& alert : alerts(result))
    {
        EXPECT_EQ(alert.code, AlertOnEventLogEntry);
    }
    EXPECT_TRUE(result.stateChanged);
    const TrackerResult again = tracker.observe(now());
    EXPECT_TRUE(alerts(again).empty());
    EXPECT_FALSE(again.stateChanged);
}

TEST_F(SelAlertTrackerTest, RestartedIdsAreNewRecordsWithTheirRunInThePath)
{
    addRecords(2);
    tracker.start(std::nullopt, now());
    // The BMC restarted its ids; the record is a later one.
    add(selRecord(1, 0x65e59000));
    const TrackerResult result = tracker.observe(now());
    EXPECT_EQ(paths(result, EventLogEntry),
              std::vector<std::string>{"/bmc0/sel/entry-r00001-00001"});
}

TEST_F(SelAlertTrackerTest, ClearIsOneLogAlertThenNewRecordsFollow)
{
    addRecords(4);
    tracker.start(std::nullopt, now());
    clear();
    status = EventLogStatusCleared;
    TrackerResult result = tracker.observe(now());
    ASSERT_EQ(alerts(result).size(), 1u);
    EXPECT_EQ(alerts(result)[0].kind, EventLog);
    EXPECT_EQ(alerts(result)[0].code, AlertOnEventLog);
    EXPECT_EQ(alerts(result)[0].path, "/bmc0/sel");
    EXPECT_TRUE(alerts(tracker.observe(now())).empty());

    // A clear followed at once by a record: the clear, then the record.
    clear();
    status = 1;
    addRecords(1);
    result = tracker.observe(now());
    ASSERT_EQ(alerts(result).size(), 2u);
    EXPECT_EQ(alerts(result)[0].kind, EventLog);
    EXPECT_EQ(alerts(result)[1].kind, EventLogEntry);
}

TEST_F(SelAlertTrackerTest, FillTransitionsAreAnnouncedOnceEach)
{
    addRecords(5);
    tracker.start(std::nullopt, now());
    addRecords(1);
    status = EventLogStatusAlmostFull;
    EXPECT_EQ(paths(tracker.observe(now()), EventLog).size(), 1u);
    addRecords(1);
    EXPECT_TRUE(paths(tracker.observe(now()), EventLog).empty());
    addRecords(1);
    status = EventLogStatusFull;
    EXPECT_EQ(paths(tracker.observe(now()), EventLog).size(), 1u);
    // Full and refusing records: nothing changes, nothing is raised.
    EXPECT_TRUE(alerts(tracker.observe(now())).empty());
    EXPECT_TRUE(alerts(tracker.observe(now())).empty());
}

TEST_F(SelAlertTrackerTest, WatchdogRestartRecordsRaiseWatchdogAlerts)
{
    tracker.start(std::nullopt, now());
    add(watchdogRecord(nextId++, 1)); // hard reset
    add(watchdogRecord(nextId++, 0)); // timer expired, no action
    add(watchdogRecord(nextId++, 2)); // power down
    add(watchdogRecord(nextId++, 3)); // power cycle
    SelRecordBytes deasserted = watchdogRecord(nextId++, 1);
    deasserted[12] = 0xef;
    add(deasserted);
    const TrackerResult result = tracker.observe(now());
    EXPECT_EQ(paths(result, EventLogEntry).size(), 5u);
    EXPECT_EQ(paths(result, Watchdog),
              std::vector<std::string>(3, "/bmc0/wdt"));
    // The watchdog alert follows its record's entry alert.
    ASSERT_GE(alerts(result).size(), 2u);
    EXPECT_EQ(alerts(result)[0].kind, EventLogEntry);
    EXPECT_EQ(alerts(result)[1].kind, Watchdog);
    EXPECT_EQ(alerts(result)[1].code, AlertOnWatchdog);
}

TEST_F(SelAlertTrackerTest, IsWatchdogRestartNeedsTheWatchdogSensorType)
{
    EXPECT_TRUE(SelAlertTracker::isWatchdogRestart(watchdogRecord(1, 1)));
    SelRecordBytes other = watchdogRecord(1, 1);
    other[10] = 0x01;
    EXPECT_FALSE(SelAlertTracker::isWatchdogRestart(other));
    SelRecordBytes oem = watchdogRecord(1, 1);
    oem[2] = 0xc0;
    EXPECT_FALSE(SelAlertTracker::isWatchdogRestart(oem));
}

TEST_F(SelAlertTrackerTest, RecordsAddedMeanwhileAreAnnouncedAfterARestart)
{
    addRecords(3);
    tracker.start(std::nullopt, now());
    const AnnouncedState kept = tracker.state();
    addRecords(2);

    SelAlertTracker restarted;
    const TrackerResult result = restarted.start(kept, now());
    EXPECT_EQ(paths(result, EventLogEntry),
              (std::vector<std::string>{"/bmc0/sel/entry-00004",
                                        "/bmc0/sel/entry-00005"}));
    EXPECT_TRUE(result.stateChanged);

    SelAlertTracker again;
    const TrackerResult none = again.start(restarted.state(), now());
    EXPECT_TRUE(alerts(none).empty());
    EXPECT_FALSE(none.stateChanged);
}

TEST_F(SelAlertTrackerTest, KeptEmptySelAnnouncesEverythingAddedSince)
{
    tracker.start(std::nullopt, now());
    const AnnouncedState kept = tracker.state();
    addRecords(2);
    SelAlertTracker restarted;
    EXPECT_EQ(paths(restarted.start(kept, now()), EventLogEntry).size(), 2u);
}

TEST_F(SelAlertTrackerTest, ClearedMeanwhileIsOneClearAndTheNewRecords)
{
    addRecords(3);
    tracker.start(std::nullopt, now());
    const AnnouncedState kept = tracker.state();
    clear();
    addRecords(1);
    SelAlertTracker restarted;
    const TrackerResult result = restarted.start(kept, now());
    ASSERT_EQ(alerts(result).size(), 2u);
    EXPECT_EQ(alerts(result)[0].kind, EventLog);
    EXPECT_EQ(alerts(result)[1].path, "/bmc0/sel/entry-00004");
}

TEST_F(SelAlertTrackerTest, LostLastRecordAnnouncesNothingOldAndSaysSo)
{
    addRecords(3);
    tracker.start(std::nullopt, now());
    AnnouncedState kept = tracker.state();
    (*kept.lastRecord)[15] ^= 0xFF; // no longer in the SEL
    addRecords(1);
    SelAlertTracker restarted;
    const TrackerResult result = restarted.start(kept, now());
    EXPECT_TRUE(alerts(result).empty());
    EXPECT_FALSE(result.note.empty());
}

TEST_F(SelAlertTrackerTest, FillReachedMeanwhileIsAnnouncedOnce)
{
    addRecords(3);
    tracker.start(std::nullopt, now());
    const AnnouncedState kept = tracker.state();
    addRecords(5);
    status = EventLogStatusFull;
    SelAlertTracker restarted;
    EXPECT_EQ(paths(restarted.start(kept, now()), EventLog).size(), 1u);
    SelAlertTracker again;
    EXPECT_TRUE(paths(again.start(restarted.state(), now()), EventLog).empty());
}

TEST_F(SelAlertTrackerTest, WatchdogRestartCauseIsAnnouncedOnceAcrossStarts)
{
    addRecords(2);
    tracker.start(std::nullopt, now());
    const AnnouncedState kept = tracker.state();

    // Restarted by the watchdog while no one watched: its record and the
    // cause tell of the same restart, announced once.
    add(watchdogRecord(nextId++));
    cause = SelAlertTracker::restartCauseWatchdog;
    SelAlertTracker first;
    const TrackerResult result = first.start(kept, now());
    EXPECT_EQ(paths(result, Watchdog).size(), 1u);
    EXPECT_EQ(paths(result, EventLogEntry).size(), 1u);

    SelAlertTracker second;
    EXPECT_TRUE(alerts(second.start(first.state(), now())).empty());

    // The SEL cleared since: the cause alone is no new restart.
    clear();
    SelAlertTracker third;
    EXPECT_TRUE(paths(third.start(second.state(), now()), Watchdog).empty());
}

TEST_F(SelAlertTrackerTest, RestartCauseWithoutRecordIsAnnouncedOnce)
{
    tracker.start(std::nullopt, now());
    const AnnouncedState kept = tracker.state();
    cause = SelAlertTracker::restartCauseWatchdog;
    SelAlertTracker first;
    EXPECT_EQ(paths(first.start(kept, now()), Watchdog).size(), 1u);
    SelAlertTracker second;
    EXPECT_TRUE(alerts(second.start(first.state(), now())).empty());

    cause = 1; // another cause: nothing
    SelAlertTracker third;
    EXPECT_TRUE(alerts(third.start(kept, now())).empty());
}

TEST_F(SelAlertTrackerTest, FrozenEraseTimeClearIsSeenInTheRecords)
{
    addRecords(4);
    tracker.start(std::nullopt, now());
    // The SEL emptied, the last-erase time the same: a clear all the same.
    records.clear();
    ++version;
    add(logClearedRecord(1));
    const TrackerResult result = tracker.observe(now());
    EXPECT_EQ(paths(result, EventLog), std::vector<std::string>{"/bmc0/sel"});
    EXPECT_EQ(paths(result, EventLogEntry),
              std::vector<std::string>{"/bmc0/sel/entry-00001"});
    EXPECT_TRUE(alerts(tracker.observe(now())).empty());
}

TEST_F(SelAlertTrackerTest, UnsetEraseTimeIsNoClear)
{
    erase = 0xFFFFFFFF;
    addRecords(2);
    tracker.start(std::nullopt, now());
    addRecords(1);
    const TrackerResult result = tracker.observe(now());
    EXPECT_TRUE(paths(result, EventLog).empty());
    EXPECT_EQ(paths(result, EventLogEntry).size(), 1u);
}

TEST_F(SelAlertTrackerTest, EveryRecordReplacedWithoutAnEraseIsNoClear)
{
    addRecords(3);
    tracker.start(std::nullopt, now());
    // A ring buffer overwrote all three: new records, no clear.
    records.clear();
    addRecords(3);
    const TrackerResult result = tracker.observe(now());
    EXPECT_TRUE(paths(result, EventLog).empty());
    EXPECT_EQ(paths(result, EventLogEntry).size(), 3u);
}

TEST_F(SelAlertTrackerTest, EqualBytesTwiceAreTwoRecords)
{
    add(selRecord(7, 0x65e58300));
    tracker.start(std::nullopt, now());
    add(selRecord(7, 0x65e58300));
    const TrackerResult result = tracker.observe(now());
    EXPECT_EQ(paths(result, EventLogEntry).size(), 1u);
}

} // namespace
