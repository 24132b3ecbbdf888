#pragma once

#include "Faults.h"
#include "Outcome.h"
#include "Schema.h"
#include "Values.h"

#include <cmpift.h>

#include <cstddef>
#include <memory>
#include <vector>

namespace host
{

namespace detail
{
struct BrokerState;
class Arena;
struct ContextObject;
struct ResultObject;
} // namespace detail

// An in-process CMPI broker: the function tables a provider calls, with
// memory handled like SFCB and OpenPegasus handle it. Objects made while a
// Request is open on the calling thread (or while the thread is attached
// to a broker-made context) are freed when it closes (or detaches);
// others live as long as the broker. Thread-safe.
class Broker
{
  public:
    explicit Broker(Schema schema = selSchema());
    ~Broker();
    Broker(const Broker&) = delete;
    Broker& operator=(const Broker&) = delete;

    const CMPIBroker* cmpi() const;
    FaultPlan& faults();
    const Schema& schema() const;

    std::vector<TraceRecord> traces() const;
    void clearTraces();
    std::vector<LogRecord> logs() const;
    std::vector<DeliveredIndication> indications() const;
    void clearIndications();

    // Objects made by clone() (or prepareAttachThread) and not released.
    std::size_t outstandingClones() const;
    std::size_t outstandingPreparedContexts() const;
    // Objects made outside any request or attachment.
    std::size_t brokerOwnedObjects() const;

    // One provider operation: a context and a result, and the scope that
    // owns every object made on this thread until it is destroyed. Must be
    // destroyed on the thread that made it.
    class Request
    {
      public:
        explicit Request(Broker& broker);
        ~Request();
        Request(const Request&) = delete;
        Request& operator=(const Request&) = delete;

        const CMPIContext* context() const;
        const CMPIResult* result() const;
        // The status and everything returned so far, copied out.
        Outcome finish(CMPIStatus status);

      private:
        detail::BrokerState& state_;
        std::unique_ptr<detail::Arena> arena_;
        Outcome outcome_;
        detail::ContextObject* context_;
        detail::ResultObject* result_;
    };

    // Helpers for tests and the host (objects owned like any other, so
    // normally by the open Request). None of them counts as a provider
    // call in the fault plan.
    CMPIObjectPath* makeObjectPath(const ObjectPath& path);
    CMPIInstance* makeInstance(const Instance& instance);
    CMPIArgs* makeArgs(const NamedValues& args = {});
    // Copy out; throw std::invalid_argument for objects not made by a
    // broker (or with a NULL handle).
    static Instance toInstance(const CMPIInstance* instance);
    static ObjectPath toObjectPath(const CMPIObjectPath* path);
    static Value toValue(const CMPIData& data);
    static NamedValues toArgs(const CMPIArgs* args);
    static std::optional<std::string> toText(const CMPIString* string);

  private:
    std::unique_ptr<detail::BrokerState> state_;
};

} // namespace host
