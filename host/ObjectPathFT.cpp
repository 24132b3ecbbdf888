#include "BrokerState.h"
#include "Objects.h"
#include "ValueConversion.h"

namespace host::detail
{

void ObjectPathObject::copyFrom(const ObjectPathObject& other)
{
    path = other.path;
}

namespace
{

using Op = ObjectPathObject;

CMPIStatus setText(CMPIObjectPath* op, const char* text,
                   Text ObjectPath::*member)
{
    Op* p = Op::of(op);
    if (p == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (text == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    }
    p->path.*member = text;
    return okStatus();
}

// getNameSpace, getHostname, getClassName: a new string, with the faults
// planned for the call (if any).
CMPIString* getText(const CMPIObjectPath* op, CMPIStatus* rc,
                    Text ObjectPath::*member, std::optional<BrokerCall> call)
{
    const Op* p = Op::of(op);
    if (p == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    const auto fault =
        call ? p->broker->fault(*call) : std::optional<FaultMode>{};
    if (fault == FaultMode::ReturnNull)
    {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return nullptr;
    }
    auto* s = p->broker->make<StringObject>();
    s->text = p->path.*member;
    return deliver(s, fault, rc);
}

CMPIStatus opSetNameSpace(CMPIObjectPath* op, const char* ns)
{
    return setText(op, ns, &ObjectPath::nameSpace);
}

CMPIString* opGetNameSpace(const CMPIObjectPath* op, CMPIStatus* rc)
{
    return getText(op, rc, &ObjectPath::nameSpace, BrokerCall::GetNameSpace);
}

CMPIStatus opSetHostname(CMPIObjectPath* op, const char* hn)
{
    return setText(op, hn, &ObjectPath::host);
}

CMPIString* opGetHostname(const CMPIObjectPath* op, CMPIStatus* rc)
{
    return getText(op, rc, &ObjectPath::host, std::nullopt);
}

CMPIStatus opSetClassName(CMPIObjectPath* op, const char* cn)
{
    return setText(op, cn, &ObjectPath::className);
}

CMPIString* opGetClassName(const CMPIObjectPath* op, CMPIStatus* rc)
{
    return getText(op, rc, &ObjectPath::className, BrokerCall::GetClassName);
}

CMPIStatus opAddKey(CMPIObjectPath* op, const char* name,
                    const CMPIValue* value, const CMPIType type)
{
    Op* p = Op::of(op);
    if (p == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    Value v;
    const CMPIrc rc = readNamedArgument(name, value, type, v);
    if (rc != CMPI_RC_OK)
    {
        return errorStatus(rc);
    }
    p->path.setKey(name, std::move(v));
    return okStatus();
}

CMPIData opGetKey(const CMPIObjectPath* op, const char* name, CMPIStatus* rc)
{
    const Op* p = Op::of(op);
    if (p == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullData();
    }
    return lookupData(*p->broker, name ? p->path.key(name) : nullptr, name, rc,
                      CMPI_keyValue);
}

CMPIData opGetKeyAt(const CMPIObjectPath* op, CMPICount index,
                    CMPIString** name, CMPIStatus* rc)
{
    const Op* p = Op::of(op);
    if (p == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullData();
    }
    if (index >= p->path.keys.size())
    {
        setStatus(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        return nullData();
    }
    const auto& [keyName, value] = p->path.keys[index];
    if (name != nullptr)
    {
        auto* s = p->broker->make<StringObject>();
        s->text = keyName;
        *name = &s->cmpi;
    }
    setStatus(rc, CMPI_RC_OK);
    return makeData(*p->broker, value, CMPI_keyValue);
}

CMPICount opGetKeyCount(const CMPIObjectPath* op, CMPIStatus* rc)
{
    const Op* p = Op::of(op);
    if (p == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return 0;
    }
    const auto fault = p->broker->fault(BrokerCall::GetKeyCount);
    if (fault && fault != FaultMode::FailStatus)
    {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return 0;
    }
    setStatus(rc, fault ? CMPI_RC_ERR_FAILED : CMPI_RC_OK);
    return static_cast<CMPICount>(p->path.keys.size());
}

/** Copies the namespace of @p src into @p op, and its host as well when
 *  @p withHost. */
CMPIStatus copyLocation(CMPIObjectPath* op, const CMPIObjectPath* src,
                        bool withHost)
{
    Op* p = Op::of(op);
    const Op* from = Op::of(src);
    if (p == nullptr || from == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    p->path.nameSpace = from->path.nameSpace;
    if (withHost)
    {
        p->path.host = from->path.host;
    }
    return okStatus();
}

CMPIStatus opSetNameSpaceFromObjectPath(CMPIObjectPath* op,
                                        const CMPIObjectPath* src)
{
    return copyLocation(op, src, false);
}

CMPIStatus opSetHostAndNameSpaceFromObjectPath(CMPIObjectPath* op,
                                               const CMPIObjectPath* src)
{
    return copyLocation(op, src, true);
}

CMPIData opGetClassQualifier(const CMPIObjectPath*, const char*, CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullData();
}

CMPIData opGetPropertyQualifier(const CMPIObjectPath*, const char*, const char*,
                                CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullData();
}

CMPIData opGetMethodQualifier(const CMPIObjectPath*, const char*, const char*,
                              CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullData();
}

CMPIData opGetParameterQualifier(const CMPIObjectPath*, const char*,
                                 const char*, const char*, CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullData();
}

CMPIString* opToString(const CMPIObjectPath* op, CMPIStatus* rc)
{
    const Op* p = Op::of(op);
    if (p == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    const auto fault = p->broker->fault(BrokerCall::ToString);
    if (fault == FaultMode::ReturnNull)
    {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return nullptr;
    }
    auto* s = p->broker->make<StringObject>();
    s->text = p->path.toString();
    return deliver(s, fault, rc);
}

} // namespace

CMPIObjectPathFT objectPathFT = {
    200,
    releaseObject<Op, CMPIObjectPath>,
    cloneObject<Op, CMPIObjectPath>,
    opSetNameSpace,
    opGetNameSpace,
    opSetHostname,
    opGetHostname,
    opSetClassName,
    opGetClassName,
    opAddKey,
    opGetKey,
    opGetKeyAt,
    opGetKeyCount,
    opSetNameSpaceFromObjectPath,
    opSetHostAndNameSpaceFromObjectPath,
    opGetClassQualifier,
    opGetPropertyQualifier,
    opGetMethodQualifier,
    opGetParameterQualifier,
    opToString,
};

} // namespace host::detail
