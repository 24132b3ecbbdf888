// 10,000 mixed requests from four threads through the loaded library while
// 1,000 simulated alerts fire and another thread keeps subscribing,
// enabling, disabling and unsubscribing.
#include "CVLogger.h"
#include "EntryFixture.h"
#include "SelClasses.h"
#include "SoakSupport.h"

#include <atomic>
#include <chrono>
#include <iostream>
#include <mutex>
#include <set>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

namespace
{

using namespace soak;
using namespace QX::NodeLexicon;

constexpr unsigned requestThreads = 4;
constexpr unsigned requestsPerThread = 2500;
constexpr unsigned totalRequests = requestThreads * requestsPerThread;
constexpr unsigned alertCount = 1000;
// The requests are spread over at least this many subscription cycles.
constexpr unsigned subscriptionCycles = 200;

constexpr QX::SimulatedAlert alertKinds[] = {
    QX::SimulatedAlert::RecordAdded, QX::SimulatedAlert::LogCleared,
    QX::SimulatedAlert::LogAlmostFull, QX::SimulatedAlert::LogFull,
    QX::SimulatedAlert::WatchdogRestart};

// Subscribed in every cycle but the last few (see churnSubscriptions).
constexpr const char* churnedClasses[] = {entryEvent, fullEvent, restartEvent};

host::ObjectPath logPath()
{
    host::ObjectPath path = entry::classPath("ZAN_MgmtHwLog");
    path.keys.edit().push_back({"Name", host::Value::string("IPMI SEL Log")});
    path.keys.edit().push_back(
        {"CreationClassName", host::Value::string("ZAN_MgmtHwLog")});
    return path;
}

/** What went wrong, from any thread; the first few are kept in full. */
class Problems
{
  public:
    void add(std::string problem)
    {
        const std::lock_guard lock(mutex_);
        if (++count_ <= 20)
        {
            kept_.push_back(std::move(problem));
        }
    }
    std::size_t count() const
    {
        const std::lock_guard lock(mutex_);
        return count_;
    }
    std::string text() const
    {
        const std::lock_guard lock(mutex_);
        std::string all;
        for (const std::string& problem : kept_)
        {
            all += problem + "\n";
        }
        return all;
    }

  private:
    mutable std::mutex mutex_;
    std::size_t count_ = 0;
    std::vector<std::string> kept_;
};

class MixedLoad : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        CVLog::CVLogger::setSink(nullptr);
        threadsBefore = threadBaseline();
        source = std::make_shared<QX::MemorySource>(entry::selTree(20).build());
        QX::Platform::overrideSource(source);
    }
    void TearDown() override
    {
        QX::Platform::overrideSource(nullptr);
    }

    /** Every alert raised so far handed out and every delivery thread
     *  ended. */
    void settle(host::Host& host)
    {
        if (!source->waitForAlerts(patience) ||
            !host.broker().waitForThreads(patience))
        {
            problems.add("alerts or delivery threads did not settle");
        }
    }

    void runRequests(host::Host& host, unsigned thread);
    void checkOutcome(const char* what, const host::Outcome& outcome);
    void checkStatus(const char* what, const host::Outcome& outcome);
    void raiseAlerts();
    void churnSubscriptions(host::Host& host, host::IndicationInbox& inbox);
    void checkPhase(const std::vector<host::DeliveredIndication>& delivered,
                    const std::set<std::string>& allowed);

    std::size_t threadsBefore = 0;
    std::shared_ptr<QX::MemorySource> source;
    Problems problems;
    std::atomic<unsigned> completed{0};
    std::atomic<unsigned> clearLogs{0};
    std::atomic<unsigned> raised{0};
    std::atomic<bool> alertsDone{false};
    std::atomic<unsigned> windows{0};
    std::atomic<unsigned> cycles{0};
    unsigned watchedWindows = 0;
    unsigned quietPhases = 0;
    std::set<std::string> deliveredClasses;
};

void MixedLoad::checkStatus(const char* what, const host::Outcome& outcome)
{
    if (outcome.rc != CMPI_RC_OK)
    {
        problems.add(std::string(what) + ": rc " + std::to_string(outcome.rc) +
                     " " + outcome.message.value_or("(no message)"));
    }
}

void MixedLoad::checkOutcome(const char* what, const host::Outcome& outcome)
{
    checkStatus(what, outcome);
    if (outcome.rc == CMPI_RC_OK && !outcome.done)
    {
        problems.add(std::string(what) + ": no end of results");
    }
}

void MixedLoad::runRequests(host::Host& host, unsigned thread)
{
    const host::ObjectPath entries = entry::classPath("ZAN_MgmtHwLogEntry");
    const host::ObjectPath logs = entry::classPath("ZAN_MgmtHwLog");
    const host::ObjectPath log = logPath();
    std::vector<host::ObjectPath> known;
    for (unsigned i = 0; i < requestsPerThread; ++i)
    {
        // Each request waits for its share of enabled windows to open.
        while (windows.load() <= i * subscriptionCycles / requestsPerThread)
        {
            std::this_thread::sleep_for(std::chrono::microseconds(100));
        }
        switch ((i + thread) % 10)
        {
            case 0:
            case 1:
            {
                const auto outcome = host.enumerateInstances(entries);
                checkOutcome("EnumerateInstances entries", outcome);
                for (const auto& instance : outcome.instances)
                {
                    if (instance.path.className != "ZAN_MgmtHwLogEntry" ||
                        instance.property("RecordID") == nullptr)
                    {
                        problems.add("entry instance without its class or id");
                    }
                }
                break;
            }
            case 2:
            {
                const auto outcome = host.enumerateInstances(logs);
                checkOutcome("EnumerateInstances log", outcome);
                if (outcome.instances.size() != 1)
                {
                    problems.add("EnumerateInstances log: " +
                                 std::to_string(outcome.instances.size()) +
                                 " instances");
                }
                break;
            }
            case 3:
            case 4:
            {
                auto outcome = host.enumerateInstanceNames(entries);
                checkOutcome("EnumerateInstanceNames entries", outcome);
                if (!outcome.paths.empty())
                {
                    known = std::move(outcome.paths);
                }
                break;
            }
            case 5:
            {
                const auto outcome = host.enumerateInstanceNames(logs);
                checkOutcome("EnumerateInstanceNames log", outcome);
                if (outcome.paths.size() != 1)
                {
                    problems.add("EnumerateInstanceNames log: " +
                                 std::to_string(outcome.paths.size()) +
                                 " paths");
                }
                break;
            }
            case 6:
            {
                const auto outcome = host.getInstance(log);
                checkOutcome("GetInstance log", outcome);
                if (outcome.instances.size() != 1)
                {
                    problems.add("GetInstance log: " +
                                 std::to_string(outcome.instances.size()) +
                                 " instances");
                }
                break;
            }
            case 7:
            case 8:
            {
                if (known.empty())
                {
                    break;
                }
                // The entry may have been cleared since: then nothing is
                // found, with rc 0.
                const auto outcome = host.getInstance(known[i % known.size()]);
                checkOutcome("GetInstance entry", outcome);
                if (outcome.instances.size() > 1)
                {
                    problems.add("GetInstance entry: several instances");
                }
                break;
            }
            default:
            {
                const auto outcome = host.invokeMethod(log, "ClearLog");
                ++clearLogs;
                const bool cleared = outcome.rc == CMPI_RC_OK;
                const bool failed =
                    outcome.rc == CMPI_RC_ERR_FAILED &&
                    outcome.message ==
                        std::optional<std::string>("Execute Method Failed");
                if (!cleared && !failed)
                {
                    problems.add("ClearLog: rc " + std::to_string(outcome.rc));
                }
                if (outcome.data.size() != 1 ||
                    outcome.data[0].unsignedValue() !=
                        static_cast<unsigned>(outcome.rc) ||
                    !outcome.done)
                {
                    problems.add("ClearLog: return value does not mirror rc");
                }
                break;
            }
        }
        ++completed;
    }
}

void MixedLoad::raiseAlerts()
{
    // Spread the alerts over the requests: alert k waits for its share of
    // them (or for all of them to end).
    for (unsigned k = 0; k < alertCount; ++k)
    {
        while (completed.load() < k * (totalRequests / alertCount) &&
               completed.load() < totalRequests)
        {
            std::this_thread::sleep_for(std::chrono::microseconds(200));
        }
        source->raiseSimulatedAlert(alertKinds[k % std::size(alertKinds)]);
        ++raised;
    }
    alertsDone = true;
}

void MixedLoad::checkPhase(
    const std::vector<host::DeliveredIndication>& delivered,
    const std::set<std::string>& allowed)
{
    for (const auto& indication : delivered)
    {
        const std::string wrong = malformation(indication);
        if (!wrong.empty())
        {
            problems.add("malformed indication: " + wrong);
        }
        else if (allowed.count(indication.instance.path.className.str()) == 0)
        {
            problems.add(indication.instance.path.className +
                         " delivered while its node kind was not watched");
        }
        else
        {
            deliveredClasses.insert(indication.instance.path.className.str());
        }
    }
}

void MixedLoad::churnSubscriptions(host::Host& host,
                                   host::IndicationInbox& inbox)
{
    for (unsigned cycle = 0;
         !(alertsDone.load() && completed.load() == totalRequests); ++cycle)
    {
        // The registry's counters stop at 1 on deactivation and wrap below
        // 0, and a log clear subscription keeps the log watch from ever
        // starting again once disabled: so most cycles subscribe a set of
        // the other three classes (bits of 1..7) and unsubscribe before
        // disabling, which starts and stops their watches every cycle.
        // Every fourth cycle subscribes twice and unsubscribes after
        // disabling, as SFCB does, and the last cycles add log clear.
        std::vector<host::IndicationFilter> filters;
        const unsigned mask = cycle % 7 + 1;
        for (unsigned bit = 0; bit < std::size(churnedClasses); ++bit)
        {
            if ((mask & (1u << bit)) != 0)
            {
                filters.push_back(selclasses::filterFor(churnedClasses[bit]));
            }
        }
        const bool likeSfcb = cycle % 4 == 3;
        if (cycle + 8 >= subscriptionCycles)
        {
            filters.push_back(selclasses::filterFor(clearEvent));
        }
        for (const auto& filter : filters)
        {
            checkStatus("activateFilter", host.activateFilter(filter, true));
            if (likeSfcb)
            {
                checkStatus("activateFilter",
                            host.activateFilter(filter, false));
            }
        }
        checkStatus("enableIndications", host.enableIndications());
        // Only this thread starts and stops watches: what is watched now
        // stays watched until the disable below.
        std::set<std::string> allowed;
        if (source->monitorCount(EventLog) > 0)
        {
            allowed.insert({clearEvent, fullEvent});
        }
        if (source->monitorCount(EventLogEntry) > 0)
        {
            allowed.insert(entryEvent);
        }
        if (source->monitorCount(Watchdog) > 0)
        {
            allowed.insert(restartEvent);
        }
        watchedWindows += allowed.empty() ? 0 : 1;
        ++windows;
        std::this_thread::sleep_for(std::chrono::milliseconds(2));
        const auto deactivateAll = [&]
        {
            for (const auto& filter : filters)
            {
                checkStatus("deActivateFilter",
                            host.deActivateFilter(filter, true));
            }
        };
        if (!likeSfcb)
        {
            deactivateAll();
            checkStatus("disableIndications", host.disableIndications());
        }
        else
        {
            checkStatus("disableIndications", host.disableIndications());
            deactivateAll();
        }
        settle(host);
        checkPhase(inbox.takeAll(), allowed);
        ++cycles;

        // Disabled: alerts go on firing, and nothing may arrive.
        const std::size_t before = inbox.received();
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
        settle(host);
        if (inbox.received() != before)
        {
            problems.add(std::to_string(inbox.received() - before) +
                         " indications delivered while disabled");
        }
        ++quietPhases;
    }
}

TEST_F(MixedLoad, RequestsAlertsAndSubscriptionsAtOnce)
{
    const auto start = std::chrono::steady_clock::now();
    std::size_t delivered = 0;
    {
        host::Host host(selclasses::hostOptions(SELPROV_LIBRARY));
        host::IndicationInbox inbox = host.listen(nameSpace);
        std::vector<std::thread> threads;
        threads.reserve(requestThreads + 2);
        for (unsigned t = 0; t < requestThreads; ++t)
        {
            threads.emplace_back([this, &host, t] { runRequests(host, t); });
        }
        threads.emplace_back([this] { raiseAlerts(); });
        threads.emplace_back([this, &host, &inbox]
                             { churnSubscriptions(host, inbox); });
        for (auto& thread : threads)
        {
            thread.join();
        }
        settle(host);
        delivered = inbox.received();
        EXPECT_EQ(host.broker().brokerOwnedObjects(), 0u);
    }
    const auto seconds =
        std::chrono::duration<double>(std::chrono::steady_clock::now() - start)
            .count();
    std::cout << completed << " requests, " << raised << " alerts, " << cycles
              << " subscription cycles (" << watchedWindows
              << " with watches), " << delivered << " indications of "
              << deliveredClasses.size() << " classes in " << seconds << " s"
              << std::endl;

    EXPECT_EQ(problems.count(), 0u) << problems.text();
    EXPECT_EQ(completed.load(), totalRequests);
    EXPECT_EQ(raised.load(), alertCount);
    EXPECT_GE(cycles.load(), subscriptionCycles);
    EXPECT_EQ(quietPhases, cycles.load());
    // Some alerts found a watch, and no alert gave more than one.
    EXPECT_GT(delivered, 0u);
    EXPECT_LE(delivered, static_cast<std::size_t>(raised + clearLogs));
    // Unloading removed every watch; the source's own thread ends with it.
    EXPECT_EQ(source->monitorCount(EventLog) +
                  source->monitorCount(EventLogEntry) +
                  source->monitorCount(Watchdog),
              0u);
    QX::Platform::overrideSource(nullptr);
    source.reset();
    EXPECT_EQ(awaitThreadCount(threadsBefore), threadsBefore) << threadNames();
}

} // namespace
