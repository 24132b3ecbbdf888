#pragma once

#include "MgmtHwLog.h"
#include "MgmtHwLogEntry.h"

#include <cstdint>
#include <map>
#include <string>
#include <string_view>

namespace QX::SELComposite
{

/** Logger component of the log model. A constant, not a string object: threads
 *  still tracing while the library's statics are destroyed read it. */
inline constexpr std::string_view loggerSEL = "Corvane.SELProvider";

/** Value written to the controller's Command property to clear the log. */
constexpr unsigned CLEAR_LOG_COMMAND = 9;

/** Logs keyed by the log's name. */
using LogMap = std::map<std::string, MgmtHwLog>;
/** Entries keyed by the printable path of the entry node. */
using EntryMap = std::map<std::string, MgmtHwLogEntry>;

/**
 * @brief Reads every event log under the management controller into
 *        @p logs (a record under an existing key replaces it).
 * @return 0 when the walk ran to its end, 1 otherwise
 */
int getMgmtHwLogInstances(LogMap& logs);

/**
 * @brief Reads every entry of the event log into @p entries.
 * @return 0 when the walk ran to its end, 1 otherwise (also for a log
 *         without entries)
 */
int getMgmtHwLogEntryInstances(EntryMap& entries);

/** Asks the management controller to clear the log: 0 on success, 2 when
 *  the controller refused. */
int clearLog();

/** Decimal digits of @p value. */
std::string convertUintToString(std::uint32_t value);

/** CIM datetime text of an entry timestamp such as "2008-05-23 04:48:11":
 *  the digits without their separators, then ".000000+000". Only the first
 *  63 characters of @p timestamp are considered. */
std::string convertTimestampToCIM(const std::string& timestamp);

} // namespace QX::SELComposite
