#pragma once

#include "Values.h"

#include <cmpidt.h>

#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace host
{

// Everything a provider operation handed back, copied out of the request.
struct Outcome
{
    CMPIrc rc = CMPI_RC_OK;
    std::optional<std::string> message; // nullopt when the status msg was NULL
    std::vector<ObjectPath> paths;      // returnObjectPath, in order
    std::vector<Instance> instances;    // returnInstance, in order
    std::vector<Value> data;            // returnData, in order
    bool done = false;                  // returnDone was called
    unsigned doneCount = 0;
    NamedValues outArgs; // invokeMethod's out arguments
    // returnInstance / returnObjectPath calls refused because the object
    // was null or not one of the broker's.
    unsigned rejectedInstances = 0;
    unsigned rejectedPaths = 0;
    // Instances and paths passed to ResultHandlers instead of collected.
    std::size_t streamedInstances = 0;
    std::size_t streamedPaths = 0;
};

// Receives each instance or object path as the provider returns it, on the
// returning thread, one call at a time and in order. A result with a
// handler is not collected in the Outcome: a caller that only prints or
// counts the results of a large enumeration need not hold them all.
struct ResultHandlers
{
    std::function<void(const Instance&)> instance;
    std::function<void(const ObjectPath&)> path;
};

} // namespace host
