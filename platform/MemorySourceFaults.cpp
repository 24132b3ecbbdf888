// Faults armed on the in-memory source: its cursors fail where a test asks
// them to, as a BMC that stops answering would.
#include "MemorySource.h"
#include "SnapshotWalk.h"

#include <stdexcept>

namespace QX
{

/** A snapshot walk that asks its source before each operation whether a
 *  fault is armed on it. */
class MemorySource::FaultingWalk : public SnapshotWalk
{
  public:
    explicit FaultingWalk(MemorySource& source) :
        SnapshotWalk(source), source_(source)
    {
    }

    void selectNode(NodeLexicon::NodeType kind) override
    {
        source_.failIfArmed(CursorOperation::SelectKind);
        SnapshotWalk::selectNode(kind);
    }
    void selectNode(const std::string& path) override
    {
        source_.failIfArmed(CursorOperation::SelectPath);
        SnapshotWalk::selectNode(path);
    }
    bool valid() const override
    {
        source_.failIfArmed(CursorOperation::Valid);
        return SnapshotWalk::valid();
    }
    void next() override
    {
        source_.failIfArmed(CursorOperation::Next);
        SnapshotWalk::next();
    }
    bool setFilter(NodeLexicon::PathType type, const std::string& path) override
    {
        source_.failIfArmed(CursorOperation::SetFilter);
        return SnapshotWalk::setFilter(type, path);
    }
    const std::string& getPathToNode() const override
    {
        source_.failIfArmed(CursorOperation::GetPath);
        return SnapshotWalk::getPathToNode();
    }
    std::string getPathToParentNode() const override
    {
        source_.failIfArmed(CursorOperation::GetParentPath);
        return SnapshotWalk::getPathToParentNode();
    }
    std::string convertPathToString(const std::string& path) const override
    {
        source_.failIfArmed(CursorOperation::ConvertPath);
        return SnapshotWalk::convertPathToString(path);
    }
    std::string getNodeDescription() const override
    {
        source_.failIfArmed(CursorOperation::GetDescription);
        return SnapshotWalk::getNodeDescription();
    }
    unsigned getNodeStatus() const override
    {
        source_.failIfArmed(CursorOperation::GetStatus);
        return SnapshotWalk::getNodeStatus();
    }
    const PropertyValue* findProperty(NodeLexicon::Properties property) override
    {
        source_.failIfArmed(CursorOperation::GetProperty);
        return SnapshotWalk::findProperty(property);
    }
    bool setProperty(NodeLexicon::Properties property, unsigned value) override
    {
        source_.failIfArmed(CursorOperation::SetProperty);
        return SnapshotWalk::setProperty(property, value);
    }
    void changeMonitoring(bool start, NodeLexicon::NodeType kind,
                          MonitorCallback callback,
                          const void* context) override
    {
        source_.failIfArmed(start ? CursorOperation::StartMonitoring
                                  : CursorOperation::StopMonitoring);
        SnapshotWalk::changeMonitoring(start, kind, callback, context);
    }

  private:
    MemorySource& source_;
};

std::unique_ptr<SnapshotWalk> MemorySource::openWalk()
{
    failIfArmed(CursorOperation::Construct);
    return std::make_unique<FaultingWalk>(*this);
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

void MemorySource::failIfArmed(CursorOperation operation)
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

} // namespace QX
