#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace QX
{

/**
 * Alerts a simulated management controller can be told to raise, the way a
 * real one raises them when its hardware changes.
 */
enum class SimulatedAlert
{
    RecordAdded,     // "entry": a new record in the event log (code 2)
    LogCleared,      // "clear": the log emptied (status 14, code 0)
    LogAlmostFull,   // "warning": the log at its warning fill (status 21)
    LogFull,         // "full": the log at its critical fill (status 24)
    WatchdogRestart, // "restart": the watchdog restarted the server (code 1)
};

/** The short name of @p alert: entry, clear, warning, full or restart. */
const char* simulatedAlertName(SimulatedAlert alert);
/** The alert of a short name, or nothing for any other text. */
std::optional<SimulatedAlert> simulatedAlertFromName(std::string_view name);
/** "entry, clear, warning, full, restart", for messages. */
std::string simulatedAlertNames();

} // namespace QX
