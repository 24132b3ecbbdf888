#include "Product.h"

#include "Support.h"

#include <fstream>

namespace QX::Product
{

namespace
{

bool isHexDigit(char c)
{
    return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'f');
}

std::string lowerAscii(std::string text)
{
    for (char& c : text)
    {
        if (c >= 'A' && c <= 'Z')
        {
            c = static_cast<char>(c - 'A' + 'a');
        }
    }
    return text;
}

std::optional<std::string> firstLineOf(const char* path)
{
    std::ifstream in(path);
    std::string line;
    if (!in || !std::getline(in, line))
    {
        return std::nullopt;
    }
    return line;
}

std::string computeUid()
{
    if (const auto dmi = firstLineOf("/sys/class/dmi/id/product_uuid"))
    {
        if (auto uid = detail::uuidFromDmiText(*dmi))
        {
            return *uid;
        }
    }
    if (const auto machine = firstLineOf("/etc/machine-id"))
    {
        if (auto uid = detail::uuidFromMachineId(*machine))
        {
            return *uid;
        }
    }
    return "00000000-0000-0000-0000-000000000000";
}

} // namespace

namespace detail
{

std::optional<std::string> uuidFromDmiText(const std::string& text)
{
    const std::string uuid = lowerAscii(stripSpaces(text));
    if (uuid.size() != 36)
    {
        return std::nullopt;
    }
    for (std::size_t i = 0; i < uuid.size(); ++i)
    {
        const bool dash = i == 8 || i == 13 || i == 18 || i == 23;
        if (dash ? uuid[i] != '-' : !isHexDigit(uuid[i]))
        {
            return std::nullopt;
        }
    }
    return uuid;
}

std::optional<std::string> uuidFromMachineId(const std::string& text)
{
    const std::string id = lowerAscii(stripSpaces(text));
    if (id.size() != 32)
    {
        return std::nullopt;
    }
    for (const char c : id)
    {
        if (!isHexDigit(c))
        {
            return std::nullopt;
        }
    }
    return id.substr(0, 8) + "-" + id.substr(8, 4) + "-" + id.substr(12, 4) +
           "-" + id.substr(16, 4) + "-" + id.substr(20);
}

} // namespace detail

std::wstring getUid()
{
    static const std::wstring uid = []
    {
        const std::string text = computeUid();
        return std::wstring(text.begin(), text.end());
    }();
    return uid;
}

} // namespace QX::Product
