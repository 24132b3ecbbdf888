#include "FixtureGenerator.h"

#include "NodeLexicon.h"
#include "ipmi/SelRecord.h"

#include <array>
#include <cstdio>
#include <ctime>
#include <ostream>

namespace QX
{

namespace
{

/** One kind of SEL event the generator cycles through. */
struct EventPattern
{
    unsigned char sensorType;
    unsigned char sensorNumber;
    unsigned char eventType; // direction bit and event/reading type
    std::array<unsigned char, 3> data;
    const char* description;
};

constexpr EventPattern patterns[] = {
    {0x01,
     0x30,
     0x01,
     {0x57, 0x52, 0x50},
     "Temperature CPU1 Temp: Upper Non-critical going high asserted "
     "(reading 82 C, threshold 80 C)"},
    {0x01,
     0x30,
     0x81,
     {0x57, 0x4e, 0x50},
     "Temperature CPU1 Temp: Upper Non-critical going high deasserted "
     "(reading 78 C, threshold 80 C)"},
    {0x02,
     0x14,
     0x01,
     {0x52, 0xb6, 0xb9},
     "Voltage 12V: Lower Critical going low asserted"},
    {0x04,
     0x43,
     0x01,
     {0x52, 0x05, 0x06},
     "Fan FAN3: Lower Critical going low"},
    {0x08,
     0x52,
     0x6f,
     {0x03, 0xff, 0xff},
     "Power Supply PSU2: Power Supply AC lost asserted"},
    {0x09, 0x50, 0x6f, {0x00, 0xff, 0xff}, "Power Unit: Power off / down"},
    {0x12,
     0x83,
     0x6f,
     {0x01, 0xff, 0xff},
     "System Event: OEM System boot event"},
    {0x23,
     0x71,
     0x6f,
     {0xc1, 0x04, 0xff},
     "Watchdog 2: Hard reset (timer use SMS/OS)"},
    {0x07, 0x11, 0x6f, {0x00, 0xff, 0xff}, "Processor CPU2: IERR"},
    {0x0c, 0x60, 0x6f, {0xa0, 0x00, 0x01}, "Memory DIMM_A1: Correctable ECC"},
};

/** 2023-01-01 00:00:00 UTC: the time of the first generated record. */
constexpr std::time_t firstRecordTime = 1672531200;
/** Seconds between consecutive generated records. */
constexpr std::time_t recordSpacing = 97;

std::string formatRecordData(unsigned recordId, std::time_t when,
                             const EventPattern& pattern)
{
    return Ipmi::SelRecord::systemEvent(
               static_cast<std::uint16_t>(recordId),
               static_cast<std::uint32_t>(when), pattern.sensorType,
               pattern.sensorNumber, pattern.eventType,
               {pattern.data[0], pattern.data[1], pattern.data[2]})
        .hex();
}

} // namespace

void writeGeneratedFixture(std::ostream& out, unsigned entries,
                           unsigned maxRecords)
{
    out << "# Generated SEL with " << entries << " entries\n"
        << "controller path=/bmc0 status=1"
           " description=\"Baseboard Management Controller\"\n"
        << "log path=/bmc0/sel status=1 description=\"IPMI System Event Log\""
           " Name=\"IPMI SEL Log\" MaxRecords="
        << maxRecords << " OverwritePolicy=1"
        << " DataFormat=\"IPMI 2.0 SEL record: 16 bytes, hexadecimal\""
        << " IsEmpty=" << (entries == 0 ? "true" : "false") << '\n';
    constexpr std::size_t patternCount = std::size(patterns);
    for (unsigned recordId = 1; recordId <= entries && recordId != 0;
         ++recordId)
    {
        const EventPattern& pattern = patterns[(recordId - 1) % patternCount];
        const std::time_t when =
            firstRecordTime +
            static_cast<std::time_t>(recordId - 1) * recordSpacing;
        out << "entry RecordId=" << recordId << " Timestamp=\""
            << NodeLexicon::timestampText(when) << "\" RecordData=\""
            << formatRecordData(recordId, when, pattern) << "\" description=\""
            << pattern.description << "\"\n";
    }
}

} // namespace QX
