#include "Support.h"

#include <algorithm>
#include <array>
#include <climits>
#include <iterator>
#include <unistd.h>

namespace QX
{

namespace
{

char lowerAscii(char c)
{
    return (c >= 'A' && c <= 'Z') ? static_cast<char>(c - 'A' + 'a') : c;
}

using HostNameBuffer = std::array<char, HOST_NAME_MAX + 2>;

/** Fills @p name with the host name, or "localhost" when there is none. */
void readSystemName(HostNameBuffer& name)
{
    name.fill('\0');
    // gethostname may leave a truncated name unterminated: the last byte
    // stays NUL because the call gets one byte less than the buffer.
    if (gethostname(name.data(), name.size() - 1) != 0 || name[0] == '\0')
    {
        static constexpr char fallback[] = "localhost";
        std::copy(std::begin(fallback), std::end(fallback), name.begin());
    }
}

/** The calling thread's open SystemNameScopes and the name they hold.
 *  Trivially destructible on purpose: a thread_local with a destructor
 *  would pin the provider library in memory until the thread ends. */
struct SystemNameCache
{
    unsigned openScopes = 0;
    bool read = false;
    HostNameBuffer name;
};

thread_local SystemNameCache systemNameCache{};

} // namespace

std::string getSystemName()
{
    SystemNameCache& cache = systemNameCache;
    if (cache.openScopes == 0)
    {
        HostNameBuffer name{};
        readSystemName(name);
        return name.data();
    }
    if (!cache.read)
    {
        readSystemName(cache.name);
        cache.read = true;
    }
    return cache.name.data();
}

SystemNameScope::SystemNameScope()
{
    ++systemNameCache.openScopes;
}

SystemNameScope::~SystemNameScope()
{
    if (--systemNameCache.openScopes == 0)
    {
        systemNameCache.read = false;
    }
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
