#include "BrokerFixture.h"

namespace hosttest
{
namespace
{

using ResultTest = BrokerTest;
using ContextTest = BrokerTest;
using EncTest = BrokerTest;

const CMPIValue* chars(const char* text)
{
    return reinterpret_cast<const CMPIValue*>(text);
}

TEST_F(ResultTest, CollectsEverythingInOrder)
{
    const CMPIResult* r = result();
    CMPIObjectPath* p = newPath("root", "P");
    CMPIInstance* i = newInstance("root", "I");
    i->ft->setProperty(i, "X", chars("x"), CMPI_chars);
    CMPIValue v{};
    v.uint32 = 4;
    EXPECT_EQ(r->ft->returnObjectPath(r, p).rc, CMPI_RC_OK);
    EXPECT_EQ(r->ft->returnInstance(r, i).rc, CMPI_RC_OK);
    EXPECT_EQ(r->ft->returnData(r, &v, CMPI_uint32).rc, CMPI_RC_OK);
    EXPECT_EQ(r->ft->returnData(r, chars("t"), CMPI_chars).rc, CMPI_RC_OK);
    EXPECT_EQ(r->ft->returnDone(r).rc, CMPI_RC_OK);
    // Later changes to the objects do not reach the copies.
    i->ft->setProperty(i, "X", chars("changed"), CMPI_chars);

    const host::Outcome out =
        request_->finish({CMPI_RC_ERR_NOT_FOUND, newString("gone")});
    EXPECT_EQ(out.rc, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(out.message, "gone");
    ASSERT_EQ(out.paths.size(), 1u);
    EXPECT_EQ(out.paths[0].className, "P");
    ASSERT_EQ(out.instances.size(), 1u);
    EXPECT_EQ(out.instances[0].property("X")->text(), "x");
    ASSERT_EQ(out.data.size(), 2u);
    EXPECT_EQ(out.data[0], host::Value::unsignedInt(CMPI_uint32, 4));
    EXPECT_EQ(out.data[1], host::Value::string("t"));
    EXPECT_TRUE(out.done);
    EXPECT_EQ(out.doneCount, 1u);
}

TEST_F(ResultTest, NullMessageStaysAbsent)
{
    const host::Outcome out = request_->finish({CMPI_RC_OK, nullptr});
    EXPECT_FALSE(out.message.has_value());
    EXPECT_FALSE(out.done);
}

TEST_F(ResultTest, RejectsNullAndForeignObjects)
{
    const CMPIResult* r = result();
    EXPECT_EQ(r->ft->returnInstance(r, nullptr).rc,
              CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(r->ft->returnObjectPath(r, nullptr).rc,
              CMPI_RC_ERR_INVALID_PARAMETER);
    CMPIInstance foreign{nullptr, nullptr};
    EXPECT_EQ(r->ft->returnInstance(r, &foreign).rc,
              CMPI_RC_ERR_INVALID_HANDLE);
}

TEST_F(ResultTest, CannotBeReleasedOrClonedAndHasNoReturnError)
{
    EXPECT_EQ(result()->ft->release, nullptr);
    EXPECT_EQ(result()->ft->clone, nullptr);
    EXPECT_EQ(result()->ft->returnError, nullptr);
}

TEST_F(ContextTest, CarriesInvocationFlagsAndPrincipal)
{
    const CMPIContext* c = context();
    EXPECT_EQ(c->ft->getEntryCount(c, nullptr), 2u);
    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    CMPIData d = c->ft->getEntry(c, CMPIInvocationFlags, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    EXPECT_EQ(d.type, CMPI_uint32);
    EXPECT_EQ(d.value.uint32, 0u);
    d = c->ft->getEntry(c, CMPIPrincipal, &rc);
    ASSERT_EQ(d.type, CMPI_string);
    EXPECT_EQ(text(d.value.string), "root");
    c->ft->getEntry(c, CMPIInitNameSpace, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

TEST_F(ContextTest, AddEntryAndIterate)
{
    const CMPIContext* c = context();
    EXPECT_EQ(c->ft->addEntry(c, "Mine", chars("value"), CMPI_chars).rc,
              CMPI_RC_OK);
    CMPIString* name = nullptr;
    const CMPIData d = c->ft->getEntryAt(c, 2, &name, nullptr);
    EXPECT_EQ(text(name), "Mine");
    EXPECT_EQ(text(d.value.string), "value");
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    c->ft->getEntryAt(c, 3, &name, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

TEST_F(ContextTest, CloneCopiesEntries)
{
    const CMPIContext* c = context();
    CMPIContext* copy = c->ft->clone(c, nullptr);
    c->ft->addEntry(c, "Later", chars("x"), CMPI_chars);
    EXPECT_EQ(copy->ft->getEntryCount(copy, nullptr), 2u);
    EXPECT_EQ(copy->ft->release(copy).rc, CMPI_RC_OK);
}

TEST_F(EncTest, TraceIsCaptured)
{
    CMPIString* extra = newString("detail");
    EXPECT_EQ(eft()->trace(mb(), CMPI_LEV_WARNING, "comp", "text", extra).rc,
              CMPI_RC_OK);
    EXPECT_EQ(eft()->trace(mb(), CMPI_LEV_INFO, "c2", "t2", nullptr).rc,
              CMPI_RC_OK);
    const auto traces = broker_.traces();
    ASSERT_EQ(traces.size(), 2u);
    EXPECT_EQ(traces[0].level, CMPI_LEV_WARNING);
    EXPECT_EQ(traces[0].component, "comp");
    EXPECT_EQ(traces[0].text, "text");
    EXPECT_EQ(traces[0].string, "detail");
    EXPECT_FALSE(traces[1].string.has_value());
    broker_.clearTraces();
    EXPECT_TRUE(broker_.traces().empty());
}

TEST_F(EncTest, LogMessageIsCaptured)
{
    EXPECT_EQ(eft()->logMessage(mb(), CMPI_SEV_ERROR, "id", "msg", nullptr).rc,
              CMPI_RC_OK);
    ASSERT_EQ(broker_.logs().size(), 1u);
    EXPECT_EQ(broker_.logs()[0].text, "msg");
}

TEST_F(EncTest, TypeQueries)
{
    CMPIString* s = newString("x");
    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    EXPECT_TRUE(eft()->isOfType(mb(), s, "CMPIString", &rc));
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    EXPECT_FALSE(eft()->isOfType(mb(), s, "CMPIArray", nullptr));
    EXPECT_EQ(text(eft()->getType(mb(), newPath("r", "C"), nullptr)),
              "CMPIObjectPath");
    EXPECT_EQ(text(eft()->getType(mb(), context(), nullptr)), "CMPIContext");
    EXPECT_EQ(text(eft()->toString(mb(), s, nullptr)), "x");
}

TEST_F(EncTest, GetMessageReturnsDefault)
{
    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    CMPIString* m = eft()->getMessage(mb(), "ID1", "default text", &rc, 0);
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    EXPECT_EQ(text(m), "default text");
}

TEST_F(EncTest, UnsupportedServices)
{
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    EXPECT_EQ(eft()->newSelectExp(mb(), "q", "WQL", nullptr, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_FALSE(eft()->classPathIsA(mb(), newPath("r", "C"), "C", &rc));
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(eft()->newCMPIError(mb(), "o", "id", "m", ErrorSevLow,
                                  ErrorProbCauseUnknown, CMPI_RC_ERR_FAILED,
                                  &rc),
              nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
    CMPIMsgFileHandle h = this;
    EXPECT_EQ(eft()->openMessageFile(mb(), "f", &h).rc,
              CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(eft()->closeMessageFile(mb(), h).rc, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(eft()->getMessage2(mb(), "id", h, "d", &rc, 0), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(mb()->mft, nullptr);
}

TEST_F(EncTest, UpCallsAreNotSupported)
{
    const CMPIBrokerFT* bft = mb()->bft;
    CMPIObjectPath* op = newPath("root", "C");
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    EXPECT_EQ(bft->enumerateInstanceNames(mb(), context(), op, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(bft->getInstance(mb(), context(), op, nullptr, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(bft->deleteInstance(mb(), context(), op).rc,
              CMPI_RC_ERR_NOT_SUPPORTED);
    bft->invokeMethod(mb(), context(), op, "M", nullptr, nullptr, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
    bft->getProperty(mb(), context(), op, "P", &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
}

TEST_F(EncTest, ArgsHoldNamedValues)
{
    CMPIArgs* a = eft()->newArgs(mb(), nullptr);
    CMPIValue v{};
    v.uint8 = 9;
    EXPECT_EQ(a->ft->addArg(a, "N", &v, CMPI_uint8).rc, CMPI_RC_OK);
    EXPECT_EQ(a->ft->addArg(a, "S", chars("s"), CMPI_chars).rc, CMPI_RC_OK);
    EXPECT_EQ(a->ft->getArgCount(a, nullptr), 2u);
    EXPECT_EQ(a->ft->getArg(a, "n", nullptr).value.uint8, 9);
    CMPIString* name = nullptr;
    EXPECT_EQ(text(a->ft->getArgAt(a, 1, &name, nullptr).value.string), "s");
    EXPECT_EQ(text(name), "S");
}

} // namespace
} // namespace hosttest
