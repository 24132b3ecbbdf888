#pragma once

#include "InstrumentationSource.h"

#include <atomic>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

namespace QX
{

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
 * raises an AlertOnEventLog alert for each. Appending an entry raises
 * AlertOnEventLogEntry. Alerts are delivered synchronously on the calling
 * thread to the callbacks registered for the alerting node's kind.
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
    std::string printablePath(const std::string& path) const override;
    void startMonitoring(NodeLexicon::NodeType kind, MonitorCallback callback,
                         const void* context) override;
    void stopMonitoring(NodeLexicon::NodeType kind, MonitorCallback callback,
                        const void* context) override;
    void beforeOperation(CursorOperation operation) override;

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

    /** Arms a fault; several may be armed at once. */
    void armFault(const CursorFault& fault);
    void clearFaults();
    /** While true, every property write is refused (returns false). */
    void refuseWrites(bool refuse);

    /** Number of registered monitor callbacks for @p kind. */
    std::size_t monitorCount(NodeLexicon::NodeType kind) const;
    /** How many writes the source has accepted so far. */
    unsigned acceptedWrites() const;

    /** Path of the entry with @p recordId under the log at @p logPath:
     *  the log path, "/entry-" and the record id in five digits, so that
     *  entry paths sort as byte strings in record order. */
    static std::string entryPath(const std::string& logPath, unsigned recordId);

  private:
    struct Monitor
    {
        NodeLexicon::NodeType kind;
        MonitorCallback callback;
        const void* context;
    };
    struct ArmedFault
    {
        CursorFault fault;
        unsigned calls = 0;
    };

    void deliver(const std::vector<std::pair<std::string, unsigned>>& alerts,
                 NodeLexicon::NodeType kind, const DateTime& when);

    mutable std::mutex mutex_;
    std::shared_ptr<const NodeTree> tree_;
    std::vector<Monitor> monitors_;
    std::vector<ArmedFault> faults_;
    // Lets cursor operations skip the lock while no fault is armed.
    std::atomic<bool> faultsArmed_{false};
    bool refuseWrites_ = false;
    unsigned acceptedWrites_ = 0;
};

} // namespace QX
