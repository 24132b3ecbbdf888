// The exchange worker on its own: jobs run one at a time on one thread,
// the caller stops waiting after the timeout, and the destructor joins.

#include "ipmi/ExchangeWorker.h"

#include <atomic>
#include <chrono>
#include <future>
#include <memory>
#include <stdexcept>
#include <thread>

#include <gtest/gtest.h>

namespace
{

using QX::Ipmi::ExchangeWorker;
using namespace std::chrono_literals;

TEST(ExchangeWorker, RunsEachJobOnTheSameThread)
{
    ExchangeWorker worker;
    std::thread::id first;
    std::thread::id second;
    ASSERT_TRUE(
        worker.run([&first] { first = std::this_thread::get_id(); }, 5s));
    ASSERT_TRUE(
        worker.run([&second] { second = std::this_thread::get_id(); }, 5s));
    EXPECT_EQ(first, second);
    EXPECT_NE(first, std::this_thread::get_id());
    EXPECT_FALSE(worker.busy());
}

TEST(ExchangeWorker, GivesUpAfterTheTimeoutAndStaysBusyUntilTheJobReturns)
{
    ExchangeWorker worker;
    auto release = std::make_shared<std::promise<void>>();
    std::shared_future<void> released = release->get_future().share();
    auto finished = std::make_shared<std::atomic<bool>>(false);

    const auto start = std::chrono::steady_clock::now();
    EXPECT_FALSE(worker.run(
        [released, finished]
        {
            released.wait();
            finished->store(true);
        },
        100ms));
    EXPECT_GE(std::chrono::steady_clock::now() - start, 100ms);
    EXPECT_TRUE(worker.busy());
    EXPECT_FALSE(finished->load());
    EXPECT_THROW(worker.run([] {}, 1s), std::logic_error);

    release->set_value();
    const auto deadline = std::chrono::steady_clock::now() + 10s;
    while (worker.busy() && std::chrono::steady_clock::now() < deadline)
    {
        std::this_thread::sleep_for(1ms);
    }
    EXPECT_FALSE(worker.busy());
    EXPECT_TRUE(finished->load());
    // And the worker takes the next job.
    bool ran = false;
    EXPECT_TRUE(worker.run([&ran] { ran = true; }, 5s));
    EXPECT_TRUE(ran);
}

TEST(ExchangeWorker, DestructorWaitsForTheJobInHand)
{
    auto finished = std::make_shared<std::atomic<bool>>(false);
    {
        ExchangeWorker worker;
        EXPECT_FALSE(worker.run(
            [finished]
            {
                std::this_thread::sleep_for(300ms);
                finished->store(true);
            },
            10ms));
    }
    EXPECT_TRUE(finished->load());
}

TEST(ExchangeWorker, ReleasesWhatAJobHoldsBeforeItCountsAsDone)
{
    ExchangeWorker worker;
    auto held = std::make_shared<int>(7);
    const std::weak_ptr<int> watch = held;
    ASSERT_TRUE(worker.run([held = std::move(held)] { (void)*held; }, 5s));
    EXPECT_TRUE(watch.expired());
}

} // namespace
