#include "BrokerState.h"
#include "Objects.h"
#include "ValueConversion.h"

#include <cstring>

namespace host::detail
{

void ContextObject::copyFrom(const ContextObject& other)
{
    entries = other.entries;
}

namespace
{

using Ctx = ContextObject;

const Value* findEntry(const Ctx& c, const char* name)
{
    for (const auto& [n, v] : c.entries)
    {
        if (n == name)
        {
            return &v;
        }
    }
    return nullptr;
}

CMPIData ctxGetEntry(const CMPIContext* ctx, const char* name, CMPIStatus* rc)
{
    const Ctx* c = Ctx::of(ctx);
    if (c == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullData();
    }
    return lookupData(*c->broker, name ? findEntry(*c, name) : nullptr, name,
                      rc);
}

CMPIData ctxGetEntryAt(const CMPIContext* ctx, CMPICount index,
                       CMPIString** name, CMPIStatus* rc)
{
    const Ctx* c = Ctx::of(ctx);
    if (c == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullData();
    }
    return indexedData(*c->broker, c->entries, index, name, rc);
}

CMPICount ctxGetEntryCount(const CMPIContext* ctx, CMPIStatus* rc)
{
    const Ctx* c = Ctx::of(ctx);
    setStatus(rc, c ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE);
    return c ? static_cast<CMPICount>(c->entries.size()) : 0;
}

CMPIStatus ctxAddEntry(const CMPIContext* ctx, const char* name,
                       const CMPIValue* value, const CMPIType type)
{
    Ctx* c = Ctx::of(ctx);
    if (c == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    Value v;
    const CMPIrc rc = readNamedArgument(name, value, type, v);
    if (rc != CMPI_RC_OK)
    {
        return errorStatus(rc);
    }
    for (auto& [n, existing] : c->entries)
    {
        if (n == name)
        {
            existing = std::move(v);
            return okStatus();
        }
    }
    c->entries.emplace_back(name, std::move(v));
    return okStatus();
}

} // namespace

CMPIContextFT contextFT = {
    200,
    releaseObject<Ctx, CMPIContext>,
    cloneObject<Ctx, CMPIContext>,
    ctxGetEntry,
    ctxGetEntryAt,
    ctxGetEntryCount,
    ctxAddEntry,
};

} // namespace host::detail
