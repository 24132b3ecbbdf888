#include "Platform.h"

#include "CVLogger.h"
#include "Configuration.h"
#include "Instrumentation.h"
#include "MemorySource.h"
#include "Resources.h"
#include "platform/CapturedLog.h"
#include "platform/ConfigurationFiles.h"
#include "platform/EnvironmentGuard.h"
#include "platform/TestTrees.h"

#include <cstdio>
#include <fstream>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace QX;
using namespace QX::NodeLexicon;
using QX::test::configurationError;
using QX::test::TempFile;
using ::testing::HasSubstr;
using ::testing::StartsWith;

namespace
{

/** Restores the configured source and the logger after a test. */
class PlatformTest : public ::testing::Test
{
  protected:
    void TearDown() override
    {
        Platform::overrideSource(nullptr);
        CVLog::CVLogger::setSink(previousSink_);
        CVLog::CVLogger::configure(previousSettings_);
    }

    test::EnvironmentGuard environment_;

  private:
    std::shared_ptr<CVLog::LogSink> previousSink_ =
        CVLog::CVLogger::setSink(nullptr);
    CVLog::LoggerSettings previousSettings_ = CVLog::CVLogger::settings();
};

} // namespace

TEST(Configuration, DefaultsWhenEmpty)
{
    const auto configuration = Platform::parseConfiguration("", "x");
    // The server's own BMC, never the built-in sample.
    EXPECT_EQ(configuration.source, "ipmi");
    EXPECT_EQ(configuration.ipmi.interface, Ipmi::Interface::InBand);
    EXPECT_EQ(configuration.fixtureFile, "");
    EXPECT_EQ(configuration.logSink, "syslog");
    EXPECT_EQ(configuration.logLevel, 6000);
    EXPECT_EQ(configuration.traceLevel, 0);
    EXPECT_EQ(configuration.logComponents, "*");
    EXPECT_EQ(configuration.locale, "");
}

TEST(Configuration, LocaleIsEnglishGermanOrTheEnvironment)
{
    EXPECT_EQ(Platform::parseConfiguration("locale = de\n", "x").locale, "de");
    EXPECT_EQ(Platform::parseConfiguration("locale=en", "x").locale, "en");
    EXPECT_EQ(Platform::parseConfiguration("locale =\n", "x").locale, "");
    EXPECT_EQ(configurationError("locale = fr\n"),
              "platform.conf:1: locale must be en or de (or empty for the "
              "environment), not \"fr\"");
    EXPECT_EQ(configurationError("locale = de_DE\n"),
              "platform.conf:1: locale must be en or de (or empty for the "
              "environment), not \"de_DE\"");
}

TEST(Configuration, ParsesEveryKey)
{
    const auto configuration = Platform::parseConfiguration(
        "# platform settings\n"
        "\n"
        "source = memory\n"
        "  memory.fixture=/var/lib/qx/sel.fixture  \n"
        "log.sink = file:/var/log/qx.log\n"
        "log.level = 4000\n"
        "trace.level=1\n"
        "log.components = Corvane.SELProvider, Other\n",
        "x");
    EXPECT_EQ(configuration.fixtureFile, "/var/lib/qx/sel.fixture");
    EXPECT_EQ(configuration.logSink, "file:/var/log/qx.log");
    EXPECT_EQ(configuration.logLevel, 4000);
    EXPECT_EQ(configuration.traceLevel, 1);
    EXPECT_EQ(configuration.logComponents, "Corvane.SELProvider, Other");
    for (const char* sink : {"syslog", "stderr", "none"})
    {
        EXPECT_EQ(
            Platform::parseConfiguration(std::string("log.sink=") + sink, "x")
                .logSink,
            sink);
    }
}

TEST(Configuration, RejectsBadLines)
{
    EXPECT_EQ(
        configurationError("source = bmc\n"),
        "platform.conf:1: source must be one of: memory, ipmi (not \"bmc\")");
    EXPECT_EQ(configurationError("\ncolour = blue\n"),
              "platform.conf:2: unknown key \"colour\"");
    EXPECT_EQ(configurationError("log.level\n"),
              "platform.conf:1: expected key = value, found \"log.level\"");
    EXPECT_THAT(
        configurationError("log.level = -1\n"),
        StartsWith("platform.conf:1: log.level must be a whole number"));
    EXPECT_THAT(configurationError("trace.level = 12x\n"),
                StartsWith("platform.conf:1: trace.level must be"));
    EXPECT_THAT(configurationError("log.sink = file:\n"),
                StartsWith("platform.conf:1: log.sink must be syslog"));
    EXPECT_THAT(configurationError("log.sink = journal\n"),
                HasSubstr("not \"journal\""));
    EXPECT_THAT(configurationError("log.components =\n"),
                StartsWith("platform.conf:1: log.components"));
}

TEST_F(PlatformTest, LoadConfigurationReadsTheNamedFile)
{
    const TempFile file("log.sink = none\nlog.level = 3000\n");
    environment_.set(Platform::configurationPathVariable, file.path());
    const auto configuration = Platform::loadConfiguration();
    EXPECT_EQ(configuration.logSink, "none");
    EXPECT_EQ(configuration.logLevel, 3000);
}

TEST_F(PlatformTest, NamedButUnreadableFileIsAnError)
{
    environment_.set(Platform::configurationPathVariable,
                     "/nonexistent/qx/platform.conf");
    try
    {
        Platform::loadConfiguration();
        FAIL() << "no exception";
    }
    catch (const std::runtime_error& error)
    {
        EXPECT_THAT(error.what(), HasSubstr("/nonexistent/qx/platform.conf"));
    }
}

TEST_F(PlatformTest, CurrentSourceBuildsFromTheConfiguredFixture)
{
    const TempFile fixture("controller path=/only status=3\n"
                           "log path=/only/sel Name=\"From File\"\n");
    const TempFile configuration("source = memory\n"
                                 "memory.fixture = " +
                                 fixture.path() +
                                 "\nlog.sink = none\n"
                                 "log.level = 5000\n"
                                 "trace.level = 2000\n"
                                 "log.components = a, b\n");
    environment_.set(Platform::configurationPathVariable, configuration.path());
    Platform::overrideSource(nullptr);

    const auto source = Platform::currentSource();
    ASSERT_NE(source, nullptr);
    EXPECT_EQ(Platform::currentSource(), source); // made once
    Instrumentation cursor;
    cursor.selectNode(EventLog);
    std::string name;
    ASSERT_TRUE(cursor.getProperty(Name, name));
    EXPECT_EQ(name, "From File");

    const auto settings = CVLog::CVLogger::settings();
    EXPECT_EQ(settings.logLevel, 5000);
    EXPECT_EQ(settings.traceLevel, 2000);
    EXPECT_EQ(settings.components, (std::vector<std::string>{"a", "b"}));
}

TEST_F(PlatformTest, EmptyFixtureSettingUsesTheBuiltInSample)
{
    const TempFile configuration("source = memory\nlog.sink = none\n");
    environment_.set(Platform::configurationPathVariable, configuration.path());
    Platform::overrideSource(nullptr);
    Instrumentation cursor;
    cursor.selectNode(EventLog);
    std::string name;
    ASSERT_TRUE(cursor.getProperty(Name, name));
    EXPECT_EQ(name, "IPMI SEL Log");
}

TEST_F(PlatformTest, BrokenConfigurationFailsEveryCursor)
{
    const TempFile configuration("source = bmc\n");
    environment_.set(Platform::configurationPathVariable, configuration.path());
    Platform::overrideSource(nullptr);
    ::testing::internal::CaptureStderr();
    EXPECT_THROW(Platform::currentSource(), std::runtime_error);
    try
    {
        Instrumentation cursor;
        FAIL() << "no exception";
    }
    catch (const std::exception& error)
    {
        EXPECT_THAT(error.what(),
                    HasSubstr("source must be one of: memory, ipmi"));
    }
    const std::string written = ::testing::internal::GetCapturedStderr();
    EXPECT_THAT(written, HasSubstr("source must be one of: memory"));
}

TEST_F(PlatformTest, UnavailablePlatformIsAFailureInTheLog)
{
    const TempFile configuration("source = bmc\n");
    environment_.set(Platform::configurationPathVariable, configuration.path());
    Platform::overrideSource(nullptr);
    CVLog::CVLogger::configure(CVLog::LoggerSettings{});
    const test::CapturedLog log;
    ::testing::internal::CaptureStderr();
    EXPECT_THROW(Platform::currentSource(), std::runtime_error);
    ::testing::internal::GetCapturedStderr();
    int failures = 0;
    for (const auto& record : log.records())
    {
        if (record.message.find("instrumentation platform unavailable") !=
            std::string::npos)
        {
            EXPECT_EQ(record.channel, CVLog::Channel::Log);
            EXPECT_EQ(record.level, 6000);
            EXPECT_EQ(record.component, "QX.Platform");
            EXPECT_THAT(record.message, HasSubstr("source must be one of"));
            ++failures;
        }
    }
    EXPECT_EQ(failures, 1);
}

TEST_F(PlatformTest, MissingFixtureFileFailsWithItsName)
{
    const TempFile configuration("source = memory\nlog.sink = none\n"
                                 "memory.fixture = /nonexistent/sel.fixture\n");
    environment_.set(Platform::configurationPathVariable, configuration.path());
    Platform::overrideSource(nullptr);
    ::testing::internal::CaptureStderr();
    try
    {
        Platform::currentSource();
        FAIL() << "no exception";
    }
    catch (const std::runtime_error& error)
    {
        EXPECT_THAT(error.what(), HasSubstr("/nonexistent/sel.fixture"));
    }
    ::testing::internal::GetCapturedStderr();
}

TEST_F(PlatformTest, TheConfiguredLocaleChoosesTheLanguage)
{
    environment_.unset("LC_ALL");
    environment_.unset("LC_MESSAGES");
    environment_.set("LANG", "en_US.UTF-8");
    const TempFile german("locale = de\nlog.sink = none\n");
    environment_.set(Platform::configurationPathVariable, german.path());
    Platform::overrideSource(nullptr);
    static_cast<void>(Platform::currentSource());
    EXPECT_EQ(Locale::getLanguageId(), Locale::German);

    const TempFile unset("log.sink = none\n");
    environment_.set(Platform::configurationPathVariable, unset.path());
    Platform::overrideSource(nullptr);
    static_cast<void>(Platform::currentSource());
    EXPECT_EQ(Locale::getLanguageId(), Locale::English);
    environment_.set("LANG", "de_CH.UTF-8");
    EXPECT_EQ(Locale::getLanguageId(), Locale::German);
}

TEST_F(PlatformTest, OverrideSourceReplacesAndNullRereads)
{
    const TempFile configuration("source = memory\nlog.sink = none\n");
    environment_.set(Platform::configurationPathVariable, configuration.path());
    const auto memory =
        std::make_shared<MemorySource>(test::twoControllerTree());
    Platform::overrideSource(memory);
    EXPECT_EQ(Platform::currentSource(), memory);
    {
        Instrumentation cursor; // the default constructor takes the override
        cursor.selectNode(ManagementController);
        ++cursor;
        ASSERT_TRUE(cursor);
        EXPECT_EQ(cursor.getPathToNode(), "/bmc1");
    }
    Platform::overrideSource(nullptr);
    const auto configured = Platform::currentSource();
    EXPECT_NE(configured, memory);
    Instrumentation cursor;
    cursor.selectNode(ManagementController);
    ++cursor;
    EXPECT_FALSE(cursor); // the sample has one controller
}
