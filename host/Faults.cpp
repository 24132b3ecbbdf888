#include "Faults.h"

namespace host
{

void FaultPlan::fail(BrokerCall call, FaultMode mode, unsigned skip,
                     unsigned count)
{
    const std::lock_guard lock(mutex_);
    rules_.at(static_cast<std::size_t>(call)) = Rule{mode, skip, count};
}

void FaultPlan::clear()
{
    const std::lock_guard lock(mutex_);
    rules_ = {};
    calls_ = {};
}

unsigned FaultPlan::calls(BrokerCall call) const
{
    const std::lock_guard lock(mutex_);
    return calls_.at(static_cast<std::size_t>(call));
}

std::optional<FaultMode> FaultPlan::record(BrokerCall call)
{
    const std::lock_guard lock(mutex_);
    const auto index = static_cast<std::size_t>(call);
    ++calls_.at(index);
    auto& rule = rules_.at(index);
    if (!rule)
    {
        return std::nullopt;
    }
    const unsigned n = ++rule->seen;
    if (n > rule->skip && (rule->count == 0 || n <= rule->skip + rule->count))
    {
        return rule->mode;
    }
    return std::nullopt;
}

} // namespace host
