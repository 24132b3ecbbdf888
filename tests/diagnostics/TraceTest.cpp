#include "sdk/qxlib/include/Trace.h"

#include "PlatformFixture.h"
#include "ProviderException.h"

#include <cstring>
#include <limits>
#include <string>
#include <thread>

#include <gtest/gtest.h>

namespace
{

using testsupport::PlatformTest;

TEST(TraceFormat, MessageLinePrintsTheTextLast)
{
    EXPECT_STREQ(QX::trace("abc", "SELProvider.cpp", 7, QX::MESSAGE_TRACE),
                 "MESSAGE [File: SELProvider.cpp, Line: 7]: abc");
}

TEST(TraceFormat, EntryExitAndMethodLines)
{
    EXPECT_STREQ(
        QX::trace("SEL_GetInstance", "SELProvider.cpp", 12, QX::ENTRY_TRACE),
        "ENTERING: SEL_GetInstance() in SELProvider.cpp [Line: 12]");
    EXPECT_STREQ(
        QX::trace("SEL_GetInstance", "SELProvider.cpp", 13, QX::EXIT_TRACE),
        "EXITING: SEL_GetInstance() in SELProvider.cpp [Line: 13]");
    EXPECT_STREQ(QX::trace("clearLog", "SEL.cpp", 14, QX::METHOD_TRACE),
                 "METHOD: clearLog() was invoked in SEL.cpp [Line: 14]");
}

template <typename Enum>
concept TakesEveryInt = requires
{
    Enum{-1};
};

TEST(TraceFormat, UnknownKindsGiveEnteringLines)
{
    // Without a fixed underlying type a kind such as 4 or -1 would not be a
    // value of MessageType at all, and the comparisons below undefined.
    static_assert(TakesEveryInt<QX::MessageType>);
    for (const int kind : {0, 4, 5, 1000, -1, std::numeric_limits<int>::max(),
                           std::numeric_limits<int>::min()})
    {
        EXPECT_STREQ(
            QX::trace("f", "SEL.cpp", 1, static_cast<QX::MessageType>(kind)),
            "ENTERING: f() in SEL.cpp [Line: 1]")
            << "kind " << kind;
    }
}

TEST(TraceFormat, VariableLines)
{
    EXPECT_STREQ(QX::trace("classname", "SELProvider.cpp", 99, "ZAN_MgmtHwLog"),
                 "VARIABLE: 'classname' has Value 'ZAN_MgmtHwLog' at line 99 "
                 "in SELProvider.cpp");
    EXPECT_STREQ(QX::trace("subscriberCountLogClearIndication",
                           "SELIndication.cpp", 5, 3u),
                 "VARIABLE: 'subscriberCountLogClearIndication' has Value "
                 "'3' at line 5 in SELIndication.cpp");
}

TEST(TraceFormat, UnsignedVariablePrintsAsSignedDecimal)
{
    EXPECT_STREQ(QX::trace("count", "SEL.cpp", 1, 4294967295u),
                 "VARIABLE: 'count' has Value '-1' at line 1 in SEL.cpp");
}

TEST(TraceFormat, NullTextsPrintAsNull)
{
    EXPECT_STREQ(QX::trace("classname", "SELProvider.cpp", 3,
                           static_cast<const char*>(nullptr)),
                 "VARIABLE: 'classname' has Value '(null)' at line 3 in "
                 "SELProvider.cpp");
}

TEST(TraceFormat, LongTextsAreCutToTheBuffer)
{
    const std::string huge(10000, 'C');
    const char* line =
        QX::trace("classname", "SELProvider.cpp", 3, huge.c_str());
    EXPECT_EQ(std::strlen(line), QX::TRACE_BUFFER_SIZE - 1);
    EXPECT_EQ(
        std::string(line).rfind("VARIABLE: 'classname' has Value 'CCC", 0), 0u);
    const char* message =
        QX::trace(huge.c_str(), "SEL.cpp", 3, QX::MESSAGE_TRACE);
    EXPECT_EQ(std::strlen(message), QX::TRACE_BUFFER_SIZE - 1);
}

TEST(TraceFormat, EachFormatterHasItsOwnBuffer)
{
    const char* kind = QX::trace("a", "f", 1, QX::ENTRY_TRACE);
    const char* text = QX::trace("n", "f", 1, "v");
    const char* number = QX::trace("n", "f", 1, 2u);
    EXPECT_NE(kind, text);
    EXPECT_NE(text, number);
    EXPECT_STREQ(kind, "ENTERING: a() in f [Line: 1]");
    // The same formatter reuses its buffer.
    EXPECT_EQ(QX::trace("b", "f", 2, QX::EXIT_TRACE), kind);
}

TEST(TraceFormat, ConcurrentTracesAlwaysGiveWholeLines)
{
    auto worker = [](const char* name)
    {
        for (int i = 0; i < 2000; ++i)
        {
            const std::string expected =
                std::string("ENTERING: ") + name + "() in f [Line: 1]";
            ASSERT_EQ(QX::trace(name, "f", 1, QX::ENTRY_TRACE), expected);
        }
    };
    std::thread first(worker, "first");
    std::thread second(worker, "second");
    first.join();
    second.join();
}

TEST(TraceHeader, PathEndsInTheTraceHeader)
{
    const std::string path = QX::TRACE_HEADER_PATH;
    const std::string tail = "sdk/qxlib/include/Trace.h";
    ASSERT_GE(path.size(), tail.size());
    EXPECT_EQ(path.substr(path.size() - tail.size()), tail);
    EXPECT_EQ(std::string(QX::TRACE_BANNER), std::string(78, '='));
}

class MarkingTest : public PlatformTest
{
  protected:
    static void setLevels(int logLevel, int traceLevel)
    {
        CVLog::LoggerSettings settings;
        settings.logLevel = logLevel;
        settings.traceLevel = traceLevel;
        CVLog::CVLogger::configure(settings);
    }
};

TEST_F(MarkingTest, EntryMarkingMakesFourLoggerCallsAtLevel4000)
{
    const std::string component = "Corvane.SELProvider";
    QX::markProviderEntry(component, "SEL_EnumInstances", "SELProvider.cpp",
                          42);
    const auto records = logRecords();
    ASSERT_EQ(records.size(), 4u);
    const std::string entering =
        "ENTERING: SEL_EnumInstances() in SELProvider.cpp [Line: 42]";
    const CVLog::Channel channels[] = {
        CVLog::Channel::Log, CVLog::Channel::Trace, CVLog::Channel::Log,
        CVLog::Channel::Trace};
    const std::string messages[] = {QX::TRACE_BANNER, QX::TRACE_BANNER,
                                    entering, entering};
    const int lines[] = {336, 336, 337, 337};
    for (std::size_t i = 0; i < records.size(); ++i)
    {
        EXPECT_EQ(records[i].channel, channels[i]) << i;
        EXPECT_EQ(records[i].message, messages[i]) << i;
        EXPECT_EQ(records[i].line, lines[i]) << i;
        EXPECT_EQ(records[i].level, 4000) << i;
        EXPECT_EQ(records[i].function, "markProviderEntry") << i;
        EXPECT_EQ(records[i].file, QX::TRACE_HEADER_PATH) << i;
        EXPECT_EQ(records[i].component, component) << i;
    }
}

TEST_F(MarkingTest, ExitMarkingWritesTheExitLineThenTheBanner)
{
    QX::markProviderExit("Corvane.SELProvider", "SEL_GetInstance",
                         "SELProvider.cpp", 77);
    const auto records = logRecords();
    ASSERT_EQ(records.size(), 4u);
    const std::string exiting =
        "EXITING: SEL_GetInstance() in SELProvider.cpp [Line: 77]";
    EXPECT_EQ(records[0].message, exiting);
    EXPECT_EQ(records[1].message, exiting);
    EXPECT_EQ(records[2].message, QX::TRACE_BANNER);
    EXPECT_EQ(records[3].message, QX::TRACE_BANNER);
    EXPECT_EQ(records[0].line, 348);
    EXPECT_EQ(records[2].line, 349);
    for (const auto& record : records)
    {
        EXPECT_EQ(record.level, 4000);
        EXPECT_EQ(record.function, "markProviderExit");
    }
}

TEST_F(MarkingTest, ErrorLineGoesToBothChannelsAt6000)
{
    QX::logMessage("SEL_EnumInstances", "SELProvider.cpp", 120,
                   "Corvane.SELProvider", QX::LOG_LEVEL_FAILURE,
                   "getAllSELCMPIInstances Failed");
    const auto records = logRecords();
    ASSERT_EQ(records.size(), 2u);
    const std::string line = "MESSAGE [File: SELProvider.cpp, Line: 120]: "
                             "getAllSELCMPIInstances Failed";
    EXPECT_EQ(records[0].channel, CVLog::Channel::Log);
    EXPECT_EQ(records[1].channel, CVLog::Channel::Trace);
    for (const auto& record : records)
    {
        EXPECT_EQ(record.message, line);
        EXPECT_EQ(record.level, 6000);
        EXPECT_EQ(record.function, "SEL_EnumInstances");
        EXPECT_EQ(record.file, "SELProvider.cpp");
        EXPECT_EQ(record.line, 120);
    }
}

TEST_F(MarkingTest, EachChannelThatWritesGetsTheLineFormattedAfresh)
{
    setLevels(4000, 4000);
    int formatted = 0;
    QX::logAndTrace("fn", "SEL.cpp", 5, "Corvane.SELProvider", 4000,
                    [&]
                    {
                        ++formatted;
                        return formatted == 1 ? "first" : "second";
                    });
    EXPECT_EQ(formatted, 2);
    const auto records = logRecords();
    ASSERT_EQ(records.size(), 2u);
    EXPECT_EQ(records[0].channel, CVLog::Channel::Log);
    EXPECT_EQ(records[0].message, "first");
    EXPECT_EQ(records[1].channel, CVLog::Channel::Trace);
    EXPECT_EQ(records[1].message, "second");
}

TEST_F(MarkingTest, LinesThatNoChannelWritesAreNotFormatted)
{
    setLevels(6000, 0);
    int formatted = 0;
    const auto format = [&]
    {
        ++formatted;
        return "line";
    };
    QX::logAndTrace("fn", "SEL.cpp", 5, "Corvane.SELProvider", 4000, format);
    EXPECT_EQ(formatted, 0);
    EXPECT_TRUE(logRecords().empty());

    // A failure still reaches the log channel, and only that one.
    QX::logAndTrace("fn", "SEL.cpp", 6, "Corvane.SELProvider", 6000, format);
    EXPECT_EQ(formatted, 1);
    const auto records = logRecords();
    ASSERT_EQ(records.size(), 1u);
    EXPECT_EQ(records[0].channel, CVLog::Channel::Log);
    EXPECT_EQ(records[0].message, "line");
}

TEST(ProviderExceptionTest, WhatReturnsTheText)
{
    const QX::ProviderException error("getAllSELCMPIInstances Failed");
    EXPECT_STREQ(error.what(), "getAllSELCMPIInstances Failed");
    const std::exception& base = error;
    EXPECT_STREQ(base.what(), "getAllSELCMPIInstances Failed");
}

TEST(ProviderExceptionTest, CopyOutlivesTheSource)
{
    std::string text = "Failed while setting Description";
    auto source = std::make_unique<QX::ProviderException>(text.c_str());
    text.assign("overwritten");
    const QX::ProviderException copy(*source);
    source.reset();
    EXPECT_STREQ(copy.what(), "Failed while setting Description");
}

TEST(ProviderExceptionTest, NullTextIsEmpty)
{
    EXPECT_STREQ(QX::ProviderException(nullptr).what(), "");
}

} // namespace
