#include "BrokerFixture.h"

#include <cstring>

namespace hosttest
{
namespace
{

using InstanceTest = BrokerTest;

TEST_F(InstanceTest, TypedProperties)
{
    CMPIInstance* i = newInstance("root/zanqx", "ZAN_MgmtHwLogEntry");
    CMPIValue v{};
    v.uint16 = 7;
    EXPECT_EQ(i->ft->setProperty(i, "Node", &v, CMPI_uint16).rc, CMPI_RC_OK);
    v.sint64 = -9;
    EXPECT_EQ(i->ft->setProperty(i, "Delta", &v, CMPI_sint64).rc, CMPI_RC_OK);
    v.boolean = 1;
    EXPECT_EQ(i->ft->setProperty(i, "Flag", &v, CMPI_boolean).rc, CMPI_RC_OK);
    v.dateTime =
        eft()->newDateTimeFromChars(mb(), "20080523044811.000000+000", nullptr);
    EXPECT_EQ(i->ft->setProperty(i, "When", &v, CMPI_dateTime).rc, CMPI_RC_OK);

    EXPECT_EQ(i->ft->getPropertyCount(i, nullptr), 4u);
    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    CMPIData d = i->ft->getProperty(i, "node", &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    EXPECT_EQ(d.type, CMPI_uint16);
    EXPECT_EQ(d.value.uint16, 7);
    EXPECT_EQ(i->ft->getProperty(i, "Delta", nullptr).value.sint64, -9);
    EXPECT_EQ(i->ft->getProperty(i, "Flag", nullptr).value.boolean, 1);
    d = i->ft->getProperty(i, "When", nullptr);
    ASSERT_EQ(d.type, CMPI_dateTime);
    EXPECT_EQ(
        text(d.value.dateTime->ft->getStringFormat(d.value.dateTime, nullptr)),
        "20080523044811.000000+000");

    CMPIString* name = nullptr;
    d = i->ft->getPropertyAt(i, 2, &name, &rc);
    EXPECT_EQ(text(name), "Flag");
    i->ft->getPropertyAt(i, 4, &name, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    i->ft->getProperty(i, "Absent", &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

TEST_F(InstanceTest, CharsAreReadFromTheValuePointerItself)
{
    CMPIInstance* i = newInstance("root", "C");
    ASSERT_EQ(i->ft->setProperty(i, "Text", chars("direct"), CMPI_chars).rc,
              CMPI_RC_OK);
    const CMPIData d = i->ft->getProperty(i, "Text", nullptr);
    ASSERT_EQ(d.type, CMPI_string); // stored and read back as a string
    EXPECT_EQ(text(d.value.string), "direct");
}

TEST_F(InstanceTest, CharsThroughValueMemberIsNotDereferenced)
{
    // A provider that passes &value with value.chars set is wrong: the real
    // brokers read the bytes of the CMPIValue itself as the text.
    CMPIInstance* i = newInstance("root", "C");
    char text8[] = "ABCDEFG"; // 7 chars + NUL fill the pointer's 8 bytes
    CMPIValue v{};
    v.chars = text8;
    std::memset(reinterpret_cast<char*>(&v) + 8, 0, 8);
    ASSERT_EQ(i->ft->setProperty(i, "Text", &v, CMPI_chars).rc, CMPI_RC_OK);
    const CMPIData d = i->ft->getProperty(i, "Text", nullptr);
    ASSERT_EQ(d.type, CMPI_string);
    EXPECT_NE(text(d.value.string), "ABCDEFG");
}

TEST_F(InstanceTest, StringPropertyReadsValueString)
{
    CMPIInstance* i = newInstance("root", "C");
    CMPIValue v{};
    v.string = newString("via CMPIString");
    ASSERT_EQ(i->ft->setProperty(i, "S", &v, CMPI_string).rc, CMPI_RC_OK);
    EXPECT_EQ(text(i->ft->getProperty(i, "S", nullptr).value.string),
              "via CMPIString");
}

TEST_F(InstanceTest, NullValueSetsNull)
{
    CMPIInstance* i = newInstance("root", "C");
    ASSERT_EQ(i->ft->setProperty(i, "N", nullptr, CMPI_uint32).rc, CMPI_RC_OK);
    const CMPIData d = i->ft->getProperty(i, "N", nullptr);
    EXPECT_EQ(d.type, CMPI_uint32);
    EXPECT_TRUE(d.state & CMPI_nullValue);
}

TEST_F(InstanceTest, ArrayProperty)
{
    CMPIInstance* i = newInstance("root", "C");
    CMPIArray* a = eft()->newArray(mb(), 2, CMPI_uint16, nullptr);
    CMPIValue e{};
    e.uint16 = 2;
    a->ft->setElementAt(a, 0, &e, CMPI_uint16);
    e.uint16 = 11;
    a->ft->setElementAt(a, 1, &e, CMPI_uint16);
    CMPIValue v{};
    v.array = a;
    ASSERT_EQ(i->ft->setProperty(i, "OperationalStatus", &v, CMPI_uint16A).rc,
              CMPI_RC_OK);
    EXPECT_EQ(i->ft->setProperty(i, "Wrong", &v, CMPI_uint32A).rc,
              CMPI_RC_ERR_TYPE_MISMATCH);
    const host::Instance copy = host::Broker::toInstance(i);
    ASSERT_NE(copy.property("OperationalStatus"), nullptr);
    EXPECT_EQ(copy.property("OperationalStatus")->toString(), "{2, 11}");
    EXPECT_EQ(copy.property("Wrong"), nullptr);
}

TEST_F(InstanceTest, ResetKeepsFirstPosition)
{
    CMPIInstance* i = newInstance("root", "C");
    i->ft->setProperty(i, "A", chars("1"), CMPI_chars);
    i->ft->setProperty(i, "B", chars("2"), CMPI_chars);
    i->ft->setProperty(i, "a", chars("3"), CMPI_chars);
    const host::Instance copy = host::Broker::toInstance(i);
    EXPECT_EQ(copy.propertyNames(), (std::vector<std::string>{"A", "B"}));
    EXPECT_EQ(copy.property("A")->text(), "3");
}

TEST_F(InstanceTest, PropertyFilterDropsUnlistedNames)
{
    CMPIInstance* i = newInstance("root", "C");
    i->ft->setProperty(i, "Early", chars("e"), CMPI_chars);
    const char* props[] = {"Wanted", nullptr};
    const char* keys[] = {"Id", nullptr};
    ASSERT_EQ(i->ft->setPropertyFilter(i, props, keys).rc, CMPI_RC_OK);
    EXPECT_EQ(i->ft->setProperty(i, "wanted", chars("w"), CMPI_chars).rc,
              CMPI_RC_OK);
    EXPECT_EQ(i->ft->setProperty(i, "Id", chars("k"), CMPI_chars).rc,
              CMPI_RC_OK);
    EXPECT_EQ(i->ft->setProperty(i, "Other", chars("o"), CMPI_chars).rc,
              CMPI_RC_OK); // silently dropped
    const host::Instance copy = host::Broker::toInstance(i);
    EXPECT_EQ(copy.propertyNames(), (std::vector<std::string>{"wanted", "Id"}));
}

TEST_F(InstanceTest, EmptyPropertyListKeepsOnlyKeys)
{
    CMPIInstance* i = newInstance("root", "C");
    const char* props[] = {nullptr};
    const char* keys[] = {"Id", nullptr};
    i->ft->setPropertyFilter(i, props, keys);
    i->ft->setProperty(i, "Id", chars("k"), CMPI_chars);
    i->ft->setProperty(i, "Other", chars("o"), CMPI_chars);
    EXPECT_EQ(i->ft->getPropertyCount(i, nullptr), 1u);
}

TEST_F(InstanceTest, NullPropertyListMeansNoFilter)
{
    CMPIInstance* i = newInstance("root", "C");
    ASSERT_EQ(i->ft->setPropertyFilter(i, nullptr, nullptr).rc, CMPI_RC_OK);
    i->ft->setProperty(i, "Any", chars("a"), CMPI_chars);
    EXPECT_EQ(i->ft->getPropertyCount(i, nullptr), 1u);
}

TEST_F(InstanceTest, ObjectPathTakesKeysFromSchema)
{
    CMPIObjectPath* op = newPath("root/zanqx", "ZAN_MgmtHwLogEntry");
    op->ft->addKey(op, "Extra", chars("x"), CMPI_chars);
    op->ft->addKey(op, "RecordID", chars("old"), CMPI_chars);
    CMPIInstance* i = eft()->newInstance(mb(), op, nullptr);
    i->ft->setProperty(i, "RecordID", chars("5"), CMPI_chars);
    i->ft->setProperty(i, "LogName", chars("IPMI SEL"), CMPI_chars);
    i->ft->setProperty(i, "CreationClassName", chars("ZAN_MgmtHwLogEntry"),
                       CMPI_chars);
    i->ft->setProperty(i, "Severity", chars("not a key"), CMPI_chars);

    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    CMPIObjectPath* path = i->ft->getObjectPath(i, &rc);
    ASSERT_EQ(rc.rc, CMPI_RC_OK);
    const host::ObjectPath copy = host::Broker::toObjectPath(path);
    EXPECT_EQ(copy.nameSpace, "root/zanqx");
    EXPECT_EQ(copy.className, "ZAN_MgmtHwLogEntry");
    ASSERT_EQ(copy.keys.size(), 4u);
    EXPECT_EQ(copy.keys[0].first, "CreationClassName"); // schema order
    EXPECT_EQ(copy.keys[1].first, "LogName");
    EXPECT_EQ(copy.keys[2].first, "RecordID");
    EXPECT_EQ(copy.keys[2].second.text(), "5"); // property wins over path key
    EXPECT_EQ(copy.keys[3].first, "Extra");
    EXPECT_EQ(copy.key("Severity"), nullptr);
}

TEST_F(InstanceTest, UnknownClassKeepsPathKeysOnly)
{
    CMPIObjectPath* op = newPath("root", "Unknown");
    op->ft->addKey(op, "K", chars("v"), CMPI_chars);
    CMPIInstance* i = eft()->newInstance(mb(), op, nullptr);
    i->ft->setProperty(i, "P", chars("p"), CMPI_chars);
    const host::ObjectPath copy =
        host::Broker::toObjectPath(i->ft->getObjectPath(i, nullptr));
    EXPECT_EQ(copy.toString(), "root:Unknown.K=\"v\"");
}

TEST_F(InstanceTest, SetObjectPathReplacesPath)
{
    CMPIInstance* i = newInstance("root", "A");
    CMPIObjectPath* op = newPath("root/zanqx", "ZAN_MgmtHwLog");
    op->ft->setHostname(op, "h");
    ASSERT_EQ(i->ft->setObjectPath(i, op).rc, CMPI_RC_OK);
    i->ft->setProperty(i, "Name", chars("IPMI SEL"), CMPI_chars);
    EXPECT_EQ(
        host::Broker::toObjectPath(i->ft->getObjectPath(i, nullptr)).toString(),
        "//h/root/zanqx:ZAN_MgmtHwLog.Name=\"IPMI SEL\"");
}

TEST_F(InstanceTest, NewInstanceNeedsAPath)
{
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    EXPECT_EQ(eft()->newInstance(mb(), nullptr, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_PARAMETER);
}

TEST_F(InstanceTest, CloneCarriesPropertiesAndFilter)
{
    CMPIInstance* i = newInstance("root", "C");
    const char* props[] = {"A", nullptr};
    i->ft->setPropertyFilter(i, props, nullptr);
    i->ft->setProperty(i, "A", chars("a"), CMPI_chars);
    CMPIInstance* c = i->ft->clone(i, nullptr);
    c->ft->setProperty(c, "B", chars("b"), CMPI_chars);
    EXPECT_EQ(c->ft->getPropertyCount(c, nullptr), 1u);
    EXPECT_EQ(text(c->ft->getProperty(c, "A", nullptr).value.string), "a");
    EXPECT_EQ(c->ft->release(c).rc, CMPI_RC_OK);
}

TEST_F(InstanceTest, SetPropertyWithOriginIsAbsentLikeSfcb)
{
    CMPIInstance* i = newInstance("root", "C");
    EXPECT_EQ(i->ft->setPropertyWithOrigin, nullptr);
}

TEST_F(InstanceTest, UnsupportedValueTypes)
{
    CMPIInstance* i = newInstance("root", "C");
    CMPIValue v{};
    EXPECT_EQ(i->ft->setProperty(i, "X", &v, CMPI_instance).rc,
              CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(i->ft->setProperty(i, "X", &v, 0x0777).rc,
              CMPI_RC_ERR_INVALID_DATA_TYPE);
    EXPECT_EQ(i->ft->getPropertyCount(i, nullptr), 0u);
}

} // namespace
} // namespace hosttest
