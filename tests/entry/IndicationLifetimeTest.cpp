// Unloading with subscriptions in place, many deliveries, and everything
// at once from several threads.
#include "IndicationFixture.h"
#include "ProviderLibrary.h"
#include "SelClasses.h"

#include <atomic>
#include <dlfcn.h>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

namespace
{

using namespace entry;
using namespace QX::NodeLexicon;

class IndicationLifetime : public WatchdogSourceTest
{
  protected:
    static void subscribeAll(host::Host& host, bool twice)
    {
        for (const char* className :
             {entryEvent, clearEvent, fullEvent, restartEvent})
        {
            const auto filter = selclasses::filterFor(className);
            ASSERT_EQ(host.activateFilter(filter, true).rc, CMPI_RC_OK);
            if (twice)
            {
                ASSERT_EQ(host.activateFilter(filter, false).rc, CMPI_RC_OK);
            }
        }
        ASSERT_EQ(host.enableIndications().rc, CMPI_RC_OK);
    }

    std::size_t watches() const
    {
        return source->monitorCount(EventLog) +
               source->monitorCount(EventLogEntry) +
               source->monitorCount(Watchdog);
    }
};

TEST_F(IndicationLifetime, UnloadingWhileAlertsFlowRemovesTheWatches)
{
    const std::string entry = QX::MemorySource::entryPath("/bmc0/sel", 2);
    for (int round = 0; round < 10; ++round)
    {
        std::atomic<bool> stop{false};
        std::thread raiser(
            [&]
            {
                while (!stop)
                {
                    source->raiseAlert(entry, alertTime);
                    source->raiseAlert("/bmc0/wdt", alertTime);
                    std::this_thread::yield();
                }
            });
        {
            host::Host host(selclasses::hostOptions(SELPROV_LIBRARY));
            host::IndicationInbox inbox = host.listen(nameSpace);
            // Counters at 2: disabling at unload leaves the watches on,
            // and the library's own teardown must remove them.
            subscribeAll(host, true);
            EXPECT_TRUE(inbox.next(patience).has_value()) << "round " << round;
        }
        EXPECT_EQ(watches(), 0u) << "round " << round;
        void* still = ::dlopen(SELPROV_LIBRARY, RTLD_NOW | RTLD_NOLOAD);
        EXPECT_EQ(still, nullptr) << "round " << round;
        if (still != nullptr)
        {
            ::dlclose(still);
        }
        stop = true;
        raiser.join();
    }
}

TEST_F(IndicationLifetime, TenThousandDeliveriesKeepNothing)
{
#if defined(__SANITIZE_THREAD__)
    constexpr int deliveries = 2000; // the thread sanitizer is slow
#else
    constexpr int deliveries = 10000;
#endif
    host::Host host(selclasses::hostOptions(SELPROV_LIBRARY));
    host::IndicationInbox inbox = host.listen(nameSpace);
    const auto filter = selclasses::filterFor(entryEvent);
    ASSERT_EQ(host.activateFilter(filter, true).rc, CMPI_RC_OK);
    ASSERT_EQ(host.enableIndications().rc, CMPI_RC_OK);
    const std::string entry = QX::MemorySource::entryPath("/bmc0/sel", 1);
    int received = 0;
    for (int i = 0; i < deliveries; ++i)
    {
        source->raiseAlert(entry, alertTime);
        if (inbox.next(patience).has_value())
        {
            ++received;
        }
    }
    EXPECT_EQ(received, deliveries);
    EXPECT_TRUE(source->waitForAlerts(patience));
    EXPECT_TRUE(host.broker().waitForThreads(patience));
    EXPECT_EQ(inbox.pending(), 0u);
    // Everything a delivery made went with its thread's detach.
    EXPECT_EQ(host.broker().brokerOwnedObjects(), 0u);
    EXPECT_EQ(host.broker().outstandingPreparedContexts(), 1u);
    EXPECT_EQ(host.broker().outstandingClones(), 0u);
}

TEST_F(IndicationLifetime, EverythingAtOnceFromSeveralThreads)
{
    host::Host host(selclasses::hostOptions(SELPROV_LIBRARY));
    host::IndicationInbox inbox = host.listen(nameSpace);
    subscribeAll(host, false);
    std::atomic<bool> stop{false};
    std::atomic<int> raised{0};
    std::vector<std::thread> threads;
    const std::vector<std::string> alerting = {
        QX::MemorySource::entryPath("/bmc0/sel", 1),
        QX::MemorySource::entryPath("/bmc0/sel", 2), "/bmc0/sel", "/bmc0/wdt"};
    threads.reserve(alerting.size() + 3);
    for (const std::string& path : alerting)
    {
        threads.emplace_back(
            [&, path]
            {
                for (int i = 0; i < 200 && !stop; ++i)
                {
                    source->raiseAlert(path, alertTime);
                    ++raised;
                }
            });
    }
    threads.emplace_back(
        [&]
        {
            const char* classes[] = {entryEvent, clearEvent, fullEvent,
                                     restartEvent};
            for (int i = 0; i < 200; ++i)
            {
                const auto filter = selclasses::filterFor(classes[i % 4]);
                EXPECT_EQ(host.activateFilter(filter, true).rc, CMPI_RC_OK);
                EXPECT_EQ(host.deActivateFilter(filter, true).rc, CMPI_RC_OK);
            }
        });
    threads.emplace_back(
        [&]
        {
            for (int i = 0; i < 200; ++i)
            {
                EXPECT_EQ(host.enableIndications().rc, CMPI_RC_OK);
                EXPECT_EQ(host.disableIndications().rc, CMPI_RC_OK);
            }
            EXPECT_EQ(host.enableIndications().rc, CMPI_RC_OK);
        });
    threads.emplace_back(
        [&]
        {
            for (int i = 0; i < 50; ++i)
            {
                EXPECT_EQ(
                    host.enumerateInstances(classPath("ZAN_MgmtHwLogEntry")).rc,
                    CMPI_RC_OK);
            }
        });
    for (auto& thread : threads)
    {
        thread.join();
    }
    EXPECT_TRUE(source->waitForAlerts(patience));
    EXPECT_TRUE(host.broker().waitForThreads(patience));
    const auto delivered = inbox.takeAll();
    EXPECT_LE(delivered.size(), static_cast<std::size_t>(raised.load()));
    for (const auto& indication : delivered)
    {
        const std::string_view className = indication.instance.path.className;
        EXPECT_TRUE(className == entryEvent || className == restartEvent ||
                    className == clearEvent || className == fullEvent)
            << className;
    }
    EXPECT_EQ(host.broker().brokerOwnedObjects(), 0u);
}

} // namespace
