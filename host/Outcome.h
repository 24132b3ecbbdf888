#pragma once

#include "Values.h"

#include <cmpidt.h>

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
};

} // namespace host
