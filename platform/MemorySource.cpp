#include "MemorySource.h"

#include <algorithm>
#include <cstdio>
#include <iterator>
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
        NodeTreeBuilder builder(*tree_);
        for (const NodeTree::NodeId log :
             tree_->nodesOfKind(NodeLexicon::EventLog, *controller))
        {
            const std::string& logPath = tree_->node(log).path;
            builder.removeNodes(NodeLexicon::EventLogEntry, logPath)
                .setProperty(logPath, NodeLexicon::IsEmpty, true)
                .setStatus(logPath, NodeLexicon::EventLogStatusCleared);
            alerts.emplace_back(logPath, NodeLexicon::AlertOnEventLog);
        }
        tree_ = builder.build();
        ++acceptedWrites_;
    }
    deliver(alerts, NodeLexicon::EventLog, DateTime::now());
    return true;
}

std::string MemorySource::printablePath(const std::string& path) const
{
    return "IPMI:" + path;
}

void MemorySource::startMonitoring(NodeLexicon::NodeType kind,
                                   MonitorCallback callback,
                                   const void* context)
{
    const std::lock_guard lock(mutex_);
    monitors_.push_back(Monitor{kind, callback, context});
}

void MemorySource::stopMonitoring(NodeLexicon::NodeType kind,
                                  MonitorCallback callback, const void* context)
{
    const std::lock_guard lock(mutex_);
    const auto found = std::find_if(monitors_.begin(), monitors_.end(),
                                    [&](const Monitor& monitor)
                                    {
                                        return monitor.kind == kind &&
                                               monitor.callback == callback &&
                                               monitor.context == context;
                                    });
    if (found != monitors_.end())
    {
        monitors_.erase(found);
    }
}

void MemorySource::beforeOperation(CursorOperation operation)
{
    if (!faultsArmed_.load(std::memory_order_acquire))
    {
        return;
    }
    const std::lock_guard lock(mutex_);
    std::optional<std::string> failure;
    for (auto armed = faults_.begin(); armed != faults_.end();)
    {
        if (armed->fault.operation != operation)
        {
            ++armed;
            continue;
        }
        ++armed->calls;
        if (!failure && armed->calls > armed->fault.skip)
        {
            failure = armed->fault.message;
            if (!armed->fault.repeat)
            {
                armed = faults_.erase(armed);
                continue;
            }
        }
        ++armed;
    }
    faultsArmed_.store(!faults_.empty(), std::memory_order_release);
    if (failure)
    {
        throw std::runtime_error(*failure);
    }
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
    const std::string path = entryPath(logPath, recordId);
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
        tree_ = builder.build();
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

void MemorySource::armFault(const CursorFault& fault)
{
    const std::lock_guard lock(mutex_);
    faults_.push_back(ArmedFault{fault, 0});
    faultsArmed_.store(true, std::memory_order_release);
}

void MemorySource::clearFaults()
{
    const std::lock_guard lock(mutex_);
    faults_.clear();
    faultsArmed_.store(false, std::memory_order_release);
}

void MemorySource::refuseWrites(bool refuse)
{
    const std::lock_guard lock(mutex_);
    refuseWrites_ = refuse;
}

std::size_t MemorySource::monitorCount(NodeLexicon::NodeType kind) const
{
    const std::lock_guard lock(mutex_);
    return static_cast<std::size_t>(std::count_if(
        monitors_.begin(), monitors_.end(),
        [kind](const Monitor& monitor) { return monitor.kind == kind; }));
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
    // Callbacks run without the lock: they may well call back into this
    // source (take a snapshot, start or stop monitoring).
    std::vector<Monitor> targets;
    {
        const std::lock_guard lock(mutex_);
        std::copy_if(
            monitors_.begin(), monitors_.end(), std::back_inserter(targets),
            [kind](const Monitor& monitor) { return monitor.kind == kind; });
    }
    for (const auto& [path, code] : alerts)
    {
        for (const Monitor& monitor : targets)
        {
            if (monitor.callback != nullptr)
            {
                monitor.callback(code, when, path, monitor.context);
            }
        }
    }
}

} // namespace QX
