#pragma once

#include "AlertDispatcher.h"
#include "SelAlertTracker.h"

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <functional>
#include <mutex>
#include <stop_token>
#include <string>
#include <thread>

namespace QX::Ipmi
{

/**
 * @brief Watches the SEL while someone is monitoring: one poller thread,
 *        the alert tracker and the alert state file.
 *
 * The first registration starts the poller, the last one removed stops and
 * joins it (so does stop() and the destructor). Every interval the poller
 * takes a look at the BMC through the source (which refreshes its SEL copy
 * under its own lock and shows the result), lets SelAlertTracker turn the
 * differences into SEL events, has the source map them to alerts on its
 * nodes, and hands those to the dispatcher, whose thread calls the
 * callbacks. What was announced is kept in the state file (written
 * atomically), so that a restarted process announces what happened
 * meanwhile, once. BMC failures are logged once per outage; the poller
 * keeps trying.
 */
class SelMonitor
{
  public:
    /** Runs the function it is given with the SEL as the source sees it
     *  now; throws when the BMC cannot be read. */
    using Look =
        std::function<void(const std::function<void(const SelObservation&)>&)>;
    /** The alert of a SEL event, on the source's node. */
    using ToAlert = std::function<PendingAlert(const SelEvent&)>;

    SelMonitor(Look look, ToAlert toAlert, std::chrono::milliseconds interval,
               std::string stateFile);
    ~SelMonitor();
    SelMonitor(const SelMonitor&) = delete;
    SelMonitor& operator=(const SelMonitor&) = delete;

    void add(NodeLexicon::NodeType kind, MonitorCallback callback,
             const void* context);
    void remove(NodeLexicon::NodeType kind, MonitorCallback callback,
                const void* context);
    /** Stops and joins the poller, registrations or not. */
    void stop();

    std::size_t count(NodeLexicon::NodeType kind) const;
    bool polling() const;
    std::uint64_t pollCount() const;
    bool waitForAlerts(std::chrono::milliseconds timeout) const;

  private:
    void pollLoop(const std::stop_token& stop);
    void pollOnce();
    TrackerResult track(const SelObservation& now);
    void stopPoller(bool evenIfMonitored);

    Look look_;
    ToAlert toAlert_;
    std::chrono::milliseconds interval_;

    // Used by the poller thread only (one at a time).
    SelAlertTracker tracker_;
    std::string stateFile_;
    bool failing_ = false;

    AlertDispatcher dispatcher_;
    std::atomic<std::uint64_t> polls_{0};
    mutable std::mutex pollerMutex_; // starting and stopping the poller
    std::mutex waitMutex_;           // the poller's wait between polls
    std::condition_variable_any wake_;
    std::jthread poller_; // last: stopped before the rest goes
};

} // namespace QX::Ipmi
