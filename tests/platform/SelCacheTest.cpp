#include "ipmi/SelCache.h"

#include "platform/FakeBmc.h"

#include <chrono>
#include <thread>

#include <gtest/gtest.h>

using namespace QX;
using namespace QX::Ipmi;
using QX::test::CountingDescriber;
using QX::test::FakeBmc;
using QX::test::selRecord;

namespace
{

std::vector<std::uint16_t> ids(const SelCache& cache)
{
    std::vector<std::uint16_t> result;
    for (const CachedRecord& record : cache.records())
    {
        result.push_back(record.id);
    }
    return result;
}

class SelCacheTest : public ::testing::Test
{
  protected:
    void fill(unsigned count, std::uint16_t firstId = 1)
    {
        for (unsigned i = 0; i < count; ++i)
        {
            bmc.add(selRecord(static_cast<std::uint16_t>(firstId + i)));
        }
    }

    FakeBmc bmc;
    CountingDescriber describer;
    SelCache cache;
};

TEST_F(SelCacheTest, FirstRefreshReadsTheWholeSel)
{
    fill(5);
    EXPECT_EQ(cache.refresh(bmc, describer), SelChange::Replaced);
    EXPECT_EQ(ids(cache), (std::vector<std::uint16_t>{1, 2, 3, 4, 5}));
    EXPECT_EQ(cache.records()[2].bytes, selRecord(3));
    EXPECT_EQ(cache.records()[2].description, "event 3");
    EXPECT_EQ(cache.info().entries, 5u);
    EXPECT_EQ(bmc.entryCalls, 5u);
}

TEST_F(SelCacheTest, UnchangedSelCostsGetSelInfoAndTheNewestRecord)
{
    fill(50);
    cache.refresh(bmc, describer);
    bmc.resetCounters();
    const unsigned describedBefore = describer.described;
    EXPECT_EQ(cache.refresh(bmc, describer), SelChange::None);
    EXPECT_EQ(bmc.selInfoCalls, 1u);
    EXPECT_EQ(bmc.entryCalls, 1u);
    EXPECT_EQ(bmc.exchanges(), 2u);
    EXPECT_EQ(describer.described, describedBefore);
}

TEST_F(SelCacheTest, AddedRecordsAreTheOnlyOnesRead)
{
    fill(50);
    cache.refresh(bmc, describer);
    fill(3, 51);
    bmc.resetCounters();
    EXPECT_EQ(cache.refresh(bmc, describer), SelChange::Appended);
    EXPECT_EQ(cache.firstNew(), 50u);
    ASSERT_EQ(cache.records().size(), 53u);
    EXPECT_EQ(cache.records().back().id, 53u);
    // The last known record once more, then the three new ones.
    EXPECT_EQ(bmc.entryCalls, 4u);
    EXPECT_EQ(bmc.selInfoCalls, 1u);
}

TEST_F(SelCacheTest, AnEraseReadsEverythingAgain)
{
    fill(5);
    cache.refresh(bmc, describer);
    bmc.sel.clear();
    ++bmc.lastErase;
    fill(7, 6);
    EXPECT_EQ(cache.refresh(bmc, describer), SelChange::Replaced);
    EXPECT_EQ(ids(cache), (std::vector<std::uint16_t>{6, 7, 8, 9, 10, 11, 12}));
}

TEST_F(SelCacheTest, AChangedLastRecordReadsEverythingAgain)
{
    fill(5);
    cache.refresh(bmc, describer);
    bmc.sel.back() = selRecord(5, 0x66000000);
    fill(1, 6);
    EXPECT_EQ(cache.refresh(bmc, describer), SelChange::Replaced);
    EXPECT_EQ(cache.records()[4].bytes, selRecord(5, 0x66000000));
}

TEST_F(SelCacheTest, SameInfoWithAnotherNewestRecordReadsAgain)
{
    fill(5);
    cache.refresh(bmc, describer);
    bmc.resetCounters();
    EXPECT_EQ(cache.refresh(bmc, describer), SelChange::None);
    EXPECT_EQ(bmc.entryCalls, 1u);

    // Same counts and times, other content (a ring buffer that replaced
    // its oldest record, a BMC that restarted): read again.
    bmc.sel.erase(bmc.sel.begin());
    bmc.sel.push_back(selRecord(6, 0x66000000));
    EXPECT_EQ(cache.refresh(bmc, describer), SelChange::Replaced);
    EXPECT_EQ(ids(cache), (std::vector<std::uint16_t>{2, 3, 4, 5, 6}));
}

TEST_F(SelCacheTest, CancelledReservationMidWalkRestartsTheWalk)
{
    fill(10);
    bmc.cancelAtEntry = 4;
    EXPECT_EQ(cache.refresh(bmc, describer), SelChange::Replaced);
    EXPECT_EQ(cache.records().size(), 10u);
    EXPECT_EQ(bmc.reserveCalls, 2u);
    EXPECT_EQ(bmc.entryCalls, 15u);
}

TEST_F(SelCacheTest, ReservationCancelledOnEveryWalkGivesUp)
{
    fill(10);
    bmc.cancelAlways = true;
    try
    {
        cache.refresh(bmc, describer);
        FAIL() << "no error";
    }
    catch (const IpmiError& error)
    {
        EXPECT_EQ(error.completionCode(), completionReservationCancelled);
    }
    EXPECT_EQ(bmc.reserveCalls, SelCache::walkAttempts);
    // Nothing was taken from the failed walks; the next refresh reads all.
    EXPECT_TRUE(cache.records().empty());
    bmc.cancelAlways = false;
    EXPECT_EQ(cache.refresh(bmc, describer), SelChange::Replaced);
    EXPECT_EQ(cache.records().size(), 10u);
}

TEST_F(SelCacheTest, CancelledReservationWhileReadingAdditionsReadsAll)
{
    fill(5);
    cache.refresh(bmc, describer);
    fill(2, 6);
    bmc.cancelAtEntry = 1;
    EXPECT_EQ(cache.refresh(bmc, describer), SelChange::Replaced);
    EXPECT_EQ(cache.records().size(), 7u);
}

TEST_F(SelCacheTest, IdsStartingAgainCountRuns)
{
    fill(3, 5001);
    fill(2, 1);
    cache.refresh(bmc, describer);
    ASSERT_EQ(ids(cache), (std::vector<std::uint16_t>{5001, 5002, 5003, 1, 2}));
    std::vector<std::uint32_t> runs;
    for (const CachedRecord& record : cache.records())
    {
        runs.push_back(record.run);
    }
    EXPECT_EQ(runs, (std::vector<std::uint32_t>{0, 0, 0, 1, 1}));

    // Records added later continue the run of the last one.
    fill(1, 3);
    EXPECT_EQ(cache.refresh(bmc, describer), SelChange::Appended);
    EXPECT_EQ(cache.records().back().run, 1u);
}

TEST_F(SelCacheTest, ALoopingNextRecordChainEndsTheWalk)
{
    // Two records that name each other as next, forever.
    class LoopingBmc : public FakeBmc
    {
      public:
        SelEntry getSelEntry(std::uint16_t reservation,
                             std::uint16_t recordId) override
        {
            SelEntry entry = FakeBmc::getSelEntry(reservation, recordId);
            entry.nextRecordId = recordId == 2 ? 1 : 2;
            return entry;
        }
    } looping;
    looping.add(selRecord(1));
    looping.add(selRecord(2));
    // The walk ends where the chain names an id it asked for already (the
    // first record was asked as 0000h, so it comes once more), keeping
    // what it read; the record is asked once more before its next id is
    // given up.
    EXPECT_EQ(cache.refresh(looping, describer), SelChange::Replaced);
    EXPECT_EQ(ids(cache), (std::vector<std::uint16_t>{1, 2, 1}));
    EXPECT_EQ(looping.entryCalls, 4u);
}

TEST_F(SelCacheTest, NewSensorNamesDescribeEveryRecordAgain)
{
    fill(4);
    cache.refresh(bmc, describer);
    describer.namesChanged = true;
    const unsigned before = describer.described;
    EXPECT_EQ(cache.refresh(bmc, describer), SelChange::Replaced);
    EXPECT_EQ(describer.described, before + 4);
}

TEST_F(SelCacheTest, AnEmptySelNeedsNoWalk)
{
    EXPECT_EQ(cache.refresh(bmc, describer), SelChange::Replaced);
    EXPECT_TRUE(cache.records().empty());
    EXPECT_EQ(bmc.entryCalls, 0u);
}

TEST_F(SelCacheTest, AFailedRefreshLeavesTheCopy)
{
    fill(3);
    cache.refresh(bmc, describer);
    bmc.failure.emplace("ipmi_cmd_get_sel_info", ErrorCategory::Timeout,
                        "session timeout");
    EXPECT_THROW(cache.refresh(bmc, describer), IpmiError);
    EXPECT_EQ(cache.records().size(), 3u);
    bmc.failure.reset();
    EXPECT_EQ(cache.refresh(bmc, describer), SelChange::None);
}

TEST_F(SelCacheTest, VerifyIntervalCatchesWhatNothingElseShows)
{
    SelCache verifying(std::chrono::seconds(30), std::chrono::seconds(1));
    fill(5);
    verifying.refresh(bmc, describer);
    // A record in the middle replaced: same count, times and newest record.
    bmc.sel[2] = selRecord(3, 0x66000000);
    EXPECT_EQ(verifying.refresh(bmc, describer), SelChange::None);
    std::this_thread::sleep_for(std::chrono::milliseconds(1050));
    bmc.resetCounters();
    EXPECT_EQ(verifying.refresh(bmc, describer), SelChange::Replaced);
    EXPECT_EQ(verifying.records()[2].bytes, selRecord(3, 0x66000000));
    EXPECT_EQ(bmc.entryCalls, 5u);
    // Read again and unchanged: nothing to rebuild.
    std::this_thread::sleep_for(std::chrono::milliseconds(1050));
    EXPECT_EQ(verifying.refresh(bmc, describer), SelChange::None);
}

TEST_F(SelCacheTest, SensorNamesThatCannotBeReadLeaveTheSel)
{
    class RefusingDescriber : public CountingDescriber
    {
      public:
        bool refreshSensorNames() override
        {
            throw IpmiError("ipmi_sdr_cache_create",
                            ErrorCategory::CompletionCode, "timeout",
                            completionTimedOut);
        }
    } refusing;
    fill(3);
    EXPECT_EQ(cache.refresh(bmc, refusing), SelChange::Replaced);
    EXPECT_EQ(cache.records().size(), 3u);
}

} // namespace

namespace
{

// Fails every Get SEL Entry while asked to: the BMC goes away after
// Get SEL Info.
class EntryFailingBmc : public FakeBmc
{
  public:
    bool failEntries = false;

    SelEntry getSelEntry(std::uint16_t reservationId,
                         std::uint16_t recordId) override
    {
        if (failEntries)
        {
            throw IpmiError("ipmi_cmd_get_sel_entry",
                            ErrorCategory::CompletionCode, "timeout",
                            completionTimedOut);
        }
        return FakeBmc::getSelEntry(reservationId, recordId);
    }
};

} // namespace

TEST_F(SelCacheTest, AdoptedCopyConfirmedByTheBmcIsNotRead)
{
    fill(20);
    cache.refresh(bmc, describer);
    const std::optional<KeptSel> kept = cache.keep("");
    ASSERT_TRUE(kept);
    EXPECT_EQ(kept->records.size(), 20u);
    EXPECT_TRUE(kept->texts.empty());

    SelCache next;
    next.adopt(*kept);
    bmc.resetCounters();
    EXPECT_EQ(next.refresh(bmc, describer), SelChange::Replaced);
    EXPECT_EQ(ids(next), ids(cache));
    EXPECT_EQ(bmc.selInfoCalls, 1u);
    EXPECT_EQ(bmc.entryCalls, 1u); // the newest record
    EXPECT_EQ(next.records()[3].description, "event 4");
    EXPECT_EQ(next.refresh(bmc, describer), SelChange::None);
}

TEST_F(SelCacheTest, AdoptedCopyThatNoLongerMatchesIsReadWhole)
{
    fill(20);
    cache.refresh(bmc, describer);
    const std::optional<KeptSel> kept = cache.keep("");
    ASSERT_TRUE(kept);
    // Same count and times, another newest record.
    bmc.sel.back() = selRecord(99);

    SelCache next;
    next.adopt(*kept);
    bmc.resetCounters();
    EXPECT_EQ(next.refresh(bmc, describer), SelChange::Replaced);
    EXPECT_EQ(next.records().back().bytes, selRecord(99));
    EXPECT_GE(bmc.entryCalls, 20u);
}

TEST_F(SelCacheTest, CopyNotKnownToMatchIsNotKept)
{
    EXPECT_FALSE(cache.keep(""));
    fill(5);
    cache.refresh(bmc, describer);
    EXPECT_TRUE(cache.keep(""));
    cache.invalidate();
    EXPECT_FALSE(cache.keep(""));
}

TEST_F(SelCacheTest, AdoptedCopyIsShownAfterARefreshThatFailed)
{
    EntryFailingBmc failing;
    for (std::uint16_t id = 1; id <= 10; ++id)
    {
        failing.add(selRecord(id));
    }
    cache.refresh(failing, describer);
    const std::optional<KeptSel> kept = cache.keep("");
    ASSERT_TRUE(kept);

    SelCache next;
    next.adopt(*kept);
    failing.failEntries = true;
    EXPECT_THROW(next.refresh(failing, describer), IpmiError);
    failing.failEntries = false;
    // Whoever shows the copy has not seen its records yet.
    EXPECT_EQ(next.refresh(failing, describer), SelChange::Replaced);
    EXPECT_EQ(next.firstNew(), 0u);
    EXPECT_EQ(ids(next), ids(cache));
}
