// Speed of the read path at three depths: the instrumentation walk alone,
// the gathering into records, and whole CMPI requests through the loaded
// provider library and the in-process broker.
#include "CVLogger.h"
#include "Fixture.h"
#include "FixtureGenerator.h"
#include "Host.h"
#include "Instrumentation.h"
#include "MemorySource.h"
#include "Platform.h"
#include "SEL.h"
#include "SelClasses.h"

#include <sstream>

#include <benchmark/benchmark.h>

namespace
{

std::shared_ptr<QX::MemorySource> generatedSource(unsigned entries)
{
    std::stringstream fixture;
    QX::writeGeneratedFixture(fixture, entries, 65535);
    return std::make_shared<QX::MemorySource>(
        QX::parseFixture(fixture, "generated"));
}

void useGenerated(unsigned entries)
{
    CVLog::CVLogger::setSink(nullptr);
    QX::Platform::overrideSource(generatedSource(entries));
}

void BM_CursorWalk(benchmark::State& state)
{
    const auto source = generatedSource(static_cast<unsigned>(state.range(0)));
    for (auto _ : state)
    {
        QX::Instrumentation cursor(source);
        cursor.selectNode(QX::NodeLexicon::EventLogEntry);
        unsigned count = 0;
        while (cursor)
        {
            unsigned id = 0;
            cursor.getProperty(QX::NodeLexicon::RecordId, id);
            count += id != 0;
            ++cursor;
        }
        benchmark::DoNotOptimize(count);
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
}
BENCHMARK(BM_CursorWalk)->Arg(1000)->Arg(65535)->Unit(benchmark::kMillisecond);

void BM_GatherEntries(benchmark::State& state)
{
    useGenerated(static_cast<unsigned>(state.range(0)));
    for (auto _ : state)
    {
        QX::SELComposite::EntryMap entries;
        benchmark::DoNotOptimize(
            QX::SELComposite::getMgmtHwLogEntryInstances(entries));
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
    QX::Platform::overrideSource(nullptr);
}
BENCHMARK(BM_GatherEntries)
    ->Arg(1000)
    ->Arg(65535)
    ->Unit(benchmark::kMillisecond);

void BM_EnumerateEntryInstances(benchmark::State& state)
{
    useGenerated(static_cast<unsigned>(state.range(0)));
    host::Host host(selclasses::hostOptions(SELPROV_LIBRARY));
    host::ObjectPath reference;
    reference.nameSpace = "root/zanqx";
    reference.className = "ZAN_MgmtHwLogEntry";
    for (auto _ : state)
    {
        const auto outcome = host.enumerateInstances(reference);
        benchmark::DoNotOptimize(outcome.instances.size());
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
    QX::Platform::overrideSource(nullptr);
}
BENCHMARK(BM_EnumerateEntryInstances)
    ->Arg(1000)
    ->Arg(65535)
    ->Unit(benchmark::kMillisecond);

void BM_GetOneEntry(benchmark::State& state)
{
    useGenerated(static_cast<unsigned>(state.range(0)));
    host::Host host(selclasses::hostOptions(SELPROV_LIBRARY));
    host::ObjectPath reference;
    reference.nameSpace = "root/zanqx";
    reference.className = "ZAN_MgmtHwLogEntry";
    const auto names = host.enumerateInstanceNames(reference);
    const host::ObjectPath target = names.paths.at(names.paths.size() / 2);
    for (auto _ : state)
    {
        const auto outcome = host.getInstance(target);
        benchmark::DoNotOptimize(outcome.instances.size());
    }
    QX::Platform::overrideSource(nullptr);
}
BENCHMARK(BM_GetOneEntry)->Arg(1000)->Arg(65535)->Unit(benchmark::kMillisecond);

} // namespace
