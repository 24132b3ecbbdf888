#include "ipmi/SelCopyFile.h"

#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <sys/stat.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace QX::Ipmi;
using ::testing::HasSubstr;

namespace
{

class SelCopyFileTest : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        directory =
            std::filesystem::temp_directory_path() /
            ("sel-copy-" + std::to_string(::getpid()) + "-" +
             ::testing::UnitTest::GetInstance()->current_test_info()->name());
        std::filesystem::remove_all(directory);
        path = (directory / "state" / "sel-copy-lan-bmc1").string();
    }
    void TearDown() override
    {
        std::filesystem::remove_all(directory);
    }

    static KeptSel sample(std::size_t records)
    {
        KeptSel copy;
        copy.bmcKey = "lan-bmc1";
        copy.info.entries = static_cast<std::uint16_t>(records);
        copy.info.freeSpace = 0x1230;
        copy.info.mostRecentAddition = 0x65e58311;
        copy.info.mostRecentErase = 0xFFFFFFFF;
        copy.info.overflow = true;
        copy.info.reserveSupported = true;
        copy.clearSeen = true;
        for (std::size_t i = 0; i < records; ++i)
        {
            SelRecordBytes record{};
            for (std::size_t b = 0; b < record.size(); ++b)
            {
                record[b] = static_cast<std::uint8_t>(i * 31 + b * 7);
            }
            copy.records.push_back(record);
        }
        return copy;
    }

    std::optional<KeptSel> parse(const std::string& bytes,
                                 const std::string& key = "lan-bmc1")
    {
        problem.clear();
        return parseSelCopy(bytes, key, problem);
    }

    std::filesystem::path directory;
    std::string path;
    std::string problem;
};

} // namespace

TEST_F(SelCopyFileTest, FormatsAndParsesBackEveryField)
{
    for (const std::size_t count : {0u, 1u, 3000u})
    {
        const KeptSel copy = sample(count);
        const std::optional<KeptSel> back = parse(formatSelCopy(copy));
        ASSERT_TRUE(back) << problem;
        EXPECT_EQ(*back, copy);
    }
    KeptSel plain = sample(2);
    plain.info.overflow = false;
    plain.info.reserveSupported = false;
    plain.clearSeen = false;
    EXPECT_EQ(parse(formatSelCopy(plain)), plain);
}

TEST_F(SelCopyFileTest, TextsAreKeptWithTheirKey)
{
    KeptSel copy = sample(3);
    copy.textsKey = "names 1";
    copy.texts = {"first", "", std::string(maxKeptText, 'x')};
    std::optional<KeptSel> back = parse(formatSelCopy(copy));
    ASSERT_TRUE(back) << problem;
    EXPECT_EQ(*back, copy);

    // A text too long, or texts that do not match the records: none kept.
    copy.texts[1] = std::string(maxKeptText + 1, 'y');
    back = parse(formatSelCopy(copy));
    ASSERT_TRUE(back) << problem;
    EXPECT_TRUE(back->texts.empty());
    EXPECT_TRUE(back->textsKey.empty());
    EXPECT_EQ(back->records, copy.records);
    copy.texts.pop_back();
    back = parse(formatSelCopy(copy));
    ASSERT_TRUE(back) << problem;
    EXPECT_TRUE(back->texts.empty());
}

TEST_F(SelCopyFileTest, SizeIsBoundedBySixteenBytesPerRecord)
{
    const std::string bytes = formatSelCopy(sample(100));
    EXPECT_LT(bytes.size(), 100 * 16 + 64 + std::string("lan-bmc1").size());
    KeptSel tooMany = sample(0);
    tooMany.records.resize(maxKeptRecords + 1);
    EXPECT_THROW(formatSelCopy(tooMany), std::invalid_argument);
    KeptSel largest = sample(0);
    largest.records.resize(maxKeptRecords);
    EXPECT_TRUE(parse(formatSelCopy(largest))) << problem;
}

TEST_F(SelCopyFileTest, EveryTruncationIsRefused)
{
    KeptSel copy = sample(4);
    copy.textsKey = "k";
    copy.texts = {"a", "bb", "ccc", ""};
    const std::string bytes = formatSelCopy(copy);
    for (std::size_t length = 0; length < bytes.size(); ++length)
    {
        EXPECT_FALSE(parse(bytes.substr(0, length))) << "length " << length;
        EXPECT_FALSE(problem.empty());
    }
    EXPECT_FALSE(parse(bytes + '\0'));
}

TEST_F(SelCopyFileTest, EveryFlippedBitIsRefused)
{
    KeptSel copy = sample(3);
    copy.textsKey = "k";
    copy.texts = {"a", "bb", "ccc"};
    const std::string bytes = formatSelCopy(copy);
    for (std::size_t at = 0; at < bytes.size(); ++at)
    {
        for (int bit = 0; bit < 8; ++bit)
        {
            std::string damaged = bytes;
            damaged[at] = static_cast<char>(damaged[at] ^ (1 << bit));
            EXPECT_FALSE(parse(damaged)) << "byte " << at << " bit " << bit;
        }
    }
}

TEST_F(SelCopyFileTest, AnotherVersionIsRefused)
{
    std::string bytes = formatSelCopy(sample(2));
    bytes[8] = static_cast<char>(selCopyVersion + 1);
    EXPECT_FALSE(parse(bytes));
    EXPECT_THAT(problem, HasSubstr("version"));
}

TEST_F(SelCopyFileTest, AnotherBmcsCopyIsRefused)
{
    EXPECT_FALSE(parse(formatSelCopy(sample(2)), "lan-bmc2"));
    EXPECT_THAT(problem, HasSubstr("another BMC"));
    EXPECT_FALSE(parse(formatSelCopy(sample(2)), "inband"));
}

TEST_F(SelCopyFileTest, ForeignBytesAreRefused)
{
    EXPECT_FALSE(parse("qx-sel-alerts 1\nend\n"));
    EXPECT_THAT(problem, HasSubstr("not a SEL copy"));
    EXPECT_FALSE(parse(std::string(4096, '\xff')));
    EXPECT_FALSE(parse(""));
}

TEST_F(SelCopyFileTest, WrittenFileIsReadBackAndOwnerOnly)
{
    const KeptSel copy = sample(50);
    writeSelCopy(path, copy);
    EXPECT_EQ(readSelCopy(path, "lan-bmc1", problem), copy) << problem;
    struct stat info
    {
    };
    ASSERT_EQ(::stat(path.c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0600u);
    // Replaced whole, no temporary file left beside it.
    writeSelCopy(path, sample(7));
    EXPECT_EQ(readSelCopy(path, "lan-bmc1", problem), sample(7));
    std::size_t files = 0;
    for ([[maybe_unused]] const auto& entry :
         std::filesystem::directory_iterator(directory / "state"))
    {
        ++files;
    }
    EXPECT_EQ(files, 1u);
}

TEST_F(SelCopyFileTest, MissingOrOverlongFileIsNoCopy)
{
    EXPECT_FALSE(readSelCopy(path, "lan-bmc1", problem));
    EXPECT_FALSE(problem.empty());
    std::filesystem::create_directories(directory / "state");
    {
        std::ofstream file(path, std::ios::binary);
        file << formatSelCopy(sample(1));
    }
    // Longer than the largest copy with the longest texts (sparse).
    std::filesystem::resize_file(path, std::uintmax_t{80} << 20);
    EXPECT_FALSE(readSelCopy(path, "lan-bmc1", problem));
    EXPECT_THAT(problem, HasSubstr("too long"));
}

TEST_F(SelCopyFileTest, WriteIntoAnUnwritablePlaceThrows)
{
    std::filesystem::create_directories(directory);
    const std::string blocker = (directory / "file").string();
    std::ofstream(blocker) << "x";
    EXPECT_THROW(writeSelCopy(blocker + "/sel-copy", sample(1)),
                 std::runtime_error);
}
