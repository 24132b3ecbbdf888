#include "BrokerFixture.h"

namespace hosttest
{
namespace
{

using host::BrokerCall;
using host::FaultMode;
using FaultTest = BrokerTest;

// Each object-making call, driven the way a provider drives it.
struct Maker
{
    const char* name;
    BrokerCall call;
    void* (*make)(BrokerTest& t, const CMPIBroker* mb, CMPIStatus* rc);
};

class FaultModes :
    public BrokerTest,
    public ::testing::WithParamInterface<Maker>
{
};

CMPIObjectPath* samplePath(const CMPIBroker* mb)
{
    return mb->eft->newObjectPath(mb, "root/zanqx", "ZAN_MgmtHwLog", nullptr);
}

const Maker makers[] = {
    {"NewObjectPath", BrokerCall::NewObjectPath,
     [](BrokerTest&, const CMPIBroker* mb, CMPIStatus* rc) -> void*
     { return mb->eft->newObjectPath(mb, "root", "C", rc); }},
    {"NewInstance", BrokerCall::NewInstance,
     [](BrokerTest&, const CMPIBroker* mb, CMPIStatus* rc) -> void*
     { return mb->eft->newInstance(mb, samplePath(mb), rc); }},
    {"NewArray", BrokerCall::NewArray,
     [](BrokerTest&, const CMPIBroker* mb, CMPIStatus* rc) -> void*
     { return mb->eft->newArray(mb, 1, CMPI_uint8, rc); }},
    {"NewString", BrokerCall::NewString,
     [](BrokerTest&, const CMPIBroker* mb, CMPIStatus* rc) -> void*
     { return mb->eft->newString(mb, "s", rc); }},
    {"NewDateTimeFromChars", BrokerCall::NewDateTimeFromChars,
     [](BrokerTest&, const CMPIBroker* mb, CMPIStatus* rc) -> void* {
         return mb->eft->newDateTimeFromChars(mb, "20080523044811.000000+000",
                                              rc);
     }},
    {"GetClassName", BrokerCall::GetClassName,
     [](BrokerTest&, const CMPIBroker* mb, CMPIStatus* rc) -> void*
     {
         CMPIObjectPath* p = samplePath(mb);
         return p->ft->getClassName(p, rc);
     }},
    {"GetNameSpace", BrokerCall::GetNameSpace,
     [](BrokerTest&, const CMPIBroker* mb, CMPIStatus* rc) -> void*
     {
         CMPIObjectPath* p = samplePath(mb);
         return p->ft->getNameSpace(p, rc);
     }},
    {"ToString", BrokerCall::ToString,
     [](BrokerTest&, const CMPIBroker* mb, CMPIStatus* rc) -> void*
     {
         CMPIObjectPath* p = samplePath(mb);
         return p->ft->toString(p, rc);
     }},
    {"EncToString", BrokerCall::ToString,
     [](BrokerTest&, const CMPIBroker* mb, CMPIStatus* rc) -> void*
     { return mb->eft->toString(mb, samplePath(mb), rc); }},
};

TEST_P(FaultModes, ReturnNull)
{
    const Maker& m = GetParam();
    broker_.faults().fail(m.call, FaultMode::ReturnNull);
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    EXPECT_EQ(m.make(*this, mb(), &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_FAILED);
    // Only the first call fails; a NULL status pointer is fine too.
    EXPECT_NE(m.make(*this, mb(), nullptr), nullptr);
    rc = {CMPI_RC_ERR_FAILED, nullptr};
    EXPECT_NE(m.make(*this, mb(), &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    EXPECT_EQ(broker_.faults().calls(m.call), 3u);
}

TEST_P(FaultModes, NullHandle)
{
    const Maker& m = GetParam();
    broker_.faults().fail(m.call, FaultMode::NullHandle);
    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    auto* object = static_cast<CMPIString*>(m.make(*this, mb(), &rc));
    ASSERT_NE(object, nullptr);
    EXPECT_EQ(object->hdl, nullptr);
    EXPECT_NE(object->ft, nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
}

TEST_P(FaultModes, FailStatus)
{
    const Maker& m = GetParam();
    broker_.faults().fail(m.call, FaultMode::FailStatus);
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    auto* object = static_cast<CMPIString*>(m.make(*this, mb(), &rc));
    ASSERT_NE(object, nullptr);
    EXPECT_NE(object->hdl, nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_FAILED);
}

INSTANTIATE_TEST_SUITE_P(ObjectCalls, FaultModes, ::testing::ValuesIn(makers),
                         [](const ::testing::TestParamInfo<Maker>& info)
                         { return std::string(info.param.name); });

TEST_F(FaultTest, SkipAndCount)
{
    broker_.faults().fail(BrokerCall::NewString, FaultMode::ReturnNull, 2, 2);
    std::vector<bool> failed;
    failed.reserve(6);
    for (int i = 0; i < 6; ++i)
    {
        failed.push_back(eft()->newString(mb(), "x", nullptr) == nullptr);
    }
    EXPECT_EQ(failed,
              (std::vector<bool>{false, false, true, true, false, false}));
}

TEST_F(FaultTest, CountZeroFailsForever)
{
    broker_.faults().fail(BrokerCall::NewArray, FaultMode::ReturnNull, 1, 0);
    EXPECT_NE(eft()->newArray(mb(), 1, CMPI_uint8, nullptr), nullptr);
    for (int i = 0; i < 10; ++i)
    {
        EXPECT_EQ(eft()->newArray(mb(), 1, CMPI_uint8, nullptr), nullptr);
    }
    broker_.faults().clear();
    EXPECT_EQ(broker_.faults().calls(BrokerCall::NewArray), 0u);
    EXPECT_NE(eft()->newArray(mb(), 1, CMPI_uint8, nullptr), nullptr);
}

TEST_F(FaultTest, GetClassNameFailStatusKeepsTheRealString)
{
    broker_.faults().fail(BrokerCall::GetClassName, FaultMode::FailStatus);
    CMPIObjectPath* p = newPath("root", "Real");
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    CMPIString* s = p->ft->getClassName(p, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(text(s), "Real");
}

TEST_F(FaultTest, GetKeyCount)
{
    CMPIObjectPath* p = newPath("root", "C");
    p->ft->addKey(p, "K", chars("v"), CMPI_chars);
    broker_.faults().fail(BrokerCall::GetKeyCount, FaultMode::ReturnNull);
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    EXPECT_EQ(p->ft->getKeyCount(p, &rc), 0u);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_FAILED);
    broker_.faults().fail(BrokerCall::GetKeyCount, FaultMode::FailStatus);
    EXPECT_EQ(p->ft->getKeyCount(p, &rc), 1u);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(p->ft->getKeyCount(p, &rc), 1u);
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
}

TEST_F(FaultTest, GetCharPtr)
{
    CMPIString* s = newString("abc");
    broker_.faults().fail(BrokerCall::GetCharPtr, FaultMode::ReturnNull);
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    EXPECT_EQ(s->ft->getCharPtr(s, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_FAILED);
    broker_.faults().fail(BrokerCall::GetCharPtr, FaultMode::FailStatus);
    EXPECT_STREQ(s->ft->getCharPtr(s, &rc), "abc");
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_FAILED);
}

TEST_F(FaultTest, SetPropertyFailsWithoutSetting)
{
    for (const FaultMode mode :
         {FaultMode::ReturnNull, FaultMode::NullHandle, FaultMode::FailStatus})
    {
        CMPIInstance* i = newInstance("root", "C");
        broker_.faults().fail(BrokerCall::SetProperty, mode);
        EXPECT_EQ(i->ft->setProperty(i, "P", chars("v"), CMPI_chars).rc,
                  CMPI_RC_ERR_FAILED);
        EXPECT_EQ(i->ft->getPropertyCount(i, nullptr), 0u);
        EXPECT_EQ(i->ft->setProperty(i, "P", chars("v"), CMPI_chars).rc,
                  CMPI_RC_OK);
        EXPECT_EQ(i->ft->getPropertyCount(i, nullptr), 1u);
    }
}

TEST_F(FaultTest, PrepareAttachThread)
{
    broker_.faults().fail(BrokerCall::PrepareAttachThread,
                          FaultMode::ReturnNull);
    EXPECT_EQ(mb()->bft->prepareAttachThread(mb(), context()), nullptr);
    broker_.faults().fail(BrokerCall::PrepareAttachThread,
                          FaultMode::NullHandle);
    CMPIContext* c = mb()->bft->prepareAttachThread(mb(), context());
    ASSERT_NE(c, nullptr);
    EXPECT_EQ(c->hdl, nullptr);
    // A context with a NULL handle cannot be attached to.
    EXPECT_EQ(mb()->bft->attachThread(mb(), c).rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(broker_.faults().calls(BrokerCall::PrepareAttachThread), 2u);
}

TEST_F(FaultTest, AttachThread)
{
    broker_.faults().fail(BrokerCall::AttachThread);
    EXPECT_EQ(mb()->bft->attachThread(mb(), context()).rc, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(mb()->bft->attachThread(mb(), context()).rc, CMPI_RC_OK);
    EXPECT_EQ(mb()->bft->detachThread(mb(), context()).rc, CMPI_RC_OK);
}

void* nothing(void*)
{
    return nullptr;
}

TEST_F(FaultTest, NewThread)
{
    broker_.faults().fail(BrokerCall::NewThread);
    EXPECT_EQ(mb()->xft->newThread(nothing, nullptr, 0), nullptr);
    CMPI_THREAD_TYPE t = mb()->xft->newThread(nothing, nullptr, 0);
    ASSERT_NE(t, nullptr);
    EXPECT_EQ(mb()->xft->joinThread(t, nullptr), 0);
    EXPECT_EQ(broker_.faults().calls(BrokerCall::NewThread), 2u);
}

TEST_F(FaultTest, DeliverIndication)
{
    host::IndicationInbox inbox = broker_.listen("root");
    broker_.faults().fail(BrokerCall::DeliverIndication);
    CMPIInstance* i = newInstance("root", "Alert");
    EXPECT_EQ(mb()->bft->deliverIndication(mb(), context(), "root", i).rc,
              CMPI_RC_ERR_FAILED);
    EXPECT_EQ(inbox.pending(), 0u);
    EXPECT_EQ(mb()->bft->deliverIndication(mb(), context(), "root", i).rc,
              CMPI_RC_OK);
    EXPECT_EQ(inbox.pending(), 1u);
    EXPECT_EQ(broker_.faults().calls(BrokerCall::DeliverIndication), 2u);
}

TEST_F(FaultTest, DetachThreadIsCountedAndStillDetaches)
{
    CMPIContext* prepared = mb()->bft->prepareAttachThread(mb(), context());
    ASSERT_EQ(mb()->bft->attachThread(mb(), prepared).rc, CMPI_RC_OK);
    broker_.faults().fail(BrokerCall::DetachThread);
    EXPECT_EQ(mb()->bft->detachThread(mb(), prepared).rc, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(broker_.outstandingPreparedContexts(), 0u);
    EXPECT_EQ(broker_.faults().calls(BrokerCall::DetachThread), 1u);
}

TEST_F(FaultTest, NullHandleObjectsAreRejectedByTheirFunctions)
{
    broker_.faults().fail(BrokerCall::NewInstance, FaultMode::NullHandle);
    CMPIInstance* i = eft()->newInstance(mb(), newPath("root", "C"), nullptr);
    ASSERT_NE(i, nullptr);
    EXPECT_EQ(i->ft->setProperty(i, "P", chars("v"), CMPI_chars).rc,
              CMPI_RC_ERR_INVALID_HANDLE);
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    EXPECT_EQ(i->ft->getObjectPath(i, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(result()->ft->returnInstance(result(), i).rc,
              CMPI_RC_ERR_INVALID_HANDLE);
}

} // namespace
} // namespace hosttest
