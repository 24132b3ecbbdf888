// Each of the four indication classes, delivered through the loaded
// library: every property by name, CMPI type and value, in the order set.
#include "IndicationFixture.h"
#include "Product.h"
#include "Resources.h"
#include "Support.h"
#include "Utf8.h"

#include <cstdint>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace
{

using namespace entry;
using host::Value;
using namespace QX::NodeLexicon;

// 2010-03-07 18:04:09, 5 ms, two hours east of UTC.
const QX::DateTime alertTime(2010, 3, 7, 18, 4, 9, 5, 2);
constexpr const char* alertTimeText = "20100307180409.000005+120";

struct Property
{
    std::string name;
    Value value; // its type is the CMPI type the property must have
};

Value text(const std::string& value)
{
    return Value::string(value);
}

Value number(std::uint64_t value)
{
    return Value::unsignedInt(CMPI_uint16, value);
}

Value when()
{
    return Value::dateTime(alertTimeText);
}

Value noStrings()
{
    return Value::array(CMPI_string, {});
}

std::vector<Property> commonTail()
{
    return {{"SystemCreationClassName", text("ZANKOR_ComputerSystem")},
            {"SystemName", text(QX::getSystemName())},
            {"OwningEntity", text("ZAN")},
            {"ProviderName", text("SELProvider")},
            {"UniqueSystemID", text(QX::make_string(QX::Product::getUid()))}};
}

std::vector<Property> withTail(std::vector<Property> head)
{
    for (Property& property : commonTail())
    {
        head.push_back(std::move(property));
    }
    return head;
}

void expectProperties(const host::Instance& instance,
                      const std::vector<Property>& expected)
{
    ASSERT_EQ(instance.properties.size(), expected.size())
        << "properties: " << ::testing::PrintToString(instance.propertyNames());
    for (std::size_t i = 0; i < expected.size(); ++i)
    {
        const auto& [name, value] = instance.properties[i];
        EXPECT_EQ(name, expected[i].name) << "property " << i + 1;
        EXPECT_EQ(host::typeName(value.type),
                  host::typeName(expected[i].value.type))
            << expected[i].name;
        EXPECT_EQ(value.toString(), expected[i].value.toString())
            << expected[i].name;
    }
}

host::ObjectPath eventPath(const std::string& className)
{
    host::ObjectPath path;
    path.nameSpace = nameSpace;
    path.className = className;
    path.host = QX::getSystemName();
    return path;
}

std::string logElement()
{
    host::ObjectPath path = eventPath("ZAN_MgmtHwLog");
    path.keys.edit().emplace_back("CreationClassName", text("ZAN_MgmtHwLog"));
    path.keys.edit().emplace_back("Name", text("IMPI SEL Log"));
    return path.toString();
}

class IndicationProperties : public IndicationTest
{
  protected:
    /** Subscribes to @p className, enables, raises @p raise and returns
     *  the one indication delivered. */
    template <typename Raise>
    host::DeliveredIndication deliveredAfter(const char* className, Raise raise)
    {
        subscribe(className);
        enable();
        raise();
        auto delivered = next();
        if (!delivered)
        {
            ADD_FAILURE() << "no indication arrived";
            return {};
        }
        settle();
        EXPECT_EQ(inbox->pending(), 0u) << "more than one indication";
        EXPECT_EQ(delivered->nameSpace, nameSpace);
        return *delivered;
    }

    void setLogStatus(unsigned status, std::optional<bool> empty)
    {
        QX::NodeTreeBuilder tree = selTreeWithWatchdog(3);
        tree.setStatus("/bmc0/sel", status);
        if (empty)
        {
            tree.setProperty("/bmc0/sel", IsEmpty, *empty);
        }
        source->replaceTree(tree.build());
    }
};

TEST_F(IndicationProperties, LogEntryEvent)
{
    const auto delivered = deliveredAfter(
        entryEvent,
        [&]
        {
            source->raiseAlert(QX::MemorySource::entryPath("/bmc0/sel", 2),
                               alertTime);
        });
    EXPECT_EQ(delivered.instance.path, eventPath(entryEvent));
    host::ObjectPath element = eventPath("ZAN_MgmtHwLogEntry");
    element.keys = {{"LogCreationClassName", text("ZAN_MgmtHwLog")},
                    {"CreationClassName", text("ZAN_MgmtHwLogEntry")},
                    {"LogName", text("IPMI SEL Log")},
                    {"RecordID", text("2")},
                    {"MessageTimestamp", when()}};
    const std::string description = "Temperature CPU1: asserted";
    const std::string message =
        "A new record was added to the IPMI System Event Log.";
    expectProperties(
        delivered.instance,
        withTail({{"IndicationIdentifier", text(description)},
                  {"EventID", text("LogEntry Creation Event: " + description)},
                  {"IndicationTime", when()},
                  {"EventTime", when()},
                  {"AlertingManagedElement", text(element.toString())},
                  {"CorrelatedIndications", noStrings()},
                  {"Message", text(message)},
                  {"Description", text(message)},
                  {"PerceivedSeverity", number(2)},
                  {"AlertingElementFormat", number(2)},
                  {"AlertType", number(4)},
                  {"ProbableCause", number(1)}}));
}

TEST_F(IndicationProperties, LogClearEvent)
{
    const auto delivered =
        deliveredAfter(clearEvent,
                       [&]
                       {
                           setLogStatus(EventLogStatusCleared, true);
                           source->raiseAlert("/bmc0/sel", alertTime);
                       });
    EXPECT_EQ(delivered.instance.path, eventPath(clearEvent));
    const std::string message = "The IPMI System Event Log was cleared.";
    expectProperties(
        delivered.instance,
        withTail({{"IndicationIdentifier", text("IMPI SEL Log")},
                  {"EventID", text("Log Clear Event: IPMI:/bmc0/sel")},
                  {"AlertingManagedElement", text(logElement())},
                  {"IndicationTime", when()},
                  {"EventTime", when()},
                  {"CorrelatedIndications", noStrings()},
                  {"PerceivedSeverity", number(2)},
                  {"Message", text(message)},
                  {"Description", text(message)},
                  {"AlertingElementFormat", number(2)},
                  {"AlertType", number(5)},
                  {"ProbableCause", number(1)}}));
}

TEST_F(IndicationProperties, LogFullEventAtCriticalFill)
{
    const auto delivered =
        deliveredAfter(fullEvent,
                       [&]
                       {
                           setLogStatus(EventLogStatusFull, std::nullopt);
                           source->raiseAlert("/bmc0/sel", alertTime);
                       });
    EXPECT_EQ(delivered.instance.path, eventPath(fullEvent));
    const std::string message =
        "The IPMI System Event Log is 100 percent full.";
    expectProperties(
        delivered.instance,
        withTail(
            {{"IndicationIdentifier",
              text("IMPI SEL Log Full : IPMI:/bmc0/sel")},
             {"EventID", text("IPMI Log Full Critical Event : IPMI:/bmc0/sel")},
             {"AlertingManagedElement", text(logElement())},
             {"IndicationTime", when()},
             {"EventTime", when()},
             {"CorrelatedIndications", noStrings()},
             {"PerceivedSeverity", number(6)},
             {"Message", text(message)},
             {"Description", text(message)},
             {"AlertingElementFormat", number(2)},
             {"AlertType", number(3)},
             {"ProbableCause", number(1)}}));
}

TEST_F(IndicationProperties, LogFullEventAtWarningFill)
{
    const auto delivered =
        deliveredAfter(fullEvent,
                       [&]
                       {
                           setLogStatus(EventLogStatusAlmostFull, false);
                           source->raiseAlert("/bmc0/sel", alertTime);
                       });
    const host::Instance& instance = delivered.instance;
    EXPECT_EQ(instance.property("EventID")->text(),
              "IPMI Log Full Warning Event : IPMI:/bmc0/sel");
    EXPECT_EQ(instance.property("PerceivedSeverity")->unsignedValue(), 3u);
    EXPECT_EQ(instance.property("Message")->text(),
              "The IPMI System Event Log is 75 percent full.");
    EXPECT_EQ(instance.property("Description")->text(),
              "The IPMI System Event Log is 75 percent full.");
}

TEST_F(IndicationProperties, RestartEventByTheWatchdog)
{
    const auto delivered = deliveredAfter(
        restartEvent, [&] { source->raiseAlert("/bmc0/wdt", alertTime); });
    EXPECT_EQ(delivered.instance.path, eventPath(restartEvent));
    const std::string message =
        "The server was restarted automatically by the hardware watchdog.";
    expectProperties(
        delivered.instance,
        withTail({{"IndicationIdentifier", text("IMPI SEL Log:IPMI:/bmc0/wdt")},
                  {"EventID", text("AutoServerRestart Event : IPMI:/bmc0/wdt")},
                  // The event names itself as the alerting element.
                  {"AlertingManagedElement",
                   text(eventPath(restartEvent).toString())},
                  {"IndicationTime", when()},
                  {"EventTime", when()},
                  {"CorrelatedIndications", noStrings()},
                  {"Message", text(message)},
                  {"Description", text(message)},
                  {"PerceivedSeverity", number(4)},
                  {"AlertingElementFormat", number(2)},
                  {"AlertType", number(3)},
                  {"ProbableCause", number(1)}}));
}

class RestartCauses :
    public IndicationProperties,
    public ::testing::WithParamInterface<int>
{
};

TEST_P(RestartCauses, AnyOtherCauseIsANormalRestart)
{
    const auto delivered = deliveredAfter(
        restartEvent,
        [&]
        {
            source->replaceTree(selTreeWithWatchdog(3, GetParam()).build());
            source->raiseAlert("/bmc0/wdt", alertTime);
        });
    const host::Instance& instance = delivered.instance;
    EXPECT_EQ(instance.property("PerceivedSeverity")->unsignedValue(), 2u);
    EXPECT_EQ(instance.property("Message")->text(),
              "The server was restarted.");
    EXPECT_EQ(instance.property("Description")->text(),
              "The server was restarted.");
}

// 0 and 5 are other causes; -1 leaves RestartCause out, so it cannot be read.
INSTANTIATE_TEST_SUITE_P(ZeroFiveAndUnreadable, RestartCauses,
                         ::testing::Values(0, 5, -1));

TEST_F(IndicationProperties, RecordIdsAreDecimalWithoutPadding)
{
    for (const unsigned id : {0u, 4294967295u})
    {
        QX::NodeTreeBuilder tree = selTreeWithWatchdog(0);
        addEntry(tree, id, "2011-01-02 03:04:05", "");
        source->replaceTree(tree.build());
        if (id == 0)
        {
            subscribe(entryEvent);
            enable();
        }
        source->raiseAlert(QX::MemorySource::entryPath("/bmc0/sel", id),
                           alertTime);
        const auto delivered = next();
        ASSERT_TRUE(delivered.has_value());
        const std::string element(
            delivered->instance.property("AlertingManagedElement")->text());
        EXPECT_NE(element.find("RecordID=\"" + std::to_string(id) + "\""),
                  std::string::npos)
            << element;
        // An empty description leaves the identifier empty and the event
        // id with its trailing blank.
        EXPECT_EQ(delivered->instance.property("IndicationIdentifier")->text(),
                  "");
        EXPECT_EQ(delivered->instance.property("EventID")->text(),
                  "LogEntry Creation Event: ");
        EXPECT_EQ(delivered->instance.property("CorrelatedIndications")
                      ->elements()
                      .size(),
                  0u);
    }
}

TEST_F(IndicationProperties, MessagesFollowTheConfiguredLanguage)
{
    QX::Locale::configureLanguage("de");
    const auto delivered = deliveredAfter(
        restartEvent, [&] { source->raiseAlert("/bmc0/wdt", alertTime); });
    QX::Locale::configureLanguage("");
    EXPECT_EQ(delivered.instance.property("Message")->text(),
              "Der Server wurde vom Hardware-Watchdog automatisch neu "
              "gestartet.");
}

} // namespace
