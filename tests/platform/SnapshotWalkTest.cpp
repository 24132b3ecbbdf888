// Cursors over a source that opens no walk of its own: the default walk
// reads one snapshot and sends writes and monitoring back to the source.
#include "SnapshotWalk.h"

#include "Instrumentation.h"
#include "InstrumentationSource.h"
#include "platform/TestTrees.h"

#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include <gtest/gtest.h>

using namespace QX;
using namespace QX::NodeLexicon;

namespace
{

/** A source with nothing but the interface: counts what reaches it. */
class PlainSource : public InstrumentationSource
{
  public:
    std::shared_ptr<const NodeTree> snapshot() override
    {
        ++snapshots;
        return tree;
    }
    bool writeProperty(const std::string& path, Properties property,
                       unsigned value) override
    {
        writes.push_back(path + " " + std::to_string(property) + "=" +
                         std::to_string(value));
        return true;
    }
    void startMonitoring(NodeType /*kind*/, MonitorCallback /*callback*/,
                         const void* /*context*/) override
    {
        ++monitors;
    }
    void stopMonitoring(NodeType /*kind*/, MonitorCallback /*callback*/,
                        const void* /*context*/) override
    {
        --monitors;
    }

    std::shared_ptr<const NodeTree> tree = test::twoControllerTree();
    unsigned snapshots = 0;
    std::vector<std::string> writes;
    int monitors = 0;
};

/** A source whose walks are not there. */
class NoWalkSource : public PlainSource
{
  public:
    std::unique_ptr<SnapshotWalk> openWalk() override
    {
        return nullptr;
    }
};

void ignore(unsigned, DateTime, std::string, const void*) {}

} // namespace

TEST(SnapshotWalk, WalksOneSnapshotOfAPlainSource)
{
    const auto source = std::make_shared<PlainSource>();
    Instrumentation cursor(source);
    cursor.selectNode(EventLogEntry);
    std::vector<std::string> paths;
    for (; cursor; ++cursor)
    {
        paths.push_back(cursor.getPathToNode());
    }
    EXPECT_EQ(paths.size(), 6u);
    // The tree the source holds now is not the one the walk reads.
    source->tree = NodeTreeBuilder().build();
    cursor.selectNode(std::string("/bmc0/sel"));
    ASSERT_TRUE(cursor);
    EXPECT_EQ(cursor.getNodeDescription(), "SEL zero");
    EXPECT_EQ(cursor.getPathToParentNode(), "/bmc0");
    EXPECT_EQ(source->snapshots, 1u);
    std::string name;
    EXPECT_TRUE(cursor.getProperty(Name, name));
    EXPECT_EQ(name, "IPMI SEL Log");
    EXPECT_EQ(cursor.convertPathToString("/bmc0/sel"), "IPMI:/bmc0/sel");
}

TEST(SnapshotWalk, SendsWritesAndMonitoringToTheSource)
{
    const auto source = std::make_shared<PlainSource>();
    Instrumentation cursor(source);
    cursor.selectNode(std::string("/bmc1"));
    unsigned command = ClearEventLogCommand;
    EXPECT_TRUE(cursor.setProperty(Command, command));
    ASSERT_EQ(source->writes.size(), 1u);
    EXPECT_EQ(source->writes[0], "/bmc1 " + std::to_string(Command) + "=" +
                                     std::to_string(ClearEventLogCommand));
    cursor.startMonitoring(EventLog, ignore, nullptr);
    EXPECT_EQ(source->monitors, 1);
    cursor.stopMonitoring(EventLog, ignore, nullptr);
    EXPECT_EQ(source->monitors, 0);
}

TEST(SnapshotWalk, ASourceThatOpensNoWalkMakesNoCursor)
{
    EXPECT_THROW(Instrumentation cursor(std::make_shared<NoWalkSource>()),
                 std::runtime_error);
}
