#include "Schema.h"

#include "Names.h"

namespace host
{

bool ClassKeys::isKey(std::string_view name) const
{
    for (const auto& [keyName, type] : keys)
    {
        if (sameName(keyName, name))
        {
            return true;
        }
    }
    return false;
}

void Schema::add(ClassKeys keys)
{
    for (ClassKeys& existing : classes_)
    {
        if (sameName(existing.className, keys.className))
        {
            existing = std::move(keys);
            return;
        }
    }
    classes_.push_back(std::move(keys));
}

const ClassKeys* Schema::find(std::string_view className) const
{
    for (const ClassKeys& c : classes_)
    {
        if (sameName(c.className, className))
        {
            return &c;
        }
    }
    return nullptr;
}

} // namespace host
