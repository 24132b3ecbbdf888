#pragma once

#include <cmpidt.h>
#include <cmpift.h>

#include <cstdint>

namespace QX::SELComposite
{

/**
 * Property setting with the CMPI type taken from the C++ type, so that a
 * value can only be set with the type code of its own width.
 */
template <typename T>
struct CmpiTypeOf; // deliberately undefined for every other type

/** One row of the table below: the type code of @p T and the member of
 *  CMPIValue that holds it. */
template <typename T, CMPIType Code, auto Member>
struct CmpiField
{
    static constexpr CMPIType type = Code;
    static void store(CMPIValue& value, T number)
    {
        value.*Member = number;
    }
};

// clang-format off
template <> struct CmpiTypeOf<std::uint8_t> : CmpiField<std::uint8_t, CMPI_uint8, &CMPIValue::uint8> {};
template <> struct CmpiTypeOf<std::uint16_t> : CmpiField<std::uint16_t, CMPI_uint16, &CMPIValue::uint16> {};
template <> struct CmpiTypeOf<std::uint32_t> : CmpiField<std::uint32_t, CMPI_uint32, &CMPIValue::uint32> {};
template <> struct CmpiTypeOf<std::uint64_t> : CmpiField<std::uint64_t, CMPI_uint64, &CMPIValue::uint64> {};
template <> struct CmpiTypeOf<CMPIDateTime*> : CmpiField<CMPIDateTime*, CMPI_dateTime, &CMPIValue::dateTime> {};
template <> struct CmpiTypeOf<CMPIString*> : CmpiField<CMPIString*, CMPI_string, &CMPIValue::string> {};
// clang-format on

template <>
struct CmpiTypeOf<bool>
{
    static constexpr CMPIType type = CMPI_boolean;
    static void store(CMPIValue& value, bool flag)
    {
        value.boolean = flag ? 1 : 0;
    }
};

template <typename T>
CMPIStatus setTypedProperty(const CMPIInstance* instance, const char* name,
                            T value)
{
    CMPIValue data{};
    CmpiTypeOf<T>::store(data, value);
    return instance->ft->setProperty(instance, name, &data,
                                     CmpiTypeOf<T>::type);
}

/** Sets a CMPI_chars property: the broker reads the text from the value
 *  pointer itself. */
inline CMPIStatus setTextProperty(const CMPIInstance* instance,
                                  const char* name, const char* text)
{
    return instance->ft->setProperty(
        instance, name, reinterpret_cast<const CMPIValue*>(text), CMPI_chars);
}

inline CMPIStatus setArrayProperty(const CMPIInstance* instance,
                                   const char* name, CMPIArray* array,
                                   CMPIType arrayType)
{
    CMPIValue data{};
    data.array = array;
    return instance->ft->setProperty(instance, name, &data, arrayType);
}

template <typename T>
CMPIStatus setTypedElement(CMPIArray* array, CMPICount index, T value)
{
    CMPIValue data{};
    CmpiTypeOf<T>::store(data, value);
    return array->ft->setElementAt(array, index, &data, CmpiTypeOf<T>::type);
}

template <typename T>
CMPIStatus returnTypedData(const CMPIResult* result, T value)
{
    CMPIValue data{};
    CmpiTypeOf<T>::store(data, value);
    return result->ft->returnData(result, &data, CmpiTypeOf<T>::type);
}

/** Characters of a broker string, or nullptr for a missing string. */
inline const char* charsOf(const CMPIString* string, CMPIStatus* status)
{
    if (string == nullptr || string->ft == nullptr)
    {
        return nullptr;
    }
    return string->ft->getCharPtr(string, status);
}

/** Whether a broker object is usable: present and holding a handle. */
template <typename Object>
bool isUsable(const Object* object)
{
    return object != nullptr && object->hdl != nullptr && object->ft != nullptr;
}

} // namespace QX::SELComposite
