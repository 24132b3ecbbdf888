// selprovider-register run as a user runs it, against stand-ins for the
// SFCB and OpenPegasus tools that record their calls and keep the state
// the real tools would change (staged files, registered modules).
#include "ChildProcess.h"

#include <array>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <unistd.h>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

namespace fs = std::filesystem;
using ::testing::HasSubstr;

struct ScriptRun
{
    int exitCode = -1;
    std::string out;
    std::string err;
};

std::string readFile(const fs::path& path)
{
    std::ifstream in(path);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

void writeExecutable(const fs::path& path, const std::string& text)
{
    std::ofstream(path) << text;
    fs::permissions(path, fs::perms::owner_all);
}

// The utilities the script and the stand-ins use; nothing else is on PATH.
constexpr std::array<const char*, 9> utilities = {
    "dirname", "readlink", "cmp", "grep", "sed", "cat", "mkdir", "cp", "rm"};

// What the two SFCB staging stand-ins share after logging their call: -n
// namespace and -r registration file, then the MOF files; their stage.
const std::string sfcbStagingOptions = R"(ns=root/cimv2 reg=
while getopts n:r: o; do
    case $o in n) ns=$OPTARG ;; r) reg=$OPTARG ;; esac
done
shift $((OPTIND - 1))
stage=$(dirname "$0")/../var/lib/sfcb/stage
)";

const std::string sfcbstage = R"(#!/bin/bash
echo "sfcbstage $*" >> "$STUB_LOG"
)" + sfcbStagingOptions + R"(mkdir -p "$stage/regs" "$stage/mofs/$ns"
[[ -z $reg ]] || cp "$reg" "$stage/regs/"
for mof in "$@"; do cp "$mof" "$stage/mofs/$ns/"; done
)";

const std::string sfcbunstage = R"(#!/bin/bash
echo "sfcbunstage $*" >> "$STUB_LOG"
)" + sfcbStagingOptions + R"([[ -z $reg ]] || rm -f "$stage/regs/$reg"
for mof in "$@"; do rm -f "$stage/mofs/$ns/$mof"; done
)";

const char* const sfcbrepos = R"(#!/bin/bash
echo "sfcbrepos $*" >> "$STUB_LOG"
[[ -z ${STUB_FAIL:-} ]] || exit 1
)";

const char* const cimprovider = R"(#!/bin/bash
echo "cimprovider $*" >> "$STUB_LOG"
modules=$(dirname "$0")/../modules
if [[ -n ${STUB_SERVER_DOWN:-} ]]; then
    echo "cimprovider: Cannot connect to CIM Server: CIM Server may not be running."
    exit 1
fi
case $1 in
    -l) echo "MODULE"; cat "$modules" 2>/dev/null; exit 0 ;;
    -r) grep -vx "$3" "$modules" > "$modules.new"; cp "$modules.new" "$modules"; exit 0 ;;
esac
exit 1
)";

const char* const cimmof = R"(#!/bin/bash
echo "cimmof $*" >> "$STUB_LOG"
modules=$(dirname "$0")/../modules
for arg in "$@"; do
    [[ $arg != root/PG_InterOp ]] || echo SELProviderModule >> "$modules"
done
)";

class RegisterScript : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        root_ = fs::temp_directory_path() /
                ("selprovider-register-test-" + std::to_string(::getpid()));
        fs::remove_all(root_);
        fs::create_directories(root_ / "bin");
        fs::create_directories(root_ / "data");
        for (const char* name : utilities)
        {
            for (const char* dir : {"/usr/bin", "/bin"})
            {
                const fs::path tool = fs::path(dir) / name;
                if (fs::exists(tool))
                {
                    fs::create_symlink(tool, root_ / "bin" / name);
                    break;
                }
            }
        }
        for (const char* file : {"SELProvider.mof", "SELProvider.reg",
                                 "SELProviderRegistration.mof"})
        {
            std::ofstream(root_ / "data" / file) << file << " content\n";
        }
        std::ofstream(root_ / "CIM_Schema.mof") << "// schema\n";
    }

    void TearDown() override
    {
        fs::remove_all(root_);
    }

    void installSfcb()
    {
        writeExecutable(root_ / "bin" / "sfcbstage", sfcbstage);
        writeExecutable(root_ / "bin" / "sfcbunstage", sfcbunstage);
        writeExecutable(root_ / "bin" / "sfcbrepos", sfcbrepos);
        fs::create_directories(stageDir());
    }

    void installPegasus()
    {
        writeExecutable(root_ / "bin" / "cimprovider", cimprovider);
        writeExecutable(root_ / "bin" / "cimmof", cimmof);
    }

    fs::path stageDir() const
    {
        return root_ / "var/lib/sfcb/stage";
    }

    std::string data() const
    {
        return (root_ / "data").string();
    }

    std::string schema() const
    {
        return (root_ / "CIM_Schema.mof").string();
    }

    // The calls the stand-ins recorded since the last look.
    std::string calls()
    {
        const fs::path log = root_ / "calls.log";
        std::string text = readFile(log);
        fs::remove(log);
        return text;
    }

    /** The commands that stage the provider with SFCB. */
    std::string sfcbStaging() const
    {
        return "sfcbstage -n root/zanqx -r " + data() + "/SELProvider.reg " +
               data() + "/SELProvider.mof\nsfcbrepos -f\n";
    }
    /** The command that loads the DMTF schema into OpenPegasus. */
    std::string schemaLoading() const
    {
        return "cimmof -uc -n root/zanqx -I " + root_.string() + " " +
               schema() + "\n";
    }
    /** The commands that load the provider's classes and registration into
     *  OpenPegasus. */
    std::string pegasusLoading() const
    {
        return "cimmof -uc -n root/zanqx " + data() +
               "/SELProvider.mof\ncimmof -n root/PG_InterOp " + data() +
               "/SELProviderRegistration.mof\n";
    }

    /** Runs the script with @p arguments, expecting it to succeed. */
    ScriptRun runOk(const std::string& arguments)
    {
        ScriptRun result = run(arguments);
        EXPECT_EQ(result.exitCode, 0) << arguments << ": " << result.err;
        return result;
    }

    ScriptRun run(const std::string& arguments,
                  const std::string& environment = "")
    {
        const std::string command =
            "env -i PATH=" + (root_ / "bin").string() +
            " STUB_LOG=" + (root_ / "calls.log").string() + " " + environment +
            " /bin/bash " + SELPROV_SOURCE_DIR +
            "/tools/selprovider-register --data-dir " + data() + " " +
            arguments + " 2>" + (root_ / "stderr").string();
        const testsupport::CommandRun shell =
            testsupport::runCommand("timeout 60 " + command);
        ScriptRun result;
        if (!shell.started)
        {
            return result;
        }
        result.exitCode = shell.exitCode;
        result.out = shell.output;
        result.err = readFile(root_ / "stderr");
        return result;
    }

    fs::path root_;
};

TEST_F(RegisterScript, RefusesWhenNoObjectManagerIsInstalled)
{
    const ScriptRun r = run("");
    EXPECT_EQ(r.exitCode, 3);
    EXPECT_THAT(r.err, HasSubstr("no CIM object manager found: SFCB needs "
                                 "sfcbstage sfcbunstage sfcbrepos and "
                                 "OpenPegasus needs cimmof cimprovider on "
                                 "PATH"));
    EXPECT_EQ(calls(), "");
}

TEST_F(RegisterScript, RefusesTheChosenObjectManagerWhenItsToolsAreMissing)
{
    installPegasus();
    ScriptRun r = run("--sfcb --dry-run");
    EXPECT_EQ(r.exitCode, 3);
    EXPECT_THAT(r.err, HasSubstr("SFCB tools not found on PATH: sfcbstage "
                                 "sfcbunstage sfcbrepos"));
    fs::remove(root_ / "bin" / "cimprovider");
    r = run("--pegasus");
    EXPECT_EQ(r.exitCode, 3);
    EXPECT_THAT(r.err,
                HasSubstr("OpenPegasus tools not found on PATH: cimprovider"));
    EXPECT_EQ(calls(), "");
}

TEST_F(RegisterScript, AsksForAChoiceWhenBothAreInstalled)
{
    installSfcb();
    installPegasus();
    const ScriptRun r = run("");
    EXPECT_EQ(r.exitCode, 3);
    EXPECT_THAT(r.err, HasSubstr("choose one with --sfcb or --pegasus"));
    EXPECT_EQ(calls(), "");
    EXPECT_EQ(run("--sfcb --dry-run").exitCode, 0);
}

TEST_F(RegisterScript, RefusesWithoutTheProviderFiles)
{
    installSfcb();
    fs::remove(root_ / "data" / "SELProvider.reg");
    const ScriptRun r = run("--dry-run");
    EXPECT_EQ(r.exitCode, 3);
    EXPECT_THAT(r.err, HasSubstr("provider file " + data() +
                                 "/SELProvider.reg not found"));
}

TEST_F(RegisterScript, RejectsBadUsage)
{
    installSfcb();
    EXPECT_EQ(run("--frobnicate").exitCode, 2);
    EXPECT_EQ(run("--sfcb --pegasus").exitCode, 2);
    EXPECT_EQ(run("--schema").exitCode, 2);
    const ScriptRun help = run("--help");
    EXPECT_EQ(help.exitCode, 0);
    EXPECT_THAT(help.out, HasSubstr("usage: selprovider-register"));
    EXPECT_EQ(calls(), "");
}

TEST_F(RegisterScript, SfcbDryRunPrintsTheCommandsAndRunsNone)
{
    installSfcb();
    const ScriptRun r = runOk("--dry-run");
    EXPECT_EQ(r.out, sfcbStaging());
    EXPECT_EQ(calls(), "");
    EXPECT_FALSE(fs::exists(stageDir() / "regs"));
}

TEST_F(RegisterScript, SfcbRegistersOnceAndUnregistersOnce)
{
    installSfcb();
    ScriptRun r = runOk("");
    EXPECT_EQ(calls(), sfcbStaging());
    EXPECT_THAT(r.out, HasSubstr("Restart SFCB"));

    r = runOk("");
    EXPECT_THAT(r.out, HasSubstr("Already registered with SFCB"));
    EXPECT_EQ(calls(), "");

    // A newer registration file is staged again.
    std::ofstream(root_ / "data" / "SELProvider.reg") << "changed\n";
    EXPECT_EQ(run("").exitCode, 0);
    EXPECT_THAT(calls(), HasSubstr("sfcbstage"));

    r = run("--unregister --dry-run");
    EXPECT_EQ(r.out, "sfcbunstage -n root/zanqx -r SELProvider.reg "
                     "SELProvider.mof\nsfcbrepos -f\n");
    EXPECT_EQ(calls(), "");

    r = runOk("--unregister");
    EXPECT_EQ(calls(), "sfcbunstage -n root/zanqx -r SELProvider.reg "
                       "SELProvider.mof\nsfcbrepos -f\n");
    r = runOk("--unregister");
    EXPECT_THAT(r.out, HasSubstr("Not registered with SFCB"));
    EXPECT_EQ(calls(), "");
}

TEST_F(RegisterScript, SfcbNeedsItsStagingDirectory)
{
    installSfcb();
    fs::remove_all(root_ / "var");
    ScriptRun r = run("");
    EXPECT_EQ(r.exitCode, 3);
    EXPECT_THAT(r.err, HasSubstr("SFCB staging directory " +
                                 stageDir().string() + " not found"));
    fs::create_directories(root_ / "elsewhere");
    r = runOk("--dry-run --sfcb-stage-dir " + (root_ / "elsewhere").string());
}

TEST_F(RegisterScript, AFailingToolFailsTheRun)
{
    installSfcb();
    const ScriptRun r = run("", "STUB_FAIL=1");
    EXPECT_EQ(r.exitCode, 1);
    EXPECT_THAT(r.err, HasSubstr("failed: sfcbrepos -f"));
}

TEST_F(RegisterScript, PegasusDryRunQueriesButChangesNothing)
{
    installPegasus();
    const ScriptRun r = runOk("--dry-run --schema " + schema());
    EXPECT_EQ(r.out, schemaLoading() + pegasusLoading());
    EXPECT_EQ(calls(), "cimprovider -l\n");
}

TEST_F(RegisterScript, PegasusWithoutSchemaLoadsOnlyTheProviderClasses)
{
    installPegasus();
    const ScriptRun r = runOk("--dry-run");
    EXPECT_EQ(r.out, pegasusLoading());
    EXPECT_THAT(r.err, HasSubstr("the DMTF CIM schema must already be in "
                                 "root/zanqx"));
}

TEST_F(RegisterScript, PegasusRegistersOnceAndUnregistersOnce)
{
    installPegasus();
    ScriptRun r = runOk("--schema " + schema());
    EXPECT_EQ(calls(), "cimprovider -l\n" + schemaLoading() + pegasusLoading());
    EXPECT_THAT(r.out, HasSubstr("providerDir"));

    r = runOk("");
    EXPECT_THAT(r.out, HasSubstr("Already registered with OpenPegasus"));
    EXPECT_THAT(r.out, HasSubstr("cimprovider -d -m SELProviderModule"));
    EXPECT_EQ(calls(), "cimprovider -l\n");

    r = runOk("--unregister");
    EXPECT_EQ(calls(), "cimprovider -l\ncimprovider -r -m SELProviderModule\n");
    r = runOk("--unregister");
    EXPECT_THAT(r.out, HasSubstr("Not registered with OpenPegasus"));
    EXPECT_EQ(calls(), "cimprovider -l\n");
}

TEST_F(RegisterScript, PegasusServerDownIsAFailureNotAnEmptyRegistry)
{
    installPegasus();
    const ScriptRun r = run("", "STUB_SERVER_DOWN=1");
    EXPECT_EQ(r.exitCode, 1);
    EXPECT_THAT(r.err, HasSubstr("is cimserver running?"));
    EXPECT_EQ(calls(), "cimprovider -l\n");
}

TEST_F(RegisterScript, MissingSchemaFileIsRefused)
{
    installPegasus();
    const ScriptRun r = run("--schema " + (root_ / "nope.mof").string());
    EXPECT_EQ(r.exitCode, 3);
    EXPECT_THAT(r.err, HasSubstr("schema file"));
    EXPECT_EQ(calls(), "");
}

} // namespace
