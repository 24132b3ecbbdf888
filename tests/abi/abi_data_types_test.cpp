// Sizes and layouts of the CMPI scalar typedefs, the value containers
// (CMPIValuePtr, CMPIValue, CMPIData, CMPIStatus), the encapsulated object
// headers and the OS-dependent handle types on x86_64.
#include "abi/abi_check.h"

#include <cmpift.h>

#include <cstring>
#include <type_traits>

#include <gtest/gtest.h>

namespace
{

// ---- Scalar typedefs -------------------------------------------------------

static_assert(std::is_same_v<CMPIBoolean, unsigned char>);
static_assert(std::is_same_v<CMPIChar16, unsigned short>);
static_assert(std::is_same_v<CMPIUint8, unsigned char>);
static_assert(std::is_same_v<CMPIUint16, unsigned short>);
static_assert(std::is_same_v<CMPIUint32, unsigned int>);
static_assert(std::is_same_v<CMPIUint64, unsigned long long>);
static_assert(std::is_same_v<CMPISint8, signed char>);
static_assert(std::is_same_v<CMPISint16, short>);
static_assert(std::is_same_v<CMPISint32, int>);
static_assert(std::is_same_v<CMPISint64, long long>);
static_assert(std::is_same_v<CMPIReal32, float>);
static_assert(std::is_same_v<CMPIReal64, double>);
static_assert(std::is_same_v<CMPIType, unsigned short>);
static_assert(std::is_same_v<CMPIValueState, unsigned short>);
static_assert(std::is_same_v<CMPICount, unsigned int>);
static_assert(std::is_same_v<CMPIFlags, unsigned int>);
static_assert(std::is_same_v<CMPIMsgFileHandle, void*>);
static_assert(std::is_same_v<CMPIGcStat, void>);
static_assert(std::is_same_v<CMPIAccessor, CMPIData(const char*, void*)>);

static_assert(sizeof(CMPIBoolean) == 1 && alignof(CMPIBoolean) == 1);
static_assert(sizeof(CMPIChar16) == 2 && alignof(CMPIChar16) == 2);
static_assert(sizeof(CMPIUint64) == 8 && alignof(CMPIUint64) == 8);
static_assert(sizeof(CMPISint64) == 8 && alignof(CMPISint64) == 8);
static_assert(sizeof(CMPIType) == 2 && sizeof(CMPIValueState) == 2);
static_assert(sizeof(CMPICount) == 4 && sizeof(CMPIFlags) == 4);

// Enums travel as 4-byte integers in registers and struct members.
static_assert(sizeof(CMPIrc) == 4 && alignof(CMPIrc) == 4);
static_assert(sizeof(CMPISeverity) == 4);
static_assert(sizeof(CMPILevel) == 4);
static_assert(sizeof(CMPIPredOp) == 4);
static_assert(sizeof(CMPISelectCondType) == 4);
static_assert(sizeof(CMPIErrorType) == 4);
static_assert(sizeof(CMPIErrorSeverity) == 4);
static_assert(sizeof(CMPIErrorProbableCause) == 4);
static_assert(sizeof(CMPIErrorSrcFormat) == 4);

// ---- OS-dependent types
// ------------------------------------------------------

// Both brokers write exactly four bytes through createThreadKey().
static_assert(std::is_same_v<CMPI_THREAD_KEY_TYPE, unsigned int>);
static_assert(std::is_same_v<CMPI_THREAD_TYPE, void*>);
static_assert(std::is_same_v<CMPI_THREAD_RETURN, void*>);
static_assert(std::is_same_v<CMPI_MUTEX_TYPE, void*>);
static_assert(std::is_same_v<CMPI_COND_TYPE, void*>);
using ThreadStart = CMPI_THREAD_RETURN(CMPI_THREAD_CDECL*)(void*);
static_assert(std::is_same_v<ThreadStart, void* (*)(void*)>);

// ---- Value containers
// --------------------------------------------------------

static_assert(sizeof(CMPIValuePtr) == 16 && alignof(CMPIValuePtr) == 8);
CMPI_ASSERT_MEMBER(CMPIValuePtr, ptr, 0, void*);
CMPI_ASSERT_MEMBER(CMPIValuePtr, length, 8, CMPICount);

static_assert(std::is_union_v<CMPIValue>);
static_assert(sizeof(CMPIValue) == 16 && alignof(CMPIValue) == 8);
CMPI_ASSERT_MEMBER(CMPIValue, uint64, 0, CMPIUint64);
CMPI_ASSERT_MEMBER(CMPIValue, uint32, 0, CMPIUint32);
CMPI_ASSERT_MEMBER(CMPIValue, uint16, 0, CMPIUint16);
CMPI_ASSERT_MEMBER(CMPIValue, uint8, 0, CMPIUint8);
CMPI_ASSERT_MEMBER(CMPIValue, sint64, 0, CMPISint64);
CMPI_ASSERT_MEMBER(CMPIValue, sint32, 0, CMPISint32);
CMPI_ASSERT_MEMBER(CMPIValue, sint16, 0, CMPISint16);
CMPI_ASSERT_MEMBER(CMPIValue, sint8, 0, CMPISint8);
CMPI_ASSERT_MEMBER(CMPIValue, real64, 0, CMPIReal64);
CMPI_ASSERT_MEMBER(CMPIValue, real32, 0, CMPIReal32);
CMPI_ASSERT_MEMBER(CMPIValue, boolean, 0, CMPIBoolean);
CMPI_ASSERT_MEMBER(CMPIValue, char16, 0, CMPIChar16);
CMPI_ASSERT_MEMBER(CMPIValue, inst, 0, CMPIInstance*);
CMPI_ASSERT_MEMBER(CMPIValue, ref, 0, CMPIObjectPath*);
CMPI_ASSERT_MEMBER(CMPIValue, args, 0, CMPIArgs*);
CMPI_ASSERT_MEMBER(CMPIValue, filter, 0, CMPISelectExp*);
CMPI_ASSERT_MEMBER(CMPIValue, Enum, 0, CMPIEnumeration*);
CMPI_ASSERT_MEMBER(CMPIValue, array, 0, CMPIArray*);
CMPI_ASSERT_MEMBER(CMPIValue, string, 0, CMPIString*);
CMPI_ASSERT_MEMBER(CMPIValue, chars, 0, char*);
CMPI_ASSERT_MEMBER(CMPIValue, dateTime, 0, CMPIDateTime*);
CMPI_ASSERT_MEMBER(CMPIValue, dataPtr, 0, CMPIValuePtr);
CMPI_ASSERT_MEMBER(CMPIValue, Byte, 0, CMPISint8);
CMPI_ASSERT_MEMBER(CMPIValue, Short, 0, CMPISint16);
CMPI_ASSERT_MEMBER(CMPIValue, Int, 0, CMPISint32);
CMPI_ASSERT_MEMBER(CMPIValue, Long, 0, CMPISint64);
CMPI_ASSERT_MEMBER(CMPIValue, Float, 0, CMPIReal32);
CMPI_ASSERT_MEMBER(CMPIValue, Double, 0, CMPIReal64);

static_assert(sizeof(CMPIData) == 24 && alignof(CMPIData) == 8);
CMPI_ASSERT_MEMBER(CMPIData, type, 0, CMPIType);
CMPI_ASSERT_MEMBER(CMPIData, state, 2, CMPIValueState);
CMPI_ASSERT_MEMBER(CMPIData, value, 8, CMPIValue);

static_assert(sizeof(CMPIStatus) == 16 && alignof(CMPIStatus) == 8);
CMPI_ASSERT_MEMBER(CMPIStatus, rc, 0, CMPIrc);
CMPI_ASSERT_MEMBER(CMPIStatus, msg, 8, CMPIString*);

// ---- Encapsulated objects: { hdl, ft }
// ---------------------------------------

static_assert(sizeof(CMPIContext) == 16);
CMPI_ASSERT_MEMBER(CMPIContext, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIContext, ft, 8, CMPIContextFT*);
static_assert(sizeof(CMPIResult) == 16);
CMPI_ASSERT_MEMBER(CMPIResult, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIResult, ft, 8, CMPIResultFT*);
static_assert(sizeof(CMPIString) == 16);
CMPI_ASSERT_MEMBER(CMPIString, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIString, ft, 8, CMPIStringFT*);
static_assert(sizeof(CMPIArray) == 16);
CMPI_ASSERT_MEMBER(CMPIArray, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIArray, ft, 8, CMPIArrayFT*);
static_assert(sizeof(CMPIEnumeration) == 16);
CMPI_ASSERT_MEMBER(CMPIEnumeration, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIEnumeration, ft, 8, CMPIEnumerationFT*);
static_assert(sizeof(CMPIInstance) == 16);
CMPI_ASSERT_MEMBER(CMPIInstance, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIInstance, ft, 8, CMPIInstanceFT*);
static_assert(sizeof(CMPIObjectPath) == 16);
CMPI_ASSERT_MEMBER(CMPIObjectPath, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIObjectPath, ft, 8, CMPIObjectPathFT*);
static_assert(sizeof(CMPIArgs) == 16);
CMPI_ASSERT_MEMBER(CMPIArgs, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIArgs, ft, 8, CMPIArgsFT*);
static_assert(sizeof(CMPISelectExp) == 16);
CMPI_ASSERT_MEMBER(CMPISelectExp, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPISelectExp, ft, 8, CMPISelectExpFT*);
static_assert(sizeof(CMPISelectCond) == 16);
CMPI_ASSERT_MEMBER(CMPISelectCond, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPISelectCond, ft, 8, CMPISelectCondFT*);
static_assert(sizeof(CMPISubCond) == 16);
CMPI_ASSERT_MEMBER(CMPISubCond, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPISubCond, ft, 8, CMPISubCondFT*);
static_assert(sizeof(CMPIPredicate) == 16);
CMPI_ASSERT_MEMBER(CMPIPredicate, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIPredicate, ft, 8, CMPIPredicateFT*);
static_assert(sizeof(CMPIDateTime) == 16);
CMPI_ASSERT_MEMBER(CMPIDateTime, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIDateTime, ft, 8, CMPIDateTimeFT*);
static_assert(sizeof(CMPIError) == 16);
CMPI_ASSERT_MEMBER(CMPIError, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIError, ft, 8, CMPIErrorFT*);

// ---- Runtime behaviour
// -------------------------------------------------------

TEST(DataTypes, CharsValueIsReadBackThroughTheValuePointer)
{
    char text[] = "System Event Log";
    CMPIValue value{};
    value.chars = text;

    // A broker handed &value with CMPI_charsptr reads *(char**)value.
    char* const* const asCharPtr = reinterpret_cast<char* const*>(&value);
    EXPECT_EQ(*asCharPtr, text);
    EXPECT_STREQ(*asCharPtr, "System Event Log");
}

TEST(DataTypes, CharsPassedAsValueArgumentIsTheStringItself)
{
    // For CMPI_chars the brokers treat the value pointer itself as the
    // string, so the string's address is what must be passed.
    const char text[] = "OK";
    const auto* const value = reinterpret_cast<const CMPIValue*>(text);
    EXPECT_STREQ(reinterpret_cast<const char*>(value), "OK");
}

TEST(DataTypes, BraceInitialisedValueSetsTheUint64Member)
{
    const CMPIValue value = {0x1122334455667788ULL};
    EXPECT_EQ(value.uint64, 0x1122334455667788ULL);
    EXPECT_EQ(value.Long, 0x1122334455667788LL);
}

TEST(DataTypes, DataCarriesTypeStateAndValueAtFixedPositions)
{
    CMPIData data{};
    data.type = CMPI_uint16;
    data.state = CMPI_keyValue;
    data.value.uint16 = 0x0102;

    unsigned char bytes[sizeof data];
    std::memcpy(bytes, &data, sizeof data);
    CMPIType type = 0;
    CMPIValueState state = 0;
    CMPIUint16 raw = 0;
    std::memcpy(&type, bytes + 0, sizeof type);
    std::memcpy(&state, bytes + 2, sizeof state);
    std::memcpy(&raw, bytes + 8, sizeof raw);
    EXPECT_EQ(type, CMPI_uint16);
    EXPECT_EQ(state, CMPI_keyValue);
    EXPECT_EQ(raw, 0x0102);
}

TEST(DataTypes, StatusIsAggregateOfCodeAndMessage)
{
    const CMPIStatus st = {CMPI_RC_ERR_NOT_FOUND, nullptr};
    EXPECT_EQ(st.rc, 6);
    EXPECT_EQ(st.msg, nullptr);
}

} // namespace
