#include "CVLogger.h"
#include "EntryFixture.h"
#include "Support.h"

#include <algorithm>

#include <gtest/gtest.h>

namespace
{

using entry::classPath;
using entry::expectComplete;
using entry::ProviderTest;
using entry::selTree;
using namespace QX::NodeLexicon;

class InstanceOperations : public ProviderTest
{
  protected:
    host::ObjectPath firstEntryPath()
    {
        const auto names =
            host().enumerateInstanceNames(classPath("ZAN_MgmtHwLogEntry"));
        EXPECT_FALSE(names.paths.empty());
        return names.paths.empty() ? host::ObjectPath{} : names.paths.front();
    }
};

std::vector<std::string> sorted(std::vector<std::string> names)
{
    std::sort(names.begin(), names.end());
    return names;
}

TEST_F(InstanceOperations, EnumerateLogInstanceWithEveryProperty)
{
    install(selTree(3));
    const auto outcome = host().enumerateInstances(classPath("ZAN_MgmtHwLog"));
    ASSERT_EQ(outcome.rc, CMPI_RC_OK);
    EXPECT_TRUE(outcome.done);
    ASSERT_EQ(outcome.instances.size(), 1u);
    const host::Instance& log = outcome.instances[0];
    const std::vector<std::string> expectedOrder = {"Name",
                                                    "CreationClassName",
                                                    "Caption",
                                                    "Description",
                                                    "ElementName",
                                                    "Status",
                                                    "Node",
                                                    "MaxNumberOfRecords",
                                                    "CurrentNumberOfRecords",
                                                    "OverWritePolicy",
                                                    "EnabledState",
                                                    "RequestedState",
                                                    "CharacterSet",
                                                    "MaxLogSize",
                                                    "PercentageNearFull",
                                                    "IsFrozen",
                                                    "OperationalStatus",
                                                    "Capabilities",
                                                    "StatusDescriptions"};
    EXPECT_EQ(log.propertyNames(), expectedOrder);
    EXPECT_EQ(log.property("Name")->text(), "IPMI SEL Log");
    EXPECT_EQ(log.property("CreationClassName")->text(), "ZAN_MgmtHwLog");
    EXPECT_EQ(log.property("Caption")->text(), "IPMI SEL LOG");
    EXPECT_EQ(log.property("Description")->text(),
              "Intelligent platform Management Interface SEL");
    EXPECT_EQ(log.property("Status")->text(), "OK");
    EXPECT_EQ(log.property("Node")->type, CMPI_uint16);
    EXPECT_EQ(log.property("Node")->unsignedValue(), 1u);
    EXPECT_EQ(log.property("MaxNumberOfRecords")->type, CMPI_uint64);
    EXPECT_EQ(log.property("MaxNumberOfRecords")->unsignedValue(), 512u);
    EXPECT_EQ(log.property("CurrentNumberOfRecords")->unsignedValue(), 3u);
    EXPECT_EQ(log.property("OverWritePolicy")->unsignedValue(), 2u);
    EXPECT_EQ(log.property("EnabledState")->unsignedValue(), 2u);
    EXPECT_EQ(log.property("RequestedState")->unsignedValue(), 2u);
    EXPECT_EQ(log.property("CharacterSet")->unsignedValue(), 7u);
    EXPECT_EQ(log.property("MaxLogSize")->unsignedValue(), 10240u);
    EXPECT_EQ(log.property("PercentageNearFull")->type, CMPI_uint8);
    EXPECT_EQ(log.property("PercentageNearFull")->unsignedValue(), 0u);
    EXPECT_EQ(log.property("IsFrozen")->type, CMPI_boolean);
    EXPECT_EQ(log.property("IsFrozen")->unsignedValue(), 0u);
    EXPECT_EQ(log.property("OperationalStatus")->toString(), "{2, 11}");
    EXPECT_EQ(log.property("OperationalStatus")->type, CMPI_uint16A);
    EXPECT_EQ(log.property("Capabilities")->toString(), "{6}");
    EXPECT_EQ(log.property("StatusDescriptions")->type, CMPI_stringA);
    EXPECT_EQ(log.property("StatusDescriptions")->toString(),
              "{\"OK\", \"Service\"}");
}

TEST_F(InstanceOperations, LogPathCarriesItsKeysAndTheLocalHost)
{
    install(selTree(1));
    host::ObjectPath reference = classPath("ZAN_MgmtHwLog");
    reference.host = "some.other.host";
    const auto outcome = host().enumerateInstances(reference);
    ASSERT_EQ(outcome.instances.size(), 1u);
    const host::ObjectPath& path = outcome.instances[0].path;
    EXPECT_EQ(path.nameSpace, "root/zanqx");
    EXPECT_EQ(path.className, "ZAN_MgmtHwLog");
    EXPECT_EQ(path.host, QX::getSystemName());
    ASSERT_EQ(path.keys.size(), 2u);
    EXPECT_EQ(path.key("Name")->text(), "IPMI SEL Log");
    EXPECT_EQ(path.key("CreationClassName")->text(), "ZAN_MgmtHwLog");
}

TEST_F(InstanceOperations, EntryInstancesInKeyOrderWithTheirProperties)
{
    auto tree = selTree(0);
    entry::addEntry(tree, 10, "2008-05-23 04:48:11", "Fan FAN3 low");
    entry::addEntry(tree, 9, "2011-01-02 03:04:05", "Voltage 12V low");
    install(tree);
    const auto outcome =
        host().enumerateInstances(classPath("ZAN_MgmtHwLogEntry"));
    ASSERT_EQ(outcome.rc, CMPI_RC_OK);
    ASSERT_EQ(outcome.instances.size(), 2u);
    // Keys are printable node paths with five-digit ids: 00009 < 00010.
    const host::Instance& first = outcome.instances[0];
    const host::Instance& second = outcome.instances[1];
    EXPECT_EQ(first.property("RecordID")->text(), "9");
    EXPECT_EQ(second.property("RecordID")->text(), "10");
    EXPECT_EQ(first.property("Node")->unsignedValue(), 2u) << "walk ordinal";
    const std::vector<std::string> expectedOrder = {
        "CreationClassName",    "Caption",    "Description", "ElementName",
        "LogCreationClassName", "LogName",    "RecordID",    "RecordData",
        "MessageTimestamp",     "DataFormat", "Node",        "Source"};
    EXPECT_EQ(second.propertyNames(), expectedOrder);
    EXPECT_EQ(second.property("CreationClassName")->text(),
              "ZAN_MgmtHwLogEntry");
    EXPECT_EQ(second.property("Caption")->text(), "IPMI SEL LOG");
    EXPECT_EQ(second.property("Description")->text(), "Fan FAN3 low");
    EXPECT_EQ(second.property("ElementName")->text(),
              source->printablePath("/bmc0/sel/entry-00010"));
    EXPECT_EQ(second.property("LogCreationClassName")->text(), "ZAN_MgmtHwLog");
    EXPECT_EQ(second.property("LogName")->text(), "IPMI SEL Log");
    EXPECT_EQ(second.property("RecordData")->text(), "0a 0b");
    EXPECT_EQ(second.property("MessageTimestamp")->type, CMPI_dateTime);
    EXPECT_EQ(second.property("MessageTimestamp")->text(),
              "20080523044811.000000+000");
    EXPECT_EQ(second.property("DataFormat")->text(), "hex bytes");
    EXPECT_EQ(second.property("Source")->text(), "IPMI");
    const host::ObjectPath& path = second.path;
    EXPECT_EQ(path.keys.size(), 5u);
    EXPECT_EQ(path.key("RecordID")->text(), "10");
    EXPECT_EQ(path.key("MessageTimestamp")->text(),
              "20080523044811.000000+000");
}

TEST_F(InstanceOperations, RejectedTimestampLeavesOnlyThatPropertyOut)
{
    auto tree = selTree(0);
    entry::addEntry(tree, 1, "not a time");
    install(tree);
    const auto outcome =
        host().enumerateInstances(classPath("ZAN_MgmtHwLogEntry"));
    ASSERT_EQ(outcome.instances.size(), 1u);
    const host::Instance& instance = outcome.instances[0];
    EXPECT_EQ(instance.property("MessageTimestamp"), nullptr);
    EXPECT_NE(instance.property("RecordID"), nullptr);
    EXPECT_NE(instance.property("Source"), nullptr);
    EXPECT_EQ(instance.propertyNames().size(), 11u);
}

TEST_F(InstanceOperations, PropertyListSelectsConditionalProperties)
{
    install(selTree(1));
    const std::vector<std::string> captionAndUnknown = {"Caption", "NoSuch"};
    auto outcome = host().enumerateInstances(classPath("ZAN_MgmtHwLog"),
                                             &captionAndUnknown);
    ASSERT_EQ(outcome.instances.size(), 1u);
    EXPECT_EQ(sorted(outcome.instances[0].propertyNames()),
              sorted({"Name", "CreationClassName", "Caption"}));

    const std::vector<std::string> empty;
    outcome = host().enumerateInstances(classPath("ZAN_MgmtHwLog"), &empty);
    EXPECT_EQ(sorted(outcome.instances[0].propertyNames()),
              sorted({"Name", "CreationClassName"}));

    const std::vector<std::string> lowerCase = {"caption"};
    outcome = host().enumerateInstances(classPath("ZAN_MgmtHwLog"), &lowerCase);
    EXPECT_EQ(outcome.instances[0].property("Caption"), nullptr);
}

TEST_F(InstanceOperations, EntryPropertyListIsExact)
{
    install(selTree(1));
    const std::vector<std::string> recordId = {"RecordID"};
    auto outcome =
        host().enumerateInstances(classPath("ZAN_MgmtHwLogEntry"), &recordId);
    ASSERT_EQ(outcome.instances.size(), 1u);
    EXPECT_EQ(sorted(outcome.instances[0].propertyNames()),
              sorted({"CreationClassName", "RecordID"}));
    const std::vector<std::string> lower = {"recordid"};
    outcome =
        host().enumerateInstances(classPath("ZAN_MgmtHwLogEntry"), &lower);
    EXPECT_EQ(outcome.instances[0].propertyNames(),
              std::vector<std::string>{"CreationClassName"});
}

TEST_F(InstanceOperations, NamesUseTheReferenceNamespaceAndLocalHost)
{
    install(selTree(4));
    host::ObjectPath reference = classPath("ZAN_MgmtHwLogEntry");
    reference.nameSpace = "root/other";
    reference.host = "remote.example";
    const auto outcome = host().enumerateInstanceNames(reference);
    ASSERT_EQ(outcome.rc, CMPI_RC_OK);
    EXPECT_TRUE(outcome.done);
    ASSERT_EQ(outcome.paths.size(), 4u);
    for (const auto& path : outcome.paths)
    {
        EXPECT_EQ(path.nameSpace, "root/other");
        EXPECT_EQ(path.host, QX::getSystemName());
        EXPECT_EQ(path.className, "ZAN_MgmtHwLogEntry");
        EXPECT_EQ(path.keys.size(), 5u) << path.toString();
    }
    EXPECT_TRUE(outcome.instances.empty());
}

TEST_F(InstanceOperations, GetInstanceFindsTheMatchingEntry)
{
    install(selTree(5));
    const auto names =
        host().enumerateInstanceNames(classPath("ZAN_MgmtHwLogEntry"));
    ASSERT_EQ(names.paths.size(), 5u);
    const auto outcome = host().getInstance(names.paths[3]);
    ASSERT_EQ(outcome.rc, CMPI_RC_OK);
    EXPECT_TRUE(outcome.done);
    ASSERT_EQ(outcome.instances.size(), 1u);
    EXPECT_EQ(outcome.instances[0].property("RecordID")->text(), "4");
}

TEST_F(InstanceOperations, GetInstanceMatchesKeyNamesIgnoringCase)
{
    install(selTree(2));
    host::ObjectPath path = classPath("ZAN_MgmtHwLog");
    path.keys.edit().push_back({"name", host::Value::string("IPMI SEL Log")});
    path.keys.edit().push_back(
        {"CREATIONCLASSNAME", host::Value::string("ZAN_MgmtHwLog")});
    const auto outcome = host().getInstance(path);
    ASSERT_EQ(outcome.instances.size(), 1u);
    EXPECT_EQ(outcome.instances[0].property("Name")->text(), "IPMI SEL Log");
}

TEST_F(InstanceOperations, GetInstanceListingKeysFindsTheEntry)
{
    install(selTree(3));
    const host::ObjectPath target = firstEntryPath();
    const std::vector<std::string> keysAndNode = {
        "RecordID", "LogCreationClassName", "MessageTimestamp", "LogName",
        "Node"};
    const auto outcome = host().getInstance(target, &keysAndNode);
    ASSERT_EQ(outcome.instances.size(), 1u);
    EXPECT_EQ(outcome.instances[0].property("Node")->unsignedValue(), 1u);
    EXPECT_EQ(outcome.instances[0].property("Description"), nullptr);
}

TEST_F(InstanceOperations, GetInstanceWithoutKeyPropertiesMatchesNothing)
{
    // Entry keys other than the class name are set only when requested, so
    // an instance built for a list without them has no full path to match.
    install(selTree(3));
    const host::ObjectPath target = firstEntryPath();
    const std::vector<std::string> nodeOnly = {"Node"};
    const auto outcome = host().getInstance(target, &nodeOnly);
    expectComplete(outcome);
    EXPECT_TRUE(outcome.instances.empty());
}

TEST_F(InstanceOperations, GetInstanceWithoutMatchDeliversNothing)
{
    install(selTree(2));
    host::ObjectPath path = classPath("ZAN_MgmtHwLog");
    path.keys.edit().push_back({"Name", host::Value::string("ipmi sel log")});
    path.keys.edit().push_back(
        {"CreationClassName", host::Value::string("ZAN_MgmtHwLog")});
    const auto outcome = host().getInstance(path);
    EXPECT_EQ(outcome.rc, CMPI_RC_OK);
    EXPECT_FALSE(outcome.message.has_value());
    EXPECT_TRUE(outcome.instances.empty());
    EXPECT_TRUE(outcome.done);
}

TEST_F(InstanceOperations, GetInstanceWithoutKeysFails)
{
    install(selTree(2));
    const auto outcome = host().getInstance(classPath("ZAN_MgmtHwLogEntry"));
    EXPECT_EQ(outcome.rc, CMPI_RC_ERR_FAILED);
    ASSERT_TRUE(outcome.message.has_value());
    EXPECT_EQ(*outcome.message, "At least one key should be passed");
    EXPECT_TRUE(outcome.done);
    EXPECT_TRUE(outcome.instances.empty());
    const auto traces = broker().traces();
    ASSERT_EQ(traces.size(), 1u);
    EXPECT_EQ(traces[0].level, CMPI_LEV_INFO);
    EXPECT_EQ(traces[0].component, "SELProvider");
    EXPECT_EQ(traces[0].text, "At least one key should be passed");
    EXPECT_FALSE(traces[0].string.has_value());
}

TEST_F(InstanceOperations, UnknownClassGivesNoResultsAndNoEndSignal)
{
    install(selTree(2));
    for (const auto& outcome :
         {host().enumerateInstances(classPath("CIM_LogRecord")),
          host().enumerateInstanceNames(classPath("CIM_LogRecord"))})
    {
        EXPECT_EQ(outcome.rc, CMPI_RC_OK);
        EXPECT_FALSE(outcome.done);
        EXPECT_TRUE(outcome.instances.empty());
        EXPECT_TRUE(outcome.paths.empty());
    }
    const auto traces = broker().traces();
    ASSERT_EQ(traces.size(), 2u);
    EXPECT_EQ(traces[0].level, CMPI_LEV_WARNING);
    EXPECT_EQ(traces[0].component, "SELProvider");
    EXPECT_EQ(traces[0].text, "***No instance found***");
}

TEST_F(InstanceOperations, ClassNamesAreMatchedIgnoringCase)
{
    install(selTree(3));
    const auto outcome =
        host().enumerateInstances(classPath("zan_mgmthwlogentry"));
    EXPECT_EQ(outcome.instances.size(), 3u);
}

TEST_F(InstanceOperations, HugeClassNameIsHandledWithoutHarm)
{
    install(selTree(1));
    const std::string huge(10000, 'Z');
    const auto outcome = host().enumerateInstances(classPath(huge));
    EXPECT_EQ(outcome.rc, CMPI_RC_OK);
    EXPECT_FALSE(outcome.done);
    const auto names = host().getInstance(
        [&]
        {
            host::ObjectPath path = classPath(huge);
            path.keys.edit().push_back({"Name", host::Value::string(huge)});
            return path;
        }());
    EXPECT_FALSE(names.done);
}

TEST_F(InstanceOperations, EmptyLogHasNoEntries)
{
    install(selTree(0));
    const auto outcome =
        host().enumerateInstances(classPath("ZAN_MgmtHwLogEntry"));
    expectComplete(outcome);
    EXPECT_TRUE(outcome.instances.empty());
}

TEST_F(InstanceOperations, InstrumentationFailureGivesAnEmptyAnswer)
{
    install(selTree(3));
    source->armFault({QX::CursorOperation::SelectKind, 0, true, "BMC gone"});
    ::testing::internal::CaptureStderr();
    const auto outcome =
        host().enumerateInstances(classPath("ZAN_MgmtHwLogEntry"));
    EXPECT_EQ(::testing::internal::GetCapturedStderr(), "BMC gone\n");
    expectComplete(outcome);
    EXPECT_TRUE(outcome.instances.empty());
}

/** Entries in the log, and how many names an enumeration delivers: the
 *  count is taken modulo 65536. */
struct CountCase
{
    const char* name;
    unsigned entries;
    std::size_t names;
};

class EntryCount :
    public ProviderTest,
    public ::testing::WithParamInterface<CountCase>
{
};

TEST_P(EntryCount, DeliversTheCountTakenAs16Bits)
{
    install(selTree(GetParam().entries));
    const auto outcome =
        host().enumerateInstanceNames(classPath("ZAN_MgmtHwLogEntry"));
    expectComplete(outcome);
    EXPECT_EQ(outcome.paths.size(), GetParam().names);
}

INSTANTIATE_TEST_SUITE_P(
    InstanceOperations, EntryCount,
    ::testing::Values(CountCase{"LargestCountDeliversEverything", 65535, 65535},
                      CountCase{"CountIsTakenModulo65536", 65537, 1}),
    [](const auto& info) { return info.param.name; });

TEST_F(InstanceOperations, CountOf65536DeliversNoInstances)
{
    install(selTree(65536));
    const std::vector<std::string> none;
    const auto outcome =
        host().enumerateInstances(classPath("ZAN_MgmtHwLogEntry"), &none);
    EXPECT_TRUE(outcome.done);
    EXPECT_TRUE(outcome.instances.empty());
}

} // namespace

namespace
{

using OperationDiagnostics = entry::CapturingProviderTest;

TEST_F(OperationDiagnostics, EnumerationIsFramedAndNamesItsClass)
{
    install(selTree(1));
    host().enumerateInstances(entry::classPath("ZAN_MgmtHwLog"));
    const auto records = capture_->records();
    ASSERT_GE(records.size(), 8u);
    EXPECT_EQ(records[0].message, std::string(78, '='));
    EXPECT_EQ(
        records[2].message.rfind(
            "ENTERING: SEL_EnumInstances() in SELProvider.cpp [Line: ", 0),
        0u);
    EXPECT_EQ(records[4].message.rfind("VARIABLE: 'classname' has Value "
                                       "'ZAN_MgmtHwLog' at line ",
                                       0),
              0u);
    EXPECT_EQ(records[4].function, "SEL_EnumInstances");
    EXPECT_EQ(records[4].file, "SELProvider.cpp");
    EXPECT_EQ(records.back().message, std::string(78, '='));
    EXPECT_EQ(records[records.size() - 3].message.rfind(
                  "EXITING: SEL_EnumInstances() in SELProvider.cpp", 0),
              0u);
    for (const auto& record : records)
    {
        EXPECT_EQ(record.level, 4000) << record.message;
        EXPECT_EQ(record.component, "Corvane.SELProvider");
    }
}

TEST_F(OperationDiagnostics, FactoryFailureIsLoggedAt6000)
{
    install(selTree(1));
    host().enumerateInstanceNames(entry::classPath("ZAN_Other"));
    int failures = 0;
    for (const auto& record : capture_->records())
    {
        if (record.message.find("getAllSELCMPIInstances Failed") !=
            std::string::npos)
        {
            EXPECT_EQ(record.level, 6000);
            EXPECT_EQ(record.function, "SEL_EnumInstanceNames");
            ++failures;
        }
    }
    EXPECT_EQ(failures, 2);
}

} // namespace
