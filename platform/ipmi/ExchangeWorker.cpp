#include "ExchangeWorker.h"

#include <pthread.h>
#include <stdexcept>

namespace QX::Ipmi
{

ExchangeWorker::ExchangeWorker() : thread_([this] { loop(); })
{
    ::pthread_setname_np(thread_.native_handle(), threadName);
}

ExchangeWorker::~ExchangeWorker()
{
    {
        const std::lock_guard lock(mutex_);
        stopping_ = true;
    }
    wake_.notify_one();
    thread_.join();
}

bool ExchangeWorker::run(std::function<void()> job,
                         std::chrono::milliseconds timeout)
{
    std::unique_lock lock(mutex_);
    if (running_)
    {
        throw std::logic_error("ExchangeWorker::run while a job is running");
    }
    job_ = std::move(job);
    running_ = true;
    const std::uint64_t ticket = completed_ + 1;
    wake_.notify_one();
    return finished_.wait_for(lock, timeout,
                              [this, ticket] { return completed_ >= ticket; });
}

bool ExchangeWorker::busy() const
{
    const std::lock_guard lock(mutex_);
    return running_;
}

void ExchangeWorker::loop()
{
    std::unique_lock lock(mutex_);
    while (true)
    {
        wake_.wait(lock, [this] { return stopping_ || job_ != nullptr; });
        if (!job_)
        {
            return; // stopping, nothing in hand
        }
        std::function<void()> job = std::move(job_);
        job_ = nullptr;
        lock.unlock();
        job();
        job = nullptr; // what it holds goes before it counts as done
        lock.lock();
        running_ = false;
        ++completed_;
        finished_.notify_all();
    }
}

} // namespace QX::Ipmi
