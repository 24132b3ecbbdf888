#pragma once

#include "DateTime.h"
#include "NodeLexicon.h"
#include "NodeTree.h"

#include <memory>
#include <string>

namespace QX
{

/** Called by a source when a monitored node raises an alert. */
using MonitorCallback = void (*)(unsigned int alertCode, DateTime when,
                                 std::string nodePath, const void* context);

class SnapshotWalk;

/**
 * @brief Where the instrumentation tree comes from: the BMC, or memory.
 *
 * A source hands out immutable snapshots of its tree; cursors
 * (QX::Instrumentation) walk a snapshot and send writes and monitoring
 * requests back to the source. The platform picks one source per process
 * from its configuration (see QX::Platform).
 */
class InstrumentationSource
{
  public:
    virtual ~InstrumentationSource() = default;

    /** The current tree. Throws a std::exception when it cannot be read. */
    virtual std::shared_ptr<const NodeTree> snapshot() = 0;

    /**
     * @brief Writes an unsigned property of the node at @p path.
     * @return true when the hardware accepted the write
     */
    virtual bool writeProperty(const std::string& path,
                               NodeLexicon::Properties property,
                               unsigned value) = 0;

    /** Printable form of a path of a source: the path behind "IPMI:". */
    std::string printablePath(const std::string& path) const
    {
        return "IPMI:" + path;
    }

    /**
     * A walk for one cursor over this source. The default walks one
     * snapshot of the tree and sends writes and monitoring requests back
     * to this source, which must outlive the walk.
     */
    virtual std::unique_ptr<SnapshotWalk> openWalk();

    /**
     * Registers @p callback for alerts of nodes of @p kind. Callbacks are
     * called on a thread of the source, never on the thread that caused the
     * alert, with the alert code of the node's kind (NodeLexicon), the time
     * of the event and the node's path.
     */
    virtual void startMonitoring(NodeLexicon::NodeType kind,
                                 MonitorCallback callback,
                                 const void* context) = 0;
    /**
     * Removes one registration made with the same three arguments. Once this
     * returns, that registration's callback is not running and is not called
     * again (a library that registered callbacks relies on this before it is
     * unloaded). Called from within a callback, it only prevents later calls.
     */
    virtual void stopMonitoring(NodeLexicon::NodeType kind,
                                MonitorCallback callback,
                                const void* context) = 0;
};

} // namespace QX
