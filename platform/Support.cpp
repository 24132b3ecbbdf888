#include "Support.h"

#include <climits>
#include <unistd.h>

namespace QX
{

namespace
{

char lowerAscii(char c)
{
    return (c >= 'A' && c <= 'Z') ? static_cast<char>(c - 'A' + 'a') : c;
}

} // namespace

std::string getSystemName()
{
    char name[HOST_NAME_MAX + 2] = {};
    // gethostname may leave a truncated name unterminated: the last byte
    // stays NUL because the call gets one byte less than the buffer.
    if (gethostname(name, sizeof name - 1) != 0 || name[0] == '\0')
    {
        return "localhost";
    }
    return name;
}

std::string stripSpaces(std::string text)
{
    const std::size_t nul = text.find('\0');
    if (nul != std::string::npos)
    {
        text.resize(nul);
    }
    const char* const blanks = " \t\r\n\v\f";
    const std::size_t first = text.find_first_not_of(blanks);
    if (first == std::string::npos)
    {
        return {};
    }
    // Trimmed in place: the copy the caller handed over is the result.
    text.erase(text.find_last_not_of(blanks) + 1);
    text.erase(0, first);
    return text;
}

bool textEqual(const char* left, const char* right)
{
    if (left == nullptr || right == nullptr)
    {
        return left == right;
    }
    for (; *left != '\0' && *right != '\0'; ++left, ++right)
    {
        if (lowerAscii(*left) != lowerAscii(*right))
        {
            return false;
        }
    }
    return *left == *right;
}

} // namespace QX
