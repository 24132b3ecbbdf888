#pragma once

#include "DateTime.h"
#include "InstrumentationSource.h"
#include "NodeLexicon.h"

#include <chrono>
#include <cstddef>
#include <memory>
#include <string>
#include <thread>
#include <vector>

namespace QX
{

/** An alert waiting for the callbacks registered for its node kind. */
struct PendingAlert
{
    NodeLexicon::NodeType kind;
    unsigned code;
    DateTime when;
    std::string path;
};

/**
 * @brief Calls monitor callbacks on a thread of its own, one alert at a
 *        time, in the order the alerts were posted.
 *
 * Registrations are keyed by (kind, callback, context); a triple registered
 * twice is called twice. The thread starts with the first alert that some
 * registration wants, and is stopped (by a condition variable) and joined
 * when the dispatcher is destroyed; alerts still queued then are dropped.
 * Thread-safe.
 */
class AlertDispatcher
{
  public:
    AlertDispatcher();
    ~AlertDispatcher();

    AlertDispatcher(const AlertDispatcher&) = delete;
    AlertDispatcher& operator=(const AlertDispatcher&) = delete;

    void add(NodeLexicon::NodeType kind, MonitorCallback callback,
             const void* context);
    /**
     * @brief Removes one registration of this triple, if there is one.
     *
     * Once this returns, its callback is not running and is not called
     * again. On the dispatcher's own thread (from within a callback) it
     * cannot wait for the running callback, which is the caller itself;
     * there it only prevents later calls.
     */
    void remove(NodeLexicon::NodeType kind, MonitorCallback callback,
                const void* context);
    std::size_t count(NodeLexicon::NodeType kind) const;
    /** Registrations of every kind. */
    std::size_t total() const;

    /** Queues the alerts that some registration wants; drops the others. */
    void post(std::vector<PendingAlert> alerts);

    /** Waits until every alert posted so far has been handed to its
     *  callbacks and they returned; false when @p timeout ran out first. */
    bool waitIdle(std::chrono::milliseconds timeout) const;

  private:
    struct State;
    std::shared_ptr<State> state_;
    std::thread thread_; // started on demand, under the state's lock
};

} // namespace QX
