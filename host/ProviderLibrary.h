#pragma once

#include <cmpift.h>

#include <stdexcept>
#include <string>

namespace host
{

// A provider library could not be loaded or lacks an entry point.
class LoadError : public std::runtime_error
{
  public:
    using std::runtime_error::runtime_error;
};

// A provider shared library, opened like a CIMOM opens it, with its MI
// factories found by name: "_Generic_Create_<Type>MI" (given the provider
// name) or "<provider>_Create_<Type>MI". A library exporting both forms for
// the same MI type is rejected, as OpenPegasus rejects it.
class ProviderLibrary
{
  public:
    // Throws LoadError (a std::runtime_error) with the dlerror() text.
    ProviderLibrary(const std::string& path, std::string providerName);
    ~ProviderLibrary();
    ProviderLibrary(const ProviderLibrary&) = delete;
    ProviderLibrary& operator=(const ProviderLibrary&) = delete;

    // Call the factory; throw LoadError if the library has none.
    CMPIInstanceMI* createInstanceMI(const CMPIBroker* broker,
                                     const CMPIContext* context,
                                     CMPIStatus* status) const;
    CMPIMethodMI* createMethodMI(const CMPIBroker* broker,
                                 const CMPIContext* context,
                                 CMPIStatus* status) const;
    CMPIIndicationMI* createIndicationMI(const CMPIBroker* broker,
                                         const CMPIContext* context,
                                         CMPIStatus* status) const;

    void* symbol(const char* name) const; // nullptr if absent
    const std::string& path() const
    {
        return path_;
    }
    const std::string& providerName() const
    {
        return providerName_;
    }

  private:
    template <typename MI>
    MI* create(const char* type, const CMPIBroker* broker,
               const CMPIContext* context, CMPIStatus* status) const;

    std::string path_;
    std::string providerName_;
    void* handle_;
};

} // namespace host
