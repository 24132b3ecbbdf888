// Layout of the encapsulated-object function tables (context, result, error,
// instance, object path, query objects, args, string, array, enumeration,
// date/time) on x86_64.
#include "abi/abi_check.h"

#include <cmpift.h>

#include <string_view>

#include <gtest/gtest.h>

namespace
{

// CMPIContextFT
static_assert(sizeof(CMPIContextFT) == 56);
static_assert(alignof(CMPIContextFT) == 8);
CMPI_ASSERT_MEMBER(CMPIContextFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIContextFT, release, 8, CMPIStatus (*)(CMPIContext*));
CMPI_ASSERT_MEMBER(CMPIContextFT, clone, 16,
                   CMPIContext* (*)(const CMPIContext*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIContextFT, getEntry, 24,
                   CMPIData (*)(const CMPIContext*, const char*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIContextFT, getEntryAt, 32,
                   CMPIData (*)(const CMPIContext*, CMPICount, CMPIString**,
                                CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIContextFT, getEntryCount, 40,
                   CMPICount (*)(const CMPIContext*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIContextFT, addEntry, 48,
                   CMPIStatus (*)(const CMPIContext*, const char*,
                                  const CMPIValue*, const CMPIType));

// CMPIResultFT
static_assert(sizeof(CMPIResultFT) == 64);
static_assert(alignof(CMPIResultFT) == 8);
CMPI_ASSERT_MEMBER(CMPIResultFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIResultFT, release, 8, CMPIStatus (*)(CMPIResult*));
CMPI_ASSERT_MEMBER(CMPIResultFT, clone, 16,
                   CMPIResult* (*)(const CMPIResult*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIResultFT, returnData, 24,
                   CMPIStatus (*)(const CMPIResult*, const CMPIValue*,
                                  const CMPIType));
CMPI_ASSERT_MEMBER(CMPIResultFT, returnInstance, 32,
                   CMPIStatus (*)(const CMPIResult*, const CMPIInstance*));
CMPI_ASSERT_MEMBER(CMPIResultFT, returnObjectPath, 40,
                   CMPIStatus (*)(const CMPIResult*, const CMPIObjectPath*));
CMPI_ASSERT_MEMBER(CMPIResultFT, returnDone, 48,
                   CMPIStatus (*)(const CMPIResult*));
CMPI_ASSERT_MEMBER(CMPIResultFT, returnError, 56,
                   CMPIStatus (*)(const CMPIResult*, const CMPIError*));

// CMPIErrorFT
static_assert(sizeof(CMPIErrorFT) == 216);
static_assert(alignof(CMPIErrorFT) == 8);
CMPI_ASSERT_MEMBER(CMPIErrorFT, ftVersion, 0, CMPISint32);
CMPI_ASSERT_MEMBER(CMPIErrorFT, release, 8, CMPIStatus (*)(CMPIError*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, clone, 16,
                   CMPIError* (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getErrorType, 24,
                   CMPIErrorType (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getOtherErrorType, 32,
                   CMPIString* (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getOwningEntity, 40,
                   CMPIString* (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getMessageID, 48,
                   CMPIString* (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getMessage, 56,
                   CMPIString* (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getPerceivedSeverity, 64,
                   CMPIErrorSeverity (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getProbableCause, 72,
                   CMPIErrorProbableCause (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getProbableCauseDescription, 80,
                   CMPIString* (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getRecommendedActions, 88,
                   CMPIArray* (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getErrorSource, 96,
                   CMPIString* (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getErrorSourceFormat, 104,
                   CMPIErrorSrcFormat (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getOtherErrorSourceFormat, 112,
                   CMPIString* (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getCIMStatusCode, 120,
                   CMPIrc (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getCIMStatusCodeDescription, 128,
                   CMPIString* (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, getMessageArguments, 136,
                   CMPIArray* (*)(const CMPIError*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, setErrorType, 144,
                   CMPIStatus (*)(CMPIError*, const CMPIErrorType));
CMPI_ASSERT_MEMBER(CMPIErrorFT, setOtherErrorType, 152,
                   CMPIStatus (*)(CMPIError*, const char*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, setProbableCauseDescription, 160,
                   CMPIStatus (*)(CMPIError*, const char*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, setRecommendedActions, 168,
                   CMPIStatus (*)(CMPIError*, const CMPIArray*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, setErrorSource, 176,
                   CMPIStatus (*)(CMPIError*, const char*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, setErrorSourceFormat, 184,
                   CMPIStatus (*)(CMPIError*, const CMPIErrorSrcFormat));
CMPI_ASSERT_MEMBER(CMPIErrorFT, setOtherErrorSourceFormat, 192,
                   CMPIStatus (*)(CMPIError*, const char*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, setCIMStatusCodeDescription, 200,
                   CMPIStatus (*)(CMPIError*, const char*));
CMPI_ASSERT_MEMBER(CMPIErrorFT, setMessageArguments, 208,
                   CMPIStatus (*)(CMPIError*, CMPIArray*));

// CMPIInstanceFT
static_assert(sizeof(CMPIInstanceFT) == 88);
static_assert(alignof(CMPIInstanceFT) == 8);
CMPI_ASSERT_MEMBER(CMPIInstanceFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIInstanceFT, release, 8, CMPIStatus (*)(CMPIInstance*));
CMPI_ASSERT_MEMBER(CMPIInstanceFT, clone, 16,
                   CMPIInstance* (*)(const CMPIInstance*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIInstanceFT, getProperty, 24,
                   CMPIData (*)(const CMPIInstance*, const char*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIInstanceFT, getPropertyAt, 32,
                   CMPIData (*)(const CMPIInstance*, CMPICount, CMPIString**,
                                CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIInstanceFT, getPropertyCount, 40,
                   CMPICount (*)(const CMPIInstance*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIInstanceFT, setProperty, 48,
                   CMPIStatus (*)(const CMPIInstance*, const char*,
                                  const CMPIValue*, CMPIType));
CMPI_ASSERT_MEMBER(CMPIInstanceFT, getObjectPath, 56,
                   CMPIObjectPath* (*)(const CMPIInstance*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIInstanceFT, setPropertyFilter, 64,
                   CMPIStatus (*)(CMPIInstance*, const char**, const char**));
CMPI_ASSERT_MEMBER(CMPIInstanceFT, setObjectPath, 72,
                   CMPIStatus (*)(CMPIInstance*, const CMPIObjectPath*));
CMPI_ASSERT_MEMBER(CMPIInstanceFT, setPropertyWithOrigin, 80,
                   CMPIStatus (*)(const CMPIInstance*, const char*,
                                  const CMPIValue*, const CMPIType,
                                  const char*));

// CMPIObjectPathFT
static_assert(sizeof(CMPIObjectPathFT) == 160);
static_assert(alignof(CMPIObjectPathFT) == 8);
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, release, 8,
                   CMPIStatus (*)(CMPIObjectPath*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, clone, 16,
                   CMPIObjectPath* (*)(const CMPIObjectPath*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, setNameSpace, 24,
                   CMPIStatus (*)(CMPIObjectPath*, const char*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, getNameSpace, 32,
                   CMPIString* (*)(const CMPIObjectPath*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, setHostname, 40,
                   CMPIStatus (*)(CMPIObjectPath*, const char*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, getHostname, 48,
                   CMPIString* (*)(const CMPIObjectPath*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, setClassName, 56,
                   CMPIStatus (*)(CMPIObjectPath*, const char*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, getClassName, 64,
                   CMPIString* (*)(const CMPIObjectPath*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, addKey, 72,
                   CMPIStatus (*)(CMPIObjectPath*, const char*,
                                  const CMPIValue*, const CMPIType));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, getKey, 80,
                   CMPIData (*)(const CMPIObjectPath*, const char*,
                                CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, getKeyAt, 88,
                   CMPIData (*)(const CMPIObjectPath*, CMPICount, CMPIString**,
                                CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, getKeyCount, 96,
                   CMPICount (*)(const CMPIObjectPath*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, setNameSpaceFromObjectPath, 104,
                   CMPIStatus (*)(CMPIObjectPath*, const CMPIObjectPath*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, setHostAndNameSpaceFromObjectPath, 112,
                   CMPIStatus (*)(CMPIObjectPath*, const CMPIObjectPath*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, getClassQualifier, 120,
                   CMPIData (*)(const CMPIObjectPath*, const char*,
                                CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, getPropertyQualifier, 128,
                   CMPIData (*)(const CMPIObjectPath*, const char*, const char*,
                                CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, getMethodQualifier, 136,
                   CMPIData (*)(const CMPIObjectPath*, const char*, const char*,
                                CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, getParameterQualifier, 144,
                   CMPIData (*)(const CMPIObjectPath*, const char*, const char*,
                                const char*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIObjectPathFT, toString, 152,
                   CMPIString* (*)(const CMPIObjectPath*, CMPIStatus*));

// CMPISelectExpFT
static_assert(sizeof(CMPISelectExpFT) == 64);
static_assert(alignof(CMPISelectExpFT) == 8);
CMPI_ASSERT_MEMBER(CMPISelectExpFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPISelectExpFT, release, 8, CMPIStatus (*)(CMPISelectExp*));
CMPI_ASSERT_MEMBER(CMPISelectExpFT, clone, 16,
                   CMPISelectExp* (*)(const CMPISelectExp*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPISelectExpFT, evaluate, 24,
                   CMPIBoolean (*)(const CMPISelectExp*, const CMPIInstance*,
                                   CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPISelectExpFT, getString, 32,
                   CMPIString* (*)(const CMPISelectExp*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPISelectExpFT, getDOC, 40,
                   CMPISelectCond* (*)(const CMPISelectExp*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPISelectExpFT, getCOD, 48,
                   CMPISelectCond* (*)(const CMPISelectExp*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPISelectExpFT, evaluateUsingAccessor, 56,
                   CMPIBoolean (*)(const CMPISelectExp*, CMPIAccessor*, void*,
                                   CMPIStatus*));

// CMPISelectCondFT
static_assert(sizeof(CMPISelectCondFT) == 40);
static_assert(alignof(CMPISelectCondFT) == 8);
CMPI_ASSERT_MEMBER(CMPISelectCondFT, ftVersion, 0, const int);
CMPI_ASSERT_MEMBER(CMPISelectCondFT, release, 8,
                   CMPIStatus (*)(CMPISelectCond*));
CMPI_ASSERT_MEMBER(CMPISelectCondFT, clone, 16,
                   CMPISelectCond* (*)(const CMPISelectCond*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPISelectCondFT, getCountAndType, 24,
                   CMPICount (*)(const CMPISelectCond*, int*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPISelectCondFT, getSubCondAt, 32,
                   CMPISubCond* (*)(const CMPISelectCond*, CMPICount,
                                    CMPIStatus*));

// CMPISubCondFT
static_assert(sizeof(CMPISubCondFT) == 48);
static_assert(alignof(CMPISubCondFT) == 8);
CMPI_ASSERT_MEMBER(CMPISubCondFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPISubCondFT, release, 8, CMPIStatus (*)(CMPISubCond*));
CMPI_ASSERT_MEMBER(CMPISubCondFT, clone, 16,
                   CMPISubCond* (*)(const CMPISubCond*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPISubCondFT, getCount, 24,
                   CMPICount (*)(const CMPISubCond*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPISubCondFT, getPredicateAt, 32,
                   CMPIPredicate* (*)(const CMPISubCond*, CMPICount,
                                      CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPISubCondFT, getPredicate, 40,
                   CMPIPredicate* (*)(const CMPISubCond*, const char*,
                                      CMPIStatus*));

// CMPIPredicateFT
static_assert(sizeof(CMPIPredicateFT) == 40);
static_assert(alignof(CMPIPredicateFT) == 8);
CMPI_ASSERT_MEMBER(CMPIPredicateFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIPredicateFT, release, 8, CMPIStatus (*)(CMPIPredicate*));
CMPI_ASSERT_MEMBER(CMPIPredicateFT, clone, 16,
                   CMPIPredicate* (*)(const CMPIPredicate*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIPredicateFT, getData, 24,
                   CMPIStatus (*)(const CMPIPredicate*, CMPIType*, CMPIPredOp*,
                                  CMPIString**, CMPIString**));
CMPI_ASSERT_MEMBER(CMPIPredicateFT, evaluateUsingAccessor, 32,
                   CMPIBoolean (*)(const CMPIPredicate*, CMPIAccessor*, void*,
                                   CMPIStatus*));

// CMPIArgsFT
static_assert(sizeof(CMPIArgsFT) == 56);
static_assert(alignof(CMPIArgsFT) == 8);
CMPI_ASSERT_MEMBER(CMPIArgsFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIArgsFT, release, 8, CMPIStatus (*)(CMPIArgs*));
CMPI_ASSERT_MEMBER(CMPIArgsFT, clone, 16,
                   CMPIArgs* (*)(const CMPIArgs*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIArgsFT, addArg, 24,
                   CMPIStatus (*)(const CMPIArgs*, const char*,
                                  const CMPIValue*, const CMPIType));
CMPI_ASSERT_MEMBER(CMPIArgsFT, getArg, 32,
                   CMPIData (*)(const CMPIArgs*, const char*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIArgsFT, getArgAt, 40,
                   CMPIData (*)(const CMPIArgs*, CMPICount, CMPIString**,
                                CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIArgsFT, getArgCount, 48,
                   CMPICount (*)(const CMPIArgs*, CMPIStatus*));

// CMPIStringFT
static_assert(sizeof(CMPIStringFT) == 32);
static_assert(alignof(CMPIStringFT) == 8);
CMPI_ASSERT_MEMBER(CMPIStringFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIStringFT, release, 8, CMPIStatus (*)(CMPIString*));
CMPI_ASSERT_MEMBER(CMPIStringFT, clone, 16,
                   CMPIString* (*)(const CMPIString*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIStringFT, getCharPtr, 24,
                   const char* (*)(const CMPIString*, CMPIStatus*));

// CMPIArrayFT
static_assert(sizeof(CMPIArrayFT) == 56);
static_assert(alignof(CMPIArrayFT) == 8);
CMPI_ASSERT_MEMBER(CMPIArrayFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIArrayFT, release, 8, CMPIStatus (*)(CMPIArray*));
CMPI_ASSERT_MEMBER(CMPIArrayFT, clone, 16,
                   CMPIArray* (*)(const CMPIArray*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIArrayFT, getSize, 24,
                   CMPICount (*)(const CMPIArray*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIArrayFT, getSimpleType, 32,
                   CMPIType (*)(const CMPIArray*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIArrayFT, getElementAt, 40,
                   CMPIData (*)(const CMPIArray*, CMPICount, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIArrayFT, setElementAt, 48,
                   CMPIStatus (*)(CMPIArray*, CMPICount, const CMPIValue*,
                                  CMPIType));

// CMPIEnumerationFT
static_assert(sizeof(CMPIEnumerationFT) == 48);
static_assert(alignof(CMPIEnumerationFT) == 8);
CMPI_ASSERT_MEMBER(CMPIEnumerationFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIEnumerationFT, release, 8,
                   CMPIStatus (*)(CMPIEnumeration*));
CMPI_ASSERT_MEMBER(CMPIEnumerationFT, clone, 16,
                   CMPIEnumeration* (*)(const CMPIEnumeration*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIEnumerationFT, getNext, 24,
                   CMPIData (*)(const CMPIEnumeration*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIEnumerationFT, hasNext, 32,
                   CMPIBoolean (*)(const CMPIEnumeration*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIEnumerationFT, toArray, 40,
                   CMPIArray* (*)(const CMPIEnumeration*, CMPIStatus*));

// CMPIDateTimeFT
static_assert(sizeof(CMPIDateTimeFT) == 48);
static_assert(alignof(CMPIDateTimeFT) == 8);
CMPI_ASSERT_MEMBER(CMPIDateTimeFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIDateTimeFT, release, 8, CMPIStatus (*)(CMPIDateTime*));
CMPI_ASSERT_MEMBER(CMPIDateTimeFT, clone, 16,
                   CMPIDateTime* (*)(const CMPIDateTime*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIDateTimeFT, getBinaryFormat, 24,
                   CMPIUint64 (*)(const CMPIDateTime*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIDateTimeFT, getStringFormat, 32,
                   CMPIString* (*)(const CMPIDateTime*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIDateTimeFT, isInterval, 40,
                   CMPIBoolean (*)(const CMPIDateTime*, CMPIStatus*));

// A string object backed by a plain C string, dispatched through its table
// exactly as a provider calls a broker-owned CMPIString.
const char* textOf(const CMPIString* st, CMPIStatus* rc)
{
    if (rc != nullptr)
    {
        *rc = CMPIStatus{CMPI_RC_OK, nullptr};
    }
    return static_cast<const char*>(st->hdl);
}

TEST(ObjectTables, StringDispatchesThroughItsTable)
{
    CMPIStringFT ft{};
    ft.ftVersion = CMPICurrentVersion;
    ft.getCharPtr = textOf;
    char text[] = "Pwr Unit Redund";
    const CMPIString str{text, &ft};

    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    EXPECT_STREQ(str.ft->getCharPtr(&str, &rc), "Pwr Unit Redund");
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    // The status out-parameter is optional.
    EXPECT_STREQ(str.ft->getCharPtr(&str, nullptr), "Pwr Unit Redund");
}

CMPIData entryFor(const CMPIContext*, const char* name, CMPIStatus* rc)
{
    CMPIData data{};
    if (std::string_view{name} == CMPIInvocationFlags)
    {
        data.type = CMPI_uint32;
        data.state = CMPI_goodValue;
        data.value.uint32 = CMPI_FLAG_IncludeQualifiers;
        *rc = CMPIStatus{CMPI_RC_OK, nullptr};
    }
    else
    {
        data.type = CMPI_null;
        data.state = CMPI_nullValue | CMPI_notFound;
        *rc = CMPIStatus{CMPI_RC_ERR_NO_SUCH_PROPERTY, nullptr};
    }
    return data;
}

TEST(ObjectTables, ContextEntryComesBackAsCMPIDataByValue)
{
    CMPIContextFT ft{};
    ft.getEntry = entryFor;
    const CMPIContext ctx{nullptr, &ft};

    CMPIStatus rc{};
    const CMPIData flags = ctx.ft->getEntry(&ctx, CMPIInvocationFlags, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    EXPECT_EQ(flags.type, CMPI_uint32);
    EXPECT_EQ(flags.value.uint32, 4u);

    const CMPIData missing = ctx.ft->getEntry(&ctx, CMPIRole, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    EXPECT_NE(missing.state & CMPI_notFound, 0);
}

} // namespace
