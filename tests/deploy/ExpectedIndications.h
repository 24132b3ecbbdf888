#pragma once

#include "Values.h"

#include <vector>

namespace deploy
{

// The indications the provider library delivers, one for each kind of
// alert (a record added, the log cleared, the log at its warning and at
// its critical fill, a watchdog restart): the library is loaded through
// its factories, every indication class is subscribed to through the
// indication MI, and the simulated BMC raises each alert in turn. So every
// property the indication builders set is here, with the CMPI type they
// set it with. Made once per test program.
const std::vector<host::Instance>& expectedIndications();

} // namespace deploy
