#include "HostileCalls.h"

namespace hostile
{

void PrintTo(const Case& c, std::ostream* out)
{
    *out << c.name;
}

ObjectPath withClass(const std::string& className)
{
    return classPath(className);
}

ObjectPath logPath()
{
    ObjectPath path = classPath(logClass);
    path.setKey("CreationClassName", Value::string(logClass));
    path.setKey("Name", Value::string("IPMI SEL Log"));
    return path;
}

ObjectPath withManyKeys(ObjectPath path, unsigned count)
{
    for (unsigned i = path.keys.size(); i < count; ++i)
    {
        path.setKey("Extra" + std::to_string(i), Value::string("v"));
    }
    return path;
}

Expected failed(const char* message)
{
    Expected expected;
    expected.rc = CMPI_RC_ERR_FAILED;
    expected.message = message;
    return expected;
}

Expected enumerated(std::size_t paths, std::size_t instances)
{
    Expected expected;
    expected.done = true;
    expected.paths = paths;
    expected.instances = instances;
    return expected;
}

Expected methodValue(std::uint32_t value)
{
    Expected expected;
    expected.done = true;
    expected.returnValue = value;
    return expected;
}

CMPIStatus names(const Call& c, const CMPIContext* context,
                 const CMPIResult* result, const CMPIObjectPath* path)
{
    return c.instanceMI->ft->enumerateInstanceNames(c.instanceMI, context,
                                                    result, path);
}

CMPIStatus instances(const Call& c, const CMPIContext* context,
                     const CMPIResult* result, const CMPIObjectPath* path,
                     const char** properties)
{
    return c.instanceMI->ft->enumerateInstances(c.instanceMI, context, result,
                                                path, properties);
}

CMPIStatus get(const Call& c, const CMPIContext* context,
               const CMPIResult* result, const CMPIObjectPath* path,
               const char** properties)
{
    return c.instanceMI->ft->getInstance(c.instanceMI, context, result, path,
                                         properties);
}

CMPIStatus invoke(const Call& c, const CMPIContext* context,
                  const CMPIResult* result, const CMPIObjectPath* path,
                  const char* method, const CMPIArgs* in, CMPIArgs* out)
{
    return c.methodMI->ft->invokeMethod(c.methodMI, context, result, path,
                                        method, in, out);
}

} // namespace hostile
