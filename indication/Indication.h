#pragma once

// What the parts of the indication code share beyond SELIndication.h.

#include "ActivityLedger.h"
#include "Watches.h"

namespace QX::SELComposite
{

/** Alert handlers and delivery threads running now. */
extern ActivityLedger indicationActivity;
/** The instrumentation watches this library holds. */
extern Watches indicationWatches;

} // namespace QX::SELComposite
