#include "Broker.h"

#include "BrokerState.h"
#include "Objects.h"
#include "ValueConversion.h"

#include <stdexcept>
#include <utility>

namespace host
{

using namespace detail;

Broker::Broker(Schema schema) :
    state_(std::make_unique<BrokerState>(std::move(schema)))
{
}

Broker::~Broker() = default;

const CMPIBroker* Broker::cmpi() const
{
    return &state_->cmpi;
}

FaultPlan& Broker::faults()
{
    return state_->faults;
}

const Schema& Broker::schema() const
{
    return state_->schema;
}

std::vector<TraceRecord> Broker::traces() const
{
    const std::lock_guard lock(state_->traceMutex);
    return state_->traces;
}

void Broker::clearTraces()
{
    const std::lock_guard lock(state_->traceMutex);
    state_->traces.clear();
    state_->logs.clear();
}

std::vector<LogRecord> Broker::logs() const
{
    const std::lock_guard lock(state_->traceMutex);
    return state_->logs;
}

const CMPIBroker* Broker::cmpiView(std::size_t index) const
{
    if (index == 0)
    {
        return &state_->cmpi;
    }
    return &state_->otherViews.at(index - 1);
}

IndicationInbox Broker::listen(std::string nameSpace)
{
    auto inbox = std::make_shared<InboxState>(std::move(nameSpace));
    const std::lock_guard lock(state_->indicationMutex);
    state_->inboxes.push_back(inbox);
    return IndicationInbox(std::move(inbox));
}

std::size_t Broker::deliveredIndications() const
{
    const std::lock_guard lock(state_->indicationMutex);
    return state_->deliveredCount;
}

std::size_t Broker::unheardIndications() const
{
    const std::lock_guard lock(state_->indicationMutex);
    return state_->unheardCount;
}

std::size_t Broker::runningThreads() const
{
    const std::lock_guard lock(state_->threadMutex);
    return state_->liveThreads;
}

bool Broker::waitForThreads(std::chrono::milliseconds timeout)
{
    return state_->waitForThreads(timeout);
}

namespace
{

std::size_t countOwned(const BrokerState& state, Ownership ownership)
{
    const std::lock_guard lock(state.ownedMutex);
    std::size_t n = 0;
    for (const auto& [object, owner] : state.owned)
    {
        n += object->ownership == ownership ? 1 : 0;
    }
    return n;
}

} // namespace

std::size_t Broker::outstandingClones() const
{
    return countOwned(*state_, Ownership::Clone);
}

std::size_t Broker::outstandingPreparedContexts() const
{
    return countOwned(*state_, Ownership::Prepared);
}

std::size_t Broker::brokerOwnedObjects() const
{
    return state_->brokerObjects.size();
}

Broker::Request::Request(Broker& broker) :
    state_(*broker.state_), objects_(std::make_unique<OwnedObjects>())
{
    state_.pushScope(objects_.get(), nullptr);
    context_ = state_.make<ContextObject>();
    context_->entries.emplace_back(CMPIInvocationFlags,
                                   Value::unsignedInt(CMPI_uint32, 0));
    context_->entries.emplace_back(CMPIPrincipal, Value::string("root"));
    result_ = state_.make<ResultObject>();
    result_->outcome = &outcome_;
}

Broker::Request::~Request()
{
    state_.popScope(objects_.get());
    objects_->clear();
}

const CMPIContext* Broker::Request::context() const
{
    return &context_->cmpi;
}

const CMPIResult* Broker::Request::result() const
{
    return &result_->cmpi;
}

void Broker::Request::streamTo(const ResultHandlers* handlers)
{
    const std::lock_guard lock(result_->mutex);
    result_->handlers = handlers;
}

Outcome Broker::Request::finish(CMPIStatus status)
{
    // Moved out, not copied: a large enumeration would otherwise be held
    // twice at its peak. The result stays usable and collects anew.
    Outcome out;
    {
        const std::lock_guard lock(result_->mutex);
        out = std::exchange(outcome_, Outcome{});
    }
    out.rc = status.rc;
    out.message = status.msg ? toText(status.msg) : std::nullopt;
    return out;
}

CMPIObjectPath* Broker::makeObjectPath(const ObjectPath& path)
{
    auto* p = state_->make<ObjectPathObject>();
    p->path = path;
    return &p->cmpi;
}

CMPIInstance* Broker::makeInstance(const Instance& instance)
{
    auto* i = state_->make<InstanceObject>();
    i->path = instance.path;
    i->properties = instance.properties;
    return &i->cmpi;
}

CMPIArgs* Broker::makeArgs(const NamedValues& args)
{
    auto* a = state_->make<ArgsObject>();
    a->args = args;
    return &a->cmpi;
}

CMPISelectExp* Broker::makeSelectExp(const std::string& query,
                                     const std::string& language)
{
    auto* e = state_->make<SelectExpObject>();
    e->query = query;
    e->language = language;
    return &e->cmpi;
}

Instance Broker::toInstance(const CMPIInstance* instance)
{
    const InstanceObject* i = InstanceObject::of(instance);
    if (i == nullptr)
    {
        throw std::invalid_argument("not a broker-made CMPIInstance");
    }
    return i->snapshot();
}

ObjectPath Broker::toObjectPath(const CMPIObjectPath* path)
{
    const ObjectPathObject* p = ObjectPathObject::of(path);
    if (p == nullptr)
    {
        throw std::invalid_argument("not a broker-made CMPIObjectPath");
    }
    return p->path;
}

Value Broker::toValue(const CMPIData& data)
{
    Value v;
    const CMPIrc rc = readData(data, v);
    if (rc != CMPI_RC_OK)
    {
        throw std::invalid_argument("unreadable CMPIData of type " +
                                    typeName(data.type));
    }
    return v;
}

NamedValues Broker::toArgs(const CMPIArgs* args)
{
    const ArgsObject* a = ArgsObject::of(args);
    if (a == nullptr)
    {
        throw std::invalid_argument("not a broker-made CMPIArgs");
    }
    return a->args;
}

std::optional<std::string> Broker::toText(const CMPIString* string)
{
    const StringObject* s = StringObject::of(string);
    return s ? s->text : std::nullopt;
}

} // namespace host
