#include "IndicationInbox.h"

#include "BrokerState.h"

namespace host
{

using detail::InboxState;

IndicationInbox::IndicationInbox(std::shared_ptr<InboxState> state) :
    state_(std::move(state))
{
}

IndicationInbox::~IndicationInbox() = default;
IndicationInbox::IndicationInbox(IndicationInbox&&) noexcept = default;
IndicationInbox&
IndicationInbox::operator=(IndicationInbox&&) noexcept = default;

const std::string& IndicationInbox::nameSpace() const
{
    return state_->nameSpace;
}

std::optional<DeliveredIndication>
IndicationInbox::next(std::chrono::milliseconds timeout)
{
    std::unique_lock lock(state_->mutex);
    if (!state_->arrived.wait_for(lock, timeout,
                                  [this] { return !state_->queue.empty(); }))
    {
        return std::nullopt;
    }
    DeliveredIndication taken = std::move(state_->queue.front());
    state_->queue.pop_front();
    return taken;
}

std::vector<DeliveredIndication> IndicationInbox::takeAll()
{
    std::vector<DeliveredIndication> taken;
    const std::lock_guard lock(state_->mutex);
    taken.reserve(state_->queue.size());
    for (auto& indication : state_->queue)
    {
        taken.push_back(std::move(indication));
    }
    state_->queue.clear();
    return taken;
}

std::size_t IndicationInbox::pending() const
{
    const std::lock_guard lock(state_->mutex);
    return state_->queue.size();
}

std::size_t IndicationInbox::received() const
{
    const std::lock_guard lock(state_->mutex);
    return state_->received;
}

} // namespace host
