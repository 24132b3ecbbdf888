// Replaces the global allocation functions of the benchmark binary so that
// the benchmarks can report the bytes a request allocates and the peak of
// what it holds at once. Sizes come from malloc_usable_size, so frees need
// no size and the tally counts what the allocator really hands out.
#include "AllocationCounter.h"

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <cstring>
#include <malloc.h>
#include <new>
#include <unordered_map>

namespace
{

std::atomic<std::uint64_t> allocated{0};
std::atomic<std::int64_t> live{0};
std::atomic<std::int64_t> peak{0};
std::atomic<bool> counting{true};

// The raw record: block and requested size, 0 for a free. Its storage
// comes from malloc, so recording does not record itself.
struct RawOperation
{
    void* block;
    std::size_t size;
};
std::atomic<bool> recording{false};
RawOperation* recorded = nullptr;
std::size_t recordCapacity = 0;
std::atomic<std::size_t> recordCount{0};

void record(void* block, std::size_t size)
{
    if (block == nullptr || !recording.load(std::memory_order_acquire))
    {
        return;
    }
    const std::size_t at = recordCount.fetch_add(1, std::memory_order_relaxed);
    if (at < recordCapacity)
    {
        recorded[at] = {block, size};
    }
}

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
    record(block, size == 0 ? 1 : size);
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
    record(block, size == 0 ? 1 : size);
    return counted(block);
}

void release(void* block) noexcept
{
    record(block, 0);
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

void startRecording(std::size_t capacity)
{
    std::free(recorded);
    recorded = static_cast<RawOperation*>(
        std::malloc(capacity * sizeof(RawOperation)));
    recordCapacity = recorded == nullptr ? 0 : capacity;
    recordCount.store(0, std::memory_order_relaxed);
    recording.store(true, std::memory_order_seq_cst);
}

bool stopRecording(HeapRecording& result)
{
    recording.store(false, std::memory_order_seq_cst);
    const std::size_t count = recordCount.load(std::memory_order_relaxed);
    result = HeapRecording{};
    if (count > recordCapacity)
    {
        return false;
    }
    result.operations.reserve(count);
    std::unordered_map<void*, HeapOperation> live;
    std::vector<std::uint32_t> freeSlots;
    std::uint64_t liveBytes = 0;
    for (std::size_t i = 0; i < count; ++i)
    {
        const RawOperation& raw = recorded[i];
        if (raw.size != 0)
        {
            HeapOperation made{0, static_cast<std::uint32_t>(raw.size)};
            if (freeSlots.empty())
            {
                made.slot = static_cast<std::uint32_t>(result.slots++);
            }
            else
            {
                made.slot = freeSlots.back();
                freeSlots.pop_back();
            }
            live[raw.block] = made;
            result.operations.push_back(made);
            result.allocatedBytes += made.size;
            liveBytes += made.size;
            result.peakLiveBytes = std::max(result.peakLiveBytes, liveBytes);
            continue;
        }
        const auto found = live.find(raw.block);
        if (found == live.end())
        {
            continue;
        }
        result.operations.push_back({found->second.slot, 0});
        freeSlots.push_back(found->second.slot);
        liveBytes -= found->second.size;
        live.erase(found);
    }
    std::free(recorded);
    recorded = nullptr;
    recordCapacity = 0;
    return true;
}

void replay(const HeapRecording& recording)
{
    std::vector<void*> slots(recording.slots, nullptr);
    for (const HeapOperation& operation : recording.operations)
    {
        void*& block = slots[operation.slot];
        if (operation.size == 0)
        {
            std::free(block);
            block = nullptr;
            continue;
        }
        block = std::malloc(operation.size);
        if (block == nullptr)
        {
            throw std::bad_alloc();
        }
        std::memset(block, 0x5a, operation.size);
    }
    for (void* block : slots)
    {
        std::free(block);
    }
}

void replayIntoArena(const HeapRecording& recording)
{
    constexpr std::size_t alignment = alignof(std::max_align_t);
    static std::vector<unsigned char> region;
    const std::size_t needed =
        recording.allocatedBytes + recording.operations.size() * alignment;
    if (region.size() < needed)
    {
        region.resize(needed);
    }
    std::size_t at = 0;
    for (const HeapOperation& operation : recording.operations)
    {
        if (operation.size != 0)
        {
            std::memset(region.data() + at, 0x5a, operation.size);
            at += (operation.size + alignment - 1) / alignment * alignment;
        }
    }
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
