#pragma once

#include "AlertDispatcher.h"
#include "BmcCommands.h"
#include "BmcGate.h"
#include "InstrumentationSource.h"
#include "IpmiSettings.h"
#include "NodeTree.h"
#include "RecordDescriber.h"
#include "SelAlertTracker.h"
#include "SelCache.h"
#include "SelFill.h"

#include <atomic>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <optional>
#include <stop_token>
#include <string>
#include <thread>
#include <vector>

namespace QX::Ipmi
{

/**
 * @brief The instrumentation tree of a real BMC, read over IPMI.
 *
 * The tree has one ManagementController (/bmc0), its EventLog (/bmc0/sel)
 * with one EventLogEntry per SEL record, and a Watchdog (/bmc0/wdt) whose
 * RestartCause is the BMC's Get System Restart Cause (absent when the BMC
 * does not implement the command). Writing ClearEventLogCommand to the
 * controller's Command property clears the SEL.
 *
 * Every snapshot asks the BMC whether its SEL changed (SelCache) and hands
 * out the same immutable tree while it has not; added records are added
 * to the tree without reading the others again. One request at a time
 * talks to the BMC (BmcGate); the others wait while it makes progress.
 * The SEL copy and the session are meant to be shared by everything in
 * the process that reads the BMC, alert polling included.
 *
 * Monitoring: the first registration starts one poller thread, the last
 * one removed stops and joins it (so does the destructor). Every poll
 * interval the poller refreshes the shared SEL copy (one Get SEL Info
 * while nothing changes) and SelAlertTracker turns the differences into
 * alerts: code 2 on the entry node of each new record, in SEL order;
 * code 0 on the log node for a clear and for each fill transition
 * (status 21, 24); code 1 on the watchdog node for a watchdog-restart
 * record, or at the first poll when the restart cause says watchdog and
 * that restart was not announced yet. Callbacks run on the dispatcher's
 * thread, so a slow or throwing one does not hold up polling. What was
 * announced is kept in the alert state file (written atomically) so that
 * a restarted process announces what happened meanwhile, once. BMC
 * failures are logged once per outage; the poller keeps trying.
 */
class IpmiSource : public InstrumentationSource
{
  public:
    static constexpr const char* controllerPath = "/bmc0";
    static constexpr const char* logPath = "/bmc0/sel";
    static constexpr const char* watchdogPath = "/bmc0/wdt";
    static constexpr const char* logName = "IPMI SEL Log";
    static constexpr const char* dataFormat =
        "IPMI 2.0 SEL record: 16 bytes, hexadecimal";

    /**
     * @param bmc the exchanges with the BMC (owned)
     * @param describer event texts; may refer to @p bmc (destroyed first)
     * @param settings SEL clock, capacity, warning fill, wrapping, timeout
     * @param controllerDescription description of the controller node
     * @param alertStateFile where monitoring keeps what it announced;
     *        empty: nothing is kept across processes
     */
    IpmiSource(std::unique_ptr<BmcCommands> bmc,
               std::unique_ptr<RecordDescriber> describer,
               const Settings& settings, std::string controllerDescription,
               std::string alertStateFile = {});
    ~IpmiSource() override;

    std::shared_ptr<const NodeTree> snapshot() override;
    bool writeProperty(const std::string& path,
                       NodeLexicon::Properties property,
                       unsigned value) override;
    std::string printablePath(const std::string& path) const override;
    void startMonitoring(NodeLexicon::NodeType kind, MonitorCallback callback,
                         const void* context) override;
    void stopMonitoring(NodeLexicon::NodeType kind, MonitorCallback callback,
                        const void* context) override;

    /** Number of monitoring registrations for @p kind. */
    std::size_t monitorCount(NodeLexicon::NodeType kind) const;
    /** Whether the poller thread runs. */
    bool polling() const;
    /** Polls completed (successful or not) since the source was made. */
    std::uint64_t pollCount() const;
    /** IPMI requests sent to the BMC so far. */
    std::uint64_t requestCount() const;
    /** Waits until every alert raised so far has been handed to the
     *  callbacks; false when @p timeout ran out first. */
    bool waitForAlerts(std::chrono::milliseconds timeout) const;

    /** Path of the entry node of a record: the log path, "/entry-" and the
     *  id in five digits; records after the n-th restart of the ids get
     *  "/entry-r", n in five digits, "-" and the id, so that paths sort
     *  as the SEL orders its records. */
    static std::string entryPath(std::uint32_t run, std::uint16_t recordId);

  private:
    std::shared_ptr<const NodeTree> refreshTree();
    void rebuildEntries();
    void addEntry(const CachedRecord& record);
    void applyLogState(const LogState& state);
    void refreshRestartCause(bool selChanged);
    void applyRestartCause();
    void clearSel();
    void pollLoop(const std::stop_token& stop);
    void pollOnce();
    void stopPoller(bool evenIfMonitored);

    // Declared before the describer, which may refer to it.
    std::unique_ptr<BmcCommands> bmc_;
    std::unique_ptr<RecordDescriber> describer_;
    Settings settings_;
    std::string controllerDescription_;
    BmcGate gate_;

    // Guarded by the gate.
    SelCache cache_;
    NodeTreeBuilder builder_;
    bool builderChanged_ = true;
    std::shared_ptr<const NodeTree> tree_;
    std::optional<LogState> logState_;
    std::optional<std::uint8_t> restartCause_;
    std::optional<std::uint64_t> restartCauseGeneration_;

    // Used by the poller thread only (one at a time).
    SelAlertTracker tracker_;
    std::string alertStateFile_;
    bool failing_ = false;

    AlertDispatcher dispatcher_;
    std::atomic<std::uint64_t> polls_{0};
    mutable std::mutex pollerMutex_; // starting and stopping the poller
    std::mutex waitMutex_;           // the poller's wait between polls
    std::condition_variable_any wake_;
    std::jthread poller_; // last: stopped before the rest goes
};

} // namespace QX::Ipmi
