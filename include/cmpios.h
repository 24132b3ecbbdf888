/*
 * Operating-system dependent types and linkage macros used by the CMPI
 * function tables (threads, mutexes, condition variables, thread keys) and by
 * the exported MI factory functions.
 *
 * Only POSIX systems built with a GNU-compatible compiler are supported.
 * The types are the ones the brokers (SFCB, OpenPegasus) use on Linux:
 * handles are plain void pointers and a thread key is a 4-byte unsigned int,
 * because both brokers write exactly 4 bytes through createThreadKey().
 */
#ifndef CMPI_OS_H_INCLUDED
#define CMPI_OS_H_INCLUDED

#include "cmpipl.h"

#include <stdlib.h> /* size_t */

#if defined(CMPI_PLATFORM_WIN32_IX86_MSVC)
#error "These CMPI headers support POSIX platforms only"
#endif

#define CMPI_THREAD_RETURN void*
#define CMPI_THREAD_TYPE void*
#define CMPI_MUTEX_TYPE void*
#define CMPI_COND_TYPE void*
#define CMPI_THREAD_KEY_TYPE unsigned int

/* x86_64 and the other supported targets have one C calling convention. */
#define CMPI_THREAD_CDECL

#if defined(__GNUC__) && __GNUC__ >= 4
#define CMPI_EXPORT __attribute__((visibility("default")))
#define CMPI_IMPORT __attribute__((visibility("default")))
#else
#define CMPI_EXPORT
#define CMPI_IMPORT
#endif

/* Linkage for the factory functions a broker finds with dlsym(). */
#ifdef __cplusplus
#define CMPI_EXTERN_C extern "C" CMPI_EXPORT
#else
#define CMPI_EXTERN_C CMPI_EXPORT
#endif

#endif /* CMPI_OS_H_INCLUDED */
