#include "MemorySource.h"
#include "platform/CapturedLog.h"
#include "platform/TestTrees.h"

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <mutex>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

using namespace QX;
using namespace QX::NodeLexicon;

namespace
{

constexpr std::chrono::seconds patience{10};

/** What the callbacks of one test saw. */
struct Seen
{
    std::mutex mutex;
    std::vector<std::string> paths;
    std::vector<std::thread::id> threads;

    void add(const std::string& path)
    {
        const std::lock_guard lock(mutex);
        paths.push_back(path);
        threads.push_back(std::this_thread::get_id());
    }
};

Seen* seen = nullptr;

void record(unsigned, DateTime, std::string path, const void*)
{
    seen->add(path);
}

class AlertDispatcherTest : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        seen = &seen_;
    }
    void TearDown() override
    {
        source.reset(); // joins the dispatcher before seen_ goes
        seen = nullptr;
    }

    Seen seen_;
    std::shared_ptr<MemorySource> source =
        std::make_shared<MemorySource>(test::twoControllerTree());
};

TEST_F(AlertDispatcherTest, CallbacksRunOnTheSourcesThreadNotTheCallers)
{
    source->startMonitoring(Watchdog, &record, nullptr);
    source->raiseAlert("/bmc0/wdt", DateTime());
    std::thread other([this] { source->raiseAlert("/bmc0/wdt", DateTime()); });
    other.join();
    ASSERT_TRUE(source->waitForAlerts(patience));
    ASSERT_EQ(seen_.threads.size(), 2u);
    EXPECT_NE(seen_.threads[0], std::this_thread::get_id());
    // One dispatcher thread per source hands out every alert.
    EXPECT_EQ(seen_.threads[0], seen_.threads[1]);
}

TEST_F(AlertDispatcherTest, AlertsAreHandedOutInTheOrderRaised)
{
    source->startMonitoring(EventLogEntry, &record, nullptr);
    std::vector<std::string> raised;
    for (unsigned id = 10; id < 110; ++id)
    {
        raised.push_back(source->appendEntry("/bmc1/sel", id, "", "", ""));
    }
    ASSERT_TRUE(source->waitForAlerts(patience));
    EXPECT_EQ(seen_.paths, raised);
}

TEST_F(AlertDispatcherTest, NoCallAfterStopReturns)
{
    source->startMonitoring(Watchdog, &record, nullptr);
    source->stopMonitoring(Watchdog, &record, nullptr);
    source->raiseAlert("/bmc0/wdt", DateTime());
    ASSERT_TRUE(source->waitForAlerts(patience));
    EXPECT_TRUE(seen_.paths.empty());
}

// A callback that holds on until the test lets it go.
struct Gate
{
    std::mutex mutex;
    std::condition_variable changed;
    bool entered = false;
    bool open = false;
    std::atomic<bool> finished{false};
};

Gate* gate = nullptr;

void blockUntilOpened(unsigned, DateTime, std::string, const void*)
{
    std::unique_lock lock(gate->mutex);
    gate->entered = true;
    gate->changed.notify_all();
    gate->changed.wait(lock, [] { return gate->open; });
    lock.unlock();
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
    gate->finished = true;
}

/** Starts a watchdog watch whose callback blocks in @p local, raises an
 *  alert and waits until the callback is inside; false when it never is. */
bool holdACallbackIn(Gate& local, MemorySource& source)
{
    gate = &local;
    source.startMonitoring(Watchdog, &blockUntilOpened, nullptr);
    source.raiseAlert("/bmc0/wdt", DateTime());
    std::unique_lock lock(local.mutex);
    return local.changed.wait_for(lock, patience,
                                  [&] { return local.entered; });
}

TEST_F(AlertDispatcherTest, StopWaitsForTheRunningCallback)
{
    Gate local;
    ASSERT_TRUE(holdACallbackIn(local, *source));
    std::atomic<bool> stopped{false};
    bool finishedWhenStopped = false;
    std::thread stopper(
        [&]
        {
            source->stopMonitoring(Watchdog, &blockUntilOpened, nullptr);
            finishedWhenStopped = local.finished;
            stopped = true;
        });
    std::this_thread::sleep_for(std::chrono::milliseconds(50));
    EXPECT_FALSE(stopped);
    {
        const std::lock_guard lock(local.mutex);
        local.open = true;
    }
    local.changed.notify_all();
    stopper.join();
    EXPECT_TRUE(finishedWhenStopped);
    EXPECT_EQ(source->monitorCount(Watchdog), 0u);
    gate = nullptr;
}

TEST_F(AlertDispatcherTest, DestroyingTheSourceWaitsForItsCallback)
{
    Gate local;
    ASSERT_TRUE(holdACallbackIn(local, *source));
    std::thread opener(
        [&]
        {
            std::this_thread::sleep_for(std::chrono::milliseconds(30));
            const std::lock_guard lock(local.mutex);
            local.open = true;
            local.changed.notify_all();
        });
    source.reset();
    EXPECT_TRUE(local.finished);
    opener.join();
    gate = nullptr;
}

std::atomic<std::shared_ptr<MemorySource>*> lastReference{nullptr};
std::atomic<bool> callerLetGo{false};
std::atomic<bool> dropped{false};

void dropTheSource(unsigned, DateTime, std::string, const void*)
{
    // Wait until the raising side no longer holds the source, so that the
    // reference dropped here is the last one.
    while (!callerLetGo)
    {
        std::this_thread::yield();
    }
    lastReference.load()->reset();
    dropped = true;
}

TEST_F(AlertDispatcherTest, TheLastReferenceMayGoInsideACallback)
{
    auto held = std::make_shared<MemorySource>(test::twoControllerTree());
    lastReference = &held;
    callerLetGo = false;
    dropped = false;
    std::weak_ptr<MemorySource> watch = held;
    {
        // A second owner, which the callback does not drop.
        // NOLINTNEXTLINE(performance-unnecessary-copy-initialization)
        auto raiser = held;
        raiser->startMonitoring(Watchdog, &dropTheSource, nullptr);
        raiser->raiseAlert("/bmc0/wdt", DateTime());
    }
    callerLetGo = true;
    const auto deadline = std::chrono::steady_clock::now() + patience;
    while (!dropped && std::chrono::steady_clock::now() < deadline)
    {
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
    ASSERT_TRUE(dropped);
    EXPECT_TRUE(watch.expired());
    lastReference = nullptr;
}

void throwing(unsigned, DateTime, std::string, const void*)
{
    throw std::runtime_error("callback failed");
}

TEST_F(AlertDispatcherTest, ACallbackThatThrowsDoesNotStopTheOthers)
{
    source->startMonitoring(Watchdog, &throwing, nullptr);
    source->startMonitoring(Watchdog, &record, nullptr);
    source->raiseAlert("/bmc0/wdt", DateTime());
    source->raiseAlert("/bmc0/wdt", DateTime());
    ASSERT_TRUE(source->waitForAlerts(patience));
    EXPECT_EQ(seen_.paths.size(), 2u);
}

TEST_F(AlertDispatcherTest, ACallbackThatThrowsIsAFailureInTheLog)
{
    const CVLog::LoggerSettings previous = CVLog::CVLogger::settings();
    CVLog::CVLogger::configure(CVLog::LoggerSettings{});
    const test::CapturedLog log;
    source->startMonitoring(Watchdog, &throwing, nullptr);
    ::testing::internal::CaptureStderr();
    source->raiseAlert("/bmc0/wdt", DateTime());
    const bool handedOut = source->waitForAlerts(patience);
    const std::string written = ::testing::internal::GetCapturedStderr();
    CVLog::CVLogger::configure(previous);
    ASSERT_TRUE(handedOut);
    EXPECT_NE(written.find("callback failed"), std::string::npos) << written;
    int failures = 0;
    for (const auto& record : log.records())
    {
        if (record.message.find("callback failed") != std::string::npos)
        {
            EXPECT_EQ(record.level, 6000);
            EXPECT_EQ(record.component, "QX.Platform");
            ++failures;
        }
    }
    EXPECT_EQ(failures, 1);
}

TEST_F(AlertDispatcherTest, EveryRegistrationOfATripleIsCalled)
{
    const int context = 0;
    source->startMonitoring(Watchdog, &record, &context);
    source->startMonitoring(Watchdog, &record, &context);
    source->startMonitoring(Watchdog, &record, nullptr);
    source->raiseAlert("/bmc0/wdt", DateTime());
    ASSERT_TRUE(source->waitForAlerts(patience));
    EXPECT_EQ(seen_.paths.size(), 3u);
    source->stopMonitoring(Watchdog, &record, &context);
    EXPECT_EQ(source->monitorCount(Watchdog), 2u);
    source->stopMonitoring(Watchdog, &record, &context);
    source->stopMonitoring(Watchdog, &record, &context); // none left
    EXPECT_EQ(source->monitorCount(Watchdog), 1u);
}

TEST(AlertDispatcher, AlertsNobodyWantsAreDropped)
{
    AlertDispatcher dispatcher;
    dispatcher.post({PendingAlert{Watchdog, AlertOnWatchdog, DateTime(), "/"}});
    EXPECT_TRUE(dispatcher.waitIdle(std::chrono::milliseconds(0)));
}

} // namespace
