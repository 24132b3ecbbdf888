// The hand-over slot between an alert handler and its delivery thread.
#include "AlertHandOver.h"

#include <chrono>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

namespace
{

using QX::DateTime;
using QX::SELComposite::AlertHandOver;

TEST(AlertHandOver, ATakenRecordFreesTheSlotAndKeepsItsData)
{
    AlertHandOver slot;
    const DateTime when(2024, 1, 2, 3, 4, 5, 6, 1);
    const auto ticket = slot.put(when, "/bmc0/sel");
    EXPECT_TRUE(slot.isFull());
    const auto [record, taken] = slot.take();
    EXPECT_EQ(taken, ticket);
    EXPECT_EQ(record.time, when);
    EXPECT_EQ(record.nodePath, "/bmc0/sel");
    EXPECT_FALSE(slot.isFull());
    EXPECT_TRUE(slot.awaitTaken(ticket));
}

TEST(AlertHandOver, AWithdrawnRecordFreesTheSlot)
{
    AlertHandOver slot;
    const auto first = slot.put(DateTime(), "/a");
    slot.withdraw(first);
    EXPECT_FALSE(slot.isFull());
    const auto start = std::chrono::steady_clock::now();
    const auto second = slot.put(DateTime(), "/b");
    EXPECT_LT(std::chrono::steady_clock::now() - start,
              AlertHandOver::handOverWait);
    EXPECT_EQ(second, first + 1);
    // The withdrawn ticket does not hold the next one back.
    const auto begin = std::chrono::steady_clock::now();
    slot.awaitTurn(second);
    EXPECT_LT(std::chrono::steady_clock::now() - begin,
              AlertHandOver::turnWait);
}

TEST(AlertHandOver, AnUntakenRecordIsOverwrittenAfterTheWait)
{
    AlertHandOver slot;
    slot.put(DateTime(), "/first");
    const auto start = std::chrono::steady_clock::now();
    const auto second = slot.put(DateTime(), "/second");
    EXPECT_GE(std::chrono::steady_clock::now() - start,
              AlertHandOver::handOverWait);
    // Both threads now copy the later alert.
    EXPECT_EQ(slot.take().first.nodePath, "/second");
    const auto [again, ticket] = slot.take();
    EXPECT_EQ(again.nodePath, "/second");
    EXPECT_EQ(ticket, second);
}

TEST(AlertHandOver, AHandlerWaitsForItsThreadToTakeTheRecord)
{
    AlertHandOver slot;
    const auto ticket = slot.put(DateTime(), "/x");
    std::thread taker(
        [&]
        {
            std::this_thread::sleep_for(std::chrono::milliseconds(20));
            slot.take();
        });
    EXPECT_TRUE(slot.awaitTaken(ticket));
    taker.join();
}

TEST(AlertHandOver, ThreadsTakeTheirTurnInTicketOrder)
{
    AlertHandOver slot;
    std::vector<AlertHandOver::Ticket> tickets;
    for (int i = 0; i < 3; ++i)
    {
        tickets.push_back(slot.put(DateTime(), "/" + std::to_string(i)));
        slot.take();
    }
    std::vector<int> order;
    std::mutex orderMutex;
    std::vector<std::thread> threads;
    for (int i = 2; i >= 0; --i)
    {
        threads.emplace_back(
            [&, i]
            {
                slot.awaitTurn(tickets[static_cast<std::size_t>(i)]);
                {
                    const std::lock_guard lock(orderMutex);
                    order.push_back(i);
                }
                slot.finish(tickets[static_cast<std::size_t>(i)]);
            });
    }
    for (auto& thread : threads)
    {
        thread.join();
    }
    EXPECT_EQ(order, (std::vector<int>{0, 1, 2}));
}

} // namespace
