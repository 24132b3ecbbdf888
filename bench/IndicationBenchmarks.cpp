// Latency of the whole indication path: from an alert raised on the
// in-memory source to the indication delivered in the host, through the
// source's dispatcher thread, the provider's alert handler, its delivery
// thread and the broker.
#include "CVLogger.h"
#include "Host.h"
#include "MemorySource.h"
#include "NodeTree.h"
#include "Platform.h"
#include "SelClasses.h"

#include <algorithm>
#include <chrono>
#include <vector>

#include <benchmark/benchmark.h>

namespace
{

using namespace QX::NodeLexicon;

std::shared_ptr<QX::MemorySource> oneEntrySource()
{
    QX::NodeTreeBuilder tree;
    tree.addNode(ManagementController, "/bmc0", "", "BMC", 1)
        .addNode(EventLog, "/bmc0/sel", "/bmc0", "SEL", 1)
        .setProperty("/bmc0/sel", Name, std::string("IPMI SEL Log"));
    const std::string entry = QX::MemorySource::entryPath("/bmc0/sel", 1);
    tree.addNode(EventLogEntry, entry, "/bmc0/sel", "Fan FAN3: low", 1)
        .setProperty(entry, RecordId, 1u);
    return std::make_shared<QX::MemorySource>(tree.build());
}

// Each iteration raises 1,000 alerts one after the other and waits for
// each indication; the counters give the median and the worst latency.
void BM_AlertToDeliveredIndication(benchmark::State& state)
{
    constexpr int alerts = 1000;
    CVLog::CVLogger::setSink(nullptr);
    const auto source = oneEntrySource();
    QX::Platform::overrideSource(source);
    std::vector<double> micros;
    {
        host::Host host(selclasses::hostOptions(SELPROV_LIBRARY));
        host::IndicationInbox inbox = host.listen("root/zanqx");
        const auto filter = selclasses::filterFor("ZAN_MgmtHwLogEntryEvent");
        host.activateFilter(filter, true);
        host.enableIndications();
        const std::string entry = QX::MemorySource::entryPath("/bmc0/sel", 1);
        const QX::DateTime when(2024, 5, 6, 7, 8, 9, 0, 0);
        for (auto _ : state)
        {
            for (int i = 0; i < alerts; ++i)
            {
                const auto start = std::chrono::steady_clock::now();
                source->raiseAlert(entry, when);
                const auto delivered = inbox.next(std::chrono::seconds(10));
                const auto end = std::chrono::steady_clock::now();
                if (!delivered)
                {
                    state.SkipWithError("an indication did not arrive");
                    break;
                }
                micros.push_back(
                    std::chrono::duration<double, std::micro>(end - start)
                        .count());
            }
        }
        host.disableIndications();
        source->waitForAlerts(std::chrono::seconds(10));
        host.broker().waitForThreads(std::chrono::seconds(10));
    }
    QX::Platform::overrideSource(nullptr);
    if (micros.empty())
    {
        return;
    }
    std::sort(micros.begin(), micros.end());
    state.counters["median_us"] = micros[micros.size() / 2];
    state.counters["p99_us"] = micros[micros.size() * 99 / 100];
    state.counters["worst_us"] = micros.back();
    state.counters["alerts"] = static_cast<double>(micros.size());
}
BENCHMARK(BM_AlertToDeliveredIndication)
    ->Iterations(1)
    ->Unit(benchmark::kMillisecond);

} // namespace
