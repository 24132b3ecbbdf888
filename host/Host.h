#pragma once

#include "Broker.h"
#include "Outcome.h"
#include "ProviderLibrary.h"
#include "Schema.h"
#include "Values.h"

#include <cmpift.h>

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
    explicit Host(const std::string& libraryPath,
                  std::string providerName = "SELProvider",
                  Schema schema = selSchema());
    explicit Host(const ProviderFactories& factories,
                  Schema schema = selSchema());
    ~Host();
    Host(const Host&) = delete;
    Host& operator=(const Host&) = delete;

    Broker& broker();
    CMPIInstanceMI* instanceMI();
    CMPIMethodMI* methodMI();
    CMPIIndicationMI* indicationMI();

    Outcome enumerateInstanceNames(const ObjectPath& reference);
    Outcome
    enumerateInstances(const ObjectPath& reference,
                       const std::vector<std::string>* properties = nullptr);
    Outcome getInstance(const ObjectPath& path,
                        const std::vector<std::string>* properties = nullptr);
    Outcome createInstance(const ObjectPath& path, const Instance& instance);
    Outcome
    modifyInstance(const ObjectPath& path, const Instance& instance,
                   const std::vector<std::string>* properties = nullptr);
    Outcome deleteInstance(const ObjectPath& path);
    Outcome execQuery(const ObjectPath& path, const std::string& query,
                      const std::string& language);
    Outcome invokeMethod(const ObjectPath& path, const std::string& method,
                         const NamedValues& in = {});
    Outcome enableIndications();
    Outcome disableIndications();
    // Calls the three cleanup slots; the first failure's code is returned
    // (its message belonged to the request and is not kept).
    CMPIStatus cleanupAll(bool terminating);

  private:
    void createMIs(const ProviderFactories* factories);
    void createEachMI(const ProviderFactories* factories);

    Broker broker_;
    std::unique_ptr<ProviderLibrary> library_;
    CMPIInstanceMI* instanceMI_ = nullptr;
    CMPIMethodMI* methodMI_ = nullptr;
    CMPIIndicationMI* indicationMI_ = nullptr;
    bool terminated_ = false;
    bool indicationsEnabled_ = false;
};

} // namespace host
