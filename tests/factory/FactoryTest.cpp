#include "Broker.h"
#include "PlatformFixture.h"
#include "SELObjectFactory.h"
#include "SelClasses.h"

#include <vector>

#include <gtest/gtest.h>

namespace
{

using host::BrokerCall;
using host::FaultMode;
using testsupport::PlatformTest;

host::ObjectPath classPath(const std::string& className)
{
    host::ObjectPath path;
    path.nameSpace = "root/zanqx";
    path.className = className;
    return path;
}

QX::NodeTreeBuilder selTree(unsigned entries)
{
    return testsupport::standardTree(entries);
}

// The builders below the operations, driven directly with the host's broker.
class Builders : public PlatformTest
{
  protected:
    host::Broker& broker()
    {
        return broker_;
    }
    host::Broker broker_{selclasses::schema()};

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
    EXPECT_EQ(
        log.propertyNames(),
        (std::vector<std::string>{"Name", "CreationClassName", "Caption"}));
}

TEST_F(Builders, NamespaceReadsReportIntoTheCallersStatus)
{
    install(selTree(1));
    broker().faults().fail(BrokerCall::GetCharPtr, FaultMode::FailStatus, 0, 0);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    const auto entry = build("ZAN_MgmtHwLogEntry", nullptr, false, &status);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(entry.propertyNames().size(), 12u);
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
                  broker().makeObjectPath(classPath("Other")), "Other", nullptr,
                  false, instances, &status),
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
    broker().faults().fail(BrokerCall::NewObjectPath, FaultMode::ReturnNull, 0,
                           0);
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

namespace
{

class Collection : public PlatformTest
{
  protected:
    std::vector<host::Instance> collect(const char* className)
    {
        QX::SELComposite::SELObjectFactory factory(className);
        host::Broker::Request request(broker_);
        std::vector<CMPIInstance*> instances;
        CMPIStatus status{CMPI_RC_OK, nullptr};
        lastResult_ = factory.getAllSELCMPIInstances(
            broker_.cmpi(), request.context(),
            broker_.makeObjectPath(classPath(className)), className, nullptr,
            false, instances, &status);
        std::vector<host::Instance> copies;
        copies.reserve(instances.size());
        for (const CMPIInstance* instance : instances)
        {
            copies.push_back(host::Broker::toInstance(instance));
        }
        request.finish(status);
        return copies;
    }

    host::Broker broker_{selclasses::schema()};
    unsigned lastResult_ = 0;
};

TEST_F(Collection, EntriesComeInByteOrderOfTheirKeysNotInWalkOrder)
{
    using namespace QX::NodeLexicon;
    auto tree = testsupport::standardTree(0);
    for (const char* path : {"/bmc0/sel/z", "/bmc0/sel/B", "/bmc0/sel/a"})
    {
        tree.addNode(EventLogEntry, path, "/bmc0/sel", path, 1);
    }
    install(tree);
    const auto instances = collect("ZAN_MgmtHwLogEntry");
    EXPECT_EQ(lastResult_, 0u);
    ASSERT_EQ(instances.size(), 3u);
    EXPECT_EQ(instances[0].property("Description")->text(), "/bmc0/sel/B");
    EXPECT_EQ(instances[1].property("Description")->text(), "/bmc0/sel/a");
    EXPECT_EQ(instances[2].property("Description")->text(), "/bmc0/sel/z");
    // The walk ordinal stays that of the hardware order.
    EXPECT_EQ(instances[0].property("Node")->unsignedValue(), 2u);
}

TEST_F(Collection, UnknownClassIsLoggedAtLevel6000)
{
    install(testsupport::standardTree(1));
    EXPECT_TRUE(collect("ZAN_Unknown").empty());
    EXPECT_EQ(lastResult_, 1u);
    const auto lines = recordsContaining("No instance found");
    ASSERT_EQ(lines.size(), 2u);
    EXPECT_EQ(lines[0].level, 6000);
    EXPECT_EQ(lines[1].level, 6000);
    EXPECT_EQ(lines[0].file, "SELObjectFactory.cpp");
    EXPECT_EQ(lines[0].message.rfind(
                  "MESSAGE [File: SELObjectFactory.cpp, Line: ", 0),
              0u);
    EXPECT_EQ(lines[0].message.substr(lines[0].message.size() - 20),
              "]: No instance found");
    const auto exits = recordsContaining("EXITING: getAllSELCMPIInstances()");
    ASSERT_EQ(exits.size(), 2u);
    EXPECT_EQ(exits[0].level, 4000);
    const auto traces = broker_.traces();
    ASSERT_EQ(traces.size(), 1u);
    EXPECT_EQ(traces[0].text, "***No instance found***");
    EXPECT_EQ(traces[0].level, CMPI_LEV_WARNING);
}

TEST_F(Collection, OneLogRecordGivesOneInstance)
{
    install(testsupport::standardTree(4));
    const auto instances = collect("ZAN_MgmtHwLog");
    EXPECT_EQ(lastResult_, 0u);
    ASSERT_EQ(instances.size(), 1u);
    EXPECT_EQ(instances[0].property("CurrentNumberOfRecords")->unsignedValue(),
              4u);
}

} // namespace
