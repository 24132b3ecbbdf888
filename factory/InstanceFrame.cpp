#include "InstanceFrame.h"

#include "CmpiValues.h"
#include "Support.h"

#include <string>

namespace QX::SELComposite
{

namespace
{

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

} // namespace QX::SELComposite
