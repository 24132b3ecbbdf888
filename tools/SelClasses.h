// What an object manager knows of the SEL provider before loading it: the
// name its factories carry, the namespace it serves and the keys of its
// classes. selprov, the tests and the benchmarks hand these to the host.
#pragma once

#include "Host.h"
#include "Schema.h"

#include <string>

namespace selclasses
{

constexpr const char* providerName = "SELProvider";
constexpr const char* nameSpace = "root/zanqx";

// ZAN_MgmtHwLog and ZAN_MgmtHwLogEntry with their key properties.
host::Schema schema();

// Loads the SEL provider from @p libraryPath with its name and schema.
host::HostOptions hostOptions(std::string libraryPath);

// A filter for every indication of @p className in the provider's
// namespace.
host::IndicationFilter filterFor(std::string className);

} // namespace selclasses
