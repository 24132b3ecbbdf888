// Hostile arguments through the exported function tables, as a careless or
// malicious object manager could pass them: NULL pointers, huge and odd
// names, paths with too many keys or keys of the wrong type, method
// arguments of the wrong types. Every call must answer a defined status,
// and every diagnostic line must stay within its buffer.
#include "CVLogger.h"
#include "HostileCalls.h"
#include "sdk/qxlib/include/Trace.h"

#include <cmpift.h>

#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace hostile
{
namespace
{

/** The whole table, in the order of its groups. */
std::vector<Case> cases()
{
    std::vector<Case> all = instanceCalls();
    for (auto group : {methodCalls(), stubCalls()})
    {
        all.insert(all.end(), group.begin(), group.end());
    }
    return all;
}

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
} // namespace hostile
