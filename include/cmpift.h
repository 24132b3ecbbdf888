/*
 * CMPI function tables: the broker services, the encapsulated data objects
 * handed between broker and provider, and the management instrumentation
 * (MI) interfaces a provider library exports.
 *
 * Every struct here is shared in binary form with the object manager, so
 * member order and types must stay exactly as they are.
 */
#ifndef CMPI_FT_H_INCLUDED
#define CMPI_FT_H_INCLUDED

#include "cmpidt.h"
#include "cmpios.h"

/* The function tables, one file per group, and their macros. */
#include "cmpift_broker.h"
#include "cmpift_objects.h"
#include "cmpimacs.h"

#endif /* CMPI_FT_H_INCLUDED */
