#include "AlertState.h"

#include "SelRecord.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <map>
#include <sstream>
#include <stdexcept>
#include <unistd.h>

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

void closeQuietly(int fd)
{
    if (fd >= 0)
    {
        ::close(fd);
    }
}

[[noreturn]] void fail(const std::string& what, const std::string& path)
{
    throw std::runtime_error(what + " " + path + ": " + std::strerror(errno));
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
    const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
    if (fd < 0)
    {
        problem = std::strerror(errno);
        return std::nullopt;
    }
    // A valid file is a few hundred bytes; read a little more to tell
    // a longer one.
    constexpr std::size_t limit = 4096;
    std::string text;
    char buffer[1024];
    for (;;)
    {
        const ssize_t got = ::read(fd, buffer, sizeof buffer);
        if (got < 0 && errno == EINTR)
        {
            continue;
        }
        if (got < 0)
        {
            problem = std::strerror(errno);
            closeQuietly(fd);
            return std::nullopt;
        }
        if (got == 0)
        {
            break;
        }
        text.append(buffer, static_cast<std::size_t>(got));
        if (text.size() > limit)
        {
            problem = "the file is too long";
            closeQuietly(fd);
            return std::nullopt;
        }
    }
    closeQuietly(fd);
    return parseAlertState(text, problem);
}

void writeAlertState(const std::string& path, const AnnouncedState& state)
{
    const std::filesystem::path target(path);
    const std::filesystem::path directory = target.parent_path();
    if (!directory.empty())
    {
        std::error_code ignored;
        std::filesystem::create_directories(directory, ignored);
    }
    const std::string temporary = path + ".tmp";
    const std::string text = formatAlertState(state);

    const int fd = ::open(temporary.c_str(),
                          O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
    if (fd < 0)
    {
        fail("cannot create", temporary);
    }
    std::size_t written = 0;
    while (written < text.size())
    {
        const ssize_t put =
            ::write(fd, text.data() + written, text.size() - written);
        if (put < 0 && errno == EINTR)
        {
            continue;
        }
        if (put < 0)
        {
            const int saved = errno;
            closeQuietly(fd);
            errno = saved;
            fail("cannot write", temporary);
        }
        written += static_cast<std::size_t>(put);
    }
    if (::fsync(fd) != 0)
    {
        const int saved = errno;
        closeQuietly(fd);
        errno = saved;
        fail("cannot flush", temporary);
    }
    if (::close(fd) != 0)
    {
        fail("cannot close", temporary);
    }
    if (::rename(temporary.c_str(), path.c_str()) != 0)
    {
        fail("cannot rename to", path);
    }
    // The rename itself lasts once the directory is on the disk.
    const std::string dirName = directory.empty() ? "." : directory.string();
    const int dirFd =
        ::open(dirName.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (dirFd >= 0)
    {
        ::fsync(dirFd);
        ::close(dirFd);
    }
}

} // namespace QX::Ipmi
