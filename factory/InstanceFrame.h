#pragma once

#include <cmpidt.h>
#include <cmpift.h>

#include <functional>

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

class PropertySelection;

/** Sets the properties of a new instance that the request selects. */
using InstanceFill =
    std::function<void(CMPIInstance*, const PropertySelection&)>;

/**
 * @brief Builds one instance of @p className for a request, framed by the
 *        ENTERING and EXITING lines of @p function.
 *
 * Makes the frame (see newInstanceFrame); when it is usable, first gives
 * the instance the broker's property filter of @p properties with @p keys
 * unless only keys are asked for, then lets @p fill set the properties.
 * Gives the frame's instance.
 */
CMPIInstance* buildInstance(const char* function, const CMPIBroker* broker,
                            const CMPIObjectPath* requestPath,
                            const char* className, const char** keys,
                            const char** properties, bool keysOnly,
                            CMPIStatus* status, const InstanceFill& fill);

} // namespace QX::SELComposite
