#pragma once

// Diagnostics of the provider's entry points: their lines name the unit
// file "SELProvider.cpp" and the component loggerSELProvider.

#include "SELProvider.h"
#include "sdk/qxlib/include/Trace.h"

namespace QX::SELComposite::provider
{

constexpr const char* unitFile = "SELProvider.cpp";

/** The banner and ENTERING line that open an operation. */
inline void markEntry(const char* function, int line)
{
    markProviderEntry(loggerSELProvider, function, unitFile,
                      static_cast<unsigned>(line));
}

/** The EXITING line and banner that close an operation. */
inline void markExit(const char* function, int line)
{
    markProviderExit(loggerSELProvider, function, unitFile,
                     static_cast<unsigned>(line));
}

} // namespace QX::SELComposite::provider
