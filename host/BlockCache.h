// Memory for request arenas, kept from one request to the next.
#pragma once

#include <cstddef>
#include <map>
#include <memory_resource>
#include <mutex>
#include <utility>

namespace host::detail
{

// Keeps the blocks that request arenas give back, up to a limit, and hands
// them to the next arena that asks for the same size. An arena takes its
// blocks in the same growing sizes every time, so a large request's
// objects land in memory already mapped, instead of in fresh pages the
// system has to find and clear for each request. Thread-safe.
class BlockCache final : public std::pmr::memory_resource
{
  public:
    explicit BlockCache(std::size_t limitBytes) : limit_(limitBytes) {}
    ~BlockCache() override;
    BlockCache(const BlockCache&) = delete;
    BlockCache& operator=(const BlockCache&) = delete;

    std::size_t cachedBytes() const;

  private:
    void* do_allocate(std::size_t bytes, std::size_t alignment) override;
    void do_deallocate(void* block, std::size_t bytes,
                       std::size_t alignment) override;
    bool
    do_is_equal(const std::pmr::memory_resource& other) const noexcept override
    {
        return this == &other;
    }

    const std::size_t limit_;
    mutable std::mutex mutex_;
    // By size and alignment.
    std::multimap<std::pair<std::size_t, std::size_t>, void*> blocks_;
    std::size_t cachedBytes_ = 0;
};

} // namespace host::detail
