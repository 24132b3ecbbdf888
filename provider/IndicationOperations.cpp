#include "CmpiValues.h"
#include "ProviderTrace.h"
#include "SELIndication.h"
#include "SELProvider.h"

#include <optional>

namespace QX::SELComposite
{

using namespace provider;

namespace
{

/** The indication id of the class named by the filter's class path, after
 *  tracing that name; none for a class that has none. The status of both
 *  queries goes to @p status. */
std::optional<unsigned short> filterIndicationId(const char* function,
                                                 const CMPIObjectPath* path,
                                                 CMPIStatus* status)
{
    const char* className =
        path == nullptr || path->ft == nullptr
            ? nullptr
            : charsOf(path->ft->getClassName(path, status), status);
    logVariable(function, unitFile, __LINE__, loggerSELProvider, "className",
                className);
    unsigned short id = UNKNOWN_INDICATION_ID;
    if (!getSELIndicationId(className, id))
    {
        return std::nullopt;
    }
    return id;
}

} // namespace

CMPIStatus SEL_ActivateFilter(CMPIIndicationMI*, const CMPIContext* context,
                              const CMPISelectExp*, const char*,
                              const CMPIObjectPath* objectPath, CMPIBoolean)
{
    constexpr const char* function = "SEL_ActivateFilter";
    markEntry(function, __LINE__);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    if (const auto id = filterIndicationId(function, objectPath, &status))
    {
        // Every activation prepares and saves a context of its own: the
        // delivery threads attach to it long after this call has returned.
        const CMPIBroker* const current = broker.load();
        CMPIContext* const prepared =
            current != nullptr
                ? current->bft->prepareAttachThread(current, context)
                : nullptr;
        saveSELIndicationContext(current, prepared);
        subscribeForSELIndication(*id);
    }
    markExit(function, __LINE__);
    return status;
}

CMPIStatus SEL_DeActivateFilter(CMPIIndicationMI*, const CMPIContext*,
                                const CMPISelectExp*, const char*,
                                const CMPIObjectPath* objectPath, CMPIBoolean)
{
    constexpr const char* function = "SEL_DeActivateFilter";
    markEntry(function, __LINE__);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    if (const auto id = filterIndicationId(function, objectPath, &status))
    {
        unsubscribeForSELIndication(*id);
    }
    markExit(function, __LINE__);
    return status;
}

CMPIStatus SEL_EnableIndications(CMPIIndicationMI*, const CMPIContext*)
{
    constexpr const char* function = "SEL_EnableIndications";
    markEntry(function, __LINE__);
    const CMPIStatus status{CMPI_RC_OK, nullptr};
    setSELEnable();
    markExit(function, __LINE__);
    return status;
}

CMPIStatus SEL_DisableIndications(CMPIIndicationMI*, const CMPIContext*)
{
    constexpr const char* function = "SEL_DisableIndications";
    markEntry(function, __LINE__);
    disableSELIndication();
    markExit(function, __LINE__);
    return CMPIStatus{CMPI_RC_OK, nullptr};
}

} // namespace QX::SELComposite
