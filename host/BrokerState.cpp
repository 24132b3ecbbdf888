#include "BrokerState.h"

#include "Names.h"

#include <algorithm>
#include <array>
#include <iterator>
#include <stdexcept>

namespace host::detail
{
namespace
{

struct Scope
{
    BrokerState* broker;
    OwnedObjects* objects;
    const CMPIContext* attached;
};

// The requests and attachments open on one thread, innermost last. Of
// fixed capacity and trivially destructible: a thread's first use of a
// thread_local that needs a destructor registers it under the dynamic
// loader's lock, and a provider's thread may get here while its library
// is being unloaded under that very lock.
class ScopeStack
{
  public:
    static constexpr std::size_t capacity = 64;

    Scope* begin()
    {
        return entries_.data();
    }
    Scope* end()
    {
        return entries_.data() + depth_;
    }
    std::reverse_iterator<Scope*> rbegin()
    {
        return std::reverse_iterator<Scope*>(end());
    }
    std::reverse_iterator<Scope*> rend()
    {
        return std::reverse_iterator<Scope*>(begin());
    }
    bool empty() const
    {
        return depth_ == 0;
    }
    const Scope& back() const
    {
        return entries_[depth_ - 1];
    }
    bool push(const Scope& scope)
    {
        if (depth_ == capacity)
        {
            return false;
        }
        entries_[depth_++] = scope;
        return true;
    }
    void erase(Scope* at)
    {
        std::copy(at + 1, end(), at);
        --depth_;
    }
    template <typename Predicate>
    void eraseIf(Predicate predicate)
    {
        depth_ = static_cast<std::size_t>(
            std::remove_if(begin(), end(), predicate) - begin());
    }

  private:
    std::array<Scope, capacity> entries_;
    std::size_t depth_;
};

thread_local ScopeStack scopes{};

std::mutex liveMutex;
std::vector<BrokerState*> liveBrokers;

} // namespace

OwnedObjects::~OwnedObjects()
{
    clear();
}

std::size_t OwnedObjects::size() const
{
    const std::lock_guard lock(mutex_);
    return objects_.size();
}

void OwnedObjects::clear()
{
    std::vector<std::unique_ptr<Object>> doomed;
    {
        const std::lock_guard lock(mutex_);
        doomed.swap(objects_);
    }
    while (!doomed.empty())
    {
        doomed.pop_back();
    }
}

ContextObject::ContextObject(BrokerState& state) : Encapsulated(state)
{
    state.registerContext(&cmpi);
}

ContextObject::~ContextObject()
{
    broker->unregisterContext(&cmpi);
}

// Longest a broker waits, when it is destroyed, for threads a provider
// started through it and that still run.
constexpr std::chrono::seconds threadDrainLimit{10};

BrokerState::BrokerState(Schema s) : schema(std::move(s))
{
    cmpi.hdl = this;
    cmpi.bft = &brokerFT;
    cmpi.eft = &brokerEncFT;
    cmpi.xft = &brokerExtFT;
    cmpi.mft = nullptr;
    for (CMPIBroker& view : otherViews)
    {
        view = cmpi;
    }
    const std::lock_guard lock(liveMutex);
    liveBrokers.push_back(this);
}

BrokerState::~BrokerState()
{
    // A provider thread still running would use what is freed below.
    waitForThreads(threadDrainLimit);
    {
        const std::lock_guard lock(liveMutex);
        std::erase(liveBrokers, this);
    }
    brokerObjects.clear();
    {
        const std::lock_guard lock(attachMutex);
        attachObjects.clear();
    }
    std::map<Object*, std::unique_ptr<Object>> doomed;
    {
        const std::lock_guard lock(ownedMutex);
        doomed.swap(owned);
    }
    doomed.clear();
    // Drop any scope this thread still has for this broker.
    scopes.eraseIf([this](const Scope& s) { return s.broker == this; });
}

BrokerState* BrokerState::of(const CMPIBroker* mb)
{
    if (mb == nullptr || mb->hdl == nullptr || mb->bft != &brokerFT)
    {
        return nullptr;
    }
    return static_cast<BrokerState*>(mb->hdl);
}

BrokerState* BrokerState::forThisThread()
{
    if (!scopes.empty())
    {
        return scopes.back().broker;
    }
    const std::lock_guard lock(liveMutex);
    return liveBrokers.size() == 1 ? liveBrokers.front() : nullptr;
}

CMPIStatus BrokerState::release(Object* object)
{
    if (object->ownership == Ownership::Scoped)
    {
        return okStatus();
    }
    std::unique_ptr<Object> doomed;
    {
        const std::lock_guard lock(ownedMutex);
        const auto it = owned.find(object);
        if (it == owned.end())
        {
            return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
        }
        doomed = std::move(it->second);
        owned.erase(it);
    }
    return okStatus();
}

OwnedObjects& BrokerState::currentObjects()
{
    for (auto it = scopes.rbegin(); it != scopes.rend(); ++it)
    {
        if (it->broker == this)
        {
            return *it->objects;
        }
    }
    return brokerObjects;
}

void BrokerState::pushScope(OwnedObjects* objects, const CMPIContext* attached)
{
    if (!scopes.push({this, objects, attached}))
    {
        throw std::length_error("too many nested requests on one thread");
    }
}

void BrokerState::popScope(OwnedObjects* objects)
{
    for (auto it = scopes.rbegin(); it != scopes.rend(); ++it)
    {
        if (it->broker == this && it->objects == objects)
        {
            scopes.erase(std::next(it).base());
            return;
        }
    }
}

CMPIStatus BrokerState::attach(const CMPIContext* ctx)
{
    if (!isLiveContext(ctx))
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    OwnedObjects* objects = nullptr;
    {
        const std::lock_guard lock(attachMutex);
        objects = &attachObjects.emplace_back();
    }
    if (!scopes.push({this, objects, ctx}))
    {
        const std::lock_guard lock(attachMutex);
        attachObjects.remove_if([objects](const OwnedObjects& a)
                                { return &a == objects; });
        return errorStatus(CMPI_RC_ERR_FAILED);
    }
    return okStatus();
}

CMPIStatus BrokerState::detach(const CMPIContext* ctx)
{
    if (!isLiveContext(ctx))
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    for (auto it = scopes.rbegin(); it != scopes.rend(); ++it)
    {
        if (it->broker == this && it->attached == ctx)
        {
            OwnedObjects* objects = it->objects;
            scopes.erase(std::next(it).base());
            std::list<OwnedObjects> doomed;
            {
                const std::lock_guard lock(attachMutex);
                const auto found = std::find_if(
                    attachObjects.begin(), attachObjects.end(),
                    [objects](const OwnedObjects& a) { return &a == objects; });
                if (found != attachObjects.end())
                {
                    doomed.splice(doomed.begin(), attachObjects, found);
                }
            }
            ContextObject* context = ContextObject::of(ctx);
            if (context != nullptr && context->ownership == Ownership::Prepared)
            {
                release(context);
            }
            break;
        }
    }
    return okStatus();
}

bool BrokerState::inScopeOnThisThread() const
{
    return std::any_of(scopes.begin(), scopes.end(),
                       [this](const Scope& s) { return s.broker == this; });
}

void BrokerState::deliver(DeliveredIndication indication)
{
    const std::lock_guard lock(indicationMutex);
    ++deliveredCount;
    std::vector<std::shared_ptr<InboxState>> listeners;
    std::erase_if(inboxes,
                  [&](const std::weak_ptr<InboxState>& weak)
                  {
                      auto inbox = weak.lock();
                      if (!inbox)
                      {
                          return true;
                      }
                      if (sameName(inbox->nameSpace, indication.nameSpace))
                      {
                          listeners.push_back(std::move(inbox));
                      }
                      return false;
                  });
    if (listeners.empty())
    {
        ++unheardCount;
        return;
    }
    for (const auto& inbox : listeners)
    {
        {
            const std::lock_guard inboxLock(inbox->mutex);
            inbox->queue.push_back(indication);
            ++inbox->received;
        }
        inbox->arrived.notify_all();
    }
}

void BrokerState::threadStarted()
{
    const std::lock_guard lock(threadMutex);
    ++liveThreads;
}

void BrokerState::threadEnded()
{
    // Notified under the lock: the broker may be destroyed as soon as the
    // waiter sees the count reach 0.
    const std::lock_guard lock(threadMutex);
    --liveThreads;
    threadsDone.notify_all();
}

bool BrokerState::waitForThreads(std::chrono::milliseconds timeout)
{
    std::unique_lock lock(threadMutex);
    return threadsDone.wait_for(lock, timeout,
                                [this] { return liveThreads == 0; });
}

void BrokerState::registerContext(const CMPIContext* ctx)
{
    const std::lock_guard lock(contextMutex);
    contexts.insert(ctx);
}

void BrokerState::unregisterContext(const CMPIContext* ctx)
{
    const std::lock_guard lock(contextMutex);
    contexts.erase(ctx);
}

bool BrokerState::isLiveContext(const CMPIContext* ctx) const
{
    // Look the pointer up before touching it: it may be stale.
    const std::lock_guard lock(contextMutex);
    return contexts.count(ctx) != 0 && ContextObject::of(ctx) != nullptr;
}

} // namespace host::detail
