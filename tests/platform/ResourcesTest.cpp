#include "Resources.h"

#include "Product.h"
#include "Utf8.h"
#include "platform/EnvironmentGuard.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace QX;
using namespace QX::Locale;

namespace
{

std::wstring text(LanguageId language, const wchar_t* identifier)
{
    return ResourceString(getResourceLibrary(SelProviderLibrary, language),
                          identifier)
        .str();
}

} // namespace

TEST(Resources, EnglishTexts)
{
    EXPECT_EQ(text(English, L"MSGID_SEL_PROBABLE_CAUSE"),
              L"A new record was added to the IPMI System Event Log.");
    EXPECT_EQ(text(English, L"MSGID_SEL_LOG_CLEARED"),
              L"The IPMI System Event Log was cleared.");
    EXPECT_EQ(text(English, L"MSGID_SEL_LOG_FULL"),
              L"The IPMI System Event Log is %d percent full.");
    EXPECT_EQ(text(English, L"MSGID_SP_WATCHDOG_ALRT"),
              L"The server was restarted automatically by the hardware "
              L"watchdog.");
    EXPECT_EQ(text(English, L"MSGID_SP_WATCHDOG_NORMAL"),
              L"The server was restarted.");
}

TEST(Resources, GermanTextsDifferAndKeepTheirConversions)
{
    const wchar_t* identifiers[] = {
        L"MSGID_SEL_PROBABLE_CAUSE", L"MSGID_SEL_LOG_CLEARED",
        L"MSGID_SEL_LOG_FULL", L"MSGID_SP_WATCHDOG_ALRT",
        L"MSGID_SP_WATCHDOG_NORMAL"};
    for (const wchar_t* identifier : identifiers)
    {
        const std::wstring german = text(German, identifier);
        EXPECT_FALSE(german.empty());
        EXPECT_NE(german, text(English, identifier));
        const bool isFull = std::wstring(identifier) == L"MSGID_SEL_LOG_FULL";
        EXPECT_EQ(german.find(L'%') != std::wstring::npos, isFull);
    }
    EXPECT_EQ(make_string(text(German, L"MSGID_SEL_LOG_CLEARED")),
              "Das IPMI-Systemereignisprotokoll wurde gel\xc3\xb6scht.");
    const std::wstring full = text(German, L"MSGID_SEL_LOG_FULL");
    EXPECT_EQ(full.find(L"%d"), full.rfind(L'%'));
}

TEST(Resources, UnknownIdentifiersAndLibrariesAreEmpty)
{
    EXPECT_EQ(text(English, L"MSGID_NOT_THERE"), L"");
    EXPECT_EQ(
        ResourceString(getResourceLibrary(2, English), L"MSGID_SEL_LOG_CLEARED")
            .str(),
        L"");
    const ResourceString resource(
        getResourceLibrary(SelProviderLibrary, English),
        L"MSGID_SP_WATCHDOG_NORMAL");
    const std::wstring& converted = resource;
    EXPECT_EQ(converted, L"The server was restarted.");
}

TEST(Resources, LanguageFollowsTheEnvironment)
{
    test::EnvironmentGuard environment;
    environment.unset("LC_ALL");
    environment.unset("LC_MESSAGES");
    environment.set("LANG", "de_DE.UTF-8");
    EXPECT_EQ(getLanguageId(), German);
    environment.set("LANG", "en_US.UTF-8");
    EXPECT_EQ(getLanguageId(), English);
    environment.set("LC_MESSAGES", "de_AT");
    EXPECT_EQ(getLanguageId(), German);
    environment.set("LC_ALL", "C");
    EXPECT_EQ(getLanguageId(), English);
    environment.set("LC_ALL", "");
    EXPECT_EQ(getLanguageId(), German); // empty LC_ALL does not count
    environment.unset("LC_MESSAGES");
    environment.unset("LANG");
    EXPECT_EQ(getLanguageId(), English);
}

TEST(Resources, AConfiguredLanguageOverridesTheEnvironment)
{
    test::EnvironmentGuard environment;
    environment.unset("LC_ALL");
    environment.unset("LC_MESSAGES");
    environment.set("LANG", "en_GB.UTF-8");
    configureLanguage("de");
    EXPECT_EQ(getLanguageId(), German);
    environment.set("LANG", "de_DE.UTF-8");
    configureLanguage("en");
    EXPECT_EQ(getLanguageId(), English);
    configureLanguage("fr"); // not a language of ours: the environment
    EXPECT_EQ(getLanguageId(), German);
    configureLanguage("");
    EXPECT_EQ(getLanguageId(), German);
}

TEST(MakeString, EncodesUtf8ByHand)
{
    EXPECT_EQ(make_string(std::wstring(L"plain ASCII")), "plain ASCII");
    EXPECT_EQ(make_string(std::wstring(L"\u00e4")), "\xc3\xa4");     // 2 bytes
    EXPECT_EQ(make_string(std::wstring(L"\u20ac")), "\xe2\x82\xac"); // 3 bytes
    EXPECT_EQ(make_string(std::wstring(L"\U0001F600")),
              "\xf0\x9f\x98\x80"); // 4 bytes
    EXPECT_EQ(make_string(std::wstring(L"\u007f\u0080\u07ff\u0800\uffff")),
              "\x7f\xc2\x80\xdf\xbf\xe0\xa0\x80\xef\xbf\xbf");
    EXPECT_EQ(make_string(std::wstring(1, static_cast<wchar_t>(0x10FFFF))),
              "\xf4\x8f\xbf\xbf");
}

TEST(MakeString, InvalidCodePointsBecomeReplacementCharacters)
{
    const std::string replacement = "\xef\xbf\xbd";
    EXPECT_EQ(make_string(std::wstring(1, static_cast<wchar_t>(0xD800))),
              replacement);
    EXPECT_EQ(make_string(std::wstring(1, static_cast<wchar_t>(0x110000))),
              replacement);
    EXPECT_EQ(make_string(std::wstring(1, static_cast<wchar_t>(-1))),
              replacement);
}

TEST(MakeString, PointerFormStopsAtNul)
{
    const wchar_t text[] = L"ab\u00e4\0hidden";
    EXPECT_EQ(make_string(text), "ab\xc3\xa4");
    EXPECT_EQ(make_string(static_cast<const wchar_t*>(nullptr)), "");
    EXPECT_EQ(make_string(std::wstring(L"a\0b", 3)), std::string("a\0b", 3));
}

TEST(Product, UidHasTheUuidForm)
{
    const std::string uid = make_string(Product::getUid());
    EXPECT_THAT(uid, ::testing::MatchesRegex(
                         "[0-9a-f]{8}-[0-9a-f]{4}-[0-9a-f]{4}-[0-9a-f]{4}-"
                         "[0-9a-f]{12}"));
    EXPECT_EQ(Product::getUid(), Product::getUid());
}

TEST(Product, DmiTextIsValidatedAndLowerCased)
{
    using Product::detail::uuidFromDmiText;
    EXPECT_EQ(uuidFromDmiText("4C4C4544-0042-3510-8052-B2C04F4E3732\n"),
              "4c4c4544-0042-3510-8052-b2c04f4e3732");
    EXPECT_FALSE(
        uuidFromDmiText("4C4C4544-0042-3510-8052-B2C04F4E373").has_value());
    EXPECT_FALSE(
        uuidFromDmiText("4C4C4544+0042-3510-8052-B2C04F4E3732").has_value());
    EXPECT_FALSE(
        uuidFromDmiText("4C4C4544-0042-3510-8052-B2C04F4E373G").has_value());
    EXPECT_FALSE(uuidFromDmiText("").has_value());
}

TEST(Product, MachineIdIsFormattedAsUuid)
{
    using Product::detail::uuidFromMachineId;
    EXPECT_EQ(uuidFromMachineId("0123456789ABCDEF0123456789abcdef\n"),
              "01234567-89ab-cdef-0123-456789abcdef");
    EXPECT_FALSE(
        uuidFromMachineId("0123456789abcdef0123456789abcde").has_value());
    EXPECT_FALSE(
        uuidFromMachineId("0123456789abcdef0123456789abcdeg").has_value());
}
