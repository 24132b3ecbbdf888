/*
 * Platform selection for the CMPI headers.
 *
 * Exactly one CMPI_PLATFORM_* symbol must be defined by the build; on Linux
 * that is CMPI_PLATFORM_LINUX_GENERIC_GNU. Failing early here gives a clear
 * message instead of confusing errors further down in cmpios.h.
 */
#ifndef CMPI_PL_H_INCLUDED
#define CMPI_PL_H_INCLUDED

#if !defined(CMPI_PLATFORM_LINUX_GENERIC_GNU) &&                               \
    !defined(CMPI_PLATFORM_HPUX_ACC) &&                                        \
    !defined(CMPI_PLATFORM_WIN32_IX86_MSVC) &&                                 \
    !defined(CMPI_PLATFORM_SOLARIS_SPARC_GNU) &&                               \
    !defined(CMPI_PLATFORM_SOLARIS_SPARC_CC) &&                                \
    !defined(CMPI_PLATFORM_AIX_RS_IBMCXX) &&                                   \
    !defined(CMPI_PLATFORM_ZOS_ZSERIES_IBM) &&                                 \
    !defined(CMPI_PLATFORM_TRU64_ALPHA_DECCXX) &&                              \
    !defined(CMPI_PLATFORM_OS400_ISERIES_IBM) &&                               \
    !defined(CMPI_PLATFORM_DARWIN_PPC_GNU) &&                                  \
    !defined(CMPI_PLATFORM_VMS_ALPHA_DECCXX) &&                                \
    !defined(CMPI_PLATFORM_VMS_IA64_DECCXX)
#error "No CMPI platform defined: define CMPI_PLATFORM_LINUX_GENERIC_GNU"
#endif

#endif /* CMPI_PL_H_INCLUDED */
