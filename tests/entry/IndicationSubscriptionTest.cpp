// The indication MI's operations through the loaded library, in the call
// orders of the two object managers it runs in.
#include "IndicationFixture.h"
#include "SelClasses.h"

#include <gtest/gtest.h>

namespace
{

using namespace entry;
using namespace QX::NodeLexicon;
using host::BrokerCall;
using host::FaultMode;

class IndicationSubscription : public IndicationTest
{
  protected:
    unsigned calls(BrokerCall call)
    {
        return broker().faults().calls(call);
    }
    std::size_t watches() const
    {
        return source->monitorCount(EventLog) +
               source->monitorCount(EventLogEntry) +
               source->monitorCount(Watchdog);
    }
    void raiseEntry()
    {
        source->raiseAlert(QX::MemorySource::entryPath("/bmc0/sel", 1),
                           alertTime);
    }
};

TEST_F(IndicationSubscription, AnUnknownClassIsAcceptedAndIgnored)
{
    for (const char* className : {"ZAN_MgmtHwLogEntryEvent ",
                                  "zan_MgmtHwLogEntryEvent", "CIM_Alert", ""})
    {
        const auto filter = selclasses::filterFor(className);
        const host::Outcome outcome = host().activateFilter(filter, true);
        EXPECT_EQ(outcome.rc, CMPI_RC_OK) << className;
        EXPECT_FALSE(outcome.message.has_value());
    }
    EXPECT_EQ(calls(BrokerCall::PrepareAttachThread), 0u);
    EXPECT_EQ(watches(), 0u);
    enable();
    raiseEntry();
    settle();
    EXPECT_EQ(calls(BrokerCall::NewThread), 0u);
}

TEST_F(IndicationSubscription, EveryActivationSavesAContextAndCounts)
{
    subscribe(entryEvent);
    subscribe(entryEvent, false);
    EXPECT_EQ(calls(BrokerCall::PrepareAttachThread), 2u);
    EXPECT_EQ(source->monitorCount(EventLogEntry), 1u);
    // Two subscribers: disabling leaves the watch running.
    ASSERT_EQ(host().disableIndications().rc, CMPI_RC_OK);
    EXPECT_EQ(source->monitorCount(EventLogEntry), 1u);
}

TEST_F(IndicationSubscription, DeactivationKeepsTheSavedContext)
{
    subscribe(entryEvent);
    const auto filter = selclasses::filterFor(entryEvent);
    ASSERT_EQ(host().deActivateFilter(filter, true).rc, CMPI_RC_OK);
    ASSERT_EQ(host().deActivateFilter(filter, true).rc, CMPI_RC_OK);
    EXPECT_EQ(calls(BrokerCall::PrepareAttachThread), 1u);
    // The counter stays at 1, so the watch and the context stay too.
    EXPECT_EQ(source->monitorCount(EventLogEntry), 1u);
    enable();
    raiseEntry();
    EXPECT_TRUE(next().has_value());
}

TEST_F(IndicationSubscription, EnableAndDisableAlwaysSucceed)
{
    for (int round = 0; round < 3; ++round)
    {
        const host::Outcome disabled = host().disableIndications();
        EXPECT_EQ(disabled.rc, CMPI_RC_OK);
        EXPECT_FALSE(disabled.message.has_value());
        const host::Outcome enabled = host().enableIndications();
        EXPECT_EQ(enabled.rc, CMPI_RC_OK);
        EXPECT_FALSE(enabled.message.has_value());
    }
}

TEST_F(IndicationSubscription, ActivationLogsTheClassNameInTheProviderUnit)
{
    subscribe(clearEvent);
    const auto lines =
        linesWith("VARIABLE: 'className' has Value 'ZAN_MgmtHwLogClearEvent'");
    ASSERT_EQ(lines.size(), 2u);
    EXPECT_EQ(lines[0].function, "SEL_ActivateFilter");
    EXPECT_EQ(lines[0].file, "SELProvider.cpp");
    EXPECT_EQ(lines[0].level, 4000);
    EXPECT_EQ(lines[0].component, "Corvane.SELProvider");
    EXPECT_EQ(
        linesWith("ENTERING: SEL_ActivateFilter() in SELProvider.cpp").size(),
        2u);
    EXPECT_EQ(
        linesWith("EXITING: SEL_ActivateFilter() in SELProvider.cpp").size(),
        2u);
    // Only the log clear counter is traced.
    const auto counter =
        linesWith("VARIABLE: 'subscriberCountLogClearIndication' has Value "
                  "'1'");
    ASSERT_EQ(counter.size(), 2u);
    EXPECT_EQ(counter[0].file, "SELIndication.cpp");
    subscribe(fullEvent);
    EXPECT_EQ(linesWith("'subscriberCount").size(), 2u);
    // Log clear and log full share one watch.
    EXPECT_EQ(source->monitorCount(EventLog), 1u);
    enable();
    EXPECT_EQ(linesWith("VARIABLE: '_enabledSEL' has Value '1'").size(), 2u);
}

TEST_F(IndicationSubscription, AFailingClassNameQueryReportsItsStatus)
{
    // Both queries report into the operation's status: the last one's
    // answer is what is returned.
    broker().faults().fail(BrokerCall::GetCharPtr, FaultMode::FailStatus);
    const auto filter = selclasses::filterFor(restartEvent);
    const host::Outcome outcome = host().activateFilter(filter, true);
    EXPECT_EQ(outcome.rc, CMPI_RC_ERR_FAILED);
    // It went on with the class name it got.
    EXPECT_EQ(source->monitorCount(Watchdog), 1u);
}

TEST_F(IndicationSubscription, SfcbSubscribesAndDeletesInItsOrder)
{
    // New subscription: authorizeFilter, mustPoll, activateFilter, then
    // enableIndications.
    subscribe(clearEvent);
    enable();
    source->raiseSimulatedAlert(QX::SimulatedAlert::LogCleared);
    const auto delivered = next();
    ASSERT_TRUE(delivered.has_value());
    EXPECT_EQ(delivered->instance.path.className, clearEvent);
    settle();
    // Deletion: disableIndications, then deActivateFilter with a class
    // path whose class name is empty.
    unsubscribeLikeSfcb(clearEvent);
    EXPECT_EQ(source->monitorCount(EventLog), 0u);
    const unsigned threads = calls(BrokerCall::NewThread);
    source->raiseSimulatedAlert(QX::SimulatedAlert::LogCleared);
    settle();
    EXPECT_EQ(calls(BrokerCall::NewThread), threads);
    EXPECT_EQ(inbox->pending(), 0u);
    // The log entry class starts over when subscribed again ...
    subscribe(entryEvent);
    enable();
    source->raiseSimulatedAlert(QX::SimulatedAlert::RecordAdded);
    EXPECT_TRUE(next().has_value());
    // ... the log clear class does not: disabling took the log full
    // counter from 0 to 4294967295, and the shared log watch starts only
    // while that counter is 0.
    subscribe(clearEvent);
    EXPECT_EQ(source->monitorCount(EventLog), 0u);
}

/** OpenPegasus: each MI gets a broker pointer of its own. */
class PegasusOrder : public WatchdogSourceTest
{
  protected:
    void SetUp() override
    {
        WatchdogSourceTest::SetUp();
        host::HostOptions options = selclasses::hostOptions(SELPROV_LIBRARY);
        options.brokerPerMI = true;
        host_ = std::make_unique<host::Host>(std::move(options));
    }
};

TEST_F(PegasusOrder, NoAuthorizationFirstAndLastAlwaysTrue)
{
    ASSERT_NE(host_->instanceBroker(), host_->indicationBroker());
    ASSERT_NE(host_->methodBroker(), host_->indicationBroker());
    host::IndicationInbox inbox = host_->listen(nameSpace);
    // Two filters on one class, each activated as the first.
    auto entries = selclasses::filterFor(entryEvent);
    auto severe = entries;
    severe.query += " WHERE PerceivedSeverity > 2";
    ASSERT_EQ(host_->activateFilter(entries, true).rc, CMPI_RC_OK);
    ASSERT_EQ(host_->activateFilter(severe, true).rc, CMPI_RC_OK);
    ASSERT_EQ(host_->enableIndications().rc, CMPI_RC_OK);
    // Instance requests keep working on the instance MI's broker.
    EXPECT_EQ(host_->enumerateInstanceNames(classPath("ZAN_MgmtHwLogEntry")).rc,
              CMPI_RC_OK);
    source->raiseAlert(QX::MemorySource::entryPath("/bmc0/sel", 3), alertTime);
    const auto delivered = inbox.next(patience);
    ASSERT_TRUE(delivered.has_value());
    // Delivered through the broker saved at activation: the one held when
    // the filters were activated, the factory called last.
    EXPECT_EQ(delivered->broker, host_->indicationBroker());
    // Each deactivation is the last one.
    ASSERT_EQ(host_->deActivateFilter(severe, true).rc, CMPI_RC_OK);
    ASSERT_EQ(host_->deActivateFilter(entries, true).rc, CMPI_RC_OK);
    ASSERT_EQ(host_->disableIndications().rc, CMPI_RC_OK);
    // The clamp kept the counter at 1, so disabling stopped the watch.
    EXPECT_EQ(source->monitorCount(EventLogEntry), 0u);
    EXPECT_TRUE(host_->broker().waitForThreads(patience));
}

} // namespace
