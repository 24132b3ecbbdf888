#include "AlertHandOver.h"

#include <algorithm>

namespace QX::SELComposite
{

AlertHandOver::Ticket AlertHandOver::put(const DateTime& time,
                                         const std::string& nodePath)
{
    std::unique_lock lock(mutex_);
    // Only handlers called on different threads meet here; past the wait
    // the record is taken over from the handler that still holds it.
    changed_.wait_for(lock, handOverWait, [this] { return !held_; });
    record_ = AlertRecord{time, nodePath};
    held_ = true;
    return ++written_;
}

bool AlertHandOver::awaitDelivered(Ticket ticket)
{
    std::unique_lock lock(mutex_);
    return changed_.wait_for(lock, deliveryWait,
                             [this, ticket] { return delivered_ >= ticket; });
}

void AlertHandOver::release(Ticket ticket)
{
    {
        const std::lock_guard lock(mutex_);
        if (written_ != ticket)
        {
            return;
        }
        held_ = false;
    }
    changed_.notify_all();
}

std::pair<AlertRecord, AlertHandOver::Ticket> AlertHandOver::take() const
{
    const std::lock_guard lock(mutex_);
    return {record_, written_};
}

void AlertHandOver::delivered(Ticket ticket)
{
    {
        const std::lock_guard lock(mutex_);
        delivered_ = std::max(delivered_, ticket);
    }
    changed_.notify_all();
}

AlertRecord AlertHandOver::current() const
{
    const std::lock_guard lock(mutex_);
    return record_;
}

bool AlertHandOver::isFull() const
{
    const std::lock_guard lock(mutex_);
    return held_;
}

} // namespace QX::SELComposite
