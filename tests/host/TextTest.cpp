// The broker's inline text: short texts inside the object, long ones on
// the heap, and both read, copied and moved alike.
#include "Text.h"

#include <sstream>
#include <string>
#include <utility>

#include <gtest/gtest.h>

namespace
{

using host::Text;

// Inside the object, the characters lie within its own bytes.
bool storedInline(const Text& text)
{
    const auto* begin = reinterpret_cast<const char*>(&text);
    return text.data() >= begin && text.data() < begin + sizeof(Text);
}

TEST(Text, KeepsUpToThirtyCharactersInsideItself)
{
    const std::string longest(Text::inlineCapacity, 'a');
    const Text fits(longest);
    EXPECT_TRUE(storedInline(fits));
    EXPECT_EQ(fits, longest);
    EXPECT_EQ(fits.size(), Text::inlineCapacity);

    const std::string over(Text::inlineCapacity + 1, 'b');
    const Text spills(over);
    EXPECT_FALSE(storedInline(spills));
    EXPECT_EQ(spills, over);
    EXPECT_EQ(spills.size(), over.size());
}

TEST(Text, IsNulTerminatedInlineAndOnTheHeap)
{
    for (const std::size_t length :
         {std::size_t{0}, std::size_t{5}, Text::inlineCapacity,
          Text::inlineCapacity + 1, std::size_t{100000}})
    {
        const std::string source(length, 'x');
        const Text text(source);
        EXPECT_EQ(std::string(text.c_str()), source) << length;
        EXPECT_EQ(text.c_str()[length], '\0') << length;
    }
}

TEST(Text, ANullCharacterPointerIsTheEmptyText)
{
    const char* none = nullptr;
    const Text text(none);
    EXPECT_TRUE(text.empty());
    EXPECT_STREQ(text.c_str(), "");
}

TEST(Text, KeepsEmbeddedNulCharacters)
{
    const std::string source("a\0b", 3);
    const Text text(source);
    EXPECT_EQ(text.size(), 3u);
    EXPECT_EQ(text.view(), source);
}

TEST(Text, CopiesAreIndependentOfTheOriginal)
{
    for (const std::size_t length : {std::size_t{7}, std::size_t{64}})
    {
        Text original(std::string(length, 'o'));
        const Text copy = original;
        original = Text("changed");
        EXPECT_EQ(copy, std::string(length, 'o'));
        EXPECT_EQ(original, "changed");
    }
}

TEST(Text, AMoveTakesTheTextAndLeavesTheSourceEmpty)
{
    for (const std::size_t length : {std::size_t{7}, std::size_t{64}})
    {
        const std::string source(length, 'm');
        Text from(source);
        const Text to(std::move(from));
        EXPECT_EQ(to, source);
        EXPECT_TRUE(from.empty()); // NOLINT(bugprone-use-after-move)

        Text target("old text that is longer than thirty characters");
        Text again(source);
        target = std::move(again);
        EXPECT_EQ(target, source);
        EXPECT_TRUE(again.empty()); // NOLINT(bugprone-use-after-move)
    }
}

TEST(Text, AssigningToItselfKeepsTheText)
{
    for (const std::size_t length : {std::size_t{7}, std::size_t{64}})
    {
        const std::string source(length, 's');
        Text text(source);
        Text& same = text;
        text = same;
        EXPECT_EQ(text, source);
        text = std::move(same);
        EXPECT_EQ(text, source);
    }
}

TEST(Text, ComparesPrintsAndJoinsLikeAString)
{
    const Text name("LogCreationClassName");
    EXPECT_EQ(name, "LogCreationClassName");
    EXPECT_EQ("LogCreationClassName", name);
    EXPECT_EQ(name, std::string("LogCreationClassName"));
    EXPECT_EQ(name, Text("LogCreationClassName"));
    EXPECT_NE(name, "LogName");
    EXPECT_EQ("[" + name + "]", "[LogCreationClassName]");
    EXPECT_EQ(std::string("x.") + name, "x.LogCreationClassName");
    EXPECT_EQ(name + "=1", "LogCreationClassName=1");
    std::ostringstream out;
    out << name;
    EXPECT_EQ(out.str(), "LogCreationClassName");
    EXPECT_EQ(name.str(), "LogCreationClassName");
}

} // namespace
