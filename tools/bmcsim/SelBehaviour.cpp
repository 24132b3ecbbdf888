#include "SelBehaviour.h"

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <string_view>

namespace bmcsim
{

SelBehaviour SelBehaviour::frozenRing()
{
    SelBehaviour behaviour;
    behaviour.replaced = true;
    behaviour.ring = true;
    behaviour.frozenInfo = true;
    return behaviour;
}

SelBehaviour SelBehaviour::backgroundClear(unsigned ms)
{
    SelBehaviour behaviour;
    behaviour.replaced = true;
    behaviour.clearMs = ms;
    behaviour.clearRecord = true;
    return behaviour;
}

SelBehaviour SelBehaviour::reserveRefused(std::uint8_t code)
{
    SelBehaviour behaviour;
    behaviour.replaced = true;
    behaviour.reserveRefusal = code;
    return behaviour;
}

bool selModuleAvailable()
{
    return std::string_view(BMCSIM_SEL_MODULE).size() > 0 &&
           std::filesystem::exists(BMCSIM_SEL_MODULE);
}

std::string selModuleLine(const SelBehaviour& behaviour, unsigned maxRecords,
                          const std::string& selFile)
{
    if (!behaviour.replaced)
    {
        return {};
    }
    if (!selModuleAvailable())
    {
        throw std::runtime_error("the SEL module was not built "
                                 "(libopenipmi-dev missing)");
    }
    char reserve[8];
    std::snprintf(reserve, sizeof reserve, "%02x", behaviour.reserveRefusal);
    return std::string("loadlib \"") + BMCSIM_SEL_MODULE +
           "\" \"state=" + selFile + " max=" + std::to_string(maxRecords) +
           " ring=" + (behaviour.ring ? "1" : "0") +
           " frozen=" + (behaviour.frozenInfo ? "1" : "0") +
           " clear-ms=" + std::to_string(behaviour.clearMs) +
           " clear-record=" + (behaviour.clearRecord ? "1" : "0") +
           " reserve=" + reserve +
           " delay-ms=" + std::to_string(behaviour.delayMs) + "\"\n";
}

void writeSelFile(const std::string& selFile,
                  const std::vector<Record>& records)
{
    std::ofstream out(selFile, std::ios::trunc);
    for (const Record& record : records)
    {
        for (std::size_t i = 0; i < record.size(); ++i)
        {
            char pair[4];
            std::snprintf(pair, sizeof pair,
                          i + 1 < record.size() ? "%02x " : "%02x\n",
                          record[i]);
            out << pair;
        }
    }
    if (!out)
    {
        throw std::runtime_error("cannot write " + selFile);
    }
}

std::vector<Record> readSelFile(const std::string& selFile)
{
    std::ifstream in(selFile);
    std::vector<Record> records;
    std::string line;
    while (std::getline(in, line))
    {
        std::istringstream words(line);
        Record record{};
        std::size_t filled = 0;
        std::string word;
        while (filled < record.size() && words >> word)
        {
            if (word.size() != 2 ||
                word.find_first_not_of("0123456789abcdef") != std::string::npos)
            {
                break;
            }
            record[filled++] =
                static_cast<std::uint8_t>(std::stoul(word, nullptr, 16));
        }
        if (filled == record.size())
        {
            records.push_back(record);
        }
    }
    return records;
}

} // namespace bmcsim
