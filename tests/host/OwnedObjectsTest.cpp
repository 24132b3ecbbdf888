// The objects of one scope (a request, an attached thread, the broker) end
// when the scope is cleared.
#include "BrokerState.h"
#include "Objects.h"

#include <gtest/gtest.h>

namespace
{

using host::detail::OwnedObjects;

TEST(OwnedObjects, ObjectsEndWhenTheScopeIsCleared)
{
    host::detail::BrokerState state(host::Schema{});
    OwnedObjects objects;
    for (int i = 0; i < 1000; ++i)
    {
        auto* text = objects.make<host::detail::StringObject>(state);
        text->text = "a text longer than the inline part of a string";
    }
    auto* context = objects.make<host::detail::ContextObject>(state);
    EXPECT_TRUE(state.isLiveContext(&context->cmpi));
    EXPECT_EQ(objects.size(), 1001u);
    objects.clear();
    EXPECT_EQ(objects.size(), 0u);
    // Its destructor ran: a context takes itself off the broker's list.
    EXPECT_FALSE(state.isLiveContext(&context->cmpi));
}

} // namespace
