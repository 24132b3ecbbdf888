#pragma once

#include <cmpidt.h>
#include <cmpift.h>

#include <exception>
#include <iostream>
#include <string>

namespace QX::SELComposite
{

/** Status for an exception that reached the CMPI boundary. */
CMPIStatus boundaryFailure(const char* what);

/**
 * @brief Function-table entry that runs a provider operation and keeps any
 *        exception from unwinding into the object manager's C code.
 *
 * The operations themselves catch nothing; an exception that escapes one
 * (for example a failure of the instrumentation while clearing the log) is
 * written to standard error and answered with CMPI_RC_ERR_FAILED.
 */
template <auto Operation>
struct Guarded;

template <typename... Args, CMPIStatus (*Operation)(Args...)>
struct Guarded<Operation>
{
    static CMPIStatus call(Args... args) noexcept
    {
        try
        {
            return Operation(args...);
        }
        catch (const std::exception& error)
        {
            std::cerr << error.what() << std::endl;
            return boundaryFailure(error.what());
        }
        catch (...)
        {
            std::cerr << "unknown exception" << std::endl;
            return boundaryFailure("unknown exception");
        }
    }
};

} // namespace QX::SELComposite
