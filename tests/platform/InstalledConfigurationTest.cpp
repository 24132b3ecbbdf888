// The platform configuration that the package installs as
// /etc/qx/platform.conf: valid, equal to the defaults that apply without
// it, and every key it shows commented out a valid setting of its own.
#include "Configuration.h"
#include "Platform.h"

#include <fstream>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace
{

std::string sourceFileText(const std::string& relativePath)
{
    std::ifstream in(std::string(SELPROV_SOURCE_DIR) + "/" + relativePath);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

std::string installedConfigurationText()
{
    return sourceFileText("platform/platform.conf");
}

std::string keyOf(const std::string& setting)
{
    return setting.substr(0, setting.find(' '));
}

// The keys of the configuration guide's table: rows "| `key` | ...".
std::set<std::string> documentedKeys()
{
    std::set<std::string> keys;
    std::istringstream lines(sourceFileText("docs/configuration.md"));
    std::string line;
    while (std::getline(lines, line))
    {
        if (line.starts_with("| `"))
        {
            const std::size_t end = line.find('`', 3);
            if (end != std::string::npos)
            {
                keys.insert(line.substr(3, end - 3));
            }
        }
    }
    return keys;
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

namespace
{

// The file the package installs and the configuration guide name the same
// keys: each key shown in the file has a row in the guide, and each row's
// key is shown in the file (set, or commented out at its default).
TEST(InstalledConfiguration, ShowsExactlyTheKeysTheGuideDocuments)
{
    const std::string text = installedConfigurationText();
    std::set<std::string> shown;
    for (const std::string& setting : commentedSettings(text))
    {
        shown.insert(keyOf(setting));
    }
    std::istringstream lines(text);
    std::string line;
    while (std::getline(lines, line))
    {
        if (!line.empty() && !line.starts_with('#'))
        {
            shown.insert(keyOf(line));
        }
    }
    const std::set<std::string> documented = documentedKeys();
    EXPECT_GE(documented.size(), 20u);
    EXPECT_EQ(shown, documented);
}

} // namespace
