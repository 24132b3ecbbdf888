#include "CmpiValues.h"
#include "ObjectPathCompare.h"
#include "ProviderTrace.h"
#include "SELObjectFactory.h"
#include "SELProvider.h"
#include "Support.h"

#include <cstdint>
#include <string>
#include <vector>

namespace QX::SELComposite
{

using namespace provider;

namespace
{

constexpr const char* noKeysText = "At least one key should be passed";
constexpr const char* factoryFailedText = "getAllSELCMPIInstances Failed";

/** Characters of the class name of @p path; the status of both queries
 *  goes to @p status. */
const char* classNameOf(const CMPIObjectPath* path, CMPIStatus* status)
{
    return charsOf(path->ft->getClassName(path, status), status);
}

const char* nameSpaceOf(const CMPIObjectPath* path, CMPIStatus* status)
{
    return charsOf(path->ft->getNameSpace(path, status), status);
}

/** The loops run over the instance count taken as 16 bits. */
std::uint16_t countOf(const std::vector<CMPIInstance*>& instances)
{
    return static_cast<std::uint16_t>(instances.size());
}

/**
 * Builds every instance of the request's class into @p instances. When the
 * factory reports failure, logs it and returns false: the caller then
 * returns the status as the factory left it, without any result.
 */
bool buildInstances(const char* function, SELObjectFactory& factory,
                    const CMPIContext* context, const CMPIObjectPath* path,
                    const char* className, const char** properties,
                    std::vector<CMPIInstance*>& instances, CMPIStatus* status)
{
    instances.reserve(
        static_cast<std::uint16_t>(factory.getNumberOfInstances()));
    if (factory.getAllSELCMPIInstances(broker.load(), context, path, className,
                                       properties, false, instances,
                                       status) == 0)
    {
        return true;
    }
    logMessage(function, unitFile, __LINE__, loggerSELProvider,
               LOG_LEVEL_FAILURE, factoryFailedText);
    return false;
}

} // namespace

CMPIStatus SEL_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                 const CMPIResult* result,
                                 const CMPIObjectPath* reference)
{
    constexpr const char* function = "SEL_EnumInstanceNames";
    markEntry(function, __LINE__);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    const char* className = classNameOf(reference, &status);
    SELObjectFactory factory(className);
    logVariable(function, unitFile, __LINE__, loggerSELProvider, "classname",
                className);
    std::vector<CMPIInstance*> instances;
    if (!buildInstances(function, factory, context, reference, className,
                        nullptr, instances, &status))
    {
        markExit(function, __LINE__);
        return status;
    }
    const std::string hostName = getSystemName();
    const std::uint16_t count = countOf(instances);
    for (std::uint16_t i = 0; i < count; ++i)
    {
        const CMPIInstance* instance = instances.at(i);
        if (!isUsable(instance))
        {
            continue;
        }
        CMPIObjectPath* path = instance->ft->getObjectPath(instance, &status);
        if (!isUsable(path))
        {
            continue;
        }
        path->ft->setNameSpace(path, nameSpaceOf(reference, &status));
        path->ft->setHostname(path, hostName.c_str());
        result->ft->returnObjectPath(result, path);
    }
    result->ft->returnDone(result);
    markExit(function, __LINE__);
    return status;
}

CMPIStatus SEL_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                             const CMPIResult* result,
                             const CMPIObjectPath* reference,
                             const char** properties)
{
    constexpr const char* function = "SEL_EnumInstances";
    markEntry(function, __LINE__);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    const char* className = classNameOf(reference, &status);
    logVariable(function, unitFile, __LINE__, loggerSELProvider, "classname",
                className);
    SELObjectFactory factory(className);
    std::vector<CMPIInstance*> instances;
    if (!buildInstances(function, factory, context, reference, className,
                        properties, instances, &status))
    {
        markExit(function, __LINE__);
        return status;
    }
    const std::uint16_t count = countOf(instances);
    for (std::uint16_t i = 0; i < count; ++i)
    {
        result->ft->returnInstance(result, instances.at(i));
    }
    result->ft->returnDone(result);
    markExit(function, __LINE__);
    return status;
}

CMPIStatus SEL_GetInstance(CMPIInstanceMI*, const CMPIContext* context,
                           const CMPIResult* result,
                           const CMPIObjectPath* objectPath,
                           const char** properties)
{
    constexpr const char* function = "SEL_GetInstance";
    markEntry(function, __LINE__);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    const CMPIBroker* const currentBroker = broker.load();
    if (objectPath->ft->getKeyCount(objectPath, &status) == 0)
    {
        status.rc = CMPI_RC_ERR_FAILED;
        if (currentBroker != nullptr)
        {
            status.msg = currentBroker->eft->newString(currentBroker,
                                                       noKeysText, nullptr);
            currentBroker->eft->trace(currentBroker, CMPI_LEV_INFO,
                                      "SELProvider", noKeysText, nullptr);
        }
        logMessage(function, unitFile, __LINE__, loggerSELProvider,
                   LOG_LEVEL_FAILURE, noKeysText);
        result->ft->returnDone(result);
        markExit(function, __LINE__);
        return status;
    }
    const char* className = classNameOf(objectPath, &status);
    logVariable(function, unitFile, __LINE__, loggerSELProvider, "classname",
                className);
    SELObjectFactory factory(className);
    std::vector<CMPIInstance*> instances;
    if (!buildInstances(function, factory, context, objectPath, className,
                        properties, instances, &status))
    {
        markExit(function, __LINE__);
        return status;
    }
    const std::uint16_t count = countOf(instances);
    for (std::uint16_t i = 0; i < count; ++i)
    {
        const CMPIInstance* instance = instances.at(i);
        if (!isUsable(instance))
        {
            continue;
        }
        const CMPIObjectPath* path =
            instance->ft->getObjectPath(instance, &status);
        if (isObjPathsEqual(path, objectPath, false))
        {
            result->ft->returnInstance(result, instance);
            break;
        }
    }
    result->ft->returnDone(result);
    markExit(function, __LINE__);
    return status;
}

} // namespace QX::SELComposite
