#pragma once

#include "InstrumentationSource.h"
#include "NodeLexicon.h"
#include "NodeTree.h"

#include <memory>
#include <string>
#include <vector>

namespace QX
{

/**
 * @brief What a cursor (QX::Instrumentation) does for each of its
 * operations: a walk over one snapshot of a source's tree.
 *
 * The snapshot is taken at the first selection; writes and monitoring
 * requests go back to the source, which must outlive the walk. A source
 * hands out its walks through InstrumentationSource::openWalk and may
 * refine them by deriving from this class. See Instrumentation for what
 * each operation means.
 */
class SnapshotWalk
{
  public:
    explicit SnapshotWalk(InstrumentationSource& source);
    virtual ~SnapshotWalk() = default;

    SnapshotWalk(const SnapshotWalk&) = delete;
    SnapshotWalk& operator=(const SnapshotWalk&) = delete;
    SnapshotWalk(SnapshotWalk&&) = delete;
    SnapshotWalk& operator=(SnapshotWalk&&) = delete;

    virtual void selectNode(NodeLexicon::NodeType kind);
    virtual void selectNode(const std::string& path);
    virtual bool valid() const;
    virtual void next();
    virtual bool setFilter(NodeLexicon::PathType type, const std::string& path);
    virtual const std::string& getPathToNode() const;
    virtual std::string getPathToParentNode() const;
    virtual std::string convertPathToString(const std::string& path) const;
    virtual std::string getNodeDescription() const;
    virtual unsigned getNodeStatus() const;
    /** The current node's value of @p property; null when the cursor
     *  stands on no node or the node has no such property. */
    virtual const PropertyValue* findProperty(NodeLexicon::Properties property);
    virtual bool setProperty(NodeLexicon::Properties property, unsigned value);
    /** Registers (@p start) or removes a monitor callback at the source. */
    virtual void changeMonitoring(bool start, NodeLexicon::NodeType kind,
                                  MonitorCallback callback,
                                  const void* context);

  private:
    const NodeTree& tree();
    const NodeRecord* current() const;
    const NodeRecord& currentOrThrow(const char* operation) const;
    void positionOnFirst();

    InstrumentationSource& source_;
    std::shared_ptr<const NodeTree> tree_;
    bool hasKind_ = false;
    NodeLexicon::NodeType kind_{};
    NodeTree::NodeId filter_ = NodeTree::none;
    bool filterUnknown_ = false; // filter path named no node: nothing matches
    const std::vector<NodeTree::NodeId>* list_ = nullptr;
    std::size_t index_ = 0;
    NodeTree::NodeId node_ = NodeTree::none;
};

} // namespace QX
