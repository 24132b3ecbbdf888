#include "NodeTree.h"

#include <algorithm>
#include <stdexcept>

namespace QX
{

const PropertyValue* NodeRecord::find(NodeLexicon::Properties property) const
{
    for (const auto& [key, value] : properties)
    {
        if (key == property)
        {
            return &value;
        }
    }
    return nullptr;
}

std::optional<NodeTree::NodeId> NodeTree::find(const std::string& path) const
{
    const auto found = byPath_.find(path);
    if (found == byPath_.end())
    {
        return std::nullopt;
    }
    return found->second;
}

const std::vector<NodeTree::NodeId>&
NodeTree::nodesOfKind(NodeLexicon::NodeType kind, NodeId ancestor) const
{
    static const std::vector<NodeId> noNodes;
    const auto found = lists_.find(listKey(kind, ancestor));
    return found == lists_.end() ? noNodes : found->second;
}

bool NodeTree::isUnder(NodeId id, NodeId ancestor) const
{
    if (id >= nodes_.size() || ancestor == none)
    {
        return false;
    }
    // Parents always precede their children, so this walk ends.
    for (NodeId up = nodes_[id].parent; up != none; up = nodes_[up].parent)
    {
        if (up == ancestor)
        {
            return true;
        }
    }
    return false;
}

std::optional<std::size_t> NodeTree::positionInList(NodeId id,
                                                    NodeId ancestor) const
{
    if (id >= nodes_.size())
    {
        return std::nullopt;
    }
    const std::uint32_t base = positionStart_[id];
    if (ancestor == none)
    {
        return positions_[base];
    }
    std::uint32_t level = 1;
    for (NodeId up = nodes_[id].parent; up != none;
         up = nodes_[up].parent, ++level)
    {
        if (up == ancestor)
        {
            return positions_[base + level];
        }
    }
    return std::nullopt;
}

NodeTreeBuilder::NodeTreeBuilder(const NodeTree& tree) :
    nodes_(tree.nodes_), byPath_(tree.byPath_)
{
}

NodeTreeBuilder& NodeTreeBuilder::addNode(NodeLexicon::NodeType kind,
                                          const std::string& path,
                                          const std::string& parentPath,
                                          const std::string& description,
                                          unsigned status)
{
    if (path.empty())
    {
        throw std::invalid_argument("node path is empty");
    }
    if (contains(path))
    {
        throw std::invalid_argument("duplicate node path: " + path);
    }
    NodeTree::NodeId parent = NodeTree::none;
    if (!parentPath.empty())
    {
        const auto found = byPath_.find(parentPath);
        if (found == byPath_.end())
        {
            throw std::invalid_argument("unknown parent path: " + parentPath);
        }
        parent = found->second;
    }
    if (nodes_.size() >= NodeTree::none)
    {
        throw std::length_error("too many nodes in one tree");
    }
    const auto id = static_cast<NodeTree::NodeId>(nodes_.size());
    nodes_.push_back(NodeRecord{kind, path, description, status, parent, {}});
    byPath_.emplace(path, id);
    return *this;
}

NodeTreeBuilder& NodeTreeBuilder::setProperty(const std::string& path,
                                              NodeLexicon::Properties property,
                                              PropertyValue value)
{
    NodeRecord& record = at(path);
    for (auto& [key, stored] : record.properties)
    {
        if (key == property)
        {
            stored = std::move(value);
            return *this;
        }
    }
    record.properties.emplace_back(property, std::move(value));
    return *this;
}

NodeTreeBuilder&
NodeTreeBuilder::removeProperty(const std::string& path,
                                NodeLexicon::Properties property)
{
    auto& properties = at(path).properties;
    std::erase_if(properties, [property](const auto& item)
                  { return item.first == property; });
    return *this;
}

NodeTreeBuilder& NodeTreeBuilder::setStatus(const std::string& path,
                                            unsigned status)
{
    at(path).status = status;
    return *this;
}

NodeTreeBuilder& NodeTreeBuilder::setDescription(const std::string& path,
                                                 const std::string& description)
{
    at(path).description = description;
    return *this;
}

NodeTreeBuilder& NodeTreeBuilder::removeNodes(NodeLexicon::NodeType kind,
                                              const std::string& ancestorPath)
{
    const auto found = byPath_.find(ancestorPath);
    if (found == byPath_.end())
    {
        throw std::invalid_argument("unknown node path: " + ancestorPath);
    }
    const NodeTree::NodeId ancestor = found->second;
    const std::size_t count = nodes_.size();

    // One forward pass suffices because parents precede their children.
    std::vector<char> under(count, 0);
    std::vector<char> removed(count, 0);
    for (std::size_t i = 0; i < count; ++i)
    {
        const NodeTree::NodeId parent = nodes_[i].parent;
        if (parent == NodeTree::none)
        {
            continue;
        }
        under[i] = static_cast<char>(parent == ancestor || under[parent]);
        removed[i] = static_cast<char>((under[i] && nodes_[i].kind == kind) ||
                                       removed[parent]);
    }

    std::vector<NodeTree::NodeId> newId(count, NodeTree::none);
    std::vector<NodeRecord> kept;
    kept.reserve(count);
    for (std::size_t i = 0; i < count; ++i)
    {
        if (removed[i])
        {
            continue;
        }
        newId[i] = static_cast<NodeTree::NodeId>(kept.size());
        kept.push_back(std::move(nodes_[i]));
        NodeRecord& record = kept.back();
        if (record.parent != NodeTree::none)
        {
            record.parent = newId[record.parent];
        }
    }
    nodes_ = std::move(kept);
    byPath_.clear();
    for (std::size_t i = 0; i < nodes_.size(); ++i)
    {
        byPath_.emplace(nodes_[i].path, static_cast<NodeTree::NodeId>(i));
    }
    return *this;
}

bool NodeTreeBuilder::contains(const std::string& path) const
{
    return byPath_.find(path) != byPath_.end();
}

std::shared_ptr<const NodeTree> NodeTreeBuilder::build() const&
{
    return freeze(nodes_, byPath_);
}

std::shared_ptr<const NodeTree> NodeTreeBuilder::build() &&
{
    auto tree = freeze(std::move(nodes_), std::move(byPath_));
    nodes_.clear();
    byPath_.clear();
    return tree;
}

std::shared_ptr<const NodeTree> NodeTreeBuilder::freeze(
    std::vector<NodeRecord> nodes,
    std::unordered_map<std::string, NodeTree::NodeId> byPath)
{
    auto tree = std::make_shared<NodeTree>();
    tree->nodes_ = std::move(nodes);
    tree->byPath_ = std::move(byPath);
    const std::vector<NodeRecord>& frozen = tree->nodes_;
    tree->positionStart_.reserve(frozen.size() + 1);
    for (std::size_t i = 0; i < frozen.size(); ++i)
    {
        const auto id = static_cast<NodeTree::NodeId>(i);
        const unsigned kind = frozen[i].kind;
        tree->positionStart_.push_back(
            static_cast<std::uint32_t>(tree->positions_.size()));

        auto& all = tree->lists_[NodeTree::listKey(kind, NodeTree::none)];
        tree->positions_.push_back(static_cast<std::uint32_t>(all.size()));
        all.push_back(id);
        for (NodeTree::NodeId up = frozen[i].parent; up != NodeTree::none;
             up = frozen[up].parent)
        {
            auto& list = tree->lists_[NodeTree::listKey(kind, up)];
            tree->positions_.push_back(static_cast<std::uint32_t>(list.size()));
            list.push_back(id);
        }
    }
    tree->positionStart_.push_back(
        static_cast<std::uint32_t>(tree->positions_.size()));
    return tree;
}

NodeRecord& NodeTreeBuilder::at(const std::string& path)
{
    const auto found = byPath_.find(path);
    if (found == byPath_.end())
    {
        throw std::invalid_argument("unknown node path: " + path);
    }
    return nodes_[found->second];
}

} // namespace QX
