// A new provider load over the SEL copy an earlier load kept on disk, on
// BMCs that behave as real ones do: the enumeration through the exported
// instance MI is the BMC's SEL whatever happened while nothing ran, an
// unchanged SEL costs no walk, added records cost only themselves, and
// the indication MI announces exactly what was added meanwhile.

#include "ProfileFixture.h"
#include "ipmi/SelCopyFile.h"

#include <filesystem>
#include <fstream>
#include <unistd.h>

using namespace profiles;
using QX::test::BmcProfile;

namespace
{

class RestartProfilesTest : public ProfileTest
{
  protected:
    void SetUp() override
    {
        ProfileTest::SetUp();
        directory =
            std::filesystem::temp_directory_path() /
            ("sel-restart-" + std::to_string(::getpid()) + "-" +
             ::testing::UnitTest::GetInstance()->current_test_info()->name());
        std::filesystem::remove_all(directory);
        selCopy.bmcKey = "lan-127.0.0.1";
        selCopy.file = (directory / ("sel-copy-" + selCopy.bmcKey)).string();
        alertStateFile = (directory / "sel-alerts").string();
    }
    void TearDown() override
    {
        ProfileTest::TearDown();
        std::filesystem::remove_all(directory);
    }

    /** Reads the SEL once through the provider, so the copy is kept. */
    void readOnce()
    {
        expectEnumerationIsTheSel();
        ASSERT_TRUE(std::filesystem::exists(selCopy.file));
    }

    /** What an enumeration costs in a process that has read the SEL
     *  before and finds it unchanged. */
    struct Cost;
    Cost warmCost();

    /** Requests and Get SEL Entry calls the BMC answered since @p since. */
    struct Cost
    {
        std::uint64_t requests = 0;
        unsigned entries = 0;
    };
    Cost costNow() const
    {
        return Cost{bmc->requestCount(), bmc->entryCalls()};
    }
    Cost costSince(const Cost& since) const
    {
        const Cost now = costNow();
        return Cost{now.requests - since.requests, now.entries - since.entries};
    }

    std::filesystem::path directory;
};

RestartProfilesTest::Cost RestartProfilesTest::warmCost()
{
    const Cost before = costNow();
    expectEnumerationIsTheSel();
    return costSince(before);
}

BmcProfile frozen()
{
    BmcProfile profile;
    profile.frozenTimestamps = true;
    profile.eraseTimeUnset = true;
    profile.clearedRecordAfterErase = true;
    return profile;
}

} // namespace

TEST_F(RestartProfilesTest, UnchangedSelIsConfirmedNotRead)
{
    start(BmcProfile{});
    addRecords(300);
    readOnce();
    const Cost warm = warmCost();
    restart();
    const Cost before = costNow();
    expectEnumerationIsTheSel();
    const Cost cost = costSince(before);
    // What a warm process pays (Get SEL Info and the newest record per
    // look), and the restart cause once.
    EXPECT_LE(cost.requests, warm.requests + 1);
    EXPECT_EQ(cost.entries, warm.entries);
}

TEST_F(RestartProfilesTest, OneEnumerationOfAnUnchangedSelAsksTheBmcOnce)
{
    start(BmcProfile{});
    addRecords(300);
    readOnce();
    // Get SEL Info and the newest record, once for the whole request
    // although it walks the tree with two cursors.
    const Cost warm = warmCost();
    EXPECT_EQ(warm.requests, 2u);
    EXPECT_EQ(warm.entries, 1u);
    restart();
    const Cost before = costNow();
    expectEnumerationIsTheSel();
    const Cost cost = costSince(before);
    // The same, and Get System Restart Cause once for the new session.
    EXPECT_EQ(cost.requests, 3u);
    EXPECT_EQ(cost.entries, 1u);
}

TEST_F(RestartProfilesTest, UnchangedFrozenSelIsConfirmedNotRead)
{
    start(frozen());
    addRecords(40);
    readOnce();
    const Cost warm = warmCost();
    restart();
    const Cost before = costNow();
    expectEnumerationIsTheSel();
    EXPECT_LE(costSince(before).requests, warm.requests + 1);
}

TEST_F(RestartProfilesTest, RecordsAddedMeanwhileAreReadAlone)
{
    start(BmcProfile{});
    addRecords(200);
    readOnce();
    const Cost warm = warmCost();
    restart();
    addRecords(10);
    const Cost before = costNow();
    expectEnumerationIsTheSel();
    // The last known record again and the ten new ones, besides what a
    // warm look costs.
    EXPECT_LE(costSince(before).entries, warm.entries + 11);
    // The next process confirms the copy that includes them.
    restart();
    const Cost again = costNow();
    expectEnumerationIsTheSel();
    EXPECT_LE(costSince(again).requests, warm.requests + 1);
}

TEST_F(RestartProfilesTest, ClearMeanwhileIsSeen)
{
    start(BmcProfile{});
    addRecords(30);
    readOnce();
    restart();
    bmc->clearByOther();
    expectEnumerationIsTheSel();
    restart();
    addRecords(4);
    expectEnumerationIsTheSel();
}

TEST_F(RestartProfilesTest, ClearWithFrozenTimesMeanwhileIsSeen)
{
    start(frozen());
    addRecords(30);
    readOnce();
    restart();
    bmc->clearByOther();
    addRecords(29); // as many as before, with the "log cleared" record
    expectEnumerationIsTheSel();
}

TEST_F(RestartProfilesTest, RingBufferThatWrappedMeanwhileIsReadAgain)
{
    start(frozenRing(16));
    addRecords(16);
    readOnce();
    restart();
    addRecords(5); // same count, same times, five records replaced
    expectEnumerationIsTheSel();
    restart();
    addRecords(16); // every record replaced
    expectEnumerationIsTheSel();
}

TEST_F(RestartProfilesTest, ReplacedBmcIsReadWhole)
{
    start(frozen());
    addRecords(20);
    readOnce();
    restart();
    // Another BMC at the same address: as many records, same frozen times,
    // other contents.
    replaceBmc(frozen());
    nextBody = 1000;
    addRecords(20);
    restart();
    const Cost before = costNow();
    expectEnumerationIsTheSel();
    EXPECT_GE(costSince(before).entries, 20u);
}

TEST_F(RestartProfilesTest, DamagedCopyMeansAWholeRead)
{
    start(BmcProfile{});
    addRecords(25);
    readOnce();
    // Truncated: the last record and the checksum lost.
    const auto size = std::filesystem::file_size(selCopy.file);
    std::filesystem::resize_file(selCopy.file, size - 20);
    restart();
    Cost before = costNow();
    expectEnumerationIsTheSel();
    EXPECT_GE(costSince(before).entries, 25u);

    // A bit flipped inside a record.
    ASSERT_TRUE(std::filesystem::exists(selCopy.file));
    {
        std::fstream file(selCopy.file,
                          std::ios::in | std::ios::out | std::ios::binary);
        file.seekp(static_cast<std::streamoff>(size / 2));
        file.put('\x5a');
    }
    restart();
    before = costNow();
    expectEnumerationIsTheSel();
    EXPECT_GE(costSince(before).entries, 25u);
}

TEST_F(RestartProfilesTest, CopyOfAnotherBmcIsNotUsed)
{
    start(BmcProfile{});
    addRecords(25);
    readOnce();
    // The file of one BMC given as another's.
    selCopy.bmcKey = "lan-127.0.0.2";
    restart();
    const Cost before = costNow();
    expectEnumerationIsTheSel();
    EXPECT_GE(costSince(before).entries, 25u);
}

TEST_F(RestartProfilesTest, CopyFileIsOwnerOnly)
{
    start(BmcProfile{});
    addRecords(3);
    readOnce();
    const auto permissions =
        std::filesystem::status(selCopy.file).permissions();
    EXPECT_EQ(permissions & std::filesystem::perms::all,
              std::filesystem::perms::owner_read |
                  std::filesystem::perms::owner_write);
}

TEST_F(RestartProfilesTest, PollerStartsWarmAndAnnouncesWhatWasAdded)
{
    start(BmcProfile{});
    addRecords(120);
    subscribeAll();
    EXPECT_TRUE(settle().empty());
    restart();
    const auto before = bmc->truth();
    addRecords(5);
    const Cost cost = costNow();
    subscribeAll();
    const auto events = settle();
    const auto fresh = added(before, bmc->truth());
    ASSERT_EQ(fresh.size(), 5u);
    expectEntryEvents(events, fresh);
    EXPECT_EQ(events.size(), fresh.size()) << "more than entry events";
    // No walk of the 120 records kept.
    EXPECT_LT(costSince(cost).entries, 40u);
}

TEST_F(RestartProfilesTest, PollerAfterAnUnchangedRestartAnnouncesNothing)
{
    start(frozen());
    addRecords(50);
    subscribeAll();
    EXPECT_TRUE(settle().empty());
    restart();
    const Cost cost = costNow();
    subscribeAll();
    EXPECT_TRUE(settle().empty());
    EXPECT_LT(costSince(cost).entries, 20u);
}

TEST_F(RestartProfilesTest, PollerAnnouncesRecordsThatWrappedMeanwhile)
{
    start(frozenRing(16));
    addRecords(16);
    subscribeAll();
    EXPECT_TRUE(settle().empty());
    restart();
    const auto before = bmc->truth();
    addRecords(6);
    subscribeAll();
    const auto events = settle();
    expectEntryEvents(events, added(before, bmc->truth()));
    EXPECT_TRUE(ofClass(events, clearEvent).empty());
}

TEST_F(RestartProfilesTest, PollerAnnouncesAClearMeanwhile)
{
    start(BmcProfile{});
    addRecords(20);
    subscribeAll();
    EXPECT_TRUE(settle().empty());
    restart();
    bmc->clearByOther();
    subscribeAll();
    const auto events = settle();
    EXPECT_EQ(ofClass(events, clearEvent).size(), 1u);
    EXPECT_EQ(events.size(), 1u);
    expectEnumerationIsTheSel();
    // And the next process does not announce it again.
    restart();
    const auto before = bmc->truth();
    addRecords(2);
    subscribeAll();
    const auto later = settle();
    expectEntryEvents(later, added(before, bmc->truth()));
    EXPECT_EQ(later.size(), 2u);
}

TEST_F(RestartProfilesTest, TextsAreKeptUnderTheSameNames)
{
    textsKey = "names-1";
    start(BmcProfile{});
    addRecords(40);
    readOnce();
    restart();
    expectEnumerationIsTheSel();
    EXPECT_EQ(describer->described, 0u);
    const auto entries = enumerate("ZAN_MgmtHwLogEntry");
    ASSERT_EQ(entries.instances.size(), 40u);
    EXPECT_EQ(text(entries.instances[4], "Description"), "event 5");
    // Other sensor names: every text is made again.
    textsKey = "names-2";
    restart();
    expectEnumerationIsTheSel();
    EXPECT_EQ(describer->described, 40u);
    // No key: texts are not reused.
    textsKey.clear();
    restart();
    expectEnumerationIsTheSel();
    EXPECT_EQ(describer->described, 40u);
}
