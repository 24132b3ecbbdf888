#include "Support.h"

#include <unistd.h>

#include <gtest/gtest.h>

using namespace QX;

TEST(Support, SystemNameIsTheHostName)
{
    char expected[256] = {};
    ASSERT_EQ(gethostname(expected, sizeof expected - 1), 0);
    EXPECT_EQ(getSystemName(), expected);
    EXPECT_FALSE(getSystemName().empty());
}

TEST(Support, StripSpacesRemovesSurroundingBlanksOnly)
{
    EXPECT_EQ(stripSpaces("  IPMI SEL Log \t\r\n"), "IPMI SEL Log");
    EXPECT_EQ(stripSpaces("\v\fx\f"), "x");
    EXPECT_EQ(stripSpaces("inner  blanks stay"), "inner  blanks stay");
    EXPECT_EQ(stripSpaces("    "), "");
    EXPECT_EQ(stripSpaces(""), "");
    EXPECT_EQ(stripSpaces(std::string(" ab \0 cd", 8)), "ab");
}

TEST(Support, TextEqualIgnoresAsciiCase)
{
    EXPECT_TRUE(textEqual("ZAN_MgmtHwLog", "zan_mgmthwlog"));
    EXPECT_TRUE(textEqual("", ""));
    EXPECT_FALSE(textEqual("ZAN_MgmtHwLog", "ZAN_MgmtHwLogEntry"));
    EXPECT_FALSE(textEqual("abc", "abd"));
    EXPECT_FALSE(textEqual("a[", "A{")); // only letters fold
    EXPECT_TRUE(textEqual(nullptr, nullptr));
    EXPECT_FALSE(textEqual("x", nullptr));
    EXPECT_FALSE(textEqual(nullptr, "x"));
    EXPECT_FALSE(textEqual("\xc3\xa4", "\xc3\x84")); // no Unicode folding
}
