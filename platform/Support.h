#pragma once

#include <cmpidt.h>

#include <string>

namespace QX
{

/** Name of the local computer system (the host name). */
std::string getSystemName();

/** @p text without leading and trailing blanks (space, tab, CR, LF, VT, FF)
 *  and cut at its first NUL character. */
std::string stripSpaces(std::string text);

/** Equality of two names, ignoring ASCII letter case, as CIM compares
 *  class and property names. Null pointers equal only each other. */
bool textEqual(const char* left, const char* right);

/**
 * @brief Whether two CMPI object paths name the same instance.
 *
 * Namespaces, class names and key names are compared ignoring ASCII case,
 * key values exactly (strings byte for byte, date-times by their text,
 * numbers by value, references recursively). Both paths need the same set
 * of keys. Host names are compared (ignoring case) only when
 * @p compareHosts is true. Null paths are never equal.
 */
bool isObjPathsEqual(const CMPIObjectPath* left, const CMPIObjectPath* right,
                     bool compareHosts);

} // namespace QX
