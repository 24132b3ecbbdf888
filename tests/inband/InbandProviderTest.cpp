// The provider on the in-band interface, through FreeIPMI's driver for
// the kernel's IPMI device: instances, ClearLog and the entry event of an
// added record, all answered by the simulated BMC behind the device node.

#include "EventClasses.h"
#include "InbandFixture.h"

#include <chrono>
#include <thread>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

using namespace inbandtest;
using namespace testevents;
using ::testing::HasSubstr;

TEST_F(InbandTest, EntriesAreTheRecordsOfTheBmc)
{
    const host::Outcome outcome = loadAndEnumerate(3, "ZAN_MgmtHwLogEntry");
    const auto records =
        device().withBmc([](inbandsim::RawBmc& bmc) { return bmc.records(); });
    ASSERT_EQ(outcome.instances.size(), records.size());
    for (std::size_t i = 0; i < records.size(); ++i)
    {
        const unsigned id = records[i][0] | records[i][1] << 8;
        EXPECT_EQ(text(outcome.instances[i], "RecordID"), std::to_string(id));
    }
    EXPECT_GT(device().requests(), 0u);
    EXPECT_THAT(device().unknownRequests(), ::testing::IsEmpty())
        << "the driver issued an ioctl the simulated device does not know";
}

TEST_F(InbandTest, LogNamesTheInbandBmc)
{
    const host::Outcome outcome = loadAndEnumerate(2, "ZAN_MgmtHwLog");
    ASSERT_EQ(outcome.instances.size(), 1u);
    EXPECT_EQ(text(outcome.instances[0], "Name"), "IPMI SEL Log");
    const host::Value* count =
        outcome.instances[0].property("CurrentNumberOfRecords");
    ASSERT_NE(count, nullptr);
    EXPECT_EQ(count->unsignedValue(), 2u);
}

TEST_F(InbandTest, GetReturnsTheEnumeratedEntry)
{
    const host::Outcome all = loadAndEnumerate(4, "ZAN_MgmtHwLogEntry");
    ASSERT_EQ(all.instances.size(), 4u);
    const host::Instance& wanted = all.instances[2];

    const host::Outcome one = host().getInstance(wanted.path);
    ASSERT_EQ(one.rc, CMPI_RC_OK) << one.message.value_or("");
    ASSERT_EQ(one.instances.size(), 1u);
    EXPECT_EQ(text(one.instances[0], "RecordID"), text(wanted, "RecordID"));
    EXPECT_EQ(text(one.instances[0], "Description"),
              text(wanted, "Description"));
    EXPECT_FALSE(text(wanted, "Description").empty());
}

TEST_F(InbandTest, ClearLogEmptiesTheBmcsSel)
{
    ASSERT_EQ(loadAndEnumerate(5, "ZAN_MgmtHwLogEntry").instances.size(), 5u);

    const host::Outcome cleared = clearLog();
    ASSERT_EQ(cleared.rc, CMPI_RC_OK) << cleared.message.value_or("");
    EXPECT_EQ(device().withBmc([](inbandsim::RawBmc& bmc)
                               { return bmc.records().size(); }),
              0u);
    const host::Outcome after = enumerate("ZAN_MgmtHwLogEntry");
    ASSERT_EQ(after.rc, CMPI_RC_OK) << after.message.value_or("");
    EXPECT_TRUE(after.instances.empty());
}

TEST_F(InbandTest, AddedRecordGivesOneEntryEvent)
{
    addRecords(2);
    load();
    host::IndicationInbox inbox = host().listen("root/zanqx");
    const auto filter = host::IndicationFilter::forClass(entryEvent);
    ASSERT_EQ(host().authorizeFilter(filter, "root").rc, CMPI_RC_OK);
    ASSERT_EQ(host().mustPoll(filter).rc, CMPI_RC_OK);
    ASSERT_EQ(host().activateFilter(filter, true).rc, CMPI_RC_OK);
    ASSERT_EQ(host().enableIndications().rc, CMPI_RC_OK);
    // Let the poller see the SEL as it is before the record arrives.
    const std::size_t before = device().requests();
    const auto deadline = std::chrono::steady_clock::now() + patience;
    while (device().requests() < before + 4 &&
           std::chrono::steady_clock::now() < deadline)
    {
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }

    const std::uint16_t id = addThroughDriver(temperatureRecord(0x47));
    EXPECT_EQ(device().withBmc([](inbandsim::RawBmc& bmc)
                               { return bmc.records().size(); }),
              3u);
    const auto indication = inbox.next(patience);
    ASSERT_TRUE(indication.has_value()) << "no entry event";
    EXPECT_EQ(indication->instance.path.className, entryEvent);
    EXPECT_THAT(text(indication->instance, "AlertingManagedElement"),
                HasSubstr("RecordID=\"" + std::to_string(id) + "\""));

    // Several more polls bring nothing more.
    std::this_thread::sleep_for(std::chrono::milliseconds(1000));
    EXPECT_TRUE(host().broker().waitForThreads(patience));
    EXPECT_TRUE(inbox.takeAll().empty()) << "an event came twice";
}

} // namespace
