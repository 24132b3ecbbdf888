#pragma once

#include "Values.h"

#include <chrono>
#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace host
{

namespace detail
{
struct InboxState;
} // namespace detail

// What a subscriber of one namespace receives: every indication a provider
// delivers into that namespace while the inbox exists, in delivery order,
// as copies independent of the provider's objects. Taking an indication
// out frees it. Thread-safe; the broker may be gone before the inbox.
class IndicationInbox
{
  public:
    explicit IndicationInbox(std::shared_ptr<detail::InboxState> state);
    ~IndicationInbox();
    IndicationInbox(IndicationInbox&&) noexcept;
    IndicationInbox& operator=(IndicationInbox&&) noexcept;
    IndicationInbox(const IndicationInbox&) = delete;
    IndicationInbox& operator=(const IndicationInbox&) = delete;

    const std::string& nameSpace() const;
    // The oldest indication not yet taken, waiting up to @p timeout for
    // one to arrive; nothing when none came in time.
    std::optional<DeliveredIndication> next(std::chrono::milliseconds timeout);
    // Everything waiting now, oldest first.
    std::vector<DeliveredIndication> takeAll();
    std::size_t pending() const;
    // Indications received so far, taken or not.
    std::size_t received() const;

  private:
    std::shared_ptr<detail::InboxState> state_;
};

} // namespace host
