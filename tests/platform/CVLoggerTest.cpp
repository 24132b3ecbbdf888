#include "CVLogger.h"

#include "CaptureSink.h"

#include <cstdio>
#include <fstream>
#include <sstream>
#include <thread>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace CVLog;

namespace
{

/** Installs a CaptureSink and settings; restores the logger afterwards. */
class LoggerTest : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        previousSink_ = CVLogger::setSink(capture_);
        previousSettings_ = CVLogger::settings();
    }
    void TearDown() override
    {
        CVLogger::setSink(previousSink_);
        CVLogger::configure(previousSettings_);
    }

    void configure(int logLevel, int traceLevel,
                   std::vector<std::string> components)
    {
        LoggerSettings settings;
        settings.logLevel = logLevel;
        settings.traceLevel = traceLevel;
        settings.components = std::move(components);
        CVLogger::configure(settings);
    }

    static void log(const std::string& component, int level,
                    const std::string& text)
    {
        CVLogger::logLevelMessage("fn", "File.cpp", 12, component, level,
                                  nullptr, 0, 0, text);
    }
    static void trace(const std::string& component, int level,
                      const std::string& text)
    {
        CVLogger::traceLevelMessage("fn", "File.cpp", 13, component, level,
                                    nullptr, 0, 0, text);
    }

    std::vector<std::string> messages() const
    {
        std::vector<std::string> texts;
        for (const auto& record : capture_->records())
        {
            texts.push_back(record.message);
        }
        return texts;
    }

    std::shared_ptr<testsupport::CaptureSink> capture_ =
        std::make_shared<testsupport::CaptureSink>();

  private:
    std::shared_ptr<LogSink> previousSink_;
    LoggerSettings previousSettings_;
};

} // namespace

TEST_F(LoggerTest, RecordsCarryEveryField)
{
    configure(4000, 4000, {"*"});
    log("Corvane.SELProvider", 4000, "hello");
    trace("Corvane.SELProvider", 6000, "world");
    const auto records = capture_->records();
    ASSERT_EQ(records.size(), 2u);
    EXPECT_EQ(records[0].channel, Channel::Log);
    EXPECT_EQ(records[0].function, "fn");
    EXPECT_EQ(records[0].file, "File.cpp");
    EXPECT_EQ(records[0].line, 12);
    EXPECT_EQ(records[0].component, "Corvane.SELProvider");
    EXPECT_EQ(records[0].level, 4000);
    EXPECT_EQ(records[0].message, "hello");
    EXPECT_EQ(records[1].channel, Channel::Trace);
    EXPECT_EQ(records[1].line, 13);
    EXPECT_EQ(records[1].level, 6000);
}

TEST_F(LoggerTest, EachChannelFiltersByItsOwnLevel)
{
    configure(6000, 3000, {"*"});
    log("c", 4000, "log-4000");
    log("c", 6000, "log-6000");
    trace("c", 2999, "trace-2999");
    trace("c", 3000, "trace-3000");
    trace("c", 4000, "trace-4000");
    EXPECT_EQ(messages(), (std::vector<std::string>{"log-6000", "trace-3000",
                                                    "trace-4000"}));
}

TEST_F(LoggerTest, ZeroThresholdDisablesAChannel)
{
    configure(0, 1, {"*"});
    log("c", 9000, "never");
    trace("c", 1, "trace");
    EXPECT_EQ(messages(), std::vector<std::string>{"trace"});
}

TEST_F(LoggerTest, OnlyListedComponentsAreWritten)
{
    configure(1, 1, {"Corvane.SELProvider", "Other"});
    log("Corvane.SELProvider", 4000, "a");
    log("Unlisted", 4000, "b");
    trace("Other", 4000, "c");
    log("corvane.selprovider", 4000, "d");
    EXPECT_EQ(messages(), (std::vector<std::string>{"a", "c"}));
}

TEST_F(LoggerTest, DefaultSettingsWriteOnlyFailuresOnTheLogChannel)
{
    CVLogger::configure(LoggerSettings{});
    log("c", 4000, "routine");
    log("c", 6000, "failure");
    trace("c", 6000, "traced");
    EXPECT_EQ(messages(), std::vector<std::string>{"failure"});
}

TEST_F(LoggerTest, NullSinkDiscardsAndSetSinkReturnsThePrevious)
{
    configure(1, 1, {"*"});
    const auto previous = CVLogger::setSink(nullptr);
    EXPECT_EQ(previous, capture_);
    log("c", 4000, "dropped");
    EXPECT_EQ(CVLogger::setSink(capture_), nullptr);
    EXPECT_TRUE(capture_->records().empty());
}

TEST_F(LoggerTest, WritesAnswersWhetherAChannelWouldWriteTheLine)
{
    configure(6000, 3000, {"Corvane.SELProvider"});
    EXPECT_FALSE(CVLogger::writes(Channel::Log, "Corvane.SELProvider", 4000));
    EXPECT_TRUE(CVLogger::writes(Channel::Log, "Corvane.SELProvider", 6000));
    EXPECT_FALSE(CVLogger::writes(Channel::Trace, "Corvane.SELProvider", 2999));
    EXPECT_TRUE(CVLogger::writes(Channel::Trace, "Corvane.SELProvider", 3000));
    EXPECT_FALSE(CVLogger::writes(Channel::Log, "Unlisted", 6000));

    configure(0, 1, {"*"});
    EXPECT_FALSE(CVLogger::writes(Channel::Log, "c", 9000));
    EXPECT_TRUE(CVLogger::writes(Channel::Trace, "c", 1));

    CVLogger::setSink(nullptr);
    EXPECT_FALSE(CVLogger::writes(Channel::Trace, "c", 1));
    CVLogger::setSink(capture_);
    EXPECT_TRUE(CVLogger::writes(Channel::Trace, "c", 1));
    // Asking writes nothing.
    EXPECT_TRUE(capture_->records().empty());
}

TEST_F(LoggerTest, WritesAgreesWithWhatTheChannelsWrite)
{
    const std::vector<std::string> components = {"a", "b"};
    for (const int threshold : {0, 1, 3000, 4000, 6000})
    {
        configure(threshold, 6000 - threshold, {"a"});
        for (const std::string& component : components)
        {
            for (const int level : {0, 1, 2999, 3000, 4000, 6000, 9000})
            {
                capture_->clear();
                const bool logs =
                    CVLogger::writes(Channel::Log, component, level);
                const bool traces =
                    CVLogger::writes(Channel::Trace, component, level);
                log(component, level, "l");
                trace(component, level, "t");
                std::vector<std::string> expected;
                if (logs)
                {
                    expected.emplace_back("l");
                }
                if (traces)
                {
                    expected.emplace_back("t");
                }
                EXPECT_EQ(messages(), expected)
                    << threshold << ' ' << component << ' ' << level;
            }
        }
    }
}

TEST_F(LoggerTest, NullFunctionAndFileBecomeEmpty)
{
    configure(1, 1, {"*"});
    CVLogger::logLevelMessage(nullptr, nullptr, 0, "c", 5, nullptr, 0, 0, "x");
    ASSERT_EQ(capture_->records().size(), 1u);
    EXPECT_EQ(capture_->records()[0].function, "");
    EXPECT_EQ(capture_->records()[0].file, "");
    capture_->clear();
    EXPECT_TRUE(capture_->records().empty());
}

TEST_F(LoggerTest, ConcurrentWritersLoseNothing)
{
    configure(1, 1, {"*"});
    std::vector<std::thread> threads;
    threads.reserve(4);
    for (int t = 0; t < 4; ++t)
    {
        threads.emplace_back(
            []
            {
                for (int i = 0; i < 250; ++i)
                {
                    log("c", 4000, "x");
                    trace("c", 4000, "y");
                }
            });
    }
    for (auto& thread : threads)
    {
        thread.join();
    }
    EXPECT_EQ(capture_->records().size(), 2000u);
}

TEST_F(LoggerTest, FileSinkAppendsFormattedLines)
{
    char name[] = "/tmp/qx-log-test-XXXXXX";
    const int fd = mkstemp(name);
    ASSERT_GE(fd, 0);
    close(fd);
    configure(1, 1, {"*"});
    CVLogger::setSink(makeFileSink(name));
    log("Comp", 4000, "first line");
    trace("Comp", 3000, "second line");
    CVLogger::setSink(capture_);
    std::ifstream in(name);
    std::string first;
    std::string second;
    std::getline(in, first);
    std::getline(in, second);
    std::remove(name);
    EXPECT_THAT(first,
                ::testing::MatchesRegex(
                    "[0-9]{4}-[0-9]{2}-[0-9]{2}T[0-9:.]+[-+][0-9]{4} LOG "
                    "4000 \\[Comp\\] first line \\(fn, File.cpp:12\\)"));
    EXPECT_THAT(second,
                ::testing::HasSubstr(
                    " TRACE 3000 [Comp] second line (fn, File.cpp:13)"));
}

TEST(LogSinks, FileSinkThrowsForAnUnwritablePath)
{
    EXPECT_THROW(makeFileSink("/nonexistent/dir/qx.log"), std::runtime_error);
}

TEST(LogSinks, StderrSinkWritesOneLine)
{
    const auto sink = makeStderrSink();
    ::testing::internal::CaptureStderr();
    sink->write(LogRecord{Channel::Trace, "f", "g.cpp", 3, "comp", 4000, "m"});
    const std::string written = ::testing::internal::GetCapturedStderr();
    EXPECT_THAT(written,
                ::testing::EndsWith(" TRACE 4000 [comp] m (f, g.cpp:3)\n"));
}

TEST(CVMessageBuffer, StrHandsOutTheTextAndEmptiesTheBuffer)
{
    CVMessageBuffer buffer;
    buffer << "ENTERING: "
           << "SEL_EnumInstances" << nullptr;
    EXPECT_EQ(CVMessageBuffer::str(buffer), "ENTERING: SEL_EnumInstances");
    EXPECT_EQ(CVMessageBuffer::str(buffer), "");
    buffer << "next";
    EXPECT_EQ(CVMessageBuffer::str(buffer), "next");
}
