// The provider as a freshly installed machine runs it: no platform
// configuration, or one that names no source. The platform then reads the
// server's own BMC in band; on a machine without one a request gets no
// data (never the built-in sample) and one line says what is missing. A
// platform that cannot be set up at all fails a subscription's watch with
// a line in the log as well.
#include "CaptureSink.h"
#include "Configuration.h"
#include "EntryFixture.h"
#include "SelClasses.h"

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <optional>
#include <sstream>
#include <string>
#include <unistd.h>

#include <gtest/gtest.h>

namespace
{

using entry::classPath;

constexpr const char* installedConfiguration = "/etc/qx/platform.conf";
constexpr const char* missingBmc = "no in-band BMC on this machine";

/** Whether this machine has an IPMI device the in-band driver could use. */
bool hasInbandDevice()
{
    for (const char* device : {"/dev/ipmi0", "/dev/ipmi/0", "/dev/ipmidev/0"})
    {
        std::error_code error;
        if (std::filesystem::exists(device, error))
        {
            return true;
        }
    }
    return false;
}

std::size_t occurrences(const std::string& text, const std::string& part)
{
    std::size_t count = 0;
    for (std::size_t at = text.find(part); at != std::string::npos;
         at = text.find(part, at + part.size()))
    {
        ++count;
    }
    return count;
}

/** The provider with no source configured: the platform's own choice. */
class DefaultSource : public entry::ProviderTest
{
  protected:
    void SetUp() override
    {
        saveVariable();
        if (hasInbandDevice())
        {
            GTEST_SKIP() << "this machine has an in-band IPMI device";
        }
        directory_ = std::filesystem::temp_directory_path() /
                     ("default-source-test-" + std::to_string(::getpid()));
        std::filesystem::create_directories(directory_);
        ProviderTest::SetUp();
        // The configuration is read again at the next request.
        QX::Platform::overrideSource(nullptr);
    }

    void TearDown() override
    {
        ProviderTest::TearDown();
        restoreVariable();
        CVLog::CVLogger::setSink(nullptr);
        if (!directory_.empty())
        {
            std::error_code ignored;
            std::filesystem::remove_all(directory_, ignored);
        }
    }

    /** Points the platform at a configuration that names no source and
     *  only sends the log to a file; returns the path of that file. */
    std::string configureLogOnly()
    {
        const auto log = directory_ / "platform.log";
        const auto file = directory_ / "platform.conf";
        std::ofstream(file) << "log.sink = file:" << log.string() << "\n";
        ::setenv(QX::Platform::configurationPathVariable, file.c_str(), 1);
        return log.string();
    }

    static void useNoConfiguration()
    {
        ::unsetenv(QX::Platform::configurationPathVariable);
    }

  private:
    void saveVariable()
    {
        const char* value =
            std::getenv(QX::Platform::configurationPathVariable);
        if (value != nullptr)
        {
            saved_ = value;
        }
    }
    void restoreVariable()
    {
        if (saved_)
        {
            ::setenv(QX::Platform::configurationPathVariable, saved_->c_str(),
                     1);
        }
        else
        {
            ::unsetenv(QX::Platform::configurationPathVariable);
        }
    }

    std::filesystem::path directory_;
    std::optional<std::string> saved_;
};

TEST_F(DefaultSource, WithoutAnyConfigurationNoSampleAndOneLineOnStderr)
{
    std::error_code error;
    if (std::filesystem::exists(installedConfiguration, error))
    {
        GTEST_SKIP() << installedConfiguration << " exists on this machine";
    }
    useNoConfiguration();
    ::testing::internal::CaptureStderr();
    const host::Outcome outcome =
        host().enumerateInstances(classPath("ZAN_MgmtHwLogEntry"));
    const std::string written = ::testing::internal::GetCapturedStderr();
    EXPECT_TRUE(outcome.instances.empty());
    EXPECT_TRUE(outcome.paths.empty());
    EXPECT_EQ(written.find("CPU1 Temp"), std::string::npos);
    EXPECT_EQ(occurrences(written, missingBmc), 1u) << written;
    EXPECT_EQ(occurrences(written, "\n"), 1u) << written;
    EXPECT_NE(written.find("modprobe ipmi_si ipmi_devintf"), std::string::npos)
        << written;
    EXPECT_NE(written.find("ipmi.interface = lan"), std::string::npos)
        << written;
}

TEST_F(DefaultSource, ConfigurationWithoutSourceLogsWhatIsMissing)
{
    const std::string logFile = configureLogOnly();
    for (const char* className : {"ZAN_MgmtHwLog", "ZAN_MgmtHwLogEntry"})
    {
        ::testing::internal::CaptureStderr();
        const host::Outcome outcome =
            host().enumerateInstances(classPath(className));
        const std::string written = ::testing::internal::GetCapturedStderr();
        EXPECT_TRUE(outcome.instances.empty()) << className;
        EXPECT_EQ(written.find("CPU1 Temp"), std::string::npos);
        EXPECT_EQ(occurrences(written, missingBmc), 1u) << written;
    }
    CVLog::CVLogger::setSink(nullptr); // flushes and closes the file
    std::ifstream in(logFile);
    std::ostringstream log;
    log << in.rdbuf();
    // One failure line per request, at the failure level.
    EXPECT_EQ(occurrences(log.str(), missingBmc), 2u) << log.str();
    EXPECT_EQ(occurrences(log.str(), "LOG 6000 [QX.Platform.IPMI]"), 2u)
        << log.str();
    EXPECT_EQ(log.str().find("CPU1 Temp"), std::string::npos);
}

TEST_F(DefaultSource, AWatchThePlatformCannotStartIsAFailureInTheLog)
{
    const auto file = std::filesystem::temp_directory_path() /
                      ("broken-" + std::to_string(::getpid()) + ".conf");
    std::ofstream(file) << "source = bmc\n";
    ::setenv(QX::Platform::configurationPathVariable, file.c_str(), 1);
    const auto capture = std::make_shared<testsupport::CaptureSink>();
    const CVLog::LoggerSettings previous = CVLog::CVLogger::settings();
    CVLog::CVLogger::setSink(capture);
    CVLog::CVLogger::configure(CVLog::LoggerSettings{});
    ::testing::internal::CaptureStderr();
    const auto filter = selclasses::filterFor("ZAN_MgmtHwLogEntryEvent");
    const host::Outcome outcome = host().activateFilter(filter, true);
    const std::string written = ::testing::internal::GetCapturedStderr();
    CVLog::CVLogger::configure(previous);
    std::filesystem::remove(file);
    EXPECT_EQ(outcome.rc, CMPI_RC_OK);
    EXPECT_NE(written.find("source must be one of"), std::string::npos)
        << written;
    unsigned watchFailures = 0;
    for (const auto& record : capture->records())
    {
        if (record.function == "Watches::start")
        {
            EXPECT_EQ(record.level, 6000);
            EXPECT_EQ(record.component, "Corvane.SELProvider");
            EXPECT_NE(record.message.find("source must be one of"),
                      std::string::npos)
                << record.message;
            watchFailures += record.channel == CVLog::Channel::Log ? 1 : 0;
        }
    }
    EXPECT_EQ(watchFailures, 1u);
}

TEST_F(DefaultSource, SampleOnlyWhereTheConfigurationAsksForIt)
{
    const auto file = std::filesystem::temp_directory_path() /
                      ("memory-" + std::to_string(::getpid()) + ".conf");
    std::ofstream(file) << "source = memory\nlog.sink = none\n";
    ::setenv(QX::Platform::configurationPathVariable, file.c_str(), 1);
    const host::Outcome outcome =
        host().enumerateInstances(classPath("ZAN_MgmtHwLogEntry"));
    std::filesystem::remove(file);
    EXPECT_EQ(outcome.rc, CMPI_RC_OK);
    EXPECT_FALSE(outcome.instances.empty());
}

} // namespace
