// Shared state of one broker: what its function tables reach through the
// CMPIBroker handle and through every object's back pointer.
#pragma once

#include "Faults.h"
#include "Objects.h"
#include "Schema.h"
#include "Values.h"

#include <cmpift.h>

#include <array>
#include <chrono>
#include <condition_variable>
#include <deque>
#include <list>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <unordered_set>
#include <vector>

namespace host::detail
{

extern CMPIBrokerFT brokerFT;
extern CMPIBrokerEncFT brokerEncFT;
extern CMPIBrokerExtFT brokerExtFT;

// The queue behind one IndicationInbox.
struct InboxState
{
    explicit InboxState(std::string ns) : nameSpace(std::move(ns)) {}
    const std::string nameSpace;
    std::mutex mutex;
    std::condition_variable arrived;
    std::deque<DeliveredIndication> queue;
    std::size_t received = 0;
};

struct BrokerState
{
    explicit BrokerState(Schema s);
    ~BrokerState();
    BrokerState(const BrokerState&) = delete;
    BrokerState& operator=(const BrokerState&) = delete;

    static BrokerState* of(const CMPIBroker* mb);
    // For calls without a broker handle (newThread): the broker of the
    // innermost request or attachment on this thread, else the only live
    // broker, else nullptr.
    static BrokerState* forThisThread();

    // A new object owned by the scope open on this thread: the open
    // request, the attached thread's scope, or else the broker itself.
    template <typename T>
    T* make()
    {
        return currentObjects().template make<T>(*this);
    }
    // A new object that lives until release() or the broker's end.
    template <typename T>
    T* makeOwned(Ownership ownership)
    {
        auto object = std::make_unique<T>(*this);
        object->ownership = ownership;
        T* raw = object.get();
        const std::lock_guard lock(ownedMutex);
        owned.emplace(raw, std::move(object));
        return raw;
    }
    // Frees clones and prepared contexts; harmless for scoped objects.
    CMPIStatus release(Object* object);

    OwnedObjects& currentObjects();
    void pushScope(OwnedObjects* objects, const CMPIContext* attached);
    void popScope(OwnedObjects* objects);
    CMPIStatus attach(const CMPIContext* ctx);
    // Ends the attachment of this thread to @p ctx: frees what the thread
    // made meanwhile and, as SFCB does, the context itself when it came
    // from prepareAttachThread.
    CMPIStatus detach(const CMPIContext* ctx);
    // Whether this thread has a request open on this broker, or is
    // attached to one of its contexts.
    bool inScopeOnThisThread() const;

    // Hands a delivered indication to every inbox of its namespace.
    void deliver(DeliveredIndication indication);

    // Threads started through newThread that have not returned yet.
    void threadStarted();
    void threadEnded();
    bool waitForThreads(std::chrono::milliseconds timeout);

    void registerContext(const CMPIContext* ctx);
    void unregisterContext(const CMPIContext* ctx);
    bool isLiveContext(const CMPIContext* ctx) const;

    std::optional<FaultMode> fault(BrokerCall call)
    {
        return faults.record(call);
    }

    // Declared first so it outlives every context freed below.
    mutable std::mutex contextMutex;
    std::unordered_set<const CMPIContext*> contexts;

    CMPIBroker cmpi{};
    // Further CMPIBroker structs over this same state, for hosts that give
    // each MI factory a broker pointer of its own (as OpenPegasus does).
    std::array<CMPIBroker, 2> otherViews{};
    Schema schema;
    FaultPlan faults;

    mutable std::mutex traceMutex;
    std::vector<TraceRecord> traces;
    std::vector<LogRecord> logs;

    mutable std::mutex indicationMutex;
    std::vector<std::weak_ptr<InboxState>> inboxes;
    std::size_t deliveredCount = 0;
    std::size_t unheardCount = 0; // delivered with no inbox listening

    mutable std::mutex threadMutex;
    std::condition_variable threadsDone;
    std::size_t liveThreads = 0;

    mutable std::mutex ownedMutex;
    std::map<Object*, std::unique_ptr<Object>> owned;

    mutable std::mutex attachMutex;
    std::list<OwnedObjects> attachObjects;

    OwnedObjects brokerObjects;
};

// Hands a freshly made object to the provider, applying a planned fault:
// NullHandle clears its hdl, FailStatus reports CMPI_RC_ERR_FAILED with the
// real object. (ReturnNull is handled before anything is made.)
template <typename T>
auto* deliver(T* object, std::optional<FaultMode> fault, CMPIStatus* rc)
{
    if (fault == FaultMode::NullHandle)
    {
        object->cmpi.hdl = nullptr;
    }
    setStatus(rc,
              fault == FaultMode::FailStatus ? CMPI_RC_ERR_FAILED : CMPI_RC_OK);
    return &object->cmpi;
}

// release() of every object table: frees clones and prepared contexts.
template <typename Object, typename Handle>
CMPIStatus releaseObject(Handle* handle)
{
    Object* object = Object::of(handle);
    return object ? object->broker->release(object)
                  : errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
}

// clone() of every object table: a new broker-owned object of the same
// type with the state of the original.
template <typename Object, typename Handle>
Handle* cloneObject(const Handle* handle, CMPIStatus* rc)
{
    const Object* object = Object::of(handle);
    if (object == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    auto* copy = object->broker->template makeOwned<Object>(Ownership::Clone);
    copy->copyFrom(*object);
    setStatus(rc, CMPI_RC_OK);
    return &copy->cmpi;
}

} // namespace host::detail
