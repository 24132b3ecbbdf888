// Heap use of the benchmark process, counted by its own global operator
// new and delete (AllocationCounter.cpp): every allocation of the binary
// and of the libraries it loads goes through them.
#pragma once

#include <cstdint>

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

} // namespace bench
