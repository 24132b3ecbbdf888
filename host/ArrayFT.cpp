#include "BrokerState.h"
#include "Objects.h"
#include "ValueConversion.h"

namespace host::detail
{

void ArrayObject::copyFrom(const ArrayObject& other)
{
    elementType = other.elementType;
    elements = other.elements;
}

namespace
{

CMPICount arrayGetSize(const CMPIArray* ar, CMPIStatus* rc)
{
    const ArrayObject* a = ArrayObject::of(ar);
    setStatus(rc, a ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE);
    return a ? static_cast<CMPICount>(a->elements.size()) : 0;
}

CMPIType arrayGetSimpleType(const CMPIArray* ar, CMPIStatus* rc)
{
    const ArrayObject* a = ArrayObject::of(ar);
    setStatus(rc, a ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE);
    return a ? a->elementType : CMPIType{CMPI_null};
}

CMPIData arrayGetElementAt(const CMPIArray* ar, CMPICount index, CMPIStatus* rc)
{
    const ArrayObject* a = ArrayObject::of(ar);
    if (a == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullData();
    }
    if (index >= a->elements.size())
    {
        setStatus(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        return nullData();
    }
    setStatus(rc, CMPI_RC_OK);
    return makeData(*a->broker, a->elements[index]);
}

CMPIStatus arraySetElementAt(CMPIArray* ar, CMPICount index,
                             const CMPIValue* value, CMPIType type)
{
    ArrayObject* a = ArrayObject::of(ar);
    if (a == nullptr)
    {
        return errorStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (index >= a->elements.size())
    {
        return errorStatus(CMPI_RC_ERR_NO_SUCH_PROPERTY);
    }
    if ((type & CMPI_ARRAY) != 0 || storedType(type) != a->elementType)
    {
        return errorStatus(CMPI_RC_ERR_TYPE_MISMATCH);
    }
    Value element;
    const CMPIrc rc = readArgument(value, type, element);
    if (rc != CMPI_RC_OK)
    {
        return errorStatus(rc);
    }
    a->elements[index] = std::move(element);
    return okStatus();
}

} // namespace

CMPIArrayFT arrayFT = {
    200,
    releaseObject<ArrayObject, CMPIArray>,
    cloneObject<ArrayObject, CMPIArray>,
    arrayGetSize,
    arrayGetSimpleType,
    arrayGetElementAt,
    arraySetElementAt,
};

} // namespace host::detail
