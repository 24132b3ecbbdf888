// Indications through the exported indication MI on BMCs that behave as
// real ones do: every new record gives exactly one entry event, a clear
// exactly one clear event, a fill transition exactly one full event, and
// nothing is announced that did not happen.

#include "ClearAndSlowProfiles.h"
#include "ProfileFixture.h"

#include <iostream>

#include <gmock/gmock.h>

using namespace profiles;
using QX::Ipmi::SelRecordBytes;
using QX::test::BmcProfile;
using QX::test::FreeSpaceAnswer;
using ::testing::HasSubstr;

namespace
{

class AlertingProfilesTest : public ProfileTest
{
  protected:
    /** Adds @p count records, lets the poller see them and checks one
     *  entry event for each record that is new in the SEL, and nothing
     *  else. */
    void addAndExpectEntryEvents(unsigned count)
    {
        const auto before = bmc->truth();
        addRecords(count);
        const auto events = settle();
        const auto fresh = added(before, bmc->truth());
        expectEntryEvents(events, fresh);
        EXPECT_EQ(events.size(), fresh.size()) << "more than entry events";
    }

    /** Starts the BMC of @p profile with @p records records and subscribes
     *  to every indication class. */
    void startSubscribed(const BmcProfile& profile, unsigned records)
    {
        start(profile);
        addRecords(records);
        subscribeAll();
    }

    /** Clears the SEL through ClearLog and checks that exactly one clear
     *  event, and nothing else, is announced. */
    void expectClearIsOneClearEvent()
    {
        ASSERT_EQ(clearLog().rc, CMPI_RC_OK);
        const auto events = settle();
        ASSERT_EQ(events.size(), 1u);
        EXPECT_EQ(events[0].instance.path.className, clearEvent);
    }
};

} // namespace

TEST_F(AlertingProfilesTest, FrozenRingBufferAnnouncesEveryNewRecord)
{
    startSubscribed(frozenRing(16), 16);
    addAndExpectEntryEvents(3);
    addAndExpectEntryEvents(5);
    addAndExpectEntryEvents(1);
    expectEnumerationIsTheSel();
}

TEST_F(AlertingProfilesTest, RingBufferWrappingIdsGiveNoClear)
{
    BmcProfile profile = frozenRing(16);
    profile.lastId = 20;
    startSubscribed(profile, 16);
    // Every record of the SEL replaced, ids used again: no clear.
    for (int round = 0; round < 4; ++round)
    {
        addAndExpectEntryEvents(6);
    }
}

TEST_F(AlertingProfilesTest, RolloverRecordIsOneFullEvent)
{
    BmcProfile profile = frozenRing(16);
    profile.rolloverRecord = true;
    profile.freeSpace = FreeSpaceAnswer::AlwaysFFFF;
    startSubscribed(profile, 10);
    const auto before = bmc->truth();
    addRecords(8); // fills the ring: the BMC logs "SEL full"
    const auto events = settle();
    const auto fresh = added(before, bmc->truth());
    expectEntryEvents(events, fresh);
    const auto full = ofClass(events, fullEvent);
    ASSERT_EQ(full.size(), 1u);
    EXPECT_THAT(text(full[0].instance, "EventID"), HasSubstr("Critical"));
    // The ring goes on overwriting: no second full event.
    addAndExpectEntryEvents(3);
}

TEST_F(AlertingProfilesTest, TwoRecordsInOneSecondAreTwoEvents)
{
    BmcProfile profile;
    profile.additionIsNewestTime = true;
    startSubscribed(profile, 2);
    const auto before = bmc->truth();
    bmc->add(QX::test::eventBody(700), 0x66000000);
    bmc->add(QX::test::eventBody(701), 0x66000000);
    const auto events = settle();
    expectEntryEvents(events, added(before, bmc->truth()));
}

TEST_F(AlertingProfilesTest, ClearWithUnsetEraseTimeIsOneClearEvent)
{
    BmcProfile profile;
    profile.eraseTimeUnset = true;
    startSubscribed(profile, 5);
    expectClearIsOneClearEvent();
}

TEST_F(AlertingProfilesTest, ClearByAnotherProgramWithFrozenTimes)
{
    BmcProfile profile;
    profile.frozenTimestamps = true;
    profile.clearedRecordAfterErase = true;
    startSubscribed(profile, 5);
    bmc->clearByOther();
    const auto events = settle();
    // The "log cleared" record is new too.
    ASSERT_EQ(ofClass(events, clearEvent).size(), 1u);
    EXPECT_EQ(ofClass(events, entryEvent).size(), 1u);
    EXPECT_TRUE(ofClass(events, fullEvent).empty());
    addAndExpectEntryEvents(2);
}

TEST_F(AlertingProfilesTest, BackgroundClearIsOneClearEvent)
{
    startSubscribed(backgroundClear(std::chrono::milliseconds(800)), 6);
    ASSERT_EQ(clearLog().rc, CMPI_RC_OK);
    const auto events = settle();
    EXPECT_EQ(ofClass(events, clearEvent).size(), 1u);
    EXPECT_LE(ofClass(events, entryEvent).size(), 1u);
    EXPECT_TRUE(ofClass(events, fullEvent).empty());
}

TEST_F(AlertingProfilesTest, IdRestartWithoutEraseIsNoClear)
{
    BmcProfile profile;
    profile.frozenTimestamps = true;
    profile.firstId = 5001;
    startSubscribed(profile, 4);
    bmc->restartIds();
    addAndExpectEntryEvents(3);
}

TEST_F(AlertingProfilesTest, ReusedIdIsANewRecord)
{
    BmcProfile profile;
    profile.reuseDeletedIds = true;
    profile.frozenTimestamps = true;
    startSubscribed(profile, 5);
    bmc->remove(2);
    EXPECT_TRUE(settle().empty()) << "a delete is neither entry nor clear";
    addAndExpectEntryEvents(1);
}

TEST_F(AlertingProfilesTest, LyingFreeSpaceGivesNoCriticalEvent)
{
    BmcProfile profile;
    profile.freeSpace = FreeSpaceAnswer::AlwaysZero;
    start(profile);
    subscribeAll();
    addAndExpectEntryEvents(2);
    const auto log = enumerate("ZAN_MgmtHwLog");
    ASSERT_EQ(log.instances.size(), 1u);
}

TEST_F(AlertingProfilesTest, FillRecordsAreTheFillSignalWhenFreeSpaceLies)
{
    BmcProfile profile;
    profile.freeSpace = FreeSpaceAnswer::AlwaysFFFF;
    profile.overflowNeverSet = true;
    startSubscribed(profile, 3);
    bmc->add(QX::test::loggingDisabledBody(0x05)); // almost full
    auto events = settle();
    auto full = ofClass(events, fullEvent);
    ASSERT_EQ(full.size(), 1u);
    EXPECT_THAT(text(full[0].instance, "EventID"), HasSubstr("Warning"));
    EXPECT_EQ(ofClass(events, entryEvent).size(), 1u);

    bmc->add(QX::test::loggingDisabledBody(0x04)); // full
    events = settle();
    full = ofClass(events, fullEvent);
    ASSERT_EQ(full.size(), 1u);
    EXPECT_THAT(text(full[0].instance, "EventID"), HasSubstr("Critical"));

    // Still full: records keep coming, no further full event.
    addAndExpectEntryEvents(2);
}

TEST_F(AlertingProfilesTest, ChainFaultsAnnounceEachRecordOnce)
{
    BmcProfile profile;
    profile.countExcess = 2;
    start(profile);
    const auto ids = addRecords(6);
    subscribeAll();
    bmc->armZeroNextId();
    addAndExpectEntryEvents(2);
    bmc->armSelfNextId();
    addAndExpectEntryEvents(2);
    bmc->armMissing(bmc->truth().back()[0] |
                    static_cast<std::uint16_t>(bmc->truth().back()[1] << 8));
    addAndExpectEntryEvents(2);
    expectEnumerationIsTheSel();
}

TEST_F(AlertingProfilesTest, RefusedReservationAndSdrTimeout)
{
    BmcProfile profile;
    profile.reserveRefusal = QX::Ipmi::completionInsufficientPrivilege;
    start(profile);
    describer->sdrTimesOut = true;
    addRecords(3);
    subscribeAll();
    addAndExpectEntryEvents(3);
    expectClearIsOneClearEvent();
}

TEST_F(AlertingProfilesTest, SlowBmcAnnouncesEveryRecordOnce)
{
    start(slowBmc(11, std::chrono::milliseconds(1200)), 5000);
    addRecords(4);
    subscribeAll();
    addAndExpectEntryEvents(3);
    addAndExpectEntryEvents(2);
}

TEST_F(AlertingProfilesTest, IdlePollCostsTwoRequests)
{
    startSubscribed(frozenRing(16), 16);
    waitForPolls(2);
    const std::uint64_t requests = ipmi().requestCount();
    const std::uint64_t polls = ipmi().pollCount();
    waitForPolls(10);
    const std::uint64_t spentPolls = ipmi().pollCount() - polls;
    const std::uint64_t spent = ipmi().requestCount() - requests;
    // Get SEL Info and the newest record; a poll may be under way.
    EXPECT_GE(spent, 2 * spentPolls);
    EXPECT_LE(spent, 2 * (spentPolls + 1));
}

TEST_F(AlertingProfilesTest, ColdReadCostsOneRequestPerRecord)
{
    start({});
    addRecords(300);
    const std::uint64_t before = ipmi().requestCount();
    expectEnumerationIsTheSel();
    const std::uint64_t spent = ipmi().requestCount() - before;
    // Each record once, plus Get SEL Info twice, Reserve SEL and the
    // restart cause, and two requests for each further look the request
    // takes at the SEL.
    EXPECT_LE(spent, 300u + 12u);
    EXPECT_GE(spent, 300u);
    std::cout << "cold read of 300 records: " << spent << " requests\n";
}
