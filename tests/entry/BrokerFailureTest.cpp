#include "EntryFixture.h"

#include <gtest/gtest.h>

namespace
{

using entry::classPath;
using entry::expectComplete;
using entry::ProviderTest;
using entry::selTree;
using host::BrokerCall;
using host::FaultMode;

class BrokerFailures : public ProviderTest
{
};

TEST_F(BrokerFailures, NullObjectPathYieldsANullInstance)
{
    install(selTree(3));
    broker().faults().fail(BrokerCall::NewObjectPath, FaultMode::ReturnNull, 1,
                           1);
    const auto names =
        host().enumerateInstanceNames(classPath("ZAN_MgmtHwLogEntry"));
    EXPECT_EQ(names.rc, CMPI_RC_OK);
    EXPECT_TRUE(names.done);
    EXPECT_EQ(names.paths.size(), 2u) << "the null instance is skipped";
}

TEST_F(BrokerFailures, NullHandleInstancesAreSkippedByNamesOnly)
{
    install(selTree(3));
    broker().faults().fail(BrokerCall::NewInstance, FaultMode::NullHandle, 0,
                           1);
    const auto names =
        host().enumerateInstanceNames(classPath("ZAN_MgmtHwLogEntry"));
    EXPECT_EQ(names.paths.size(), 2u);
    EXPECT_EQ(broker().faults().calls(BrokerCall::NewInstance), 3u);

    broker().faults().clear();
    broker().faults().fail(BrokerCall::NewInstance, FaultMode::NullHandle, 0,
                           1);
    const auto instances =
        host().enumerateInstances(classPath("ZAN_MgmtHwLogEntry"));
    EXPECT_TRUE(instances.done);
    // Every element is handed to the broker, the unusable one included.
    EXPECT_EQ(broker().faults().calls(BrokerCall::NewInstance), 3u);
    EXPECT_EQ(instances.instances.size(), 2u);
    EXPECT_EQ(instances.rejectedInstances, 1u);
}

TEST_F(BrokerFailures, FailedArrayLeavesThePropertyOut)
{
    install(selTree(1));
    broker().faults().fail(BrokerCall::NewArray, FaultMode::ReturnNull, 0, 1);
    const auto outcome = host().enumerateInstances(classPath("ZAN_MgmtHwLog"));
    ASSERT_EQ(outcome.instances.size(), 1u);
    const host::Instance& log = outcome.instances[0];
    EXPECT_EQ(log.property("OperationalStatus"), nullptr);
    EXPECT_NE(log.property("Capabilities"), nullptr);
    EXPECT_NE(log.property("StatusDescriptions"), nullptr);
}

TEST_F(BrokerFailures, FailedStringLeavesAPartlyFilledArray)
{
    install(selTree(1));
    // The second description's string cannot be made.
    broker().faults().fail(BrokerCall::NewString, FaultMode::ReturnNull, 1, 1);
    const auto outcome = host().enumerateInstances(classPath("ZAN_MgmtHwLog"));
    ASSERT_EQ(outcome.instances.size(), 1u);
    const host::Value* descriptions =
        outcome.instances[0].property("StatusDescriptions");
    ASSERT_NE(descriptions, nullptr);
    ASSERT_EQ(descriptions->elements().size(), 2u);
    EXPECT_EQ(descriptions->elements()[0].text(), "OK");
    EXPECT_TRUE(descriptions->elements()[1].null);
}

TEST_F(BrokerFailures, RejectedDateTimeLeavesTheTimestampOut)
{
    install(selTree(2));
    broker().faults().fail(BrokerCall::NewDateTimeFromChars,
                           FaultMode::ReturnNull, 0, 1);
    const auto outcome =
        host().enumerateInstances(classPath("ZAN_MgmtHwLogEntry"));
    ASSERT_EQ(outcome.instances.size(), 2u);
    EXPECT_EQ(outcome.instances[0].property("MessageTimestamp"), nullptr);
    EXPECT_NE(outcome.instances[0].property("RecordID"), nullptr);
    EXPECT_NE(outcome.instances[1].property("MessageTimestamp"), nullptr);
}

TEST_F(BrokerFailures, FailedPropertyDoesNotStopTheOthers)
{
    install(selTree(1));
    // The third property set on the log ("Caption") is refused.
    broker().faults().fail(BrokerCall::SetProperty, FaultMode::FailStatus, 2,
                           1);
    const auto outcome = host().enumerateInstances(classPath("ZAN_MgmtHwLog"));
    EXPECT_EQ(outcome.rc, CMPI_RC_OK);
    ASSERT_EQ(outcome.instances.size(), 1u);
    const host::Instance& log = outcome.instances[0];
    EXPECT_EQ(log.property("Caption"), nullptr);
    EXPECT_NE(log.property("Description"), nullptr);
    EXPECT_EQ(log.propertyNames().size(), 18u);
}

TEST_F(BrokerFailures, FailingClassNameQueryIsReportedInTheStatus)
{
    install(selTree(2));
    broker().faults().fail(BrokerCall::GetClassName, FaultMode::ReturnNull, 0,
                           1);
    const auto outcome =
        host().enumerateInstances(classPath("ZAN_MgmtHwLogEntry"));
    EXPECT_EQ(outcome.rc, CMPI_RC_ERR_FAILED);
    EXPECT_FALSE(outcome.done);
    EXPECT_TRUE(outcome.instances.empty());
}

TEST_F(BrokerFailures, ClassNameStatusFailureKeepsTheCharacters)
{
    install(selTree(2));
    broker().faults().fail(BrokerCall::GetClassName, FaultMode::FailStatus, 0,
                           1);
    const auto outcome =
        host().enumerateInstances(classPath("ZAN_MgmtHwLogEntry"));
    // The operation goes on with the characters it got; the queries that
    // follow report into the same status and leave it OK.
    expectComplete(outcome);
    EXPECT_EQ(outcome.instances.size(), 2u);
}

TEST_F(BrokerFailures, FailedMessageStringLeavesTheMessageNull)
{
    install(selTree(1));
    broker().faults().fail(BrokerCall::NewString, FaultMode::ReturnNull, 0, 1);
    const auto outcome = host().getInstance(classPath("ZAN_MgmtHwLog"));
    EXPECT_EQ(outcome.rc, CMPI_RC_ERR_FAILED);
    EXPECT_FALSE(outcome.message.has_value());
    EXPECT_TRUE(outcome.done);
}

} // namespace
