#pragma once

#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <mutex>
#include <sys/types.h>
#include <vector>

namespace QX::SELComposite
{

/**
 * @brief Keeps count of the alert handlers running in this library and of
 *        the delivery threads it started, so that unloading the library
 *        can wait until none of them runs its code any more.
 *
 * A delivery thread is counted from just before it is created until the
 * last statement of its body. Its last few instructions still run in this
 * library after that, so the ledger also remembers the thread's id and
 * waits for the thread itself to end.
 */
class ActivityLedger
{
  public:
    void handlerEntered();
    void handlerLeft() noexcept;

    void threadStarting();
    /** The thread could not be created. */
    void threadNotStarted() noexcept;
    /** Called by the thread as the very last thing it does in its body. */
    void threadFinishing() noexcept;

    /** Handlers and delivery threads counted now. */
    std::size_t active() const;
    /** Waits until no handler runs, no delivery thread is counted and the
     *  finished ones have ended; false when @p timeout ran out first. */
    bool awaitIdle(std::chrono::milliseconds timeout);

  private:
    void leave() noexcept;

    mutable std::mutex mutex_;
    std::condition_variable idle_;
    std::size_t handlers_ = 0;
    std::size_t threads_ = 0;
    std::vector<pid_t> ending_; // finished delivery threads, maybe still alive
};

/** RAII form of handlerEntered / handlerLeft. */
class HandlerActivity
{
  public:
    explicit HandlerActivity(ActivityLedger& ledger) : ledger_(ledger)
    {
        ledger_.handlerEntered();
    }
    ~HandlerActivity()
    {
        ledger_.handlerLeft();
    }
    HandlerActivity(const HandlerActivity&) = delete;
    HandlerActivity& operator=(const HandlerActivity&) = delete;

  private:
    ActivityLedger& ledger_;
};

} // namespace QX::SELComposite
