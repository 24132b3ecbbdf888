/*
 * A deliberately small set of convenience macros on top of cmpift.h.
 * Providers in this project call the function tables directly; these exist
 * for the common status and null checks only.
 */
#ifndef CMPI_MACS_H_INCLUDED
#define CMPI_MACS_H_INCLUDED

#include "cmpift.h"

/* True when an encapsulated object pointer or its handle is missing. */
#define CMIsNullObject(obj) ((obj) == NULL || (obj)->hdl == NULL)

/* State tests on a CMPIData. */
#define CMIsNullValue(data) (((data).state & CMPI_nullValue) != 0)
#define CMIsKeyValue(data) (((data).state & CMPI_keyValue) != 0)
#define CMIsArray(data) (((data).type & CMPI_ARRAY) != 0)

/* Store a return code in an optional CMPIStatus out-parameter. */
#define CMSetStatus(status, code)                                              \
    do                                                                         \
    {                                                                          \
        if (status)                                                            \
        {                                                                      \
            (status)->rc = (code);                                             \
            (status)->msg = NULL;                                              \
        }                                                                      \
    } while (0)

/* Return a CMPIStatus with the given code and no message. */
#define CMReturn(code)                                                         \
    do                                                                         \
    {                                                                          \
        CMPIStatus cmpi_return_status_ = {(code), NULL};                       \
        return cmpi_return_status_;                                            \
    } while (0)

#endif /* CMPI_MACS_H_INCLUDED */
