#include "CmpiValues.h"
#include "ProviderTrace.h"
#include "SELObjectFactory.h"
#include "SELProvider.h"

#include <cstdint>
#include <strings.h>

namespace QX::SELComposite
{

using namespace provider;

namespace
{

bool equalIgnoringCase(const char* left, const char* right)
{
    return left != nullptr && right != nullptr &&
           ::strcasecmp(left, right) == 0;
}

} // namespace

CMPIStatus SEL_InvokeMethod(CMPIMethodMI*, const CMPIContext*,
                            const CMPIResult* result,
                            const CMPIObjectPath* objectPath,
                            const char* method, const CMPIArgs*, CMPIArgs*)
{
    constexpr const char* function = "SEL_InvokeMethod";
    markProviderEntry(loggerSELProvider, function, unitFile, __LINE__);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    const char* className =
        charsOf(objectPath->ft->getClassName(objectPath, &status), &status);
    if (equalIgnoringCase(className, LOG_CLASS_NAME) &&
        equalIgnoringCase(method, "ClearLog"))
    {
        SELObjectFactory factory(className);
        if (factory.executeClearLog() != 0)
        {
            status.rc = CMPI_RC_ERR_FAILED;
            const CMPIBroker* const currentBroker = broker.load();
            if (currentBroker != nullptr)
            {
                status.msg = currentBroker->eft->newString(
                    currentBroker, "Execute Method Failed", nullptr);
            }
        }
    }
    // The method's return value mirrors the status code.
    returnTypedData(result, static_cast<std::uint32_t>(status.rc));
    result->ft->returnDone(result);
    markProviderExit(loggerSELProvider, function, unitFile, __LINE__);
    return status;
}

} // namespace QX::SELComposite
