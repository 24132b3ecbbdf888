#include "ClassRepository.h"

namespace mof
{

void ClassRepository::add(const Document& document)
{
    for (const Class& c : document.classes)
    {
        if (const Class* existing = find(c.name))
        {
            throw MofError(c.source + ":" + std::to_string(c.line) +
                           ": class " + c.name + " is already defined in " +
                           existing->source);
        }
        classes_.push_back(c);
    }
}

const Class* ClassRepository::find(std::string_view name) const
{
    for (const Class& c : classes_)
    {
        if (sameName(c.name, name))
        {
            return &c;
        }
    }
    return nullptr;
}

std::vector<const Class*> ClassRepository::chain(std::string_view name) const
{
    std::vector<const Class*> result;
    const Class* c = find(name);
    if (c == nullptr)
    {
        throw MofError("unknown class " + std::string(name));
    }
    while (c != nullptr)
    {
        for (const Class* seen : result)
        {
            if (seen == c)
            {
                throw MofError("class " + std::string(name) +
                               " has a cycle in its superclasses");
            }
        }
        result.push_back(c);
        if (c->superclass.empty())
        {
            break;
        }
        const Class* parent = find(c->superclass);
        if (parent == nullptr)
        {
            throw MofError(c->source + ":" + std::to_string(c->line) +
                           ": superclass " + c->superclass + " of " + c->name +
                           " is not defined");
        }
        c = parent;
    }
    return result;
}

const Feature* ClassRepository::findProperty(std::string_view className,
                                             std::string_view propertyName,
                                             const Class** declaredIn) const
{
    for (const Class* c : chain(className))
    {
        if (const Feature* f = c->property(propertyName))
        {
            if (declaredIn != nullptr)
            {
                *declaredIn = c;
            }
            return f;
        }
    }
    return nullptr;
}

const Method* ClassRepository::findMethod(std::string_view className,
                                          std::string_view methodName,
                                          const Class** declaredIn) const
{
    for (const Class* c : chain(className))
    {
        if (const Method* m = c->method(methodName))
        {
            if (declaredIn != nullptr)
            {
                *declaredIn = c;
            }
            return m;
        }
    }
    return nullptr;
}

std::vector<std::string> ClassRepository::keys(std::string_view className) const
{
    // Key cannot be overridden away: a property is a key when any
    // declaration of it in the chain says so.
    const std::vector<const Class*> classes = chain(className);
    std::vector<std::string> names;
    for (auto c = classes.rbegin(); c != classes.rend(); ++c)
    {
        for (const Feature& f : (*c)->properties)
        {
            if (!f.hasFlag("Key"))
            {
                continue;
            }
            bool known = false;
            for (const std::string& n : names)
            {
                known = known || sameName(n, f.name);
            }
            if (!known)
            {
                names.push_back(findProperty(className, f.name)->name);
            }
        }
    }
    return names;
}

bool ClassRepository::hasInheritedFlag(std::string_view className,
                                       std::string_view qualifier) const
{
    for (const Class* c : chain(className))
    {
        if (c->hasFlag(qualifier))
        {
            return true;
        }
    }
    return false;
}

} // namespace mof
