#include "Names.h"

#include <algorithm>

namespace host
{
namespace
{

char lower(char c)
{
    return (c >= 'A' && c <= 'Z') ? static_cast<char>(c - 'A' + 'a') : c;
}

bool isAlpha(char c)
{
    return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || c == '_';
}

} // namespace

bool sameName(std::string_view a, std::string_view b)
{
    return a.size() == b.size() &&
           std::equal(a.begin(), a.end(), b.begin(),
                      [](char x, char y) { return lower(x) == lower(y); });
}

bool nameLess(std::string_view a, std::string_view b)
{
    return std::lexicographical_compare(a.begin(), a.end(), b.begin(), b.end(),
                                        [](char x, char y)
                                        { return lower(x) < lower(y); });
}

bool isIdentifier(std::string_view text)
{
    if (text.empty() || !isAlpha(text.front()))
    {
        return false;
    }
    return std::all_of(text.begin(), text.end(),
                       [](char c)
                       { return isAlpha(c) || (c >= '0' && c <= '9'); });
}

} // namespace host
