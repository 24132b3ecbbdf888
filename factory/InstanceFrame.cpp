#include "InstanceFrame.h"

#include "CmpiValues.h"
#include "PropertySelection.h"
#include "SELObjectFactory.h"
#include "Support.h"
#include "sdk/qxlib/include/Trace.h"

#include <string>

namespace QX::SELComposite
{

namespace
{

constexpr const char* unitFile = "SELObjectFactory.cpp";

const char* requestNamespace(const CMPIObjectPath* requestPath,
                             CMPIStatus* status)
{
    if (requestPath == nullptr || requestPath->ft == nullptr)
    {
        return nullptr;
    }
    return charsOf(requestPath->ft->getNameSpace(requestPath, status), status);
}

} // namespace

InstanceFrame newInstanceFrame(const CMPIBroker* broker,
                               const CMPIObjectPath* requestPath,
                               const char* className, CMPIStatus* status)
{
    InstanceFrame frame;
    if (broker == nullptr)
    {
        return frame;
    }
    const char* nameSpace = requestNamespace(requestPath, status);
    CMPIObjectPath* path =
        broker->eft->newObjectPath(broker, nameSpace, className, nullptr);
    if (!isUsable(path))
    {
        return frame;
    }
    path->ft->setNameSpace(path, requestNamespace(requestPath, status));
    const std::string hostName = getSystemName();
    path->ft->setHostname(path, hostName.c_str());
    frame.instance = broker->eft->newInstance(broker, path, nullptr);
    frame.usable = isUsable(frame.instance);
    return frame;
}

CMPIInstance* buildInstance(const char* function, const CMPIBroker* broker,
                            const CMPIObjectPath* requestPath,
                            const char* className, const char** keys,
                            const char** properties, bool keysOnly,
                            CMPIStatus* status, const InstanceFill& fill)
{
    logFunctionEdge(function, unitFile, __LINE__, loggerSELObjectFactory,
                    ENTRY_TRACE);
    const PropertySelection selection(properties, keysOnly);
    const InstanceFrame frame =
        newInstanceFrame(broker, requestPath, className, status);
    if (frame.usable)
    {
        if (!keysOnly)
        {
            frame.instance->ft->setPropertyFilter(frame.instance, properties,
                                                  keys);
        }
        fill(frame.instance, selection);
    }
    logFunctionEdge(function, unitFile, __LINE__, loggerSELObjectFactory,
                    EXIT_TRACE);
    return frame.instance;
}

} // namespace QX::SELComposite
