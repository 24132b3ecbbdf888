#include "ipmi/AlertState.h"

#include <filesystem>
#include <fstream>
#include <sstream>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace QX::Ipmi;
using ::testing::HasSubstr;

namespace
{

class AlertStateTest : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        directory =
            std::filesystem::temp_directory_path() /
            ("alert-state-" + std::to_string(::getpid()) + "-" +
             ::testing::UnitTest::GetInstance()->current_test_info()->name());
        std::filesystem::remove_all(directory);
        path = (directory / "sel-alerts").string();
    }
    void TearDown() override
    {
        std::filesystem::remove_all(directory);
    }

    void writeText(const std::string& text) const
    {
        std::filesystem::create_directories(directory);
        std::ofstream(path, std::ios::binary) << text;
    }

    static AnnouncedState sample()
    {
        AnnouncedState state;
        state.lastRecord =
            SelRecordBytes{0x05, 0x00, 0x02, 0x1a, 0x83, 0xe5, 0x65, 0x20,
                           0x00, 0x04, 0x23, 0x00, 0x6f, 0xc1, 0x04, 0xff};
        state.lastAddition = 0x65e5831a;
        state.lastErase = 4294967295u;
        state.logStatus = 21;
        state.restartKey = "0500021a83e5652000042300";
        return state;
    }

    std::filesystem::path directory;
    std::string path;
};

TEST_F(AlertStateTest, WrittenStateReadsBackTheSame)
{
    writeAlertState(path, sample());
    std::string problem;
    const auto read = readAlertState(path, problem);
    ASSERT_TRUE(read.has_value()) << problem;
    EXPECT_EQ(*read, sample());
}

TEST_F(AlertStateTest, EmptySelAndNoRestartReadBack)
{
    AnnouncedState state;
    state.logStatus = 1;
    writeAlertState(path, state);
    std::string problem;
    const auto read = readAlertState(path, problem);
    ASSERT_TRUE(read.has_value()) << problem;
    EXPECT_FALSE(read->lastRecord.has_value());
    EXPECT_TRUE(read->restartKey.empty());
    EXPECT_EQ(*read, state);
}

TEST_F(AlertStateTest, WritingReplacesTheFileAndLeavesNoTemporary)
{
    writeAlertState(path, AnnouncedState{});
    writeAlertState(path, sample());
    std::size_t files = 0;
    for (const auto& entry : std::filesystem::directory_iterator(directory))
    {
        ++files;
        EXPECT_EQ(entry.path().filename(), "sel-alerts");
    }
    EXPECT_EQ(files, 1u);
    EXPECT_EQ(std::filesystem::status(path).permissions() &
                  std::filesystem::perms::all,
              std::filesystem::perms::owner_read |
                  std::filesystem::perms::owner_write);
}

TEST_F(AlertStateTest, MissingFileGivesNothing)
{
    std::string problem;
    EXPECT_FALSE(readAlertState(path, problem).has_value());
    EXPECT_THAT(problem, HasSubstr("No such file"));
}

TEST_F(AlertStateTest, OtherVersionGivesNothing)
{
    std::string text = formatAlertState(sample());
    text.replace(0, std::string(alertStateHeader).size(), "qx-sel-alerts 2");
    writeText(text);
    std::string problem;
    EXPECT_FALSE(readAlertState(path, problem).has_value());
    EXPECT_THAT(problem, HasSubstr("version"));
}

TEST_F(AlertStateTest, TruncatedFileGivesNothing)
{
    const std::string text = formatAlertState(sample());
    // Every proper prefix, as a crash in the middle of a write would leave
    // without the rename.
    for (std::size_t length = 0; length + 1 < text.size(); ++length)
    {
        std::string problem;
        EXPECT_FALSE(parseAlertState(text.substr(0, length), problem))
            << "prefix of " << length << " bytes";
        EXPECT_FALSE(problem.empty());
    }
}

TEST_F(AlertStateTest, CorruptLinesGiveNothing)
{
    const std::string good = formatAlertState(sample());
    const std::vector<std::pair<std::string, std::string>> damages{
        {"last-record 0500", "last-record 05zz"},
        {"last-addition 1709540122", "last-addition -3"},
        {"last-addition 1709540122", "last-addition 99999999999"},
        {"log-status 21", "log-status"},
        {"log-status 21", "log-status twenty"},
        {"restart 0500", "restart \x01"},
        {"last-erase", "last-eraser"},
    };
    for (const auto& [from, to] : damages)
    {
        std::string text = good;
        const std::size_t at = text.find(from);
        ASSERT_NE(at, std::string::npos) << from;
        text.replace(at, from.size(), to);
        std::string problem;
        EXPECT_FALSE(parseAlertState(text, problem).has_value()) << to;
    }
    std::string doubled = good;
    doubled.insert(doubled.find("end\n"), "log-status 24\n");
    std::string problem;
    EXPECT_FALSE(parseAlertState(doubled, problem).has_value());
    EXPECT_THAT(problem, HasSubstr("twice"));
}

TEST_F(AlertStateTest, BinaryGarbageGivesNothing)
{
    std::string garbage(3000, '\0');
    for (std::size_t i = 0; i < garbage.size(); ++i)
    {
        garbage[i] = static_cast<char>(i * 37 % 256);
    }
    writeText(garbage);
    std::string problem;
    EXPECT_FALSE(readAlertState(path, problem).has_value());
    writeText(std::string(alertStateHeader) + "\n" + std::string(10000, 'x') +
              "\n");
    EXPECT_FALSE(readAlertState(path, problem).has_value());
    EXPECT_THAT(problem, HasSubstr("too long"));
}

TEST_F(AlertStateTest, UnwritableDirectoryThrows)
{
    writeText("");
    // A path below a regular file cannot be created.
    EXPECT_THROW(writeAlertState(path + "/below", sample()),
                 std::runtime_error);
}

} // namespace
