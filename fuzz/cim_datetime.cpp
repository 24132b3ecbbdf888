// CIM datetime text of arbitrary date-time fields, checked against a plain
// rebuilding of the same text from the same fields.
#include "CIMDateTime.h"

#include <cstdint>
#include <cstdlib>
#include <fuzzer/FuzzedDataProvider.h>
#include <string>

namespace
{

std::string padded(std::string field, std::size_t width)
{
    if (field.size() < width)
    {
        field.insert(0, width - field.size(), '0');
    }
    return field;
}

std::string expectedText(const QX::DateTime& value)
{
    const int offsetMinutes =
        static_cast<int>(static_cast<std::int16_t>(value.getOffset())) * 60;
    return std::to_string(static_cast<std::uint16_t>(value.getYear())) +
           padded(std::to_string(static_cast<std::uint8_t>(value.getMonth())),
                  2) +
           padded(std::to_string(static_cast<std::uint8_t>(value.getDay())),
                  2) +
           padded(std::to_string(static_cast<std::uint8_t>(value.getHour())),
                  2) +
           padded(std::to_string(static_cast<std::uint8_t>(value.getMinute())),
                  2) +
           padded(std::to_string(static_cast<std::uint8_t>(value.getSecond())),
                  2) +
           "." + padded(std::to_string(value.getMillisecond()), 6) +
           (offsetMinutes < 0 ? "" : "+") +
           padded(std::to_string(offsetMinutes), 3);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data,
                                      std::size_t size)
{
    FuzzedDataProvider input(data, size);
    const QX::DateTime value(
        input.ConsumeIntegral<unsigned>(), input.ConsumeIntegral<unsigned>(),
        input.ConsumeIntegral<unsigned>(), input.ConsumeIntegral<unsigned>(),
        input.ConsumeIntegral<unsigned>(), input.ConsumeIntegral<unsigned>(),
        input.ConsumeIntegral<unsigned>(), input.ConsumeIntegral<int>());
    const std::size_t scratchSize = input.ConsumeIntegralInRange(0, 40);

    // Every field of a 32-bit number fits a scratch buffer of 11.
    if (QX::SELComposite::convertCIMDateTime(value) != expectedText(value))
    {
        std::abort();
    }
    const std::string cut =
        QX::SELComposite::formatCIMDateTime(value, scratchSize);
    if (scratchSize >= 11 && cut != expectedText(value))
    {
        std::abort();
    }
    return 0;
}
