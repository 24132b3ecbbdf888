#include "EntryFixture.h"
#include "ProviderLibrary.h"
#include "SelClasses.h"

#include <cstring>

#include <gtest/gtest.h>

namespace
{

using entry::classPath;
using entry::ProviderTest;

TEST(FactoryTest, FactoriesReturnTheSameThreeMIsWhateverTheOrder)
{
    host::ProviderLibrary library(SELPROV_LIBRARY, "SELProvider");
    host::Broker first{selclasses::schema()};
    host::Broker second{selclasses::schema()};
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIMethodMI* method =
        library.createMethodMI(first.cmpi(), nullptr, &status);
    CMPIIndicationMI* indication =
        library.createIndicationMI(second.cmpi(), nullptr, &status);
    CMPIInstanceMI* instance =
        library.createInstanceMI(first.cmpi(), nullptr, &status);
    ASSERT_NE(method, nullptr);
    ASSERT_NE(indication, nullptr);
    ASSERT_NE(instance, nullptr);
    EXPECT_NE(static_cast<void*>(method), static_cast<void*>(indication));
    EXPECT_NE(static_cast<void*>(method), static_cast<void*>(instance));
    EXPECT_NE(static_cast<void*>(instance), static_cast<void*>(indication));
    for (int round = 0; round < 3; ++round)
    {
        EXPECT_EQ(library.createInstanceMI(second.cmpi(), nullptr, &status),
                  instance);
        EXPECT_EQ(library.createIndicationMI(first.cmpi(), nullptr, &status),
                  indication);
        EXPECT_EQ(library.createMethodMI(second.cmpi(), nullptr, &status),
                  method);
    }
    EXPECT_EQ(instance->hdl, nullptr);
    EXPECT_EQ(method->hdl, nullptr);
    EXPECT_EQ(indication->hdl, nullptr);
}

TEST(FactoryTest, NullContextAndStatusAreAccepted)
{
    host::ProviderLibrary library(SELPROV_LIBRARY, "SELProvider");
    host::Broker broker{selclasses::schema()};
    EXPECT_NE(library.createInstanceMI(broker.cmpi(), nullptr, nullptr),
              nullptr);
    EXPECT_NE(library.createMethodMI(broker.cmpi(), nullptr, nullptr), nullptr);
    EXPECT_NE(library.createIndicationMI(broker.cmpi(), nullptr, nullptr),
              nullptr);
}

TEST(FactoryTest, StatusIsNeverWritten)
{
    host::ProviderLibrary library(SELPROV_LIBRARY, "SELProvider");
    host::Broker broker{selclasses::schema()};
    const auto sentinel = reinterpret_cast<CMPIString*>(0x1234);
    CMPIStatus status{CMPI_RC_ERR_NOT_FOUND, sentinel};
    library.createInstanceMI(broker.cmpi(), nullptr, &status);
    library.createMethodMI(broker.cmpi(), nullptr, &status);
    library.createIndicationMI(broker.cmpi(), nullptr, &status);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(status.msg, sentinel);
}

TEST(FactoryTest, TheLastBrokerPassedIsTheOneOperationsUse)
{
    host::ProviderLibrary library(SELPROV_LIBRARY, "SELProvider");
    host::Broker first{selclasses::schema()};
    host::Broker last{selclasses::schema()};
    CMPIInstanceMI* mi =
        library.createInstanceMI(first.cmpi(), nullptr, nullptr);
    library.createMethodMI(last.cmpi(), nullptr, nullptr);
    // A get without keys writes to the trace of the broker the provider
    // holds, whichever broker made the request's objects.
    host::Broker::Request request(first);
    const host::ObjectPath noKeys = classPath("ZAN_MgmtHwLog");
    const CMPIStatus status =
        mi->ft->getInstance(mi, request.context(), request.result(),
                            first.makeObjectPath(noKeys), nullptr);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_FAILED);
    EXPECT_TRUE(first.traces().empty());
    ASSERT_EQ(last.traces().size(), 1u);
    EXPECT_EQ(last.traces()[0].text, "At least one key should be passed");
    request.finish(status);
}

TEST(FunctionTables, NamesAndVersions)
{
    host::ProviderLibrary library(SELPROV_LIBRARY, "SELProvider");
    host::Broker broker{selclasses::schema()};
    const CMPIInstanceMI* instance =
        library.createInstanceMI(broker.cmpi(), nullptr, nullptr);
    const CMPIMethodMI* method =
        library.createMethodMI(broker.cmpi(), nullptr, nullptr);
    const CMPIIndicationMI* indication =
        library.createIndicationMI(broker.cmpi(), nullptr, nullptr);
    EXPECT_STREQ(instance->ft->miName, "instanceSELProvider");
    EXPECT_STREQ(method->ft->miName, "methodSELProvider");
    EXPECT_STREQ(indication->ft->miName, "IndicationSELProvider");
    EXPECT_EQ(instance->ft->ftVersion, 200);
    EXPECT_EQ(instance->ft->miVersion, 200);
    EXPECT_EQ(method->ft->ftVersion, 200);
    EXPECT_EQ(method->ft->miVersion, 200);
    EXPECT_EQ(indication->ft->ftVersion, 200);
    EXPECT_EQ(indication->ft->miVersion, 200);
    // Object managers call every slot without checking for NULL.
    EXPECT_NE(indication->ft->enableIndications, nullptr);
    EXPECT_NE(indication->ft->disableIndications, nullptr);
    EXPECT_NE(instance->ft->execQuery, nullptr);
}

class FixedOperations : public ProviderTest
{
};

void expectNotSupported(const host::Outcome& outcome)
{
    EXPECT_EQ(outcome.rc, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_FALSE(outcome.message.has_value());
    EXPECT_TRUE(outcome.paths.empty());
    EXPECT_TRUE(outcome.instances.empty());
    EXPECT_TRUE(outcome.data.empty());
    EXPECT_FALSE(outcome.done);
}

TEST_F(FixedOperations, WritesAreNotSupported)
{
    install(entry::selTree(2));
    host::ObjectPath path = classPath("ZAN_MgmtHwLog");
    path.keys.edit().push_back({"Name", host::Value::string("IPMI SEL Log")});
    host::Instance instance;
    instance.path = path;
    expectNotSupported(host().createInstance(path, instance));
    expectNotSupported(host().modifyInstance(path, instance));
    expectNotSupported(host().deleteInstance(path));
    expectNotSupported(host().execQuery(classPath("ZAN_MgmtHwLogEntry"),
                                        "SELECT * FROM ZAN_MgmtHwLogEntry",
                                        "WQL"));
    EXPECT_EQ(source->acceptedWrites(), 0u);
}

TEST_F(FixedOperations, FiltersAreAuthorisedAndNeverPolled)
{
    CMPIIndicationMI* mi = host().indicationMI();
    host::Broker::Request request(broker());
    for (const char* className : {"ZAN_MgmtHwLogEntryEvent", "Anything",
                                  static_cast<const char*>(nullptr)})
    {
        CMPIStatus status = mi->ft->authorizeFilter(
            mi, request.context(), nullptr, className, nullptr, nullptr);
        EXPECT_EQ(status.rc, CMPI_RC_OK);
        EXPECT_EQ(status.msg, nullptr);
        status = mi->ft->mustPoll(mi, request.context(), nullptr, className,
                                  nullptr);
        EXPECT_EQ(status.rc, CMPI_RC_OK);
        EXPECT_EQ(status.msg, nullptr);
    }
    const CMPIStatus owned = mi->ft->authorizeFilter(
        mi, request.context(), nullptr, "ZAN_MgmtHwLogFullEvent",
        broker().makeObjectPath(classPath("ZAN_MgmtHwLogFullEvent")), "root");
    EXPECT_EQ(owned.rc, CMPI_RC_OK);
    request.finish(owned);
}

TEST_F(FixedOperations, CleanupNeverRefusesUnloading)
{
    for (const bool terminating : {false, true})
    {
        const CMPIStatus status = host().cleanupAll(terminating);
        EXPECT_EQ(status.rc, CMPI_RC_OK);
        EXPECT_EQ(status.msg, nullptr);
    }
}

} // namespace
