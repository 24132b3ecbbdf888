#pragma once

// Helpers behind QX::Product::getUid, visible for the unit tests.

#include <optional>
#include <string>

namespace QX::Product::detail
{

/** @p text (surrounding blanks allowed) as a lower-case UUID text, or
 *  nothing when it is not xxxxxxxx-xxxx-xxxx-xxxx-xxxxxxxxxxxx in hex. */
std::optional<std::string> uuidFromDmiText(const std::string& text);

/** A machine id (32 hex digits, surrounding blanks allowed) formatted as a
 *  lower-case UUID text, or nothing when it is not one. */
std::optional<std::string> uuidFromMachineId(const std::string& text);

} // namespace QX::Product::detail
