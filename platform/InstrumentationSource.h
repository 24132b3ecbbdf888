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

/** Cursor operations, named so a source can fail any one of them. */
enum class CursorOperation
{
    Construct,
    SelectKind,
    SelectPath,
    Valid,
    Next,
    SetFilter,
    GetPath,
    GetParentPath,
    ConvertPath,
    GetDescription,
    GetStatus,
    GetProperty,
    SetProperty,
    StartMonitoring,
    StopMonitoring,
};

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

    /** Printable form of a path of this source. */
    virtual std::string printablePath(const std::string& path) const = 0;

    /** Registers @p callback for alerts of nodes of @p kind. */
    virtual void startMonitoring(NodeLexicon::NodeType kind,
                                 MonitorCallback callback,
                                 const void* context) = 0;
    /** Removes a registration made with the same three arguments. */
    virtual void stopMonitoring(NodeLexicon::NodeType kind,
                                MonitorCallback callback,
                                const void* context) = 0;

    /**
     * Called by a cursor before each of its operations. A source throws a
     * std::exception here to fail that operation; the default does nothing.
     */
    virtual void beforeOperation(CursorOperation /*operation*/) {}
};

} // namespace QX
