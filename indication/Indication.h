#pragma once

// What the parts of the indication code share beyond SELIndication.h.

#include "ActivityLedger.h"
#include "DateTime.h"
#include "Watches.h"

#include <string>

namespace QX::SELComposite
{

/** Alert handlers and delivery threads running now. */
extern ActivityLedger indicationActivity;
/** The instrumentation watches this library holds. */
extern Watches indicationWatches;

/** Reads an alerting log node: its path and its condition, as
 *  getLogInstrumentation does; false when there is nothing to deliver. */
using LogReader = bool (*)(std::string nodePath, std::string& logPath,
                           std::string& condition);

/** What LogHandler does, with the log node read by @p read: the clear
 *  event for the condition "IsEmpty", the full event for any other. */
void handleLogAlert(DateTime time, std::string nodePath, LogReader read);

} // namespace QX::SELComposite
