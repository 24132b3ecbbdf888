#include "ActivityLedger.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <sys/syscall.h>
#include <thread>
#include <unistd.h>

namespace QX::SELComposite
{

namespace
{

pid_t currentThreadId()
{
    return static_cast<pid_t>(::syscall(SYS_gettid));
}

bool threadExists(pid_t thread)
{
    return ::syscall(SYS_tgkill, ::getpid(), thread, 0) == 0 || errno != ESRCH;
}

} // namespace

void ActivityLedger::handlerEntered()
{
    const std::lock_guard lock(mutex_);
    ++handlers_;
}

void ActivityLedger::handlerLeft() noexcept
{
    const std::lock_guard lock(mutex_);
    --handlers_;
    idle_.notify_all();
}

bool ActivityLedger::threadStarting()
{
    const std::lock_guard lock(mutex_);
    if (closed_)
    {
        return false;
    }
    ++threads_;
    return true;
}

void ActivityLedger::closeForUnload()
{
    const std::lock_guard lock(mutex_);
    closed_ = true;
}

void ActivityLedger::threadNotStarted() noexcept
{
    leave();
}

void ActivityLedger::threadFinishing() noexcept
{
    const pid_t self = currentThreadId();
    const std::lock_guard lock(mutex_);
    // Threads that ended long ago need no more waiting for.
    std::erase_if(ending_, [](pid_t thread) { return !threadExists(thread); });
    try
    {
        ending_.push_back(self);
    }
    catch (...)
    {
        // Without memory to remember it, the wait for its end is skipped.
    }
    --threads_;
    idle_.notify_all();
}

void ActivityLedger::leave() noexcept
{
    const std::lock_guard lock(mutex_);
    --threads_;
    idle_.notify_all();
}

std::size_t ActivityLedger::active() const
{
    const std::lock_guard lock(mutex_);
    return handlers_ + threads_;
}

bool ActivityLedger::awaitIdle(std::chrono::milliseconds timeout)
{
    const auto deadline = std::chrono::steady_clock::now() + timeout;
    std::unique_lock lock(mutex_);
    if (!idle_.wait_until(lock, deadline,
                          [this] { return handlers_ == 0 && threads_ == 0; }))
    {
        return false;
    }
    // The counted work is over; what is left of each finished thread is a
    // return into the code that started it. That takes microseconds, so a
    // short poll for the thread's end is enough.
    std::vector<pid_t> ending = ending_;
    lock.unlock();
    for (const pid_t thread : ending)
    {
        while (threadExists(thread))
        {
            if (std::chrono::steady_clock::now() >= deadline)
            {
                return false;
            }
            std::this_thread::sleep_for(std::chrono::microseconds(200));
        }
    }
    return true;
}

} // namespace QX::SELComposite
