// Hostile calls of invokeMethod.
#include "HostileCalls.h"

namespace hostile
{

std::vector<Case> methodCalls()
{
    return {
        {"ClearLogNullContext",
         [](const Call& c)
         {
             return invoke(c, nullptr, c.result, c.path(logPath()), "ClearLog",
                           c.broker.makeArgs(), c.broker.makeArgs());
         },
         methodValue(0)},
        {"ClearLogNullMI",
         [](const Call& c)
         {
             return c.methodMI->ft->invokeMethod(nullptr, c.context, c.result,
                                                 c.path(logPath()), "ClearLog",
                                                 nullptr, nullptr);
         },
         methodValue(0)},
        {"ClearLogThousandKeys",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result,
                           c.path(withManyKeys(logPath(), 1000)), "ClearLog",
                           nullptr, nullptr);
         },
         methodValue(0)},
        {"ClearLogInvalidUtf8ClassName",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result,
                           c.path(withClass(invalidUtf8)), "ClearLog", nullptr,
                           nullptr);
         },
         methodValue(0)},
        {"ClearLogNullResult",
         [](const Call& c)
         {
             return invoke(c, c.context, nullptr, c.path(logPath()), "ClearLog",
                           c.broker.makeArgs(), c.broker.makeArgs());
         },
         noResult},
        {"ClearLogNullPath",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result, nullptr, "ClearLog",
                           c.broker.makeArgs(), c.broker.makeArgs());
         },
         noPath},
        {"MethodNullName",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result, c.path(logPath()), nullptr,
                           c.broker.makeArgs(), c.broker.makeArgs());
         },
         methodValue(0)},
        {"ClearLogNullArguments",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result, c.path(logPath()),
                           "ClearLog", nullptr, nullptr);
         },
         methodValue(0)},
        {"ClearLogArgumentsOfWrongTypes",
         [](const Call& c)
         {
             host::NamedValues in;
             in.emplace_back("Name", Value::unsignedInt(CMPI_uint8, 7));
             in.emplace_back("ClearLog", Value::boolean(false));
             in.emplace_back(hugeName, Value::string(directives));
             return invoke(c, c.context, c.result, c.path(logPath()),
                           "ClearLog", c.broker.makeArgs(in),
                           c.broker.makeArgs(in));
         },
         methodValue(0)},
        {"MethodHugeName",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result, c.path(logPath()),
                           hugeName.c_str(), nullptr, nullptr);
         },
         methodValue(0)},
        {"MethodDirectivesInName",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result, c.path(logPath()),
                           directives.c_str(), nullptr, nullptr);
         },
         methodValue(0)},
        {"MethodInvalidUtf8Name",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result, c.path(logPath()),
                           invalidUtf8.c_str(), nullptr, nullptr);
         },
         methodValue(0)},
        {"ClearLogOnAHugeClassName",
         [](const Call& c)
         {
             return invoke(c, c.context, c.result,
                           c.path(withClass(hugeName + directives)), "ClearLog",
                           nullptr, nullptr);
         },
         methodValue(0)},
    };
}

} // namespace hostile
