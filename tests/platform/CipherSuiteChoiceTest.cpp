// The order in which LAN sessions offer cipher suites, and what is kept
// of the one that worked.

#include "ipmi/CipherSuiteChoice.h"

#include <filesystem>
#include <fstream>
#include <string>
#include <unistd.h>

#include <gtest/gtest.h>

namespace
{

using QX::Ipmi::CipherSuiteChoice;
using Suites = std::vector<std::uint8_t>;

class CipherSuiteChoiceTest : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        char name[] = "/tmp/cipher-suite-XXXXXX";
        ASSERT_NE(::mkdtemp(name), nullptr);
        directory = name;
    }
    void TearDown() override
    {
        std::error_code ignored;
        std::filesystem::remove_all(directory, ignored);
    }
    std::string file() const
    {
        return directory + "/cipher-suite-lan-bmc";
    }
    void writeFile(const std::string& text) const
    {
        std::ofstream(file()) << text;
    }

    std::string directory;
};

TEST_F(CipherSuiteChoiceTest, DefaultLeavesTheChoiceToTheParameters)
{
    const CipherSuiteChoice none;
    EXPECT_TRUE(none.candidates().empty());
    EXPECT_FALSE(none.automaticChoice());
}

TEST_F(CipherSuiteChoiceTest, FixedOffersOnlyItsSuiteAndKeepsNothing)
{
    CipherSuiteChoice fixed = CipherSuiteChoice::fixed(1);
    fixed.rememberFor("lan-bmc");
    EXPECT_EQ(fixed.candidates(), (Suites{1}));
    fixed.worked(1);
    EXPECT_FALSE(std::filesystem::exists(file()));
}

TEST_F(CipherSuiteChoiceTest, AutomaticTries17Then3)
{
    CipherSuiteChoice choice = CipherSuiteChoice::automatic(directory);
    choice.rememberFor("lan-bmc");
    EXPECT_EQ(choice.candidates(), (Suites{17, 3}));
}

TEST_F(CipherSuiteChoiceTest, SuiteThatWorkedGoesFirstNextTime)
{
    CipherSuiteChoice first = CipherSuiteChoice::automatic(directory);
    first.rememberFor("lan-bmc");
    first.worked(3);
    EXPECT_EQ(first.candidates(), (Suites{3, 17}));

    CipherSuiteChoice next = CipherSuiteChoice::automatic(directory);
    next.rememberFor("lan-bmc");
    EXPECT_EQ(next.current(), 3u);
    EXPECT_EQ(next.candidates(), (Suites{3, 17}));

    // Another BMC has its own file.
    CipherSuiteChoice other = CipherSuiteChoice::automatic(directory);
    other.rememberFor("lan-other");
    EXPECT_EQ(other.candidates(), (Suites{17, 3}));
}

TEST_F(CipherSuiteChoiceTest, UnusableFileIsIgnored)
{
    for (const char* text : {"", "banana\n", "2\n", "99999999999\n", "-3\n"})
    {
        writeFile(text);
        CipherSuiteChoice choice = CipherSuiteChoice::automatic(directory);
        choice.rememberFor("lan-bmc");
        EXPECT_EQ(choice.candidates(), (Suites{17, 3})) << text;
        EXPECT_FALSE(choice.current().has_value()) << text;
    }
}

TEST_F(CipherSuiteChoiceTest, AttemptsAreCounted)
{
    CipherSuiteChoice choice = CipherSuiteChoice::automatic("");
    choice.rememberFor("lan-bmc");
    EXPECT_EQ(choice.attempts(), 0u);
    choice.tried();
    choice.tried();
    EXPECT_EQ(choice.attempts(), 2u);
    choice.worked(3);
    EXPECT_EQ(choice.current(), 3u);
}

} // namespace
