// The message texts the indications are built with are used as printf
// formats: the full event's holds exactly one integer conversion, the
// others none, in every language the resources carry.
#include "Resources.h"

#include <cstddef>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace
{

using QX::Locale::LanguageId;

/** The conversions of @p format, each as the text from its '%' to its
 *  conversion letter; "%%" is no conversion. */
std::vector<std::wstring> conversionsOf(const std::wstring& format)
{
    std::vector<std::wstring> conversions;
    for (std::size_t i = 0; i < format.size(); ++i)
    {
        if (format[i] != L'%')
        {
            continue;
        }
        if (i + 1 < format.size() && format[i + 1] == L'%')
        {
            ++i;
            continue;
        }
        std::size_t end = i + 1;
        while (end < format.size() &&
               std::wstring(L"-+ #0123456789.hlLqjzt").find(format[end]) !=
                   std::wstring::npos)
        {
            ++end;
        }
        conversions.push_back(format.substr(i, end + 1 - i));
        i = end;
    }
    return conversions;
}

std::wstring textOf(const wchar_t* identifier, LanguageId language)
{
    return QX::ResourceString(QX::Locale::getResourceLibrary(
                                  QX::Locale::SelProviderLibrary, language),
                              identifier)
        .str();
}

constexpr LanguageId languages[] = {QX::Locale::English, QX::Locale::German};

TEST(MessageFormats, TheScanFindsConversions)
{
    EXPECT_TRUE(conversionsOf(L"100%% sure").empty());
    EXPECT_EQ(conversionsOf(L"%d and %-5.2ls, %"),
              (std::vector<std::wstring>{L"%d", L"%-5.2ls", L"%"}));
}

TEST(MessageFormats, TextsWithoutArgumentsHoldNoConversion)
{
    for (const wchar_t* identifier :
         {L"MSGID_SEL_PROBABLE_CAUSE", L"MSGID_SEL_LOG_CLEARED",
          L"MSGID_SP_WATCHDOG_ALRT", L"MSGID_SP_WATCHDOG_NORMAL"})
    {
        for (const LanguageId language : languages)
        {
            const std::wstring text = textOf(identifier, language);
            EXPECT_FALSE(text.empty()) << identifier << " " << language;
            EXPECT_TRUE(conversionsOf(text).empty())
                << identifier << " " << language;
        }
    }
}

TEST(MessageFormats, TheFullTextHoldsOneIntegerConversion)
{
    for (const LanguageId language : languages)
    {
        const std::wstring text = textOf(L"MSGID_SEL_LOG_FULL", language);
        EXPECT_EQ(conversionsOf(text), std::vector<std::wstring>{L"%d"})
            << language;
    }
}

} // namespace
