/*
 * The platform configuration file. Its syntax and every key, with values
 * and defaults, are described in docs/configuration.md; the ipmi.* keys are
 * read by platform/ipmi/IpmiSettings.cpp.
 */
#include "Configuration.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>

namespace QX::Platform
{

namespace
{

std::string trim(const std::string& text)
{
    const char* const blanks = " \t\r\n\v\f";
    const std::size_t first = text.find_first_not_of(blanks);
    if (first == std::string::npos)
    {
        return {};
    }
    return text.substr(first, text.find_last_not_of(blanks) - first + 1);
}

class ConfigurationLine
{
  public:
    ConfigurationLine(const std::string& sourceName, std::size_t number) :
        sourceName_(sourceName), number_(number)
    {
    }

    [[noreturn]] void fail(const std::string& what) const
    {
        throw std::runtime_error(sourceName_ + ":" + std::to_string(number_) +
                                 ": " + what);
    }

    int level(const std::string& key, const std::string& value) const
    {
        if (value.empty() || value.size() > 9 ||
            value.find_first_not_of("0123456789") != std::string::npos)
        {
            fail(key + " must be a whole number from 0 to 999999999, not \"" +
                 value + "\"");
        }
        return std::stoi(value);
    }

    void checkSink(const std::string& value) const
    {
        if (value == "syslog" || value == "stderr" || value == "none")
        {
            return;
        }
        if (value.starts_with("file:") && value.size() > 5)
        {
            return;
        }
        fail("log.sink must be syslog, stderr, none or file:PATH, not \"" +
             value + "\"");
    }

  private:
    const std::string& sourceName_;
    std::size_t number_;
};

std::string readWholeFile(const std::string& path)
{
    std::ifstream in(path, std::ios::binary);
    if (!in)
    {
        throw std::runtime_error("cannot read platform configuration " + path +
                                 ": " + std::strerror(errno));
    }
    std::ostringstream text;
    text << in.rdbuf();
    if (in.bad())
    {
        throw std::runtime_error("cannot read platform configuration " + path);
    }
    return text.str();
}

} // namespace

Configuration parseConfiguration(const std::string& text,
                                 const std::string& sourceName)
{
    Configuration configuration;
    std::istringstream lines(text);
    std::string raw;
    for (std::size_t number = 1; std::getline(lines, raw); ++number)
    {
        const std::string line = trim(raw);
        if (line.empty() || line.front() == '#')
        {
            continue;
        }
        const ConfigurationLine at(sourceName, number);
        const std::size_t equals = line.find('=');
        if (equals == std::string::npos)
        {
            // A malformed password line must not end up in a log.
            at.fail(line.find("password") == std::string::npos
                        ? "expected key = value, found \"" + line + "\""
                        : std::string("expected key = value"));
        }
        const std::string key = trim(line.substr(0, equals));
        const std::string value = trim(line.substr(equals + 1));
        if (key == "source")
        {
            if (value != "memory" && value != "ipmi")
            {
                at.fail("source must be one of: memory, ipmi (not \"" + value +
                        "\")");
            }
            configuration.source = value;
        }
        else if (key == "memory.fixture")
        {
            configuration.fixtureFile = value;
        }
        else if (Ipmi::isSettingKey(key))
        {
            const std::string problem =
                Ipmi::applySetting(configuration.ipmi, key, value);
            if (!problem.empty())
            {
                at.fail(problem);
            }
        }
        else if (key == "log.sink")
        {
            at.checkSink(value);
            configuration.logSink = value;
        }
        else if (key == "log.level")
        {
            configuration.logLevel = at.level(key, value);
        }
        else if (key == "trace.level")
        {
            configuration.traceLevel = at.level(key, value);
        }
        else if (key == "log.components")
        {
            if (value.empty())
            {
                at.fail("log.components must list components or be *");
            }
            configuration.logComponents = value;
        }
        else if (key == "locale")
        {
            if (!value.empty() && value != "en" && value != "de")
            {
                at.fail("locale must be en or de (or empty for the "
                        "environment), not \"" +
                        value + "\"");
            }
            configuration.locale = value;
        }
        else
        {
            at.fail("unknown key \"" + key + "\"");
        }
    }
    return configuration;
}

Configuration loadConfiguration()
{
    const char* named = std::getenv(configurationPathVariable);
    if (named != nullptr && *named != '\0')
    {
        Configuration configuration =
            parseConfiguration(readWholeFile(named), named);
        configuration.file = named;
        return configuration;
    }
    std::error_code error;
    if (std::filesystem::exists(defaultConfigurationPath, error))
    {
        Configuration configuration = parseConfiguration(
            readWholeFile(defaultConfigurationPath), defaultConfigurationPath);
        configuration.file = defaultConfigurationPath;
        return configuration;
    }
    return Configuration{};
}

} // namespace QX::Platform
