#pragma once

#include <string>

namespace QX
{

/** UTF-8 form of a wide text (up to its first NUL for the pointer form).
 *  A value that is not a Unicode scalar value becomes U+FFFD. */
std::string make_string(const std::wstring& text);
std::string make_string(const wchar_t* text);

} // namespace QX
