#include "SELProvider.h"

#include "BoundaryGuard.h"

namespace QX::SELComposite
{

std::atomic<const CMPIBroker*> broker{nullptr};

namespace
{

constexpr CMPIStatus statusOf(CMPIrc rc)
{
    return CMPIStatus{rc, nullptr};
}

} // namespace

CMPIStatus boundaryFailure(const char* what)
{
    CMPIStatus status = statusOf(CMPI_RC_ERR_FAILED);
    const CMPIBroker* current = broker.load();
    if (current != nullptr)
    {
        const std::string text = std::string("Internal error: ") + what;
        status.msg = current->eft->newString(current, text.c_str(), nullptr);
    }
    return status;
}

CMPIStatus missingArgument(const char* what)
{
    CMPIStatus status = statusOf(CMPI_RC_ERR_FAILED);
    const CMPIBroker* current = broker.load();
    if (current != nullptr)
    {
        const std::string text = std::string("No ") + what + " was passed";
        status.msg = current->eft->newString(current, text.c_str(), nullptr);
    }
    return status;
}

CMPIStatus SEL_Cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean)
{
    return statusOf(CMPI_RC_OK);
}

CMPIStatus SEL_CreateInstance(CMPIInstanceMI*, const CMPIContext*,
                              const CMPIResult*, const CMPIObjectPath*,
                              const CMPIInstance*)
{
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus SEL_ModifyInstance(CMPIInstanceMI*, const CMPIContext*,
                              const CMPIResult*, const CMPIObjectPath*,
                              const CMPIInstance*, const char**)
{
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus SEL_DeleteInstance(CMPIInstanceMI*, const CMPIContext*,
                              const CMPIResult*, const CMPIObjectPath*)
{
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus SEL_ExecQuery(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                         const CMPIObjectPath*, const char*, const char*)
{
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus SEL_MethodCleanup(CMPIMethodMI*, const CMPIContext*, CMPIBoolean)
{
    return statusOf(CMPI_RC_OK);
}

CMPIStatus SEL_IndicationCleanup(CMPIIndicationMI*, const CMPIContext*,
                                 CMPIBoolean)
{
    return statusOf(CMPI_RC_OK);
}

CMPIStatus SEL_AuthorizeFilter(CMPIIndicationMI*, const CMPIContext*,
                               const CMPISelectExp*, const char*,
                               const CMPIObjectPath*, const char*)
{
    return statusOf(CMPI_RC_OK);
}

CMPIStatus SEL_MustPoll(CMPIIndicationMI*, const CMPIContext*,
                        const CMPISelectExp*, const char*,
                        const CMPIObjectPath*)
{
    return statusOf(CMPI_RC_OK);
}

CMPIInstanceMIFT instMIFT__ = {
    CMPICurrentVersion,
    CMPICurrentVersion,
    "instanceSELProvider",
    SEL_Cleanup,
    Guarded<&SEL_EnumInstanceNames>::call,
    Guarded<&SEL_EnumInstances>::call,
    Guarded<&SEL_GetInstance>::call,
    SEL_CreateInstance,
    SEL_ModifyInstance,
    SEL_DeleteInstance,
    SEL_ExecQuery,
};

CMPIMethodMIFT methMIFT__ = {
    CMPICurrentVersion,
    CMPICurrentVersion,
    "methodSELProvider",
    SEL_MethodCleanup,
    Guarded<&SEL_InvokeMethod>::call,
};

CMPIIndicationMIFT indMIFT__ = {
    CMPICurrentVersion,
    CMPICurrentVersion,
    "IndicationSELProvider",
    SEL_IndicationCleanup,
    SEL_AuthorizeFilter,
    SEL_MustPoll,
    Guarded<&SEL_ActivateFilter>::call,
    Guarded<&SEL_DeActivateFilter>::call,
    Guarded<&SEL_EnableIndications>::call,
    Guarded<&SEL_DisableIndications>::call,
};

namespace
{

CMPIInstanceMI instanceMI = {nullptr, &instMIFT__};
CMPIMethodMI methodMI = {nullptr, &methMIFT__};
CMPIIndicationMI indicationMI = {nullptr, &indMIFT__};

} // namespace

} // namespace QX::SELComposite

extern "C"
{

    CMPIInstanceMI* SELProvider_Create_InstanceMI(const CMPIBroker* broker,
                                                  const CMPIContext*,
                                                  CMPIStatus*)
    {
        QX::SELComposite::broker.store(broker);
        return &QX::SELComposite::instanceMI;
    }

    CMPIMethodMI* SELProvider_Create_MethodMI(const CMPIBroker* broker,
                                              const CMPIContext*, CMPIStatus*)
    {
        QX::SELComposite::broker.store(broker);
        return &QX::SELComposite::methodMI;
    }

    CMPIIndicationMI* SELProvider_Create_IndicationMI(const CMPIBroker* broker,
                                                      const CMPIContext*,
                                                      CMPIStatus*)
    {
        QX::SELComposite::broker.store(broker);
        return &QX::SELComposite::indicationMI;
    }
}
