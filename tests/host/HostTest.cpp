#include "Host.h"

#include "ProviderLibrary.h"
#include "SelClasses.h"

#include <cmpift.h>

#include <cstring>
#include <stdexcept>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace hosttest
{
namespace
{

// A tiny provider linked into the test, to drive the Host's operations.
struct Recorder
{
    const CMPIBroker* broker = nullptr;
    std::vector<std::string> calls;
    bool sawNullProperties = false;
    std::vector<std::string> properties;
    std::string principal;
    CMPIrc factoryRc = CMPI_RC_OK;
    bool factoryReturnsNull = false;
};
Recorder recorder;

CMPIStatus ok()
{
    return {CMPI_RC_OK, nullptr};
}

CMPIStatus cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean term)
{
    recorder.calls.push_back(term ? "cleanup(1)" : "cleanup(0)");
    return ok();
}

CMPIStatus enumNames(CMPIInstanceMI*, const CMPIContext* ctx,
                     const CMPIResult* rslt, const CMPIObjectPath* op)
{
    recorder.calls.push_back("enumerateInstanceNames");
    const CMPIData who = ctx->ft->getEntry(ctx, CMPIPrincipal, nullptr);
    recorder.principal =
        who.value.string->ft->getCharPtr(who.value.string, nullptr);
    const CMPIBroker* mb = recorder.broker;
    CMPIString* ns = op->ft->getNameSpace(op, nullptr);
    CMPIObjectPath* p = mb->eft->newObjectPath(
        mb, ns->ft->getCharPtr(ns, nullptr), "ZAN_MgmtHwLog", nullptr);
    p->ft->addKey(p, "Name", reinterpret_cast<const CMPIValue*>("IPMI SEL"),
                  CMPI_chars);
    rslt->ft->returnObjectPath(rslt, p);
    rslt->ft->returnDone(rslt);
    return ok();
}

void recordProperties(const char** properties)
{
    recorder.sawNullProperties = properties == nullptr;
    recorder.properties.clear();
    for (; properties && *properties; ++properties)
    {
        recorder.properties.emplace_back(*properties);
    }
}

CMPIStatus enumInstances(CMPIInstanceMI*, const CMPIContext*,
                         const CMPIResult* rslt, const CMPIObjectPath* op,
                         const char** properties)
{
    recorder.calls.push_back("enumerateInstances");
    recordProperties(properties);
    const CMPIBroker* mb = recorder.broker;
    CMPIInstance* i = mb->eft->newInstance(mb, op, nullptr);
    i->ft->setProperty(
        i, "Name", reinterpret_cast<const CMPIValue*>("IPMI SEL"), CMPI_chars);
    i->ft->setProperty(i, "CreationClassName",
                       reinterpret_cast<const CMPIValue*>("ZAN_MgmtHwLog"),
                       CMPI_chars);
    rslt->ft->returnInstance(rslt, i);
    rslt->ft->returnDone(rslt);
    return ok();
}

CMPIStatus getInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                       const CMPIObjectPath* op, const char** properties)
{
    recorder.calls.push_back("getInstance");
    recordProperties(properties);
    const CMPIData key = op->ft->getKey(op, "RecordID", nullptr);
    recorder.calls.push_back("RecordID type " + std::to_string(key.type));
    return {CMPI_RC_ERR_NOT_FOUND,
            recorder.broker->eft->newString(recorder.broker, "no such record",
                                            nullptr)};
}

CMPIInstanceMIFT instanceFT = {
    200,         200,     "instanceTest", cleanup, enumNames, enumInstances,
    getInstance, nullptr, nullptr,        nullptr, nullptr};
CMPIInstanceMI instanceMI = {nullptr, &instanceFT};

CMPIStatus methodCleanup(CMPIMethodMI*, const CMPIContext*, CMPIBoolean term)
{
    recorder.calls.push_back(term ? "methodCleanup(1)" : "methodCleanup(0)");
    return ok();
}

CMPIStatus invoke(CMPIMethodMI*, const CMPIContext*, const CMPIResult* rslt,
                  const CMPIObjectPath*, const char* method, const CMPIArgs* in,
                  CMPIArgs* out)
{
    recorder.calls.push_back(std::string("invoke ") + method + " with " +
                             std::to_string(in->ft->getArgCount(in, nullptr)));
    CMPIValue v{};
    v.uint32 = 0;
    rslt->ft->returnData(rslt, &v, CMPI_uint32);
    out->ft->addArg(out, "Done", reinterpret_cast<const CMPIValue*>("yes"),
                    CMPI_chars);
    rslt->ft->returnDone(rslt);
    return ok();
}

CMPIMethodMIFT methodFT = {200, 200, "methodTest", methodCleanup, invoke};
CMPIMethodMI methodMI = {nullptr, &methodFT};

CMPIStatus indicationCleanup(CMPIIndicationMI*, const CMPIContext*,
                             CMPIBoolean term)
{
    recorder.calls.push_back(term ? "indicationCleanup(1)"
                                  : "indicationCleanup(0)");
    return ok();
}

CMPIStatus enable(CMPIIndicationMI*, const CMPIContext*)
{
    recorder.calls.push_back("enableIndications");
    return ok();
}

CMPIStatus disable(CMPIIndicationMI*, const CMPIContext*)
{
    recorder.calls.push_back("disableIndications");
    return ok();
}

CMPIIndicationMIFT indicationFT = {
    200,     200,     "Indicationtest", indicationCleanup,
    nullptr, nullptr, nullptr,          nullptr,
    enable,  disable};
CMPIIndicationMI indicationMI = {nullptr, &indicationFT};

CMPIInstanceMI* createInstanceMI(const CMPIBroker* mb, const CMPIContext* ctx,
                                 CMPIStatus* rc)
{
    recorder.broker = mb;
    recorder.calls.push_back(ctx && rc && rc->rc == CMPI_RC_OK
                                 ? "createInstanceMI"
                                 : "createInstanceMI without context");
    rc->rc = recorder.factoryRc;
    return recorder.factoryReturnsNull ? nullptr : &instanceMI;
}

CMPIMethodMI* createMethodMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*)
{
    recorder.calls.push_back("createMethodMI");
    return &methodMI;
}

CMPIIndicationMI* createIndicationMI(const CMPIBroker*, const CMPIContext*,
                                     CMPIStatus*)
{
    recorder.calls.push_back("createIndicationMI");
    return &indicationMI;
}

const host::ProviderFactories factories{createInstanceMI, createMethodMI,
                                        createIndicationMI};

// A host over @p linked with the SEL provider's classes.
host::HostOptions linkedProvider(const host::ProviderFactories& linked)
{
    host::HostOptions options;
    options.factories = linked;
    options.schema = selclasses::schema();
    return options;
}

class HostTest : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        recorder = Recorder{};
    }
};

TEST_F(HostTest, CreatesTheThreeMIs)
{
    host::Host h(linkedProvider(factories));
    EXPECT_EQ(h.instanceMI(), &instanceMI);
    EXPECT_EQ(h.methodMI(), &methodMI);
    EXPECT_EQ(h.indicationMI(), &indicationMI);
    EXPECT_EQ(recorder.calls,
              (std::vector<std::string>{"createInstanceMI", "createMethodMI",
                                        "createIndicationMI"}));
    EXPECT_EQ(recorder.broker, h.broker().cmpi());
}

TEST_F(HostTest, NullMIIsALoadFailure)
{
    recorder.factoryReturnsNull = true;
    EXPECT_THROW(host::Host h(linkedProvider(factories)), host::LoadError);
}

TEST_F(HostTest, FactoryErrorStatusIsALoadFailure)
{
    recorder.factoryRc = CMPI_RC_ERR_FAILED;
    EXPECT_THROW(host::Host h(linkedProvider(factories)), std::runtime_error);
}

TEST_F(HostTest, MissingFactoryIsALoadFailure)
{
    host::ProviderFactories partial = factories;
    partial.method = nullptr;
    EXPECT_THROW(host::Host h(linkedProvider(partial)), host::LoadError);
    // The MI that did load was cleaned up.
    EXPECT_EQ(recorder.calls.back(), "cleanup(1)");
}

TEST_F(HostTest, EnumerateInstanceNames)
{
    host::Host h(linkedProvider(factories));
    const host::Outcome out = h.enumerateInstanceNames(
        host::ObjectPath::parse("root/zanqx:ZAN_MgmtHwLog"));
    EXPECT_EQ(out.rc, CMPI_RC_OK);
    ASSERT_EQ(out.paths.size(), 1u);
    EXPECT_EQ(out.paths[0].toString(),
              "root/zanqx:ZAN_MgmtHwLog.Name=\"IPMI SEL\"");
    EXPECT_TRUE(out.done);
    EXPECT_EQ(recorder.principal, "root");
}

TEST_F(HostTest, PropertyListsReachTheProvider)
{
    host::Host h(linkedProvider(factories));
    const auto reference = host::ObjectPath::parse("root/zanqx:ZAN_MgmtHwLog");
    h.enumerateInstances(reference);
    EXPECT_TRUE(recorder.sawNullProperties);
    const std::vector<std::string> none;
    h.enumerateInstances(reference, &none);
    EXPECT_FALSE(recorder.sawNullProperties);
    EXPECT_TRUE(recorder.properties.empty());
    const std::vector<std::string> two{"Name", "ElementName"};
    const host::Outcome out = h.enumerateInstances(reference, &two);
    EXPECT_EQ(recorder.properties, two);
    ASSERT_EQ(out.instances.size(), 1u);
    EXPECT_EQ(out.instances[0].path.toString(),
              "root/zanqx:ZAN_MgmtHwLog.CreationClassName=\"ZAN_MgmtHwLog\","
              "Name=\"IPMI SEL\"");
}

TEST_F(HostTest, ErrorStatusAndMessage)
{
    host::Host h(linkedProvider(factories));
    const host::Schema schema = selclasses::schema();
    const host::Outcome out = h.getInstance(host::ObjectPath::parse(
        "root/zanqx:ZAN_MgmtHwLogEntry.RecordID=\"9\"", &schema));
    EXPECT_EQ(out.rc, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(out.message, "no such record");
    EXPECT_TRUE(out.instances.empty());
    EXPECT_EQ(recorder.calls.back(),
              "RecordID type " + std::to_string(CMPI_string));
}

TEST_F(HostTest, MissingSlotIsNotSupported)
{
    host::Host h(linkedProvider(factories));
    const host::Outcome out =
        h.deleteInstance(host::ObjectPath::parse("root:C.K=1"));
    EXPECT_EQ(out.rc, CMPI_RC_ERR_NOT_SUPPORTED);
}

TEST_F(HostTest, InvokeMethod)
{
    host::Host h(linkedProvider(factories));
    const host::Outcome out = h.invokeMethod(
        host::ObjectPath::parse("root/zanqx:ZAN_MgmtHwLog.Name=\"IPMI SEL\""),
        "ClearLog");
    EXPECT_EQ(out.rc, CMPI_RC_OK);
    ASSERT_EQ(out.data.size(), 1u);
    EXPECT_EQ(out.data[0], host::Value::unsignedInt(CMPI_uint32, 0));
    ASSERT_EQ(out.outArgs.size(), 1u);
    EXPECT_EQ(out.outArgs[0].second.text(), "yes");
    EXPECT_EQ(recorder.calls.back(), "invoke ClearLog with 0");
}

TEST_F(HostTest, DestructionDisablesAndCleansUp)
{
    {
        host::Host h(linkedProvider(factories));
        EXPECT_EQ(h.enableIndications().rc, CMPI_RC_OK);
        recorder.calls.clear();
    }
    EXPECT_EQ(recorder.calls, (std::vector<std::string>{
                                  "disableIndications", "cleanup(1)",
                                  "methodCleanup(1)", "indicationCleanup(1)"}));
}

TEST_F(HostTest, CleanupAllOnlyOnceWhenTerminating)
{
    {
        host::Host h(linkedProvider(factories));
        EXPECT_EQ(h.cleanupAll(false).rc, CMPI_RC_OK);
        EXPECT_EQ(h.cleanupAll(true).rc, CMPI_RC_OK);
        recorder.calls.clear();
    }
    EXPECT_TRUE(recorder.calls.empty());
}

TEST_F(HostTest, RequestsLeaveNothingBehind)
{
    host::Host h(linkedProvider(factories));
    for (int i = 0; i < 100; ++i)
    {
        h.enumerateInstances(host::ObjectPath::parse("root:ZAN_MgmtHwLog"));
    }
    EXPECT_EQ(h.broker().brokerOwnedObjects(), 0u);
    EXPECT_EQ(h.broker().outstandingClones(), 0u);
}

TEST(ProviderLibrary, MissingLibraryIsARuntimeError)
{
    try
    {
        host::ProviderLibrary lib("/nonexistent/libNope.so", "Nope");
        FAIL();
    }
    catch (const std::runtime_error& e)
    {
        EXPECT_NE(std::string(e.what()).find("libNope.so"), std::string::npos);
    }
    EXPECT_THROW(host::Host(selclasses::hostOptions("/nonexistent/libNope.so")),
                 std::runtime_error);
}

TEST(ProviderLibrary, LibraryWithoutFactoriesFails)
{
    host::ProviderLibrary lib("libm.so.6", "SELProvider");
    EXPECT_NE(lib.symbol("cos"), nullptr);
    EXPECT_EQ(lib.symbol("SELProvider_Create_InstanceMI"), nullptr);
    host::Broker broker{selclasses::schema()};
    host::Broker::Request request(broker);
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    try
    {
        lib.createInstanceMI(broker.cmpi(), request.context(), &rc);
        FAIL();
    }
    catch (const host::LoadError& e)
    {
        EXPECT_NE(std::string(e.what()).find("SELProvider_Create_InstanceMI"),
                  std::string::npos);
    }
    EXPECT_THROW(host::Host(selclasses::hostOptions("libm.so.6")),
                 host::LoadError);
}

} // namespace
} // namespace hosttest
