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

} // namespace QX::Platform
