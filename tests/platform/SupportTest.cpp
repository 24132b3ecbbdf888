#include "Support.h"

#include <cerrno>
#include <cstring>
#include <sched.h>
#include <string>
#include <thread>
#include <unistd.h>
#include <vector>

#include <gtest/gtest.h>

using namespace QX;

TEST(Support, SystemNameIsTheHostName)
{
    char expected[256] = {};
    ASSERT_EQ(gethostname(expected, sizeof expected - 1), 0);
    EXPECT_EQ(getSystemName(), expected);
    EXPECT_FALSE(getSystemName().empty());
}

TEST(Support, SystemNameIsTheHostNameInsideAScopeToo)
{
    char expected[256] = {};
    ASSERT_EQ(gethostname(expected, sizeof expected - 1), 0);
    const SystemNameScope outer;
    EXPECT_EQ(getSystemName(), expected);
    {
        const SystemNameScope inner;
        EXPECT_EQ(getSystemName(), expected);
    }
    EXPECT_EQ(getSystemName(), expected);
}

namespace
{

/** What a thread in a UTS namespace of its own saw of getSystemName
 *  while its host name changed. */
struct RenamedHostView
{
    std::string skipped; // why the check could not run, if it could not
    std::vector<std::string> seen;
};

RenamedHostView renameHostWhileScoped()
{
    RenamedHostView view;
    // Only this thread moves to a new UTS namespace, so renaming the host
    // there leaves the machine's name alone.
    if (unshare(CLONE_NEWUTS) != 0)
    {
        view.skipped =
            std::string("no UTS namespace of our own: ") + std::strerror(errno);
        return view;
    }
    const auto rename = [](const char* name)
    { return sethostname(name, std::strlen(name)) == 0; };
    if (!rename("scope-first"))
    {
        view.skipped = "sethostname refused";
        return view;
    }
    {
        const SystemNameScope scope;
        view.seen.push_back(getSystemName());
        rename("scope-second");
        view.seen.push_back(getSystemName());
        {
            const SystemNameScope nested;
            rename("scope-third");
            view.seen.push_back(getSystemName());
        }
    }
    view.seen.push_back(getSystemName());
    rename("scope-fourth");
    view.seen.push_back(getSystemName());
    return view;
}

} // namespace

TEST(Support, AScopeReadsTheSystemNameOnceAndTheNextCallReadsAgain)
{
    RenamedHostView view;
    std::thread([&] { view = renameHostWhileScoped(); }).join();
    if (!view.skipped.empty())
    {
        GTEST_SKIP() << view.skipped;
    }
    // Within the scope (and the one nested in it) the first name stays;
    // after it, each call reads the name again.
    EXPECT_EQ(view.seen, (std::vector<std::string>{"scope-first", "scope-first",
                                                   "scope-first", "scope-third",
                                                   "scope-fourth"}));
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
