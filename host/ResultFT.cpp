#include "BrokerState.h"
#include "Objects.h"
#include "ValueConversion.h"

namespace host::detail
{
namespace
{

// Gives a result to the caller's handler; what the handler throws must not
// unwind through the provider's C frames.
template <typename Handler, typename Result>
CMPIStatus handOver(const Handler& handler, const Result& result)
{
    try
    {
        handler(result);
        return okStatus();
    }
    catch (...)
    {
        return errorStatus(CMPI_RC_ERR_FAILED);
    }
}

CMPIStatus resultReturnData(const CMPIResult* rslt, const CMPIValue* value,
                            const CMPIType type)
{
    ResultObject* r = ResultObject::of(rslt);
    if (r == nullptr || r->outcome == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    Value v;
    const CMPIrc rc = readArgument(value, type, v);
    if (rc != CMPI_RC_OK)
    {
        return errorStatus(rc);
    }
    const std::lock_guard lock(r->mutex);
    r->outcome->data.push_back(std::move(v));
    return okStatus();
}

CMPIStatus resultReturnInstance(const CMPIResult* rslt,
                                const CMPIInstance* inst)
{
    ResultObject* r = ResultObject::of(rslt);
    if (r == nullptr || r->outcome == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    const InstanceObject* i =
        inst == nullptr ? nullptr : InstanceObject::of(inst);
    if (i == nullptr)
    {
        const std::lock_guard lock(r->mutex);
        ++r->outcome->rejectedInstances;
        return errorStatus(inst == nullptr ? CMPI_RC_ERR_INVALID_PARAMETER
                                           : CMPI_RC_ERR_INVALID_HANDLE);
    }
    Instance copy = i->snapshot();
    const std::lock_guard lock(r->mutex);
    if (r->handlers != nullptr && r->handlers->instance)
    {
        ++r->outcome->streamedInstances;
        return handOver(r->handlers->instance, copy);
    }
    r->outcome->instances.push_back(std::move(copy));
    return okStatus();
}

CMPIStatus resultReturnObjectPath(const CMPIResult* rslt,
                                  const CMPIObjectPath* ref)
{
    ResultObject* r = ResultObject::of(rslt);
    if (r == nullptr || r->outcome == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    const ObjectPathObject* p =
        ref == nullptr ? nullptr : ObjectPathObject::of(ref);
    if (p == nullptr)
    {
        const std::lock_guard lock(r->mutex);
        ++r->outcome->rejectedPaths;
        return errorStatus(ref == nullptr ? CMPI_RC_ERR_INVALID_PARAMETER
                                          : CMPI_RC_ERR_INVALID_HANDLE);
    }
    const std::lock_guard lock(r->mutex);
    if (r->handlers != nullptr && r->handlers->path)
    {
        ++r->outcome->streamedPaths;
        return handOver(r->handlers->path, p->path);
    }
    r->outcome->paths.push_back(p->path);
    return okStatus();
}

CMPIStatus resultReturnDone(const CMPIResult* rslt)
{
    ResultObject* r = ResultObject::of(rslt);
    if (r == nullptr || r->outcome == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    const std::lock_guard lock(r->mutex);
    r->outcome->done = true;
    ++r->outcome->doneCount;
    return okStatus();
}

} // namespace

// Results handed to providers cannot be released or cloned (OpenPegasus
// leaves both NULL) and have no returnError (SFCB leaves it NULL).
CMPIResultFT resultFT = {
    200,
    nullptr,
    nullptr,
    resultReturnData,
    resultReturnInstance,
    resultReturnObjectPath,
    resultReturnDone,
    nullptr,
};

} // namespace host::detail
