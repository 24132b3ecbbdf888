#pragma once

#include <string_view>

namespace host
{

// CIM names (classes, properties, keys) compare without regard to case.
bool sameName(std::string_view a, std::string_view b);
bool nameLess(std::string_view a, std::string_view b);

// A CIM identifier: a letter or underscore, then letters, digits, underscores.
bool isIdentifier(std::string_view text);

} // namespace host
