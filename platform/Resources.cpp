#include "Resources.h"

#include <atomic>
#include <cstdlib>
#include <string_view>

namespace QX
{

namespace
{

struct Message
{
    std::wstring_view identifier;
    std::wstring_view english;
    std::wstring_view german;
};

// MSGID_SEL_LOG_FULL holds exactly one %d (the fill level in percent); the
// other texts hold no conversions.
constexpr Message selProviderMessages[] = {
    {L"MSGID_SEL_PROBABLE_CAUSE",
     L"A new record was added to the IPMI System Event Log.",
     L"Dem IPMI-Systemereignisprotokoll wurde ein neuer Eintrag "
     L"hinzugef\u00fcgt."},
    {L"MSGID_SEL_LOG_CLEARED", L"The IPMI System Event Log was cleared.",
     L"Das IPMI-Systemereignisprotokoll wurde gel\u00f6scht."},
    {L"MSGID_SEL_LOG_FULL", L"The IPMI System Event Log is %d percent full.",
     L"Das IPMI-Systemereignisprotokoll ist zu %d Prozent voll."},
    {L"MSGID_SP_WATCHDOG_ALRT",
     L"The server was restarted automatically by the hardware watchdog.",
     L"Der Server wurde vom Hardware-Watchdog automatisch neu gestartet."},
    {L"MSGID_SP_WATCHDOG_NORMAL", L"The server was restarted.",
     L"Der Server wurde neu gestartet."},
};

// The configured language plus one, 0 for none (the environment decides).
std::atomic<unsigned> configuredLanguage{0};

} // namespace

namespace Locale
{

void configureLanguage(const std::string& name)
{
    unsigned chosen = 0;
    if (name == "en")
    {
        chosen = English + 1;
    }
    else if (name == "de")
    {
        chosen = German + 1;
    }
    configuredLanguage.store(chosen);
}

LanguageId getLanguageId()
{
    const unsigned chosen = configuredLanguage.load();
    if (chosen != 0)
    {
        return static_cast<LanguageId>(chosen - 1);
    }
    // The first of these that is set and not empty decides, as for
    // message catalogues.
    for (const char* variable : {"LC_ALL", "LC_MESSAGES", "LANG"})
    {
        const char* value = std::getenv(variable);
        if (value != nullptr && *value != '\0')
        {
            return std::string_view(value).starts_with("de") ? German : English;
        }
    }
    return English;
}

ResourceLibrary getResourceLibrary(unsigned library, LanguageId language)
{
    return ResourceLibrary{library, language};
}

} // namespace Locale

ResourceString::ResourceString(const Locale::ResourceLibrary& library,
                               const std::wstring& identifier)
{
    if (library.library != Locale::SelProviderLibrary)
    {
        return;
    }
    for (const Message& message : selProviderMessages)
    {
        if (message.identifier == identifier)
        {
            text_ = library.language == Locale::German ? message.german
                                                       : message.english;
            return;
        }
    }
}

} // namespace QX
