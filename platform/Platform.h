#pragma once

#include "InstrumentationSource.h"

#include <memory>

namespace QX::Platform
{

/**
 * The process's instrumentation source, made from the configuration at
 * first use (and the logger configured with it).
 */
std::shared_ptr<InstrumentationSource> currentSource();

/** Puts @p source in place of the configured one (tools and tests); a null
 *  pointer returns to the configuration at the next use. */
void overrideSource(std::shared_ptr<InstrumentationSource> source);

/** Has the current source raise a simulated alert; throws
 *  std::runtime_error when it cannot (see
 *  InstrumentationSource::raiseSimulatedAlert). */
void raiseSimulatedAlert(SimulatedAlert alert);

} // namespace QX::Platform
