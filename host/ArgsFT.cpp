#include "BrokerState.h"
#include "Objects.h"
#include "ValueConversion.h"

namespace host::detail
{

void ArgsObject::copyFrom(const ArgsObject& other)
{
    args = other.args;
}

namespace
{

CMPIStatus argsAddArg(const CMPIArgs* as, const char* name,
                      const CMPIValue* value, const CMPIType type)
{
    ArgsObject* a = ArgsObject::of(as);
    if (a == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    Value v;
    const CMPIrc rc = readNamedArgument(name, value, type, v);
    if (rc != CMPI_RC_OK)
    {
        return errorStatus(rc);
    }
    setNamed(a->args, name, std::move(v));
    return okStatus();
}

CMPIData argsGetArg(const CMPIArgs* as, const char* name, CMPIStatus* rc)
{
    const ArgsObject* a = ArgsObject::of(as);
    if (a == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullData();
    }
    return lookupData(*a->broker, name ? findNamed(a->args, name) : nullptr,
                      name, rc);
}

CMPIData argsGetArgAt(const CMPIArgs* as, CMPICount index, CMPIString** name,
                      CMPIStatus* rc)
{
    const ArgsObject* a = ArgsObject::of(as);
    if (a == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullData();
    }
    return indexedData(*a->broker, a->args, index, name, rc);
}

CMPICount argsGetArgCount(const CMPIArgs* as, CMPIStatus* rc)
{
    const ArgsObject* a = ArgsObject::of(as);
    setStatus(rc, a ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE);
    return a ? static_cast<CMPICount>(a->args.size()) : 0;
}

} // namespace

CMPIArgsFT argsFT = {
    200,
    releaseObject<ArgsObject, CMPIArgs>,
    cloneObject<ArgsObject, CMPIArgs>,
    argsAddArg,
    argsGetArg,
    argsGetArgAt,
    argsGetArgCount,
};

} // namespace host::detail
