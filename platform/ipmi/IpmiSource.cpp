#include "IpmiSource.h"

#include "IpmiError.h"
#include "IpmiLog.h"
#include "SelRecordText.h"

#include <cstdio>
#include <filesystem>

namespace QX::Ipmi
{

namespace
{

using namespace NodeLexicon;

constexpr unsigned nodeStatusOk = 1;

void logFailure(const char* what, const std::exception& error)
{
    logLine(logLevelFailure, "IpmiSource", __LINE__,
            std::string(what) + " failed: " + error.what());
}

} // namespace

IpmiSource::IpmiSource(std::unique_ptr<BmcCommands> bmc,
                       std::unique_ptr<RecordDescriber> describer,
                       const Settings& settings,
                       std::string controllerDescription,
                       std::string alertStateFile, SelCopyPlace selCopy) :
    bmc_(std::move(bmc)),
    describer_(std::move(describer)), settings_(settings),
    controllerDescription_(std::move(controllerDescription)),
    gate_(std::chrono::milliseconds(settings.timeoutMs),
          [bmc = bmc_.get()] { return bmc->lastActivity(); }),
    cache_(std::chrono::milliseconds(settings.clearWaitMs),
           std::chrono::seconds(settings.selVerifySeconds)),
    selCopy_(std::move(selCopy)),
    monitor_([this](const std::function<void(const SelObservation&)>& use)
             { look(use); },
             alertOf, std::chrono::milliseconds(settings.pollIntervalMs),
             std::move(alertStateFile))
{
    // The password is not needed beyond the session.
    settings_.password.clear();
    rebuildEntries();
}

// The poller uses everything else; the describer may refer to the
// session.
IpmiSource::~IpmiSource()
{
    monitor_.stop();
    describer_.reset();
}

std::string IpmiSource::entryPath(std::uint32_t run, std::uint16_t recordId)
{
    char suffix[32];
    if (run == 0)
    {
        std::snprintf(suffix, sizeof suffix, "/entry-%05u",
                      static_cast<unsigned>(recordId));
    }
    else
    {
        std::snprintf(suffix, sizeof suffix, "/entry-r%05u-%05u",
                      static_cast<unsigned>(run),
                      static_cast<unsigned>(recordId));
    }
    return std::string(logPath) + suffix;
}

std::shared_ptr<const NodeTree> IpmiSource::snapshot()
{
    // A second cursor of the same request walks the tree the BMC confirmed
    // for the first one.
    if (std::shared_ptr<const NodeTree> held = handed_.held())
    {
        return held;
    }
    try
    {
        const BmcGate::Access access(gate_);
        return handed_.handOut(refreshTree());
    }
    catch (const IpmiError& error)
    {
        logFailure("Reading the SEL", error);
        throw;
    }
}

std::shared_ptr<const NodeTree> IpmiSource::refreshTree()
{
    loadKeptCopy();
    const SelChange change = cache_.refresh(*bmc_, *describer_);
    keepCopy();
    if (change == SelChange::Replaced)
    {
        rebuildEntries();
    }
    else if (change == SelChange::Appended)
    {
        const auto& records = cache_.records();
        for (std::size_t i = cache_.firstNew(); i < records.size(); ++i)
        {
            addEntry(records[i]);
        }
        builderChanged_ = true;
    }
    const LogState state = logStateOf(cache_.info(), cache_.records(),
                                      cache_.clearSeen(), settings_);
    if (!logState_ || state != *logState_)
    {
        applyLogState(state);
    }
    refreshRestartCause(change != SelChange::None);
    if (builderChanged_ || !tree_)
    {
        tree_ = builder_.build();
        builderChanged_ = false;
    }
    return tree_;
}

void IpmiSource::loadKeptCopy()
{
    if (copyLoaded_ || selCopy_.file.empty())
    {
        return;
    }
    copyLoaded_ = true;
    std::string problem;
    std::optional<KeptSel> kept =
        readSelCopy(selCopy_.file, selCopy_.bmcKey, problem);
    if (!kept)
    {
        logLine(logLevelInfo, "IpmiSource", __LINE__,
                "No SEL copy in " + selCopy_.file + " (" + problem +
                    "): the whole SEL is read");
        return;
    }
    copyWritten_ = kept;
    cache_.adopt(std::move(*kept));
}

void IpmiSource::keepCopy()
{
    if (selCopy_.file.empty())
    {
        return;
    }
    // Only a change of the copy is compared with the file.
    const CopyStamp stamp{cache_.version(), cache_.info(), cache_.clearSeen()};
    if (stamp == copyStamp_)
    {
        return;
    }
    copyStamp_ = stamp;
    std::optional<KeptSel> copy = cache_.keep(describer_->textsKey());
    if (!copy)
    {
        return; // not known to be true: the file keeps what it had
    }
    copy->bmcKey = selCopy_.bmcKey;
    if (copy == copyWritten_)
    {
        return;
    }
    try
    {
        writeSelCopy(selCopy_.file, *copy);
        copyWritten_ = std::move(copy);
        copyFailing_ = false;
    }
    catch (const std::exception& error)
    {
        // Costs the next process a whole read, nothing else; said once.
        if (!copyFailing_)
        {
            logFailure("Keeping the SEL copy", error);
            copyFailing_ = true;
        }
    }
}

void IpmiSource::rebuildEntries()
{
    builder_ = NodeTreeBuilder();
    builder_.addNode(ManagementController, controllerPath, "",
                     controllerDescription_, nodeStatusOk);
    builder_.addNode(EventLog, logPath, controllerPath, "IPMI System Event Log",
                     nodeStatusOk);
    builder_.setProperty(logPath, Name, std::string(logName));
    builder_.setProperty(logPath, DataFormat, std::string(dataFormat));
    builder_.addNode(Watchdog, watchdogPath, controllerPath,
                     "BMC watchdog timer", nodeStatusOk);
    for (const CachedRecord& record : cache_.records())
    {
        addEntry(record);
    }
    // The new builder lacks the log state and the restart cause.
    logState_.reset();
    applyRestartCause();
    builderChanged_ = true;
}

void IpmiSource::addEntry(const CachedRecord& record)
{
    const std::string path = entryPath(record.run, record.id);
    builder_.addNode(EventLogEntry, path, logPath, record.description, 0);
    builder_.setProperty(path, RecordId, static_cast<unsigned>(record.id));
    builder_.setProperty(path, RecordData, hexText(record.bytes));
    builder_.setProperty(path, Timestamp,
                         timestampText(record.bytes, settings_.selClock));
}

void IpmiSource::applyLogState(const LogState& state)
{
    builder_.setProperty(logPath, MaxRecords, state.maxRecords);
    builder_.setProperty(logPath, OverwritePolicy, state.overwritePolicy);
    builder_.setProperty(logPath, IsEmpty, state.isEmpty);
    builder_.setStatus(logPath, state.status);
    logState_ = state;
    builderChanged_ = true;
}

void IpmiSource::refreshRestartCause(bool selChanged)
{
    // The cause changes only when the server restarts, which new SEL
    // records or a new session (a restarted BMC) come with.
    const std::uint64_t generation = bmc_->sessionGeneration();
    if (!selChanged && restartCauseGeneration_ == generation)
    {
        return;
    }
    std::optional<std::uint8_t> cause;
    try
    {
        cause = bmc_->getSystemRestartCause();
    }
    catch (const IpmiError& error)
    {
        if (error.category() != ErrorCategory::CompletionCode)
        {
            throw;
        }
        // Refused (privilege, say): report no cause rather than no SEL.
        if (!restartCauseGeneration_)
        {
            logFailure("Get System Restart Cause", error);
        }
    }
    restartCauseGeneration_ = generation;
    if (cause != restartCause_)
    {
        restartCause_ = cause;
        applyRestartCause();
    }
}

void IpmiSource::applyRestartCause()
{
    if (restartCause_)
    {
        builder_.setProperty(watchdogPath, RestartCause,
                             static_cast<unsigned>(*restartCause_));
    }
    else
    {
        builder_.removeProperty(watchdogPath, RestartCause);
    }
    builderChanged_ = true;
}

bool IpmiSource::writeProperty(const std::string& path,
                               NodeLexicon::Properties property, unsigned value)
{
    if (path != controllerPath || property != Command ||
        value != ClearEventLogCommand)
    {
        return false;
    }
    try
    {
        const BmcGate::Access access(gate_);
        clearSel();
    }
    catch (const IpmiError& error)
    {
        logFailure("Clearing the SEL", error);
        throw;
    }
    logLine(logLevelInfo, "IpmiSource", __LINE__, "SEL cleared");
    return true;
}

void IpmiSource::clearSel()
{
    // The kept copy is of a SEL that is going away; a process started
    // before the next refresh reads the whole SEL.
    if (!selCopy_.file.empty())
    {
        std::error_code ignored;
        std::filesystem::remove(selCopy_.file, ignored);
        copyWritten_.reset();
    }
    handed_.forget();
    cache_.erase(*bmc_);
}

void IpmiSource::startMonitoring(NodeLexicon::NodeType kind,
                                 MonitorCallback callback, const void* context)
{
    monitor_.add(kind, callback, context);
}

void IpmiSource::stopMonitoring(NodeLexicon::NodeType kind,
                                MonitorCallback callback, const void* context)
{
    monitor_.remove(kind, callback, context);
}

void IpmiSource::look(const std::function<void(const SelObservation&)>& use)
{
    const BmcGate::Access access(gate_);
    refreshTree();
    SelObservation now;
    now.records = &cache_.records();
    now.version = cache_.version();
    now.info = cache_.info();
    now.logStatus = logState_ ? logState_->status : nodeStatusOk;
    now.restartCause = restartCause_;
    use(now);
}

PendingAlert IpmiSource::alertOf(const SelEvent& event)
{
    switch (event.kind)
    {
        case SelEvent::Kind::RecordAdded:
            return PendingAlert{EventLogEntry, AlertOnEventLogEntry,
                                DateTime::now(),
                                entryPath(event.run, event.recordId)};
        case SelEvent::Kind::WatchdogRestart:
            return PendingAlert{Watchdog, AlertOnWatchdog, DateTime::now(),
                                watchdogPath};
        case SelEvent::Kind::LogChanged:
            break;
    }
    return PendingAlert{EventLog, AlertOnEventLog, DateTime::now(), logPath};
}

std::size_t IpmiSource::monitorCount(NodeLexicon::NodeType kind) const
{
    return monitor_.count(kind);
}

bool IpmiSource::polling() const
{
    return monitor_.polling();
}

std::uint64_t IpmiSource::pollCount() const
{
    return monitor_.pollCount();
}

std::uint64_t IpmiSource::requestCount() const
{
    return bmc_->requestCount();
}

bool IpmiSource::waitForAlerts(std::chrono::milliseconds timeout) const
{
    return monitor_.waitForAlerts(timeout);
}

} // namespace QX::Ipmi
