// The log's fill and cleared status from Get SEL Info and the records,
// where Get SEL Info can and cannot be believed.

#include "ipmi/SelFill.h"

#include "NodeLexicon.h"
#include "platform/FakeBmc.h"

#include <gtest/gtest.h>

using namespace QX;
using namespace QX::Ipmi;
using namespace QX::NodeLexicon;

namespace
{

SelRecordBytes loggingDisabled(std::uint16_t id, std::uint8_t offset)
{
    SelRecordBytes record = test::logClearedRecord(id);
    record[13] = offset;
    return record;
}

class SelFillTest : public ::testing::Test
{
  protected:
    void add(const SelRecordBytes& bytes)
    {
        test::appendCached(records, bytes);
        info.entries = static_cast<std::uint16_t>(records.size());
    }
    void addRecords(unsigned count)
    {
        for (unsigned i = 0; i < count; ++i)
        {
            add(test::selRecord(
                static_cast<std::uint16_t>(records.size() + 1)));
        }
    }
    LogState state(bool clearSeen = false) const
    {
        return logStateOf(info, records, clearSeen, settings);
    }

    SelInfo info;
    std::vector<CachedRecord> records;
    Settings settings;
};

TEST_F(SelFillTest, BelievableFreeSpaceGivesTheFill)
{
    addRecords(8);
    info.freeSpace = 2 * 16;
    EXPECT_EQ(state().maxRecords, 10u);
    EXPECT_EQ(state().status, EventLogStatusAlmostFull);
    info.freeSpace = 0;
    EXPECT_EQ(state().status, EventLogStatusFull);
}

TEST_F(SelFillTest, FreeSpaceFFFFhIsUnknownNotFull)
{
    addRecords(3000);
    info.freeSpace = 0xFFFF;
    EXPECT_EQ(state().status, 1u);
    EXPECT_EQ(state().maxRecords, 3000u + 4095u);
}

TEST_F(SelFillTest, FreeSpaceZeroWithTwoRecordsIsNotBelieved)
{
    addRecords(2);
    info.freeSpace = 0;
    EXPECT_EQ(state().status, 1u);
    EXPECT_EQ(state().maxRecords, smallestSel);
}

TEST_F(SelFillTest, FillRecordsAreAFillSignalOfTheirOwn)
{
    addRecords(2);
    info.freeSpace = 0xFFFF;
    add(loggingDisabled(3, 0x05));
    EXPECT_EQ(state().status, EventLogStatusAlmostFull);
    add(loggingDisabled(4, 0x04));
    EXPECT_EQ(state().status, EventLogStatusFull);
    // Deasserted, they say nothing; after a clear, the old ones neither.
    records.clear();
    add(test::logClearedRecord(1));
    EXPECT_EQ(state().status, 1u);
    SelRecordBytes deasserted = loggingDisabled(2, 0x04);
    deasserted[12] = 0xef;
    add(deasserted);
    EXPECT_EQ(state().status, 1u);
}

TEST_F(SelFillTest, EmptiedSelIsClearedByEraseTimeOrByWhatWasSeen)
{
    info.freeSpace = 512 * 16;
    info.mostRecentErase = 0xFFFFFFFF;
    EXPECT_EQ(state().status, 1u);
    EXPECT_EQ(state(true).status, EventLogStatusCleared);
    info.mostRecentErase = 0x65000000;
    EXPECT_EQ(state().status, EventLogStatusCleared);
    add(test::logClearedRecord(1));
    EXPECT_TRUE(state().isEmpty);
    EXPECT_EQ(state().status, EventLogStatusCleared);
}

} // namespace
