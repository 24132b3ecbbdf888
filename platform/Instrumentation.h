#pragma once

#include "DateTime.h"
#include "InstrumentationSource.h"
#include "NodeLexicon.h"
#include "NodeTree.h"

#include <memory>
#include <string>

namespace QX
{

/**
 * @brief A cursor over the instrumentation tree.
 *
 * Made by its default constructor on the platform's configured source, used
 * for one walk and destroyed; the source decides how the walk goes (see
 * InstrumentationSource::openWalk). The cursor reads one snapshot of the tree,
 * taken at its first selection, so a walk sees a consistent tree even while
 * the source changes. Every operation may throw a std::exception.
 *
 * Selection and stepping follow the kind last selected: selectNode(kind)
 * stands on the first node of that kind (within the filter, if one is set),
 * operator++ moves to the next one, and the cursor becomes invalid after the
 * last. selectNode(path) stands on that node when it lies within the filter
 * (invalid otherwise) and makes its kind the one stepped through.
 * setFilter(Parent, path) restricts selection and stepping to nodes under
 * that path; a current node outside the new filter is replaced by the first
 * node of its kind inside it.
 */
class Instrumentation
{
  public:
    Instrumentation();
    explicit Instrumentation(std::shared_ptr<InstrumentationSource> source);
    ~Instrumentation();

    Instrumentation(const Instrumentation&) = delete;
    Instrumentation& operator=(const Instrumentation&) = delete;

    void selectNode(NodeLexicon::NodeType kind);
    void selectNode(const std::string& path);
    explicit operator bool() const;
    Instrumentation& operator++();
    bool setFilter(NodeLexicon::PathType type, const std::string& path);

    /** The current node's path, held by the cursor's snapshot: valid for
     *  as long as the cursor lives. */
    const std::string& getPathToNode() const;
    std::string getPathToParentNode() const;
    std::string convertPathToString(const std::string& path) const;
    std::string getNodeDescription() const;
    unsigned getNodeStatus() const;

    bool getProperty(NodeLexicon::Properties property, std::string& value);
    bool getProperty(NodeLexicon::Properties property, unsigned int& value);
    bool getProperty(NodeLexicon::Properties property, bool& value);
    bool setProperty(NodeLexicon::Properties property, unsigned int& value);

    void startMonitoring(NodeLexicon::NodeType kind, MonitorCallback callback,
                         const void* context);
    void stopMonitoring(NodeLexicon::NodeType kind, MonitorCallback callback,
                        const void* context);

  private:
    template <typename T>
    bool readProperty(NodeLexicon::Properties property, T& value);

    // The walk refers to the source: declared after it, destroyed before it.
    std::shared_ptr<InstrumentationSource> source_;
    std::unique_ptr<SnapshotWalk> walk_;
};

} // namespace QX
