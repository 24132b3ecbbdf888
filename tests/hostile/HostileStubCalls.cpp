// Hostile calls of the operations the provider does not support.
#include "HostileCalls.h"

namespace hostile
{

std::vector<Case> stubCalls()
{
    return {
        {"CreateAllNull",
         [](const Call& c)
         {
             return c.instanceMI->ft->createInstance(nullptr, nullptr, nullptr,
                                                     nullptr, nullptr);
         },
         notSupported},
        {"ModifyAllNull",
         [](const Call& c)
         {
             return c.instanceMI->ft->modifyInstance(nullptr, nullptr, nullptr,
                                                     nullptr, nullptr, nullptr);
         },
         notSupported},
        {"DeleteAllNull",
         [](const Call& c)
         {
             return c.instanceMI->ft->deleteInstance(nullptr, nullptr, nullptr,
                                                     nullptr);
         },
         notSupported},
        {"ExecQueryAllNull",
         [](const Call& c)
         {
             return c.instanceMI->ft->execQuery(nullptr, nullptr, nullptr,
                                                nullptr, nullptr, nullptr);
         },
         notSupported},
        {"InstanceCleanupNullContext",
         [](const Call& c)
         { return c.instanceMI->ft->cleanup(nullptr, nullptr, 0); },
         Expected{}},
        {"MethodCleanupNullContext",
         [](const Call& c)
         { return c.methodMI->ft->cleanup(nullptr, nullptr, 0); },
         Expected{}},
        {"IndicationCleanupNullContext",
         [](const Call& c)
         { return c.indicationMI->ft->cleanup(nullptr, nullptr, 0); },
         Expected{}},
        {"AuthorizeFilterAllNull",
         [](const Call& c)
         {
             return c.indicationMI->ft->authorizeFilter(
                 nullptr, nullptr, nullptr, nullptr, nullptr, nullptr);
         },
         Expected{}},
        {"AuthorizeFilterHostileNames",
         [](const Call& c)
         {
             return c.indicationMI->ft->authorizeFilter(
                 c.indicationMI, c.context, nullptr, hugeName.c_str(),
                 c.path(withClass(directives)), invalidUtf8.c_str());
         },
         Expected{}},
        {"MustPollAllNull",
         [](const Call& c)
         {
             return c.indicationMI->ft->mustPoll(nullptr, nullptr, nullptr,
                                                 nullptr, nullptr);
         },
         Expected{}},
        {"MustPollHostileNames",
         [](const Call& c)
         {
             return c.indicationMI->ft->mustPoll(c.indicationMI, c.context,
                                                 nullptr, directives.c_str(),
                                                 c.path(withClass(hugeName)));
         },
         Expected{}},
    };
}

} // namespace hostile
