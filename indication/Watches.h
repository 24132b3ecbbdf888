#pragma once

#include "InstrumentationSource.h"
#include "NodeLexicon.h"

#include <memory>
#include <mutex>
#include <vector>

namespace QX::SELComposite
{

/**
 * @brief Starts and stops the instrumentation's monitoring for the alert
 *        handlers, remembering every registration this library holds.
 *
 * Failures of the instrumentation are written to standard error and
 * otherwise ignored: a subscription does not fail because the hardware
 * cannot be watched. The registrations still held when the library is
 * unloaded are removed then (releaseAll), so no source is left calling
 * into code that is gone.
 */
class Watches
{
  public:
    void start(NodeLexicon::NodeType kind, MonitorCallback handler);
    void stop(NodeLexicon::NodeType kind, MonitorCallback handler);
    /** Removes every registration still held, from the sources it was
     *  made on; once it returns, none of their callbacks runs. */
    void releaseAll() noexcept;
    /** Registrations held now. */
    std::size_t held() const;

  private:
    /** Starts (@p watch) or stops the monitoring on the platform's current
     *  source and keeps the list of registrations up to date; a failure is
     *  written to standard error and logged. */
    void change(bool watch, NodeLexicon::NodeType kind,
                MonitorCallback handler);

    struct Registration
    {
        std::weak_ptr<InstrumentationSource> source;
        NodeLexicon::NodeType kind;
        MonitorCallback handler;
    };

    mutable std::mutex mutex_;
    std::vector<Registration> registrations_;
};

} // namespace QX::SELComposite
