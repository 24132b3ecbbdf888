// The platform configuration that the package installs as
// /etc/qx/platform.conf: valid, equal to the defaults that apply without
// it, and every key it shows commented out a valid setting of its own.
#include "Configuration.h"
#include "Platform.h"

#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace
{

std::string installedConfigurationText()
{
    const std::string path =
        std::string(SELPROV_SOURCE_DIR) + "/platform/platform.conf";
    std::ifstream in(path);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

// The "# key = value" lines: after "# ", a key (lower-case letters, dots
// and dashes), then " =" and an optional value.
std::vector<std::string> commentedSettings(const std::string& text)
{
    std::vector<std::string> settings;
    std::istringstream lines(text);
    std::string line;
    while (std::getline(lines, line))
    {
        if (!line.starts_with("# "))
        {
            continue;
        }
        const std::string body = line.substr(2);
        const std::size_t blank = body.find(' ');
        if (blank == 0 || blank == std::string::npos ||
            body.substr(0, blank).find_first_not_of(
                "abcdefghijklmnopqrstuvwxyz.-") != std::string::npos)
        {
            continue;
        }
        const std::string rest = body.substr(blank);
        if (rest == " =" || rest.starts_with(" = "))
        {
            settings.push_back(body);
        }
    }
    return settings;
}

TEST(InstalledConfiguration, ParsesAndShowsTheDefaults)
{
    const std::string text = installedConfigurationText();
    ASSERT_FALSE(text.empty());
    QX::Platform::Configuration installed;
    ASSERT_NO_THROW(
        installed = QX::Platform::parseConfiguration(text, "platform.conf"));
    const QX::Platform::Configuration defaults;
    EXPECT_EQ(installed.source, defaults.source);
    EXPECT_EQ(installed.ipmi.interface, defaults.ipmi.interface);
    EXPECT_EQ(installed.fixtureFile, defaults.fixtureFile);
    EXPECT_EQ(installed.logSink, defaults.logSink);
    EXPECT_EQ(installed.logLevel, defaults.logLevel);
    EXPECT_EQ(installed.traceLevel, defaults.traceLevel);
    EXPECT_EQ(installed.logComponents, defaults.logComponents);
}

TEST(InstalledConfiguration, ReadsTheServersOwnBmcInBand)
{
    const auto installed = QX::Platform::parseConfiguration(
        installedConfigurationText(), "platform.conf");
    EXPECT_EQ(installed.source, "ipmi");
    EXPECT_EQ(installed.ipmi.interface, QX::Ipmi::Interface::InBand);
}

TEST(InstalledConfiguration, EveryCommentedOutKeyIsAValidSetting)
{
    const std::vector<std::string> settings =
        commentedSettings(installedConfigurationText());
    // The documented keys: at least the IPMI, log and locale settings.
    EXPECT_GE(settings.size(), 20u);
    for (const std::string& setting : settings)
    {
        EXPECT_NO_THROW(QX::Platform::parseConfiguration(setting, "line"))
            << setting;
    }
}

} // namespace
