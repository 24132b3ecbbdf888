#pragma once

#include "InstrumentationSource.h"
#include "IpmiSettings.h"

#include <memory>
#include <string>

namespace QX::Ipmi
{

/**
 * The IPMI source for @p settings: checks them (completeSettings), then
 * makes the FreeIPMI session and event texts behind an IpmiSource. No
 * session is opened yet. A refusal is written to the log and thrown as
 * std::runtime_error.
 *
 * @param configurationFile the file the settings were read from, whose
 *        permissions guard a password it holds; empty for none
 */
std::shared_ptr<InstrumentationSource>
makeIpmiSource(Settings settings, const std::string& configurationFile);

} // namespace QX::Ipmi
