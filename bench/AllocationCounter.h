// Heap use of the benchmark process, counted by its own global operator
// new and delete (AllocationCounter.cpp): every allocation of the binary
// and of the libraries it loads goes through them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace bench
{

struct HeapTally
{
    std::uint64_t allocatedBytes = 0; // all bytes handed out so far
    std::int64_t liveBytes = 0;       // bytes handed out and not yet freed
    std::int64_t peakLiveBytes = 0;   // highest liveBytes since resetPeak()
};

HeapTally heapTally();
// Starts a new peak at the current live bytes.
void resetPeak();
// Counting is on at start. Off, allocations cost what they cost without
// the counter, for timing; blocks freed while it is off are not subtracted,
// so tallies compare only between points where it was on throughout.
void countAllocations(bool on);

// One heap operation of a recorded run: a block of @c size bytes placed in
// @c slot, or, with size 0, the block in @c slot freed. Slots are reused
// once their block is freed, so there are as many as blocks live at once.
struct HeapOperation
{
    std::uint32_t slot = 0;
    std::uint32_t size = 0;
};

struct HeapRecording
{
    std::vector<HeapOperation> operations;
    std::size_t slots = 0;
    std::uint64_t allocatedBytes = 0;
    std::uint64_t peakLiveBytes = 0; // of the blocks made while recording
};

// Records every allocation and free of the process, up to @p capacity of
// them, until stopRecording(). Frees of blocks made before are left out.
void startRecording(std::size_t capacity);
// The recorded operations; false if there were more than the capacity.
bool stopRecording(HeapRecording& recording);
// Performs the recorded operations with malloc and free alone, writing
// every block in full as the code that asked for it would, and frees
// what they leave: the heap work of the recorded run without its work.
void replay(const HeapRecording& recording);
// The same blocks, written in full, but placed one after the other in a
// region kept from one call to the next, and none freed: the cost of the
// recorded run's heap traffic were its objects taken from an arena of its
// own that is dropped as a whole.
void replayIntoArena(const HeapRecording& recording);

} // namespace bench
