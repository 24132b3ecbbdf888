// Hostile calls of enumerateInstanceNames, enumerateInstances and
// getInstance.
#include "HostileCalls.h"

namespace hostile
{

std::vector<Case> instanceCalls()
{
    const auto entries = [] { return withClass(entryClass); };
    return {
        {"NamesNullContext",
         [=](const Call& c)
         { return names(c, nullptr, c.result, c.path(entries())); },
         enumerated(entryCount, 0)},
        {"NamesNullMI",
         [=](const Call& c)
         {
             return c.instanceMI->ft->enumerateInstanceNames(
                 nullptr, c.context, c.result, c.path(entries()));
         },
         enumerated(entryCount, 0)},
        {"NamesNullResult",
         [=](const Call& c)
         { return names(c, c.context, nullptr, c.path(entries())); },
         noResult},
        {"NamesNullPath",
         [](const Call& c) { return names(c, c.context, c.result, nullptr); },
         noPath},
        {"NamesAllNull",
         [](const Call& c) { return names(c, nullptr, nullptr, nullptr); },
         noResult},
        {"NamesHugeClassName",
         [](const Call& c)
         { return names(c, c.context, c.result, c.path(withClass(hugeName))); },
         unknownClass},
        {"NamesDirectivesInClassName",
         [](const Call& c) {
             return names(c, c.context, c.result,
                          c.path(withClass(directives)));
         },
         unknownClass},
        {"NamesInvalidUtf8ClassName",
         [](const Call& c) {
             return names(c, c.context, c.result,
                          c.path(withClass(invalidUtf8)));
         },
         unknownClass},
        {"NamesHugeNamespaceWithDirectives",
         [=](const Call& c)
         {
             ObjectPath path = entries();
             path.nameSpace = hugeName + directives + invalidUtf8;
             return names(c, c.context, c.result, c.path(path));
         },
         enumerated(entryCount, 0)},
        {"NamesThousandKeys",
         [=](const Call& c)
         {
             return names(c, c.context, c.result,
                          c.path(withManyKeys(entries(), 1000)));
         },
         enumerated(entryCount, 0)},
        // enumerateInstances
        {"InstancesNullContext",
         [=](const Call& c) {
             return instances(c, nullptr, c.result, c.path(entries()), nullptr);
         },
         enumerated(0, entryCount)},
        {"InstancesNullResult",
         [=](const Call& c) {
             return instances(c, c.context, nullptr, c.path(entries()),
                              nullptr);
         },
         noResult},
        {"InstancesNullPath",
         [](const Call& c)
         { return instances(c, c.context, c.result, nullptr, nullptr); },
         noPath},
        {"InstancesEmptyPropertyList",
         [=](const Call& c)
         {
             return instances(c, c.context, c.result, c.path(entries()),
                              emptyProperties);
         },
         enumerated(0, entryCount)},
        {"InstancesHostilePropertyNames",
         [=](const Call& c)
         {
             return instances(c, c.context, c.result, c.path(entries()),
                              hostileProperties);
         },
         enumerated(0, entryCount)},
        {"InstancesHugeClassName",
         [](const Call& c)
         {
             return instances(c, c.context, c.result,
                              c.path(withClass(hugeName)), hostileProperties);
         },
         unknownClass},
        {"InstancesDirectivesInClassName",
         [](const Call& c)
         {
             return instances(c, c.context, c.result,
                              c.path(withClass(directives)), nullptr);
         },
         unknownClass},
        {"InstancesThousandKeysOnTheLog",
         [](const Call& c)
         {
             return instances(c, c.context, c.result,
                              c.path(withManyKeys(logPath(), 1000)), nullptr);
         },
         enumerated(0, 1)},
        // getInstance
        {"GetNullContext",
         [](const Call& c)
         { return get(c, nullptr, c.result, c.path(c.firstEntry), nullptr); },
         enumerated(0, 1)},
        {"GetNullResult",
         [](const Call& c)
         { return get(c, c.context, nullptr, c.path(c.firstEntry), nullptr); },
         noResult},
        {"GetNullPath",
         [](const Call& c)
         { return get(c, c.context, c.result, nullptr, nullptr); },
         noPath},
        // Without its key properties requested, the entry instance carries
        // only CreationClassName as key, so no instance matches the path.
        {"GetEmptyPropertyList",
         [](const Call& c) {
             return get(c, c.context, c.result, c.path(c.firstEntry),
                        emptyProperties);
         },
         enumerated(0, 0)},
        {"GetHostilePropertyNames",
         [](const Call& c)
         {
             return get(c, c.context, c.result, c.path(c.firstEntry),
                        hostileProperties);
         },
         enumerated(0, 0)},
        {"GetThousandKeys",
         [](const Call& c)
         {
             return get(c, c.context, c.result,
                        c.path(withManyKeys(c.firstEntry, 1000)), nullptr);
         },
         enumerated(0, 0)},
        {"GetRecordIdOfTheWrongType",
         [](const Call& c)
         {
             ObjectPath path = c.firstEntry;
             path.setKey("RecordID", Value::unsignedInt(CMPI_uint64, 1));
             return get(c, c.context, c.result, c.path(path), nullptr);
         },
         enumerated(0, 0)},
        {"GetEveryKeyOfTheWrongType",
         [](const Call& c)
         {
             ObjectPath path = c.firstEntry;
             for (auto& key : path.keys.edit())
             {
                 key.second = Value::boolean(true);
             }
             return get(c, c.context, c.result, c.path(path), nullptr);
         },
         enumerated(0, 0)},
        {"GetHugeKeyValues",
         [](const Call& c)
         {
             ObjectPath path = c.firstEntry;
             for (auto& key : path.keys.edit())
             {
                 key.second = Value::string(hugeName + directives);
             }
             return get(c, c.context, c.result, c.path(path), nullptr);
         },
         enumerated(0, 0)},
        {"GetLogNameOfTheWrongType",
         [](const Call& c)
         {
             ObjectPath path = logPath();
             path.setKey("Name", Value::signedInt(CMPI_sint64, -1));
             return get(c, c.context, c.result, c.path(path), nullptr);
         },
         enumerated(0, 0)},
        {"GetWithoutKeys",
         [=](const Call& c)
         { return get(c, c.context, c.result, c.path(entries()), nullptr); },
         []
         {
             Expected expected = failed("At least one key should be passed");
             expected.done = true;
             return expected;
         }()},
        {"GetHugeClassName",
         [](const Call& c)
         {
             ObjectPath path = c.firstEntry;
             path.className = hugeName + directives;
             return get(c, c.context, c.result, c.path(path), nullptr);
         },
         unknownClass},
    };
}

} // namespace hostile
