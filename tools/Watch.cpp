#include "Watch.h"

#include "MemorySource.h"
#include "Platform.h"
#include "Printing.h"
#include "SimulatedAlert.h"
#include "StatusText.h"

#include <algorithm>
#include <chrono>
#include <csignal>
#include <iostream>
#include <string>
#include <vector>

namespace selprov
{
namespace
{

volatile std::sig_atomic_t interrupted = 0;

void onInterrupt(int)
{
    interrupted = 1;
}

// Ctrl-C ends the watch, not the process, while this lives.
class InterruptCatcher
{
  public:
    InterruptCatcher()
    {
        interrupted = 0;
        previous_ = std::signal(SIGINT, onInterrupt);
    }
    ~InterruptCatcher()
    {
        std::signal(SIGINT, previous_);
    }
    InterruptCatcher(const InterruptCatcher&) = delete;
    InterruptCatcher& operator=(const InterruptCatcher&) = delete;

  private:
    void (*previous_)(int) = SIG_DFL;
};

bool failed(const char* step, const std::string& className,
            const host::Outcome& outcome)
{
    if (outcome.rc == CMPI_RC_OK)
    {
        return false;
    }
    std::cerr << "selprov: " << step
              << (className.empty() ? "" : " for " + className) << ": "
              << host::describeStatus(outcome.rc, outcome.message) << "\n";
    return true;
}

void print(const Options& options, const host::DeliveredIndication& got)
{
    if (options.json)
    {
        std::cout << host::jsonInstance(got.instance) << "\n";
    }
    else
    {
        std::cout << host::formatMof(got.instance) << "\n";
    }
    std::cout.flush();
}

int raiseOne(const std::string& name)
{
    try
    {
        // The platform's source is the provider's too: simulating there is
        // what the provider sees as its hardware raising the alert.
        QX::raiseSimulatedAlert(*QX::Platform::currentSource(),
                                *QX::simulatedAlertFromName(name));
    }
    catch (const std::exception& error)
    {
        std::cerr << "selprov: cannot raise " << name << ": " << error.what()
                  << "\n";
        return 1;
    }
    return 0;
}

} // namespace

int raise(const Options& options)
{
    for (const std::string& name : options.alerts)
    {
        if (raiseOne(name) != 0)
        {
            return 1;
        }
    }
    return 0;
}

int watch(const Options& options, host::Host& host)
{
    using Clock = std::chrono::steady_clock;
    const InterruptCatcher catcher;
    host::IndicationInbox inbox = host.listen(options.nameSpace);
    std::vector<host::IndicationFilter> active;
    int result = 0;
    for (const std::string& className : options.classes)
    {
        const auto filter =
            host::IndicationFilter::forClass(className, options.nameSpace);
        if (failed("authorizeFilter", className,
                   host.authorizeFilter(filter, "selprov")) ||
            failed("mustPoll", className, host.mustPoll(filter)) ||
            failed("activateFilter", className,
                   host.activateFilter(filter, true)))
        {
            result = 1;
            break;
        }
        active.push_back(filter);
    }
    if (result == 0 &&
        failed("enableIndications", "", host.enableIndications()))
    {
        result = 1;
    }
    if (result == 0)
    {
        std::cerr << "selprov: watching " << active.size()
                  << " indication class" << (active.size() == 1 ? "" : "es")
                  << " in " << options.nameSpace << "\n";
    }
    unsigned received = 0;
    const auto deadline =
        options.timeout
            ? Clock::now() +
                  std::chrono::duration_cast<Clock::duration>(
                      std::chrono::duration<double>(*options.timeout))
            : Clock::time_point::max();
    // The alerts go one at a time: the next once the last one's indication
    // arrived (or a second passed), since a delivery reads the hardware as
    // it is then, and a later alert may have changed it.
    constexpr auto raisePause = std::chrono::seconds(1);
    std::size_t raised = 0;
    bool answered = true;
    auto lastRaise = Clock::now();
    while (result == 0 && (!options.count || received < *options.count) &&
           interrupted == 0)
    {
        auto now = Clock::now();
        if (raised < options.alerts.size() &&
            (answered || now - lastRaise >= raisePause))
        {
            result = raiseOne(options.alerts[raised++]);
            lastRaise = now;
            answered = false;
            continue;
        }
        if (now >= deadline)
        {
            break;
        }
        // Short waits, so that Ctrl-C and the next alert come promptly.
        const auto slice = std::min<Clock::duration>(
            deadline - now, std::chrono::milliseconds(100));
        if (const auto got = inbox.next(
                std::chrono::duration_cast<std::chrono::milliseconds>(slice) +
                std::chrono::milliseconds(1)))
        {
            print(options, *got);
            ++received;
            answered = true;
        }
    }
    if (result == 0 && options.count && received < *options.count)
    {
        std::cerr << "selprov: " << (interrupted ? "interrupted" : "timed out")
                  << " with " << received << " of " << *options.count
                  << " indications\n";
        result = 1;
    }
    // As SFCB ends a subscription: disable, then deactivate each filter.
    if (failed("disableIndications", "", host.disableIndications()))
    {
        result = 1;
    }
    for (const host::IndicationFilter& filter : active)
    {
        if (failed("deActivateFilter", filter.className,
                   host.deActivateFilter(filter, true)))
        {
            result = 1;
        }
    }
    return result;
}

} // namespace selprov
