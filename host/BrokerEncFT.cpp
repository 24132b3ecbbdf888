// Encapsulated-data services: object factories, type queries, messages,
// logging and tracing.
#include "BrokerState.h"
#include "DateTimeText.h"
#include "Objects.h"

#include <cstring>

namespace host::detail
{
namespace
{

constexpr CMPICount maxArraySize = 1u << 20;

// Every encapsulated object starts with {hdl, ft}; the ft tells the type.
struct AnyObject
{
    void* hdl;
    const void* ft;
};

const char* typeOf(const void* object)
{
    if (object == nullptr)
    {
        return nullptr;
    }
    const void* ft = static_cast<const AnyObject*>(object)->ft;
    if (ft == &stringFT)
    {
        return "CMPIString";
    }
    if (ft == &arrayFT)
    {
        return "CMPIArray";
    }
    if (ft == &dateTimeFT)
    {
        return "CMPIDateTime";
    }
    if (ft == &objectPathFT)
    {
        return "CMPIObjectPath";
    }
    if (ft == &instanceFT)
    {
        return "CMPIInstance";
    }
    if (ft == &resultFT)
    {
        return "CMPIResult";
    }
    if (ft == &contextFT)
    {
        return "CMPIContext";
    }
    if (ft == &argsFT)
    {
        return "CMPIArgs";
    }
    if (ft == &selectExpFT)
    {
        return "CMPISelectExp";
    }
    return nullptr;
}

std::optional<std::string> textOf(const CMPIString* s)
{
    const StringObject* so = StringObject::of(s);
    return so ? so->text : std::nullopt;
}

CMPIString* newText(BrokerState& b, std::optional<std::string> text)
{
    auto* s = b.make<StringObject>();
    s->text = std::move(text);
    return &s->cmpi;
}

CMPIInstance* newInstance(const CMPIBroker* mb, const CMPIObjectPath* op,
                          CMPIStatus* rc)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    const auto fault = b->fault(BrokerCall::NewInstance);
    if (fault == FaultMode::ReturnNull)
    {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return nullptr;
    }
    if (op == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER);
        return nullptr;
    }
    const ObjectPathObject* p = ObjectPathObject::of(op);
    if (p == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    auto* i = b->make<InstanceObject>();
    i->path = p->path;
    return deliver(i, fault, rc);
}

CMPIObjectPath* newObjectPath(const CMPIBroker* mb, const char* ns,
                              const char* cn, CMPIStatus* rc)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    const auto fault = b->fault(BrokerCall::NewObjectPath);
    if (fault == FaultMode::ReturnNull)
    {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return nullptr;
    }
    if (cn == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER);
        return nullptr;
    }
    auto* p = b->make<ObjectPathObject>();
    p->path.nameSpace = ns ? ns : "";
    p->path.className = cn;
    return deliver(p, fault, rc);
}

CMPIArgs* newArgs(const CMPIBroker* mb, CMPIStatus* rc)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    setStatus(rc, CMPI_RC_OK);
    return &b->make<ArgsObject>()->cmpi;
}

CMPIString* newString(const CMPIBroker* mb, const char* data, CMPIStatus* rc)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    const auto fault = b->fault(BrokerCall::NewString);
    if (fault == FaultMode::ReturnNull)
    {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return nullptr;
    }
    auto* s = b->make<StringObject>();
    if (data != nullptr)
    {
        s->text = data;
    }
    return deliver(s, fault, rc);
}

CMPIArray* newArray(const CMPIBroker* mb, CMPICount max, CMPIType type,
                    CMPIStatus* rc)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    const auto fault = b->fault(BrokerCall::NewArray);
    if (fault == FaultMode::ReturnNull)
    {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return nullptr;
    }
    const auto element = storedType(static_cast<CMPIType>(type & ~CMPI_ARRAY));
    if (element == CMPI_null)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
        return nullptr;
    }
    // A garbage count must not take the process down with bad_alloc.
    if (max > maxArraySize)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER);
        return nullptr;
    }
    auto* a = b->make<ArrayObject>();
    a->elementType = element;
    a->elements.assign(max, Value::nullOf(element));
    return deliver(a, fault, rc);
}

CMPIDateTime* makeDateTime(BrokerState& b, std::string_view text,
                           CMPIStatus* rc)
{
    auto* d = b.make<DateTimeObject>();
    d->text = text;
    setStatus(rc, CMPI_RC_OK);
    return &d->cmpi;
}

CMPIDateTime* newDateTime(const CMPIBroker* mb, CMPIStatus* rc)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    return makeDateTime(*b, cimDateTimeNow(), rc);
}

CMPIDateTime* newDateTimeFromBinary(const CMPIBroker* mb, CMPIUint64 binTime,
                                    CMPIBoolean interval, CMPIStatus* rc)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    auto text = cimDateTimeFromBinary(binTime, interval != 0);
    if (!text)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER);
        return nullptr;
    }
    return makeDateTime(*b, *text, rc);
}

CMPIDateTime* newDateTimeFromChars(const CMPIBroker* mb, const char* utcTime,
                                   CMPIStatus* rc)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    const auto fault = b->fault(BrokerCall::NewDateTimeFromChars);
    if (fault == FaultMode::ReturnNull)
    {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return nullptr;
    }
    if (utcTime == nullptr || !isCimDateTime(utcTime))
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER);
        return nullptr;
    }
    auto* d = b->make<DateTimeObject>();
    d->text = utcTime;
    return deliver(d, fault, rc);
}

CMPISelectExp* newSelectExp(const CMPIBroker*, const char*, const char*,
                            CMPIArray**, CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

CMPIBoolean classPathIsA(const CMPIBroker*, const CMPIObjectPath*, const char*,
                         CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return 0;
}

CMPIString* toString(const CMPIBroker* mb, const void* object, CMPIStatus* rc)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    const auto fault = b->fault(BrokerCall::ToString);
    if (fault == FaultMode::ReturnNull)
    {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return nullptr;
    }
    std::optional<std::string> text;
    bool known = true;
    if (const auto* p =
            ObjectPathObject::of(static_cast<const CMPIObjectPath*>(object)))
    {
        text = p->path.toString();
    }
    else if (const auto* s =
                 StringObject::of(static_cast<const CMPIString*>(object)))
    {
        text = s->text;
    }
    else if (const auto* d =
                 DateTimeObject::of(static_cast<const CMPIDateTime*>(object)))
    {
        text = d->text;
    }
    else if (const auto* i =
                 InstanceObject::of(static_cast<const CMPIInstance*>(object)))
    {
        text = "instance of " + i->path.className;
    }
    else
    {
        known = false;
    }
    if (!known)
    {
        setStatus(rc, object ? CMPI_RC_ERR_INVALID_HANDLE
                             : CMPI_RC_ERR_INVALID_PARAMETER);
        return nullptr;
    }
    auto* s = b->make<StringObject>();
    s->text = std::move(text);
    return deliver(s, fault, rc);
}

CMPIBoolean isOfType(const CMPIBroker* mb, const void* object, const char* type,
                     CMPIStatus* rc)
{
    const char* actual = typeOf(object);
    if (BrokerState::of(mb) == nullptr || actual == nullptr || type == nullptr)
    {
        setStatus(rc, actual ? CMPI_RC_ERR_INVALID_PARAMETER
                             : CMPI_RC_ERR_INVALID_HANDLE);
        return 0;
    }
    setStatus(rc, CMPI_RC_OK);
    return std::strcmp(actual, type) == 0;
}

CMPIString* getType(const CMPIBroker* mb, const void* object, CMPIStatus* rc)
{
    BrokerState* b = BrokerState::of(mb);
    const char* actual = typeOf(object);
    if (b == nullptr || actual == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    setStatus(rc, CMPI_RC_OK);
    return newText(*b, std::string(actual));
}

CMPIString* getMessage(const CMPIBroker* mb, const char*, const char* defMsg,
                       CMPIStatus* rc, CMPICount, ...)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    setStatus(rc, CMPI_RC_OK);
    return newText(*b,
                   defMsg ? std::optional<std::string>(defMsg) : std::nullopt);
}

CMPIStatus logMessage(const CMPIBroker* mb, int severity, const char* id,
                      const char* text, const CMPIString* string)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    LogRecord record{severity, id ? id : "", text ? text : "", textOf(string)};
    const std::lock_guard lock(b->traceMutex);
    b->logs.push_back(std::move(record));
    return okStatus();
}

CMPIStatus trace(const CMPIBroker* mb, int level, const char* component,
                 const char* text, const CMPIString* string)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    TraceRecord record{level, component ? component : "", text ? text : "",
                       textOf(string)};
    const std::lock_guard lock(b->traceMutex);
    b->traces.push_back(std::move(record));
    return okStatus();
}

CMPIError* newCMPIError(const CMPIBroker*, const char*, const char*,
                        const char*, const CMPIErrorSeverity,
                        const CMPIErrorProbableCause, const CMPIrc,
                        CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

CMPIStatus openMessageFile(const CMPIBroker*, const char*,
                           CMPIMsgFileHandle* handle)
{
    if (handle != nullptr)
    {
        *handle = nullptr;
    }
    return errorStatus(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus closeMessageFile(const CMPIBroker*, const CMPIMsgFileHandle)
{
    return errorStatus(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIString* getMessage2(const CMPIBroker*, const char*, const CMPIMsgFileHandle,
                        const char*, CMPIStatus* rc, CMPICount, ...)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

} // namespace

CMPIBrokerEncFT brokerEncFT = {
    200,
    newInstance,
    newObjectPath,
    newArgs,
    newString,
    newArray,
    newDateTime,
    newDateTimeFromBinary,
    newDateTimeFromChars,
    newSelectExp,
    classPathIsA,
    toString,
    isOfType,
    getType,
    getMessage,
    logMessage,
    trace,
    newCMPIError,
    openMessageFile,
    closeMessageFile,
    getMessage2,
};

} // namespace host::detail
