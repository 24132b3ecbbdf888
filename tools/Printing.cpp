#include "Printing.h"

#include "WbemText.h"

#include <cmath>
#include <cstdio>

namespace selprov
{

using host::Instance;
using host::ObjectPath;
using host::Value;

std::string formatMof(const Instance& instance)
{
    std::string out = "// " + instance.path.toString() + "\n";
    out += "instance of " + instance.path.className + "\n{\n";
    for (const auto& [name, value] : instance.properties)
    {
        out += "    " + name + " = " + value.toString() + ";\n";
    }
    return out + "};\n";
}

namespace
{

// Length of the valid UTF-8 sequence starting at text[i], or 0.
std::size_t utf8Length(std::string_view text, std::size_t i)
{
    const auto byte = [&](std::size_t k)
    { return static_cast<unsigned char>(text[k]); };
    const unsigned char c = byte(i);
    std::size_t n = 0;
    unsigned min = 0;
    unsigned code = 0;
    if (c < 0x80)
    {
        return 1;
    }
    if ((c & 0xE0) == 0xC0)
    {
        n = 2;
        min = 0x80;
        code = c & 0x1F;
    }
    else if ((c & 0xF0) == 0xE0)
    {
        n = 3;
        min = 0x800;
        code = c & 0x0F;
    }
    else if ((c & 0xF8) == 0xF0)
    {
        n = 4;
        min = 0x10000;
        code = c & 0x07;
    }
    else
    {
        return 0;
    }
    if (i + n > text.size())
    {
        return 0;
    }
    for (std::size_t k = 1; k < n; ++k)
    {
        if ((byte(i + k) & 0xC0) != 0x80)
        {
            return 0;
        }
        code = (code << 6) | (byte(i + k) & 0x3F);
    }
    if (code < min || code > 0x10FFFF || (code >= 0xD800 && code <= 0xDFFF))
    {
        return 0;
    }
    return n;
}

} // namespace

std::string jsonString(std::string_view text)
{
    std::string out = "\"";
    for (std::size_t i = 0; i < text.size();)
    {
        const char c = text[i];
        switch (c)
        {
            case '"':
                out += "\\\"";
                ++i;
                continue;
            case '\\':
                out += "\\\\";
                ++i;
                continue;
            case '\b':
                out += "\\b";
                ++i;
                continue;
            case '\f':
                out += "\\f";
                ++i;
                continue;
            case '\n':
                out += "\\n";
                ++i;
                continue;
            case '\r':
                out += "\\r";
                ++i;
                continue;
            case '\t':
                out += "\\t";
                ++i;
                continue;
            default:
                break;
        }
        if (static_cast<unsigned char>(c) < 0x20 || c == 0x7F)
        {
            char buf[8];
            std::snprintf(buf, sizeof buf, "\\u%04x",
                          static_cast<unsigned>(static_cast<unsigned char>(c)));
            out += buf;
            ++i;
            continue;
        }
        const std::size_t n = utf8Length(text, i);
        if (n == 0)
        {
            out += "\\ufffd";
            ++i;
            continue;
        }
        out.append(text.substr(i, n));
        i += n;
    }
    return out + "\"";
}

std::string jsonValue(const Value& value)
{
    if (value.null)
    {
        return "null";
    }
    if (value.isArray())
    {
        std::string out = "[";
        for (std::size_t i = 0; i < value.elements().size(); ++i)
        {
            out += (i ? ", " : "") + jsonValue(value.elements()[i]);
        }
        return out + "]";
    }
    switch (value.type)
    {
        case CMPI_boolean:
            return value.unsignedValue() ? "true" : "false";
        case CMPI_char16:
        case CMPI_uint8:
        case CMPI_uint16:
        case CMPI_uint32:
        case CMPI_uint64:
            return std::to_string(value.unsignedValue());
        case CMPI_sint8:
        case CMPI_sint16:
        case CMPI_sint32:
        case CMPI_sint64:
            return std::to_string(value.signedValue());
        case CMPI_real32:
        case CMPI_real64:
            return std::isfinite(value.realValue())
                       ? host::realText(value.realValue())
                       : "null";
        case CMPI_string:
        case CMPI_dateTime:
            return jsonString(value.text());
        case CMPI_ref:
            return value.ref() ? jsonString(value.ref()->toString()) : "null";
        default:
            return "null";
    }
}

std::string jsonInstance(const Instance& instance)
{
    std::string out = "{\"path\": " + jsonString(instance.path.toString()) +
                      ", \"properties\": {";
    for (std::size_t i = 0; i < instance.properties.size(); ++i)
    {
        const auto& [name, value] = instance.properties[i];
        out += (i ? ", " : "") + jsonString(name) + ": " + jsonValue(value);
    }
    return out + "}}";
}

std::string jsonInstances(const std::vector<Instance>& instances)
{
    std::string out = "[";
    for (std::size_t i = 0; i < instances.size(); ++i)
    {
        out += (i ? ",\n " : "") + jsonInstance(instances[i]);
    }
    return out + "]\n";
}

std::string jsonPaths(const std::vector<ObjectPath>& paths)
{
    std::string out = "[";
    for (std::size_t i = 0; i < paths.size(); ++i)
    {
        out += (i ? ",\n " : "") + jsonString(paths[i].toString());
    }
    return out + "]\n";
}

} // namespace selprov
