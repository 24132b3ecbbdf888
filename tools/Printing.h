// Human (MOF-like) and machine (JSON) renderings of provider results, as
// selprov prints them.
#pragma once

#include "Values.h"

#include <string>
#include <string_view>
#include <vector>

namespace selprov
{

// "// path\ninstance of Class\n{\n    Name = value;\n};\n"
std::string formatMof(const host::Instance& instance);

// A JSON string literal; invalid UTF-8 bytes become U+FFFD.
std::string jsonString(std::string_view text);
// Numbers as numbers (non-finite reals as null), strings and datetimes as
// strings, references as their path text, arrays as arrays.
std::string jsonValue(const host::Value& value);
// {"path": "...", "properties": {"Name": value, ...}}
std::string jsonInstance(const host::Instance& instance);
std::string jsonInstances(const std::vector<host::Instance>& instances);
std::string jsonPaths(const std::vector<host::ObjectPath>& paths);

} // namespace selprov
