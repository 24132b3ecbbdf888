#include "BrokerFixture.h"

namespace hosttest
{
namespace
{

using ObjectPathTest = BrokerTest;

TEST_F(ObjectPathTest, NamespaceClassAndHost)
{
    CMPIObjectPath* p = newPath("root/zanqx", "ZAN_MgmtHwLog");
    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    EXPECT_EQ(text(p->ft->getNameSpace(p, &rc)), "root/zanqx");
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    EXPECT_EQ(text(p->ft->getClassName(p, nullptr)), "ZAN_MgmtHwLog");
    EXPECT_EQ(text(p->ft->getHostname(p, nullptr)), "");
    EXPECT_EQ(p->ft->setHostname(p, "bmc1").rc, CMPI_RC_OK);
    EXPECT_EQ(p->ft->setNameSpace(p, "root/other").rc, CMPI_RC_OK);
    EXPECT_EQ(p->ft->setClassName(p, "Other").rc, CMPI_RC_OK);
    EXPECT_EQ(text(p->ft->getHostname(p, nullptr)), "bmc1");
    EXPECT_EQ(text(p->ft->getNameSpace(p, nullptr)), "root/other");
    EXPECT_EQ(text(p->ft->getClassName(p, nullptr)), "Other");
    EXPECT_EQ(p->ft->setClassName(p, nullptr).rc,
              CMPI_RC_ERR_INVALID_PARAMETER);
}

TEST_F(ObjectPathTest, NewObjectPathNeedsAClassName)
{
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    EXPECT_EQ(eft()->newObjectPath(mb(), "root", nullptr, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_PARAMETER);
}

TEST_F(ObjectPathTest, KeysByNameAndIndex)
{
    CMPIObjectPath* p = newPath("root/zanqx", "ZAN_MgmtHwLogEntry");
    EXPECT_EQ(p->ft
                  ->addKey(p, "RecordID",
                           reinterpret_cast<const CMPIValue*>("12"), CMPI_chars)
                  .rc,
              CMPI_RC_OK);
    CMPIValue v{};
    v.uint16 = 3;
    EXPECT_EQ(p->ft->addKey(p, "Node", &v, CMPI_uint16).rc, CMPI_RC_OK);
    EXPECT_EQ(p->ft->getKeyCount(p, nullptr), 2u);

    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    CMPIData d = p->ft->getKey(p, "recordid", &rc); // names ignore case
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    ASSERT_EQ(d.type, CMPI_string);
    EXPECT_TRUE(d.state & CMPI_keyValue);
    EXPECT_EQ(text(d.value.string), "12");

    CMPIString* name = nullptr;
    d = p->ft->getKeyAt(p, 1, &name, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    EXPECT_EQ(text(name), "Node");
    EXPECT_EQ(d.type, CMPI_uint16);
    EXPECT_EQ(d.value.uint16, 3);

    d = p->ft->getKeyAt(p, 2, &name, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    d = p->ft->getKey(p, "Missing", &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

TEST_F(ObjectPathTest, AddKeyReplacesSameName)
{
    CMPIObjectPath* p = newPath("root", "C");
    p->ft->addKey(p, "K", reinterpret_cast<const CMPIValue*>("a"), CMPI_chars);
    p->ft->addKey(p, "k", reinterpret_cast<const CMPIValue*>("b"), CMPI_chars);
    EXPECT_EQ(p->ft->getKeyCount(p, nullptr), 1u);
    EXPECT_EQ(text(p->ft->getKey(p, "K", nullptr).value.string), "b");
}

TEST_F(ObjectPathTest, ToStringSortsKeys)
{
    CMPIObjectPath* p = newPath("root/zanqx", "ZAN_MgmtHwLog");
    p->ft->addKey(p, "Name", reinterpret_cast<const CMPIValue*>("IPMI \"SEL\""),
                  CMPI_chars);
    p->ft->addKey(p, "CreationClassName",
                  reinterpret_cast<const CMPIValue*>("ZAN_MgmtHwLog"),
                  CMPI_chars);
    EXPECT_EQ(text(p->ft->toString(p, nullptr)),
              "root/zanqx:ZAN_MgmtHwLog.CreationClassName=\"ZAN_MgmtHwLog\","
              "Name=\"IPMI \\\"SEL\\\"\"");
    EXPECT_EQ(text(eft()->toString(mb(), p, nullptr)),
              text(p->ft->toString(p, nullptr)));
}

TEST_F(ObjectPathTest, CloneIsIndependent)
{
    CMPIObjectPath* p = newPath("root", "C");
    CMPIObjectPath* c = p->ft->clone(p, nullptr);
    p->ft->setClassName(p, "D");
    EXPECT_EQ(text(c->ft->getClassName(c, nullptr)), "C");
    EXPECT_EQ(broker_.outstandingClones(), 1u);
    EXPECT_EQ(c->ft->release(c).rc, CMPI_RC_OK);
    EXPECT_EQ(broker_.outstandingClones(), 0u);
}

TEST_F(ObjectPathTest, SetHostAndNameSpaceFromObjectPath)
{
    CMPIObjectPath* src = newPath("root/src", "A");
    src->ft->setHostname(src, "hostA");
    CMPIObjectPath* dst = newPath("root/dst", "B");
    EXPECT_EQ(dst->ft->setNameSpaceFromObjectPath(dst, src).rc, CMPI_RC_OK);
    EXPECT_EQ(text(dst->ft->getNameSpace(dst, nullptr)), "root/src");
    EXPECT_EQ(text(dst->ft->getHostname(dst, nullptr)), "");
    EXPECT_EQ(dst->ft->setHostAndNameSpaceFromObjectPath(dst, src).rc,
              CMPI_RC_OK);
    EXPECT_EQ(text(dst->ft->getHostname(dst, nullptr)), "hostA");
    EXPECT_EQ(text(dst->ft->getClassName(dst, nullptr)), "B");
    EXPECT_EQ(dst->ft->setHostAndNameSpaceFromObjectPath(dst, nullptr).rc,
              CMPI_RC_ERR_INVALID_HANDLE);
}

TEST_F(ObjectPathTest, QualifiersAreNotSupported)
{
    CMPIObjectPath* p = newPath("root", "C");
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    p->ft->getClassQualifier(p, "Key", &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
    p->ft->getPropertyQualifier(p, "P", "Key", &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
    p->ft->getMethodQualifier(p, "M", "Q", &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
    p->ft->getParameterQualifier(p, "M", "P", "Q", &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
}

TEST_F(ObjectPathTest, ReferenceKeyRoundTrips)
{
    CMPIObjectPath* inner = newPath("root", "Inner");
    inner->ft->addKey(inner, "Id", reinterpret_cast<const CMPIValue*>("x"),
                      CMPI_chars);
    CMPIObjectPath* p = newPath("root", "Outer");
    CMPIValue v{};
    v.ref = inner;
    ASSERT_EQ(p->ft->addKey(p, "Ref", &v, CMPI_ref).rc, CMPI_RC_OK);
    const CMPIData d = p->ft->getKey(p, "Ref", nullptr);
    ASSERT_EQ(d.type, CMPI_ref);
    EXPECT_EQ(host::Broker::toObjectPath(d.value.ref).toString(),
              "root:Inner.Id=\"x\"");
}

TEST_F(ObjectPathTest, MakeAndCopyOutThroughBroker)
{
    host::ObjectPath path = host::ObjectPath::parse(
        "root/zanqx:ZAN_MgmtHwLog.CreationClassName=\"ZAN_MgmtHwLog\","
        "Name=\"IPMI SEL\"");
    CMPIObjectPath* p = broker_.makeObjectPath(path);
    EXPECT_EQ(p->ft->getKeyCount(p, nullptr), 2u);
    EXPECT_EQ(host::Broker::toObjectPath(p), path);
    EXPECT_EQ(broker_.faults().calls(host::BrokerCall::GetKeyCount), 1u);
}

} // namespace
} // namespace hosttest
