#include "CmpiValues.h"
#include "SELIndication.h"
#include "SELProvider.h"
#include "sdk/qxlib/include/Trace.h"

namespace QX::SELComposite
{

namespace
{

constexpr const char* unitFile = "SELProvider.cpp";

void markEntry(const char* function, int line)
{
    markProviderEntry(loggerSELProvider, function, unitFile,
                      static_cast<unsigned>(line));
}

void markExit(const char* function, int line)
{
    markProviderExit(loggerSELProvider, function, unitFile,
                     static_cast<unsigned>(line));
}

/** The indication class named by the filter's class path; the status of
 *  both queries goes to @p status. */
const char* indicationClassOf(const CMPIObjectPath* path, CMPIStatus* status)
{
    if (path == nullptr || path->ft == nullptr)
    {
        return nullptr;
    }
    return charsOf(path->ft->getClassName(path, status), status);
}

} // namespace

CMPIStatus SEL_ActivateFilter(CMPIIndicationMI*, const CMPIContext* context,
                              const CMPISelectExp*, const char*,
                              const CMPIObjectPath* objectPath, CMPIBoolean)
{
    constexpr const char* function = "SEL_ActivateFilter";
    markEntry(function, __LINE__);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    unsigned short id = UNKNOWN_INDICATION_ID;
    const char* className = indicationClassOf(objectPath, &status);
    logVariable(function, unitFile, __LINE__, loggerSELProvider, "className",
                className);
    if (getSELIndicationId(className, id))
    {
        // Every activation prepares and saves a context of its own: the
        // delivery threads attach to it long after this call has returned.
        const CMPIBroker* const current = broker.load();
        CMPIContext* const prepared =
            current != nullptr
                ? current->bft->prepareAttachThread(current, context)
                : nullptr;
        saveSELIndicationContext(current, prepared);
        subscribeForSELIndication(id);
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
    unsigned short id = UNKNOWN_INDICATION_ID;
    const char* className = indicationClassOf(objectPath, &status);
    logVariable(function, unitFile, __LINE__, loggerSELProvider, "className",
                className);
    if (getSELIndicationId(className, id))
    {
        unsubscribeForSELIndication(id);
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
