#include "Instrumentation.h"

#include "Fixture.h"
#include "FixtureGenerator.h"
#include "MemorySource.h"
#include "platform/TestTrees.h"

#include <sstream>
#include <stdexcept>

#include <gtest/gtest.h>

using namespace QX;
using namespace QX::NodeLexicon;

namespace
{

std::shared_ptr<MemorySource> twoControllerSource()
{
    return std::make_shared<MemorySource>(test::twoControllerTree());
}

std::vector<std::string> walk(Instrumentation& cursor)
{
    std::vector<std::string> paths;
    while (cursor)
    {
        paths.push_back(cursor.getPathToNode());
        ++cursor;
    }
    return paths;
}

} // namespace

TEST(Instrumentation, ProviderWalkOverLogsAndEntries)
{
    const auto source = twoControllerSource();
    Instrumentation controller(source);
    controller.selectNode(ManagementController);
    ASSERT_TRUE(controller);
    const std::string controllerPath = controller.getPathToNode();
    EXPECT_EQ(controllerPath, "/bmc0");

    Instrumentation logs(source);
    logs.selectNode(EventLog);
    EXPECT_TRUE(logs.setFilter(Parent, controllerPath));
    std::vector<std::string> names;
    std::vector<std::string> logPaths;
    while (logs)
    {
        std::string name = "unset";
        logs.getProperty(Name, name);
        names.push_back(name);
        logPaths.push_back(logs.getPathToNode());
        ++logs;
    }
    EXPECT_EQ(logPaths, (std::vector<std::string>{"/bmc0/sel", "/bmc0/aux"}));
    EXPECT_EQ(names, (std::vector<std::string>{"IPMI SEL Log", "unset"}));

    Instrumentation entries(source);
    entries.selectNode(EventLogEntry);
    entries.setFilter(Parent, "/bmc0/sel");
    Instrumentation log(source);
    log.selectNode(std::string("/bmc0/sel"));
    ASSERT_TRUE(log);
    unsigned maxRecords = 0;
    EXPECT_TRUE(log.getProperty(MaxRecords, maxRecords));
    EXPECT_EQ(maxRecords, 512u);

    std::vector<unsigned> ids;
    while (entries)
    {
        unsigned id = 0;
        EXPECT_TRUE(entries.getProperty(RecordId, id));
        ids.push_back(id);
        EXPECT_EQ(entries.getPathToParentNode(), "/bmc0/sel");
        EXPECT_EQ(entries.convertPathToString(entries.getPathToNode()),
                  "IPMI:" + entries.getPathToNode());
        ++entries;
    }
    EXPECT_EQ(ids, (std::vector<unsigned>{1, 2, 3}));
    EXPECT_FALSE(entries);
    ++entries; // stepping past the end stays invalid
    EXPECT_FALSE(entries);
}

TEST(Instrumentation, SelectKindWithoutFilterVisitsAllInOrder)
{
    Instrumentation cursor(twoControllerSource());
    cursor.selectNode(EventLog);
    EXPECT_EQ(walk(cursor), (std::vector<std::string>{"/bmc0/sel", "/bmc0/aux",
                                                      "/bmc1/sel"}));
    cursor.selectNode(Watchdog);
    ASSERT_TRUE(cursor);
    EXPECT_EQ(cursor.getNodeDescription(), "Watchdog 2");
    EXPECT_EQ(cursor.getNodeStatus(), 1u);
    EXPECT_EQ(cursor.getPathToParentNode(), "/bmc0");
}

TEST(Instrumentation, FilterSetBeforeSelection)
{
    Instrumentation cursor(twoControllerSource());
    EXPECT_TRUE(cursor.setFilter(Parent, "/bmc1"));
    cursor.selectNode(EventLogEntry);
    EXPECT_EQ(walk(cursor),
              (std::vector<std::string>{"/bmc1/sel/entry-00001",
                                        "/bmc1/sel/entry-00002"}));
}

TEST(Instrumentation, FilterMovesACurrentNodeOutsideIt)
{
    Instrumentation cursor(twoControllerSource());
    cursor.selectNode(EventLog);
    ASSERT_EQ(cursor.getPathToNode(), "/bmc0/sel");
    cursor.setFilter(Parent, "/bmc1");
    ASSERT_TRUE(cursor);
    EXPECT_EQ(cursor.getPathToNode(), "/bmc1/sel");
    ++cursor;
    EXPECT_FALSE(cursor);
}

TEST(Instrumentation, FilterKeepsACurrentNodeInsideIt)
{
    Instrumentation cursor(twoControllerSource());
    cursor.selectNode(EventLog);
    ++cursor;
    ASSERT_EQ(cursor.getPathToNode(), "/bmc0/aux");
    cursor.setFilter(Parent, "/bmc0");
    ASSERT_TRUE(cursor);
    EXPECT_EQ(cursor.getPathToNode(), "/bmc0/aux");
    ++cursor;
    EXPECT_FALSE(cursor); // /bmc1/sel lies outside the filter
}

TEST(Instrumentation, UnknownFilterMatchesNothingUntilChanged)
{
    Instrumentation cursor(twoControllerSource());
    cursor.selectNode(EventLog);
    EXPECT_FALSE(cursor.setFilter(Parent, "/no/such/node"));
    EXPECT_FALSE(cursor);
    cursor.selectNode(EventLog);
    EXPECT_FALSE(cursor);
    cursor.selectNode(std::string("/bmc0/sel"));
    EXPECT_FALSE(cursor);
    EXPECT_TRUE(cursor.setFilter(Parent, "/bmc1"));
    ASSERT_TRUE(cursor);
    EXPECT_EQ(cursor.getPathToNode(), "/bmc1/sel");
}

TEST(Instrumentation, SelectByPathStepsThroughItsKind)
{
    Instrumentation cursor(twoControllerSource());
    cursor.selectNode(std::string("/bmc0/sel/entry-00002"));
    ASSERT_TRUE(cursor);
    EXPECT_EQ(walk(cursor),
              (std::vector<std::string>{
                  "/bmc0/sel/entry-00002", "/bmc0/sel/entry-00003",
                  "/bmc0/aux/entry-00007", "/bmc1/sel/entry-00001",
                  "/bmc1/sel/entry-00002"}));
    cursor.selectNode(std::string("/unknown"));
    EXPECT_FALSE(cursor);
}

TEST(Instrumentation, SelectByPathRespectsTheFilter)
{
    Instrumentation cursor(twoControllerSource());
    cursor.setFilter(Parent, "/bmc0/sel");
    cursor.selectNode(std::string("/bmc0/sel/entry-00002"));
    EXPECT_EQ(walk(cursor),
              (std::vector<std::string>{"/bmc0/sel/entry-00002",
                                        "/bmc0/sel/entry-00003"}));
    cursor.selectNode(std::string("/bmc1/sel/entry-00001"));
    EXPECT_FALSE(cursor);
}

TEST(Instrumentation, InvalidCursorThrowsOnNodeReadsAndFailsProperties)
{
    Instrumentation cursor(twoControllerSource());
    EXPECT_FALSE(cursor); // nothing selected yet
    EXPECT_THROW(cursor.getPathToNode(), std::logic_error);
    cursor.selectNode(static_cast<NodeType>(77));
    EXPECT_FALSE(cursor);
    EXPECT_THROW(cursor.getPathToNode(), std::logic_error);
    EXPECT_THROW(cursor.getPathToParentNode(), std::logic_error);
    EXPECT_THROW(cursor.getNodeDescription(), std::logic_error);
    EXPECT_THROW(cursor.getNodeStatus(), std::logic_error);
    try
    {
        cursor.getNodeStatus();
        FAIL() << "no exception";
    }
    catch (const std::exception& error)
    {
        EXPECT_NE(std::string(error.what()).find("getNodeStatus"),
                  std::string::npos);
    }
    unsigned number = 42;
    std::string text = "keep";
    bool flag = true;
    EXPECT_FALSE(cursor.getProperty(MaxRecords, number));
    EXPECT_FALSE(cursor.getProperty(Name, text));
    EXPECT_FALSE(cursor.getProperty(IsEmpty, flag));
    EXPECT_EQ(number, 42u);
    EXPECT_EQ(text, "keep");
    EXPECT_TRUE(flag);
    unsigned command = ClearEventLogCommand;
    EXPECT_FALSE(cursor.setProperty(Command, command));
    // A path can be converted even on an invalid cursor.
    EXPECT_EQ(cursor.convertPathToString("/x"), "IPMI:/x");
}

TEST(Instrumentation, PropertyOfAnotherTypeOrMissingLeavesOutputUnchanged)
{
    Instrumentation cursor(twoControllerSource());
    cursor.selectNode(std::string("/bmc0/sel"));
    ASSERT_TRUE(cursor);
    unsigned number = 99;
    EXPECT_FALSE(cursor.getProperty(Name, number)); // Name is text
    EXPECT_EQ(number, 99u);
    std::string text = "keep";
    EXPECT_FALSE(cursor.getProperty(MaxRecords, text)); // unsigned
    EXPECT_EQ(text, "keep");
    bool flag = true;
    EXPECT_FALSE(cursor.getProperty(MaxRecords, flag));
    EXPECT_TRUE(flag);
    EXPECT_FALSE(cursor.getProperty(DataFormat, text)); // absent
    EXPECT_EQ(text, "keep");
    EXPECT_TRUE(cursor.getProperty(IsEmpty, flag));
    EXPECT_FALSE(flag);
}

TEST(Instrumentation, SnapshotIsTakenAtFirstUseAndKept)
{
    const auto source = twoControllerSource();
    Instrumentation cursor(source);
    // Replaced before the first selection: the cursor sees the new tree.
    NodeTreeBuilder builder;
    builder.addNode(ManagementController, "/other", "", "", 0);
    source->replaceTree(builder.build());
    cursor.selectNode(ManagementController);
    ASSERT_TRUE(cursor);
    EXPECT_EQ(cursor.getPathToNode(), "/other");
    // Replaced after: the cursor keeps walking its snapshot.
    source->replaceTree(test::twoControllerTree());
    cursor.selectNode(ManagementController);
    EXPECT_EQ(walk(cursor), std::vector<std::string>{"/other"});
}

TEST(Instrumentation, SetPropertyForwardsToTheSource)
{
    const auto source = twoControllerSource();
    Instrumentation cursor(source);
    cursor.selectNode(ManagementController);
    unsigned command = ClearEventLogCommand;
    EXPECT_TRUE(cursor.setProperty(Command, command));
    EXPECT_EQ(source->acceptedWrites(), 1u);
    unsigned other = 3;
    EXPECT_FALSE(cursor.setProperty(Command, other));
    EXPECT_EQ(source->acceptedWrites(), 1u);
}

TEST(Instrumentation, MonitoringForwardsToTheSource)
{
    const auto source = twoControllerSource();
    const MonitorCallback callback = [](unsigned, DateTime, std::string,
                                        const void*) {};
    Instrumentation cursor(source);
    cursor.startMonitoring(EventLog, callback, nullptr);
    EXPECT_EQ(source->monitorCount(EventLog), 1u);
    cursor.stopMonitoring(EventLog, callback, nullptr);
    EXPECT_EQ(source->monitorCount(EventLog), 0u);
}

TEST(Instrumentation, NullSourceIsRejected)
{
    EXPECT_THROW(Instrumentation(std::shared_ptr<InstrumentationSource>()),
                 std::invalid_argument);
}

TEST(Instrumentation, WalksAFullSizeLogInOrder)
{
    std::stringstream text;
    writeGeneratedFixture(text, 65535, 65535);
    const auto source =
        std::make_shared<MemorySource>(parseFixture(text, "generated"));
    Instrumentation entries(source);
    entries.selectNode(EventLogEntry);
    entries.setFilter(Parent, "/bmc0/sel");
    unsigned expected = 1;
    while (entries)
    {
        unsigned id = 0;
        ASSERT_TRUE(entries.getProperty(RecordId, id));
        ASSERT_EQ(id, expected);
        ++expected;
        ++entries;
    }
    EXPECT_EQ(expected - 1, 65535u);
}

// ---- Fault injection ------------------------------------------------------

namespace
{

/** Performs @p operation on a cursor that stands on /bmc0/sel. */
void perform(Instrumentation& cursor, CursorOperation operation)
{
    std::string text;
    unsigned number = 0;
    const MonitorCallback callback = [](unsigned, DateTime, std::string,
                                        const void*) {};
    switch (operation)
    {
        case CursorOperation::Construct:
            break; // handled by the caller
        case CursorOperation::SelectKind:
            cursor.selectNode(EventLog);
            break;
        case CursorOperation::SelectPath:
            cursor.selectNode(std::string("/bmc0/sel"));
            break;
        case CursorOperation::Valid:
            static_cast<void>(static_cast<bool>(cursor));
            break;
        case CursorOperation::Next:
            ++cursor;
            break;
        case CursorOperation::SetFilter:
            cursor.setFilter(Parent, "/bmc0");
            break;
        case CursorOperation::GetPath:
            cursor.getPathToNode();
            break;
        case CursorOperation::GetParentPath:
            cursor.getPathToParentNode();
            break;
        case CursorOperation::ConvertPath:
            cursor.convertPathToString("/bmc0");
            break;
        case CursorOperation::GetDescription:
            cursor.getNodeDescription();
            break;
        case CursorOperation::GetStatus:
            cursor.getNodeStatus();
            break;
        case CursorOperation::GetProperty:
            cursor.getProperty(Name, text);
            break;
        case CursorOperation::SetProperty:
            cursor.setProperty(Command, number);
            break;
        case CursorOperation::StartMonitoring:
            cursor.startMonitoring(EventLog, callback, nullptr);
            break;
        case CursorOperation::StopMonitoring:
            cursor.stopMonitoring(EventLog, callback, nullptr);
            break;
    }
}

class CursorFaultTest : public ::testing::TestWithParam<CursorOperation>
{
};

} // namespace

TEST_P(CursorFaultTest, ArmedOperationThrowsOnceThenWorks)
{
    const CursorOperation operation = GetParam();
    const auto source = twoControllerSource();
    if (operation == CursorOperation::Construct)
    {
        source->armFault({operation, 0, false, "construct failed"});
        EXPECT_THROW(Instrumentation cursor(source), std::runtime_error);
        EXPECT_NO_THROW(Instrumentation cursor(source));
        return;
    }
    Instrumentation cursor(source);
    cursor.selectNode(std::string("/bmc0/sel"));
    ASSERT_TRUE(cursor);
    source->armFault({operation, 0, false, "injected failure"});
    try
    {
        perform(cursor, operation);
        FAIL() << "operation " << static_cast<int>(operation)
               << " did not fail";
    }
    catch (const std::runtime_error& error)
    {
        EXPECT_STREQ(error.what(), "injected failure");
    }
    cursor.selectNode(std::string("/bmc0/sel"));
    EXPECT_NO_THROW(perform(cursor, operation));
}

INSTANTIATE_TEST_SUITE_P(
    EveryOperation, CursorFaultTest,
    ::testing::Values(CursorOperation::Construct, CursorOperation::SelectKind,
                      CursorOperation::SelectPath, CursorOperation::Valid,
                      CursorOperation::Next, CursorOperation::SetFilter,
                      CursorOperation::GetPath, CursorOperation::GetParentPath,
                      CursorOperation::ConvertPath,
                      CursorOperation::GetDescription,
                      CursorOperation::GetStatus, CursorOperation::GetProperty,
                      CursorOperation::SetProperty,
                      CursorOperation::StartMonitoring,
                      CursorOperation::StopMonitoring));

TEST(CursorFault, SkipLetsCallsThroughFirst)
{
    const auto source = twoControllerSource();
    Instrumentation cursor(source);
    cursor.selectNode(EventLogEntry);
    source->armFault({CursorOperation::Next, 2, false, "third step"});
    ++cursor;
    ++cursor;
    EXPECT_THROW(++cursor, std::runtime_error);
    EXPECT_NO_THROW(++cursor);
}

TEST(CursorFault, RepeatKeepsFailingUntilCleared)
{
    const auto source = twoControllerSource();
    Instrumentation cursor(source);
    cursor.selectNode(EventLog);
    source->armFault({CursorOperation::GetStatus, 1, true, "always"});
    EXPECT_NO_THROW(cursor.getNodeStatus());
    EXPECT_THROW(cursor.getNodeStatus(), std::runtime_error);
    EXPECT_THROW(cursor.getNodeStatus(), std::runtime_error);
    EXPECT_NO_THROW(cursor.getPathToNode()); // other operations unaffected
    source->clearFaults();
    EXPECT_EQ(cursor.getNodeStatus(), 2u);
}
