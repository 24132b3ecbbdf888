#include "NodeTree.h"

#include "platform/TestTrees.h"

#include <stdexcept>
#include <utility>

#include <gtest/gtest.h>

using namespace QX;
using namespace QX::NodeLexicon;

namespace
{

std::vector<std::string> pathsOf(const NodeTree& tree,
                                 const std::vector<NodeTree::NodeId>& ids)
{
    std::vector<std::string> paths;
    paths.reserve(ids.size());
    for (const auto id : ids)
    {
        paths.push_back(tree.node(id).path);
    }
    return paths;
}

} // namespace

TEST(NodeTree, KeepsInsertionOrderAndFindsByPath)
{
    const auto tree = test::twoControllerTree();
    ASSERT_EQ(tree->size(), 12u);
    EXPECT_EQ(tree->node(0).path, "/bmc0");
    EXPECT_EQ(tree->node(1).path, "/bmc0/sel");
    const auto wdt = tree->find("/bmc0/wdt");
    ASSERT_TRUE(wdt.has_value());
    EXPECT_EQ(tree->node(*wdt).kind, Watchdog);
    EXPECT_EQ(tree->node(*wdt).description, "Watchdog 2");
    EXPECT_EQ(tree->node(tree->node(*wdt).parent).path, "/bmc0");
    EXPECT_EQ(tree->node(0).parent, NodeTree::none);
    EXPECT_FALSE(tree->find("/nothing").has_value());
}

TEST(NodeTree, IndexesKindsByEveryAncestor)
{
    const auto tree = test::twoControllerTree();
    EXPECT_EQ(
        pathsOf(*tree, tree->nodesOfKind(EventLog)),
        (std::vector<std::string>{"/bmc0/sel", "/bmc0/aux", "/bmc1/sel"}));
    const auto bmc0 = *tree->find("/bmc0");
    const auto bmc1 = *tree->find("/bmc1");
    EXPECT_EQ(pathsOf(*tree, tree->nodesOfKind(EventLog, bmc1)),
              (std::vector<std::string>{"/bmc1/sel"}));
    // Entries two levels below the controller are indexed under it too.
    EXPECT_EQ(tree->nodesOfKind(EventLogEntry, bmc0).size(), 4u);
    EXPECT_EQ(pathsOf(*tree, tree->nodesOfKind(EventLogEntry,
                                               *tree->find("/bmc0/sel"))),
              (std::vector<std::string>{"/bmc0/sel/entry-00001",
                                        "/bmc0/sel/entry-00002",
                                        "/bmc0/sel/entry-00003"}));
    EXPECT_EQ(tree->nodesOfKind(EventLogEntry).size(), 6u);
}

TEST(NodeTree, UnknownKindOrAncestorGivesTheSameEmptyList)
{
    const auto tree = test::twoControllerTree();
    const auto& none1 = tree->nodesOfKind(Watchdog, *tree->find("/bmc1"));
    const auto& none2 = tree->nodesOfKind(static_cast<NodeType>(999));
    EXPECT_TRUE(none1.empty());
    EXPECT_TRUE(none2.empty());
    EXPECT_EQ(&none1, &none2);
    EXPECT_TRUE(tree->nodesOfKind(EventLog, 123456).empty());
}

TEST(NodeTree, IsUnderAndPositions)
{
    const auto tree = test::twoControllerTree();
    const auto bmc0 = *tree->find("/bmc0");
    const auto sel = *tree->find("/bmc0/sel");
    const auto entry2 = *tree->find("/bmc0/sel/entry-00002");
    const auto aux = *tree->find("/bmc0/aux/entry-00007");
    EXPECT_TRUE(tree->isUnder(entry2, bmc0));
    EXPECT_TRUE(tree->isUnder(entry2, sel));
    EXPECT_FALSE(tree->isUnder(sel, sel));
    EXPECT_FALSE(tree->isUnder(entry2, *tree->find("/bmc1")));
    EXPECT_FALSE(tree->isUnder(entry2, NodeTree::none));
    EXPECT_FALSE(tree->isUnder(9999, bmc0));

    EXPECT_EQ(tree->positionInList(entry2), 1u);
    EXPECT_EQ(tree->positionInList(entry2, sel), 1u);
    EXPECT_EQ(tree->positionInList(aux, bmc0), 3u);
    EXPECT_EQ(tree->positionInList(aux, *tree->find("/bmc0/aux")), 0u);
    EXPECT_FALSE(tree->positionInList(aux, sel).has_value());
    EXPECT_FALSE(tree->positionInList(9999).has_value());
}

TEST(NodeTree, PropertiesAreTypedAndReplaceable)
{
    NodeTreeBuilder builder;
    builder.addNode(EventLog, "/log", "", "", 0)
        .setProperty("/log", Name, std::string("first"))
        .setProperty("/log", MaxRecords, 10u)
        .setProperty("/log", Name, std::string("second"))
        .removeProperty("/log", MaxRecords)
        .setStatus("/log", 7)
        .setDescription("/log", "described");
    const auto tree = builder.build();
    const NodeRecord& log = tree->node(0);
    ASSERT_NE(log.find(Name), nullptr);
    EXPECT_EQ(std::get<std::string>(*log.find(Name)), "second");
    EXPECT_EQ(log.properties.size(), 1u);
    EXPECT_EQ(log.find(MaxRecords), nullptr);
    EXPECT_EQ(log.status, 7u);
    EXPECT_EQ(log.description, "described");
}

TEST(NodeTreeBuilder, BuildingFromATemporaryGivesTheSameTree)
{
    const auto fill = [](NodeTreeBuilder& builder)
    {
        builder.addNode(ManagementController, "/bmc0", "", "BMC", 1)
            .addNode(EventLog, "/bmc0/sel", "/bmc0", "SEL", 2)
            .addNode(EventLogEntry, "/bmc0/sel/e1", "/bmc0/sel", "one", 0)
            .addNode(EventLogEntry, "/bmc0/sel/e2", "/bmc0/sel", "two", 0)
            .setProperty("/bmc0/sel/e2", RecordId, 2u)
            .setProperty("/bmc0/sel", Name, std::string("SEL"));
    };
    NodeTreeBuilder kept;
    fill(kept);
    NodeTreeBuilder consumed;
    fill(consumed);
    const auto copied = kept.build();
    const auto moved = std::move(consumed).build();

    ASSERT_EQ(moved->size(), copied->size());
    for (NodeTree::NodeId id = 0; id < copied->size(); ++id)
    {
        EXPECT_EQ(moved->node(id).path, copied->node(id).path);
        EXPECT_EQ(moved->node(id).description, copied->node(id).description);
        EXPECT_EQ(moved->node(id).parent, copied->node(id).parent);
        EXPECT_EQ(moved->node(id).properties, copied->node(id).properties);
        EXPECT_EQ(moved->find(copied->node(id).path), id);
    }
    const auto log = *moved->find("/bmc0/sel");
    EXPECT_EQ(pathsOf(*moved, moved->nodesOfKind(EventLogEntry, log)),
              (std::vector<std::string>{"/bmc0/sel/e1", "/bmc0/sel/e2"}));
    EXPECT_EQ(moved->positionInList(*moved->find("/bmc0/sel/e2"), log), 1u);

    // The builder that was copied from keeps its nodes; the one that was
    // built from is left empty and usable.
    EXPECT_TRUE(kept.contains("/bmc0/sel/e2"));
    EXPECT_EQ(kept.build()->size(), copied->size());
    EXPECT_FALSE(consumed.contains("/bmc0")); // NOLINT(bugprone-use-after-move)
    consumed.addNode(ManagementController, "/bmc0", "", "again", 1);
    EXPECT_EQ(consumed.build()->size(), 1u);
}

TEST(NodeTreeBuilder, RejectsDuplicatesUnknownParentsAndEmptyPaths)
{
    NodeTreeBuilder builder;
    builder.addNode(ManagementController, "/bmc0", "", "", 0);
    EXPECT_THROW(builder.addNode(EventLog, "/bmc0", "", "", 0),
                 std::invalid_argument);
    EXPECT_THROW(builder.addNode(EventLog, "/bmc0/sel", "/nope", "", 0),
                 std::invalid_argument);
    EXPECT_THROW(builder.addNode(EventLog, "", "/bmc0", "", 0),
                 std::invalid_argument);
    EXPECT_THROW(builder.setProperty("/missing", Name, std::string("x")),
                 std::invalid_argument);
    EXPECT_THROW(builder.removeNodes(EventLogEntry, "/missing"),
                 std::invalid_argument);
    EXPECT_TRUE(builder.contains("/bmc0"));
    EXPECT_FALSE(builder.contains("/bmc0/sel"));
}

TEST(NodeTreeBuilder, RemoveNodesDropsDescendantsAndReindexes)
{
    const auto original = test::twoControllerTree();
    NodeTreeBuilder builder(*original);
    builder.removeNodes(EventLogEntry, "/bmc0");
    builder.addNode(EventLogEntry, "/bmc0/sel/entry-00009", "/bmc0/sel", "", 0);
    const auto tree = builder.build();
    EXPECT_EQ(tree->size(), original->size() - 4 + 1);
    EXPECT_FALSE(tree->find("/bmc0/sel/entry-00001").has_value());
    EXPECT_FALSE(tree->find("/bmc0/aux/entry-00007").has_value());
    EXPECT_EQ(pathsOf(*tree, tree->nodesOfKind(EventLogEntry)),
              (std::vector<std::string>{"/bmc1/sel/entry-00001",
                                        "/bmc1/sel/entry-00002",
                                        "/bmc0/sel/entry-00009"}));
    // Parents were renumbered consistently.
    for (std::size_t i = 0; i < tree->size(); ++i)
    {
        const NodeRecord& node = tree->node(static_cast<NodeTree::NodeId>(i));
        if (node.parent != NodeTree::none)
        {
            EXPECT_EQ(node.path.rfind(tree->node(node.parent).path + "/", 0),
                      0u)
                << node.path;
        }
    }
    // The tree the builder started from is untouched.
    EXPECT_TRUE(original->find("/bmc0/sel/entry-00001").has_value());
}

TEST(NodeTreeBuilder, RemovingAKindRemovesItsSubtree)
{
    const auto original = test::twoControllerTree();
    NodeTreeBuilder builder(*original);
    builder.removeNodes(EventLog, "/bmc0");
    const auto tree = builder.build();
    EXPECT_FALSE(tree->find("/bmc0/sel").has_value());
    EXPECT_FALSE(tree->find("/bmc0/sel/entry-00002").has_value());
    EXPECT_TRUE(tree->find("/bmc0/wdt").has_value());
    EXPECT_TRUE(tree->find("/bmc1/sel/entry-00002").has_value());
}

TEST(NodeLexicon, NamesKindsAndProperties)
{
    EXPECT_STREQ(nodeTypeName(EventLog), "EventLog");
    EXPECT_STREQ(nodeTypeName(13), "ManagementController");
    EXPECT_EQ(nodeTypeName(14), nullptr);
    EXPECT_STREQ(propertyName(RecordId), "RecordId");
    EXPECT_STREQ(propertyName(191), "Command");
    EXPECT_EQ(propertyName(0), nullptr);
}
