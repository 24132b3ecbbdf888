#pragma once

#include "Values.h"

#include <vector>

namespace deploy
{

// One indication of each class the provider delivers, with every property
// the indication builders set, each with the CMPI type the builder uses,
// and "AlertingManagedElement" holding the object path text of the
// element it names.
//
// Written down from the builders' design while they are not in the
// library yet. Once they are, this is the one function to replace: make it
// return the instances the library delivers through the host (subscribe to
// each class through the indication MI, raise each alert on the memory
// source, collect Broker::indications()), and every check that uses it
// covers the real builders.
std::vector<host::Instance> expectedIndications();

} // namespace deploy
