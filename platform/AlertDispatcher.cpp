#include "AlertDispatcher.h"

#include "FailureReport.h"

#include <algorithm>
#include <condition_variable>
#include <cstdint>
#include <deque>
#include <mutex>

namespace QX
{

struct AlertDispatcher::State
{
    struct Registration
    {
        std::uint64_t id;
        NodeLexicon::NodeType kind;
        MonitorCallback callback;
        const void* context;
    };

    bool wanted(NodeLexicon::NodeType kind) const
    {
        return std::any_of(registrations.begin(), registrations.end(),
                           [kind](const Registration& registration)
                           { return registration.kind == kind; });
    }

    void run();
    void handOut(std::unique_lock<std::mutex>& lock, const PendingAlert& alert);

    mutable std::mutex mutex;
    std::condition_variable wake;             // an alert queued, or stop
    mutable std::condition_variable progress; // a callback or alert done
    std::deque<PendingAlert> queue;
    std::vector<Registration> registrations;
    std::uint64_t nextId = 1;
    std::uint64_t running = 0; // registration whose callback runs now
    bool busy = false;         // an alert is being handed out
    bool stopping = false;
    std::thread::id dispatcher;
};

void AlertDispatcher::State::run()
{
    std::unique_lock lock(mutex);
    for (;;)
    {
        wake.wait(lock, [this] { return stopping || !queue.empty(); });
        if (stopping)
        {
            break;
        }
        const PendingAlert alert = std::move(queue.front());
        queue.pop_front();
        busy = true;
        handOut(lock, alert);
        busy = false;
        progress.notify_all();
    }
    queue.clear();
    busy = false;
    progress.notify_all();
}

void AlertDispatcher::State::handOut(std::unique_lock<std::mutex>& lock,
                                     const PendingAlert& alert)
{
    // The callbacks registered when the alert is handed out; one removed
    // meanwhile is skipped.
    std::vector<std::uint64_t> targets;
    for (const Registration& registration : registrations)
    {
        if (registration.kind == alert.kind)
        {
            targets.push_back(registration.id);
        }
    }
    for (const std::uint64_t id : targets)
    {
        if (stopping)
        {
            return;
        }
        const auto found =
            std::find_if(registrations.begin(), registrations.end(),
                         [id](const Registration& registration)
                         { return registration.id == id; });
        if (found == registrations.end() || found->callback == nullptr)
        {
            continue;
        }
        const MonitorCallback callback = found->callback;
        const void* const context = found->context;
        running = id;
        lock.unlock();
        try
        {
            callback(alert.code, alert.when, alert.path, context);
        }
        catch (const std::exception& error)
        {
            // A callback's failure must not end the dispatcher.
            Platform::reportFailure("AlertDispatcher", __LINE__,
                                    std::string("monitor callback failed: ") +
                                        error.what());
        }
        catch (...)
        {
            Platform::reportFailure("AlertDispatcher", __LINE__,
                                    "unknown exception in a monitor callback");
        }
        lock.lock();
        running = 0;
        progress.notify_all();
    }
}

AlertDispatcher::AlertDispatcher() : state_(std::make_shared<State>()) {}

AlertDispatcher::~AlertDispatcher()
{
    std::thread thread;
    {
        const std::lock_guard lock(state_->mutex);
        state_->stopping = true;
        thread = std::move(thread_);
    }
    state_->wake.notify_all();
    if (!thread.joinable())
    {
        return;
    }
    if (thread.get_id() == std::this_thread::get_id())
    {
        // Destroyed from one of its own callbacks: the thread holds the
        // state and ends by itself once the callback returns.
        thread.detach();
        return;
    }
    thread.join();
}

void AlertDispatcher::add(NodeLexicon::NodeType kind, MonitorCallback callback,
                          const void* context)
{
    const std::lock_guard lock(state_->mutex);
    state_->registrations.push_back(
        State::Registration{state_->nextId++, kind, callback, context});
}

void AlertDispatcher::remove(NodeLexicon::NodeType kind,
                             MonitorCallback callback, const void* context)
{
    std::unique_lock lock(state_->mutex);
    auto& registrations = state_->registrations;
    const auto found =
        std::find_if(registrations.begin(), registrations.end(),
                     [&](const State::Registration& registration)
                     {
                         return registration.kind == kind &&
                                registration.callback == callback &&
                                registration.context == context;
                     });
    if (found == registrations.end())
    {
        return;
    }
    const std::uint64_t id = found->id;
    registrations.erase(found);
    if (std::this_thread::get_id() == state_->dispatcher)
    {
        return;
    }
    state_->progress.wait(lock, [&] { return state_->running != id; });
}

std::size_t AlertDispatcher::count(NodeLexicon::NodeType kind) const
{
    const std::lock_guard lock(state_->mutex);
    return static_cast<std::size_t>(std::count_if(
        state_->registrations.begin(), state_->registrations.end(),
        [kind](const State::Registration& registration)
        { return registration.kind == kind; }));
}

std::size_t AlertDispatcher::total() const
{
    const std::lock_guard lock(state_->mutex);
    return state_->registrations.size();
}

void AlertDispatcher::post(std::vector<PendingAlert> alerts)
{
    {
        const std::lock_guard lock(state_->mutex);
        if (state_->stopping)
        {
            return;
        }
        bool queued = false;
        for (PendingAlert& alert : alerts)
        {
            if (state_->wanted(alert.kind))
            {
                state_->queue.push_back(std::move(alert));
                queued = true;
            }
        }
        if (!queued)
        {
            return;
        }
        if (!thread_.joinable())
        {
            thread_ = std::thread([state = state_] { state->run(); });
            state_->dispatcher = thread_.get_id();
        }
        state_->wake.notify_one();
    }
}

bool AlertDispatcher::waitIdle(std::chrono::milliseconds timeout) const
{
    std::unique_lock lock(state_->mutex);
    return state_->progress.wait_for(
        lock, timeout,
        [this] { return state_->queue.empty() && !state_->busy; });
}

} // namespace QX
