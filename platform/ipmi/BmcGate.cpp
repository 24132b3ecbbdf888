#include "BmcGate.h"

#include "IpmiError.h"

#include <algorithm>

namespace QX::Ipmi
{

BmcGate::BmcGate(std::chrono::milliseconds patience,
                 std::function<Clock::time_point()> lastActivity) :
    patience_(patience),
    lastActivity_(std::move(lastActivity))
{
}

BmcGate::Access::Access(BmcGate& gate) : gate_(gate)
{
    const Clock::time_point arrival = Clock::now();
    std::unique_lock lock(gate_.mutex_);
    while (gate_.taken_)
    {
        const Clock::time_point deadline =
            std::max(arrival, gate_.lastActivity_()) + gate_.patience_;
        if (Clock::now() >= deadline)
        {
            throw IpmiError(
                "waiting for the BMC", ErrorCategory::Busy,
                "another request has been waiting for the BMC's answer for " +
                    std::to_string(gate_.patience_.count()) + " ms");
        }
        gate_.released_.wait_until(lock, deadline);
    }
    gate_.taken_ = true;
}

BmcGate::Access::~Access()
{
    {
        const std::lock_guard lock(gate_.mutex_);
        gate_.taken_ = false;
    }
    gate_.released_.notify_all();
}

} // namespace QX::Ipmi
