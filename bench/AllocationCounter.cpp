// Replaces the global allocation functions of the benchmark binary so that
// the benchmarks can report the bytes a request allocates and the peak of
// what it holds at once. Sizes come from malloc_usable_size, so frees need
// no size and the tally counts what the allocator really hands out.
#include "AllocationCounter.h"

#include <atomic>
#include <cstdlib>
#include <malloc.h>
#include <new>

namespace
{

std::atomic<std::uint64_t> allocated{0};
std::atomic<std::int64_t> live{0};
std::atomic<std::int64_t> peak{0};
std::atomic<bool> counting{true};

void* counted(void* block)
{
    if (block == nullptr || !counting.load(std::memory_order_relaxed))
    {
        return block;
    }
    const auto size = static_cast<std::int64_t>(malloc_usable_size(block));
    allocated.fetch_add(static_cast<std::uint64_t>(size),
                        std::memory_order_relaxed);
    const std::int64_t now =
        live.fetch_add(size, std::memory_order_relaxed) + size;
    std::int64_t high = peak.load(std::memory_order_relaxed);
    while (now > high &&
           !peak.compare_exchange_weak(high, now, std::memory_order_relaxed))
    {
    }
    return block;
}

void uncount(void* block)
{
    if (block != nullptr && counting.load(std::memory_order_relaxed))
    {
        live.fetch_sub(static_cast<std::int64_t>(malloc_usable_size(block)),
                       std::memory_order_relaxed);
    }
}

void* allocate(std::size_t size)
{
    void* block = counted(std::malloc(size == 0 ? 1 : size));
    if (block == nullptr)
    {
        throw std::bad_alloc();
    }
    return block;
}

void* allocateAligned(std::size_t size, std::align_val_t alignment)
{
    void* block = nullptr;
    const auto align = static_cast<std::size_t>(alignment);
    if (posix_memalign(&block, align < sizeof(void*) ? sizeof(void*) : align,
                       size == 0 ? 1 : size) != 0)
    {
        throw std::bad_alloc();
    }
    return counted(block);
}

void release(void* block) noexcept
{
    uncount(block);
    std::free(block);
}

} // namespace

namespace bench
{

HeapTally heapTally()
{
    return {allocated.load(std::memory_order_relaxed),
            live.load(std::memory_order_relaxed),
            peak.load(std::memory_order_relaxed)};
}

void countAllocations(bool on)
{
    counting.store(on, std::memory_order_relaxed);
}

void resetPeak()
{
    peak.store(live.load(std::memory_order_relaxed), std::memory_order_relaxed);
}

} // namespace bench

void* operator new(std::size_t size)
{
    return allocate(size);
}
void* operator new[](std::size_t size)
{
    return allocate(size);
}
void* operator new(std::size_t size, const std::nothrow_t&) noexcept
{
    return counted(std::malloc(size == 0 ? 1 : size));
}
void* operator new[](std::size_t size, const std::nothrow_t&) noexcept
{
    return counted(std::malloc(size == 0 ? 1 : size));
}
void* operator new(std::size_t size, std::align_val_t alignment)
{
    return allocateAligned(size, alignment);
}
void* operator new[](std::size_t size, std::align_val_t alignment)
{
    return allocateAligned(size, alignment);
}
void operator delete(void* block) noexcept
{
    release(block);
}
void operator delete[](void* block) noexcept
{
    release(block);
}
void operator delete(void* block, std::size_t) noexcept
{
    release(block);
}
void operator delete[](void* block, std::size_t) noexcept
{
    release(block);
}
void operator delete(void* block, std::align_val_t) noexcept
{
    release(block);
}
void operator delete[](void* block, std::align_val_t) noexcept
{
    release(block);
}
void operator delete(void* block, std::size_t, std::align_val_t) noexcept
{
    release(block);
}
void operator delete[](void* block, std::size_t, std::align_val_t) noexcept
{
    release(block);
}
