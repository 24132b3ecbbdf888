#pragma once

#include "AlertDispatcher.h"
#include "InstrumentationSource.h"
#include "SimulatedAlert.h"

#include <atomic>
#include <chrono>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

namespace QX
{

/** Cursor operations, named so that a fault can be armed on any one of
 *  them (see MemorySource::armFault). */
enum class CursorOperation
{
    Construct,
    SelectKind,
    SelectPath,
    Valid,
    Next,
    SetFilter,
    GetPath,
    GetParentPath,
    ConvertPath,
    GetDescription,
    GetStatus,
    GetProperty,
    SetProperty,
    StartMonitoring,
    StopMonitoring,
};

/** A failure armed on a MemorySource: the given cursor operation throws
 *  std::runtime_error(message) on its @p skip+1-th call from now on, then
 *  (unless @p repeat) the fault disarms itself. */
struct CursorFault
{
    CursorOperation operation;
    unsigned skip = 0;
    bool repeat = false;
    std::string message = "instrumentation fault";
};

/**
 * @brief An instrumentation source held in memory: a simulated BMC.
 *
 * Built from a NodeTree (by tests through NodeTreeBuilder, or from a
 * fixture file, see Fixture.h). Writing ClearEventLogCommand to the Command
 * property of a ManagementController empties every EventLog under it, sets
 * their IsEmpty to true and their status to EventLogStatusCleared, and
 * raises an AlertOnEventLog alert for each, as a BMC does when its log is
 * cleared. Appending an entry raises AlertOnEventLogEntry. Alerts reach the
 * callbacks registered for the alerting node's kind on the source's own
 * dispatcher thread (see AlertDispatcher), in the order they were raised.
 *
 * Thread-safe: every member may be called from any thread.
 */
class MemorySource : public InstrumentationSource
{
  public:
    explicit MemorySource(std::shared_ptr<const NodeTree> tree);

    std::shared_ptr<const NodeTree> snapshot() override;
    bool writeProperty(const std::string& path,
                       NodeLexicon::Properties property,
                       unsigned value) override;
    /** A walk that fails where a fault is armed (see armFault) and
     *  otherwise walks a snapshot as every source's does. */
    std::unique_ptr<SnapshotWalk> openWalk() override;
    void startMonitoring(NodeLexicon::NodeType kind, MonitorCallback callback,
                         const void* context) override;
    void stopMonitoring(NodeLexicon::NodeType kind, MonitorCallback callback,
                        const void* context) override;

    /**
     * Changes the simulated BMC as its hardware would and raises the alert
     * that goes with it, on the first controller's first log (or watchdog):
     * RecordAdded appends a record with the next record id, the current
     * time and a system boot event; LogCleared clears the controller's logs
     * as the clear command does; LogAlmostFull and LogFull set the log's
     * status to EventLogStatusAlmostFull or EventLogStatusFull;
     * WatchdogRestart raises AlertOnWatchdog on the watchdog, adding one
     * (RestartCause 4, a watchdog expiry) when the controller has none.
     * Throws std::runtime_error when the tree has no controller or log.
     */
    void raiseSimulatedAlert(SimulatedAlert alert);

    /** Replaces the whole tree. */
    void replaceTree(std::shared_ptr<const NodeTree> tree);
    /**
     * Adds an entry under the log at @p logPath with the next path of that
     * log (see entryPath), sets the log's IsEmpty to false, and raises
     * AlertOnEventLogEntry for it. Throws std::invalid_argument when there
     * is no log at @p logPath or the entry exists already.
     * @return the new entry's path
     */
    std::string appendEntry(const std::string& logPath, unsigned recordId,
                            const std::string& timestamp,
                            const std::string& recordData,
                            const std::string& description);
    /** Raises an alert for the node at @p path (which must exist) with the
     *  code of its kind, at @p when. */
    void raiseAlert(const std::string& path, const DateTime& when);

    /** Arms a fault on the cursors of this source, those open already
     *  included; several may be armed at once. */
    void armFault(const CursorFault& fault);
    void clearFaults();
    /** While true, every property write is refused (returns false). */
    void refuseWrites(bool refuse);

    /** Number of registered monitor callbacks for @p kind. */
    std::size_t monitorCount(NodeLexicon::NodeType kind) const;
    /** Waits until every alert raised so far has been handed to its
     *  callbacks and they returned; false when @p timeout ran out first. */
    bool waitForAlerts(std::chrono::milliseconds timeout) const;
    /** How many writes the source has accepted so far. */
    unsigned acceptedWrites() const;

    /** Path of the entry with @p recordId under the log at @p logPath:
     *  the log path, "/entry-" and the record id in five digits, so that
     *  entry paths sort as byte strings in record order. */
    static std::string entryPath(const std::string& logPath, unsigned recordId);

  private:
    class FaultingWalk;

    struct ArmedFault
    {
        CursorFault fault;
        unsigned calls = 0;
    };

    void deliver(const std::vector<std::pair<std::string, unsigned>>& alerts,
                 NodeLexicon::NodeType kind, const DateTime& when);
    /** Clears the logs under @p controller in a copy of the tree; the
     *  paths of the cleared logs. Call with the lock held. */
    std::vector<std::string> clearLogsLocked(NodeTree::NodeId controller);
    NodeTree::NodeId firstControllerLocked() const;
    NodeTree::NodeId firstLogLocked() const;
    /** Appends a simulated system boot record to the first log. */
    void simulateRecord();
    /** Sets the first log's status and raises AlertOnEventLog for it. */
    void simulateLogStatus(unsigned status);
    void simulateRestart();
    /** Throws the armed fault's message when @p operation is to fail now. */
    void failIfArmed(CursorOperation operation);

    mutable std::mutex mutex_;
    std::shared_ptr<const NodeTree> tree_;
    std::vector<ArmedFault> faults_;
    // Lets cursor operations skip the lock while no fault is armed.
    std::atomic<bool> faultsArmed_{false};
    bool refuseWrites_ = false;
    unsigned acceptedWrites_ = 0;
    // Last: destroyed (its thread joined) while the rest still exists, as
    // callbacks may call back into the source.
    AlertDispatcher dispatcher_;
};

/**
 * Has @p source raise @p alert as its hardware would (see
 * MemorySource::raiseSimulatedAlert). Only the in-memory source can; any
 * other throws std::runtime_error saying so.
 */
void raiseSimulatedAlert(InstrumentationSource& source, SimulatedAlert alert);

} // namespace QX
