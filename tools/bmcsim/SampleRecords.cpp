#include "Fixture.h"
#include "NodeTree.h"
#include "SimulatedBmc.h"
#include "SystemEventRecord.h"

#include <memory>
#include <sstream>
#include <stdexcept>

namespace bmcsim
{

std::vector<Record> generatedRecords(unsigned count, std::uint16_t firstId,
                                     std::uint32_t lastTime)
{
    // Sensor type, number, event type, data 1-3.
    static const EventBytes events[] = {
        {0x01, 0x30, 0x01, 0x57, 0x52, 0x50}, // temperature above threshold
        {0x01, 0x30, 0x81, 0x57, 0x4e, 0x50}, // ... and back
        {0x04, 0x43, 0x01, 0x52, 0x05, 0x06}, // fan below threshold
        {0x08, 0x52, 0x6f, 0x03, 0xff, 0xff}, // power supply AC lost
        {0x0c, 0x60, 0x6f, 0xa0, 0x00, 0x01}, // correctable ECC
        {0x23, 0x00, 0x6f, 0xc1, 0x04, 0xff}, // watchdog hard reset
    };
    std::vector<Record> records;
    records.reserve(count);
    for (unsigned i = 0; i < count; ++i)
    {
        const unsigned id = firstId + i;
        const std::uint32_t time = lastTime - (count - 1 - i);
        records.push_back(systemEventRecord(static_cast<std::uint16_t>(id),
                                            time,
                                            events[i % std::size(events)]));
    }
    return records;
}

Record parseRecord(const std::string& hex)
{
    Record record{};
    std::istringstream in(hex);
    for (std::uint8_t& byte : record)
    {
        std::string pair;
        if (!(in >> pair) || pair.size() != 2 ||
            pair.find_first_not_of("0123456789abcdefABCDEF") !=
                std::string::npos)
        {
            throw std::invalid_argument("not 16 hexadecimal bytes: \"" + hex +
                                        "\"");
        }
        byte = static_cast<std::uint8_t>(std::stoul(pair, nullptr, 16));
    }
    return record;
}

std::vector<Record> fixtureRecords(const std::string& fixtureFile)
{
    std::shared_ptr<const QX::NodeTree> tree;
    if (fixtureFile.empty())
    {
        std::istringstream sample(QX::builtinSampleFixture());
        tree = QX::parseFixture(sample, "built-in sample SEL");
    }
    else
    {
        tree = QX::loadFixtureFile(fixtureFile);
    }
    std::vector<Record> records;
    for (const auto id : tree->nodesOfKind(QX::NodeLexicon::EventLogEntry))
    {
        const QX::PropertyValue* data =
            tree->node(id).find(QX::NodeLexicon::RecordData);
        if (data != nullptr && std::holds_alternative<std::string>(*data))
        {
            records.push_back(parseRecord(std::get<std::string>(*data)));
        }
    }
    return records;
}

std::vector<Sensor> sampleSensors()
{
    return {
        {0x01, 0x10, 0x6f, "SEL"},          {0x30, 0x01, 0x01, "CPU1 Temp"},
        {0x43, 0x04, 0x01, "FAN3"},         {0x14, 0x02, 0x01, "12V"},
        {0x52, 0x08, 0x6f, "PSU2"},         {0x60, 0x0c, 0x6f, "DIMM_A1"},
        {0x11, 0x07, 0x6f, "CPU2"},         {0x71, 0x23, 0x6f, "Watchdog 2"},
        {0x83, 0x12, 0x6f, "System Event"},
    };
}

} // namespace bmcsim
