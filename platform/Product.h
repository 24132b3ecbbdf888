#pragma once

#include <optional>
#include <string>

namespace QX::Product
{

/** Stable identity of this system as a UUID text
 *  (xxxxxxxx-xxxx-xxxx-xxxx-xxxxxxxxxxxx, lower case): from the DMI
 *  product UUID when readable, else from /etc/machine-id; all zeros when
 *  neither can be read. */
std::wstring getUid();

} // namespace QX::Product

// Helpers behind getUid, visible for the unit tests.
namespace QX::Product::detail
{

/** @p text (surrounding blanks allowed) as a lower-case UUID text, or
 *  nothing when it is not xxxxxxxx-xxxx-xxxx-xxxx-xxxxxxxxxxxx in hex. */
std::optional<std::string> uuidFromDmiText(const std::string& text);

/** A machine id (32 hex digits, surrounding blanks allowed) formatted as a
 *  lower-case UUID text, or nothing when it is not one. */
std::optional<std::string> uuidFromMachineId(const std::string& text);

} // namespace QX::Product::detail
