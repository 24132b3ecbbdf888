#include "SelMonitor.h"

#include "AlertState.h"
#include "IpmiLog.h"

namespace QX::Ipmi
{

namespace
{

void logFailure(const char* what, const std::exception& error)
{
    logLine(logLevelFailure, "IpmiSource", __LINE__,
            std::string(what) + " failed: " + error.what());
}

} // namespace

SelMonitor::SelMonitor(Look look, ToAlert toAlert,
                       std::chrono::milliseconds interval,
                       std::string stateFile) :
    look_(std::move(look)),
    toAlert_(std::move(toAlert)), interval_(interval),
    stateFile_(std::move(stateFile))
{
}

SelMonitor::~SelMonitor()
{
    stopPoller(true);
}

void SelMonitor::stop()
{
    stopPoller(true);
}

void SelMonitor::add(NodeLexicon::NodeType kind, MonitorCallback callback,
                     const void* context)
{
    dispatcher_.add(kind, callback, context);
    const std::lock_guard lock(pollerMutex_);
    if (!poller_.joinable() && dispatcher_.total() > 0)
    {
        poller_ = std::jthread([this](const std::stop_token& stop)
                               { pollLoop(stop); });
    }
}

void SelMonitor::remove(NodeLexicon::NodeType kind, MonitorCallback callback,
                        const void* context)
{
    // Not under the poller lock: this waits for a running callback, which
    // may itself start or stop monitoring.
    dispatcher_.remove(kind, callback, context);
    if (dispatcher_.total() == 0)
    {
        stopPoller(false);
    }
}

void SelMonitor::stopPoller(bool evenIfMonitored)
{
    const std::lock_guard lock(pollerMutex_);
    if (!poller_.joinable() || (!evenIfMonitored && dispatcher_.total() > 0))
    {
        return;
    }
    poller_.request_stop();
    if (poller_.get_id() == std::this_thread::get_id())
    {
        poller_.detach(); // cannot happen: callbacks run elsewhere
        return;
    }
    // A poll in progress ends within the BMC timeout.
    poller_.join();
}

void SelMonitor::pollLoop(const std::stop_token& stop)
{
    while (!stop.stop_requested())
    {
        pollOnce();
        std::unique_lock lock(waitMutex_);
        wake_.wait_for(lock, stop, interval_, [] { return false; });
    }
}

// After a restart the poller starts warm: its first look goes through the
// source's SEL copy, which the source loaded from its file and had the BMC
// confirm (records added meanwhile read one by one, anything else read
// whole), so @p now is the SEL as it truly is without a walk of all of it.
// The alert state file and the copy file are kept consistent by never
// depending on each other: the copy is only ever used once the BMC
// confirmed it, so it holds the true SEL whatever the alert state says,
// and the alert state alone tells what was announced (its last record is
// looked up in the true SEL; everything after it is announced). Either
// file may be newer than the other after a crash between the two writes
// (the copy is written first, under the source's lock, before the tracker
// runs): an older alert state only means its records are announced now.
TrackerResult SelMonitor::track(const SelObservation& now)
{
    if (tracker_.started())
    {
        return tracker_.observe(now);
    }
    std::optional<AnnouncedState> kept;
    if (!stateFile_.empty())
    {
        std::string problem;
        kept = readAlertState(stateFile_, problem);
        if (!kept)
        {
            logLine(logLevelInfo, "IpmiSource", __LINE__,
                    "No alert state in " + stateFile_ + " (" + problem +
                        "): SEL records present now are not announced");
        }
    }
    return tracker_.start(kept, now);
}

void SelMonitor::pollOnce()
{
    TrackerResult result;
    try
    {
        look_([&](const SelObservation& now) { result = track(now); });
        if (failing_)
        {
            logLine(logLevelInfo, "IpmiSource", __LINE__,
                    "SEL monitoring reaches the BMC again");
            failing_ = false;
        }
    }
    catch (const std::exception& error)
    {
        // Logged once per outage; the next interval tries again.
        if (!failing_)
        {
            logFailure("SEL monitoring", error);
            failing_ = true;
        }
        polls_.fetch_add(1, std::memory_order_release);
        return;
    }
    if (!result.note.empty())
    {
        logLine(logLevelInfo, "IpmiSource", __LINE__, result.note);
    }
    std::vector<PendingAlert> alerts;
    alerts.reserve(result.events.size());
    for (const SelEvent& event : result.events)
    {
        alerts.push_back(toAlert_(event));
    }
    dispatcher_.post(std::move(alerts));
    if (result.stateChanged && !stateFile_.empty())
    {
        try
        {
            writeAlertState(stateFile_, tracker_.state());
        }
        catch (const std::exception& error)
        {
            logFailure("Keeping the alert state", error);
        }
    }
    polls_.fetch_add(1, std::memory_order_release);
}

std::size_t SelMonitor::count(NodeLexicon::NodeType kind) const
{
    return dispatcher_.count(kind);
}

bool SelMonitor::polling() const
{
    const std::lock_guard lock(pollerMutex_);
    return poller_.joinable();
}

std::uint64_t SelMonitor::pollCount() const
{
    return polls_.load(std::memory_order_acquire);
}

bool SelMonitor::waitForAlerts(std::chrono::milliseconds timeout) const
{
    return dispatcher_.waitIdle(timeout);
}

} // namespace QX::Ipmi
