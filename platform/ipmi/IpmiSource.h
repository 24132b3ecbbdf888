#pragma once

#include "BmcCommands.h"
#include "BmcGate.h"
#include "InstrumentationSource.h"
#include "IpmiSettings.h"
#include "NodeTree.h"
#include "RecordDescriber.h"
#include "RequestSnapshot.h"
#include "SelCache.h"
#include "SelFill.h"
#include "SelMonitor.h"

#include <functional>
#include <memory>
#include <optional>
#include <string>

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
 * The SEL copy outlives the process in a file (SelCopyFile): the first
 * request of a process loads it and has the BMC confirm it like any later
 * request, and every change of the copy is written back.
 *
 * Every request asks the BMC whether its SEL changed (SelCache) and is
 * handed the same immutable tree while it has not; added records are
 * added to the tree without reading the others again. The cursors of one
 * request share the tree its first cursor was handed (RequestSnapshot):
 * the BMC is asked once per request, not once per cursor. One request at a time
 * talks to the BMC (BmcGate); the others wait while it makes progress.
 * The SEL copy and the session are meant to be shared by everything in
 * the process that reads the BMC, alert polling included.
 *
 * Monitoring is SelMonitor's: its poller looks at the SEL through this
 * source (the same copy, under the same gate) and the source turns the
 * SEL events it finds into alerts on its nodes: code 2 on the entry node
 * of each new record, code 0 on the log node for a clear and for each
 * fill transition (status 21, 24), code 1 on the watchdog node for a
 * watchdog restart.
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
     * @param selCopy where the SEL copy is kept for the next process, and
     *        the BMC's key; an empty file: the copy is not kept
     */
    IpmiSource(std::unique_ptr<BmcCommands> bmc,
               std::unique_ptr<RecordDescriber> describer,
               const Settings& settings, std::string controllerDescription,
               std::string alertStateFile = {}, SelCopyPlace selCopy = {});
    ~IpmiSource() override;

    std::shared_ptr<const NodeTree> snapshot() override;
    bool writeProperty(const std::string& path,
                       NodeLexicon::Properties property,
                       unsigned value) override;
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

    /** The alert a SEL event raises on this source's nodes: code 2 on the
     *  record's entry node, code 0 on the log node, code 1 on the watchdog
     *  node. */
    static PendingAlert alertOf(const SelEvent& event);

  private:
    std::shared_ptr<const NodeTree> refreshTree();
    void rebuildEntries();
    void addEntry(const CachedRecord& record);
    void applyLogState(const LogState& state);
    void refreshRestartCause(bool selChanged);
    void applyRestartCause();
    void clearSel();
    void look(const std::function<void(const SelObservation&)>& use);
    void loadKeptCopy();
    void keepCopy();

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
    SelCopyPlace selCopy_;
    bool copyLoaded_ = false;
    std::optional<KeptSel> copyWritten_; // what the file holds
    struct CopyStamp
    {
        std::uint64_t version = 0;
        SelInfo info;
        bool clearSeen = false;
        bool operator==(const CopyStamp&) const = default;
    };
    std::optional<CopyStamp> copyStamp_;
    bool copyFailing_ = false;
    RequestSnapshot handed_;

    SelMonitor monitor_; // last: its poller stops before the rest goes
};

} // namespace QX::Ipmi
