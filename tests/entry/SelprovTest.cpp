// selprov, the main job's command, run as a user runs it: a separate
// process on the shipped sample SEL or on a fixture named by --config.
#include "ChildProcess.h"

#include <filesystem>
#include <fstream>
#include <string>
#include <unistd.h>

#include <gtest/gtest.h>

namespace
{

using CommandResult = testsupport::CommandRun;

/** Runs a shell command line with a bounded run time; captures standard
 *  output (and standard error when @p withErrors). */
CommandResult run(const std::string& commandLine, bool withErrors = false)
{
    return testsupport::runCommand("timeout 240 " + commandLine +
                                   (withErrors ? " 2>&1" : " 2>/dev/null"));
}

class Selprov : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        directory_ = std::filesystem::temp_directory_path() /
                     ("selprov-test-" + std::to_string(::getpid()));
        std::filesystem::create_directories(directory_);
        // The built-in sample, whatever /etc/qx/platform.conf says.
        writeConfig("sample.conf", "source = memory\nlog.sink = none\n");
    }
    void TearDown() override
    {
        std::filesystem::remove_all(directory_);
    }

    std::string writeConfig(const std::string& name, const std::string& text)
    {
        const auto path = directory_ / name;
        std::ofstream(path) << text;
        return path.string();
    }

    std::string selprov(const std::string& config = "sample.conf") const
    {
        return std::string(SELPROV_BIN_DIR) + "/selprov --config " +
               (directory_ / config).string() + " ";
    }

    std::filesystem::path directory_;
};

std::size_t countLines(const std::string& text)
{
    std::size_t lines = 0;
    for (const char c : text)
    {
        lines += c == '\n';
    }
    return lines;
}

TEST_F(Selprov, SampleLogIsServed)
{
    const CommandResult names =
        run(selprov() + "enumerate-names ZAN_MgmtHwLog");
    EXPECT_EQ(names.exitCode, 0);
    EXPECT_NE(names.output.find("root/zanqx:ZAN_MgmtHwLog.CreationClassName="
                                "\"ZAN_MgmtHwLog\",Name=\"IPMI SEL Log\""),
              std::string::npos)
        << names.output;
    const CommandResult log = run(selprov() + "enumerate ZAN_MgmtHwLog");
    EXPECT_EQ(log.exitCode, 0);
    EXPECT_NE(log.output.find("instance of ZAN_MgmtHwLog"), std::string::npos);
    EXPECT_NE(log.output.find("OperationalStatus = {2, 11};"),
              std::string::npos)
        << log.output;
}

TEST_F(Selprov, WithoutASourceNoSampleAndOneLineSayingWhatIsMissing)
{
    if (std::filesystem::exists("/dev/ipmi0"))
    {
        GTEST_SKIP() << "this machine has an in-band IPMI device";
    }
    // A configuration that names no source: the platform's defaults.
    writeConfig("defaults.conf", "log.sink = none\n");
    const std::string errors = (directory_ / "errors.txt").string();
    // Standard error into a file of its own, standard output captured.
    const CommandResult entries =
        run("sh -c '" + selprov("defaults.conf") +
            "enumerate ZAN_MgmtHwLogEntry 2>" + errors + "'");
    EXPECT_EQ(entries.exitCode, 0);
    EXPECT_EQ(entries.output, "");
    std::ifstream in(errors);
    std::string line;
    ASSERT_TRUE(std::getline(in, line));
    EXPECT_NE(line.find("no in-band BMC on this machine"), std::string::npos)
        << line;
    EXPECT_NE(line.find("modprobe ipmi_si ipmi_devintf"), std::string::npos)
        << line;
    EXPECT_EQ(line.find("CPU1 Temp"), std::string::npos);
    std::string more;
    EXPECT_FALSE(std::getline(in, more)) << more;
}

TEST_F(Selprov, EntriesCanBeListedAndFetchedByPath)
{
    const CommandResult names =
        run(selprov() + "enumerate-names ZAN_MgmtHwLogEntry");
    ASSERT_EQ(names.exitCode, 0);
    EXPECT_GE(countLines(names.output), 20u);
    const std::string first = names.output.substr(0, names.output.find('\n'));
    const CommandResult one = run(selprov() + "get '" + first + "'");
    EXPECT_EQ(one.exitCode, 0);
    EXPECT_NE(one.output.find("RecordID = \"1\";"), std::string::npos)
        << one.output;
    EXPECT_EQ(one.output.find("instance of"), one.output.rfind("instance of"))
        << "exactly one instance";
}

TEST_F(Selprov, ClearLogInOneProcessEmptiesTheLog)
{
    const CommandResult batch = run("printf 'clear-log\\nenumerate-names "
                                    "ZAN_MgmtHwLogEntry\\n' | " +
                                    selprov() + "batch");
    EXPECT_EQ(batch.exitCode, 0);
    EXPECT_EQ(batch.output, "ReturnValue = 0\n");
}

TEST_F(Selprov, JsonOutputIsStructured)
{
    const CommandResult json =
        run(selprov() + "--json enumerate ZAN_MgmtHwLogEntry --properties "
                        "RecordID,Node");
    EXPECT_EQ(json.exitCode, 0);
    ASSERT_FALSE(json.output.empty());
    EXPECT_EQ(json.output.front(), '[');
    EXPECT_NE(json.output.find("\"RecordID\": \"1\""), std::string::npos)
        << json.output.substr(0, 400);
    EXPECT_NE(json.output.find("\"Node\": 1"), std::string::npos);
}

TEST_F(Selprov, TimingWritesEachRequestsTimeToStandardError)
{
    const CommandResult batch =
        run("printf 'enumerate-names ZAN_MgmtHwLog\\nenumerate-names "
            "ZAN_MgmtHwLog\\n' | { " +
                selprov() + "--timing batch >/dev/null; }",
            true);
    EXPECT_EQ(batch.exitCode, 0);
    std::size_t lines = 0;
    for (std::size_t at = batch.output.find("selprov: request took ");
         at != std::string::npos;
         at = batch.output.find("selprov: request took ", at + 1))
    {
        ++lines;
    }
    EXPECT_EQ(lines, 2u) << batch.output;
    EXPECT_NE(batch.output.find(" ms\n"), std::string::npos);
}

TEST_F(Selprov, FailedRequestPrintsTheCmpiStatus)
{
    const CommandResult failed =
        run(selprov() + "get 'root/zanqx:ZAN_MgmtHwLog'", true);
    EXPECT_EQ(failed.exitCode, 1);
    EXPECT_NE(failed.output.find("At least one key should be passed"),
              std::string::npos)
        << failed.output;
}

TEST_F(Selprov, LargeGeneratedLogIsServedWhole)
{
    const std::string fixture = (directory_ / "big.fixture").string();
    ASSERT_EQ(
        run(std::string(SELPROV_BIN_DIR) + "/selfixture 65535 > " + fixture)
            .exitCode,
        0);
    writeConfig("big.conf", "source = memory\nmemory.fixture = " + fixture +
                                "\nlog.sink = none\n");
    const CommandResult names =
        run(selprov("big.conf") + "enumerate-names ZAN_MgmtHwLogEntry");
    EXPECT_EQ(names.exitCode, 0);
    EXPECT_EQ(countLines(names.output), 65535u);
}

TEST_F(Selprov, WatchPrintsTheIndicationOfEachRaisedAlert)
{
    const std::pair<const char*, const char*> cases[] = {
        {"entry", "instance of ZAN_MgmtHwLogEntryEvent"},
        {"clear", "instance of ZAN_MgmtHwLogClearEvent"},
        {"warning", "EventID = \"IPMI Log Full Warning Event : "},
        {"full", "EventID = \"IPMI Log Full Critical Event : "},
        {"restart", "instance of ZANx_AutomaticServerRestartEvent"}};
    for (const auto& [kind, expected] : cases)
    {
        const CommandResult watched = run(selprov() + "watch --raise " + kind +
                                          " --count 1 --timeout 20");
        EXPECT_EQ(watched.exitCode, 0) << kind;
        EXPECT_NE(watched.output.find(expected), std::string::npos)
            << kind << "\n"
            << watched.output;
        EXPECT_EQ(countLines(watched.output) > 10, true) << watched.output;
    }
}

TEST_F(Selprov, WatchRaisesSeveralAlertsOneAfterTheOther)
{
    const CommandResult watched =
        run(selprov() + "watch --raise entry,clear,warning,full,restart "
                        "--count 5 --timeout 30");
    EXPECT_EQ(watched.exitCode, 0);
    std::size_t at = 0;
    for (const char* expected :
         {"instance of ZAN_MgmtHwLogEntryEvent",
          "instance of ZAN_MgmtHwLogClearEvent", "IPMI Log Full Warning Event",
          "IPMI Log Full Critical Event",
          "instance of ZANx_AutomaticServerRestartEvent"})
    {
        at = watched.output.find(expected, at);
        EXPECT_NE(at, std::string::npos) << expected << "\n" << watched.output;
    }
}

TEST_F(Selprov, WatchOnlyTheNamedClassesAsJson)
{
    const CommandResult watched =
        run(selprov() + "watch --classes ZAN_MgmtHwLogClearEvent --raise "
                        "entry,restart,clear --count 1 --timeout 20 --json");
    EXPECT_EQ(watched.exitCode, 0);
    EXPECT_EQ(countLines(watched.output), 1u) << watched.output;
    EXPECT_EQ(watched.output.rfind("{\"path\": ", 0), 0u) << watched.output;
    EXPECT_NE(watched.output.find("\"IndicationIdentifier\": \"IMPI SEL "
                                  "Log\""),
              std::string::npos)
        << watched.output;
}

TEST_F(Selprov, WatchWithoutEnoughIndicationsTimesOut)
{
    const CommandResult watched =
        run(selprov() + "watch --raise entry --count 2 --timeout 1", true);
    EXPECT_EQ(watched.exitCode, 1);
    EXPECT_NE(watched.output.find("timed out with 1 of 2 indications"),
              std::string::npos)
        << watched.output;
}

TEST_F(Selprov, RaiseInABatchChangesWhatLaterCommandsSee)
{
    const CommandResult batch =
        run("printf 'raise entry,entry\\nenumerate-names "
            "ZAN_MgmtHwLogEntry\\n' | " +
            selprov() + "batch");
    EXPECT_EQ(batch.exitCode, 0);
    EXPECT_EQ(countLines(batch.output), 26u) << batch.output;
    EXPECT_NE(batch.output.find("RecordID=\"26\""), std::string::npos);
}

TEST_F(Selprov, BrokenFixtureIsReportedNotCrashed)
{
    const std::string fixture = (directory_ / "broken.fixture").string();
    std::ofstream(fixture) << "controller path=/bmc0 status=x\n";
    writeConfig("broken.conf", "source = memory\nmemory.fixture = " + fixture +
                                   "\nlog.sink = none\n");
    const CommandResult result =
        run(selprov("broken.conf") + "enumerate ZAN_MgmtHwLogEntry", true);
    EXPECT_EQ(result.exitCode, 0) << "an empty answer, as for a dead BMC";
    EXPECT_NE(result.output.find("broken.fixture:1:"), std::string::npos)
        << result.output;
}

} // namespace
