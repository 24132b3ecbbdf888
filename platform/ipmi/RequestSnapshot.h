#pragma once

#include "NodeTree.h"

#include <atomic>
#include <cstdint>
#include <memory>

namespace QX::Ipmi
{

/**
 * @brief Hands a request's cursors one tree that the BMC confirmed once.
 *
 * A request walks the tree with several cursors that are alive at the same
 * time on one thread (the log's cursor and its entries' cursor, say), and
 * each cursor asks its source for a snapshot. Asking the BMC again for the
 * second cursor tells nothing the first one did not; it costs exchanges.
 * So a source hands out the tree it confirmed through handOut(), and held()
 * gives it back to the same thread while a cursor of that thread still
 * holds it. Once the thread's cursors have let go (the request ended), the
 * next snapshot asks the BMC again.
 *
 * The tree is handed out through a holder of its own, so that the source's
 * own reference does not keep it "held". Each thread remembers what it was
 * given in thread-local storage; nothing is shared between threads, and
 * forget() (a clear of the log, say) makes every thread ask again.
 */
class RequestSnapshot
{
  public:
    RequestSnapshot();
    RequestSnapshot(const RequestSnapshot&) = delete;
    RequestSnapshot& operator=(const RequestSnapshot&) = delete;
    ~RequestSnapshot() = default;

    /** The tree this object handed to the calling thread, while a cursor
     *  of this thread still holds it and nothing made it stale; else null.
     */
    std::shared_ptr<const NodeTree> held() const;

    /** Hands @p tree to the calling thread and remembers it for held(). */
    std::shared_ptr<const NodeTree>
    handOut(std::shared_ptr<const NodeTree> tree) const;

    /** Trees handed out before are no longer given back by held(). */
    void forget();

  private:
    const std::uint64_t owner_; // unique per object, never reused
    std::atomic<std::uint64_t> epoch_{0};
};

} // namespace QX::Ipmi
