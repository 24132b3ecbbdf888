#include "AlertState.h"

#include "AtomicFile.h"
#include "SelRecord.h"

#include <map>
#include <sstream>

namespace QX::Ipmi
{

namespace
{

constexpr const char* noRecord = "none";

bool parseRecord(const std::string& text, SelRecordBytes& record)
{
    // The file keeps the pairs without blanks.
    const std::optional<SelRecord> parsed = SelRecord::parseHex(text);
    if (text.size() != record.size() * 2 || !parsed)
    {
        return false;
    }
    record = parsed->bytes();
    return true;
}

bool parseNumber(const std::string& text, std::uint32_t& value)
{
    if (text.empty() || text.size() > 10 ||
        text.find_first_not_of("0123456789") != std::string::npos)
    {
        return false;
    }
    const unsigned long long parsed = std::stoull(text);
    if (parsed > 0xFFFFFFFFull)
    {
        return false;
    }
    value = static_cast<std::uint32_t>(parsed);
    return true;
}

// The key is everything that is neither blank nor control; keeps a
// corrupt key from breaking the file's line structure.
bool printableKey(const std::string& key)
{
    for (const char c : key)
    {
        if (static_cast<unsigned char>(c) <= ' ' ||
            static_cast<unsigned char>(c) >= 0x7f)
        {
            return false;
        }
    }
    return true;
}

} // namespace

std::string recordHex(const SelRecordBytes& record)
{
    return SelRecord::compactHexOf(record);
}

std::string formatAlertState(const AnnouncedState& state)
{
    std::string text = std::string(alertStateHeader) + "\n";
    text += "last-record " +
            (state.lastRecord ? recordHex(*state.lastRecord) : noRecord) + "\n";
    text += "last-addition " + std::to_string(state.lastAddition) + "\n";
    text += "last-erase " + std::to_string(state.lastErase) + "\n";
    text += "log-status " + std::to_string(state.logStatus) + "\n";
    text += "restart " +
            (state.restartKey.empty() || !printableKey(state.restartKey)
                 ? std::string(noRecord)
                 : state.restartKey) +
            "\n";
    text += "end\n";
    return text;
}

std::optional<AnnouncedState> parseAlertState(const std::string& text,
                                              std::string& problem)
{
    std::istringstream lines(text);
    std::string line;
    if (!std::getline(lines, line) || line != alertStateHeader)
    {
        problem = "not a state file of this version (first line \"" +
                  line.substr(0, 40) + "\")";
        return std::nullopt;
    }
    std::map<std::string, std::string> values;
    bool ended = false;
    while (std::getline(lines, line))
    {
        if (line == "end")
        {
            ended = true;
            break;
        }
        const std::size_t blank = line.find(' ');
        if (blank == std::string::npos)
        {
            problem = "malformed line \"" + line.substr(0, 40) + "\"";
            return std::nullopt;
        }
        const std::string key = line.substr(0, blank);
        if (!values.emplace(key, line.substr(blank + 1)).second)
        {
            problem = "\"" + key + "\" appears twice";
            return std::nullopt;
        }
    }
    if (!ended)
    {
        problem = "the file is truncated";
        return std::nullopt;
    }

    AnnouncedState state;
    const char* required[] = {"last-record", "last-addition", "last-erase",
                              "log-status", "restart"};
    for (const char* key : required)
    {
        if (values.count(key) == 0)
        {
            problem = std::string("\"") + key + "\" is missing";
            return std::nullopt;
        }
    }
    if (values.size() != std::size(required))
    {
        problem = "unknown lines";
        return std::nullopt;
    }
    if (values["last-record"] != noRecord)
    {
        SelRecordBytes record{};
        if (!parseRecord(values["last-record"], record))
        {
            problem = "last-record is not 16 hexadecimal bytes";
            return std::nullopt;
        }
        state.lastRecord = record;
    }
    std::uint32_t status = 0;
    if (!parseNumber(values["last-addition"], state.lastAddition) ||
        !parseNumber(values["last-erase"], state.lastErase) ||
        !parseNumber(values["log-status"], status))
    {
        problem = "a number is malformed";
        return std::nullopt;
    }
    state.logStatus = status;
    const std::string& restart = values["restart"];
    if (restart.empty() || !printableKey(restart))
    {
        problem = "restart is malformed";
        return std::nullopt;
    }
    state.restartKey = restart == noRecord ? std::string() : restart;
    return state;
}

std::optional<AnnouncedState> readAlertState(const std::string& path,
                                             std::string& problem)
{
    // A valid file is a few hundred bytes; a longer one is not read.
    constexpr std::size_t limit = 4096;
    const std::optional<std::string> text = readSmallFile(path, limit, problem);
    if (!text)
    {
        return std::nullopt;
    }
    return parseAlertState(*text, problem);
}

void writeAlertState(const std::string& path, const AnnouncedState& state)
{
    writeFileAtomically(path, formatAlertState(state));
}

} // namespace QX::Ipmi
