// The provider through its exported instance, method and indication MIs
// on a simulated BMC whose SEL behaves as some real BMCs' do (the bench's
// SEL module, over real RMCP+ and FreeIPMI). What the enumeration shows is
// checked against the SEL the module holds, record for record.

#include "AlertFixture.h"
#include "EventClasses.h"
#include "SelBehaviour.h"
#include "SystemEventRecord.h"

#include <cstdio>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

using bmctest::recordIdKey;
using bmctest::temperatureRecords;
using bmctest::text;
using ::testing::HasSubstr;

std::string hexBytes(const bmcsim::Record& record)
{
    std::string out;
    for (std::size_t i = 0; i < record.size(); ++i)
    {
        char pair[4];
        std::snprintf(pair, sizeof pair,
                      i + 1 < record.size() ? "%02x " : "%02x", record[i]);
        out += pair;
    }
    return out;
}

unsigned idOf(const bmcsim::Record& record)
{
    return record[0] | record[1] << 8;
}

// Fan events: different bytes from the seeded temperature records, so a
// record that replaces another one in the ring never looks like it.
std::vector<bmcsim::Record> fanRecords(unsigned count)
{
    std::vector<bmcsim::Record> records;
    for (unsigned i = 0; i < count; ++i)
    {
        records.push_back(bmcsim::systemEventRecord(
            0, 0,
            {0x04, 0x43, 0x01, 0x52, static_cast<std::uint8_t>(0x05 + i),
             0x06}));
    }
    return records;
}

class SelBehaviourTest : public bmctest::AlertTest
{
  protected:
    void SetUp() override
    {
        AlertTest::SetUp();
        if (IsSkipped())
        {
            return;
        }
        if (!bmcsim::selModuleAvailable())
        {
            GTEST_SKIP() << "the simulator's SEL module was not built "
                            "(libopenipmi-dev missing)";
        }
    }

    /** The simulator with @p seeded temperature records in a SEL of
     *  @p capacity that behaves as @p behaviour says. */
    void launchWith(bmcsim::SelBehaviour behaviour, unsigned capacity,
                    unsigned seeded)
    {
        bmcsim::Options options;
        options.maxRecords = capacity;
        options.records = temperatureRecords(seeded);
        options.selBehaviour = behaviour;
        launch(options);
    }

    /** The entries the provider enumerates are the module's SEL: the same
     *  ids and bytes in the same order. */
    void expectEnumerationIsTheTrueSel()
    {
        const auto truth = bmc().moduleSel();
        const auto outcome = enumerate("ZAN_MgmtHwLogEntry");
        ASSERT_EQ(outcome.rc, CMPI_RC_OK);
        std::vector<std::string> seen;
        seen.reserve(outcome.instances.size());
        for (const host::Instance& entry : outcome.instances)
        {
            seen.push_back(text(entry, "RecordID") + " " +
                           text(entry, "RecordData"));
        }
        std::vector<std::string> expected;
        expected.reserve(truth.size());
        for (const bmcsim::Record& record : truth)
        {
            expected.push_back(std::to_string(idOf(record)) + " " +
                               hexBytes(record));
        }
        EXPECT_EQ(seen, expected);
    }
};

// Behaviours 1 and 3: a full ring of 16 whose Get SEL Info never changes.
TEST_F(SelBehaviourTest, FrozenRingEnumerationIsTheTrueSelAsIpmitoolWalksIt)
{
    launchWith(bmcsim::SelBehaviour::frozenRing(), 16, 16);
    ASSERT_EQ(bmc().moduleSel().size(), 16u);
    expectEnumerationIsTheTrueSel();

    // ipmitool's walk of the wrapped ring (ids 6..16, then 1..5) is the
    // module's SEL too.
    bmc().addRecords(fanRecords(5));
    const auto truth = bmc().moduleSel();
    const auto walked = ipmitoolRecords();
    ASSERT_EQ(walked.size(), truth.size());
    for (std::size_t i = 0; i < truth.size(); ++i)
    {
        EXPECT_EQ(walked[i].id, idOf(truth[i])) << i;
        EXPECT_EQ(walked[i].bytes, hexBytes(truth[i])) << i;
    }
}

TEST_F(SelBehaviourTest, FrozenRingShowsRecordsThatReplacedTheOldest)
{
    launchWith(bmcsim::SelBehaviour::frozenRing(), 16, 16);
    expectEnumerationIsTheTrueSel();

    // In the same provider load, as inside an object manager: the count
    // and Get SEL Info's times stay as they were.
    const auto ids = bmc().addRecords(fanRecords(5));
    EXPECT_EQ(ids, (std::vector<std::uint16_t>{1, 2, 3, 4, 5}));
    const auto truth = bmc().moduleSel();
    ASSERT_EQ(truth.size(), 16u);
    EXPECT_EQ(idOf(truth.front()), 6u);
    EXPECT_EQ(idOf(truth.back()), 5u);
    expectEnumerationIsTheTrueSel();
}

TEST_F(SelBehaviourTest, FrozenRingDeliversOneEntryEventPerReplacingRecord)
{
    launchWith(bmcsim::SelBehaviour::frozenRing(), 16, 16);
    subscribe(testevents::entryEvent);

    const auto ids = bmc().addRecords(fanRecords(3));
    ASSERT_EQ(ids, (std::vector<std::uint16_t>{1, 2, 3}));
    expectEntryEventsFor(ids);
}

// Behaviour 6: Clear SEL runs for seconds in the background (81h for
// reads meanwhile), cancels the reservation and leaves a "Log Area
// Reset/Cleared" record.
TEST_F(SelBehaviourTest, ClearLogWaitsOutABackgroundClearAndAnnouncesItOnce)
{
    launchWith(bmcsim::SelBehaviour::backgroundClear(2000), 64, 5);
    subscribe(testevents::clearEvent);

    const auto outcome = clearLog();
    EXPECT_EQ(outcome.rc, CMPI_RC_OK);
    ASSERT_EQ(outcome.data.size(), 1u);
    EXPECT_EQ(outcome.data[0].unsignedValue(), 0u)
        << "ClearLog reported a failure";

    // Only the BMC's own "log cleared" record is left.
    const auto truth = bmc().moduleSel();
    ASSERT_EQ(truth.size(), 1u) << "the erase did not complete";
    EXPECT_EQ(truth[0][10], 0x10);        // Event Logging Disabled
    EXPECT_EQ(truth[0][13] & 0x0F, 0x02); // Log Area Reset/Cleared
    expectEnumerationIsTheTrueSel();

    const auto indication = next();
    ASSERT_TRUE(indication.has_value()) << "no clear event";
    EXPECT_EQ(indication->instance.path.className, testevents::clearEvent);
    EXPECT_TRUE(more().empty()) << "more than one clear event";
}

TEST_F(SelBehaviourTest, BackgroundClearByAnotherClientIsAnnouncedOnce)
{
    launchWith(bmcsim::SelBehaviour::backgroundClear(1500), 64, 5);
    subscribe(testevents::clearEvent);

    bmc().clearSel(); // returns while the erase goes on
    const auto indication = next();
    ASSERT_TRUE(indication.has_value()) << "no clear event";
    EXPECT_EQ(indication->instance.path.className, testevents::clearEvent);
    EXPECT_TRUE(more().empty()) << "more than one clear event";
    EXPECT_EQ(bmc().moduleSel().size(), 1u);
    expectEnumerationIsTheTrueSel();
}

// Behaviour 7: Reserve SEL refused (not supported, or not at this
// privilege); records are read with reservation 0.
class ReserveRefusedTest :
    public SelBehaviourTest,
    public ::testing::WithParamInterface<std::uint8_t>
{
};

TEST_P(ReserveRefusedTest, EnumerationReadsTheSelAndRecordsAddedLater)
{
    launchWith(bmcsim::SelBehaviour::reserveRefused(GetParam()), 64, 10);
    expectEnumerationIsTheTrueSel();
    ASSERT_EQ(enumerate("ZAN_MgmtHwLogEntry").instances.size(), 10u);

    bmc().addRecords(fanRecords(2));
    ASSERT_EQ(bmc().moduleSel().size(), 12u);
    expectEnumerationIsTheTrueSel();
}

TEST_P(ReserveRefusedTest, AddedRecordsDeliverTheirEntryEvents)
{
    launchWith(bmcsim::SelBehaviour::reserveRefused(GetParam()), 64, 3);
    subscribe(testevents::entryEvent);

    const auto ids = bmc().addRecords(fanRecords(2));
    ASSERT_EQ(ids.size(), 2u);
    expectEntryEventsFor(ids);
}

INSTANTIATE_TEST_SUITE_P(NotSupportedAndPrivilege, ReserveRefusedTest,
                         ::testing::Values(std::uint8_t{0xC1},
                                           std::uint8_t{0xD4}));

} // namespace
