// The record an alert handler hands to its delivery thread: held from
// put() until release(), the handler's bounded wait for its delivery.
#include "AlertHandOver.h"

#include <chrono>
#include <string>
#include <thread>

#include <gtest/gtest.h>

namespace
{

using QX::DateTime;
using QX::SELComposite::AlertHandOver;
using Clock = std::chrono::steady_clock;

TEST(HandOver, TheThreadCopiesTheRecordTheHandlerHolds)
{
    AlertHandOver handOver;
    EXPECT_FALSE(handOver.isFull());
    const DateTime when(2024, 1, 2, 3, 4, 5, 6, 1);
    const auto ticket = handOver.put(when, "/bmc0/sel");
    EXPECT_TRUE(handOver.isFull());
    const auto [record, taken] = handOver.take();
    EXPECT_EQ(taken, ticket);
    EXPECT_EQ(record.time, when);
    EXPECT_EQ(record.nodePath, "/bmc0/sel");
    // Copying does not free it: the handler holds it until it lets go.
    EXPECT_TRUE(handOver.isFull());
    handOver.release(ticket);
    EXPECT_FALSE(handOver.isFull());
    EXPECT_EQ(handOver.current().nodePath, "/bmc0/sel");
}

TEST(HandOver, TicketsFollowTheOrderOfTheAlerts)
{
    AlertHandOver handOver;
    const auto first = handOver.put(DateTime(), "/a");
    handOver.release(first);
    const auto start = Clock::now();
    const auto second = handOver.put(DateTime(), "/b");
    EXPECT_LT(Clock::now() - start, AlertHandOver::handOverWait);
    EXPECT_EQ(second, first + 1);
    EXPECT_EQ(handOver.take().first.nodePath, "/b");
}

TEST(HandOver, TheHandlerWaitsUntilItsThreadHasDelivered)
{
    AlertHandOver handOver;
    const auto ticket = handOver.put(DateTime(), "/x");
    std::thread delivery(
        [&]
        {
            const auto taken = handOver.take().second;
            std::this_thread::sleep_for(std::chrono::milliseconds(20));
            handOver.delivered(taken);
        });
    const auto start = Clock::now();
    EXPECT_TRUE(handOver.awaitDelivered(ticket));
    EXPECT_GE(Clock::now() - start, std::chrono::milliseconds(20));
    delivery.join();
}

TEST(HandOver, TheWaitForADeliveryIsBounded)
{
    AlertHandOver handOver;
    const auto first = handOver.put(DateTime(), "/first");
    handOver.release(first);
    const auto second = handOver.put(DateTime(), "/second");
    // The delivery of the alert before does not end the wait for this one.
    handOver.delivered(first);
    const auto start = Clock::now();
    EXPECT_FALSE(handOver.awaitDelivered(second));
    EXPECT_GE(Clock::now() - start, AlertHandOver::deliveryWait);
    // Nor does a late one, after a later alert was delivered.
    handOver.delivered(second);
    handOver.delivered(first);
    EXPECT_TRUE(handOver.awaitDelivered(second));
}

TEST(HandOver, ARecordStillHeldIsTakenOverAfterTheWait)
{
    AlertHandOver handOver;
    const auto first = handOver.put(DateTime(), "/first");
    const auto start = Clock::now();
    const auto second = handOver.put(DateTime(), "/second");
    EXPECT_GE(Clock::now() - start, AlertHandOver::handOverWait);
    EXPECT_EQ(second, first + 1);
    // The handler of the first alert letting go leaves the second held.
    handOver.release(first);
    EXPECT_TRUE(handOver.isFull());
    const auto [record, ticket] = handOver.take();
    EXPECT_EQ(record.nodePath, "/second");
    EXPECT_EQ(ticket, second);
    handOver.release(second);
    EXPECT_FALSE(handOver.isFull());
}

TEST(HandOver, AHandlerWaitingForTheRecordGetsItOnceItIsReleased)
{
    AlertHandOver handOver;
    const auto first = handOver.put(DateTime(), "/first");
    std::thread releaser(
        [&]
        {
            std::this_thread::sleep_for(std::chrono::milliseconds(20));
            handOver.release(first);
        });
    const auto start = Clock::now();
    const auto second = handOver.put(DateTime(), "/second");
    EXPECT_LT(Clock::now() - start, AlertHandOver::handOverWait);
    releaser.join();
    const auto [record, ticket] = handOver.take();
    EXPECT_EQ(record.nodePath, "/second");
    EXPECT_EQ(ticket, second);
}

TEST(HandOver, TheThreadSideNeverWaits)
{
    AlertHandOver handOver;
    const auto held = handOver.put(DateTime(), "/held");
    // Another handler waits for the record meanwhile.
    std::thread waiting([&] { handOver.put(DateTime(), "/next"); });
    const auto start = Clock::now();
    for (int i = 0; i < 100; ++i)
    {
        const auto taken = handOver.take().second;
        handOver.delivered(taken);
    }
    EXPECT_LT(Clock::now() - start, AlertHandOver::handOverWait / 2);
    handOver.release(held);
    waiting.join();
    EXPECT_EQ(handOver.take().first.nodePath, "/next");
}

} // namespace
