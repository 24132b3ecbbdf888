// How long a record added to the (simulated) BMC takes to arrive as a
// delivered "ZAN_MgmtHwLogEntryEvent", and what the SEL poller costs while
// nothing changes. Needs OpenIPMI's ipmi_sim; run by hand:
//
//   build/bin/selprov_ipmi_bench
//
// Per poll interval: 100 records, each added alone over IPMI (Add SEL
// Entry) at a random phase of the poll cycle; the delay runs from the end
// of the Add SEL Entry exchange to the indication's arrival in the
// subscriber's inbox. Counters: median and worst delay in ms, and the
// IPMI requests the poller sent per poll while the SEL did not change.

#include "CVLogger.h"
#include "Host.h"
#include "IndicationInbox.h"
#include "Platform.h"
#include "SelClasses.h"
#include "SimulatedBmc.h"
#include "ipmi/IpmiSource.h"
#include "ipmi/IpmiSourceFactory.h"

#include <algorithm>
#include <chrono>
#include <random>
#include <thread>
#include <vector>

#include <benchmark/benchmark.h>

namespace
{

using Clock = std::chrono::steady_clock;

constexpr unsigned samples = 100;
constexpr unsigned idlePolls = 20;

bmcsim::Record temperatureRecord()
{
    return {0,    0,    0x02, 0,    0,    0,    0,    0x20,
            0x00, 0x04, 0x01, 0x30, 0x01, 0x57, 0x52, 0x50};
}

QX::Ipmi::Settings settingsFor(const bmcsim::SimulatedBmc& bmc, unsigned pollMs)
{
    QX::Ipmi::Settings settings;
    settings.interface = QX::Ipmi::Interface::Lan;
    settings.host = bmc.host();
    settings.user = bmc.options().user;
    settings.password = bmc.options().password;
    settings.privilege = "admin";
    settings.workarounds = {"opensesspriv"};
    settings.timeoutMs = 5000; // the default: sessions live 2.5 s idle
    settings.stateDirectory = bmc.directory() + "/platform-state";
    settings.pollIntervalMs = pollMs;
    return settings;
}

void BM_RecordAddedToDeliveredIndication(benchmark::State& state)
{
    if (!bmcsim::SimulatedBmc::available())
    {
        state.SkipWithError("ipmi_sim is not installed");
        return;
    }
    const auto pollMs = static_cast<unsigned>(state.range(0));
    CVLog::CVLogger::setSink(nullptr);
    bmcsim::Options options;
    options.maxRecords = 1024;
    bmcsim::SimulatedBmc bmc(options);
    bmc.start();
    auto source = QX::Ipmi::makeIpmiSource(settingsFor(bmc, pollMs), "");
    auto& ipmi = dynamic_cast<QX::Ipmi::IpmiSource&>(*source);
    QX::Platform::overrideSource(source);

    std::vector<double> delaysMs;
    double requestsPerIdlePoll = 0;
    {
        host::Host host(selclasses::hostOptions(SELPROV_LIBRARY));
        host::IndicationInbox inbox = host.listen("root/zanqx");
        const auto filter = selclasses::filterFor("ZAN_MgmtHwLogEntryEvent");
        host.authorizeFilter(filter, "root");
        host.mustPoll(filter);
        host.activateFilter(filter, true);
        host.enableIndications();
        while (ipmi.pollCount() < 1)
        {
            std::this_thread::sleep_for(std::chrono::milliseconds(5));
        }

        // Idle: the SEL does not change for idlePolls polls.
        const std::uint64_t polls = ipmi.pollCount();
        const std::uint64_t requests = ipmi.requestCount();
        while (ipmi.pollCount() < polls + idlePolls)
        {
            std::this_thread::sleep_for(std::chrono::milliseconds(5));
        }
        requestsPerIdlePoll =
            static_cast<double>(ipmi.requestCount() - requests) /
            static_cast<double>(ipmi.pollCount() - polls);

        // A fixed seed gives every run the same addition phases.
        std::mt19937 random(7); // NOLINT(cert-msc51-cpp)
        std::uniform_int_distribution<unsigned> phase(0, pollMs);
        for (auto _ : state)
        {
            for (unsigned i = 0; i < samples; ++i)
            {
                std::this_thread::sleep_for(
                    std::chrono::milliseconds(phase(random)));
                bmc.addRecords({temperatureRecord()});
                const auto added = Clock::now();
                const auto got = inbox.next(std::chrono::seconds(10));
                const auto arrived = Clock::now();
                if (!got)
                {
                    state.SkipWithError("an entry event did not arrive");
                    break;
                }
                delaysMs.push_back(
                    std::chrono::duration<double, std::milli>(arrived - added)
                        .count());
            }
        }
    }
    QX::Platform::overrideSource(nullptr);
    source.reset();

    if (delaysMs.empty())
    {
        return;
    }
    std::sort(delaysMs.begin(), delaysMs.end());
    state.counters["median_ms"] = delaysMs[delaysMs.size() / 2];
    state.counters["worst_ms"] = delaysMs.back();
    state.counters["requests_per_idle_poll"] = requestsPerIdlePoll;
}

BENCHMARK(BM_RecordAddedToDeliveredIndication)
    ->Arg(100)
    ->Arg(250)
    ->Arg(1000)
    ->Iterations(1)
    ->Unit(benchmark::kMillisecond);

} // namespace
