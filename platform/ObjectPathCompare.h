#pragma once

#include <cmpidt.h>

namespace QX
{

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
