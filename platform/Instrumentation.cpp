#include "Instrumentation.h"

#include "Platform.h"

#include <stdexcept>

namespace QX
{

Instrumentation::Instrumentation() : Instrumentation(Platform::currentSource())
{
}

Instrumentation::Instrumentation(
    std::shared_ptr<InstrumentationSource> source) :
    source_(std::move(source))
{
    if (!source_)
    {
        throw std::invalid_argument("instrumentation cursor without a source");
    }
    source_->beforeOperation(CursorOperation::Construct);
}

Instrumentation::~Instrumentation() = default;

void Instrumentation::selectNode(NodeLexicon::NodeType kind)
{
    source_->beforeOperation(CursorOperation::SelectKind);
    hasKind_ = true;
    kind_ = kind;
    positionOnFirst();
}

void Instrumentation::selectNode(const std::string& path)
{
    source_->beforeOperation(CursorOperation::SelectPath);
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

Instrumentation::operator bool() const
{
    source_->beforeOperation(CursorOperation::Valid);
    return current() != nullptr;
}

Instrumentation& Instrumentation::operator++()
{
    source_->beforeOperation(CursorOperation::Next);
    if (node_ == NodeTree::none || list_ == nullptr)
    {
        return *this;
    }
    ++index_;
    node_ = index_ < list_->size() ? (*list_)[index_] : NodeTree::none;
    return *this;
}

bool Instrumentation::setFilter(NodeLexicon::PathType type,
                                const std::string& path)
{
    source_->beforeOperation(CursorOperation::SetFilter);
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

const std::string& Instrumentation::getPathToNode() const
{
    source_->beforeOperation(CursorOperation::GetPath);
    return currentOrThrow("getPathToNode").path;
}

std::string Instrumentation::getPathToParentNode() const
{
    source_->beforeOperation(CursorOperation::GetParentPath);
    const NodeRecord& record = currentOrThrow("getPathToParentNode");
    // A root node has no parent: its parent path is empty.
    return record.parent == NodeTree::none ? std::string()
                                           : tree_->node(record.parent).path;
}

std::string Instrumentation::convertPathToString(const std::string& path) const
{
    source_->beforeOperation(CursorOperation::ConvertPath);
    return source_->printablePath(path);
}

std::string Instrumentation::getNodeDescription() const
{
    source_->beforeOperation(CursorOperation::GetDescription);
    return currentOrThrow("getNodeDescription").description;
}

unsigned Instrumentation::getNodeStatus() const
{
    source_->beforeOperation(CursorOperation::GetStatus);
    return currentOrThrow("getNodeStatus").status;
}

bool Instrumentation::getProperty(NodeLexicon::Properties property,
                                  std::string& value)
{
    return readProperty(property, value);
}

bool Instrumentation::getProperty(NodeLexicon::Properties property,
                                  unsigned int& value)
{
    return readProperty(property, value);
}

bool Instrumentation::getProperty(NodeLexicon::Properties property, bool& value)
{
    return readProperty(property, value);
}

bool Instrumentation::setProperty(NodeLexicon::Properties property,
                                  unsigned int& value)
{
    source_->beforeOperation(CursorOperation::SetProperty);
    const NodeRecord* record = current();
    if (record == nullptr)
    {
        return false;
    }
    return source_->writeProperty(record->path, property, value);
}

void Instrumentation::startMonitoring(NodeLexicon::NodeType kind,
                                      MonitorCallback callback,
                                      const void* context)
{
    source_->beforeOperation(CursorOperation::StartMonitoring);
    source_->startMonitoring(kind, callback, context);
}

void Instrumentation::stopMonitoring(NodeLexicon::NodeType kind,
                                     MonitorCallback callback,
                                     const void* context)
{
    source_->beforeOperation(CursorOperation::StopMonitoring);
    source_->stopMonitoring(kind, callback, context);
}

const NodeTree& Instrumentation::tree()
{
    if (!tree_)
    {
        tree_ = source_->snapshot();
        if (!tree_)
        {
            throw std::runtime_error("instrumentation source has no tree");
        }
    }
    return *tree_;
}

const NodeRecord* Instrumentation::current() const
{
    if (node_ == NodeTree::none || !tree_)
    {
        return nullptr;
    }
    return &tree_->node(node_);
}

const NodeRecord& Instrumentation::currentOrThrow(const char* operation) const
{
    const NodeRecord* record = current();
    if (record == nullptr)
    {
        throw std::logic_error(std::string("Instrumentation::") + operation +
                               ": the cursor stands on no node");
    }
    return *record;
}

void Instrumentation::positionOnFirst()
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

template <typename T>
bool Instrumentation::readProperty(NodeLexicon::Properties property, T& value)
{
    source_->beforeOperation(CursorOperation::GetProperty);
    const NodeRecord* record = current();
    if (record == nullptr)
    {
        return false;
    }
    const PropertyValue* stored = record->find(property);
    if (stored == nullptr)
    {
        return false;
    }
    const T* typed = std::get_if<T>(stored);
    if (typed == nullptr)
    {
        return false;
    }
    value = *typed;
    return true;
}

} // namespace QX
