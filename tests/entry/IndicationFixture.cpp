#include "IndicationFixture.h"

#include "CapturedLines.h"

namespace entry
{

using namespace QX::NodeLexicon;

QX::NodeTreeBuilder selTreeWithWatchdog(unsigned entries, int restartCause)
{
    QX::NodeTreeBuilder tree = selTree(entries);
    tree.addNode(Watchdog, "/bmc0/wdt", "/bmc0", "Watchdog 2", 1);
    if (restartCause >= 0)
    {
        tree.setProperty("/bmc0/wdt", RestartCause,
                         static_cast<unsigned>(restartCause));
    }
    return tree;
}

void WatchdogSourceTest::SetUp()
{
    CVLog::CVLogger::setSink(nullptr);
    source = std::make_shared<QX::MemorySource>(selTreeWithWatchdog(3).build());
    QX::Platform::overrideSource(source);
}

void WatchdogSourceTest::TearDown()
{
    EXPECT_TRUE(source->waitForAlerts(patience));
    host_.reset();
    QX::Platform::overrideSource(nullptr);
}

void IndicationTest::SetUp()
{
    ProviderTest::SetUp();
    capture = std::make_shared<testsupport::CaptureSink>();
    CVLog::CVLogger::setSink(capture);
    CVLog::LoggerSettings everything;
    everything.logLevel = 1;
    everything.traceLevel = 1;
    CVLog::CVLogger::configure(everything);
    install(selTreeWithWatchdog(3));
    inbox = std::make_unique<host::IndicationInbox>(host().listen(nameSpace));
}

void IndicationTest::TearDown()
{
    settle();
    ProviderTest::TearDown();
    CVLog::CVLogger::setSink(nullptr);
    CVLog::CVLogger::configure(CVLog::LoggerSettings{});
}

void IndicationTest::subscribe(const std::string& className,
                               bool firstActivation)
{
    const auto filter = host::IndicationFilter::forClass(className);
    ASSERT_EQ(host().authorizeFilter(filter, "root").rc, CMPI_RC_OK);
    ASSERT_EQ(host().mustPoll(filter).rc, CMPI_RC_OK);
    ASSERT_EQ(host().activateFilter(filter, firstActivation).rc, CMPI_RC_OK);
}

void IndicationTest::unsubscribeLikeSfcb(const std::string& className)
{
    ASSERT_EQ(host().disableIndications().rc, CMPI_RC_OK);
    host::ObjectPath noClass;
    noClass.nameSpace = nameSpace;
    const auto filter = host::IndicationFilter::forClass(className);
    ASSERT_EQ(host().deActivateFilter(filter, true, &noClass).rc, CMPI_RC_OK);
}

void IndicationTest::enable()
{
    ASSERT_EQ(host().enableIndications().rc, CMPI_RC_OK);
}

std::optional<host::DeliveredIndication> IndicationTest::next()
{
    return inbox->next(patience);
}

void IndicationTest::settle()
{
    if (source)
    {
        EXPECT_TRUE(source->waitForAlerts(patience));
    }
    EXPECT_TRUE(broker().waitForThreads(patience));
}

std::vector<CVLog::LogRecord>
IndicationTest::linesWith(const std::string& text) const
{
    return testsupport::recordsContaining(*capture, text);
}

} // namespace entry
