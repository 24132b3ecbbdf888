#pragma once

#include <string>
#include <string_view>

namespace host
{

// A double-quoted string with \" \\ and control characters escaped, as used
// in WBEM object path text and MOF.
std::string quoted(std::string_view text);

// Shortest text that reads back as the same double.
std::string realText(double value);

} // namespace host
