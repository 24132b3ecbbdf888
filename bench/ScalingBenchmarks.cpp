// Cost per log entry of whole instance requests, through the loaded
// provider library and the in-process broker, on generated logs of 4,096
// and 65,535 entries. Each benchmark reports:
//   per_entry            CPU time of one request divided by the entries
//   bytes_per_entry      heap bytes the request allocates, per entry
//   peak_bytes_per_entry the most heap the request holds at once, per entry
// The heap figures come from one counted request; the timed requests run
// with the allocation counter off.
// A request whose cost per entry stays flat as the log grows is linear;
// bench/scaling.sh prints the ratios between the sizes.
//
// HeapReplayEnumerate records every allocation and free of one
// EnumerateInstances and times them again with malloc and free alone, each
// block written in full: the cost of the request's heap traffic on this
// machine without the request's work. Its ratio is how much of the growth
// per entry the allocator and the memory system give by themselves.
// HeapReplayArena places the same blocks one after the other in a region
// kept between requests and frees nothing, as an arena per request would.
#include "AllocationCounter.h"
#include "CVLogger.h"
#include "Fixture.h"
#include "FixtureGenerator.h"
#include "Host.h"
#include "MemorySource.h"
#include "Platform.h"
#include "SelClasses.h"

#include <functional>
#include <sstream>

#include <benchmark/benchmark.h>

namespace
{

void useGeneratedLog(unsigned entries)
{
    CVLog::CVLogger::setSink(nullptr);
    std::stringstream fixture;
    QX::writeGeneratedFixture(fixture, entries, 65535);
    QX::Platform::overrideSource(std::make_shared<QX::MemorySource>(
        QX::parseFixture(fixture, "generated")));
}

host::ObjectPath entryClass()
{
    host::ObjectPath reference;
    reference.nameSpace = "root/zanqx";
    reference.className = "ZAN_MgmtHwLogEntry";
    return reference;
}

// Runs @p request once per iteration and sets the per-entry counters;
// @p request returns how many results it got, which must be @p expected.
void measure(benchmark::State& state, std::size_t expected,
             const std::function<std::size_t()>& request)
{
    const auto entries = static_cast<double>(state.range(0));
    // One request first, untimed: the allocator settles on the size of
    // the request, whatever the benchmarks before this one left behind.
    request();
    // One counted request for the heap figures, then the timed ones with
    // the counter off, so that the time is the request's own.
    bench::resetPeak();
    const bench::HeapTally before = bench::heapTally();
    const bool complete = request() == expected;
    const bench::HeapTally after = bench::heapTally();
    bench::countAllocations(false);
    for (auto _ : state)
    {
        if (!complete || request() != expected)
        {
            state.SkipWithError("the request returned the wrong count");
            break;
        }
    }
    bench::countAllocations(true);
    using benchmark::Counter;
    state.counters["per_entry"] =
        Counter(entries, Counter::kIsIterationInvariantRate | Counter::kInvert);
    state.counters["bytes_per_entry"] = Counter(
        static_cast<double>(after.allocatedBytes - before.allocatedBytes) /
        entries);
    state.counters["peak_bytes_per_entry"] = Counter(
        static_cast<double>(after.peakLiveBytes - before.liveBytes) / entries);
}

// Records the heap operations of one run of @p request and times @p replay
// of them; the counters are those of measure().
void measureHeapReplay(benchmark::State& state,
                       const std::function<std::size_t()>& request,
                       void (*replay)(const bench::HeapRecording&))
{
    const auto entries = static_cast<double>(state.range(0));
    request();
    // Generously more than the 100 or so operations a request makes per
    // entry; a recording that overflows is reported, not replayed.
    bench::startRecording(static_cast<std::size_t>(entries) * 400 + 100000);
    request();
    bench::HeapRecording recording;
    if (!bench::stopRecording(recording))
    {
        state.SkipWithError("the request made more heap operations than "
                            "the recording holds");
        return;
    }
    replay(recording);
    bench::countAllocations(false);
    for (auto _ : state)
    {
        replay(recording);
    }
    bench::countAllocations(true);
    using benchmark::Counter;
    state.counters["per_entry"] =
        Counter(entries, Counter::kIsIterationInvariantRate | Counter::kInvert);
    state.counters["bytes_per_entry"] =
        Counter(static_cast<double>(recording.allocatedBytes) / entries);
    state.counters["peak_bytes_per_entry"] =
        Counter(static_cast<double>(recording.peakLiveBytes) / entries);
}

// Runs @p run with a host on a generated log of state.range(0) entries.
template <typename Run>
void onGeneratedLog(benchmark::State& state, const Run& run)
{
    const auto entries = static_cast<unsigned>(state.range(0));
    useGeneratedLog(entries);
    {
        host::Host host(selclasses::hostOptions(SELPROV_LIBRARY));
        run(host, entries);
    }
    QX::Platform::overrideSource(nullptr);
}

void BM_ScalingEnumerateInstances(benchmark::State& state)
{
    onGeneratedLog(state,
                   [&](host::Host& host, unsigned entries)
                   {
                       measure(state, entries,
                               [&] {
                                   return host.enumerateInstances(entryClass())
                                       .instances.size();
                               });
                   });
}

void BM_ScalingEnumerateInstanceNames(benchmark::State& state)
{
    onGeneratedLog(state,
                   [&](host::Host& host, unsigned entries)
                   {
                       measure(state, entries,
                               [&] {
                                   return host
                                       .enumerateInstanceNames(entryClass())
                                       .paths.size();
                               });
                   });
}

// One entry, from the middle of the log, by its full path.
void BM_ScalingGetInstance(benchmark::State& state)
{
    onGeneratedLog(
        state,
        [&](host::Host& host, unsigned)
        {
            const auto names = host.enumerateInstanceNames(entryClass());
            const host::ObjectPath target =
                names.paths.at(names.paths.size() / 2);
            measure(state, 1,
                    [&] { return host.getInstance(target).instances.size(); });
        });
}

void heapReplayOfEnumeration(benchmark::State& state,
                             void (*replay)(const bench::HeapRecording&))
{
    onGeneratedLog(state,
                   [&](host::Host& host, unsigned)
                   {
                       measureHeapReplay(
                           state,
                           [&] {
                               return host.enumerateInstances(entryClass())
                                   .instances.size();
                           },
                           replay);
                   });
}

void BM_ScalingHeapReplayEnumerate(benchmark::State& state)
{
    heapReplayOfEnumeration(state, bench::replay);
}

void BM_ScalingHeapReplayArena(benchmark::State& state)
{
    heapReplayOfEnumeration(state, bench::replayIntoArena);
}

void logSizes(benchmark::internal::Benchmark* b)
{
    b->Arg(4096)->Arg(65535)->Unit(benchmark::kMillisecond);
}

BENCHMARK(BM_ScalingEnumerateInstances)->Apply(logSizes);
BENCHMARK(BM_ScalingEnumerateInstanceNames)->Apply(logSizes);
BENCHMARK(BM_ScalingGetInstance)->Apply(logSizes);
BENCHMARK(BM_ScalingHeapReplayEnumerate)->Apply(logSizes);
BENCHMARK(BM_ScalingHeapReplayArena)->Apply(logSizes);

} // namespace
