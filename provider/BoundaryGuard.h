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

/** Status for a required argument that the object manager passed as NULL:
 *  rc CMPI_RC_ERR_FAILED with the message "No <what> was passed". */
CMPIStatus missingArgument(const char* what);

namespace detail
{

// Every operation that takes a result or an object path uses it, so these
// two may not be NULL; contexts, property lists, method names and
// arguments are either unused or already checked where they are read.
inline const char* nullArgument(const CMPIResult* result)
{
    return result == nullptr ? "result" : nullptr;
}

inline const char* nullArgument(const CMPIObjectPath* path)
{
    return path == nullptr ? "object path" : nullptr;
}

template <typename Argument>
const char* nullArgument(const Argument&)
{
    return nullptr;
}

/** Name of the first required argument that is NULL, or nullptr. */
template <typename... Args>
const char* firstNullArgument(const Args&... args)
{
    const char* missing = nullptr;
    ((missing = missing != nullptr ? missing : nullArgument(args)), ...);
    return missing;
}

} // namespace detail

/**
 * @brief Function-table entry that runs a provider operation and keeps any
 *        exception from unwinding into the object manager's C code.
 *
 * The operations themselves catch nothing; an exception that escapes one
 * (for example a failure of the instrumentation while clearing the log) is
 * written to standard error and answered with CMPI_RC_ERR_FAILED. A NULL
 * result or object path is answered the same way before the operation
 * runs, so the operations never see one.
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
            if (const char* missing = detail::firstNullArgument(args...))
            {
                return missingArgument(missing);
            }
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
