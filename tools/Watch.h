#pragma once

#include "CommandLine.h"
#include "Host.h"

namespace selprov
{

// Subscribes to the options' indication classes the way SFCB does
// (authorizeFilter, mustPoll, activateFilter, enableIndications), raises
// the simulated alerts asked for, prints every indication as it arrives and
// unsubscribes again (disableIndications, deActivateFilter). Ends when the
// count is reached, the timeout runs out or SIGINT comes. Returns the exit
// code: 1 when a count was asked for and not reached, or anything failed.
int watch(const Options& options, host::Host& host);

// Has the platform's source raise the options' simulated alerts; 1 (with
// the reason on standard error) when it cannot.
int raise(const Options& options);

} // namespace selprov
