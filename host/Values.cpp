#include "Values.h"

#include "Names.h"
#include "WbemText.h"

#include <algorithm>
#include <array>

namespace host
{

Value Value::nullOf(CMPIType type)
{
    Value v;
    v.type = storedType(type);
    v.null = true;
    return v;
}

Value Value::boolean(bool value)
{
    Value v;
    v.type = CMPI_boolean;
    v.setUnsigned(value ? 1 : 0);
    return v;
}

Value Value::unsignedInt(CMPIType type, std::uint64_t value)
{
    Value v;
    v.type = type;
    v.setUnsigned(value);
    return v;
}

Value Value::signedInt(CMPIType type, std::int64_t value)
{
    Value v;
    v.type = type;
    v.setSigned(value);
    return v;
}

Value Value::real(CMPIType type, double value)
{
    Value v;
    v.type = type;
    v.setReal(value);
    return v;
}

Value Value::string(Text value)
{
    Value v;
    v.type = CMPI_string;
    v.setText(std::move(value));
    return v;
}

Value Value::dateTime(Text cimText)
{
    Value v;
    v.type = CMPI_dateTime;
    v.setText(std::move(cimText));
    return v;
}

Value Value::reference(ObjectPath path)
{
    Value v;
    v.type = CMPI_ref;
    v.setRef(std::make_shared<ObjectPath>(std::move(path)));
    return v;
}

Value Value::array(CMPIType elementType, std::vector<Value> elements)
{
    Value v;
    v.type = static_cast<CMPIType>(storedType(elementType) | CMPI_ARRAY);
    v.setElements(std::move(elements));
    return v;
}

namespace
{

template <typename T>
T scalarOf(const auto& payload)
{
    const T* held = std::get_if<T>(&payload);
    return held != nullptr ? *held : T{};
}

template <typename T>
const T& objectOf(const auto& payload)
{
    static const T none{};
    const T* held = std::get_if<T>(&payload);
    return held != nullptr ? *held : none;
}

} // namespace

std::uint64_t Value::unsignedValue() const
{
    return scalarOf<std::uint64_t>(payload_);
}

std::int64_t Value::signedValue() const
{
    return scalarOf<std::int64_t>(payload_);
}

double Value::realValue() const
{
    return scalarOf<double>(payload_);
}

std::string_view Value::text() const
{
    return objectOf<Text>(payload_);
}

const std::vector<Value>& Value::elements() const
{
    return objectOf<std::vector<Value>>(payload_);
}

const std::shared_ptr<ObjectPath>& Value::ref() const
{
    return objectOf<std::shared_ptr<ObjectPath>>(payload_);
}

std::string Value::toString() const
{
    if (null)
    {
        return "NULL";
    }
    if (isArray())
    {
        std::string out = "{";
        const std::vector<Value>& items = elements();
        for (std::size_t i = 0; i < items.size(); ++i)
        {
            out += (i ? ", " : "") + items[i].toString();
        }
        return out + "}";
    }
    switch (type)
    {
        case CMPI_boolean:
            return unsignedValue() ? "TRUE" : "FALSE";
        case CMPI_char16:
        case CMPI_uint8:
        case CMPI_uint16:
        case CMPI_uint32:
        case CMPI_uint64:
            return std::to_string(unsignedValue());
        case CMPI_sint8:
        case CMPI_sint16:
        case CMPI_sint32:
        case CMPI_sint64:
            return std::to_string(signedValue());
        case CMPI_real32:
        case CMPI_real64:
            return realText(realValue());
        case CMPI_string:
        case CMPI_dateTime:
            return quoted(text());
        case CMPI_ref:
            return ref() ? quoted(ref()->toString()) : "NULL";
        default:
        {
            std::string out = "<";
            out += typeName(type);
            out += '>';
            return out;
        }
    }
}

bool Value::operator==(const Value& other) const
{
    if (type != other.type || null != other.null)
    {
        return false;
    }
    if (null)
    {
        return true;
    }
    if (isArray())
    {
        return elements() == other.elements();
    }
    switch (type)
    {
        case CMPI_sint8:
        case CMPI_sint16:
        case CMPI_sint32:
        case CMPI_sint64:
            return signedValue() == other.signedValue();
        case CMPI_real32:
        case CMPI_real64:
            return realValue() == other.realValue();
        case CMPI_string:
        case CMPI_dateTime:
            return text() == other.text();
        case CMPI_ref:
            return ref() && other.ref() ? *ref() == *other.ref()
                                        : ref() == other.ref();
        default:
            return unsignedValue() == other.unsignedValue();
    }
}

const Value* findNamed(const NamedValues& values, std::string_view name)
{
    for (const auto& [n, v] : values)
    {
        if (sameName(n, name))
        {
            return &v;
        }
    }
    return nullptr;
}

void setNamed(NamedValues& values, Text name, Value value)
{
    for (auto& [n, v] : values)
    {
        if (sameName(n, name))
        {
            v = std::move(value);
            return;
        }
    }
    if (values.size() == values.capacity())
    {
        // Grow by half, not double: instances and paths are built a value
        // at a time and live to the end of their request, each holding
        // whatever spare room its last growth left.
        values.reserve(values.size() +
                       std::max<std::size_t>(4, values.size() / 2));
    }
    values.emplace_back(std::move(name), std::move(value));
}

SharedNamedValues::SharedNamedValues(NamedValues values) :
    list_(std::make_shared<NamedValues>(std::move(values)))
{
}

SharedNamedValues::SharedNamedValues(const SharedNamedValues& other) :
    list_(other.list_), shared_(true)
{
    other.shared_.store(true, std::memory_order_relaxed);
}

SharedNamedValues::SharedNamedValues(SharedNamedValues&& other) noexcept :
    list_(std::move(other.list_)),
    shared_(other.shared_.load(std::memory_order_relaxed))
{
    other.shared_.store(false, std::memory_order_relaxed);
}

SharedNamedValues& SharedNamedValues::operator=(const SharedNamedValues& other)
{
    if (this != &other)
    {
        list_ = other.list_;
        shared_.store(true, std::memory_order_relaxed);
        other.shared_.store(true, std::memory_order_relaxed);
    }
    return *this;
}

SharedNamedValues&
SharedNamedValues::operator=(SharedNamedValues&& other) noexcept
{
    if (this != &other)
    {
        list_ = std::move(other.list_);
        shared_.store(other.shared_.load(std::memory_order_relaxed),
                      std::memory_order_relaxed);
        other.shared_.store(false, std::memory_order_relaxed);
    }
    return *this;
}

const NamedValues& SharedNamedValues::list() const
{
    static const NamedValues none;
    return list_ ? *list_ : none;
}

NamedValues& SharedNamedValues::edit()
{
    if (!list_)
    {
        list_ = std::make_shared<NamedValues>();
    }
    else if (shared_.load(std::memory_order_relaxed))
    {
        list_ = std::make_shared<NamedValues>(*list_);
    }
    shared_.store(false, std::memory_order_relaxed);
    return *list_;
}

const Value* ObjectPath::key(std::string_view name) const
{
    return findNamed(keys.list(), name);
}

void ObjectPath::setKey(Text name, Value value)
{
    setNamed(keys.edit(), std::move(name), std::move(value));
}

bool ObjectPath::operator==(const ObjectPath& other) const
{
    return nameSpace == other.nameSpace && className == other.className &&
           host == other.host && keys == other.keys;
}

const Value* Instance::property(std::string_view name) const
{
    return findNamed(properties.list(), name);
}

void Instance::setProperty(Text name, Value value)
{
    setNamed(properties.edit(), std::move(name), std::move(value));
}

std::vector<std::string> Instance::propertyNames() const
{
    std::vector<std::string> names;
    names.reserve(properties.size());
    for (const auto& [n, v] : properties)
    {
        names.emplace_back(n);
    }
    return names;
}

CMPIType storedType(CMPIType type)
{
    if (type == CMPI_chars)
    {
        return CMPI_string;
    }
    if (type == CMPI_charsA)
    {
        return CMPI_stringA;
    }
    return type;
}

std::string typeName(CMPIType type)
{
    struct Entry
    {
        CMPIType type;
        const char* name;
    };
    static constexpr std::array<Entry, 23> names{{
        {CMPI_null, "CMPI_null"},
        {CMPI_boolean, "CMPI_boolean"},
        {CMPI_char16, "CMPI_char16"},
        {CMPI_real32, "CMPI_real32"},
        {CMPI_real64, "CMPI_real64"},
        {CMPI_uint8, "CMPI_uint8"},
        {CMPI_uint16, "CMPI_uint16"},
        {CMPI_uint32, "CMPI_uint32"},
        {CMPI_uint64, "CMPI_uint64"},
        {CMPI_sint8, "CMPI_sint8"},
        {CMPI_sint16, "CMPI_sint16"},
        {CMPI_sint32, "CMPI_sint32"},
        {CMPI_sint64, "CMPI_sint64"},
        {CMPI_instance, "CMPI_instance"},
        {CMPI_ref, "CMPI_ref"},
        {CMPI_args, "CMPI_args"},
        {CMPI_class, "CMPI_class"},
        {CMPI_filter, "CMPI_filter"},
        {CMPI_enumeration, "CMPI_enumeration"},
        {CMPI_string, "CMPI_string"},
        {CMPI_chars, "CMPI_chars"},
        {CMPI_dateTime, "CMPI_dateTime"},
        {CMPI_ptr, "CMPI_ptr"},
    }};
    const bool array = (type & CMPI_ARRAY) != 0 && type != CMPI_ARRAY;
    const CMPIType element =
        array ? static_cast<CMPIType>(type & ~CMPI_ARRAY) : type;
    for (const Entry& e : names)
    {
        if (e.type == element)
        {
            return std::string(e.name) + (array ? "A" : "");
        }
    }
    return "unknown";
}

} // namespace host
