#include "BrokerFixture.h"

namespace hosttest
{
namespace
{

using StringTest = BrokerTest;
using ArrayTest = BrokerTest;

/** Sets element @p index of @p array to @p value as @p type; gives the rc. */
CMPIrc setAt(CMPIArray* array, CMPICount index, const CMPIValue& value,
             CMPIType type)
{
    return array->ft->setElementAt(array, index, &value, type).rc;
}

TEST_F(StringTest, KeepsACopyOfTheText)
{
    char buffer[] = "hello";
    CMPIString* s = newString(buffer);
    buffer[0] = 'J';
    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    EXPECT_STREQ(s->ft->getCharPtr(s, &rc), "hello");
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
}

TEST_F(StringTest, NullTextGivesNullCharPtr)
{
    CMPIString* s = newString(nullptr);
    EXPECT_EQ(s->ft->getCharPtr(s, nullptr), nullptr);
}

TEST_F(StringTest, CloneIsIndependentAndReleasable)
{
    CMPIString* s = newString("abc");
    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    CMPIString* c = s->ft->clone(s, &rc);
    ASSERT_NE(c, nullptr);
    EXPECT_NE(c, s);
    EXPECT_EQ(text(c), "abc");
    EXPECT_EQ(broker_.outstandingClones(), 1u);
    EXPECT_EQ(c->ft->release(c).rc, CMPI_RC_OK);
    EXPECT_EQ(broker_.outstandingClones(), 0u);
}

TEST_F(StringTest, ReleaseOfRequestObjectIsHarmless)
{
    CMPIString* s = newString("abc");
    EXPECT_EQ(s->ft->release(s).rc, CMPI_RC_OK);
    EXPECT_EQ(s->ft->release(s).rc, CMPI_RC_OK);
    EXPECT_EQ(text(s), "abc"); // still owned by the request
}

TEST_F(StringTest, NullHandleIsRejected)
{
    CMPIString* s = newString("abc");
    CMPIString broken{nullptr, s->ft};
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    EXPECT_EQ(broken.ft->getCharPtr(&broken, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_HANDLE);
}

TEST_F(ArrayTest, NewArrayHasNullElementsOfItsType)
{
    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    CMPIArray* a = eft()->newArray(mb(), 3, CMPI_uint16, &rc);
    ASSERT_EQ(rc.rc, CMPI_RC_OK);
    EXPECT_EQ(a->ft->getSize(a, nullptr), 3u);
    EXPECT_EQ(a->ft->getSimpleType(a, nullptr), CMPI_uint16);
    const CMPIData d = a->ft->getElementAt(a, 2, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    EXPECT_EQ(d.type, CMPI_uint16);
    EXPECT_TRUE(d.state & CMPI_nullValue);
}

TEST_F(ArrayTest, TypedSetAndGet)
{
    CMPIArray* a = eft()->newArray(mb(), 2, CMPI_uint16, nullptr);
    CMPIValue v{};
    v.uint16 = 11;
    EXPECT_EQ(a->ft->setElementAt(a, 1, &v, CMPI_uint16).rc, CMPI_RC_OK);
    const CMPIData d = a->ft->getElementAt(a, 1, nullptr);
    EXPECT_EQ(d.type, CMPI_uint16);
    EXPECT_EQ(d.state, CMPI_goodValue);
    EXPECT_EQ(d.value.uint16, 11);
}

TEST_F(ArrayTest, StringElementReadsValueString)
{
    CMPIArray* a = eft()->newArray(mb(), 1, CMPI_string, nullptr);
    CMPIValue v{};
    v.string = newString("alpha");
    ASSERT_EQ(a->ft->setElementAt(a, 0, &v, CMPI_string).rc, CMPI_RC_OK);
    const CMPIData d = a->ft->getElementAt(a, 0, nullptr);
    ASSERT_EQ(d.type, CMPI_string);
    EXPECT_EQ(text(d.value.string), "alpha");
}

TEST_F(ArrayTest, CharsElementIsReadFromTheValuePointerItself)
{
    CMPIArray* a = eft()->newArray(mb(), 1, CMPI_string, nullptr);
    const char* chars = "beta";
    ASSERT_EQ(a->ft
                  ->setElementAt(a, 0,
                                 reinterpret_cast<const CMPIValue*>(chars),
                                 CMPI_chars)
                  .rc,
              CMPI_RC_OK);
    const CMPIData d = a->ft->getElementAt(a, 0, nullptr);
    ASSERT_EQ(d.type, CMPI_string);
    EXPECT_EQ(text(d.value.string), "beta");
}

TEST_F(ArrayTest, CharsArrayIsStoredAsStringArray)
{
    CMPIArray* a = eft()->newArray(mb(), 1, CMPI_chars, nullptr);
    EXPECT_EQ(a->ft->getSimpleType(a, nullptr), CMPI_string);
}

TEST_F(ArrayTest, WrongElementTypeIsATypeMismatch)
{
    CMPIArray* a = eft()->newArray(mb(), 1, CMPI_uint16, nullptr);
    const CMPIValue v{.uint32 = 5};
    EXPECT_EQ(setAt(a, 0, v, CMPI_uint32), CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(setAt(a, 0, v, CMPI_uint16A), CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(a->ft
                  ->setElementAt(a, 0, reinterpret_cast<const CMPIValue*>("x"),
                                 CMPI_chars)
                  .rc,
              CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_TRUE(a->ft->getElementAt(a, 0, nullptr).state & CMPI_nullValue);
}

TEST_F(ArrayTest, IndexOutOfRange)
{
    CMPIArray* a = eft()->newArray(mb(), 2, CMPI_uint8, nullptr);
    EXPECT_EQ(setAt(a, 2, CMPIValue{.uint8 = 1}, CMPI_uint8),
              CMPI_RC_ERR_NO_SUCH_PROPERTY);
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    const CMPIData d = a->ft->getElementAt(a, 99, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    EXPECT_TRUE(d.state & CMPI_nullValue);
}

TEST_F(ArrayTest, NullValueSetsNullElement)
{
    CMPIArray* a = eft()->newArray(mb(), 1, CMPI_sint32, nullptr);
    CMPIValue v{};
    v.sint32 = -4;
    a->ft->setElementAt(a, 0, &v, CMPI_sint32);
    EXPECT_EQ(a->ft->getElementAt(a, 0, nullptr).value.sint32, -4);
    EXPECT_EQ(a->ft->setElementAt(a, 0, nullptr, CMPI_sint32).rc, CMPI_RC_OK);
    EXPECT_TRUE(a->ft->getElementAt(a, 0, nullptr).state & CMPI_nullValue);
}

TEST_F(ArrayTest, AbsurdSizeOrTypeIsRejected)
{
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    EXPECT_EQ(eft()->newArray(mb(), 0xFFFFFFFFu, CMPI_uint8, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(eft()->newArray(mb(), 1, CMPI_null, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
}

TEST_F(ArrayTest, CloneCopiesElements)
{
    CMPIArray* a = eft()->newArray(mb(), 1, CMPI_boolean, nullptr);
    CMPIValue v{};
    v.boolean = 1;
    a->ft->setElementAt(a, 0, &v, CMPI_boolean);
    CMPIArray* c = a->ft->clone(a, nullptr);
    v.boolean = 0;
    a->ft->setElementAt(a, 0, &v, CMPI_boolean);
    EXPECT_EQ(c->ft->getElementAt(c, 0, nullptr).value.boolean, 1);
    EXPECT_EQ(c->ft->release(c).rc, CMPI_RC_OK);
}

TEST_F(ArrayTest, ForeignArrayIsRejected)
{
    CMPIArray foreign{this, nullptr};
    CMPIArray* a = eft()->newArray(mb(), 1, CMPI_uint8, nullptr);
    foreign.ft = nullptr;
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    EXPECT_EQ(a->ft->getSize(&foreign, &rc), 0u);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_HANDLE);
}

} // namespace
} // namespace hosttest
