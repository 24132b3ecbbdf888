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

template <>
struct CmpiTypeOf<std::uint8_t>
{
    static constexpr CMPIType type = CMPI_uint8;
    static void store(CMPIValue& value, std::uint8_t number)
    {
        value.uint8 = number;
    }
};

template <>
struct CmpiTypeOf<std::uint16_t>
{
    static constexpr CMPIType type = CMPI_uint16;
    static void store(CMPIValue& value, std::uint16_t number)
    {
        value.uint16 = number;
    }
};

template <>
struct CmpiTypeOf<std::uint32_t>
{
    static constexpr CMPIType type = CMPI_uint32;
    static void store(CMPIValue& value, std::uint32_t number)
    {
        value.uint32 = number;
    }
};

template <>
struct CmpiTypeOf<std::uint64_t>
{
    static constexpr CMPIType type = CMPI_uint64;
    static void store(CMPIValue& value, std::uint64_t number)
    {
        value.uint64 = number;
    }
};

template <>
struct CmpiTypeOf<bool>
{
    static constexpr CMPIType type = CMPI_boolean;
    static void store(CMPIValue& value, bool flag)
    {
        value.boolean = flag ? 1 : 0;
    }
};

template <>
struct CmpiTypeOf<CMPIDateTime*>
{
    static constexpr CMPIType type = CMPI_dateTime;
    static void store(CMPIValue& value, CMPIDateTime* dateTime)
    {
        value.dateTime = dateTime;
    }
};

template <>
struct CmpiTypeOf<CMPIString*>
{
    static constexpr CMPIType type = CMPI_string;
    static void store(CMPIValue& value, CMPIString* string)
    {
        value.string = string;
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
