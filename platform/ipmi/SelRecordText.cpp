#include "SelRecordText.h"

#include "SelRecord.h"

#include <cstdio>
#include <ctime>

namespace QX::Ipmi
{

namespace
{

constexpr std::uint8_t firstTimestampedOem = 0xC0;
constexpr std::uint8_t lastTimestampedOem = 0xDF;
constexpr std::uint32_t unspecifiedTimestamp = 0xFFFFFFFF;

// The "Event Logging Disabled" sensor and its offsets. The event type is
// compared with the deassertion bit, so that only assertions count.
constexpr std::uint8_t sensorTypeEventLoggingDisabled = 0x10;
constexpr std::uint8_t eventTypeSensorSpecific = 0x6F;
constexpr std::uint8_t offsetLogAreaResetCleared = 0x02;
constexpr std::uint8_t offsetSelFull = 0x04;
constexpr std::uint8_t offsetSelAlmostFull = 0x05;

bool hasTimestamp(std::uint8_t type)
{
    return type == SelRecord::systemEventType ||
           (type >= firstTimestampedOem && type <= lastTimestampedOem);
}

// The UTC instant of a wall-clock time that the BMC counted in the host's
// local zone, as ipmi-sel's --localtime-to-utc.
std::optional<std::int64_t> localToUtc(std::uint32_t localSeconds)
{
    const std::time_t wall = static_cast<std::time_t>(localSeconds);
    std::tm fields{};
    if (gmtime_r(&wall, &fields) == nullptr)
    {
        return std::nullopt;
    }
    fields.tm_isdst = -1;
    const std::time_t instant = std::mktime(&fields);
    if (instant == static_cast<std::time_t>(-1))
    {
        return std::nullopt;
    }
    return static_cast<std::int64_t>(instant);
}

} // namespace

std::uint16_t recordIdOf(const SelRecordBytes& record)
{
    return SelRecord::parse(record).recordId;
}

std::uint8_t recordTypeOf(const SelRecordBytes& record)
{
    return SelRecord::parse(record).recordType;
}

std::string hexText(const SelRecordBytes& record)
{
    return SelRecord::hexOf(record);
}

std::optional<std::int64_t> recordTime(const SelRecordBytes& record,
                                       SelClock clock)
{
    if (!hasTimestamp(recordTypeOf(record)))
    {
        return std::nullopt;
    }
    const std::uint32_t raw = SelRecord::parse(record).timestamp;
    if (raw <= lastPreInitTimestamp || raw == unspecifiedTimestamp)
    {
        return std::nullopt;
    }
    if (clock == SelClock::Local)
    {
        return localToUtc(raw);
    }
    return static_cast<std::int64_t>(raw);
}

std::string timestampText(const SelRecordBytes& record, SelClock clock)
{
    const std::optional<std::int64_t> seconds = recordTime(record, clock);
    if (!seconds)
    {
        return unknownTimestamp;
    }
    const std::time_t instant = static_cast<std::time_t>(*seconds);
    std::tm fields{};
    char text[32];
    if (gmtime_r(&instant, &fields) == nullptr ||
        std::strftime(text, sizeof text, "%Y-%m-%d %H:%M:%S", &fields) == 0)
    {
        return unknownTimestamp;
    }
    return text;
}

bool isLogClearedRecord(const SelRecordBytes& record)
{
    const SelRecord fields = SelRecord::parse(record);
    return fields.isSystemEvent() &&
           fields.sensorType == sensorTypeEventLoggingDisabled &&
           fields.eventDirType == eventTypeSensorSpecific &&
           fields.offset() == offsetLogAreaResetCleared;
}

FillEvent fillEventOf(const SelRecordBytes& record)
{
    const SelRecord fields = SelRecord::parse(record);
    if (!fields.isSystemEvent() ||
        fields.sensorType != sensorTypeEventLoggingDisabled ||
        fields.eventDirType != eventTypeSensorSpecific)
    {
        return FillEvent::None;
    }
    switch (fields.offset())
    {
        case offsetSelFull:
            return FillEvent::Full;
        case offsetSelAlmostFull:
            return FillEvent::AlmostFull;
        default:
            return FillEvent::None;
    }
}

std::string fallbackDescription(const SelRecordBytes& record)
{
    char type[32];
    std::snprintf(type, sizeof type,
                  "SEL record type %02Xh: ", recordTypeOf(record));
    // Bytes 0-2 are the id and the type, already said.
    return type + hexText(record).substr(9);
}

} // namespace QX::Ipmi
