// The IPMI source's poller on a simulated SEL: its thread's lifetime,
// callbacks that fail or take long, and the state file it keeps. The SEL
// is prepared before monitoring starts; from then on only the poller
// touches it.

#include "CVLogger.h"
#include "ipmi/AlertState.h"
#include "ipmi/IpmiSource.h"
#include "platform/CapturedLog.h"
#include "platform/FakeBmc.h"

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <filesystem>
#include <fstream>
#include <functional>
#include <mutex>
#include <thread>
#include <unistd.h>

#include <gtest/gtest.h>

using namespace QX;
using namespace QX::Ipmi;
using namespace QX::NodeLexicon;
using namespace QX::test;

namespace
{

constexpr auto patience = std::chrono::seconds(10);

std::atomic<unsigned> calls{0};

void throwingCallback(unsigned, DateTime, std::string, const void*)
{
    ++calls;
    throw std::runtime_error("a subscriber's failure");
}

// A callback that stays inside until the test lets it go.
struct Gate
{
    std::mutex mutex;
    std::condition_variable changed;
    bool inside = false;
    bool open = false;
};
Gate gate;

void blockingCallback(unsigned, DateTime, std::string, const void*)
{
    std::unique_lock lock(gate.mutex);
    gate.inside = true;
    gate.changed.notify_all();
    gate.changed.wait(lock, [] { return gate.open; });
    ++calls;
}

void countingCallback(unsigned, DateTime, std::string, const void*)
{
    ++calls;
}

class IpmiMonitoringTest : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        calls = 0;
        {
            const std::lock_guard lock(gate.mutex);
            gate.inside = false;
            gate.open = false;
        }
        CVLog::LoggerSettings everything;
        everything.logLevel = 1;
        CVLog::CVLogger::configure(everything);
        directory = std::filesystem::temp_directory_path() /
                    ("ipmi-monitoring-" + std::to_string(::getpid()));
        std::filesystem::remove_all(directory);
        stateFile = (directory / "sel-alerts").string();
    }
    void TearDown() override
    {
        {
            const std::lock_guard lock(gate.mutex);
            gate.open = true;
        }
        gate.changed.notify_all();
        source.reset();
        std::filesystem::remove_all(directory);
        CVLog::CVLogger::configure(CVLog::LoggerSettings{});
    }

    /** A source on a SEL of @p records records, polling every 20 ms. */
    void make(unsigned records)
    {
        auto fake = std::make_unique<FakeBmc>();
        for (unsigned id = 1; id <= records; ++id)
        {
            fake->add(selRecord(static_cast<std::uint16_t>(id)));
        }
        Settings settings;
        settings.pollIntervalMs = 50;
        source = std::make_shared<IpmiSource>(
            std::move(fake), std::make_unique<CountingDescriber>(), settings,
            "BMC", stateFile);
    }

    /** Kept state saying the SEL was empty: every record present is new. */
    void keepEmptySel()
    {
        AnnouncedState state;
        state.logStatus = 1;
        writeAlertState(stateFile, state);
    }

    bool waitFor(const std::function<bool()>& done)
    {
        const auto deadline = std::chrono::steady_clock::now() + patience;
        while (!done())
        {
            if (std::chrono::steady_clock::now() >= deadline)
            {
                return false;
            }
            std::this_thread::sleep_for(std::chrono::milliseconds(5));
        }
        return true;
    }

    QX::test::CapturedLog captured;
    std::filesystem::path directory;
    std::string stateFile;
    std::shared_ptr<IpmiSource> source;
};

TEST_F(IpmiMonitoringTest, FirstRegistrationStartsThePollerLastStopsIt)
{
    make(1);
    EXPECT_FALSE(source->polling());
    source->startMonitoring(EventLog, countingCallback, nullptr);
    source->startMonitoring(EventLogEntry, countingCallback, nullptr);
    EXPECT_TRUE(source->polling());
    ASSERT_TRUE(waitFor([&] { return source->pollCount() >= 2; }));
    source->stopMonitoring(EventLog, countingCallback, nullptr);
    EXPECT_TRUE(source->polling());
    source->stopMonitoring(EventLogEntry, countingCallback, nullptr);
    EXPECT_FALSE(source->polling());
    const std::uint64_t polls = source->pollCount();
    std::this_thread::sleep_for(std::chrono::milliseconds(200));
    EXPECT_EQ(source->pollCount(), polls);

    source->startMonitoring(Watchdog, countingCallback, nullptr);
    EXPECT_TRUE(source->polling());
    ASSERT_TRUE(waitFor([&] { return source->pollCount() > polls; }));
}

TEST_F(IpmiMonitoringTest, ThrowingCallbackDoesNotStopThePoller)
{
    keepEmptySel();
    make(3);
    source->startMonitoring(EventLogEntry, throwingCallback, nullptr);
    ASSERT_TRUE(waitFor([] { return calls.load() == 3; }));
    const std::uint64_t polls = source->pollCount();
    EXPECT_TRUE(waitFor([&] { return source->pollCount() >= polls + 3; }));
    EXPECT_EQ(calls.load(), 3u);
}

TEST_F(IpmiMonitoringTest, SlowCallbackDoesNotHoldUpPolling)
{
    keepEmptySel();
    make(2);
    source->startMonitoring(EventLogEntry, blockingCallback, nullptr);
    {
        std::unique_lock lock(gate.mutex);
        ASSERT_TRUE(
            gate.changed.wait_for(lock, patience, [] { return gate.inside; }));
    }
    const std::uint64_t polls = source->pollCount();
    EXPECT_TRUE(waitFor([&] { return source->pollCount() >= polls + 3; }));
    {
        const std::lock_guard lock(gate.mutex);
        gate.open = true;
    }
    gate.changed.notify_all();
    EXPECT_TRUE(waitFor([] { return calls.load() == 2; }));
}

TEST_F(IpmiMonitoringTest, KeepsWhatItAnnouncedInTheStateFile)
{
    make(4);
    source->startMonitoring(EventLogEntry, countingCallback, nullptr);
    ASSERT_TRUE(waitFor([&] { return source->pollCount() >= 1; }));
    std::string problem;
    const auto kept = readAlertState(stateFile, problem);
    ASSERT_TRUE(kept.has_value()) << problem;
    EXPECT_EQ(kept->lastRecord, selRecord(4));
    // Nothing old is announced without a state file.
    EXPECT_EQ(calls.load(), 0u);
    bool logged = false;
    for (const auto& record : captured.records())
    {
        logged = logged ||
                 record.message.find("No alert state") != std::string::npos;
    }
    EXPECT_TRUE(logged);
}

TEST_F(IpmiMonitoringTest, CorruptStateFileAnnouncesNothingOld)
{
    std::filesystem::create_directories(directory);
    writeAlertState(stateFile, AnnouncedState{});
    {
        std::ofstream damage(stateFile, std::ios::app);
        damage << "garbage after the end";
    }
    {
        // Cut the file in the middle, as a torn write would.
        const std::string text = formatAlertState(AnnouncedState{});
        std::ofstream(stateFile, std::ios::trunc)
            << text.substr(0, text.size() / 2);
    }
    make(3);
    source->startMonitoring(EventLogEntry, countingCallback, nullptr);
    ASSERT_TRUE(waitFor([&] { return source->pollCount() >= 3; }));
    EXPECT_EQ(calls.load(), 0u);
    std::string problem;
    EXPECT_TRUE(readAlertState(stateFile, problem).has_value()) << problem;
}

TEST_F(IpmiMonitoringTest, DestroyingTheSourceStopsThePollerAndCallbacks)
{
    keepEmptySel();
    make(2);
    source->startMonitoring(EventLogEntry, countingCallback, nullptr);
    ASSERT_TRUE(waitFor([&] { return source->pollCount() >= 1; }));
    source.reset(); // registrations still in place
    const unsigned seen = calls.load();
    std::this_thread::sleep_for(std::chrono::milliseconds(200));
    EXPECT_EQ(calls.load(), seen);
}

} // namespace
