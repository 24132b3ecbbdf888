#include "SimulatedAlert.h"

#include <array>
#include <utility>

namespace QX
{

namespace
{

constexpr std::array<std::pair<SimulatedAlert, const char*>, 5> names{{
    {SimulatedAlert::RecordAdded, "entry"},
    {SimulatedAlert::LogCleared, "clear"},
    {SimulatedAlert::LogAlmostFull, "warning"},
    {SimulatedAlert::LogFull, "full"},
    {SimulatedAlert::WatchdogRestart, "restart"},
}};

} // namespace

const char* simulatedAlertName(SimulatedAlert alert)
{
    for (const auto& [value, name] : names)
    {
        if (value == alert)
        {
            return name;
        }
    }
    return "unknown";
}

std::optional<SimulatedAlert> simulatedAlertFromName(std::string_view name)
{
    for (const auto& [value, text] : names)
    {
        if (name == text)
        {
            return value;
        }
    }
    return std::nullopt;
}

std::string simulatedAlertNames()
{
    std::string list;
    for (const auto& [value, name] : names)
    {
        list += list.empty() ? "" : ", ";
        list += name;
    }
    return list;
}

} // namespace QX
