#pragma once

#include <cmpidt.h>
#include <cmpift.h>

#include <atomic>
#include <string>
#include <string_view>

namespace QX::SELComposite
{

/** The broker handed over by the object manager; the factory called last
 *  wins. */
extern std::atomic<const CMPIBroker*> broker;

/** Logger component of the provider operations. A constant, not a string
 * object: threads still tracing while the library's statics are destroyed read
 * it. */
inline constexpr std::string_view loggerSELProvider = "Corvane.SELProvider";

CMPIStatus SEL_Cleanup(CMPIInstanceMI* mi, const CMPIContext* context,
                       CMPIBoolean terminating);
CMPIStatus SEL_EnumInstanceNames(CMPIInstanceMI* mi, const CMPIContext* context,
                                 const CMPIResult* result,
                                 const CMPIObjectPath* reference);
CMPIStatus SEL_EnumInstances(CMPIInstanceMI* mi, const CMPIContext* context,
                             const CMPIResult* result,
                             const CMPIObjectPath* reference,
                             const char** properties);
CMPIStatus SEL_GetInstance(CMPIInstanceMI* mi, const CMPIContext* context,
                           const CMPIResult* result,
                           const CMPIObjectPath* objectPath,
                           const char** properties);
CMPIStatus SEL_CreateInstance(CMPIInstanceMI* mi, const CMPIContext* context,
                              const CMPIResult* result,
                              const CMPIObjectPath* objectPath,
                              const CMPIInstance* instance);
CMPIStatus SEL_ModifyInstance(CMPIInstanceMI* mi, const CMPIContext* context,
                              const CMPIResult* result,
                              const CMPIObjectPath* objectPath,
                              const CMPIInstance* instance,
                              const char** properties);
CMPIStatus SEL_DeleteInstance(CMPIInstanceMI* mi, const CMPIContext* context,
                              const CMPIResult* result,
                              const CMPIObjectPath* objectPath);
CMPIStatus SEL_ExecQuery(CMPIInstanceMI* mi, const CMPIContext* context,
                         const CMPIResult* result,
                         const CMPIObjectPath* objectPath, const char* query,
                         const char* language);

CMPIStatus SEL_MethodCleanup(CMPIMethodMI* mi, const CMPIContext* context,
                             CMPIBoolean terminating);
CMPIStatus SEL_InvokeMethod(CMPIMethodMI* mi, const CMPIContext* context,
                            const CMPIResult* result,
                            const CMPIObjectPath* objectPath,
                            const char* method, const CMPIArgs* in,
                            CMPIArgs* out);

CMPIStatus SEL_IndicationCleanup(CMPIIndicationMI* mi,
                                 const CMPIContext* context,
                                 CMPIBoolean terminating);
CMPIStatus SEL_AuthorizeFilter(CMPIIndicationMI* mi, const CMPIContext* context,
                               const CMPISelectExp* filter,
                               const char* className,
                               const CMPIObjectPath* objectPath,
                               const char* owner);
CMPIStatus SEL_MustPoll(CMPIIndicationMI* mi, const CMPIContext* context,
                        const CMPISelectExp* filter, const char* className,
                        const CMPIObjectPath* objectPath);
CMPIStatus SEL_ActivateFilter(CMPIIndicationMI* mi, const CMPIContext* context,
                              const CMPISelectExp* filter,
                              const char* className,
                              const CMPIObjectPath* objectPath,
                              CMPIBoolean firstActivation);
CMPIStatus SEL_DeActivateFilter(CMPIIndicationMI* mi,
                                const CMPIContext* context,
                                const CMPISelectExp* filter,
                                const char* className,
                                const CMPIObjectPath* objectPath,
                                CMPIBoolean lastActivation);
CMPIStatus SEL_EnableIndications(CMPIIndicationMI* mi,
                                 const CMPIContext* context);
CMPIStatus SEL_DisableIndications(CMPIIndicationMI* mi,
                                  const CMPIContext* context);

/** The three function tables, as the factories hand them out. */
extern CMPIInstanceMIFT instMIFT__;
extern CMPIMethodMIFT methMIFT__;
extern CMPIIndicationMIFT indMIFT__;

} // namespace QX::SELComposite

extern "C"
{
    CMPI_EXPORT CMPIInstanceMI*
    SELProvider_Create_InstanceMI(const CMPIBroker* broker,
                                  const CMPIContext* context,
                                  CMPIStatus* status);
    CMPI_EXPORT CMPIMethodMI*
    SELProvider_Create_MethodMI(const CMPIBroker* broker,
                                const CMPIContext* context, CMPIStatus* status);
    CMPI_EXPORT CMPIIndicationMI*
    SELProvider_Create_IndicationMI(const CMPIBroker* broker,
                                    const CMPIContext* context,
                                    CMPIStatus* status);
}
