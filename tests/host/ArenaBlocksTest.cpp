// Request arenas: objects end with the arena, and the blocks they lived in
// go back to the broker's cache for the next request.
#include "BlockCache.h"
#include "BrokerState.h"
#include "Objects.h"

#include <gtest/gtest.h>

namespace
{

using host::detail::Arena;
using host::detail::BlockCache;

TEST(ArenaBlocks, HandsABlockGivenBackToTheNextRequestOfItsSize)
{
    BlockCache cache(1 << 20);
    void* first = cache.allocate(4096, 16);
    cache.deallocate(first, 4096, 16);
    EXPECT_EQ(cache.cachedBytes(), 4096u);
    void* other = cache.allocate(8192, 16);
    EXPECT_NE(other, first);
    void* again = cache.allocate(4096, 16);
    EXPECT_EQ(again, first);
    EXPECT_EQ(cache.cachedBytes(), 0u);
    cache.deallocate(again, 4096, 16);
    cache.deallocate(other, 8192, 16);
}

TEST(ArenaBlocks, KeepsNoMoreThanItsLimit)
{
    BlockCache cache(10000);
    void* a = cache.allocate(6000, 16);
    void* b = cache.allocate(6000, 16);
    cache.deallocate(a, 6000, 16);
    cache.deallocate(b, 6000, 16); // over the limit: freed at once
    EXPECT_EQ(cache.cachedBytes(), 6000u);
}

TEST(ArenaBlocks, ObjectsEndWithTheArenaAndItsBlocksReturnToTheCache)
{
    host::detail::BrokerState state(host::Schema{});
    const std::size_t before = state.arenaBlocks.cachedBytes();
    {
        Arena arena(&state.arenaBlocks);
        for (int i = 0; i < 1000; ++i)
        {
            auto* text = arena.make<host::detail::StringObject>(state);
            text->text = "a text longer than the inline part of a string";
        }
        auto* context = arena.make<host::detail::ContextObject>(state);
        EXPECT_TRUE(state.isLiveContext(&context->cmpi));
        EXPECT_EQ(arena.size(), 1001u);
        arena.clear();
        EXPECT_EQ(arena.size(), 0u);
        // Its destructor ran: a context takes itself off the broker's list.
        EXPECT_FALSE(state.isLiveContext(&context->cmpi));
    }
    EXPECT_GT(state.arenaBlocks.cachedBytes(), before);
}

} // namespace
