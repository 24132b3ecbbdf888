#include "IpmiSettings.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <sys/stat.h>

namespace QX::Ipmi
{

namespace
{

// IPMI 2.0 passwords are at most 20 bytes.
constexpr std::size_t longestPassword = 20;

constexpr std::array knownWorkarounds{
    "assumeio",          "spinpoll",
    "authcap",           "intel20",
    "supermicro20",      "sun20",
    "opensesspriv",      "integritycheckvalue",
    "nochecksumcheck",   "assumemaxsdrrecordcount",
    "assumesystemevent",
};

constexpr std::array knownDrivers{"auto",     "kcs",    "ssif",
                                  "openipmi", "sunbmc", "inteldcmi"};

template <std::size_t N>
bool oneOf(const std::string& value, const std::array<const char*, N>& names)
{
    return std::any_of(names.begin(), names.end(),
                       [&value](const char* name) { return value == name; });
}

// Strict decimal in [low, high]: "12x", "-1" and "" are refused.
bool parseUnsigned(const std::string& text, unsigned low, unsigned high,
                   unsigned& value)
{
    if (text.empty() || text.size() > 9 ||
        text.find_first_not_of("0123456789") != std::string::npos)
    {
        return false;
    }
    const unsigned long parsed = std::stoul(text);
    if (parsed < low || parsed > high)
    {
        return false;
    }
    value = static_cast<unsigned>(parsed);
    return true;
}

std::string number(const std::string& key, const std::string& value,
                   unsigned low, unsigned high, unsigned& target)
{
    if (parseUnsigned(value, low, high, target))
    {
        return {};
    }
    return key + " must be a whole number from " + std::to_string(low) +
           " to " + std::to_string(high) + ", not \"" + value + "\"";
}

std::string choice(const std::string& key, const std::string& value,
                   const std::string& allowed)
{
    return key + " must be " + allowed + ", not \"" + value + "\"";
}

std::string workaroundList(const std::string& value,
                           std::vector<std::string>& names)
{
    std::vector<std::string> parsed;
    std::istringstream items(value);
    std::string item;
    while (std::getline(items, item, ','))
    {
        const std::size_t first = item.find_first_not_of(" \t");
        if (first == std::string::npos)
        {
            continue;
        }
        item = item.substr(first, item.find_last_not_of(" \t") - first + 1);
        if (item == "none")
        {
            continue;
        }
        if (!oneOf(item, knownWorkarounds))
        {
            return "ipmi.workarounds: unknown workaround \"" + item + "\"";
        }
        parsed.push_back(item);
    }
    names = std::move(parsed);
    return {};
}

// Refuses a file holding a password that group or others can read.
void requirePrivate(const std::string& path, const std::string& what)
{
    struct stat status
    {
    };
    if (::stat(path.c_str(), &status) != 0)
    {
        throw std::runtime_error("cannot check the permissions of " + what +
                                 " " + path + ": " + std::strerror(errno));
    }
    if ((status.st_mode & (S_IRGRP | S_IROTH)) != 0)
    {
        char mode[8];
        std::snprintf(mode, sizeof mode, "%04o",
                      static_cast<unsigned>(status.st_mode & 07777));
        throw std::runtime_error(
            what + " " + path + " holds an IPMI password but group or others " +
            "may read it (mode " + mode + "): refused; make it private " +
            "(chmod 600 " + path + ")");
    }
}

std::string readPasswordFile(const std::string& path)
{
    requirePrivate(path, "password file");
    std::ifstream in(path, std::ios::binary);
    if (!in)
    {
        throw std::runtime_error("cannot read password file " + path + ": " +
                                 std::strerror(errno));
    }
    std::string password;
    std::getline(in, password);
    if (!password.empty() && password.back() == '\r')
    {
        password.pop_back();
    }
    return password;
}

} // namespace

bool isSettingKey(const std::string& key)
{
    return key.starts_with("ipmi.");
}

std::string applySetting(Settings& settings, const std::string& key,
                         const std::string& value)
{
    if (key == "ipmi.interface")
    {
        if (value == "inband")
        {
            settings.interface = Interface::InBand;
        }
        else if (value == "lan")
        {
            settings.interface = Interface::Lan;
        }
        else
        {
            return choice(key, value, "inband or lan");
        }
    }
    else if (key == "ipmi.driver")
    {
        if (!oneOf(value, knownDrivers))
        {
            return choice(key, value,
                          "auto, kcs, ssif, openipmi, sunbmc or inteldcmi");
        }
        settings.driver = value;
    }
    else if (key == "ipmi.driver-device")
    {
        settings.driverDevice = value;
    }
    else if (key == "ipmi.host")
    {
        settings.host = value;
    }
    else if (key == "ipmi.user")
    {
        settings.user = value;
    }
    else if (key == "ipmi.password")
    {
        if (value.size() > longestPassword)
        {
            return "ipmi.password is longer than 20 bytes";
        }
        settings.password = value;
        settings.passwordInConfiguration = true;
    }
    else if (key == "ipmi.password-file")
    {
        settings.passwordFile = value;
    }
    else if (key == "ipmi.privilege")
    {
        if (value != "user" && value != "operator" && value != "admin")
        {
            return choice(key, value, "user, operator or admin");
        }
        settings.privilege = value;
    }
    else if (key == "ipmi.cipher-suite")
    {
        if (value == "auto")
        {
            settings.cipherSuite.reset();
            return {};
        }
        unsigned suite = 0;
        if (!parseUnsigned(value, 0, 17, suite))
        {
            return key +
                   " must be auto or a whole number from 0 to 17, "
                   "not \"" +
                   value + "\"";
        }
        settings.cipherSuite = suite;
        return {};
    }
    else if (key == "ipmi.workarounds")
    {
        return workaroundList(value, settings.workarounds);
    }
    else if (key == "ipmi.timeout")
    {
        return number(key, value, 100, 60000, settings.timeoutMs);
    }
    else if (key == "ipmi.retransmission-timeout")
    {
        return number(key, value, 10, 60000, settings.retransmissionTimeoutMs);
    }
    else if (key == "ipmi.sel-warning-fill")
    {
        return number(key, value, 1, 100, settings.warningFillPercent);
    }
    else if (key == "ipmi.poll-interval")
    {
        return number(key, value, 50, 600000, settings.pollIntervalMs);
    }
    else if (key == "ipmi.sel-clock")
    {
        if (value == "utc")
        {
            settings.selClock = SelClock::Utc;
        }
        else if (value == "local")
        {
            settings.selClock = SelClock::Local;
        }
        else
        {
            return choice(key, value, "utc or local");
        }
    }
    else if (key == "ipmi.sel-capacity")
    {
        return number(key, value, 0, 65535, settings.selCapacity);
    }
    else if (key == "ipmi.sel-wraps")
    {
        if (value != "yes" && value != "no")
        {
            return choice(key, value, "yes or no");
        }
        settings.selWraps = value == "yes";
    }
    else if (key == "ipmi.clear-wait")
    {
        return number(key, value, 1000, 600000, settings.clearWaitMs);
    }
    else if (key == "ipmi.sel-verify-interval")
    {
        return number(key, value, 0, 604800, settings.selVerifySeconds);
    }
    else if (key == "ipmi.state-directory")
    {
        settings.stateDirectory = value;
    }
    else
    {
        return "unknown key \"" + key + "\"";
    }
    return {};
}

void completeSettings(Settings& settings, const std::string& configurationFile)
{
    const bool lan = settings.interface == Interface::Lan;
    if (lan && settings.host.empty())
    {
        throw std::runtime_error("ipmi.interface is lan but ipmi.host is not "
                                 "set");
    }
    if (!lan && !settings.host.empty())
    {
        throw std::runtime_error("ipmi.host is set but ipmi.interface is "
                                 "inband (set ipmi.interface = lan)");
    }
    // Retransmission is the LAN's: an in-band timeout below its default
    // is fine.
    if (lan && settings.retransmissionTimeoutMs >= settings.timeoutMs)
    {
        throw std::runtime_error(
            "ipmi.retransmission-timeout must be below ipmi.timeout");
    }
    if (settings.passwordInConfiguration && !settings.passwordFile.empty())
    {
        throw std::runtime_error(
            "give either ipmi.password or ipmi.password-file, not both");
    }
    if (settings.passwordInConfiguration && !configurationFile.empty())
    {
        requirePrivate(configurationFile, "platform configuration");
    }
    if (!settings.passwordFile.empty())
    {
        settings.password = readPasswordFile(settings.passwordFile);
        if (settings.password.size() > longestPassword)
        {
            throw std::runtime_error("the password in " +
                                     settings.passwordFile +
                                     " is longer than 20 bytes");
        }
    }
}

} // namespace QX::Ipmi
