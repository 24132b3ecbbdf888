#pragma once

#include <string>

namespace QX
{

namespace Locale
{

/** Languages the message resources carry. */
enum LanguageId : unsigned
{
    English = 0,
    German = 1,
};

/** Opaque handle of one resource library in one language. */
struct ResourceLibrary
{
    unsigned library = 0;
    LanguageId language = English;
};

/** Resource library of the SEL provider's messages. */
constexpr unsigned SelProviderLibrary = 1;

/** The language of the messages: the one the platform configuration
 *  chose (see configureLanguage), else that of the process: LC_ALL,
 *  LC_MESSAGES, then LANG; German for a "de" prefix, English otherwise. */
LanguageId getLanguageId();
/**
 * Fixes the language to "en" or "de" (the platform configuration's
 * locale); any other text, the empty one included, returns to the process
 * environment.
 */
void configureLanguage(const std::string& name);
ResourceLibrary getResourceLibrary(unsigned library, LanguageId language);

} // namespace Locale

/**
 * @brief The text of one message identifier in one resource library.
 *
 * An identifier the library does not hold gives an empty text. Texts may
 * hold printf-style conversions, documented per identifier.
 */
class ResourceString
{
  public:
    ResourceString(const Locale::ResourceLibrary& library,
                   const std::wstring& identifier);

    const std::wstring& str() const
    {
        return text_;
    }
    operator const std::wstring&() const
    {
        return text_;
    }

  private:
    std::wstring text_;
};

} // namespace QX
