#pragma once

#include "Faults.h"
#include "IndicationInbox.h"
#include "Outcome.h"
#include "Schema.h"
#include "Values.h"

#include <cmpift.h>

#include <chrono>
#include <cstddef>
#include <memory>
#include <string>
#include <vector>

namespace host
{

namespace detail
{
struct BrokerState;
class OwnedObjects;
struct ContextObject;
struct ResultObject;
} // namespace detail

// An in-process CMPI broker: the function tables a provider calls, with
// memory handled like SFCB and OpenPegasus handle it. Objects made while a
// Request is open on the calling thread (or while the thread is attached
// to a broker-made context) are freed when it closes (or detaches);
// others live as long as the broker. Thread-safe. Destroying it waits (up
// to 10 s) for the threads providers started through it.
class Broker
{
  public:
    // Number of distinct CMPIBroker pointers the broker can hand out.
    static constexpr std::size_t viewCount = 3;

    // @p schema: the classes whose instance paths the broker builds from
    // their key properties.
    explicit Broker(Schema schema = {});
    ~Broker();
    Broker(const Broker&) = delete;
    Broker& operator=(const Broker&) = delete;

    const CMPIBroker* cmpi() const;
    // Distinct CMPIBroker pointers over this one broker (0 is cmpi()), as
    // OpenPegasus gives each MI a broker object of its own. Throws
    // std::out_of_range for an index of viewCount or more.
    const CMPIBroker* cmpiView(std::size_t index) const;
    FaultPlan& faults();
    const Schema& schema() const;

    std::vector<TraceRecord> traces() const;
    void clearTraces();
    std::vector<LogRecord> logs() const;
    // Receives, from now on, every indication delivered into @p nameSpace
    // (compared ignoring case), like a subscriber's listener.
    IndicationInbox listen(std::string nameSpace);
    // Indications accepted by deliverIndication, and of those, how many no
    // inbox was listening for.
    std::size_t deliveredIndications() const;
    std::size_t unheardIndications() const;

    // Threads started through newThread that have not returned yet, and a
    // bounded wait for them to end.
    std::size_t runningThreads() const;
    bool waitForThreads(std::chrono::milliseconds timeout);

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
        // From now on, results with a handler in @p handlers go to it
        // instead of into the Outcome; nullptr collects them again.
        // @p handlers must outlive the request or the next streamTo().
        void streamTo(const ResultHandlers* handlers);
        // The status and everything returned so far, handed over: what
        // the provider returns afterwards goes to the next finish().
        Outcome finish(CMPIStatus status);

      private:
        detail::BrokerState& state_;
        std::unique_ptr<detail::OwnedObjects> objects_;
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
    // The filter of a subscription, as object managers hand it to
    // activateFilter and its siblings.
    CMPISelectExp* makeSelectExp(const std::string& query,
                                 const std::string& language);
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
