#include "AlertHandOver.h"

namespace QX::SELComposite
{

AlertHandOver::Ticket AlertHandOver::put(const DateTime& time,
                                         const std::string& nodePath)
{
    std::unique_lock lock(mutex_);
    changed_.wait_for(lock, handOverWait, [this] { return !full_; });
    if (full_)
    {
        // Its thread never came for it: the record is overwritten and
        // that ticket will not be delivered on its own.
        finishLocked(written_);
    }
    record_ = AlertRecord{time, nodePath};
    full_ = true;
    return ++written_;
}

bool AlertHandOver::awaitTaken(Ticket ticket)
{
    std::unique_lock lock(mutex_);
    return changed_.wait_for(lock, handOverWait,
                             [this, ticket] { return taken_ >= ticket; });
}

void AlertHandOver::withdraw(Ticket ticket)
{
    {
        const std::lock_guard lock(mutex_);
        if (full_ && written_ == ticket)
        {
            full_ = false;
        }
        finishLocked(ticket);
    }
    changed_.notify_all();
}

std::pair<AlertRecord, AlertHandOver::Ticket> AlertHandOver::take()
{
    std::pair<AlertRecord, Ticket> copy;
    {
        const std::lock_guard lock(mutex_);
        copy = {record_, written_};
        full_ = false;
        taken_ = written_;
    }
    changed_.notify_all();
    return copy;
}

void AlertHandOver::awaitTurn(Ticket ticket)
{
    std::unique_lock lock(mutex_);
    if (changed_.wait_for(lock, turnWait,
                          [this, ticket] { return finished_ + 1 >= ticket; }))
    {
        return;
    }
    // A thread before this one is stuck: stop waiting for it, here and in
    // every thread after this one.
    skipTo(ticket - 1);
    lock.unlock();
    changed_.notify_all();
}

void AlertHandOver::finish(Ticket ticket)
{
    {
        const std::lock_guard lock(mutex_);
        finishLocked(ticket);
    }
    changed_.notify_all();
}

void AlertHandOver::finishLocked(Ticket ticket)
{
    if (ticket <= finished_)
    {
        return;
    }
    const Ticket ahead = ticket - finished_ - 1;
    if (ahead >= 64)
    {
        // Too far ahead to remember: the tickets before it are given up.
        skipTo(ticket);
        return;
    }
    finishedAhead_ |= std::uint64_t{1} << ahead;
    collapse();
}

void AlertHandOver::skipTo(Ticket ticket)
{
    if (ticket <= finished_)
    {
        return;
    }
    const Ticket shift = ticket - finished_;
    finishedAhead_ = shift >= 64 ? 0 : finishedAhead_ >> shift;
    finished_ = ticket;
    collapse();
}

void AlertHandOver::collapse()
{
    while ((finishedAhead_ & 1u) != 0)
    {
        ++finished_;
        finishedAhead_ >>= 1;
    }
}

AlertRecord AlertHandOver::current() const
{
    const std::lock_guard lock(mutex_);
    return record_;
}

bool AlertHandOver::isFull() const
{
    const std::lock_guard lock(mutex_);
    return full_;
}

} // namespace QX::SELComposite
