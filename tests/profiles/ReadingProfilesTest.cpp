// Enumerations through the exported instance MI on BMCs that behave as
// real ones do: every one equals the BMC's SEL (ids, bytes, order) and
// ends in bounded time.

#include "ClearAndSlowProfiles.h"
#include "ProfileFixture.h"
#include "ipmi/SelRecord.h"

#include <chrono>

using namespace profiles;
using QX::test::BmcProfile;
using QX::test::FreeSpaceAnswer;

namespace
{

class ReadingProfilesTest : public ProfileTest
{
};

} // namespace

TEST_F(ReadingProfilesTest, FrozenRingBufferShowsReplacedRecords)
{
    start(frozenRing(16));
    addRecords(16);
    expectEnumerationIsTheSel();
    // Five new records replace the five oldest: count and Get SEL Info
    // stay the same.
    addRecords(5);
    expectEnumerationIsTheSel();
    addRecords(1);
    expectEnumerationIsTheSel();
}

TEST_F(ReadingProfilesTest, RingBufferWithWrappingIdsAndRolloverRecord)
{
    BmcProfile profile = frozenRing(16);
    profile.rolloverRecord = true;
    profile.lastId = 20; // ids 1..20, then 1 again
    start(profile);
    addRecords(10);
    expectEnumerationIsTheSel();
    for (int round = 0; round < 4; ++round)
    {
        addRecords(7);
        expectEnumerationIsTheSel();
    }
}

TEST_F(ReadingProfilesTest, LastAdditionIsTheNewestRecordsTime)
{
    BmcProfile profile;
    profile.additionIsNewestTime = true;
    start(profile);
    addRecords(3);
    expectEnumerationIsTheSel();
    // Two records in one second: Get SEL Info looks the same as for one.
    const std::uint32_t second = 0x66000000;
    bmc->add(QX::test::eventBody(901), second);
    expectEnumerationIsTheSel();
    bmc->add(QX::test::eventBody(902), second);
    expectEnumerationIsTheSel();
}

TEST_F(ReadingProfilesTest, IdsWithLargeGaps)
{
    BmcProfile profile;
    profile.idStep = 4000;
    start(profile);
    addRecords(12); // ids 1, 4001, ..., 44001
    expectEnumerationIsTheSel();
    addRecords(3);
    expectEnumerationIsTheSel();
}

TEST_F(ReadingProfilesTest, IdReusedAfterADelete)
{
    BmcProfile profile;
    profile.reuseDeletedIds = true;
    profile.frozenTimestamps = true;
    start(profile);
    addRecords(5);
    expectEnumerationIsTheSel();
    bmc->remove(3);
    expectEnumerationIsTheSel();
    EXPECT_EQ(addRecords(1), std::vector<std::uint16_t>{3});
    expectEnumerationIsTheSel();
}

TEST_F(ReadingProfilesTest, IdsStartingAgainAfterABmcRestart)
{
    BmcProfile profile;
    profile.frozenTimestamps = true;
    profile.firstId = 5001;
    start(profile);
    addRecords(4);
    expectEnumerationIsTheSel();
    bmc->restartIds();
    addRecords(2);
    expectEnumerationIsTheSel();
}

TEST_F(ReadingProfilesTest, NextIdZeroOnceIsAskedAgain)
{
    start({});
    addRecords(8);
    bmc->armZeroNextId();
    expectEnumerationIsTheSel();
    addRecords(2);
    bmc->armZeroNextId();
    expectEnumerationIsTheSel();
}

TEST_F(ReadingProfilesTest, NextIdEqualToTheRecordIsAskedAgain)
{
    start({});
    addRecords(8);
    bmc->armSelfNextId();
    expectEnumerationIsTheSel();
}

TEST_F(ReadingProfilesTest, ChainEndingBeforeTheCount)
{
    BmcProfile profile;
    profile.countExcess = 3;
    start(profile);
    addRecords(30);
    expectEnumerationIsTheSel();
    addRecords(2);
    expectEnumerationIsTheSel();
    // Once read, a count that never adds up costs no whole read per
    // request: one newest record per look at the SEL.
    const unsigned before = bmc->entryCalls();
    expectEnumerationIsTheSel();
    EXPECT_LT(bmc->entryCalls() - before, 10u);
}

TEST_F(ReadingProfilesTest, RememberedIdNotPresentReadsFromTheStart)
{
    start({});
    const auto ids = addRecords(6);
    expectEnumerationIsTheSel();
    bmc->armMissing(ids.back());
    addRecords(3);
    expectEnumerationIsTheSel();
}

TEST_F(ReadingProfilesTest, ReserveSelNotSupported)
{
    BmcProfile profile;
    profile.reserveRefusal = QX::Ipmi::completionInvalidCommand;
    start(profile);
    addRecords(7);
    expectEnumerationIsTheSel();
    ASSERT_EQ(clearLog().rc, CMPI_RC_OK);
    expectEnumerationIsTheSel();
    EXPECT_TRUE(bmc->truth().empty());
}

TEST_F(ReadingProfilesTest, ReserveSelRefusedBelowOperator)
{
    BmcProfile profile;
    profile.reserveRefusal = QX::Ipmi::completionInsufficientPrivilege;
    start(profile);
    addRecords(7);
    expectEnumerationIsTheSel();
    addRecords(2);
    expectEnumerationIsTheSel();
}

TEST_F(ReadingProfilesTest, OemInvalidAndUnorderedRecordsKeepTheirBytes)
{
    start({});
    addRecords(2);
    // A timestamped OEM record, a non-timestamped one, an invalid type no
    // describer understands, and a record older than the one before it.
    const QX::Ipmi::SelRecordBytes timedOem{0,    0,    0xC1, 0,    0,    0,
                                            0,    0x57, 0x01, 0x02, 0x03, 0x04,
                                            0x05, 0x06, 0x07, 0x08};
    const QX::Ipmi::SelRecordBytes plainOem{0,    0,    0xE0, 0xaa, 0xbb, 0xcc,
                                            0xdd, 0xee, 0xff, 0x01, 0x02, 0x03,
                                            0x04, 0x05, 0x06, 0x07};
    const QX::Ipmi::SelRecordBytes invalid{0, 0,    0x55, 0, 0, 0, 0, 0x20,
                                           0, 0x04, 1,    2, 3, 4, 5, 6};
    bmc->add(timedOem);
    bmc->add(plainOem);
    bmc->add(invalid);
    bmc->add(QX::test::eventBody(51), 0x10000000);
    expectEnumerationIsTheSel();
    const host::Outcome outcome = enumerate("ZAN_MgmtHwLogEntry");
    ASSERT_EQ(outcome.instances.size(), 6u);
    EXPECT_NE(text(outcome.instances[4], "Description").find("55h"),
              std::string::npos)
        << text(outcome.instances[4], "Description");
}

TEST_F(ReadingProfilesTest, SdrTimingOutLeavesTheSelReadable)
{
    start({});
    describer->sdrTimesOut = true;
    addRecords(5);
    expectEnumerationIsTheSel();
    addRecords(2);
    expectEnumerationIsTheSel();
}

TEST_F(ReadingProfilesTest, SlowBmcStillAnswersInBoundedTime)
{
    start(slowBmc(9, std::chrono::milliseconds(1500)), 5000);
    addRecords(20);
    const auto began = std::chrono::steady_clock::now();
    expectEnumerationIsTheSel();
    addRecords(3);
    expectEnumerationIsTheSel();
    // 20 ms per exchange and a slow one in nine: a few seconds at most.
    EXPECT_LT(std::chrono::steady_clock::now() - began,
              std::chrono::seconds(15));
}

TEST_F(ReadingProfilesTest, BackgroundClearIsWaitedFor)
{
    start(backgroundClear(std::chrono::milliseconds(1200)));
    addRecords(9);
    expectEnumerationIsTheSel();
    const auto began = std::chrono::steady_clock::now();
    ASSERT_EQ(clearLog().rc, CMPI_RC_OK);
    EXPECT_GE(std::chrono::steady_clock::now() - began,
              std::chrono::milliseconds(1100))
        << "ClearLog returned before the erase was done";
    const auto sel = bmc->truth();
    ASSERT_EQ(sel.size(), 1u);
    const auto cleared = QX::Ipmi::SelRecord::parse(sel.front());
    EXPECT_EQ(cleared.sensorType, 0x10); // Event Logging Disabled
    EXPECT_EQ(cleared.offset(), 0x02);   // Log Area Reset/Cleared
    expectEnumerationIsTheSel();
}

TEST_F(ReadingProfilesTest, ClearThatNeverEndsFailsWithinTheWait)
{
    BmcProfile profile;
    profile.eraseTakes = std::chrono::hours(1);
    clearWaitMs = 1000;
    start(profile);
    addRecords(3);
    const auto began = std::chrono::steady_clock::now();
    EXPECT_NE(clearLog().rc, CMPI_RC_OK);
    EXPECT_LT(std::chrono::steady_clock::now() - began,
              std::chrono::seconds(5));
}

TEST_F(ReadingProfilesTest, EraseByAnotherProgramWhileReading)
{
    BmcProfile profile;
    profile.eraseTakes = std::chrono::milliseconds(600);
    profile.clearedRecordAfterErase = true;
    start(profile);
    addRecords(9);
    expectEnumerationIsTheSel();
    bmc->clearByOther();
    // The read waits for the erase (81h meanwhile) and then reads the SEL.
    expectEnumerationIsTheSel();
    EXPECT_EQ(bmc->truth().size(), 1u);
}
