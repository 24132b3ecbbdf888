#include "Fixture.h"

#include "FixtureGenerator.h"
#include "Instrumentation.h"
#include "MemorySource.h"

#include <sstream>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace QX;
using namespace QX::NodeLexicon;

namespace
{

std::shared_ptr<const NodeTree> parse(const std::string& text)
{
    std::istringstream in(text);
    return parseFixture(in, "test.fixture");
}

const NodeRecord& nodeAt(const NodeTree& tree, const std::string& path)
{
    const auto id = tree.find(path);
    if (!id)
    {
        throw std::runtime_error("no node " + path);
    }
    return tree.node(*id);
}

template <typename T>
T property(const NodeRecord& node, Properties key)
{
    const PropertyValue* value = node.find(key);
    if (value == nullptr)
    {
        throw std::runtime_error("missing property");
    }
    return std::get<T>(*value);
}

/** The FixtureError message for @p text, or "" when it parses. */
std::string errorOf(const std::string& text)
{
    try
    {
        parse(text);
    }
    catch (const FixtureError& error)
    {
        return error.what();
    }
    return "";
}

const std::string controllerAndLog = "controller path=/bmc0 status=1\n"
                                     "log path=/bmc0/sel\n";

} // namespace

TEST(Fixture, ParsesEveryDirective)
{
    const auto tree = parse(
        "# a comment\n"
        "\n"
        "   # indented comment\n"
        "controller path=/bmc0 status=1 description=\"Baseboard Management "
        "Controller\"\r\n"
        "log path=/bmc0/sel status=2 description=SEL Name=\"IPMI SEL Log\" "
        "MaxRecords=512 OverwritePolicy=1 DataFormat=\"hex pairs\" "
        "IsEmpty=false\n"
        "entry RecordId=1 Timestamp=\"2024-03-04 08:15:22\" RecordData=\"01 "
        "00\" "
        "description=\"first\"\n"
        "entry RecordId=2 path=/custom/entry status=5\n"
        "watchdog path=/bmc0/wdt status=1 description=\"Watchdog 2\" "
        "RestartCause=4\n");
    ASSERT_EQ(tree->size(), 5u);

    const NodeRecord& controller = nodeAt(*tree, "/bmc0");
    EXPECT_EQ(controller.kind, ManagementController);
    EXPECT_EQ(controller.status, 1u);
    EXPECT_EQ(controller.description, "Baseboard Management Controller");
    EXPECT_EQ(controller.parent, NodeTree::none);

    const NodeRecord& log = nodeAt(*tree, "/bmc0/sel");
    EXPECT_EQ(log.kind, EventLog);
    EXPECT_EQ(log.status, 2u);
    EXPECT_EQ(log.description, "SEL");
    EXPECT_EQ(tree->node(log.parent).path, "/bmc0");
    EXPECT_EQ(property<std::string>(log, Name), "IPMI SEL Log");
    EXPECT_EQ(property<unsigned>(log, MaxRecords), 512u);
    EXPECT_EQ(property<unsigned>(log, OverwritePolicy), 1u);
    EXPECT_EQ(property<std::string>(log, DataFormat), "hex pairs");
    EXPECT_FALSE(property<bool>(log, IsEmpty));

    const NodeRecord& first = nodeAt(*tree, "/bmc0/sel/entry-00001");
    EXPECT_EQ(first.kind, EventLogEntry);
    EXPECT_EQ(first.status, 0u);
    EXPECT_EQ(tree->node(first.parent).path, "/bmc0/sel");
    EXPECT_EQ(property<unsigned>(first, RecordId), 1u);
    EXPECT_EQ(property<std::string>(first, Timestamp), "2024-03-04 08:15:22");
    EXPECT_EQ(property<std::string>(first, RecordData), "01 00");
    EXPECT_EQ(first.description, "first");

    const NodeRecord& custom = nodeAt(*tree, "/custom/entry");
    EXPECT_EQ(custom.status, 5u);
    EXPECT_EQ(tree->node(custom.parent).path, "/bmc0/sel");
    EXPECT_EQ(custom.find(Timestamp), nullptr);

    const NodeRecord& watchdog = nodeAt(*tree, "/bmc0/wdt");
    EXPECT_EQ(watchdog.kind, Watchdog);
    EXPECT_EQ(property<unsigned>(watchdog, RestartCause), 4u);
    EXPECT_EQ(tree->node(watchdog.parent).path, "/bmc0");
}

TEST(Fixture, OmittedPropertiesAreAbsent)
{
    const auto tree = parse(controllerAndLog + "entry RecordId=3\n");
    const NodeRecord& log = nodeAt(*tree, "/bmc0/sel");
    EXPECT_TRUE(log.properties.empty());
    EXPECT_EQ(log.status, 0u);
    EXPECT_EQ(log.description, "");
    const NodeRecord& entry = nodeAt(*tree, "/bmc0/sel/entry-00003");
    EXPECT_EQ(entry.properties.size(), 1u);
}

TEST(Fixture, ExplicitParentsAndDefaultsFollowTheLastNode)
{
    const auto tree = parse("controller path=/a\n"
                            "log path=/a/log1\n"
                            "controller path=/b\n"
                            "log path=/b/log\n"
                            "entry RecordId=1\n"
                            "log path=/a/log2 parent=/a\n"
                            "entry RecordId=1\n"
                            "entry RecordId=2 parent=/a/log1\n"
                            "watchdog path=/b/wdt\n");
    EXPECT_EQ(tree->node(nodeAt(*tree, "/a/log2").parent).path, "/a");
    EXPECT_TRUE(tree->find("/b/log/entry-00001").has_value());
    EXPECT_TRUE(tree->find("/a/log2/entry-00001").has_value());
    EXPECT_TRUE(tree->find("/a/log1/entry-00002").has_value());
    EXPECT_EQ(tree->node(nodeAt(*tree, "/b/wdt").parent).path, "/b");
}

TEST(Fixture, QuotedValuesKeepBlanksAndEscapes)
{
    const auto tree = parse(
        "controller path=\"/with blank\" description=\"say \\\"hi\\\" \\\\ "
        "there\"\n"
        "log path=/l parent=\"/with blank\" Name=\"\" DataFormat=a=b\n");
    EXPECT_EQ(nodeAt(*tree, "/with blank").description, "say \"hi\" \\ there");
    EXPECT_EQ(property<std::string>(nodeAt(*tree, "/l"), Name), "");
    EXPECT_EQ(property<std::string>(nodeAt(*tree, "/l"), DataFormat), "a=b");
}

TEST(Fixture, NumbersAndBooleansAreStrict)
{
    EXPECT_EQ(
        property<unsigned>(nodeAt(*parse(controllerAndLog +
                                         "log path=/x MaxRecords=4294967295"),
                                  "/x"),
                           MaxRecords),
        4294967295u);
    EXPECT_EQ(property<unsigned>(nodeAt(*parse(controllerAndLog +
                                               "log path=/x MaxRecords=007"),
                                        "/x"),
                                 MaxRecords),
              7u);
    for (const char* bad : {"12x", "-1", "99999999999", "", "+5", " 5"})
    {
        EXPECT_THAT(errorOf(controllerAndLog + "log path=/x MaxRecords=\"" +
                            bad + "\""),
                    ::testing::StartsWith("test.fixture:3: bad unsigned value"))
            << bad;
    }
    EXPECT_EQ(errorOf(controllerAndLog + "log path=/x MaxRecords=4294967296"),
              "test.fixture:3: value for MaxRecords exceeds 4294967295: "
              "4294967296");
    EXPECT_EQ(errorOf(controllerAndLog + "log path=/x IsEmpty=True"),
              "test.fixture:3: bad boolean value for IsEmpty: \"True\" "
              "(expected true or false)");
    EXPECT_THAT(errorOf(controllerAndLog + "log path=/x IsEmpty=1"),
                ::testing::StartsWith("test.fixture:3: bad boolean"));
    EXPECT_THAT(errorOf(controllerAndLog + "log path=/x status=ok"),
                ::testing::StartsWith("test.fixture:3: bad unsigned value for "
                                      "status"));
}

TEST(Fixture, ReportsEachErrorWithItsLine)
{
    EXPECT_EQ(errorOf("controller path=/a\nsensor path=/b\n"),
              "test.fixture:2: unknown directive \"sensor\"");
    EXPECT_EQ(errorOf("controller path=/a Name=x\n"),
              "test.fixture:1: unknown key Name for controller");
    EXPECT_EQ(errorOf("controller path=/a parent=/b\n"),
              "test.fixture:1: unknown key parent for controller");
    EXPECT_EQ(errorOf(controllerAndLog + "entry RecordId=1 MaxRecords=3\n"),
              "test.fixture:3: unknown key MaxRecords for entry");
    EXPECT_EQ(errorOf("controller path=/a\n\n# x\ncontroller path=/a\n"),
              "test.fixture:4: duplicate path /a");
    EXPECT_EQ(
        errorOf(controllerAndLog + "entry RecordId=1\nentry RecordId=1\n"),
        "test.fixture:4: duplicate path /bmc0/sel/entry-00001");
    EXPECT_EQ(errorOf("controller status=1\n"),
              "test.fixture:1: controller needs a non-empty path=");
    EXPECT_EQ(errorOf("controller path=\"\"\n"),
              "test.fixture:1: controller needs a non-empty path=");
    EXPECT_EQ(errorOf(controllerAndLog + "entry description=x\n"),
              "test.fixture:3: entry needs path= or RecordId=");
    EXPECT_EQ(errorOf("controller path=/a path=/b\n"),
              "test.fixture:1: duplicate key path");
    EXPECT_EQ(errorOf("controller path=/a\nlog path=/l parent=/zzz\n"),
              "test.fixture:2: unknown parent /zzz");
    EXPECT_EQ(errorOf("log path=/l\n"),
              "test.fixture:1: log without parent=: no controller above it");
    EXPECT_EQ(errorOf("controller path=/a\nentry RecordId=1\n"),
              "test.fixture:2: entry without parent=: no log above it");
    EXPECT_EQ(errorOf("controller path=/a description=\"open\n"),
              "test.fixture:1: unterminated quoted value");
    EXPECT_EQ(errorOf("controller path=/a description=\"x\"y\n"),
              "test.fixture:1: text after closing quote");
    EXPECT_EQ(
        errorOf("controller path=/a description=\"bad \\n\"\n"),
        "test.fixture:1: bad escape in quoted value (only \\\" and \\\\)");
    EXPECT_EQ(errorOf("controller path=/a stray\n"),
              "test.fixture:1: expected key=value, found \"stray\"");
    EXPECT_EQ(errorOf("controller path=/a =x\n"),
              "test.fixture:1: empty key before '='");
}

TEST(Fixture, LoadFixtureFileNamesUnreadableFiles)
{
    try
    {
        loadFixtureFile("/nonexistent/dir/x.fixture");
        FAIL() << "no exception";
    }
    catch (const FixtureError& error)
    {
        EXPECT_THAT(error.what(),
                    ::testing::StartsWith("/nonexistent/dir/x.fixture: cannot "
                                          "open"));
    }
}

TEST(Fixture, ShippedSampleParsesAndMatchesTheBuiltInCopy)
{
    const std::string path = std::string(SELPROV_SOURCE_DIR) +
                             "/platform/fixtures/sample-sel.fixture";
    const auto fromFile = loadFixtureFile(path);
    std::istringstream builtin(builtinSampleFixture());
    const auto fromLibrary = parseFixture(builtin, "builtin");
    ASSERT_EQ(fromFile->size(), fromLibrary->size());

    const auto source = std::make_shared<MemorySource>(fromLibrary);
    Instrumentation controller(source);
    controller.selectNode(ManagementController);
    ASSERT_TRUE(controller);
    EXPECT_EQ(controller.getPathToNode(), "/bmc0");
    EXPECT_EQ(controller.getNodeDescription(),
              "Baseboard Management Controller");

    Instrumentation log(source);
    log.selectNode(EventLog);
    log.setFilter(Parent, "/bmc0");
    ASSERT_TRUE(log);
    std::string name;
    ASSERT_TRUE(log.getProperty(Name, name));
    EXPECT_EQ(name, "IPMI SEL Log");
    unsigned maxRecords = 0;
    EXPECT_TRUE(log.getProperty(MaxRecords, maxRecords));
    EXPECT_EQ(maxRecords, 512u);
    bool empty = true;
    EXPECT_TRUE(log.getProperty(IsEmpty, empty));
    EXPECT_FALSE(empty);

    Instrumentation entries(source);
    entries.selectNode(EventLogEntry);
    entries.setFilter(Parent, log.getPathToNode());
    std::vector<std::string> paths;
    unsigned expectedId = 1;
    while (entries)
    {
        unsigned id = 0;
        std::string data;
        std::string timestamp;
        ASSERT_TRUE(entries.getProperty(RecordId, id));
        ASSERT_TRUE(entries.getProperty(RecordData, data));
        ASSERT_TRUE(entries.getProperty(Timestamp, timestamp));
        EXPECT_EQ(id, expectedId++);
        EXPECT_THAT(data, ::testing::MatchesRegex(
                              "[0-9a-f][0-9a-f]( [0-9a-f][0-9a-f]){15}"));
        EXPECT_THAT(timestamp, ::testing::MatchesRegex(
                                   "20[0-9][0-9]-[0-9][0-9]-[0-9][0-9] "
                                   "[0-9][0-9]:[0-9][0-9]:[0-9][0-9]"));
        paths.push_back(entries.getPathToNode());
        ++entries;
    }
    EXPECT_GE(paths.size(), 20u);
    EXPECT_LE(paths.size(), 30u);
    EXPECT_TRUE(std::is_sorted(paths.begin(), paths.end()));

    Instrumentation watchdog(source);
    watchdog.selectNode(Watchdog);
    ASSERT_TRUE(watchdog);
    unsigned cause = 0;
    EXPECT_TRUE(watchdog.getProperty(RestartCause, cause));
    EXPECT_EQ(cause, 4u);
}

TEST(Fixture, SampleRecordDataStartsWithTheRecordId)
{
    std::istringstream builtin(builtinSampleFixture());
    const auto tree = parseFixture(builtin, "builtin");
    for (const auto id : tree->nodesOfKind(EventLogEntry))
    {
        const NodeRecord& entry = tree->node(id);
        const unsigned recordId = property<unsigned>(entry, RecordId);
        char expected[16];
        std::snprintf(expected, sizeof expected, "%02x %02x 02 ",
                      recordId & 0xff, recordId >> 8);
        EXPECT_EQ(property<std::string>(entry, RecordData).substr(0, 9),
                  expected);
        EXPECT_FALSE(entry.description.empty());
    }
}

TEST(Fixture, GeneratedFixtureParsesWithAllEntries)
{
    std::stringstream text;
    writeGeneratedFixture(text, 65535, 1000);
    const auto tree = parseFixture(text, "generated");
    const auto& entries = tree->nodesOfKind(EventLogEntry);
    ASSERT_EQ(entries.size(), 65535u);
    EXPECT_EQ(tree->node(entries.front()).path, "/bmc0/sel/entry-00001");
    EXPECT_EQ(tree->node(entries.back()).path, "/bmc0/sel/entry-65535");
    EXPECT_EQ(property<unsigned>(tree->node(entries.back()), RecordId), 65535u);
    const NodeRecord& log = nodeAt(*tree, "/bmc0/sel");
    EXPECT_EQ(property<std::string>(log, Name), "IPMI SEL Log");
    EXPECT_EQ(property<unsigned>(log, MaxRecords), 1000u);
    EXPECT_EQ(property<unsigned>(log, OverwritePolicy), 1u);
    EXPECT_FALSE(property<bool>(log, IsEmpty));
    EXPECT_EQ(nodeAt(*tree, "/bmc0").status, 1u);
    EXPECT_EQ(log.status, 1u);
    // Record data carries the record id little endian.
    EXPECT_EQ(property<std::string>(nodeAt(*tree, "/bmc0/sel/entry-00258"),
                                    RecordData)
                  .substr(0, 8),
              "02 01 02");
}

TEST(Fixture, GeneratedEmptyFixtureHasAnEmptyLog)
{
    std::stringstream text;
    writeGeneratedFixture(text, 0, 512);
    const auto tree = parseFixture(text, "generated");
    EXPECT_TRUE(tree->nodesOfKind(EventLogEntry).empty());
    EXPECT_TRUE(property<bool>(nodeAt(*tree, "/bmc0/sel"), IsEmpty));
}
