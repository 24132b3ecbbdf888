#include "SELProvider.h"

namespace QX::SELComposite
{

// Indication delivery is not wired to the instrumentation's alerts yet, so
// subscriptions are refused rather than accepted and never served. The
// slots must exist: object managers call them without checking for NULL.

namespace
{

constexpr CMPIStatus notSupported()
{
    return CMPIStatus{CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
}

} // namespace

CMPIStatus SEL_ActivateFilter(CMPIIndicationMI*, const CMPIContext*,
                              const CMPISelectExp*, const char*,
                              const CMPIObjectPath*, CMPIBoolean)
{
    return notSupported();
}

CMPIStatus SEL_DeActivateFilter(CMPIIndicationMI*, const CMPIContext*,
                                const CMPISelectExp*, const char*,
                                const CMPIObjectPath*, CMPIBoolean)
{
    return notSupported();
}

CMPIStatus SEL_EnableIndications(CMPIIndicationMI*, const CMPIContext*)
{
    return notSupported();
}

CMPIStatus SEL_DisableIndications(CMPIIndicationMI*, const CMPIContext*)
{
    return notSupported();
}

} // namespace QX::SELComposite
