#pragma once

#include <cmpidt.h>
#include <cmpift.h>

namespace QX::SELComposite
{

/** An instance made for a request, and whether properties can be set. */
struct InstanceFrame
{
    CMPIInstance* instance = nullptr;
    bool usable = false;
};

/**
 * @brief Makes an empty instance of @p className in the request's
 *        namespace, on a path with this system's host name.
 *
 * When the broker gives no usable object path the frame holds no instance;
 * when it gives no usable instance the frame holds the broker's answer as
 * it is. @p status goes only to the reads of the request's namespace.
 */
InstanceFrame newInstanceFrame(const CMPIBroker* broker,
                               const CMPIObjectPath* requestPath,
                               const char* className, CMPIStatus* status);

} // namespace QX::SELComposite
