#pragma once

// How the bench itself talks to the simulator over LAN 2.0: the session
// parameters every helper uses.

#include "ipmi/FreeIpmiHandles.h"

#include <string>

namespace bmcsim
{

/** An admin session with cipher suite 3 and the open-session privilege
 *  workaround the simulator needs. */
QX::Ipmi::SessionParameters sessionTo(const std::string& host,
                                      const std::string& user,
                                      const std::string& password,
                                      unsigned timeoutMs);

} // namespace bmcsim
