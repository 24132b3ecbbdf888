#pragma once

// The 16 bytes of a SEL system event record as the simulated BMC writes
// them, made by the platform's one record type (Ipmi::SelRecord).

#include "ipmi/SelRecord.h"

#include <array>
#include <cstdint>

namespace bmcsim
{

/** Sensor type, sensor number, event type, event data 1-3. */
using EventBytes = std::array<std::uint8_t, 6>;

inline QX::Ipmi::SelRecordBytes
systemEventRecord(std::uint16_t id, std::uint32_t time, const EventBytes& event)
{
    return QX::Ipmi::SelRecord::systemEvent(id, time, event[0], event[1],
                                            event[2],
                                            {event[3], event[4], event[5]})
        .bytes();
}

} // namespace bmcsim
