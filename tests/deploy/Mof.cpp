// The lookups and conversions of the MOF model.
#include "Mof.h"

#include <algorithm>
#include <cctype>

namespace mof
{

bool sameName(std::string_view a, std::string_view b)
{
    return a.size() == b.size() &&
           std::equal(a.begin(), a.end(), b.begin(),
                      [](unsigned char x, unsigned char y)
                      { return std::tolower(x) == std::tolower(y); });
}

std::vector<std::string> Value::strings() const
{
    if (kind == Kind::String)
    {
        return {text};
    }
    std::vector<std::string> out;
    if (kind == Kind::Array)
    {
        for (const Value& e : elements)
        {
            if (e.kind != Kind::String)
            {
                throw std::invalid_argument("not an array of strings");
            }
            out.push_back(e.text);
        }
        return out;
    }
    throw std::invalid_argument("not a string value");
}

std::vector<std::int64_t> Value::integers() const
{
    if (kind == Kind::Integer)
    {
        return {integer};
    }
    std::vector<std::int64_t> out;
    if (kind == Kind::Array)
    {
        for (const Value& e : elements)
        {
            if (e.kind != Kind::Integer)
            {
                throw std::invalid_argument("not an array of integers");
            }
            out.push_back(e.integer);
        }
        return out;
    }
    throw std::invalid_argument("not an integer value");
}

const Qualifier* findQualifier(const std::vector<Qualifier>& qualifiers,
                               std::string_view name)
{
    for (const Qualifier& q : qualifiers)
    {
        if (sameName(q.name, name))
        {
            return &q;
        }
    }
    return nullptr;
}

namespace
{

bool flagOf(const Qualifier* q)
{
    return q != nullptr &&
           !(q->value.kind == Value::Kind::Boolean && !q->value.boolean);
}

} // namespace

bool Feature::hasFlag(std::string_view qualifierName) const
{
    return flagOf(qualifier(qualifierName));
}

std::string Feature::typeText() const
{
    std::string text = type == "ref" ? "ref " + referenceClass : type;
    return isArray ? text + "[]" : text;
}

bool Class::hasFlag(std::string_view qualifierName) const
{
    return flagOf(qualifier(qualifierName));
}

const Feature* Class::property(std::string_view propertyName) const
{
    for (const Feature& f : properties)
    {
        if (sameName(f.name, propertyName))
        {
            return &f;
        }
    }
    return nullptr;
}

const Method* Class::method(std::string_view methodName) const
{
    for (const Method& m : methods)
    {
        if (sameName(m.name, methodName))
        {
            return &m;
        }
    }
    return nullptr;
}

const Value* Instance::property(std::string_view propertyName) const
{
    for (const auto& [name, value] : properties)
    {
        if (sameName(name, propertyName))
        {
            return &value;
        }
    }
    return nullptr;
}

} // namespace mof
