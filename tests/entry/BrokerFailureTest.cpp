#include "EntryFixture.h"
#include "SELObjectFactory.h"

#include <gtest/gtest.h>

namespace
{

using entry::classPath;
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
    broker().faults().fail(BrokerCall::NewObjectPath, FaultMode::ReturnNull,
                           1, 1);
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
    EXPECT_EQ(instances.instances.size() + instances.rejectedInstances, 3u);
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
    broker().faults().fail(BrokerCall::NewString, FaultMode::ReturnNull, 1,
                           1);
    const auto outcome = host().enumerateInstances(classPath("ZAN_MgmtHwLog"));
    ASSERT_EQ(outcome.instances.size(), 1u);
    const host::Value* descriptions =
        outcome.instances[0].property("StatusDescriptions");
    ASSERT_NE(descriptions, nullptr);
    ASSERT_EQ(descriptions->elements.size(), 2u);
    EXPECT_EQ(descriptions->elements[0].text, "OK");
    EXPECT_TRUE(descriptions->elements[1].null);
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
    EXPECT_EQ(outcome.rc, CMPI_RC_ERR_FAILED);
    EXPECT_TRUE(outcome.done);
    EXPECT_EQ(outcome.instances.size(), 2u);
}

TEST_F(BrokerFailures, FailedMessageStringLeavesTheMessageNull)
{
    install(selTree(1));
    broker().faults().fail(BrokerCall::NewString, FaultMode::ReturnNull, 0,
                           1);
    const auto outcome = host().getInstance(classPath("ZAN_MgmtHwLog"));
    EXPECT_EQ(outcome.rc, CMPI_RC_ERR_FAILED);
    EXPECT_FALSE(outcome.message.has_value());
    EXPECT_TRUE(outcome.done);
}

// The builders below the operations, driven directly with the host's broker.
class Builders : public ProviderTest
{
  protected:
    host::Instance build(const char* className, const char** properties,
                         bool keysOnly, CMPIStatus* status = nullptr)
    {
        QX::SELComposite::SELObjectFactory factory(className);
        host::Broker::Request request(broker());
        std::vector<CMPIInstance*> instances;
        CMPIStatus local{CMPI_RC_OK, nullptr};
        const unsigned rc = factory.getAllSELCMPIInstances(
            broker().cmpi(), request.context(),
            broker().makeObjectPath(classPath(className)), className,
            properties, keysOnly, instances, status ? status : &local);
        EXPECT_EQ(rc, 0u);
        EXPECT_EQ(instances.size(), 1u);
        host::Instance copy;
        if (instances.size() == 1 && instances[0] != nullptr)
        {
            copy = host::Broker::toInstance(instances[0]);
        }
        request.finish(local);
        return copy;
    }
};

TEST_F(Builders, KeysOnlyLogCarriesItsTwoKeys)
{
    install(selTree(1));
    const auto log = build("ZAN_MgmtHwLog", nullptr, true);
    EXPECT_EQ(log.propertyNames(),
              (std::vector<std::string>{"Name", "CreationClassName"}));
}

TEST_F(Builders, KeysOnlyEntryCarriesOnlyItsClassName)
{
    install(selTree(1));
    const auto entry = build("ZAN_MgmtHwLogEntry", nullptr, true);
    EXPECT_EQ(entry.propertyNames(),
              std::vector<std::string>{"CreationClassName"});
}

TEST_F(Builders, KeysOnlyWithAListSetsTheListedProperties)
{
    install(selTree(1));
    const char* list[] = {"Caption", nullptr};
    const auto log = build("ZAN_MgmtHwLog", list, true);
    EXPECT_EQ(log.propertyNames(),
              (std::vector<std::string>{"Name", "CreationClassName",
                                        "Caption"}));
}

TEST_F(Builders, StatusIsNotWritten)
{
    install(selTree(1));
    CMPIStatus status{CMPI_RC_ERR_NOT_FOUND, nullptr};
    build("ZAN_MgmtHwLogEntry", nullptr, false, &status);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(Builders, FactoryForOneClassAskedForTheOther)
{
    install(selTree(2));
    QX::SELComposite::SELObjectFactory factory("ZAN_MgmtHwLog");
    EXPECT_EQ(factory.getNumberOfInstances(), 1u);
    host::Broker::Request request(broker());
    std::vector<CMPIInstance*> instances;
    CMPIStatus status{CMPI_RC_OK, nullptr};
    EXPECT_EQ(factory.getAllSELCMPIInstances(
                  broker().cmpi(), request.context(),
                  broker().makeObjectPath(classPath("ZAN_MgmtHwLogEntry")),
                  "ZAN_MgmtHwLogEntry", nullptr, false, instances, &status),
              0u);
    EXPECT_TRUE(instances.empty());
    EXPECT_EQ(factory.getAllSELCMPIInstances(
                  broker().cmpi(), request.context(),
                  broker().makeObjectPath(classPath("ZAN_MgmtHwLog")),
                  "ZAN_MgmtHwLog", nullptr, false, instances, &status),
              0u);
    EXPECT_EQ(instances.size(), 1u);
    EXPECT_EQ(factory.getAllSELCMPIInstances(
                  broker().cmpi(), request.context(),
                  broker().makeObjectPath(classPath("Other")), "Other",
                  nullptr, false, instances, &status),
              1u);
    EXPECT_EQ(instances.size(), 1u) << "appended to, never emptied";
    EXPECT_EQ(status.rc, CMPI_RC_OK);
    request.finish(status);
}

TEST_F(Builders, UnknownClassGathersNothing)
{
    install(selTree(2));
    QX::SELComposite::SELObjectFactory factory("CIM_Nothing");
    EXPECT_EQ(factory.getNumberOfInstances(), 0u);
    EXPECT_EQ(factory.executeClearLog(), 0);
}

TEST_F(Builders, NullPathFromBrokerGivesNullAndLeavesStatusAlone)
{
    install(selTree(1));
    broker().faults().fail(BrokerCall::NewObjectPath, FaultMode::ReturnNull,
                           0, 0);
    QX::SELComposite::SELObjectFactory factory("ZAN_MgmtHwLog");
    host::Broker::Request request(broker());
    std::vector<CMPIInstance*> instances;
    CMPIStatus status{CMPI_RC_OK, nullptr};
    factory.getAllSELCMPIInstances(
        broker().cmpi(), request.context(),
        broker().makeObjectPath(classPath("ZAN_MgmtHwLog")), "ZAN_MgmtHwLog",
        nullptr, false, instances, &status);
    ASSERT_EQ(instances.size(), 1u);
    EXPECT_EQ(instances[0], nullptr);
    EXPECT_EQ(status.rc, CMPI_RC_OK);
    EXPECT_EQ(broker().faults().calls(BrokerCall::NewInstance), 0u);
    request.finish(status);
}

} // namespace
