#include "BrokerState.h"
#include "DateTimeText.h"
#include "Objects.h"

namespace host::detail
{

void DateTimeObject::copyFrom(const DateTimeObject& other)
{
    text = other.text;
}

namespace
{

CMPIUint64 dateTimeGetBinaryFormat(const CMPIDateTime* dt, CMPIStatus* rc)
{
    const DateTimeObject* d = DateTimeObject::of(dt);
    if (d == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return 0;
    }
    const auto binary = cimDateTimeToBinary(d->text);
    setStatus(rc, binary ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_PARAMETER);
    return binary.value_or(0);
}

CMPIString* dateTimeGetStringFormat(const CMPIDateTime* dt, CMPIStatus* rc)
{
    const DateTimeObject* d = DateTimeObject::of(dt);
    if (d == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    auto* s = d->broker->make<StringObject>();
    s->text = d->text;
    setStatus(rc, CMPI_RC_OK);
    return &s->cmpi;
}

CMPIBoolean dateTimeIsInterval(const CMPIDateTime* dt, CMPIStatus* rc)
{
    const DateTimeObject* d = DateTimeObject::of(dt);
    if (d == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return 0;
    }
    setStatus(rc, CMPI_RC_OK);
    return d->text.size() > 21 && d->text.view()[21] == ':';
}

} // namespace

CMPIDateTimeFT dateTimeFT = {
    200,
    releaseObject<DateTimeObject, CMPIDateTime>,
    cloneObject<DateTimeObject, CMPIDateTime>,
    dateTimeGetBinaryFormat,
    dateTimeGetStringFormat,
    dateTimeIsInterval,
};

} // namespace host::detail
