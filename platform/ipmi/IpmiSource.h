#pragma once

#include "BmcCommands.h"
#include "BmcGate.h"
#include "InstrumentationSource.h"
#include "IpmiSettings.h"
#include "NodeTree.h"
#include "RecordDescriber.h"
#include "SelCache.h"

#include <memory>
#include <mutex>
#include <optional>
#include <string>
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
 * Monitoring registrations are kept, but no alerts are raised yet.
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
     */
    IpmiSource(std::unique_ptr<BmcCommands> bmc,
               std::unique_ptr<RecordDescriber> describer,
               const Settings& settings, std::string controllerDescription);
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

    /** Path of the entry node of a record: the log path, "/entry-" and the
     *  id in five digits; records after the n-th restart of the ids get
     *  "/entry-r", n in five digits, "-" and the id, so that paths sort
     *  as the SEL orders its records. */
    static std::string entryPath(std::uint32_t run, std::uint16_t recordId);

  private:
    struct LogState
    {
        unsigned maxRecords = 0;
        unsigned overwritePolicy = 0;
        bool isEmpty = true;
        unsigned status = 0;
        bool operator==(const LogState&) const = default;
    };
    struct Monitor
    {
        NodeLexicon::NodeType kind;
        MonitorCallback callback;
        const void* context;
    };

    std::shared_ptr<const NodeTree> refreshTree();
    void rebuildEntries();
    void addEntry(const CachedRecord& record);
    LogState logState() const;
    void applyLogState(const LogState& state);
    void refreshRestartCause(bool selChanged);
    void applyRestartCause();
    void clearSel();

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

    mutable std::mutex monitorMutex_;
    std::vector<Monitor> monitors_;
};

} // namespace QX::Ipmi
