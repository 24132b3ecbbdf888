#pragma once

#include "ClassRepository.h"
#include "Values.h"

#include <cmpidt.h>

#include <string>
#include <vector>

namespace deploy
{

// The MOF type a CMPI type code stands for: "uint16", "string[]",
// "datetime", "ref"; "unknown(0x...)" for codes a MOF cannot declare.
std::string mofTypeOf(CMPIType type);
// The same text for a MOF declaration ("ref" for any reference).
std::string mofTypeOf(const mof::Feature& feature);

// What is wrong with an instance the provider made, as an instance of its
// class in @p classes: properties no class of the chain declares, or
// declares with another type. Empty when all agree.
std::vector<std::string> propertyMismatches(const mof::ClassRepository& classes,
                                            const host::Instance& instance);
// What is wrong with the keys of an object path: missing or extra keys, or
// key values of another type than the class declares.
std::vector<std::string> keyMismatches(const mof::ClassRepository& classes,
                                       const host::ObjectPath& path);

} // namespace deploy
