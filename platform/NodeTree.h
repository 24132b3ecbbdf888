#pragma once

#include "NodeLexicon.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <unordered_map>
#include <variant>
#include <vector>

namespace QX
{

/** A property value: text, unsigned 32-bit or boolean. */
using PropertyValue = std::variant<std::string, unsigned, bool>;

/** One node of an instrumentation tree. */
struct NodeRecord
{
    NodeLexicon::NodeType kind{};
    std::string path; // identity of the node within its tree
    std::string description;
    unsigned status = 0;
    std::uint32_t parent; // index of the parent node, or NodeTree::none
    std::vector<std::pair<NodeLexicon::Properties, PropertyValue>> properties;

    const PropertyValue* find(NodeLexicon::Properties property) const;
};

/**
 * @brief An immutable snapshot of an instrumentation tree, indexed for
 *        constant-time cursor moves.
 *
 * Nodes keep the order in which they were added. For every node kind there
 * is one ordered list of all nodes of that kind, and one per ancestor, so a
 * cursor filtered by "under this node" steps through a prepared list. Built
 * by NodeTreeBuilder; shared read-only between cursors and threads.
 */
class NodeTree
{
  public:
    using NodeId = std::uint32_t;
    static constexpr NodeId none = UINT32_MAX;

    std::size_t size() const
    {
        return nodes_.size();
    }
    const NodeRecord& node(NodeId id) const
    {
        return nodes_.at(id);
    }
    /** Node with exactly this path, if any. */
    std::optional<NodeId> find(const std::string& path) const;
    /**
     * Nodes of @p kind in insertion order; with @p ancestor other than none,
     * only those that lie (at any depth) under that node.
     */
    const std::vector<NodeId>& nodesOfKind(NodeLexicon::NodeType kind,
                                           NodeId ancestor = none) const;
    /** Whether @p id lies at any depth under @p ancestor. */
    bool isUnder(NodeId id, NodeId ancestor) const;
    /**
     * Position of @p id within nodesOfKind(kind of @p id, @p ancestor), or
     * nothing when the node is not in that list. Costs O(depth).
     */
    std::optional<std::size_t> positionInList(NodeId id,
                                              NodeId ancestor = none) const;

  private:
    friend class NodeTreeBuilder;
    static std::uint64_t listKey(unsigned kind, NodeId ancestor)
    {
        return (static_cast<std::uint64_t>(kind) << 32) | ancestor;
    }

    std::vector<NodeRecord> nodes_;
    std::unordered_map<std::string, NodeId> byPath_;
    std::unordered_map<std::uint64_t, std::vector<NodeId>> lists_;
    // For node i, positions_[positionStart_[i] + d] is its index in the list
    // of its kind under its ancestor d levels up (d = 0: the unfiltered list).
    std::vector<std::uint32_t> positionStart_;
    std::vector<std::uint32_t> positions_;
};

/**
 * @brief Collects nodes and properties, then freezes them into a NodeTree.
 *
 * Throws std::invalid_argument for a duplicate path or an unknown parent.
 */
class NodeTreeBuilder
{
  public:
    NodeTreeBuilder() = default;
    /** Starts from a copy of an existing tree's nodes. */
    explicit NodeTreeBuilder(const NodeTree& tree);

    /** Adds a node; an empty @p parentPath makes it a root. */
    NodeTreeBuilder& addNode(NodeLexicon::NodeType kind,
                             const std::string& path,
                             const std::string& parentPath,
                             const std::string& description, unsigned status);
    /** Sets (or replaces) a property of the node at @p path. */
    NodeTreeBuilder& setProperty(const std::string& path,
                                 NodeLexicon::Properties property,
                                 PropertyValue value);
    NodeTreeBuilder& removeProperty(const std::string& path,
                                    NodeLexicon::Properties property);
    NodeTreeBuilder& setStatus(const std::string& path, unsigned status);
    NodeTreeBuilder& setDescription(const std::string& path,
                                    const std::string& description);
    /** Removes every node of @p kind under the node at @p ancestorPath,
     *  together with their descendants. */
    NodeTreeBuilder& removeNodes(NodeLexicon::NodeType kind,
                                 const std::string& ancestorPath);
    bool contains(const std::string& path) const;

    /** A tree of the nodes collected so far; the builder keeps them. */
    std::shared_ptr<const NodeTree> build() const&;
    /** The same, handing the collected nodes over instead of copying them
     *  (the builder is left empty). */
    std::shared_ptr<const NodeTree> build() &&;

  private:
    NodeRecord& at(const std::string& path);
    static std::shared_ptr<const NodeTree>
    freeze(std::vector<NodeRecord> nodes,
           std::unordered_map<std::string, NodeTree::NodeId> byPath);

    std::vector<NodeRecord> nodes_;
    std::unordered_map<std::string, NodeTree::NodeId> byPath_;
};

} // namespace QX
