#pragma once

// The 16 bytes of a SEL system event record (type 0x02) as a BMC writes
// them: record id and timestamp little-endian, generator 0x20 on LUN 0,
// event message format 0x04, then sensor type, sensor number, event type
// and the three event data bytes.

#include <array>
#include <cstdint>

namespace bmcsim
{

/** Sensor type, sensor number, event type, event data 1-3. */
using EventBytes = std::array<std::uint8_t, 6>;

inline std::array<std::uint8_t, 16>
systemEventRecord(std::uint16_t id, std::uint32_t time, const EventBytes& event)
{
    return {static_cast<std::uint8_t>(id),
            static_cast<std::uint8_t>(id >> 8),
            0x02,
            static_cast<std::uint8_t>(time),
            static_cast<std::uint8_t>(time >> 8),
            static_cast<std::uint8_t>(time >> 16),
            static_cast<std::uint8_t>(time >> 24),
            0x20,
            0x00,
            0x04,
            event[0],
            event[1],
            event[2],
            event[3],
            event[4],
            event[5]};
}

} // namespace bmcsim
