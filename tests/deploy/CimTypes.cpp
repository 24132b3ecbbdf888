#include "CimTypes.h"

#include <algorithm>
#include <cstdio>

namespace deploy
{

namespace
{

std::string baseTypeName(CMPIType type)
{
    switch (type)
    {
        case CMPI_boolean:
            return "boolean";
        case CMPI_char16:
            return "char16";
        case CMPI_real32:
            return "real32";
        case CMPI_real64:
            return "real64";
        case CMPI_uint8:
            return "uint8";
        case CMPI_uint16:
            return "uint16";
        case CMPI_uint32:
            return "uint32";
        case CMPI_uint64:
            return "uint64";
        case CMPI_sint8:
            return "sint8";
        case CMPI_sint16:
            return "sint16";
        case CMPI_sint32:
            return "sint32";
        case CMPI_sint64:
            return "sint64";
        case CMPI_string:
        case CMPI_chars:
            return "string";
        case CMPI_dateTime:
            return "datetime";
        case CMPI_ref:
            return "ref";
        default:
        {
            char text[32];
            std::snprintf(text, sizeof text, "unknown(0x%04x)",
                          static_cast<unsigned>(type));
            return text;
        }
    }
}

bool contains(const std::vector<std::string>& names, std::string_view name)
{
    return std::any_of(names.begin(), names.end(),
                       [&](const std::string& n)
                       { return mof::sameName(n, name); });
}

} // namespace

std::string mofTypeOf(CMPIType type)
{
    if ((type & CMPI_ARRAY) != 0)
    {
        return baseTypeName(static_cast<CMPIType>(type & ~CMPI_ARRAY)) + "[]";
    }
    return baseTypeName(type);
}

std::string mofTypeOf(const mof::Feature& feature)
{
    return feature.type + (feature.isArray ? "[]" : "");
}

std::vector<std::string> propertyMismatches(const mof::ClassRepository& classes,
                                            const host::Instance& instance)
{
    std::vector<std::string> problems;
    const std::string className = instance.path.className.str();
    for (const auto& [name, value] : instance.properties)
    {
        const mof::Class* declaredIn = nullptr;
        const mof::Feature* declared =
            classes.findProperty(className, name, &declaredIn);
        if (declared == nullptr)
        {
            problems.push_back(className + "." + name + " (" +
                               mofTypeOf(value.type) +
                               ") is set by the provider but not declared");
        }
        else if (mofTypeOf(*declared) != mofTypeOf(value.type))
        {
            problems.push_back(className + "." + name + " is set as " +
                               mofTypeOf(value.type) + " but " +
                               declaredIn->name + " declares " +
                               declared->typeText());
        }
    }
    return problems;
}

std::vector<std::string> keyMismatches(const mof::ClassRepository& classes,
                                       const host::ObjectPath& path)
{
    std::vector<std::string> problems;
    const std::vector<std::string> keys = classes.keys(path.className);
    std::vector<std::string> given;
    for (const auto& [name, value] : path.keys)
    {
        given.emplace_back(name);
        if (!contains(keys, name))
        {
            problems.push_back(path.className + ": " + name +
                               " is in the object path but is not a key");
            continue;
        }
        const mof::Feature* declared =
            classes.findProperty(path.className, name);
        if (value.type != CMPI_null &&
            mofTypeOf(*declared) != mofTypeOf(value.type))
        {
            problems.push_back(path.className + ": key " + name + " is " +
                               mofTypeOf(value.type) + " in the path but " +
                               declared->typeText() + " in the class");
        }
    }
    for (const std::string& key : keys)
    {
        if (!contains(given, key))
        {
            problems.push_back(path.className + ": key " + key +
                               " is missing from the object path");
        }
    }
    return problems;
}

} // namespace deploy
