#include "ValueConversion.h"

#include "BrokerState.h"
#include "Objects.h"

#include <algorithm>
#include <array>

namespace host::detail
{
namespace
{

CMPIrc readScalar(const CMPIValue& v, CMPIType type, Value& out)
{
    out = Value{};
    out.type = type;
    switch (type)
    {
        case CMPI_boolean:
            out.setUnsigned(v.boolean ? 1 : 0);
            return CMPI_RC_OK;
        case CMPI_char16:
            out.setUnsigned(v.char16);
            return CMPI_RC_OK;
        case CMPI_uint8:
            out.setUnsigned(v.uint8);
            return CMPI_RC_OK;
        case CMPI_uint16:
            out.setUnsigned(v.uint16);
            return CMPI_RC_OK;
        case CMPI_uint32:
            out.setUnsigned(v.uint32);
            return CMPI_RC_OK;
        case CMPI_uint64:
            out.setUnsigned(v.uint64);
            return CMPI_RC_OK;
        case CMPI_sint8:
            // A signed number, not a character.
            // NOLINTNEXTLINE(bugprone-signed-char-misuse,cert-str34-c)
            out.setSigned(v.sint8);
            return CMPI_RC_OK;
        case CMPI_sint16:
            out.setSigned(v.sint16);
            return CMPI_RC_OK;
        case CMPI_sint32:
            out.setSigned(v.sint32);
            return CMPI_RC_OK;
        case CMPI_sint64:
            out.setSigned(v.sint64);
            return CMPI_RC_OK;
        case CMPI_real32:
            out.setReal(v.real32);
            return CMPI_RC_OK;
        case CMPI_real64:
            out.setReal(v.real64);
            return CMPI_RC_OK;
        case CMPI_string:
        {
            if (v.string == nullptr)
            {
                out.null = true;
                return CMPI_RC_OK;
            }
            const StringObject* s = StringObject::of(v.string);
            if (s == nullptr)
            {
                return CMPI_RC_ERR_INVALID_HANDLE;
            }
            out.null = !s->text.has_value();
            out.setText(s->text ? Text(*s->text) : Text());
            return CMPI_RC_OK;
        }
        case CMPI_dateTime:
        {
            if (v.dateTime == nullptr)
            {
                out.null = true;
                return CMPI_RC_OK;
            }
            const DateTimeObject* d = DateTimeObject::of(v.dateTime);
            if (d == nullptr)
            {
                return CMPI_RC_ERR_INVALID_HANDLE;
            }
            out.setText(d->text);
            return CMPI_RC_OK;
        }
        case CMPI_ref:
        {
            if (v.ref == nullptr)
            {
                out.null = true;
                return CMPI_RC_OK;
            }
            const ObjectPathObject* p = ObjectPathObject::of(v.ref);
            if (p == nullptr)
            {
                return CMPI_RC_ERR_INVALID_HANDLE;
            }
            out.setRef(std::make_shared<ObjectPath>(p->path));
            return CMPI_RC_OK;
        }
        case CMPI_instance:
        case CMPI_args:
        case CMPI_class:
        case CMPI_filter:
        case CMPI_enumeration:
        case CMPI_ptr:
        case CMPI_charsptr:
            return CMPI_RC_ERR_NOT_SUPPORTED;
        default:
            return CMPI_RC_ERR_INVALID_DATA_TYPE;
    }
}

CMPIrc readArray(const CMPIArray* array, CMPIType type, Value& out)
{
    const CMPIType element =
        storedType(static_cast<CMPIType>(type & ~CMPI_ARRAY));
    out = Value::nullOf(static_cast<CMPIType>(element | CMPI_ARRAY));
    if (array == nullptr)
    {
        return CMPI_RC_OK;
    }
    const ArrayObject* a = ArrayObject::of(array);
    if (a == nullptr)
    {
        return CMPI_RC_ERR_INVALID_HANDLE;
    }
    if (a->elementType != element)
    {
        return CMPI_RC_ERR_TYPE_MISMATCH;
    }
    out.null = false;
    out.setElements(a->elements);
    return CMPI_RC_OK;
}

// The scalar types a Value holds (CMPI_chars is read as a string): the
// element types an argument or array may have.
constexpr std::array<CMPIType, 16> knownScalars{
    CMPI_boolean, CMPI_char16, CMPI_uint8,    CMPI_uint16,
    CMPI_uint32,  CMPI_uint64, CMPI_sint8,    CMPI_sint16,
    CMPI_sint32,  CMPI_sint64, CMPI_real32,   CMPI_real64,
    CMPI_string,  CMPI_chars,  CMPI_dateTime, CMPI_ref};

bool isKnownScalar(CMPIType type)
{
    return std::find(knownScalars.begin(), knownScalars.end(), type) !=
           knownScalars.end();
}

} // namespace

CMPIrc readArgument(const CMPIValue* value, CMPIType type, Value& out)
{
    if (type == CMPI_chars)
    {
        out = Value::nullOf(CMPI_string);
        if (value != nullptr)
        {
            out.null = false;
            out.setText(reinterpret_cast<const char*>(value));
        }
        return CMPI_RC_OK;
    }
    if ((type & CMPI_ARRAY) != 0)
    {
        const auto element = static_cast<CMPIType>(type & ~CMPI_ARRAY);
        if (!isKnownScalar(element))
        {
            return CMPI_RC_ERR_INVALID_DATA_TYPE;
        }
        return readArray(value ? value->array : nullptr, type, out);
    }
    if (value == nullptr)
    {
        if (!isKnownScalar(type))
        {
            return CMPI_RC_ERR_INVALID_DATA_TYPE;
        }
        out = Value::nullOf(type);
        return CMPI_RC_OK;
    }
    return readScalar(*value, type, out);
}

CMPIrc readData(const CMPIData& data, Value& out)
{
    if ((data.state & CMPI_nullValue) != 0)
    {
        out = Value::nullOf(data.type);
        return CMPI_RC_OK;
    }
    if (data.type == CMPI_chars)
    {
        out = Value::nullOf(CMPI_string);
        if (data.value.chars != nullptr)
        {
            out.null = false;
            out.setText(data.value.chars);
        }
        return CMPI_RC_OK;
    }
    if ((data.type & CMPI_ARRAY) != 0)
    {
        return readArray(data.value.array, data.type, out);
    }
    return readScalar(data.value, data.type, out);
}

CMPIData makeData(BrokerState& broker, const Value& value,
                  CMPIValueState extraState)
{
    CMPIData d{};
    d.type = value.type;
    d.state = extraState;
    if (value.null)
    {
        d.state |= CMPI_nullValue;
        return d;
    }
    if (value.isArray())
    {
        auto* a = broker.make<ArrayObject>();
        a->elementType = static_cast<CMPIType>(value.type & ~CMPI_ARRAY);
        a->elements = value.elements();
        d.value.array = &a->cmpi;
        return d;
    }
    switch (value.type)
    {
        case CMPI_boolean:
            d.value.boolean = value.unsignedValue() ? 1 : 0;
            break;
        case CMPI_char16:
            d.value.char16 = static_cast<CMPIChar16>(value.unsignedValue());
            break;
        case CMPI_uint8:
            d.value.uint8 = static_cast<CMPIUint8>(value.unsignedValue());
            break;
        case CMPI_uint16:
            d.value.uint16 = static_cast<CMPIUint16>(value.unsignedValue());
            break;
        case CMPI_uint32:
            d.value.uint32 = static_cast<CMPIUint32>(value.unsignedValue());
            break;
        case CMPI_uint64:
            d.value.uint64 = value.unsignedValue();
            break;
        case CMPI_sint8:
            d.value.sint8 = static_cast<CMPISint8>(value.signedValue());
            break;
        case CMPI_sint16:
            d.value.sint16 = static_cast<CMPISint16>(value.signedValue());
            break;
        case CMPI_sint32:
            d.value.sint32 = static_cast<CMPISint32>(value.signedValue());
            break;
        case CMPI_sint64:
            d.value.sint64 = value.signedValue();
            break;
        case CMPI_real32:
            d.value.real32 = static_cast<CMPIReal32>(value.realValue());
            break;
        case CMPI_real64:
            d.value.real64 = value.realValue();
            break;
        case CMPI_string:
        {
            auto* s = broker.make<StringObject>();
            s->text = value.text();
            d.value.string = &s->cmpi;
            break;
        }
        case CMPI_dateTime:
        {
            auto* t = broker.make<DateTimeObject>();
            t->text = value.text();
            d.value.dateTime = &t->cmpi;
            break;
        }
        case CMPI_ref:
        {
            auto* p = broker.make<ObjectPathObject>();
            if (value.ref())
            {
                p->path = *value.ref();
            }
            d.value.ref = &p->cmpi;
            break;
        }
        default:
            d.state |= CMPI_nullValue;
            break;
    }
    return d;
}

CMPIrc readNamedArgument(const char* name, const CMPIValue* value,
                         CMPIType type, Value& out)
{
    return name == nullptr ? CMPI_RC_ERR_INVALID_PARAMETER
                           : readArgument(value, type, out);
}

CMPIData lookupData(BrokerState& broker, const Value* found, const char* name,
                    CMPIStatus* rc, CMPIValueState extraState)
{
    if (found == nullptr)
    {
        setStatus(rc, name ? CMPI_RC_ERR_NO_SUCH_PROPERTY
                           : CMPI_RC_ERR_INVALID_PARAMETER);
        CMPIData d = nullData();
        d.state |= CMPI_notFound;
        return d;
    }
    setStatus(rc, CMPI_RC_OK);
    return makeData(broker, *found, extraState);
}

CMPIData indexedData(BrokerState& broker, const NamedValues& values,
                     CMPICount index, CMPIString** name, CMPIStatus* rc)
{
    if (index >= values.size())
    {
        setStatus(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        return nullData();
    }
    const auto& [valueName, value] = values[index];
    if (name != nullptr)
    {
        auto* s = broker.make<StringObject>();
        s->text = valueName;
        *name = &s->cmpi;
    }
    setStatus(rc, CMPI_RC_OK);
    return makeData(broker, value);
}

} // namespace host::detail
