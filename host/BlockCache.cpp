#include "BlockCache.h"

namespace host::detail
{

BlockCache::~BlockCache()
{
    for (const auto& [shape, block] : blocks_)
    {
        std::pmr::new_delete_resource()->deallocate(block, shape.first,
                                                    shape.second);
    }
}

std::size_t BlockCache::cachedBytes() const
{
    const std::lock_guard lock(mutex_);
    return cachedBytes_;
}

void* BlockCache::do_allocate(std::size_t bytes, std::size_t alignment)
{
    {
        const std::lock_guard lock(mutex_);
        const auto found = blocks_.find({bytes, alignment});
        if (found != blocks_.end())
        {
            void* block = found->second;
            blocks_.erase(found);
            cachedBytes_ -= bytes;
            return block;
        }
    }
    return std::pmr::new_delete_resource()->allocate(bytes, alignment);
}

void BlockCache::do_deallocate(void* block, std::size_t bytes,
                               std::size_t alignment)
{
    {
        const std::lock_guard lock(mutex_);
        if (cachedBytes_ + bytes <= limit_)
        {
            try
            {
                blocks_.emplace(std::pair{bytes, alignment}, block);
                cachedBytes_ += bytes;
                return;
            }
            catch (const std::bad_alloc&)
            {
                // No room to remember the block: give it back below.
            }
        }
    }
    std::pmr::new_delete_resource()->deallocate(block, bytes, alignment);
}

} // namespace host::detail
