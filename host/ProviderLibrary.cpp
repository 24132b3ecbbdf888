#include "ProviderLibrary.h"

#include <dlfcn.h>

namespace host
{

ProviderLibrary::ProviderLibrary(const std::string& path,
                                 std::string providerName) :
    path_(path),
    providerName_(std::move(providerName)),
    // SFCB loads providers RTLD_GLOBAL: exported symbols can collide.
    handle_(dlopen(path.c_str(), RTLD_NOW | RTLD_GLOBAL))
{
    if (handle_ == nullptr)
    {
        const char* error = dlerror();
        throw LoadError(error ? error : "cannot load " + path);
    }
}

ProviderLibrary::~ProviderLibrary()
{
    dlclose(handle_);
}

void* ProviderLibrary::symbol(const char* name) const
{
    dlerror();
    return dlsym(handle_, name);
}

template <typename MI>
MI* ProviderLibrary::create(const char* type, const CMPIBroker* broker,
                            const CMPIContext* context,
                            CMPIStatus* status) const
{
    using Specific =
        MI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
    using Generic = MI* (*)(const CMPIBroker*, const CMPIContext*, const char*,
                            CMPIStatus*);
    const std::string specificName = providerName_ + "_Create_" + type + "MI";
    const std::string genericName =
        std::string("_Generic_Create_") + type + "MI";
    void* specific = symbol(specificName.c_str());
    const char* specificError = specific ? nullptr : dlerror();
    const std::string missing =
        specificError ? specificError
                      : path_ + ": undefined symbol: " + specificName;
    void* generic = symbol(genericName.c_str());
    if (specific != nullptr && generic != nullptr)
    {
        throw LoadError(path_ + " exports both " + specificName + " and " +
                        genericName);
    }
    if (generic != nullptr)
    {
        return reinterpret_cast<Generic>(generic)(
            broker, context, providerName_.c_str(), status);
    }
    if (specific == nullptr)
    {
        throw LoadError(missing);
    }
    return reinterpret_cast<Specific>(specific)(broker, context, status);
}

CMPIInstanceMI* ProviderLibrary::createInstanceMI(const CMPIBroker* broker,
                                                  const CMPIContext* context,
                                                  CMPIStatus* status) const
{
    return create<CMPIInstanceMI>("Instance", broker, context, status);
}

CMPIMethodMI* ProviderLibrary::createMethodMI(const CMPIBroker* broker,
                                              const CMPIContext* context,
                                              CMPIStatus* status) const
{
    return create<CMPIMethodMI>("Method", broker, context, status);
}

CMPIIndicationMI*
ProviderLibrary::createIndicationMI(const CMPIBroker* broker,
                                    const CMPIContext* context,
                                    CMPIStatus* status) const
{
    return create<CMPIIndicationMI>("Indication", broker, context, status);
}

} // namespace host
