#pragma once

// Diagnostics of the indication code: its lines name the unit file
// "SELIndication.cpp" and the component loggerSELIndication.

#include "SELIndication.h"
#include "sdk/qxlib/include/Trace.h"

namespace QX::SELComposite::indication
{

constexpr const char* unitFile = "SELIndication.cpp";

inline void traceEntry(const char* function, int line)
{
    logFunctionEdge(function, unitFile, line, loggerSELIndication, ENTRY_TRACE);
}

inline void traceExit(const char* function, int line)
{
    logFunctionEdge(function, unitFile, line, loggerSELIndication, EXIT_TRACE);
}

inline void traceMessage(const char* function, int line, int level,
                         const char* text)
{
    logMessage(function, unitFile, line, loggerSELIndication, level, text);
}

template <typename Value>
void traceVariable(const char* function, int line, const char* name,
                   Value value)
{
    logVariable(function, unitFile, line, loggerSELIndication, name, value);
}

} // namespace QX::SELComposite::indication
