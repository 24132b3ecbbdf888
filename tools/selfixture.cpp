// selfixture: writes a fixture file of a generated SEL (one controller, one
// log, N entries) to standard output, for large-log runs of selprov and the
// benchmarks.
#include "FixtureGenerator.h"

#include <charconv>
#include <iostream>
#include <string>
#include <string_view>

namespace
{

constexpr const char* usage =
    "usage: selfixture ENTRIES [MAX_RECORDS]\n"
    "Writes a fixture with ENTRIES generated entries (0 to 1000000) under a\n"
    "log of MAX_RECORDS records (default: ENTRIES, at least 1).\n";

bool parseCount(std::string_view text, unsigned& value)
{
    const char* end = text.data() + text.size();
    const auto [rest, error] = std::from_chars(text.data(), end, value);
    return error == std::errc() && rest == end && !text.empty();
}

} // namespace

int main(int argc, char** argv)
{
    unsigned entries = 0;
    unsigned maxRecords = 0;
    if (argc < 2 || argc > 3 || !parseCount(argv[1], entries) ||
        entries > 1000000 || (argc == 3 && !parseCount(argv[2], maxRecords)))
    {
        std::cerr << usage;
        return 2;
    }
    if (argc == 2)
    {
        maxRecords = entries > 0 ? entries : 1;
    }
    QX::writeGeneratedFixture(std::cout, entries, maxRecords);
    std::cout.flush();
    return std::cout ? 0 : 1;
}
