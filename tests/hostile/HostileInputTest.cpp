// Hostile arguments through the exported function tables, as a careless or
// malicious object manager could pass them: NULL pointers, huge and odd
// names, paths with too many keys or keys of the wrong type, method
// arguments of the wrong types. Every call must answer a defined status,
// and every diagnostic line must stay within its buffer.
#include "CVLogger.h"
#include "entry/EntryFixture.h"
#include "sdk/qxlib/include/Trace.h"

#include <cmpift.h>

#include <functional>
#include <memory>
#include <optional>
#include <ostream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace
{

using entry::classPath;
using host::ObjectPath;
using host::Value;

constexpr const char* logClass = "ZAN_MgmtHwLog";
constexpr const char* entryClass = "ZAN_MgmtHwLogEntry";
constexpr unsigned entryCount = 3;

const std::string hugeName(100000, 'A');
const std::string directives = "%n%s%s%s%x%p%n%99999999d";
const std::string invalidUtf8 = "\xff\xfe\xc0\xaf\xed\xa0\x80Z";

/** What the table's calls have at hand. */
struct Call
{
    host::Broker& broker;
    const CMPIContext* context;
    const CMPIResult* result;
    CMPIInstanceMI* instanceMI;
    CMPIMethodMI* methodMI;
    CMPIIndicationMI* indicationMI;
    /** The path of the first entry, as the provider names it. */
    const ObjectPath& firstEntry;

    CMPIObjectPath* path(const ObjectPath& value) const
    {
        return broker.makeObjectPath(value);
    }
};

/** The answer a call must give. */
struct Expected
{
    CMPIrc rc = CMPI_RC_OK;
    std::optional<std::string> message;
    bool done = false;
    std::size_t paths = 0;
    std::size_t instances = 0;
    std::optional<std::uint32_t> returnValue;
};

struct Case
{
    std::string name;
    std::function<CMPIStatus(const Call&)> call;
    Expected expected;
};

void PrintTo(const Case& c, std::ostream* out)
{
    *out << c.name;
}

ObjectPath withClass(const std::string& className)
{
    return classPath(className);
}

ObjectPath logPath()
{
    ObjectPath path = classPath(logClass);
    path.setKey("CreationClassName", Value::string(logClass));
    path.setKey("Name", Value::string("IPMI SEL Log"));
    return path;
}

ObjectPath withManyKeys(ObjectPath path, unsigned count)
{
    for (unsigned i = path.keys.size(); i < count; ++i)
    {
        path.setKey("Extra" + std::to_string(i), Value::string("v"));
    }
    return path;
}

Expected failed(const char* message)
{
    Expected expected;
    expected.rc = CMPI_RC_ERR_FAILED;
    expected.message = message;
    return expected;
}

const Expected noResult = failed("No result was passed");
const Expected noPath = failed("No object path was passed");

/** An unknown class: the factory finds nothing and no end is signalled. */
const Expected unknownClass{};

Expected enumerated(std::size_t paths, std::size_t instances)
{
    Expected expected;
    expected.done = true;
    expected.paths = paths;
    expected.instances = instances;
    return expected;
}

Expected methodValue(std::uint32_t value)
{
    Expected expected;
    expected.done = true;
    expected.returnValue = value;
    return expected;
}

const Expected notSupported = []
{
    Expected expected;
    expected.rc = CMPI_RC_ERR_NOT_SUPPORTED;
    return expected;
}();

// Operations through the tables, with any argument replaceable.
CMPIStatus names(const Call& c, const CMPIContext* context,
                 const CMPIResult* result, const CMPIObjectPath* path)
{
    return c.instanceMI->ft->enumerateInstanceNames(c.instanceMI, context,
                                                    result, path);
}

CMPIStatus instances(const Call& c, const CMPIContext* context,
                     const CMPIResult* result, const CMPIObjectPath* path,
                     const char** properties)
{
    return c.instanceMI->ft->enumerateInstances(c.instanceMI, context, result,
                                                path, properties);
}

CMPIStatus get(const Call& c, const CMPIContext* context,
               const CMPIResult* result, const CMPIObjectPath* path,
               const char** properties)
{
    return c.instanceMI->ft->getInstance(c.instanceMI, context, result, path,
                                         properties);
}

CMPIStatus invoke(const Call& c, const CMPIContext* context,
                  const CMPIResult* result, const CMPIObjectPath* path,
                  const char* method, const CMPIArgs* in, CMPIArgs* out)
{
    return c.methodMI->ft->invokeMethod(c.methodMI, context, result, path,
                                        method, in, out);
}

const char* hostileProperties[] = {
    hugeName.c_str(), directives.c_str(), invalidUtf8.c_str(),
    "RecordID",       "RecordID",         "",
    nullptr};
const char* emptyProperties[] = {nullptr};

std::vector<Case> cases()
{
    const auto entries = [] { return withClass(entryClass); };
    return {
        // enumerateInstanceNames
        {"NamesNullContext",
         [=](const Call& c)
         { return names(c, nullptr, c.result, c.path(entries())); },
         enumerated(entryCount, 0)},
        {"NamesNullMI",
         [=](const Call& c)
         {
             return c.instanceMI->ft->enumerateInstanceNames(
                 nullptr, c.context, c.result, c.path(entries()));
         },
         enumerated(entryCount, 0)},
        {"NamesNullResult",
         [=](const Call& c)
         { return names(c, c.context, nullptr, c.path(entries())); },
         noResult},
        {"NamesNullPath",
         [](const Call& c) { return names(c, c.context, c.result, nullptr); },
         noPath},
        {"NamesAllNull",
         [](const Call& c) { return names(c, nullptr, nullptr, nullptr); },
         noResult},
        {"NamesHugeClassName",
         [](const Call& c)
         { return names(c, c.context, c.result, c.path(withClass(hugeName))); },
         unknownClass},
        {"NamesDirectivesInClassName",
         [](const Call& c) {
             return names(c, c.context, c.result,
                          c.path(withClass(directives)));
         },
         unknownClass},
        {"NamesInvalidUtf8ClassName",
         [](const Call& c) {
             return names(c, c.context, c.result,
                          c.path(withClass(invalidUtf8)));
         },
         unknownClass},
        {"NamesHugeNamespaceWithDirectives",
         [=](const Call& c)
         {
             ObjectPath path = entries();
             path.nameSpace = hugeName + directives + invalidUtf8;
             return names(c, c.context, c.result, c.path(path));
         },
         enumerated(entryCount, 0)},
        {"NamesThousandKeys",
         [=](const Call& c)
         {
             return names(c, c.context, c.result,
                          c.path(withManyKeys(entries(), 1000)));
         },
         enumerated(entryCount, 0)},
        // enumerateInstances
        {"InstancesNullContext",
         [=](const Call& c) {
             return instances(c, nullptr, c.result, c.path(entries()), nullptr);
         },
         enumerated(0, entryCount)},
        {"InstancesNullResult",
         [=](const Call& c) {
             return instances(c, c.context, nullptr, c.path(entries()),
                              nullptr);
         },
         noResult},
        {"InstancesNullPath",
         [](const Call& c)
         { return instances(c, c.context, c.result, nullptr, nullptr); },
         noPath},
        {"InstancesEmptyPropertyList",
         [=](const Call& c)
         {
             return instances(c, c.context, c.result, c.path(entries()),
                              emptyProperties);
         },
         enumerated(0, entryCount)},
        {"InstancesHostilePropertyNames",
         [=](const Call& c)
         {
             return instances(c, c.context, c.result, c.path(entries()),
                              hostileProperties);
         },
         enumerated(0, entryCount)},
        {"InstancesHugeClassName",
         [](const Call& c)
         {
             return instances(c, c.context, c.result,
                              c.path(withClass(hugeName)), hostileProperties);
         },
         unknownClass},
        {"InstancesDirectivesInClassName",
         [](const Call& c)
         {
             return instances(c, c.context, c.result,
                              c.path(withClass(directives)), nullptr);
         },
         unknownClass},
        {"InstancesThousandKeysOnTheLog",
         [](const Call& c)
         {
             return instances(c, c.context, c.result,
                              c.path(withManyKeys(logPath(), 1000)), nullptr);
         },
         enumerated(0, 1)},
        // getInstance
        {"GetNullContext",
         [](const Call& c)
         { return get(c, nullptr, c.result, c.path(c.firstEntry), nullptr); },
         enumerated(0, 1)},
        {"GetNullResult",
         [](const Call& c)
         { return get(c, c.context, nullptr, c.path(c.firstEntry), nullptr); },
         noResult},
        {"GetNullPath",
         [](const Call& c)
         { return get(c, c.context, c.result, nullptr, nullptr); },
         noPath},
        // Without its key properties requested, the entry instance carries
        // only CreationClassName as key, so no instance matches the path.
        {"GetEmptyPropertyList",
         [](const Call& c) {
             return get(c, c.context, c.result, c.path(c.firstEntry),
                        emptyProperties);
         },
         enumerated(0, 0)},
        {"GetHostilePropertyNames",
         [](const Call& c)
         {
             return get(c, c.context, c.result, c.path(c.firstEntry),
                        hostileProperties);
         },
         enumerated(0, 0)},
        {"GetThousandKeys",
         [](const Call& c)
         {
             return get(c, c.context, c.result,
                        c.path(withManyKeys(c.firstEntry, 1000)), nullptr);
         },
         enumerated(0, 0)},
        {"GetRecordIdOfTheWrongType",
         [](const Call& c)
         {
             ObjectPath path = c.firstEntry;
             path.setKey("RecordID", Value::unsignedInt(CMPI_uint64, 1));
             return get(c, c.context, c.result, c.path(path), nullptr);
         },
         enumerated(0, 0)},
        {"GetEveryKeyOfTheWrongType",
         [](const Call& c)
         {
             ObjectPath path = c.firstEntry;
             for (auto& key : path.keys.edit())
             {
                 key.second = Value::boolean(true);
             }
             return get(c, c.context, c.result, c.path(path), nullptr);
         },
         enumerated(0, 0)},
        {"GetHugeKeyValues",
         [](const Call& c)
         {
             ObjectPath path = c.firstEntry;
             for (auto& key : path.keys.edit())
             {
                 key.second = Value::string(hugeName + directives);
             }
             return get(c, c.context, c.result, c.path(path), nullptr);
         },
         enumerated(0, 0)},
        {"GetLogNameOfTheWrongType",
         [](const Call& c)
         {
             ObjectPath path = logPath();
             path.setKey("Name", Value::signedInt(CMPI_sint64, -1));
             return get(c, c.context, c.result, c.path(path), nullptr);
         },
         enumerated(0, 0)},
        {"GetWithoutKeys",
         [=](const Call& c)
         { return get(c, c.context, c.result, c.path(entries()), nullptr); },
         []
         {
             Expected expected = failed("At least one key should be passed");
             expected.done = true;
             return expected;
         }()},
        {"GetHugeClassName",
         [](const Call& c)
         {
             ObjectPath path = c.firstEntry;
             path.className = hugeName + directives;
             return get(c, c.context, c.result, c.path(path), nullptr);
         },
         unknownClass},
        // invokeMethod
        {"ClearLogNullContext",
         [](const Call& c)
         {
             return invoke(c, nullptr, c.result, c.path(logPath()), "ClearLog",
                           c.broker.makeArgs(), c.broker.makeArgs());
         },
         methodValue(0)},
        {"ClearLogNullMI",
         [](const Call& c)
         {
             return c.methodMI->ft->invokeMethod(nullptr, c.context, c.result,
                                                 c.path(logPath()), "ClearLog",
                                                 nullptr, nullptr);
         },
         methodValue(0)},
        {"ClearLogThousandKeys",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result,
                           c.path(withManyKeys(logPath(), 1000)), "ClearLog",
                           nullptr, nullptr);
         },
         methodValue(0)},
        {"ClearLogInvalidUtf8ClassName",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result,
                           c.path(withClass(invalidUtf8)), "ClearLog", nullptr,
                           nullptr);
         },
         methodValue(0)},
        {"ClearLogNullResult",
         [](const Call& c)
         {
             return invoke(c, c.context, nullptr, c.path(logPath()), "ClearLog",
                           c.broker.makeArgs(), c.broker.makeArgs());
         },
         noResult},
        {"ClearLogNullPath",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result, nullptr, "ClearLog",
                           c.broker.makeArgs(), c.broker.makeArgs());
         },
         noPath},
        {"MethodNullName",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result, c.path(logPath()), nullptr,
                           c.broker.makeArgs(), c.broker.makeArgs());
         },
         methodValue(0)},
        {"ClearLogNullArguments",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result, c.path(logPath()),
                           "ClearLog", nullptr, nullptr);
         },
         methodValue(0)},
        {"ClearLogArgumentsOfWrongTypes",
         [](const Call& c)
         {
             host::NamedValues in;
             in.emplace_back("Name", Value::unsignedInt(CMPI_uint8, 7));
             in.emplace_back("ClearLog", Value::boolean(false));
             in.emplace_back(hugeName, Value::string(directives));
             return invoke(c, c.context, c.result, c.path(logPath()),
                           "ClearLog", c.broker.makeArgs(in),
                           c.broker.makeArgs(in));
         },
         methodValue(0)},
        {"MethodHugeName",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result, c.path(logPath()),
                           hugeName.c_str(), nullptr, nullptr);
         },
         methodValue(0)},
        {"MethodDirectivesInName",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result, c.path(logPath()),
                           directives.c_str(), nullptr, nullptr);
         },
         methodValue(0)},
        {"MethodInvalidUtf8Name",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result, c.path(logPath()),
                           invalidUtf8.c_str(), nullptr, nullptr);
         },
         methodValue(0)},
        {"ClearLogOnAHugeClassName",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result,
                           c.path(withClass(hugeName + directives)), "ClearLog",
                           nullptr, nullptr);
         },
         methodValue(0)},
        // the stubs
        {"CreateAllNull",
         [](const Call& c)
         {
             return c.instanceMI->ft->createInstance(nullptr, nullptr, nullptr,
                                                     nullptr, nullptr);
         },
         notSupported},
        {"ModifyAllNull",
         [](const Call& c)
         {
             return c.instanceMI->ft->modifyInstance(nullptr, nullptr, nullptr,
                                                     nullptr, nullptr, nullptr);
         },
         notSupported},
        {"DeleteAllNull",
         [](const Call& c)
         {
             return c.instanceMI->ft->deleteInstance(nullptr, nullptr, nullptr,
                                                     nullptr);
         },
         notSupported},
        {"ExecQueryAllNull",
         [](const Call& c)
         {
             return c.instanceMI->ft->execQuery(nullptr, nullptr, nullptr,
                                                nullptr, nullptr, nullptr);
         },
         notSupported},
        {"InstanceCleanupNullContext",
         [](const Call& c)
         { return c.instanceMI->ft->cleanup(nullptr, nullptr, 0); },
         Expected{}},
        {"MethodCleanupNullContext",
         [](const Call& c)
         { return c.methodMI->ft->cleanup(nullptr, nullptr, 0); },
         Expected{}},
        {"IndicationCleanupNullContext",
         [](const Call& c)
         { return c.indicationMI->ft->cleanup(nullptr, nullptr, 0); },
         Expected{}},
        {"AuthorizeFilterAllNull",
         [](const Call& c)
         {
             return c.indicationMI->ft->authorizeFilter(
                 nullptr, nullptr, nullptr, nullptr, nullptr, nullptr);
         },
         Expected{}},
        {"AuthorizeFilterHostileNames",
         [](const Call& c)
         {
             return c.indicationMI->ft->authorizeFilter(
                 c.indicationMI, c.context, nullptr, hugeName.c_str(),
                 c.path(withClass(directives)), invalidUtf8.c_str());
         },
         Expected{}},
        {"MustPollAllNull",
         [](const Call& c)
         {
             return c.indicationMI->ft->mustPoll(nullptr, nullptr, nullptr,
                                                 nullptr, nullptr);
         },
         Expected{}},
        {"MustPollHostileNames",
         [](const Call& c)
         {
             return c.indicationMI->ft->mustPoll(c.indicationMI, c.context,
                                                 nullptr, directives.c_str(),
                                                 c.path(withClass(hugeName)));
         },
         Expected{}},
    };
}

/** The provider on three entries, with every diagnostic line captured. */
class CapturingThreeEntries : public entry::CapturingProviderTest
{
  protected:
    void SetUp() override
    {
        CapturingProviderTest::SetUp();
        install(entry::selTree(entryCount));
    }
};

class HostileInput :
    public CapturingThreeEntries,
    public ::testing::WithParamInterface<Case>
{
};

TEST_P(HostileInput, AnswersItsDefinedStatus)
{
    const Case& c = GetParam();
    const host::Outcome listed =
        host().enumerateInstanceNames(classPath(entryClass));
    ASSERT_EQ(listed.paths.size(), entryCount);
    const ObjectPath firstEntry = listed.paths.front();
    capture_->clear();
    host::Outcome outcome;
    {
        host::Broker::Request request(broker());
        const Call call{broker(),          request.context(),
                        request.result(),  host().instanceMI(),
                        host().methodMI(), host().indicationMI(),
                        firstEntry};
        outcome = request.finish(c.call(call));
    }
    const Expected& expected = c.expected;
    EXPECT_EQ(outcome.rc, expected.rc);
    EXPECT_EQ(outcome.message, expected.message);
    EXPECT_EQ(outcome.done, expected.done);
    EXPECT_LE(outcome.doneCount, 1u);
    EXPECT_EQ(outcome.paths.size(), expected.paths);
    EXPECT_EQ(outcome.instances.size(), expected.instances);
    EXPECT_EQ(outcome.rejectedInstances, 0u);
    EXPECT_EQ(outcome.rejectedPaths, 0u);
    if (expected.returnValue)
    {
        ASSERT_EQ(outcome.data.size(), 1u);
        EXPECT_EQ(outcome.data[0],
                  Value::unsignedInt(CMPI_uint32, *expected.returnValue));
    }
    else
    {
        EXPECT_TRUE(outcome.data.empty());
    }
    for (const CVLog::LogRecord& line : capture_->records())
    {
        EXPECT_LT(line.message.size(), QX::TRACE_BUFFER_SIZE) << line.message;
    }
}

INSTANTIATE_TEST_SUITE_P(Table, HostileInput, ::testing::ValuesIn(cases()),
                         [](const auto& info) { return info.param.name; });

} // namespace

namespace
{

class HostileNames : public CapturingThreeEntries
{
  protected:
    /** The captured line that starts with @p prefix, or an empty text. */
    std::string lineStartingWith(const std::string& prefix) const
    {
        for (const CVLog::LogRecord& line : capture_->records())
        {
            if (line.message.starts_with(prefix))
            {
                return line.message;
            }
        }
        return {};
    }
};

TEST_F(HostileNames, DirectivesInAClassNameArePrintedAsTheyStand)
{
    const host::Outcome outcome =
        host().enumerateInstances(classPath(directives));
    EXPECT_EQ(outcome.rc, CMPI_RC_OK);
    const std::string line = lineStartingWith("VARIABLE: 'classname'");
    EXPECT_TRUE(line.starts_with("VARIABLE: 'classname' has Value '" +
                                 directives + "' at line "))
        << line;
    EXPECT_TRUE(line.ends_with(" in SELProvider.cpp")) << line;
}

TEST_F(HostileNames, AHugeClassNameIsCutAtTheBuffer)
{
    const host::Outcome outcome =
        host().enumerateInstanceNames(classPath(hugeName));
    EXPECT_EQ(outcome.rc, CMPI_RC_OK);
    const std::string line = lineStartingWith("VARIABLE: 'classname'");
    const std::string start = "VARIABLE: 'classname' has Value '";
    ASSERT_EQ(line.size(), QX::TRACE_BUFFER_SIZE - 1);
    EXPECT_EQ(line, start + std::string(line.size() - start.size(), 'A'));
    EXPECT_FALSE(lineStartingWith("MESSAGE [File: ").empty());
}

} // namespace
