// The in-band exchange worker through the provider: a BMC that stops
// answering ends each request within the configured timeout, one worker
// serves every exchange of a session, and none outlives an unload.

#include "InbandFixture.h"

#include <atomic>
#include <chrono>
#include <set>
#include <thread>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

using namespace inbandtest;
using ::testing::HasSubstr;
using Clock = std::chrono::steady_clock;

constexpr unsigned timeoutMs = 400;

TEST_F(InbandTest, SilentBmcEndsTheRequestWithinTheTimeout)
{
    addRecords(3);
    load(timeoutMs);
    ASSERT_EQ(enumerate("ZAN_MgmtHwLogEntry").instances.size(), 3u);

    // A failed read gives an empty result and the reason on stderr.
    device().stopAnswering();
    ::testing::internal::CaptureStderr();
    const auto start = Clock::now();
    const host::Outcome silent = enumerate("ZAN_MgmtHwLogEntry");
    const auto took = Clock::now() - start;
    const std::string silentText = ::testing::internal::GetCapturedStderr();
    EXPECT_EQ(silent.rc, CMPI_RC_OK);
    EXPECT_TRUE(silent.instances.empty());
    EXPECT_THAT(silentText, HasSubstr("timeout: no answer from the driver "
                                      "within 400 ms"));
    EXPECT_GE(took, std::chrono::milliseconds(timeoutMs));
    EXPECT_LT(took, std::chrono::milliseconds(timeoutMs + 2000));

    // The driver still waits: the next request is refused at once.
    ::testing::internal::CaptureStderr();
    const auto again = Clock::now();
    const host::Outcome busy = enumerate("ZAN_MgmtHwLogEntry");
    const auto tookAgain = Clock::now() - again;
    const std::string busyText = ::testing::internal::GetCapturedStderr();
    EXPECT_TRUE(busy.instances.empty());
    EXPECT_THAT(busyText, HasSubstr("busy: the driver has not yet returned"));
    EXPECT_LT(tookAgain, std::chrono::milliseconds(timeoutMs));

    // Once the BMC answers (late), the driver returns and requests work.
    device().resumeAnswering();
    ::testing::internal::CaptureStderr();
    std::size_t entries = 0;
    const auto deadline = Clock::now() + patience;
    while (entries != 3 && Clock::now() < deadline)
    {
        entries = enumerate("ZAN_MgmtHwLogEntry").instances.size();
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    ::testing::internal::GetCapturedStderr();
    EXPECT_EQ(entries, 3u);
}

TEST_F(InbandTest, OneWorkerReadsALargeLog)
{
    addRecords(300);
    load();
    std::atomic<bool> reading{true};
    std::set<std::string> seen;
    std::thread watcher(
        [&reading, &seen]
        {
            while (reading.load())
            {
                const std::set<std::string> now = exchangeWorkerIds();
                seen.insert(now.begin(), now.end());
                std::this_thread::sleep_for(std::chrono::milliseconds(2));
            }
        });
    const host::Outcome outcome = enumerate("ZAN_MgmtHwLogEntry");
    reading.store(false);
    watcher.join();

    ASSERT_EQ(outcome.rc, CMPI_RC_OK) << outcome.message.value_or("");
    EXPECT_EQ(outcome.instances.size(), 300u);
    EXPECT_GE(device().requests(), 300u);
    EXPECT_EQ(seen.size(), 1u) << "exchanges ran on more than one thread";
    EXPECT_EQ(exchangeWorkerIds(), seen) << "the worker did not stay";
}

TEST_F(InbandTest, NoWorkerOutlivesAnUnload)
{
    addRecords(3);
    load();
    ASSERT_EQ(enumerate("ZAN_MgmtHwLogEntry").rc, CMPI_RC_OK);
    EXPECT_EQ(exchangeWorkers(), 1u);
    EXPECT_EQ(device().openDescriptors(), 1u);

    unload();
    EXPECT_EQ(exchangeWorkersAfterGrace(), 0u);
    EXPECT_EQ(device().openDescriptors(), 0u) << "the device was left open";
}

TEST_F(InbandTest, NoWorkerOutlivesAnUnloadWithIndicationsEnabled)
{
    addRecords(3);
    load(1000, 100);
    const auto filter =
        host::IndicationFilter::forClass("ZAN_MgmtHwLogEntryEvent");
    ASSERT_EQ(host().activateFilter(filter, true).rc, CMPI_RC_OK);
    ASSERT_EQ(host().enableIndications().rc, CMPI_RC_OK);
    const auto deadline = Clock::now() + patience;
    while (device().requests() < 6 && Clock::now() < deadline)
    {
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    ASSERT_GE(device().requests(), 6u) << "the poller did not poll";

    unload();
    EXPECT_EQ(exchangeWorkersAfterGrace(), 0u);
    EXPECT_EQ(device().openDescriptors(), 0u);
}

TEST_F(InbandTest, UnloadWaitsForTheDriverToReturn)
{
    addRecords(3);
    load(timeoutMs);
    ASSERT_EQ(enumerate("ZAN_MgmtHwLogEntry").rc, CMPI_RC_OK);
    device().stopAnswering();
    ::testing::internal::CaptureStderr();
    const host::Outcome silent = enumerate("ZAN_MgmtHwLogEntry");
    EXPECT_THAT(::testing::internal::GetCapturedStderr(),
                HasSubstr("no answer from the driver"));
    ASSERT_TRUE(silent.instances.empty());
    ASSERT_EQ(exchangeWorkers(), 1u) << "the worker left the driver";

    // The BMC answers while the unload waits for the worker.
    std::thread late(
        [this]
        {
            std::this_thread::sleep_for(std::chrono::milliseconds(300));
            device().resumeAnswering();
        });
    const auto start = Clock::now();
    unload();
    const auto took = Clock::now() - start;
    late.join();
    EXPECT_GE(took, std::chrono::milliseconds(200))
        << "the unload did not wait for the worker";
    EXPECT_EQ(exchangeWorkersAfterGrace(), 0u);
    EXPECT_EQ(device().openDescriptors(), 0u);
}

} // namespace
