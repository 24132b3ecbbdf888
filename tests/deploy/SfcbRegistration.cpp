#include "SfcbRegistration.h"

#include "Mof.h"

#include <fstream>
#include <sstream>

namespace mof
{

namespace
{

std::string trim(std::string_view text)
{
    const char* const blanks = " \t\r\n\v\f";
    const std::size_t first = text.find_first_not_of(blanks);
    if (first == std::string_view::npos)
    {
        return {};
    }
    const std::size_t last = text.find_last_not_of(blanks);
    return std::string(text.substr(first, last - first + 1));
}

} // namespace

const std::string* SfcbStanza::value(std::string_view key) const
{
    for (const auto& [name, text] : entries)
    {
        if (sameName(name, key))
        {
            return &text;
        }
    }
    return nullptr;
}

std::vector<SfcbStanza> parseSfcbRegistration(std::string_view text,
                                              const std::string& source)
{
    std::vector<SfcbStanza> stanzas;
    std::istringstream lines{std::string(text)};
    std::string raw;
    for (int number = 1; std::getline(lines, raw); ++number)
    {
        const auto fail = [&](const std::string& what) {
            throw MofError(source + ":" + std::to_string(number) + ": " + what);
        };
        const std::string line = trim(raw);
        if (line.empty() || line.front() == '#')
        {
            continue;
        }
        if (line.front() == '[')
        {
            if (line.back() != ']' || line.size() < 3)
            {
                fail("bad block header \"" + line + "\"");
            }
            SfcbStanza stanza;
            stanza.className = trim(line.substr(1, line.size() - 2));
            stanza.line = number;
            for (const SfcbStanza& s : stanzas)
            {
                if (sameName(s.className, stanza.className))
                {
                    fail("class " + stanza.className + " registered twice");
                }
            }
            stanzas.push_back(std::move(stanza));
            continue;
        }
        const std::size_t colon = line.find(':');
        if (colon == std::string::npos)
        {
            fail("expected \"key: value\", found \"" + line + "\"");
        }
        if (stanzas.empty())
        {
            fail("\"" + line + "\" before the first [class] block");
        }
        std::string key = trim(line.substr(0, colon));
        if (key.empty())
        {
            fail("empty key in \"" + line + "\"");
        }
        if (stanzas.back().value(key) != nullptr)
        {
            fail("key " + key + " given twice in block " +
                 stanzas.back().className);
        }
        stanzas.back().entries.emplace_back(std::move(key),
                                            trim(line.substr(colon + 1)));
    }
    return stanzas;
}

std::vector<SfcbStanza> parseSfcbRegistrationFile(const std::string& path)
{
    std::ifstream in(path, std::ios::binary);
    if (!in)
    {
        throw MofError(path + ": cannot be read");
    }
    std::ostringstream text;
    text << in.rdbuf();
    return parseSfcbRegistration(text.str(), path);
}

std::vector<std::string> words(std::string_view text)
{
    std::vector<std::string> out;
    std::istringstream in{std::string(text)};
    std::string word;
    while (in >> word)
    {
        out.push_back(word);
    }
    return out;
}

} // namespace mof
