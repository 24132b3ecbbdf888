#include "BrokerState.h"
#include "Objects.h"

namespace host::detail
{

void StringObject::copyFrom(const StringObject& other)
{
    text = other.text;
}

namespace
{

const char* stringGetCharPtr(const CMPIString* st, CMPIStatus* rc)
{
    const StringObject* s = StringObject::of(st);
    if (s == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    const auto fault = s->broker->fault(BrokerCall::GetCharPtr);
    if (fault && fault != FaultMode::FailStatus)
    {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return nullptr;
    }
    setStatus(rc, fault ? CMPI_RC_ERR_FAILED : CMPI_RC_OK);
    return s->text ? s->text->c_str() : nullptr;
}

} // namespace

CMPIStringFT stringFT = {
    200,
    releaseObject<StringObject, CMPIString>,
    cloneObject<StringObject, CMPIString>,
    stringGetCharPtr,
};

} // namespace host::detail
