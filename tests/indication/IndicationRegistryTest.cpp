// The subscription registry and the alert handlers, called directly: the
// counters, the watches they start and stop, and the saved context.
#include "Broker.h"
#include "Indication.h"
#include "PlatformFixture.h"
#include "SELIndication.h"
#include "SelClasses.h"

#include <chrono>
#include <cstdint>
#include <mutex>
#include <vector>

#include <gtest/gtest.h>

namespace
{

using namespace QX::SELComposite;
using namespace QX::NodeLexicon;

/** The indication state as this program found it before any test ran. */
struct LoadState
{
    std::uint32_t counters[4];
    bool enabled;
    bool available;
    const CMPIBroker* broker;
    const CMPIContext* context;
    CMPI_THREAD_TYPE threads[3];
};

const LoadState atLoad{{subscriberCountServerIndication.load(),
                        subscriberCountLogEntryIndication.load(),
                        subscriberCountLogFullIndication.load(),
                        subscriberCountLogClearIndication.load()},
                       _enabledSEL.load(),
                       _alertSELContextAvailable.load(),
                       _alertSELBroker.load(),
                       _alertSELContext.load(),
                       {ind_thread_id_server.load(), ind_thread_id_log.load(),
                        ind_thread_id_entry.load()}};

TEST(IndicationState, EverythingIsZeroAtLoad)
{
    for (const std::uint32_t counter : atLoad.counters)
    {
        EXPECT_EQ(counter, 0u);
    }
    EXPECT_FALSE(atLoad.enabled);
    EXPECT_FALSE(atLoad.available);
    EXPECT_EQ(atLoad.broker, nullptr);
    EXPECT_EQ(atLoad.context, nullptr);
    for (const CMPI_THREAD_TYPE thread : atLoad.threads)
    {
        EXPECT_EQ(thread, nullptr);
    }
    EXPECT_EQ(loggerSELIndication, "Corvane.SELProvider");
    EXPECT_FALSE(indicationSELData.isFull());
}

/** A memory source that counts the monitoring calls it gets. */
class CountingSource : public QX::MemorySource
{
  public:
    using MemorySource::MemorySource;

    struct Call
    {
        bool start;
        NodeType kind;
        QX::MonitorCallback callback;
        const void* context;
    };

    void startMonitoring(NodeType kind, QX::MonitorCallback callback,
                         const void* context) override
    {
        record(Call{true, kind, callback, context});
        MemorySource::startMonitoring(kind, callback, context);
    }
    void stopMonitoring(NodeType kind, QX::MonitorCallback callback,
                        const void* context) override
    {
        record(Call{false, kind, callback, context});
        MemorySource::stopMonitoring(kind, callback, context);
    }

    std::vector<Call> calls() const
    {
        const std::lock_guard lock(mutex_);
        return calls_;
    }
    unsigned count(bool start, NodeType kind) const
    {
        unsigned n = 0;
        for (const Call& call : calls())
        {
            n += call.start == start && call.kind == kind ? 1 : 0;
        }
        return n;
    }

  private:
    void record(const Call& call)
    {
        const std::lock_guard lock(mutex_);
        calls_.push_back(call);
    }

    mutable std::mutex mutex_;
    std::vector<Call> calls_;
};

class Registry : public testsupport::PlatformTest
{
  protected:
    void SetUp() override
    {
        PlatformTest::SetUp();
        resetState();
        auto tree = testsupport::standardTree(3);
        tree.addNode(Watchdog, "/bmc0/wdt", "/bmc0", "Watchdog", 1)
            .setProperty("/bmc0/wdt", RestartCause, 4u);
        counting = std::make_shared<CountingSource>(tree.build());
        QX::Platform::overrideSource(counting);
    }
    void TearDown() override
    {
        EXPECT_TRUE(counting->waitForAlerts(std::chrono::seconds(10)));
        EXPECT_TRUE(awaitIndicationThreads(std::chrono::seconds(10)));
        indicationWatches.releaseAll();
        resetState();
        PlatformTest::TearDown();
    }

    /** Every start (or, with @p start false, every stop) of a watch went
     *  to the log alert handler, without a context. */
    void expectLogHandlerOnEvery(bool start) const
    {
        for (const auto& call : counting->calls())
        {
            if (call.start == start)
            {
                EXPECT_EQ(call.callback, &LogAlertHandler);
                EXPECT_EQ(call.context, nullptr);
            }
        }
    }

    static void resetState()
    {
        for (auto* counter : {&subscriberCountServerIndication,
                              &subscriberCountLogEntryIndication,
                              &subscriberCountLogFullIndication,
                              &subscriberCountLogClearIndication})
        {
            counter->store(0);
        }
        _enabledSEL = false;
        clearSELIndicationContext();
    }

    std::shared_ptr<CountingSource> counting;
};

TEST_F(Registry, ClassNamesMapToTheirIdsExactly)
{
    const std::pair<const char*, unsigned short> known[] = {
        {"ZANx_AutomaticServerRestartEvent", 2},
        {"ZAN_MgmtHwLogClearEvent", 3},
        {"ZAN_MgmtHwLogEntryEvent", 4},
        {"ZAN_MgmtHwLogFullEvent", 5}};
    for (const auto& [name, expected] : known)
    {
        unsigned short id = 0;
        EXPECT_TRUE(getSELIndicationId(name, id)) << name;
        EXPECT_EQ(id, expected) << name;
    }
    for (const char* other :
         {"ZAN_MgmtHwLogEntryEvent ", "zan_MgmtHwLogEntryEvent",
          "ZAN_MgmtHwLogEntry", "ZAN_MgmtHwLogEntryEventX", "",
          static_cast<const char*>(nullptr)})
    {
        unsigned short id = 0;
        EXPECT_FALSE(getSELIndicationId(other, id));
        EXPECT_EQ(id, 15);
    }
    EXPECT_EQ(recordsContaining("ENTERING: getSELIndicationId() in "
                                "SELIndication.cpp")
                  .size(),
              2u * 10);
}

TEST_F(Registry, LogFullAndLogClearShareOneWatchWhicheverComesFirst)
{
    subscribeForSELIndication(5);
    subscribeForSELIndication(3);
    EXPECT_EQ(counting->count(true, EventLog), 1u);
    resetState();
    indicationWatches.releaseAll();
    subscribeForSELIndication(3);
    subscribeForSELIndication(5);
    EXPECT_EQ(counting->count(true, EventLog), 2u);
    expectLogHandlerOnEvery(true);
}

TEST_F(Registry, EachClassStartsItsWatchWithItsHandler)
{
    subscribeForSELIndication(2);
    subscribeForSELIndication(4);
    subscribeForSELIndication(2);
    subscribeForSELIndication(4);
    subscribeForSELIndication(7); // not a class of ours
    const auto calls = counting->calls();
    ASSERT_EQ(calls.size(), 2u);
    EXPECT_EQ(calls[0].kind, Watchdog);
    EXPECT_EQ(calls[0].callback, &AutoServerRestartAlertHandler);
    EXPECT_EQ(calls[1].kind, EventLogEntry);
    EXPECT_EQ(calls[1].callback, &LogEntryAlertHandler);
    EXPECT_EQ(subscriberCountServerIndication, 2u);
    EXPECT_EQ(subscriberCountLogEntryIndication, 2u);
}

TEST_F(Registry, UnsubscribingNeverReachesZero)
{
    host::Broker broker{selclasses::schema()};
    const int context = 0;
    saveSELIndicationContext(broker.cmpi(),
                             reinterpret_cast<const CMPIContext*>(&context));
    subscribeForSELIndication(2);
    subscribeForSELIndication(2);
    unsubscribeForSELIndication(2);
    unsubscribeForSELIndication(2);
    EXPECT_EQ(subscriberCountServerIndication, 1u);
    EXPECT_TRUE(_alertSELContextAvailable);
    EXPECT_EQ(_alertSELBroker, broker.cmpi());
    EXPECT_EQ(_alertSELContext, reinterpret_cast<const CMPIContext*>(&context));
    EXPECT_EQ(counting->count(false, Watchdog), 0u);
    subscriberCountLogEntryIndication = 3;
    unsubscribeForSELIndication(4);
    EXPECT_EQ(subscriberCountLogEntryIndication, 2u);
}

TEST_F(Registry, UnsubscribingWithEveryCounterAtZeroClearsTheContext)
{
    host::Broker broker{selclasses::schema()};
    saveSELIndicationContext(broker.cmpi(), nullptr);
    unsubscribeForSELIndication(15);
    EXPECT_FALSE(_alertSELContextAvailable);
    EXPECT_EQ(_alertSELBroker, nullptr);
    EXPECT_EQ(_alertSELContext, nullptr);
}

TEST_F(Registry, UnsubscribingAClassAtZeroWrapsAndKeepsTheContext)
{
    host::Broker broker{selclasses::schema()};
    saveSELIndicationContext(broker.cmpi(), nullptr);
    unsubscribeForSELIndication(3);
    EXPECT_EQ(subscriberCountLogClearIndication, 4294967295u);
    EXPECT_TRUE(_alertSELContextAvailable);
    EXPECT_EQ(_alertSELBroker, broker.cmpi());
}

TEST_F(Registry, DisableStopsOnlyTheWatchesOfCountersAtOne)
{
    subscribeForSELIndication(2);
    subscribeForSELIndication(2);
    subscribeForSELIndication(4);
    setSELEnable();
    EXPECT_TRUE(_enabledSEL);
    disableSELIndication();
    EXPECT_FALSE(_enabledSEL);
    EXPECT_EQ(counting->count(false, Watchdog), 0u);
    EXPECT_EQ(subscriberCountServerIndication, 2u);
    EXPECT_EQ(counting->count(false, EventLogEntry), 1u);
    EXPECT_EQ(subscriberCountLogEntryIndication, 0u);
    EXPECT_EQ(counting->monitorCount(Watchdog), 1u);
    EXPECT_EQ(counting->monitorCount(EventLogEntry), 0u);
}

TEST_F(Registry, DisableTakesOnlyTheLogFullCounterDown)
{
    subscribeForSELIndication(3);
    disableSELIndication();
    EXPECT_EQ(subscriberCountLogFullIndication, 4294967295u);
    EXPECT_EQ(subscriberCountLogClearIndication, 1u);
    EXPECT_EQ(counting->count(false, EventLog), 1u);
    disableSELIndication();
    EXPECT_EQ(counting->count(false, EventLog), 2u);
    EXPECT_EQ(subscriberCountLogFullIndication, 4294967294u);
    expectLogHandlerOnEvery(false);
}

TEST_F(Registry, OnlyTheLogClearCounterIsTraced)
{
    subscribeForSELIndication(2);
    subscribeForSELIndication(4);
    subscribeForSELIndication(5);
    EXPECT_TRUE(recordsContaining("'subscriberCount").empty());
    subscribeForSELIndication(3);
    const auto lines =
        recordsContaining("VARIABLE: 'subscriberCountLogClearIndication' has "
                          "Value '1' at line ");
    ASSERT_EQ(lines.size(), 2u);
    EXPECT_EQ(lines[0].file, "SELIndication.cpp");
    EXPECT_EQ(lines[0].function, "subscribeForSELIndication");
    EXPECT_EQ(lines[0].level, 4000);
    setSELEnable();
    EXPECT_EQ(recordsContaining("VARIABLE: '_enabledSEL' has Value '1'").size(),
              2u);
}

class AlertHandlers : public Registry
{
  protected:
    void SetUp() override
    {
        Registry::SetUp();
        request = std::make_unique<host::Broker::Request>(broker);
        const CMPIBroker* b = broker.cmpi();
        saveSELIndicationContext(
            b, b->bft->prepareAttachThread(b, request->context()));
        setSELEnable();
    }
    void TearDown() override
    {
        Registry::TearDown();
        request.reset();
    }

    unsigned threadsStarted()
    {
        EXPECT_TRUE(awaitIndicationThreads(std::chrono::seconds(10)));
        return broker.faults().calls(host::BrokerCall::NewThread);
    }

    host::Broker broker{selclasses::schema()};
    std::unique_ptr<host::Broker::Request> request;
};

TEST_F(AlertHandlers, OtherAlertCodesStartNoThread)
{
    const QX::DateTime when;
    LogAlertHandler(1, when, "/bmc0/sel", nullptr);
    LogAlertHandler(2, when, "/bmc0/sel", nullptr);
    LogEntryAlertHandler(0, when, "/bmc0/sel/entry-00001", nullptr);
    LogEntryAlertHandler(1, when, "/bmc0/sel/entry-00001", nullptr);
    AutoServerRestartAlertHandler(2, when, "/bmc0/wdt", nullptr);
    AutoServerRestartAlertHandler(0, when, "/bmc0/wdt", nullptr);
    EXPECT_EQ(threadsStarted(), 0u);
    EXPECT_EQ(ind_thread_id_log, nullptr);
    // The log handler alone traces what it was given.
    EXPECT_EQ(recordsContaining("VARIABLE: 'indicationClass' has Value").size(),
              4u);
    EXPECT_EQ(recordsContaining("ENTERING: LogEntryAlertHandler()").size(), 4u);
}

TEST_F(AlertHandlers, TheirOwnCodeStartsOneThreadEach)
{
    const QX::DateTime when;
    LogAlertHandler(0, when, "/bmc0/sel", nullptr);
    LogEntryAlertHandler(2, when, "/bmc0/sel/entry-00001", nullptr);
    AutoServerRestartAlertHandler(1, when, "/bmc0/wdt", nullptr);
    EXPECT_EQ(threadsStarted(), 3u);
    EXPECT_NE(ind_thread_id_log, nullptr);
    EXPECT_NE(ind_thread_id_entry, nullptr);
    EXPECT_NE(ind_thread_id_server, nullptr);
    EXPECT_FALSE(indicationSELData.isFull());
}

TEST_F(AlertHandlers, NothingStartsWhileDisabled)
{
    disableSELIndication();
    LogEntryAlertHandler(2, QX::DateTime(), "/bmc0/sel/entry-00001", nullptr);
    EXPECT_EQ(threadsStarted(), 0u);
}

TEST_F(AlertHandlers, NothingStartsWithoutASavedBroker)
{
    clearSELIndicationContext();
    LogEntryAlertHandler(2, QX::DateTime(), "/bmc0/sel/entry-00001", nullptr);
    EXPECT_EQ(threadsStarted(), 0u);
    EXPECT_FALSE(indicationSELData.isFull());
}

TEST_F(AlertHandlers, AFullEventOfAnyOtherConditionIsAtZeroPercent)
{
    CMPIInstance* instance = createLogFullIndicationInstance(
        "IPMI:/bmc0/sel", QX::DateTime(2024, 1, 2, 3, 4, 5, 6, 0), "");
    ASSERT_NE(instance, nullptr);
    const host::Instance full = host::Broker::toInstance(instance);
    EXPECT_EQ(full.property("PerceivedSeverity")->unsignedValue(), 2u);
    EXPECT_EQ(full.property("Message")->text(),
              "The IPMI System Event Log is 0 percent full.");
    EXPECT_EQ(full.property("EventID")->text(),
              "IPMI Log Full  Event : IPMI:/bmc0/sel");
    EXPECT_EQ(full.property("IndicationTime")->text(),
              "20240102030405.000006+000");
}

TEST_F(AlertHandlers, BuildersGiveNullWithoutAnEventPath)
{
    broker.faults().fail(host::BrokerCall::NewObjectPath,
                         host::FaultMode::ReturnNull, 0, 0);
    const QX::DateTime when;
    EXPECT_EQ(createLogEntryIndicationInstance("d", when, "1"), nullptr);
    EXPECT_EQ(createLogClearIndicationInstance("p", when), nullptr);
    EXPECT_EQ(createLogFullIndicationInstance("p", when, "Warning"), nullptr);
    EXPECT_EQ(createAutoServerRestartIndicationInstance("p", when, "Other"),
              nullptr);
    EXPECT_EQ(recordsContaining("Failed to create ObjectPath").size(), 8u);
}

TEST_F(AlertHandlers, AnInstanceWithoutHandleIsHandedBackAsItIs)
{
    broker.faults().fail(host::BrokerCall::NewInstance,
                         host::FaultMode::NullHandle);
    CMPIInstance* instance =
        createLogClearIndicationInstance("IPMI:/bmc0/sel", QX::DateTime());
    ASSERT_NE(instance, nullptr);
    EXPECT_EQ(instance->hdl, nullptr);
    EXPECT_EQ(broker.faults().calls(host::BrokerCall::SetProperty), 0u);
}

} // namespace
