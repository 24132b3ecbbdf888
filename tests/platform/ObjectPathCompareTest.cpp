#include "ObjectPathCompare.h"

#include <cmpift.h>

#include <deque>
#include <string>
#include <vector>

#include <gtest/gtest.h>

using QX::isObjPathsEqual;

namespace
{

// ---- A minimal hand-made CMPI object path ---------------------------------

const char* stringText(const CMPIString* text, CMPIStatus* rc)
{
    if (rc != nullptr)
    {
        *rc = CMPIStatus{CMPI_RC_OK, nullptr};
    }
    return static_cast<const std::string*>(text->hdl)->c_str();
}

CMPIStringFT stringFunctions = {1, nullptr, nullptr, &stringText};

CMPIString* dateTimeText(const CMPIDateTime* when, CMPIStatus* rc);
CMPIDateTimeFT dateTimeFunctions = {1,       nullptr,       nullptr,
                                    nullptr, &dateTimeText, nullptr};

struct FakeKey
{
    CMPIString* name;
    CMPIData data;
};

/** Everything one fake path answers, and which calls should fail. */
struct FakePathData
{
    CMPIString* nameSpace = nullptr;
    CMPIString* className = nullptr;
    CMPIString* host = nullptr;
    std::vector<FakeKey> keys;
    bool failKeyCount = false;
    bool failKeyAt = false;
    bool failClassName = false;
};

FakePathData& dataOf(const CMPIObjectPath* path)
{
    return *static_cast<FakePathData*>(path->hdl);
}

void setStatus(CMPIStatus* rc, bool failed)
{
    if (rc != nullptr)
    {
        *rc = CMPIStatus{failed ? CMPI_RC_ERR_FAILED : CMPI_RC_OK, nullptr};
    }
}

CMPIString* pathNameSpace(const CMPIObjectPath* path, CMPIStatus* rc)
{
    setStatus(rc, false);
    return dataOf(path).nameSpace;
}

CMPIString* pathHost(const CMPIObjectPath* path, CMPIStatus* rc)
{
    setStatus(rc, false);
    return dataOf(path).host;
}

CMPIString* pathClassName(const CMPIObjectPath* path, CMPIStatus* rc)
{
    setStatus(rc, dataOf(path).failClassName);
    return dataOf(path).className;
}

CMPICount pathKeyCount(const CMPIObjectPath* path, CMPIStatus* rc)
{
    setStatus(rc, dataOf(path).failKeyCount);
    return static_cast<CMPICount>(dataOf(path).keys.size());
}

CMPIData pathKeyAt(const CMPIObjectPath* path, CMPICount index,
                   CMPIString** name, CMPIStatus* rc)
{
    const auto& keys = dataOf(path).keys;
    if (index >= keys.size() || dataOf(path).failKeyAt)
    {
        setStatus(rc, true);
        return CMPIData{0, CMPI_nullValue, {}};
    }
    setStatus(rc, false);
    if (name != nullptr)
    {
        *name = keys[index].name;
    }
    return keys[index].data;
}

CMPIObjectPathFT makePathFunctions()
{
    CMPIObjectPathFT functions{};
    functions.ftVersion = 1;
    functions.getNameSpace = &pathNameSpace;
    functions.getHostname = &pathHost;
    functions.getClassName = &pathClassName;
    functions.getKeyAt = &pathKeyAt;
    functions.getKeyCount = &pathKeyCount;
    return functions;
}

CMPIObjectPathFT pathFunctions = makePathFunctions();

/** Owns fake strings, date-times and paths for one test. */
class FakeFactory
{
  public:
    CMPIString* string(const std::string& text)
    {
        texts_.push_back(text);
        strings_.push_back(CMPIString{&texts_.back(), &stringFunctions});
        return &strings_.back();
    }

    CMPIDateTime* dateTime(const std::string& text)
    {
        dateTimes_.push_back(CMPIDateTime{string(text), &dateTimeFunctions});
        return &dateTimes_.back();
    }

    CMPIObjectPath* path(const std::string& nameSpace,
                         const std::string& className,
                         const std::string& host = "host1")
    {
        data_.emplace_back();
        data_.back().nameSpace = string(nameSpace);
        data_.back().className = string(className);
        data_.back().host = string(host);
        paths_.push_back(CMPIObjectPath{&data_.back(), &pathFunctions});
        return &paths_.back();
    }

    void addKey(CMPIObjectPath* path, const std::string& name, CMPIType type,
                CMPIValue value)
    {
        dataOf(path).keys.push_back(
            FakeKey{string(name), CMPIData{type, CMPI_keyValue, value}});
    }

    void addString(CMPIObjectPath* path, const std::string& name,
                   const std::string& text)
    {
        CMPIValue value{};
        value.string = string(text);
        addKey(path, name, CMPI_string, value);
    }

  private:
    std::deque<std::string> texts_;
    std::deque<CMPIString> strings_;
    std::deque<CMPIDateTime> dateTimes_;
    std::deque<FakePathData> data_;
    std::deque<CMPIObjectPath> paths_;
};

CMPIString* dateTimeText(const CMPIDateTime* when, CMPIStatus* rc)
{
    setStatus(rc, false);
    return static_cast<CMPIString*>(when->hdl);
}

CMPIValue unsignedValue(CMPIType type, std::uint64_t number)
{
    CMPIValue value{};
    switch (type)
    {
        case CMPI_uint8:
            value.uint8 = static_cast<CMPIUint8>(number);
            break;
        case CMPI_uint16:
            value.uint16 = static_cast<CMPIUint16>(number);
            break;
        case CMPI_uint32:
            value.uint32 = static_cast<CMPIUint32>(number);
            break;
        default:
            value.uint64 = number;
    }
    return value;
}

CMPIValue signedValue(CMPIType type, std::int64_t number)
{
    CMPIValue value{};
    switch (type)
    {
        case CMPI_sint8:
            value.sint8 = static_cast<CMPISint8>(number);
            break;
        case CMPI_sint16:
            value.sint16 = static_cast<CMPISint16>(number);
            break;
        case CMPI_sint32:
            value.sint32 = static_cast<CMPISint32>(number);
            break;
        default:
            value.sint64 = number;
    }
    return value;
}

/** A log entry path like the provider makes. */
CMPIObjectPath* entryPath(FakeFactory& make, const std::string& className,
                          const std::string& recordId, bool reversed = false)
{
    CMPIObjectPath* path = make.path("root/zanqx", className);
    if (reversed)
    {
        make.addString(path, "LOGNAME", "IPMI SEL Log");
        make.addString(path, "recordid", recordId);
    }
    else
    {
        make.addString(path, "RecordID", recordId);
        make.addString(path, "LogName", "IPMI SEL Log");
    }
    return path;
}

} // namespace

TEST(ObjectPathCompare, SamePathsAreEqualIgnoringNameCase)
{
    FakeFactory make;
    CMPIObjectPath* left = entryPath(make, "ZAN_MgmtHwLogEntry", "IPMI:/e1");
    CMPIObjectPath* right =
        entryPath(make, "zan_mgmthwlogentry", "IPMI:/e1", true);
    dataOf(right).nameSpace = make.string("ROOT/ZanQX");
    EXPECT_TRUE(isObjPathsEqual(left, right, false));
    EXPECT_TRUE(isObjPathsEqual(right, left, false));
    EXPECT_TRUE(isObjPathsEqual(left, left, true));
}

TEST(ObjectPathCompare, DifferentPartsAreUnequal)
{
    FakeFactory make;
    CMPIObjectPath* base = entryPath(make, "ZAN_MgmtHwLogEntry", "IPMI:/e1");
    EXPECT_FALSE(isObjPathsEqual(
        base, entryPath(make, "ZAN_MgmtHwLogEntry", "IPMI:/E1"), false))
        << "key values compare exactly";
    EXPECT_FALSE(isObjPathsEqual(
        base, entryPath(make, "ZAN_MgmtHwLog", "IPMI:/e1"), false));
    CMPIObjectPath* otherNamespace =
        entryPath(make, "ZAN_MgmtHwLogEntry", "IPMI:/e1");
    dataOf(otherNamespace).nameSpace = make.string("root/cimv2");
    EXPECT_FALSE(isObjPathsEqual(base, otherNamespace, false));

    CMPIObjectPath* extraKey =
        entryPath(make, "ZAN_MgmtHwLogEntry", "IPMI:/e1");
    make.addString(extraKey, "CreationClassName", "ZAN_MgmtHwLogEntry");
    EXPECT_FALSE(isObjPathsEqual(base, extraKey, false));
    EXPECT_FALSE(isObjPathsEqual(extraKey, base, false));

    CMPIObjectPath* renamedKey = make.path("root/zanqx", "ZAN_MgmtHwLogEntry");
    make.addString(renamedKey, "RecordID", "IPMI:/e1");
    make.addString(renamedKey, "Name", "IPMI SEL Log");
    EXPECT_FALSE(isObjPathsEqual(base, renamedKey, false));
}

TEST(ObjectPathCompare, DuplicateKeyNamesMustMatchDistinctKeys)
{
    FakeFactory make;
    CMPIObjectPath* left = make.path("ns", "C");
    make.addString(left, "A", "1");
    make.addString(left, "A", "1");
    CMPIObjectPath* right = make.path("ns", "C");
    make.addString(right, "A", "1");
    make.addString(right, "B", "1");
    EXPECT_FALSE(isObjPathsEqual(left, right, false));
}

TEST(ObjectPathCompare, HostsCountOnlyWhenAsked)
{
    FakeFactory make;
    CMPIObjectPath* left = make.path("ns", "C", "alpha");
    CMPIObjectPath* right = make.path("ns", "C", "ALPHA");
    CMPIObjectPath* other = make.path("ns", "C", "beta");
    EXPECT_TRUE(isObjPathsEqual(left, other, false));
    EXPECT_FALSE(isObjPathsEqual(left, other, true));
    EXPECT_TRUE(isObjPathsEqual(left, right, true));
}

TEST(ObjectPathCompare, TextKindsCompareByTheirText)
{
    FakeFactory make;
    const std::string stamp = "20240305140211.000000+060";
    CMPIObjectPath* asDateTime = make.path("ns", "C");
    CMPIValue when{};
    when.dateTime = make.dateTime(stamp);
    make.addKey(asDateTime, "MessageTimestamp", CMPI_dateTime, when);
    CMPIObjectPath* asString = make.path("ns", "C");
    make.addString(asString, "MessageTimestamp", stamp);
    CMPIObjectPath* asChars = make.path("ns", "C");
    std::string charsText = stamp;
    CMPIValue chars{};
    chars.chars = charsText.data();
    make.addKey(asChars, "MessageTimestamp", CMPI_chars, chars);
    EXPECT_TRUE(isObjPathsEqual(asDateTime, asString, false));
    EXPECT_TRUE(isObjPathsEqual(asChars, asDateTime, false));

    CMPIObjectPath* later = make.path("ns", "C");
    CMPIValue laterWhen{};
    laterWhen.dateTime = make.dateTime("20240305140212.000000+060");
    make.addKey(later, "MessageTimestamp", CMPI_dateTime, laterWhen);
    EXPECT_FALSE(isObjPathsEqual(asDateTime, later, false));
}

TEST(ObjectPathCompare, IntegersCompareByValueAcrossWidths)
{
    FakeFactory make;
    const auto withKey = [&](CMPIType type, CMPIValue value)
    {
        CMPIObjectPath* path = make.path("ns", "C");
        make.addKey(path, "N", type, value);
        return path;
    };
    CMPIObjectPath* u8 = withKey(CMPI_uint8, unsignedValue(CMPI_uint8, 200));
    CMPIObjectPath* u64 = withKey(CMPI_uint64, unsignedValue(CMPI_uint64, 200));
    CMPIObjectPath* s16 = withKey(CMPI_sint16, signedValue(CMPI_sint16, 200));
    CMPIObjectPath* s8neg = withKey(CMPI_sint8, signedValue(CMPI_sint8, -56));
    CMPIObjectPath* s64neg =
        withKey(CMPI_sint64, signedValue(CMPI_sint64, -56));
    CMPIObjectPath* u32 = withKey(CMPI_uint32, unsignedValue(CMPI_uint32, 201));
    CMPIObjectPath* text = make.path("ns", "C");
    make.addString(text, "N", "200");
    EXPECT_TRUE(isObjPathsEqual(u8, u64, false));
    EXPECT_TRUE(isObjPathsEqual(u8, s16, false));
    EXPECT_TRUE(isObjPathsEqual(s8neg, s64neg, false));
    EXPECT_FALSE(isObjPathsEqual(u8, s8neg, false)); // 200 vs -56
    EXPECT_FALSE(isObjPathsEqual(u8, u32, false));
    EXPECT_FALSE(isObjPathsEqual(u8, text, false));

    CMPIObjectPath* maxUnsigned =
        withKey(CMPI_uint64, unsignedValue(CMPI_uint64, UINT64_MAX));
    CMPIObjectPath* minusOne =
        withKey(CMPI_sint64, signedValue(CMPI_sint64, -1));
    EXPECT_FALSE(isObjPathsEqual(maxUnsigned, minusOne, false));
    CMPIObjectPath* minSigned =
        withKey(CMPI_sint64, signedValue(CMPI_sint64, INT64_MIN));
    EXPECT_TRUE(isObjPathsEqual(minSigned, minSigned, false));
}

TEST(ObjectPathCompare, BooleansAndReferences)
{
    FakeFactory make;
    const auto withBool = [&](CMPIBoolean flag)
    {
        CMPIObjectPath* path = make.path("ns", "C");
        CMPIValue value{};
        value.boolean = flag;
        make.addKey(path, "B", CMPI_boolean, value);
        return path;
    };
    EXPECT_TRUE(isObjPathsEqual(withBool(1), withBool(2), false));
    EXPECT_FALSE(isObjPathsEqual(withBool(1), withBool(0), false));

    const auto withRef = [&](const std::string& host, const std::string& id)
    {
        CMPIObjectPath* target = make.path("ns", "Target", host);
        make.addString(target, "Id", id);
        CMPIObjectPath* path = make.path("ns", "Assoc");
        CMPIValue value{};
        value.ref = target;
        make.addKey(path, "Ref", CMPI_ref, value);
        return path;
    };
    EXPECT_TRUE(isObjPathsEqual(withRef("a", "1"), withRef("b", "1"), false));
    EXPECT_FALSE(isObjPathsEqual(withRef("a", "1"), withRef("b", "1"), true));
    EXPECT_FALSE(isObjPathsEqual(withRef("a", "1"), withRef("a", "2"), false));
}

TEST(ObjectPathCompare, SelfReferenceEndsUnequal)
{
    FakeFactory make;
    CMPIObjectPath* loop = make.path("ns", "C");
    CMPIValue value{};
    value.ref = loop;
    make.addKey(loop, "Self", CMPI_ref, value);
    EXPECT_FALSE(isObjPathsEqual(loop, loop, false));
}

TEST(ObjectPathCompare, NullsAndFailuresAreUnequal)
{
    FakeFactory make;
    CMPIObjectPath* good = entryPath(make, "C", "1");
    EXPECT_FALSE(isObjPathsEqual(nullptr, good, false));
    EXPECT_FALSE(isObjPathsEqual(good, nullptr, false));
    EXPECT_FALSE(isObjPathsEqual(nullptr, nullptr, false));

    CMPIObjectPath noTable{nullptr, nullptr};
    EXPECT_FALSE(isObjPathsEqual(&noTable, good, false));

    CMPIObjectPath* failing = entryPath(make, "C", "1");
    ASSERT_TRUE(isObjPathsEqual(failing, good, false));
    dataOf(failing).failKeyCount = true;
    EXPECT_FALSE(isObjPathsEqual(failing, good, false));
    dataOf(failing).failKeyCount = false;
    dataOf(failing).failKeyAt = true;
    EXPECT_FALSE(isObjPathsEqual(good, failing, false));
    dataOf(failing).failKeyAt = false;
    dataOf(failing).failClassName = true;
    EXPECT_FALSE(isObjPathsEqual(failing, good, false));
    dataOf(failing).failClassName = false;
    dataOf(failing).nameSpace = nullptr;
    EXPECT_FALSE(isObjPathsEqual(failing, good, false));

    CMPIObjectPathFT partial = makePathFunctions();
    partial.getKeyAt = nullptr;
    CMPIObjectPath* noKeyAt = entryPath(make, "C", "1");
    noKeyAt->ft = &partial;
    EXPECT_FALSE(isObjPathsEqual(noKeyAt, good, false));

    CMPIObjectPath* nullValue = make.path("ns", "C");
    make.addKey(nullValue, "RecordID", CMPI_string, CMPIValue{});
    dataOf(nullValue).keys.back().data.state = CMPI_nullValue;
    make.addString(nullValue, "LogName", "IPMI SEL Log");
    CMPIObjectPath* sameShape = make.path("ns", "C");
    make.addString(sameShape, "RecordID", "1");
    make.addString(sameShape, "LogName", "IPMI SEL Log");
    EXPECT_FALSE(isObjPathsEqual(nullValue, sameShape, false));

    CMPIObjectPath* nullString = make.path("ns", "C");
    make.addKey(nullString, "RecordID", CMPI_string, CMPIValue{});
    make.addString(nullString, "LogName", "IPMI SEL Log");
    EXPECT_FALSE(isObjPathsEqual(nullString, sameShape, false));
}
