#include "MemorySource.h"

#include "NodeLexicon.h"
#include "ipmi/SelRecord.h"

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <iterator>
#include <set>
#include <stdexcept>

namespace QX
{

namespace
{

std::shared_ptr<const NodeTree> orEmpty(std::shared_ptr<const NodeTree> tree)
{
    return tree ? std::move(tree) : NodeTreeBuilder().build();
}

std::optional<unsigned> alertCodeOf(NodeLexicon::NodeType kind)
{
    switch (kind)
    {
        case NodeLexicon::EventLog:
            return NodeLexicon::AlertOnEventLog;
        case NodeLexicon::Watchdog:
            return NodeLexicon::AlertOnWatchdog;
        case NodeLexicon::EventLogEntry:
            return NodeLexicon::AlertOnEventLogEntry;
        default:
            return std::nullopt;
    }
}

} // namespace

MemorySource::MemorySource(std::shared_ptr<const NodeTree> tree) :
    tree_(orEmpty(std::move(tree)))
{
}

std::shared_ptr<const NodeTree> MemorySource::snapshot()
{
    const std::lock_guard lock(mutex_);
    return tree_;
}

bool MemorySource::writeProperty(const std::string& path,
                                 NodeLexicon::Properties property,
                                 unsigned value)
{
    std::vector<std::pair<std::string, unsigned>> alerts;
    {
        const std::lock_guard lock(mutex_);
        if (refuseWrites_ || property != NodeLexicon::Command ||
            value != NodeLexicon::ClearEventLogCommand)
        {
            return false;
        }
        const auto controller = tree_->find(path);
        if (!controller ||
            tree_->node(*controller).kind != NodeLexicon::ManagementController)
        {
            return false;
        }
        for (std::string& logPath : clearLogsLocked(*controller))
        {
            alerts.emplace_back(std::move(logPath),
                                NodeLexicon::AlertOnEventLog);
        }
        ++acceptedWrites_;
    }
    deliver(alerts, NodeLexicon::EventLog, DateTime::now());
    return true;
}

std::vector<std::string>
MemorySource::clearLogsLocked(NodeTree::NodeId controller)
{
    std::vector<std::string> cleared;
    NodeTreeBuilder builder(*tree_);
    for (const NodeTree::NodeId log :
         tree_->nodesOfKind(NodeLexicon::EventLog, controller))
    {
        const std::string& logPath = tree_->node(log).path;
        builder.removeNodes(NodeLexicon::EventLogEntry, logPath)
            .setProperty(logPath, NodeLexicon::IsEmpty, true)
            .setStatus(logPath, NodeLexicon::EventLogStatusCleared);
        cleared.push_back(logPath);
    }
    tree_ = std::move(builder).build();
    return cleared;
}

void MemorySource::startMonitoring(NodeLexicon::NodeType kind,
                                   MonitorCallback callback,
                                   const void* context)
{
    dispatcher_.add(kind, callback, context);
}

void MemorySource::stopMonitoring(NodeLexicon::NodeType kind,
                                  MonitorCallback callback, const void* context)
{
    dispatcher_.remove(kind, callback, context);
}

void MemorySource::replaceTree(std::shared_ptr<const NodeTree> tree)
{
    auto replacement = orEmpty(std::move(tree));
    const std::lock_guard lock(mutex_);
    tree_ = std::move(replacement);
}

std::string MemorySource::appendEntry(const std::string& logPath,
                                      unsigned recordId,
                                      const std::string& timestamp,
                                      const std::string& recordData,
                                      const std::string& description)
{
    std::string path = entryPath(logPath, recordId);
    {
        const std::lock_guard lock(mutex_);
        const auto log = tree_->find(logPath);
        if (!log || tree_->node(*log).kind != NodeLexicon::EventLog)
        {
            throw std::invalid_argument("no event log at " + logPath);
        }
        NodeTreeBuilder builder(*tree_);
        builder
            .addNode(NodeLexicon::EventLogEntry, path, logPath, description, 0)
            .setProperty(path, NodeLexicon::RecordId, recordId)
            .setProperty(path, NodeLexicon::Timestamp, timestamp)
            .setProperty(path, NodeLexicon::RecordData, recordData)
            .setProperty(logPath, NodeLexicon::IsEmpty, false);
        tree_ = std::move(builder).build();
    }
    deliver({{path, NodeLexicon::AlertOnEventLogEntry}},
            NodeLexicon::EventLogEntry, DateTime::now());
    return path;
}

void MemorySource::raiseAlert(const std::string& path, const DateTime& when)
{
    NodeLexicon::NodeType kind{};
    std::optional<unsigned> code;
    {
        const std::lock_guard lock(mutex_);
        const auto node = tree_->find(path);
        if (!node)
        {
            throw std::invalid_argument("no node at " + path);
        }
        kind = tree_->node(*node).kind;
        code = alertCodeOf(kind);
    }
    if (!code)
    {
        throw std::invalid_argument("nodes of the kind of " + path +
                                    " raise no alerts");
    }
    deliver({{path, *code}}, kind, when);
}

void MemorySource::refuseWrites(bool refuse)
{
    const std::lock_guard lock(mutex_);
    refuseWrites_ = refuse;
}

std::size_t MemorySource::monitorCount(NodeLexicon::NodeType kind) const
{
    return dispatcher_.count(kind);
}

bool MemorySource::waitForAlerts(std::chrono::milliseconds timeout) const
{
    return dispatcher_.waitIdle(timeout);
}

unsigned MemorySource::acceptedWrites() const
{
    const std::lock_guard lock(mutex_);
    return acceptedWrites_;
}

std::string MemorySource::entryPath(const std::string& logPath,
                                    unsigned recordId)
{
    char digits[16];
    std::snprintf(digits, sizeof digits, "%05u", recordId);
    return logPath + "/entry-" + digits;
}

void MemorySource::deliver(
    const std::vector<std::pair<std::string, unsigned>>& alerts,
    NodeLexicon::NodeType kind, const DateTime& when)
{
    std::vector<PendingAlert> pending;
    pending.reserve(alerts.size());
    for (const auto& [path, code] : alerts)
    {
        pending.push_back(PendingAlert{kind, code, when, path});
    }
    dispatcher_.post(std::move(pending));
}

void MemorySource::raiseSimulatedAlert(SimulatedAlert alert)
{
    switch (alert)
    {
        case SimulatedAlert::RecordAdded:
            simulateRecord();
            return;
        case SimulatedAlert::LogCleared:
        {
            std::vector<std::pair<std::string, unsigned>> alerts;
            {
                const std::lock_guard lock(mutex_);
                for (std::string& logPath :
                     clearLogsLocked(firstControllerLocked()))
                {
                    alerts.emplace_back(std::move(logPath),
                                        NodeLexicon::AlertOnEventLog);
                }
            }
            deliver(alerts, NodeLexicon::EventLog, DateTime::now());
            return;
        }
        case SimulatedAlert::LogAlmostFull:
            simulateLogStatus(NodeLexicon::EventLogStatusAlmostFull);
            return;
        case SimulatedAlert::LogFull:
            simulateLogStatus(NodeLexicon::EventLogStatusFull);
            return;
        case SimulatedAlert::WatchdogRestart:
            simulateRestart();
            return;
    }
    throw std::invalid_argument("unknown simulated alert " +
                                std::to_string(static_cast<int>(alert)));
}

void raiseSimulatedAlert(InstrumentationSource& source, SimulatedAlert alert)
{
    auto* memory = dynamic_cast<MemorySource*>(&source);
    if (memory == nullptr)
    {
        throw std::runtime_error(
            std::string("this instrumentation source cannot simulate "
                        "alerts (asked for \"") +
            simulatedAlertName(alert) + "\"); only source = memory can");
    }
    memory->raiseSimulatedAlert(alert);
}

NodeTree::NodeId MemorySource::firstControllerLocked() const
{
    const auto& controllers =
        tree_->nodesOfKind(NodeLexicon::ManagementController);
    if (controllers.empty())
    {
        throw std::runtime_error(
            "the simulated BMC has no management controller");
    }
    return controllers.front();
}

NodeTree::NodeId MemorySource::firstLogLocked() const
{
    const auto& logs =
        tree_->nodesOfKind(NodeLexicon::EventLog, firstControllerLocked());
    if (logs.empty())
    {
        throw std::runtime_error("the simulated BMC has no event log");
    }
    return logs.front();
}

namespace
{

/** The 16 bytes of an IPMI SEL record: a system boot event logged by the
 *  BMC at @p when. */
std::string bootRecordData(unsigned recordId, std::time_t when)
{
    // System Event sensor (12h) 83h, sensor-specific, offset 01h: OEM
    // system boot event.
    return Ipmi::SelRecord::systemEvent(static_cast<std::uint16_t>(recordId),
                                        static_cast<std::uint32_t>(when), 0x12,
                                        0x83, 0x6f, {0x01, 0xff, 0xff})
        .hex();
}

} // namespace

void MemorySource::simulateRecord()
{
    std::string logPath;
    unsigned recordId = 1;
    {
        const std::lock_guard lock(mutex_);
        const NodeTree::NodeId log = firstLogLocked();
        logPath = tree_->node(log).path;
        // IPMI record ids are 16 bits, 0 and 0xffff reserved: take the one
        // after the highest, or the lowest free one once that runs out.
        std::set<unsigned> used;
        for (const NodeTree::NodeId entry :
             tree_->nodesOfKind(NodeLexicon::EventLogEntry, log))
        {
            const PropertyValue* id =
                tree_->node(entry).find(NodeLexicon::RecordId);
            if (id != nullptr && std::holds_alternative<unsigned>(*id))
            {
                used.insert(std::get<unsigned>(*id));
            }
        }
        recordId = used.empty() ? 1 : *used.rbegin() + 1;
        if (recordId > 0xfffe)
        {
            recordId = 1;
            while (used.count(recordId) != 0 ||
                   tree_->find(entryPath(logPath, recordId)))
            {
                ++recordId;
            }
        }
    }
    const std::time_t now = std::time(nullptr);
    appendEntry(logPath, recordId, NodeLexicon::timestampText(now),
                bootRecordData(recordId, now),
                "System Event: OEM System boot event");
}

void MemorySource::simulateLogStatus(unsigned status)
{
    std::string logPath;
    {
        const std::lock_guard lock(mutex_);
        logPath = tree_->node(firstLogLocked()).path;
        NodeTreeBuilder builder(*tree_);
        builder.setStatus(logPath, status);
        tree_ = std::move(builder).build();
    }
    deliver({{logPath, NodeLexicon::AlertOnEventLog}}, NodeLexicon::EventLog,
            DateTime::now());
}

void MemorySource::simulateRestart()
{
    std::string watchdogPath;
    {
        const std::lock_guard lock(mutex_);
        const NodeTree::NodeId controller = firstControllerLocked();
        const auto& watchdogs =
            tree_->nodesOfKind(NodeLexicon::Watchdog, controller);
        if (watchdogs.empty())
        {
            const std::string& controllerPath = tree_->node(controller).path;
            watchdogPath = controllerPath + "/wdt";
            NodeTreeBuilder builder(*tree_);
            builder
                .addNode(NodeLexicon::Watchdog, watchdogPath, controllerPath,
                         "Watchdog", 1)
                .setProperty(watchdogPath, NodeLexicon::RestartCause, 4u);
            tree_ = std::move(builder).build();
        }
        else
        {
            watchdogPath = tree_->node(watchdogs.front()).path;
        }
    }
    deliver({{watchdogPath, NodeLexicon::AlertOnWatchdog}},
            NodeLexicon::Watchdog, DateTime::now());
}

} // namespace QX
