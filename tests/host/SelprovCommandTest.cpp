// The selprov command's exit codes for bad command lines and libraries that
// cannot be loaded (neither needs a working provider).
#include "ChildProcess.h"

#include <string>
#include <unistd.h>

#include <gtest/gtest.h>

namespace hosttest
{
namespace
{

using testsupport::CommandRun; // output: stdout and stderr together

std::string selprovPath()
{
#ifdef SELPROV_BIN_DIR
    return std::string(SELPROV_BIN_DIR) + "/selprov";
#else
    return "";
#endif
}

CommandRun run(const std::string& args)
{
    return testsupport::runCommand(selprovPath() + " " + args + " 2>&1");
}

class SelprovCommand : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        if (selprovPath().empty() || access(selprovPath().c_str(), X_OK) != 0)
        {
            GTEST_SKIP() << "selprov is not built";
        }
    }
};

TEST_F(SelprovCommand, HelpExitsZero)
{
    const CommandRun r = run("--help");
    EXPECT_EQ(r.exitCode, 0);
    EXPECT_NE(r.output.find("usage: selprov"), std::string::npos);
}

TEST_F(SelprovCommand, UsageErrorsExitTwo)
{
    const char* bad[] = {
        "",
        "bogus",
        "--frobnicate enumerate X",
        "enumerate",
        "enumerate 9Bad",
        "enumerate X extra",
        "enumerate X --properties A,,B",
        "enumerate-names X --properties A",
        "get",
        "get 'root:C.K=unquoted'",
        "invoke 'root:C.K=1'",
        "invoke 'root:C.K=1' 'Bad Method'",
        "clear-log now",
        "--namespace",
        "--library",
        "--library a --library b clear-log",
        "--config /nonexistent/platform.conf clear-log",
        "watch --classes ZAN_MgmtHwLog",
        "watch --classes ZAN_MgmtHwLogEntryEvent,,ZAN_MgmtHwLogFullEvent",
        "watch --count 0",
        "watch --count -1",
        "watch --count 12x",
        "watch --timeout 0",
        "watch --timeout 1e3",
        "watch --timeout -2",
        "watch --raise everything",
        "watch --raise entry --raise clear",
        "watch extra",
        "raise",
        "raise Entry",
        "raise entry,",
    };
    for (const char* args : bad)
    {
        const CommandRun r = run(args);
        EXPECT_EQ(r.exitCode, 2) << args << "\n" << r.output;
        EXPECT_NE(r.output.find("usage: selprov"), std::string::npos) << args;
    }
}

TEST_F(SelprovCommand, LoadFailuresExitThree)
{
    CommandRun r =
        run("--library /nonexistent/libSELProvider.so enumerate-names X");
    EXPECT_EQ(r.exitCode, 3);
    EXPECT_NE(r.output.find("/nonexistent/libSELProvider.so"),
              std::string::npos);
    r = run("--library libm.so.6 clear-log");
    EXPECT_EQ(r.exitCode, 3);
    EXPECT_NE(r.output.find("SELProvider_Create_InstanceMI"),
              std::string::npos);
}

} // namespace
} // namespace hosttest
