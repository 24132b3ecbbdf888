// Loading and unloading the library 100 times with subscriptions active
// and alerts in flight, in an object manager's unload order: cleanup, then
// dlclose, without disabling indications first.
#include "CVLogger.h"
#include "EntryFixture.h"
#include "SelClasses.h"
#include "SoakSupport.h"

#include <dlfcn.h>

#include <gtest/gtest.h>

namespace
{

using namespace soak;
using namespace QX::NodeLexicon;

constexpr int rounds = 100;

class Unload : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        CVLog::CVLogger::setSink(nullptr);
        threadsBefore = threadBaseline();
        source = std::make_shared<QX::MemorySource>(entry::selTree(5).build());
        QX::Platform::overrideSource(source);
    }
    void TearDown() override
    {
        QX::Platform::overrideSource(nullptr);
    }

    std::size_t watches() const
    {
        return source->monitorCount(EventLog) +
               source->monitorCount(EventLogEntry) +
               source->monitorCount(Watchdog);
    }

    std::size_t threadsBefore = 0;
    std::shared_ptr<QX::MemorySource> source;
};

// Enables through the function table itself, so that the host does not
// disable before it unloads (it disables only what it enabled).
CMPIrc enableBehindTheHostsBack(host::Host& host)
{
    host::Broker::Request request(host.broker());
    CMPIIndicationMI* mi = host.indicationMI();
    return mi->ft->enableIndications(mi, request.context()).rc;
}

TEST_F(Unload, HundredUnloadsWithSubscriptionsAndAlertsInFlight)
{
    std::size_t delivered = 0;
    for (int round = 0; round < rounds; ++round)
    {
        {
            host::Host host(selclasses::hostOptions(SELPROV_LIBRARY));
            host::IndicationInbox inbox = host.listen(nameSpace);
            for (const char* className :
                 {entryEvent, clearEvent, fullEvent, restartEvent})
            {
                const auto filter = selclasses::filterFor(className);
                ASSERT_EQ(host.activateFilter(filter, true).rc, CMPI_RC_OK);
                // Every other round a second subscription of the class,
                // which disabling would not end.
                if (round % 2 == 1)
                {
                    ASSERT_EQ(host.activateFilter(filter, false).rc,
                              CMPI_RC_OK);
                }
            }
            ASSERT_EQ(enableBehindTheHostsBack(host), CMPI_RC_OK);
            ASSERT_GT(watches(), 0u);
            // The first alert is awaited every tenth round, so that some
            // rounds unload with deliveries done and the others with
            // everything still in flight.
            source->raiseSimulatedAlert(QX::SimulatedAlert::RecordAdded);
            if (round % 10 == 0)
            {
                EXPECT_TRUE(inbox.next(patience).has_value())
                    << "round " << round;
            }
            source->raiseSimulatedAlert(QX::SimulatedAlert::WatchdogRestart);
            source->raiseSimulatedAlert(QX::SimulatedAlert::LogFull);
            source->raiseSimulatedAlert(QX::SimulatedAlert::LogCleared);
            EXPECT_EQ(host.cleanupAll(true).rc, CMPI_RC_OK);
            delivered += inbox.received();
        }
        // The library is gone, and so are its watches.
        ASSERT_EQ(watches(), 0u) << "round " << round;
        void* still = ::dlopen(SELPROV_LIBRARY, RTLD_NOW | RTLD_NOLOAD);
        EXPECT_EQ(still, nullptr) << "round " << round;
        if (still != nullptr)
        {
            ::dlclose(still);
        }
    }
    EXPECT_GE(delivered, static_cast<std::size_t>(rounds / 10));
    EXPECT_TRUE(source->waitForAlerts(patience));
    QX::Platform::overrideSource(nullptr);
    source.reset();
    EXPECT_EQ(awaitThreadCount(threadsBefore), threadsBefore) << threadNames();
}

} // namespace
