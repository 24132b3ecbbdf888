#pragma once

#include "BmcCommands.h"

#include <array>
#include <cstdint>
#include <cstdio>
#include <optional>
#include <string>
#include <string_view>

namespace QX::Ipmi
{

/**
 * @brief One 16-byte SEL record, field by field as a system event record
 *        lays it out.
 *
 * Every record type parses and builds back to the same 16 bytes: the
 * fields are positions, so an OEM record keeps its bytes even where they
 * mean something else. The hex forms are the ones the platform shows and
 * keeps: "01 00 02 ..." (lower case, blank separated) and, in state
 * files, the same pairs without blanks.
 */
struct SelRecord
{
    static constexpr std::uint8_t systemEventType = 0x02;
    static constexpr std::uint16_t bmcGenerator = 0x0020; // slave address 20h
    static constexpr std::uint8_t evmRevIpmi = 0x04;      // IPMI 1.5 and 2.0
    static constexpr std::uint8_t deassertionBit = 0x80;

    std::uint16_t recordId = 0;
    std::uint8_t recordType = systemEventType;
    std::uint32_t timestamp = 0;
    std::uint16_t generatorId = bmcGenerator;
    std::uint8_t evmRev = evmRevIpmi;
    std::uint8_t sensorType = 0;
    std::uint8_t sensorNumber = 0;
    std::uint8_t eventDirType = 0; // bit 7 deassertion, bits 0-6 event type
    std::array<std::uint8_t, 3> eventData{};

    /** A system event record from the BMC (generator 20h, EvM Rev 04h). */
    static SelRecord systemEvent(std::uint16_t recordId,
                                 std::uint32_t timestamp,
                                 std::uint8_t sensorType,
                                 std::uint8_t sensorNumber,
                                 std::uint8_t eventDirType,
                                 std::array<std::uint8_t, 3> eventData);

    static SelRecord parse(const SelRecordBytes& bytes);
    /** 16 hex pairs, blank separated or not, either case; nothing for
     *  anything else. */
    static std::optional<SelRecord> parseHex(std::string_view text);

    /** hex() and compactHex() of @p bytes, without parsing them. */
    static std::string hexOf(const SelRecordBytes& bytes);
    static std::string compactHexOf(const SelRecordBytes& bytes);

    SelRecordBytes bytes() const;
    /** "01 00 02 ...": 16 lower-case pairs separated by blanks. */
    std::string hex() const;
    /** The same pairs without blanks. */
    std::string compactHex() const;

    bool isSystemEvent() const
    {
        return recordType == systemEventType;
    }
    bool asserted() const
    {
        return (eventDirType & deassertionBit) == 0;
    }
    std::uint8_t eventType() const
    {
        return eventDirType & static_cast<std::uint8_t>(~deassertionBit);
    }
    /** The event offset: event data 1, bits 0-3. */
    std::uint8_t offset() const
    {
        return eventData[0] & 0x0F;
    }
    bool operator==(const SelRecord&) const = default;
};

// Defined here: the platform library keeps its internals to itself, and
// the simulators and tests that build records need them too.

namespace detail
{

inline int hexDigit(char c)
{
    if (c >= '0' && c <= '9')
    {
        return c - '0';
    }
    if (c >= 'a' && c <= 'f')
    {
        return c - 'a' + 10;
    }
    if (c >= 'A' && c <= 'F')
    {
        return c - 'A' + 10;
    }
    return -1;
}

inline std::string pairs(const SelRecordBytes& bytes, bool blanks)
{
    std::string text;
    text.reserve(bytes.size() * 3);
    char pair[3];
    for (const std::uint8_t byte : bytes)
    {
        if (blanks && !text.empty())
        {
            text += ' ';
        }
        std::snprintf(pair, sizeof pair, "%02x", byte);
        text += pair;
    }
    return text;
}

} // namespace detail

inline SelRecord SelRecord::systemEvent(std::uint16_t recordId,
                                        std::uint32_t timestamp,
                                        std::uint8_t sensorType,
                                        std::uint8_t sensorNumber,
                                        std::uint8_t eventDirType,
                                        std::array<std::uint8_t, 3> eventData)
{
    return SelRecord{.recordId = recordId,
                     .timestamp = timestamp,
                     .sensorType = sensorType,
                     .sensorNumber = sensorNumber,
                     .eventDirType = eventDirType,
                     .eventData = eventData};
}

inline SelRecord SelRecord::parse(const SelRecordBytes& bytes)
{
    SelRecord record;
    record.recordId = static_cast<std::uint16_t>(bytes[0] | bytes[1] << 8);
    record.recordType = bytes[2];
    record.timestamp = static_cast<std::uint32_t>(bytes[3]) |
                       static_cast<std::uint32_t>(bytes[4]) << 8 |
                       static_cast<std::uint32_t>(bytes[5]) << 16 |
                       static_cast<std::uint32_t>(bytes[6]) << 24;
    record.generatorId = static_cast<std::uint16_t>(bytes[7] | bytes[8] << 8);
    record.evmRev = bytes[9];
    record.sensorType = bytes[10];
    record.sensorNumber = bytes[11];
    record.eventDirType = bytes[12];
    record.eventData = {bytes[13], bytes[14], bytes[15]};
    return record;
}

inline std::optional<SelRecord> SelRecord::parseHex(std::string_view text)
{
    SelRecordBytes bytes{};
    std::size_t at = 0;
    for (std::size_t i = 0; i < bytes.size(); ++i)
    {
        if (i > 0 && at < text.size() && text[at] == ' ')
        {
            ++at;
        }
        if (at + 2 > text.size())
        {
            return std::nullopt;
        }
        const int high = detail::hexDigit(text[at]);
        const int low = detail::hexDigit(text[at + 1]);
        if (high < 0 || low < 0)
        {
            return std::nullopt;
        }
        bytes[i] = static_cast<std::uint8_t>(high << 4 | low);
        at += 2;
    }
    if (at != text.size())
    {
        return std::nullopt;
    }
    return parse(bytes);
}

inline SelRecordBytes SelRecord::bytes() const
{
    return {static_cast<std::uint8_t>(recordId),
            static_cast<std::uint8_t>(recordId >> 8),
            recordType,
            static_cast<std::uint8_t>(timestamp),
            static_cast<std::uint8_t>(timestamp >> 8),
            static_cast<std::uint8_t>(timestamp >> 16),
            static_cast<std::uint8_t>(timestamp >> 24),
            static_cast<std::uint8_t>(generatorId),
            static_cast<std::uint8_t>(generatorId >> 8),
            evmRev,
            sensorType,
            sensorNumber,
            eventDirType,
            eventData[0],
            eventData[1],
            eventData[2]};
}

inline std::string SelRecord::hexOf(const SelRecordBytes& bytes)
{
    return detail::pairs(bytes, true);
}

inline std::string SelRecord::compactHexOf(const SelRecordBytes& bytes)
{
    return detail::pairs(bytes, false);
}

inline std::string SelRecord::hex() const
{
    return hexOf(bytes());
}

inline std::string SelRecord::compactHex() const
{
    return compactHexOf(bytes());
}

} // namespace QX::Ipmi
