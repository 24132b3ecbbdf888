#pragma once

#include <cmpidt.h>

#include <optional>
#include <string>

namespace host
{

// "CMPI_RC_ERR_NOT_FOUND" and so on; "CMPI_RC_UNKNOWN" for other codes.
const char* rcName(CMPIrc rc);
// "CMPI rc 6 (CMPI_RC_ERR_NOT_FOUND): message" (no ": message" without one).
std::string describeStatus(CMPIrc rc,
                           const std::optional<std::string>& message);

} // namespace host
