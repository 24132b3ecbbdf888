#include "SnapshotWalk.h"

#include <stdexcept>

namespace QX
{

std::unique_ptr<SnapshotWalk> InstrumentationSource::openWalk()
{
    return std::make_unique<SnapshotWalk>(*this);
}

SnapshotWalk::SnapshotWalk(InstrumentationSource& source) : source_(source) {}

void SnapshotWalk::selectNode(NodeLexicon::NodeType kind)
{
    hasKind_ = true;
    kind_ = kind;
    positionOnFirst();
}

void SnapshotWalk::selectNode(const std::string& path)
{
    const NodeTree& nodes = tree();
    list_ = nullptr;
    node_ = NodeTree::none;
    const auto id = nodes.find(path);
    if (!id || filterUnknown_)
    {
        return;
    }
    // A filter restricts selection by path too: a node outside it is not
    // selectable, and stepping goes on from the node's place in the list.
    const auto position = nodes.positionInList(*id, filter_);
    if (!position)
    {
        return;
    }
    hasKind_ = true;
    kind_ = nodes.node(*id).kind;
    list_ = &nodes.nodesOfKind(kind_, filter_);
    index_ = *position;
    node_ = *id;
}

bool SnapshotWalk::valid() const
{
    return current() != nullptr;
}

void SnapshotWalk::next()
{
    if (node_ == NodeTree::none || list_ == nullptr)
    {
        return;
    }
    ++index_;
    node_ = index_ < list_->size() ? (*list_)[index_] : NodeTree::none;
}

bool SnapshotWalk::setFilter(NodeLexicon::PathType type,
                             const std::string& path)
{
    if (type != NodeLexicon::Parent)
    {
        return false;
    }
    const NodeTree& nodes = tree();
    const auto id = nodes.find(path);
    if (!id)
    {
        filterUnknown_ = true;
        filter_ = NodeTree::none;
        list_ = nullptr;
        node_ = NodeTree::none;
        return false;
    }
    filterUnknown_ = false;
    filter_ = *id;
    if (!hasKind_)
    {
        return true;
    }
    const auto position = node_ == NodeTree::none
                              ? std::nullopt
                              : nodes.positionInList(node_, filter_);
    if (position)
    {
        list_ = &nodes.nodesOfKind(kind_, filter_);
        index_ = *position;
    }
    else
    {
        positionOnFirst();
    }
    return true;
}

const std::string& SnapshotWalk::getPathToNode() const
{
    return currentOrThrow("getPathToNode").path;
}

std::string SnapshotWalk::getPathToParentNode() const
{
    const NodeRecord& record = currentOrThrow("getPathToParentNode");
    // A root node has no parent: its parent path is empty.
    return record.parent == NodeTree::none ? std::string()
                                           : tree_->node(record.parent).path;
}

std::string SnapshotWalk::convertPathToString(const std::string& path) const
{
    return source_.printablePath(path);
}

std::string SnapshotWalk::getNodeDescription() const
{
    return currentOrThrow("getNodeDescription").description;
}

unsigned SnapshotWalk::getNodeStatus() const
{
    return currentOrThrow("getNodeStatus").status;
}

const PropertyValue*
SnapshotWalk::findProperty(NodeLexicon::Properties property)
{
    const NodeRecord* record = current();
    return record == nullptr ? nullptr : record->find(property);
}

bool SnapshotWalk::setProperty(NodeLexicon::Properties property, unsigned value)
{
    const NodeRecord* record = current();
    if (record == nullptr)
    {
        return false;
    }
    return source_.writeProperty(record->path, property, value);
}

void SnapshotWalk::changeMonitoring(bool start, NodeLexicon::NodeType kind,
                                    MonitorCallback callback,
                                    const void* context)
{
    if (start)
    {
        source_.startMonitoring(kind, callback, context);
    }
    else
    {
        source_.stopMonitoring(kind, callback, context);
    }
}

const NodeTree& SnapshotWalk::tree()
{
    if (!tree_)
    {
        tree_ = source_.snapshot();
        if (!tree_)
        {
            throw std::runtime_error("instrumentation source has no tree");
        }
    }
    return *tree_;
}

const NodeRecord* SnapshotWalk::current() const
{
    if (node_ == NodeTree::none || !tree_)
    {
        return nullptr;
    }
    return &tree_->node(node_);
}

const NodeRecord& SnapshotWalk::currentOrThrow(const char* operation) const
{
    const NodeRecord* record = current();
    if (record == nullptr)
    {
        throw std::logic_error(std::string("Instrumentation::") + operation +
                               ": the cursor stands on no node");
    }
    return *record;
}

void SnapshotWalk::positionOnFirst()
{
    list_ = nullptr;
    node_ = NodeTree::none;
    index_ = 0;
    if (filterUnknown_)
    {
        return;
    }
    list_ = &tree().nodesOfKind(kind_, filter_);
    if (!list_->empty())
    {
        node_ = list_->front();
    }
}

} // namespace QX
