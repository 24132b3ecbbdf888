#pragma once

// The texts an SEL record's entry node carries that come from the record's
// bytes alone: record id, raw data, time, the "log cleared" marker and the
// description used when FreeIPMI cannot interpret the record.

#include "BmcCommands.h"

#include <cstdint>
#include <optional>
#include <string>

namespace QX::Ipmi
{

/** How the BMC's SEL clock counts: in UTC, or in the local time of the
 *  host the platform runs on (the zone of the TZ environment). */
enum class SelClock
{
    Utc,
    Local,
};

/** The CIM "unknown time", for records without a usable time. */
constexpr const char* unknownTimestamp = "9999-01-01 00:00:00";

/** Timestamps at or below this count seconds since the BMC started (IPMI's
 *  "pre-init" time), not seconds since 1970. */
constexpr std::uint32_t lastPreInitTimestamp = 0x20000000;

/** Record id, from bytes 0-1 (little endian). */
std::uint16_t recordIdOf(const SelRecordBytes& record);
/** Record type, byte 2. */
std::uint8_t recordTypeOf(const SelRecordBytes& record);

/** The 16 bytes as lower-case hexadecimal pairs separated by blanks. */
std::string hexText(const SelRecordBytes& record);

/** The record's own time in seconds since 1970 (UTC), for system event and
 *  timestamped OEM records whose time is neither pre-init nor unspecified;
 *  nothing otherwise. */
std::optional<std::int64_t> recordTime(const SelRecordBytes& record,
                                       SelClock clock);

/** "YYYY-MM-DD hh:mm:ss" in UTC from recordTime, or unknownTimestamp. */
std::string timestampText(const SelRecordBytes& record, SelClock clock);

/** Whether the record is the "Event Logging Disabled: Log Area
 *  Reset/Cleared" assertion that many BMCs write right after a clear. */
bool isLogClearedRecord(const SelRecordBytes& record);

/** What an "Event Logging Disabled" record says about the SEL's fill. */
enum class FillEvent
{
    None,       // not a fill record (or a deassertion)
    AlmostFull, // "SEL almost full" asserted (offset 05h)
    Full,       // "SEL full" asserted (offset 04h)
};
FillEvent fillEventOf(const SelRecordBytes& record);

/** A readable description from the bytes alone, for records FreeIPMI
 *  cannot interpret: "SEL record type 30h: 01 02 ...". Never empty. */
std::string fallbackDescription(const SelRecordBytes& record);

} // namespace QX::Ipmi
