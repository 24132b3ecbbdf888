// The tree a source hands to one request's cursors: given back to the same
// thread while one of its cursors holds it, asked for again once they let
// go, after forget(), on another thread and from another source.

#include "ipmi/RequestSnapshot.h"

#include "platform/TestTrees.h"

#include <memory>
#include <thread>

#include <gtest/gtest.h>

using QX::NodeTree;
using QX::Ipmi::RequestSnapshot;

TEST(RequestSnapshot, NothingIsHeldBeforeATreeIsHandedOut)
{
    const RequestSnapshot handed;
    EXPECT_EQ(handed.held(), nullptr);
}

TEST(RequestSnapshot, GivesTheTreeBackWhileACursorHoldsIt)
{
    const RequestSnapshot handed;
    const auto tree = QX::test::twoControllerTree();
    const auto first = handed.handOut(tree);
    ASSERT_EQ(first.get(), tree.get());
    const auto second = handed.held();
    EXPECT_EQ(second.get(), tree.get());
}

TEST(RequestSnapshot, TheSourcesOwnReferenceDoesNotCountAsHeld)
{
    const RequestSnapshot handed;
    const auto tree = QX::test::twoControllerTree();
    {
        const auto cursor = handed.handOut(tree);
        ASSERT_NE(handed.held(), nullptr);
    }
    // The request ended: the next one asks the BMC again.
    EXPECT_EQ(handed.held(), nullptr);
    EXPECT_EQ(tree.use_count(), 1);
}

TEST(RequestSnapshot, ANewerHandOutReplacesTheOlderOne)
{
    const RequestSnapshot handed;
    const auto older = QX::test::twoControllerTree();
    const auto newer = QX::test::twoControllerTree();
    const auto olderCursor = handed.handOut(older);
    const auto newerCursor = handed.handOut(newer);
    EXPECT_EQ(handed.held().get(), newer.get());
}

TEST(RequestSnapshot, ForgetMakesAHeldTreeStale)
{
    RequestSnapshot handed;
    const auto cursor = handed.handOut(QX::test::twoControllerTree());
    handed.forget();
    EXPECT_EQ(handed.held(), nullptr);
    // What is handed out after the forget is given back again.
    const auto next = handed.handOut(QX::test::twoControllerTree());
    EXPECT_EQ(handed.held().get(), next.get());
}

TEST(RequestSnapshot, AnotherThreadIsNotGivenThisThreadsTree)
{
    const RequestSnapshot handed;
    const auto cursor = handed.handOut(QX::test::twoControllerTree());
    std::shared_ptr<const NodeTree> there = cursor;
    std::thread other([&] { there = handed.held(); });
    other.join();
    EXPECT_EQ(there, nullptr);
    EXPECT_EQ(handed.held().get(), cursor.get());
}

TEST(RequestSnapshot, AnotherSourceIsNotGivenThisSourcesTree)
{
    const RequestSnapshot one;
    const RequestSnapshot two;
    const auto cursor = one.handOut(QX::test::twoControllerTree());
    EXPECT_EQ(two.held(), nullptr);
    EXPECT_EQ(one.held().get(), cursor.get());
}

TEST(RequestSnapshot, NoTreeIsHandedOutAsNone)
{
    const RequestSnapshot handed;
    EXPECT_EQ(handed.handOut(nullptr), nullptr);
    EXPECT_EQ(handed.held(), nullptr);
}
