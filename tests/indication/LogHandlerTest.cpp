// LogHandler's choice of event, through a log reader the test controls:
// "IsEmpty" brings the clear event, any other condition, the empty one
// included, the full event with all its properties.
#include "Broker.h"
#include "CVLogger.h"
#include "Indication.h"
#include "Resources.h"
#include "SELIndication.h"
#include "Support.h"

#include <chrono>
#include <memory>
#include <optional>
#include <string>

#include <gtest/gtest.h>

namespace
{

using namespace QX::SELComposite;

/** What the reader below answers. */
struct LogReading
{
    bool found = true;
    std::string condition;
};

LogReading reading;
std::string readPath;

bool readLog(std::string nodePath, std::string& logPath, std::string& condition)
{
    readPath = nodePath;
    logPath = "IPMI:" + nodePath;
    condition = reading.condition;
    return reading.found;
}

const QX::DateTime alertTime(2024, 1, 2, 3, 4, 5, 6, 0);

class LogHandlerTest : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        previousSink_ = CVLog::CVLogger::setSink(nullptr);
        QX::Locale::configureLanguage("en");
        const CMPIBroker* cmpi = broker.cmpi();
        saveSELIndicationContext(
            cmpi, cmpi->bft->prepareAttachThread(cmpi, request.context()));
    }
    void TearDown() override
    {
        clearSELIndicationContext();
        QX::Locale::configureLanguage("");
        CVLog::CVLogger::setSink(previousSink_);
    }

    /** LogHandler on the log node, with the reader answering @p answer;
     *  what it delivered, if anything. */
    std::optional<host::DeliveredIndication> handle(const LogReading& answer)
    {
        reading = answer;
        readPath.clear();
        handleLogAlert(alertTime, "/bmc0/sel", &readLog);
        EXPECT_EQ(readPath, "/bmc0/sel");
        auto delivered = inbox.next(std::chrono::milliseconds(0));
        EXPECT_EQ(inbox.pending(), 0u);
        return delivered;
    }

    host::Broker broker;
    host::IndicationInbox inbox = broker.listen("root/zanqx");
    host::Broker::Request request{broker};

  private:
    std::shared_ptr<CVLog::LogSink> previousSink_;
};

class OtherConditions :
    public LogHandlerTest,
    public ::testing::WithParamInterface<const char*>
{
};

TEST_P(OtherConditions, BringTheFullEventAtItsLowest)
{
    const std::string condition = GetParam();
    const auto delivered = handle({true, condition});
    ASSERT_TRUE(delivered.has_value());
    EXPECT_EQ(delivered->nameSpace, "root/zanqx");
    const host::Instance& event = delivered->instance;
    EXPECT_EQ(event.path.className, LOG_FULL_EVENT_CLASS);
    const auto text = [&](const char* name)
    {
        const auto* property = event.property(name);
        return property != nullptr ? property->text() : "(missing)";
    };
    const auto number = [&](const char* name)
    {
        const auto* property = event.property(name);
        return property != nullptr ? property->unsignedValue() : 999u;
    };
    EXPECT_EQ(text("IndicationIdentifier"),
              "IMPI SEL Log Full : IPMI:/bmc0/sel");
    EXPECT_EQ(text("EventID"),
              "IPMI Log Full " + condition + " Event : IPMI:/bmc0/sel");
    EXPECT_NE(text("AlertingManagedElement").find("ZAN_MgmtHwLog"),
              std::string::npos);
    EXPECT_NE(text("AlertingManagedElement").find("IMPI SEL Log"),
              std::string::npos);
    EXPECT_EQ(text("IndicationTime"), "20240102030405.000006+000");
    EXPECT_EQ(text("EventTime"), "20240102030405.000006+000");
    EXPECT_EQ(number("PerceivedSeverity"), 2u);
    EXPECT_EQ(text("Message"), "The IPMI System Event Log is 0 percent full.");
    EXPECT_EQ(text("Description"), text("Message"));
    EXPECT_EQ(number("AlertingElementFormat"), 2u);
    EXPECT_EQ(number("AlertType"), 3u);
    EXPECT_EQ(number("ProbableCause"), 1u);
    EXPECT_EQ(text("SystemCreationClassName"), "ZANKOR_ComputerSystem");
    EXPECT_EQ(text("SystemName"), QX::getSystemName());
    EXPECT_EQ(text("OwningEntity"), "ZAN");
    EXPECT_EQ(text("ProviderName"), "SELProvider");
    EXPECT_FALSE(text("UniqueSystemID").empty());
    ASSERT_NE(event.property("CorrelatedIndications"), nullptr);
    EXPECT_EQ(event.propertyNames().size(), 17u);
}

// Empty, unknown, and near misses of the three conditions the hardware
// read gives.
INSTANTIATE_TEST_SUITE_P(EmptyAndUnknown, OtherConditions,
                         ::testing::Values("", "Unknown", "isempty", "IsEmpty ",
                                           "warning"));

TEST_F(LogHandlerTest, IsEmptyBringsTheClearEvent)
{
    const auto delivered = handle({true, "IsEmpty"});
    ASSERT_TRUE(delivered.has_value());
    EXPECT_EQ(delivered->instance.path.className, LOG_CLEAR_EVENT_CLASS);
}

TEST_F(LogHandlerTest, NothingIsDeliveredWhenTheReaderFindsNothing)
{
    EXPECT_FALSE(handle({false, ""}).has_value());
    EXPECT_FALSE(handle({false, "Critical"}).has_value());
}

} // namespace
