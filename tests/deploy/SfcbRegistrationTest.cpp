#include "SfcbRegistration.h"

#include "Mof.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

using ::testing::ElementsAre;

std::string errorOf(const std::string& text)
{
    try
    {
        mof::parseSfcbRegistration(text, "t.reg");
    }
    catch (const mof::MofError& e)
    {
        return e.what();
    }
    return "no error";
}

TEST(SfcbRegistration, BlocksWithTheirKeysInFileOrder)
{
    const auto stanzas = mof::parseSfcbRegistration(R"(# comment

[A_Class]
   provider: P
   type: instance  method
# inside
[B_Class]
 location:   libx
)",
                                                    "t.reg");
    ASSERT_EQ(stanzas.size(), 2u);
    EXPECT_EQ(stanzas[0].className, "A_Class");
    EXPECT_EQ(stanzas[0].line, 3);
    ASSERT_NE(stanzas[0].value("PROVIDER"), nullptr);
    EXPECT_EQ(*stanzas[0].value("provider"), "P");
    EXPECT_THAT(mof::words(*stanzas[0].value("type")),
                ElementsAre("instance", "method"));
    EXPECT_EQ(stanzas[0].value("location"), nullptr);
    EXPECT_EQ(*stanzas[1].value("location"), "libx");
}

TEST(SfcbRegistration, MalformedFilesAreRejectedWithTheLine)
{
    EXPECT_EQ(errorOf("provider: P\n"),
              "t.reg:1: \"provider: P\" before the first [class] block");
    EXPECT_EQ(errorOf("[A]\n\njust words\n"),
              "t.reg:3: expected \"key: value\", found \"just words\"");
    EXPECT_EQ(errorOf("[A]\n[a]\n"), "t.reg:2: class a registered twice");
    EXPECT_EQ(errorOf("[A]\n type: x\n Type: y\n"),
              "t.reg:3: key Type given twice in block A");
    EXPECT_EQ(errorOf("[A\n"), "t.reg:1: bad block header \"[A\"");
    EXPECT_EQ(errorOf("[]\n"), "t.reg:1: bad block header \"[]\"");
    EXPECT_EQ(errorOf("[A]\n: x\n"), "t.reg:2: empty key in \": x\"");
}

} // namespace
