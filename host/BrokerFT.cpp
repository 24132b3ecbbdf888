// Up-calls: thread attachment and indication delivery work; the operations
// a provider could ask of the object manager are not offered. Indications
// go to the inboxes listening on their namespace (IndicationInbox).
#include "BrokerState.h"
#include "Objects.h"

namespace host::detail
{
namespace
{

CMPIContext* prepareAttachThread(const CMPIBroker* mb, const CMPIContext* ctx)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        return nullptr;
    }
    const auto fault = b->fault(BrokerCall::PrepareAttachThread);
    const ContextObject* source = ContextObject::of(ctx);
    if (source == nullptr || (fault && fault != FaultMode::NullHandle))
    {
        return nullptr;
    }
    // Outlives the request: a provider thread keeps using it.
    auto* prepared = b->makeOwned<ContextObject>(Ownership::Prepared);
    prepared->entries = source->entries;
    return deliver(prepared, fault, nullptr);
}

CMPIStatus attachThread(const CMPIBroker* mb, const CMPIContext* ctx)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (b->fault(BrokerCall::AttachThread))
    {
        return errorStatus(CMPI_RC_ERR_FAILED);
    }
    return b->attach(ctx);
}

CMPIStatus detachThread(const CMPIBroker* mb, const CMPIContext* ctx)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    const bool fails = b->fault(BrokerCall::DetachThread).has_value();
    const CMPIStatus status = b->detach(ctx);
    return fails ? errorStatus(CMPI_RC_ERR_FAILED) : status;
}

CMPIStatus deliverIndication(const CMPIBroker* mb, const CMPIContext* ctx,
                             const char* ns, const CMPIInstance* ind)
{
    BrokerState* b = BrokerState::of(mb);
    if (b == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (b->fault(BrokerCall::DeliverIndication))
    {
        return errorStatus(CMPI_RC_ERR_FAILED);
    }
    if (!b->isLiveContext(ctx))
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (ns == nullptr || ind == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    }
    // An object manager keeps track of a provider's objects per request or
    // attached thread; delivering from anywhere else is not supported.
    if (!b->inScopeOnThisThread())
    {
        return errorStatus(CMPI_RC_ERR_FAILED);
    }
    const InstanceObject* i = InstanceObject::of(ind);
    if (i == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    b->deliver(DeliveredIndication{ns, i->snapshot(), mb});
    return okStatus();
}

CMPIEnumeration* enumerateInstanceNames(const CMPIBroker*, const CMPIContext*,
                                        const CMPIObjectPath*, CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

CMPIInstance* getInstance(const CMPIBroker*, const CMPIContext*,
                          const CMPIObjectPath*, const char**, CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

CMPIObjectPath* createInstance(const CMPIBroker*, const CMPIContext*,
                               const CMPIObjectPath*, const CMPIInstance*,
                               CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

CMPIStatus modifyInstance(const CMPIBroker*, const CMPIContext*,
                          const CMPIObjectPath*, const CMPIInstance*,
                          const char**)
{
    return errorStatus(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus deleteInstance(const CMPIBroker*, const CMPIContext*,
                          const CMPIObjectPath*)
{
    return errorStatus(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIEnumeration* execQuery(const CMPIBroker*, const CMPIContext*,
                           const CMPIObjectPath*, const char*, const char*,
                           CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

CMPIEnumeration* enumerateInstances(const CMPIBroker*, const CMPIContext*,
                                    const CMPIObjectPath*, const char**,
                                    CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

CMPIEnumeration* associators(const CMPIBroker*, const CMPIContext*,
                             const CMPIObjectPath*, const char*, const char*,
                             const char*, const char*, const char**,
                             CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

CMPIEnumeration* associatorNames(const CMPIBroker*, const CMPIContext*,
                                 const CMPIObjectPath*, const char*,
                                 const char*, const char*, const char*,
                                 CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

CMPIEnumeration* references(const CMPIBroker*, const CMPIContext*,
                            const CMPIObjectPath*, const char*, const char*,
                            const char**, CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

CMPIEnumeration* referenceNames(const CMPIBroker*, const CMPIContext*,
                                const CMPIObjectPath*, const char*, const char*,
                                CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

CMPIData invokeMethod(const CMPIBroker*, const CMPIContext*,
                      const CMPIObjectPath*, const char*, const CMPIArgs*,
                      CMPIArgs*, CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullData();
}

CMPIStatus setProperty(const CMPIBroker*, const CMPIContext*,
                       const CMPIObjectPath*, const char*, const CMPIValue*,
                       CMPIType)
{
    return errorStatus(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIData getProperty(const CMPIBroker*, const CMPIContext*,
                     const CMPIObjectPath*, const char*, CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullData();
}

} // namespace

CMPIBrokerFT brokerFT = {
    CMPI_MB_Class_0 | CMPI_MB_Supports_IndicationMI,
    0, // like SFCB: providers must not rely on a broker version
    "selhost",
    prepareAttachThread,
    attachThread,
    detachThread,
    deliverIndication,
    enumerateInstanceNames,
    getInstance,
    createInstance,
    modifyInstance,
    deleteInstance,
    execQuery,
    enumerateInstances,
    associators,
    associatorNames,
    references,
    referenceNames,
    invokeMethod,
    setProperty,
    getProperty,
};

} // namespace host::detail
