#pragma once

#include "BmcCommands.h"

#include <array>
#include <cstdint>
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

} // namespace QX::Ipmi
