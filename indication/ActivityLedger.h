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

    /**
     * @brief Counts a delivery thread about to be created; false once the
     *        library is being unloaded, when no thread may be started.
     *
     * A thread created while the library is unloaded could find the
     * dynamic loader's lock taken by the unloading and could then not get
     * out of this library's code before it is unmapped.
     */
    bool threadStarting();
    /** The thread could not be created. */
    void threadNotStarted() noexcept;
    /** Called by the thread as the very last thing it does in its body. */
    void threadFinishing() noexcept;

    /** From now on no delivery thread starts (see threadStarting). */
    void closeForUnload();

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
    bool closed_ = false;
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
