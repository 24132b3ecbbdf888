#include "Utf8.h"

#include <cstdint>

namespace QX
{

namespace
{

void appendUtf8(std::string& out, wchar_t character)
{
    // A wchar_t, not a char: negative values land above 0x10FFFF.
    // NOLINTNEXTLINE(bugprone-signed-char-misuse,cert-str34-c)
    auto code = static_cast<std::uint32_t>(character);
    if ((code >= 0xD800 && code <= 0xDFFF) || code > 0x10FFFF)
    {
        code = 0xFFFD; // not a Unicode scalar value
    }
    if (code < 0x80)
    {
        out += static_cast<char>(code);
    }
    else if (code < 0x800)
    {
        out += static_cast<char>(0xC0 | (code >> 6));
        out += static_cast<char>(0x80 | (code & 0x3F));
    }
    else if (code < 0x10000)
    {
        out += static_cast<char>(0xE0 | (code >> 12));
        out += static_cast<char>(0x80 | ((code >> 6) & 0x3F));
        out += static_cast<char>(0x80 | (code & 0x3F));
    }
    else
    {
        out += static_cast<char>(0xF0 | (code >> 18));
        out += static_cast<char>(0x80 | ((code >> 12) & 0x3F));
        out += static_cast<char>(0x80 | ((code >> 6) & 0x3F));
        out += static_cast<char>(0x80 | (code & 0x3F));
    }
}

} // namespace

std::string make_string(const std::wstring& text)
{
    std::string out;
    out.reserve(text.size());
    for (const wchar_t character : text)
    {
        appendUtf8(out, character);
    }
    return out;
}

std::string make_string(const wchar_t* text)
{
    std::string out;
    if (text == nullptr)
    {
        return out;
    }
    for (; *text != L'\0'; ++text)
    {
        appendUtf8(out, *text);
    }
    return out;
}

} // namespace QX
