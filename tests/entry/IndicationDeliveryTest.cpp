// Alert threads and dispatch through the loaded library: what starts a
// delivery thread, what each failure leaves behind, and what arrives.
#include "IndicationFixture.h"

#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace
{

using namespace entry;
using namespace QX::NodeLexicon;
using host::BrokerCall;
using host::FaultMode;

class IndicationDelivery : public IndicationTest
{
  protected:
    void subscribeAllAndEnable()
    {
        for (const char* className :
             {entryEvent, clearEvent, fullEvent, restartEvent})
        {
            subscribe(className);
        }
        enable();
    }

    std::string entryPath(unsigned id) const
    {
        return QX::MemorySource::entryPath("/bmc0/sel", id);
    }

    unsigned calls(BrokerCall call)
    {
        return broker().faults().calls(call);
    }

    /** Calls ClearLog on the log, as a client does. */
    host::Outcome clearLog()
    {
        host::ObjectPath log = classPath("ZAN_MgmtHwLog");
        log.keys.edit().emplace_back("CreationClassName",
                                     host::Value::string("ZAN_MgmtHwLog"));
        log.keys.edit().emplace_back("Name",
                                     host::Value::string("IPMI SEL Log"));
        return host().invokeMethod(log, "ClearLog");
    }
};

TEST_F(IndicationDelivery, AFailedHardwareReadIsAFailureInTheLog)
{
    subscribe(restartEvent);
    enable();
    source->armFault({QX::CursorOperation::SelectPath, 0, false, "BMC gone"});
    ::testing::internal::CaptureStderr();
    source->raiseAlert("/bmc0/wdt", alertTime);
    settle();
    const std::string written = ::testing::internal::GetCapturedStderr();
    EXPECT_NE(written.find("BMC gone"), std::string::npos) << written;
    unsigned logged = 0;
    for (const auto& line : linesWith("BMC gone"))
    {
        EXPECT_EQ(line.level, 6000);
        EXPECT_EQ(line.component, "Corvane.SELProvider");
        EXPECT_EQ(line.function, "getAutoServerInstrumentation");
        logged += line.channel == CVLog::Channel::Log ? 1 : 0;
    }
    EXPECT_EQ(logged, 1u);
    EXPECT_EQ(calls(BrokerCall::DeliverIndication), 0u);
}

TEST_F(IndicationDelivery, AlertsWhileDisabledStartNoThread)
{
    subscribe(entryEvent);
    subscribe(restartEvent);
    source->raiseAlert(entryPath(1), alertTime);
    source->raiseAlert("/bmc0/wdt", alertTime);
    settle();
    EXPECT_EQ(calls(BrokerCall::NewThread), 0u);
    EXPECT_EQ(inbox->pending(), 0u);
    enable();
    ASSERT_EQ(host().disableIndications().rc, CMPI_RC_OK);
    // Disabling stopped the watches whose counters were at 1.
    EXPECT_EQ(source->monitorCount(EventLogEntry), 0u);
    EXPECT_EQ(source->monitorCount(Watchdog), 0u);
}

TEST_F(IndicationDelivery, ARecordUnderAnotherLogIsNotDelivered)
{
    QX::NodeTreeBuilder tree = selTreeWithWatchdog(2);
    tree.addNode(EventLog, "/bmc0/other", "/bmc0", "Other log", 1);
    tree.addNode(EventLogEntry, "/bmc0/other/entry-00001", "/bmc0/other",
                 "elsewhere", 1);
    tree.setProperty("/bmc0/other/entry-00001", RecordId, 1u);
    source->replaceTree(tree.build());
    subscribe(entryEvent);
    enable();
    source->raiseAlert("/bmc0/other/entry-00001", alertTime);
    settle();
    EXPECT_EQ(calls(BrokerCall::NewThread), 1u); // the thread found nothing
    EXPECT_EQ(calls(BrokerCall::DeliverIndication), 0u);
    EXPECT_EQ(inbox->pending(), 0u);
}

TEST_F(IndicationDelivery, ALogAlertWithoutClearOrFillSendsNothing)
{
    subscribe(clearEvent);
    enable();
    // The thread reads the log when it runs: each tree stays until then.
    for (const auto& [status, empty] :
         std::vector<std::pair<unsigned, bool>>{{14, false}, {1, true}})
    {
        QX::NodeTreeBuilder tree = selTreeWithWatchdog(1);
        tree.setStatus("/bmc0/sel", status);
        tree.setProperty("/bmc0/sel", IsEmpty, empty);
        source->replaceTree(tree.build());
        source->raiseAlert("/bmc0/sel", alertTime);
        settle();
    }
    QX::NodeTreeBuilder unreadable = selTreeWithWatchdog(1);
    unreadable.setStatus("/bmc0/sel", 14);
    source->replaceTree(unreadable.build());
    source->raiseAlert("/bmc0/sel", alertTime);
    settle();
    EXPECT_EQ(calls(BrokerCall::DeliverIndication), 0u);
    EXPECT_EQ(inbox->pending(), 0u);
    const auto unread = linesWith("Failed while reading Empty property.");
    ASSERT_EQ(unread.size(), 2u); // log and trace
    EXPECT_EQ(unread[0].level, 6000);
    EXPECT_EQ(unread[0].function, "getLogInstrumentation");
}

TEST_F(IndicationDelivery, AlertsOneAfterAnotherAreEachDeliveredInOrder)
{
    subscribe(entryEvent);
    enable();
    // A BMC adds several records between two polls: one alert after the
    // other on the source's one thread.
    std::vector<std::string> expected;
    for (unsigned id = 100; id < 130; ++id)
    {
        source->appendEntry("/bmc0/sel", id, "2024-05-06 07:08:09", "",
                            "record " + std::to_string(id));
        expected.push_back("record " + std::to_string(id));
    }
    std::vector<std::string> delivered;
    for (std::size_t i = 0; i < expected.size(); ++i)
    {
        const auto indication = next();
        ASSERT_TRUE(indication.has_value()) << "after " << i;
        delivered.emplace_back(
            indication->instance.property("IndicationIdentifier")->text());
    }
    settle();
    EXPECT_EQ(delivered, expected);
    EXPECT_EQ(inbox->pending(), 0u);
}

TEST_F(IndicationDelivery, ClearLogBringsTheClearEvent)
{
    subscribe(clearEvent);
    enable();
    const host::Outcome cleared = clearLog();
    ASSERT_EQ(cleared.rc, CMPI_RC_OK);
    const auto delivered = next();
    ASSERT_TRUE(delivered.has_value());
    EXPECT_EQ(delivered->instance.path.className, clearEvent);
    EXPECT_EQ(delivered->instance.property("EventID")->text(),
              "Log Clear Event: IPMI:/bmc0/sel");
}

TEST_F(IndicationDelivery, TheFiveSimulatedAlertsBringTheirEvents)
{
    subscribeAllAndEnable();
    const std::vector<std::pair<QX::SimulatedAlert, std::string>> cases = {
        {QX::SimulatedAlert::RecordAdded, entryEvent},
        {QX::SimulatedAlert::LogCleared, clearEvent},
        {QX::SimulatedAlert::LogAlmostFull, fullEvent},
        {QX::SimulatedAlert::LogFull, fullEvent},
        {QX::SimulatedAlert::WatchdogRestart, restartEvent}};
    for (const auto& [alert, className] : cases)
    {
        source->raiseSimulatedAlert(alert);
        const auto delivered = next();
        ASSERT_TRUE(delivered.has_value()) << QX::simulatedAlertName(alert);
        EXPECT_EQ(delivered->instance.path.className, className);
    }
}

TEST_F(IndicationDelivery, DeliveryThreadsAttachAndFreeWhatTheyMade)
{
    subscribe(entryEvent);
    enable();
    for (int i = 0; i < 5; ++i)
    {
        source->raiseAlert(entryPath(1), alertTime);
        ASSERT_TRUE(next().has_value());
    }
    settle();
    // Every object was made on a request or an attached thread and freed
    // with it; only the context saved at activation stays.
    EXPECT_EQ(broker().brokerOwnedObjects(), 0u);
    EXPECT_EQ(broker().outstandingPreparedContexts(), 1u);
    // Per alert: one prepared context for the handler, one for the thread.
    EXPECT_EQ(calls(BrokerCall::PrepareAttachThread), 1u + 5 * 2);
    EXPECT_EQ(calls(BrokerCall::AttachThread), 5u * 2);
    EXPECT_EQ(calls(BrokerCall::DetachThread), 5u * 2);
}

TEST_F(IndicationDelivery, AFailedAttachBuildsNothingAndDoesNotDetach)
{
    subscribe(entryEvent);
    enable();
    // The handler's own attach is the first; the thread's the second.
    broker().faults().fail(BrokerCall::AttachThread, FaultMode::ReturnNull, 1);
    source->raiseAlert(entryPath(1), alertTime);
    settle();
    EXPECT_EQ(calls(BrokerCall::AttachThread), 2u);
    EXPECT_EQ(calls(BrokerCall::NewObjectPath), 0u);
    EXPECT_EQ(calls(BrokerCall::DetachThread), 1u); // the handler's only
    EXPECT_EQ(inbox->pending(), 0u);
}

TEST_F(IndicationDelivery, AFailedPrepareForTheThreadAttachesNothing)
{
    subscribe(entryEvent);
    enable();
    // Prepared at activation, then (counted from here) by the handler and
    // by the thread.
    broker().faults().fail(BrokerCall::PrepareAttachThread,
                           FaultMode::ReturnNull, 1);
    source->raiseAlert(entryPath(1), alertTime);
    settle();
    EXPECT_EQ(calls(BrokerCall::PrepareAttachThread), 3u);
    EXPECT_EQ(calls(BrokerCall::AttachThread), 1u);
    EXPECT_EQ(inbox->pending(), 0u);
}

TEST_F(IndicationDelivery, AnEventPathThatCannotBeMadeIsTraced)
{
    subscribe(entryEvent);
    enable();
    broker().faults().fail(BrokerCall::NewObjectPath);
    source->raiseAlert(entryPath(1), alertTime);
    settle();
    EXPECT_EQ(inbox->pending(), 0u);
    EXPECT_EQ(calls(BrokerCall::DeliverIndication), 0u);
    EXPECT_EQ(calls(BrokerCall::DetachThread), 2u); // the thread detached
    const auto failed = linesWith("Failed to create ObjectPath");
    ASSERT_EQ(failed.size(), 2u);
    EXPECT_EQ(failed[0].message, "MESSAGE [File: SELIndication.cpp, Line: " +
                                     std::to_string(failed[0].line) +
                                     "]: Failed to create ObjectPath");
    EXPECT_EQ(failed[0].level, 6000);
    EXPECT_EQ(failed[0].function, "createLogEntryIndicationInstance");
}

TEST_F(IndicationDelivery, AnAlertingElementPathThatCannotBeMadeAbandons)
{
    subscribe(entryEvent);
    subscribe(clearEvent);
    enable();
    broker().faults().fail(BrokerCall::NewObjectPath, FaultMode::NullHandle, 1);
    source->raiseAlert(entryPath(1), alertTime);
    settle();
    EXPECT_EQ(inbox->pending(), 0u);
    const auto failed =
        linesWith("Failed to create ObjectPath for Alerting Managed Element");
    ASSERT_EQ(failed.size(), 2u);
    EXPECT_EQ(failed[0].level, 6000);
    EXPECT_TRUE(
        linesWith("Success to create ObjectPath for Alerting Managed Element")
            .empty());
}

TEST_F(IndicationDelivery, AFailedDeliveryGoesToTheBrokersTrace)
{
    subscribe(restartEvent);
    enable();
    broker().faults().fail(BrokerCall::DeliverIndication);
    source->raiseAlert("/bmc0/wdt", alertTime);
    settle();
    EXPECT_EQ(inbox->pending(), 0u);
    const auto traces = broker().traces();
    ASSERT_EQ(traces.size(), 1u);
    EXPECT_EQ(traces[0].level, CMPI_LEV_INFO);
    EXPECT_EQ(traces[0].component, "SELProvider");
    EXPECT_EQ(traces[0].text, "Could not send the Indication");
    EXPECT_FALSE(traces[0].string.has_value());
    // Both delivery lines are written, failure or not.
    EXPECT_EQ(linesWith("AutoServerRestartHandler : Calling CB Deliver "
                        "Indication ")
                  .size(),
              2u);
    EXPECT_EQ(linesWith("AutoServerRestartHandler : CB Deliver Indication done")
                  .size(),
              2u);
    EXPECT_EQ(calls(BrokerCall::DetachThread), 2u);
}

TEST_F(IndicationDelivery, AThreadThatCannotBeStartedIsLoggedAndDropped)
{
    subscribe(entryEvent);
    enable();
    broker().faults().fail(BrokerCall::NewThread);
    source->raiseAlert(entryPath(1), alertTime);
    settle();
    EXPECT_EQ(inbox->pending(), 0u);
    const auto failed = linesWith("Error creating thread");
    ASSERT_EQ(failed.size(), 2u);
    for (const auto& line : failed)
    {
        EXPECT_EQ(line.level, 6000);
        EXPECT_EQ(line.function, "LogEntryAlertHandler");
        EXPECT_EQ(line.file, "SELIndication.cpp");
    }
    EXPECT_EQ(failed[0].channel, CVLog::Channel::Log);
    EXPECT_EQ(failed[1].channel, CVLog::Channel::Trace);
    // The dropped alert left the hand-over free: the next one, with its
    // own data, arrives at once.
    source->raiseAlert(entryPath(2), alertTime);
    const auto delivered = next();
    ASSERT_TRUE(delivered.has_value());
    EXPECT_NE(delivered->instance.property("AlertingManagedElement")
                  ->text()
                  .find("RecordID=\"2\""),
              std::string::npos);
}

TEST_F(IndicationDelivery, ProgressNotesAndDeliveryLinesHaveTheirLevels)
{
    subscribe(entryEvent);
    subscribe(fullEvent);
    enable();
    source->raiseAlert(entryPath(1), alertTime);
    ASSERT_TRUE(next().has_value());
    settle();
    for (const char* note :
         {"Success to create ObjectPath for Alerting Managed Element",
          "Before NLS"})
    {
        const auto lines = linesWith(note);
        ASSERT_EQ(lines.size(), 2u) << note;
        EXPECT_EQ(lines[0].level, 3000) << note;
        EXPECT_EQ(lines[1].level, 3000) << note;
    }
    EXPECT_EQ(linesWith("LogEntryHandler : Calling CB Deliver Indication ")
                  .at(0)
                  .level,
              4000);
    capture->clear();
    QX::NodeTreeBuilder tree = selTreeWithWatchdog(1);
    tree.setStatus("/bmc0/sel", EventLogStatusFull);
    source->replaceTree(tree.build());
    source->raiseAlert("/bmc0/sel", alertTime);
    ASSERT_TRUE(next().has_value());
    settle();
    for (const char* note :
         {"Before creatin objectPAth for LOG class",
          "success creatin objectPAth for LOG class", "Before NLS"})
    {
        const auto lines = linesWith(note);
        ASSERT_EQ(lines.size(), 2u) << note;
        EXPECT_EQ(lines[0].level, 4000) << note;
    }
    const auto condition = linesWith("VARIABLE: 'message' has Value "
                                     "'Critical'");
    EXPECT_EQ(condition.size(), 2u);
    EXPECT_EQ(linesWith("VARIABLE: 'newStatus' has Value '24'").size(), 2u);
    EXPECT_EQ(linesWith("VARIABLE: 'indicationClass' has Value '0'").size(),
              2u);
}

TEST_F(IndicationDelivery, OnlyTheEntryAndFullEventsNoteBeforeNls)
{
    subscribe(clearEvent);
    subscribe(restartEvent);
    enable();
    ASSERT_EQ(clearLog().rc, CMPI_RC_OK);
    const auto cleared = next();
    ASSERT_TRUE(cleared.has_value());
    EXPECT_EQ(cleared->instance.path.className, clearEvent);
    source->raiseAlert("/bmc0/wdt", alertTime);
    const auto restarted = next();
    ASSERT_TRUE(restarted.has_value());
    EXPECT_EQ(restarted->instance.path.className, restartEvent);
    settle();
    // Both messages were looked up, without the note.
    EXPECT_FALSE(cleared->instance.property("Message")->text().empty());
    EXPECT_FALSE(restarted->instance.property("Message")->text().empty());
    EXPECT_TRUE(linesWith("Before NLS").empty());
    EXPECT_EQ(linesWith("LogHandler : CB Deliver Indication done").size(), 2u);
    EXPECT_EQ(linesWith("AutoServerRestartHandler : CB Deliver Indication "
                        "done")
                  .size(),
              2u);
}

} // namespace
