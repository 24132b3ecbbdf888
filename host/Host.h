#pragma once

#include "Broker.h"
#include "Outcome.h"
#include "ProviderLibrary.h"
#include "Schema.h"
#include "Values.h"

#include <cmpift.h>

#include <atomic>
#include <memory>
#include <string>
#include <vector>

namespace host
{

// MI factories of a provider linked into the program (instead of loaded).
struct ProviderFactories
{
    CMPIInstanceMI* (*instance)(const CMPIBroker*, const CMPIContext*,
                                CMPIStatus*) = nullptr;
    CMPIMethodMI* (*method)(const CMPIBroker*, const CMPIContext*,
                            CMPIStatus*) = nullptr;
    CMPIIndicationMI* (*indication)(const CMPIBroker*, const CMPIContext*,
                                    CMPIStatus*) = nullptr;
};

// A subscription's filter as an object manager holds it.
struct IndicationFilter
{
    std::string query; // e.g. SELECT * FROM Some_AlertIndication
    std::string language = "WQL";
    std::string className; // the indication class the query selects
    std::string sourceNamespace;

    // sourceNamespace:className, the class path passed with the filter.
    ObjectPath classPath() const;
    // A filter for every indication of @p className.
    static IndicationFilter forClass(std::string className,
                                     std::string sourceNamespace);
};

// The provider a Host loads and how it presents the broker to it.
struct HostOptions
{
    // The provider library, whose factories are named after providerName
    // (<providerName>_Create_InstanceMI and its siblings); when empty, the
    // factories below, linked into the program, are used instead.
    std::string libraryPath;
    std::string providerName;
    ProviderFactories factories;
    // The classes the provider serves, for the instance paths the broker
    // builds.
    Schema schema;
    // Hand each MI factory a broker pointer of its own (over one broker), as
    // OpenPegasus does, instead of the same one for all, as SFCB does.
    bool brokerPerMI = false;
};

// A broker with a provider loaded into it, and the operations a CIMOM
// performs on the provider's behalf. Loading creates the instance, method
// and indication MIs; destroying disables indications if they are enabled
// and calls cleanup (terminating) unless cleanupAll(true) already did, as
// SFCB does at shutdown, then unloads the library.
class Host
{
  public:
    // Throws LoadError (a std::runtime_error) if the library cannot be
    // loaded, lacks a factory, or a factory fails.
    explicit Host(HostOptions options);
    ~Host();
    Host(const Host&) = delete;
    Host& operator=(const Host&) = delete;

    Broker& broker();
    CMPIInstanceMI* instanceMI();
    CMPIMethodMI* methodMI();
    CMPIIndicationMI* indicationMI();

    // With @p handlers, the results go to them as the provider returns
    // them (see ResultHandlers) rather than into the Outcome.
    Outcome enumerateInstanceNames(const ObjectPath& reference,
                                   const ResultHandlers* handlers = nullptr);
    Outcome
    enumerateInstances(const ObjectPath& reference,
                       const std::vector<std::string>* properties = nullptr,
                       const ResultHandlers* handlers = nullptr);
    Outcome getInstance(const ObjectPath& path,
                        const std::vector<std::string>* properties = nullptr,
                        const ResultHandlers* handlers = nullptr);
    Outcome createInstance(const ObjectPath& path, const Instance& instance);
    Outcome
    modifyInstance(const ObjectPath& path, const Instance& instance,
                   const std::vector<std::string>* properties = nullptr);
    Outcome deleteInstance(const ObjectPath& path);
    Outcome execQuery(const ObjectPath& path, const std::string& query,
                      const std::string& language);
    Outcome invokeMethod(const ObjectPath& path, const std::string& method,
                         const NamedValues& in = {});
    // The indication MI's filter operations. Each passes a select
    // expression carrying the filter's query and language, the filter's
    // class name and a class path: the filter's own unless @p classPath is
    // given (SFCB deactivates with a path whose class name is empty).
    Outcome authorizeFilter(const IndicationFilter& filter,
                            const std::string& owner);
    Outcome mustPoll(const IndicationFilter& filter);
    Outcome activateFilter(const IndicationFilter& filter, bool firstActivation,
                           const ObjectPath* classPath = nullptr);
    Outcome deActivateFilter(const IndicationFilter& filter,
                             bool lastActivation,
                             const ObjectPath* classPath = nullptr);
    Outcome enableIndications();
    Outcome disableIndications();
    // Indications delivered into @p nameSpace from now on.
    IndicationInbox listen(std::string nameSpace);
    // The broker pointer each MI factory was given.
    const CMPIBroker* instanceBroker() const;
    const CMPIBroker* methodBroker() const;
    const CMPIBroker* indicationBroker() const;
    // Calls the three cleanup slots; the first failure's code is returned
    // (its message belonged to the request and is not kept).
    CMPIStatus cleanupAll(bool terminating);

  private:
    void createMIs(const ProviderFactories& factories);
    void createEachMI(const ProviderFactories& factories);

    Broker broker_;
    bool brokerPerMI_ = false;
    std::unique_ptr<ProviderLibrary> library_;
    CMPIInstanceMI* instanceMI_ = nullptr;
    CMPIMethodMI* methodMI_ = nullptr;
    CMPIIndicationMI* indicationMI_ = nullptr;
    bool terminated_ = false;
    // Enable and disable may come from different threads.
    std::atomic<bool> indicationsEnabled_{false};
};

} // namespace host
