#include "SelRecord.h"

#include <cstdio>

namespace QX::Ipmi
{

namespace
{

int hexDigit(char c)
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

std::string pairs(const SelRecordBytes& bytes, bool blanks)
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

} // namespace

SelRecord SelRecord::systemEvent(std::uint16_t recordId,
                                 std::uint32_t timestamp,
                                 std::uint8_t sensorType,
                                 std::uint8_t sensorNumber,
                                 std::uint8_t eventDirType,
                                 std::array<std::uint8_t, 3> eventData)
{
    SelRecord record;
    record.recordId = recordId;
    record.timestamp = timestamp;
    record.sensorType = sensorType;
    record.sensorNumber = sensorNumber;
    record.eventDirType = eventDirType;
    record.eventData = eventData;
    return record;
}

SelRecord SelRecord::parse(const SelRecordBytes& bytes)
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

std::optional<SelRecord> SelRecord::parseHex(std::string_view text)
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
        const int high = hexDigit(text[at]);
        const int low = hexDigit(text[at + 1]);
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

SelRecordBytes SelRecord::bytes() const
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

std::string SelRecord::hexOf(const SelRecordBytes& bytes)
{
    return pairs(bytes, true);
}

std::string SelRecord::compactHexOf(const SelRecordBytes& bytes)
{
    return pairs(bytes, false);
}

std::string SelRecord::hex() const
{
    return hexOf(bytes());
}

std::string SelRecord::compactHex() const
{
    return compactHexOf(bytes());
}

} // namespace QX::Ipmi
