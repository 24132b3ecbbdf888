#pragma once

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <functional>
#include <mutex>
#include <thread>

namespace QX::Ipmi
{

/**
 * @brief One thread that runs a session's BMC exchanges, one at a time,
 *        so that the caller can stop waiting while the driver cannot.
 *
 * run() hands a job over and waits at most the given time. A job that
 * takes longer keeps the worker until it returns; meanwhile busy() is
 * true and run() refuses. The destructor waits for the job in hand, if
 * any, and joins the thread: that wait is as long as the driver's own
 * limit on one call (see IpmiSession).
 *
 * run() and the destructor are called by the session's owner only (one
 * caller at a time); busy() from any thread.
 */
class ExchangeWorker
{
  public:
    /** The thread's name, as /proc/<pid>/task/<tid>/comm shows it. */
    static constexpr const char* threadName = "ipmi-exchange";

    ExchangeWorker();
    ~ExchangeWorker();
    ExchangeWorker(const ExchangeWorker&) = delete;
    ExchangeWorker& operator=(const ExchangeWorker&) = delete;
    ExchangeWorker(ExchangeWorker&&) = delete;
    ExchangeWorker& operator=(ExchangeWorker&&) = delete;

    /**
     * Runs @p job on the worker. True when it finished within @p timeout;
     * false when it did not (it goes on, and the worker stays busy until
     * it returns). @p job must own everything it touches, since it may
     * outlive this call, and keep its errors (it must not throw). Throws
     * std::logic_error while busy().
     */
    bool run(std::function<void()> job, std::chrono::milliseconds timeout);
    /** A job given up on is still running. */
    bool busy() const;

  private:
    void loop();

    mutable std::mutex mutex_;
    std::condition_variable wake_;     // a job or the stop request arrived
    std::condition_variable finished_; // the job in hand returned
    std::function<void()> job_;
    bool running_ = false;
    bool stopping_ = false;
    std::uint64_t completed_ = 0;
    std::thread thread_; // last: starts once the state above exists
};

} // namespace QX::Ipmi
