#include "BrokerState.h"
#include "Names.h"
#include "Objects.h"
#include "ValueConversion.h"

#include <algorithm>

namespace host::detail
{

void InstanceObject::copyFrom(const InstanceObject& other)
{
    path = other.path;
    properties = other.properties;
    filter = other.filter;
    filterKeys = other.filterKeys;
}

bool InstanceObject::accepts(std::string_view name) const
{
    if (!filter)
    {
        return true;
    }
    const auto matches = [name](const std::string& n)
    { return sameName(n, name); };
    return std::any_of(filter->begin(), filter->end(), matches) ||
           std::any_of(filterKeys.begin(), filterKeys.end(), matches);
}

ObjectPath InstanceObject::effectivePath() const
{
    ObjectPath result = path;
    const ClassKeys* keys = broker->schema.find(path.className);
    if (keys == nullptr)
    {
        return result;
    }
    NamedValues ordered;
    ordered.reserve(keys->keys.size() + path.keys.size());
    for (const auto& [keyName, type] : keys->keys)
    {
        const Value* property = findNamed(properties.list(), keyName);
        if (property != nullptr && !property->null)
        {
            ordered.emplace_back(keyName, *property);
        }
        else if (const Value* key = path.key(keyName))
        {
            ordered.emplace_back(keyName, *key);
        }
    }
    for (const auto& [keyName, value] : path.keys)
    {
        if (!keys->isKey(keyName))
        {
            ordered.emplace_back(keyName, value);
        }
    }
    result.keys = std::move(ordered);
    return result;
}

Instance InstanceObject::snapshot() const
{
    return Instance{effectivePath(), properties};
}

namespace
{

using Inst = InstanceObject;

CMPIData instGetProperty(const CMPIInstance* inst, const char* name,
                         CMPIStatus* rc)
{
    const Inst* i = Inst::of(inst);
    if (i == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullData();
    }
    return lookupData(*i->broker,
                      name ? findNamed(i->properties.list(), name) : nullptr,
                      name, rc);
}

CMPIData instGetPropertyAt(const CMPIInstance* inst, CMPICount index,
                           CMPIString** name, CMPIStatus* rc)
{
    const Inst* i = Inst::of(inst);
    if (i == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullData();
    }
    return indexedData(*i->broker, i->properties.list(), index, name, rc);
}

CMPICount instGetPropertyCount(const CMPIInstance* inst, CMPIStatus* rc)
{
    const Inst* i = Inst::of(inst);
    setStatus(rc, i ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE);
    return i ? static_cast<CMPICount>(i->properties.size()) : 0;
}

CMPIStatus instSetProperty(const CMPIInstance* inst, const char* name,
                           const CMPIValue* value, CMPIType type)
{
    Inst* i = Inst::of(inst);
    if (i == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (i->broker->fault(BrokerCall::SetProperty))
    {
        return errorStatus(CMPI_RC_ERR_FAILED);
    }
    Value v;
    const CMPIrc rc = readNamedArgument(name, value, type, v);
    if (rc != CMPI_RC_OK)
    {
        return errorStatus(rc);
    }
    if (i->accepts(name))
    {
        setNamed(i->properties.edit(), name, std::move(v));
    }
    return okStatus();
}

CMPIObjectPath* instGetObjectPath(const CMPIInstance* inst, CMPIStatus* rc)
{
    const Inst* i = Inst::of(inst);
    if (i == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    auto* p = i->broker->make<ObjectPathObject>();
    p->path = i->effectivePath();
    setStatus(rc, CMPI_RC_OK);
    return &p->cmpi;
}

std::vector<std::string> nameList(const char** names)
{
    std::vector<std::string> list;
    for (; names != nullptr && *names != nullptr; ++names)
    {
        list.emplace_back(*names);
    }
    return list;
}

CMPIStatus instSetPropertyFilter(CMPIInstance* inst, const char** properties,
                                 const char** keys)
{
    Inst* i = Inst::of(inst);
    if (i == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (properties == nullptr)
    {
        i->filter.reset();
        i->filterKeys.clear();
        return okStatus();
    }
    i->filter = nameList(properties);
    i->filterKeys = nameList(keys);
    std::erase_if(i->properties.edit(),
                  [i](const auto& p) { return !i->accepts(p.first); });
    return okStatus();
}

CMPIStatus instSetObjectPath(CMPIInstance* inst, const CMPIObjectPath* op)
{
    Inst* i = Inst::of(inst);
    if (i == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (op == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    }
    const ObjectPathObject* p = ObjectPathObject::of(op);
    if (p == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    i->path = p->path;
    return okStatus();
}

} // namespace

// setPropertyWithOrigin stays NULL, as in SFCB.
CMPIInstanceFT instanceFT = {
    200,
    releaseObject<Inst, CMPIInstance>,
    cloneObject<Inst, CMPIInstance>,
    instGetProperty,
    instGetPropertyAt,
    instGetPropertyCount,
    instSetProperty,
    instGetObjectPath,
    instSetPropertyFilter,
    instSetObjectPath,
    nullptr,
};

} // namespace host::detail
