#include "CIMDateTime.h"

#include "Support.h"

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <string_view>
#include <vector>

namespace QX::SELComposite
{

namespace
{

/** Scratch size of the free conversion used by the indication builders. */
constexpr std::size_t providerScratchSize = 12;

/** Prints fields into one scratch buffer, one at a time. */
class FieldPrinter
{
  public:
    explicit FieldPrinter(std::size_t size) : buffer_(size + 1, '\0') {}

    std::string unsignedField(unsigned value)
    {
        return print("%u", value);
    }
    std::string signedField(int value)
    {
        return print("%d", value);
    }

  private:
    template <typename Number>
    std::string print(const char* format, Number value)
    {
        const int written =
            std::snprintf(buffer_.data(), buffer_.size(), format, value);
        // Only what this print produced counts, cut to the buffer.
        const std::size_t length =
            written < 0 ? 0
                        : std::min(static_cast<std::size_t>(written),
                                   buffer_.size() - 1);
        return stripSpaces(std::string(buffer_.data(), length));
    }

    std::vector<char> buffer_;
};

void appendPadded(std::string& result, const std::string& field,
                  std::size_t width)
{
    if (field.size() < width)
    {
        result += addZero(static_cast<unsigned char>(width - field.size()));
    }
    result += field;
}

} // namespace

std::string addZero(unsigned char count)
{
    std::string zeros;
    for (unsigned char i = 0; i < count; ++i)
    {
        zeros += "0";
    }
    return zeros;
}

std::string formatCIMDateTime(const DateTime& value, std::size_t scratchSize)
{
    FieldPrinter printer(scratchSize);
    std::string result;
    result +=
        printer.unsignedField(static_cast<std::uint16_t>(value.getYear()));
    appendPadded(
        result,
        printer.unsignedField(static_cast<std::uint8_t>(value.getMonth())), 2);
    appendPadded(
        result,
        printer.unsignedField(static_cast<std::uint8_t>(value.getDay())), 2);
    appendPadded(
        result,
        printer.unsignedField(static_cast<std::uint8_t>(value.getHour())), 2);
    appendPadded(
        result,
        printer.unsignedField(static_cast<std::uint8_t>(value.getMinute())), 2);
    appendPadded(
        result,
        printer.unsignedField(static_cast<std::uint8_t>(value.getSecond())), 2);
    result += ".";
    appendPadded(result, printer.unsignedField(value.getMillisecond()), 6);
    const int offsetMinutes =
        static_cast<int>(static_cast<std::int16_t>(value.getOffset())) * 60;
    const std::string offset = printer.signedField(offsetMinutes);
    if (offset.find('-') == std::string::npos)
    {
        result += "+";
    }
    // The width test counts a minus sign: -60 is left as it is.
    appendPadded(result, offset, 3);
    return stripSpaces(result);
}

std::string convertCIMDateTime(DateTime value)
{
    return formatCIMDateTime(value, providerScratchSize);
}

} // namespace QX::SELComposite
