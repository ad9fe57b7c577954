/*
 * cmpipl.h - platform selection for the project's own CMPI 2.0 headers.
 *
 * These headers are written to the CMPI 2.0 binary interface and are
 * layout-compatible with the copies shipped by CMPI object managers.
 *
 * Exactly one CMPI_PLATFORM_* macro must be defined.  When none is, Linux/GNU
 * is assumed, which is the only platform this project builds for.
 */
#ifndef _CMPIPL_H_
#define _CMPIPL_H_

#if !defined(CMPI_PLATFORM_LINUX_GENERIC_GNU) && !defined(CMPI_PLATFORM_HPUX_ACC) && \
    !defined(CMPI_PLATFORM_WIN32_IX86_MSVC) && !defined(CMPI_PLATFORM_SOLARIS_SPARC_GNU) && \
    !defined(CMPI_PLATFORM_SOLARIS_SPARC_CC) && !defined(CMPI_PLATFORM_AIX_RS_IBMCXX) && \
    !defined(CMPI_PLATFORM_ZOS_ZSERIES_IBM) && !defined(CMPI_PLATFORM_TRU64_ALPHA_DECCXX) && \
    !defined(CMPI_PLATFORM_OS400_ISERIES_IBM) && !defined(CMPI_PLATFORM_DARWIN_PPC_GNU) && \
    !defined(CMPI_PLATFORM_VMS_ALPHA_DECCXX) && !defined(CMPI_PLATFORM_VMS_IA64_DECCXX)
#define CMPI_PLATFORM_LINUX_GENERIC_GNU 1
#endif

#if (defined(CMPI_PLATFORM_LINUX_GENERIC_GNU) + defined(CMPI_PLATFORM_HPUX_ACC) +          \
     defined(CMPI_PLATFORM_WIN32_IX86_MSVC) + defined(CMPI_PLATFORM_SOLARIS_SPARC_GNU) +   \
     defined(CMPI_PLATFORM_SOLARIS_SPARC_CC) + defined(CMPI_PLATFORM_AIX_RS_IBMCXX) +      \
     defined(CMPI_PLATFORM_ZOS_ZSERIES_IBM) + defined(CMPI_PLATFORM_TRU64_ALPHA_DECCXX) +  \
     defined(CMPI_PLATFORM_OS400_ISERIES_IBM) + defined(CMPI_PLATFORM_DARWIN_PPC_GNU) +    \
     defined(CMPI_PLATFORM_VMS_ALPHA_DECCXX) + defined(CMPI_PLATFORM_VMS_IA64_DECCXX)) != 1
#error "cmpipl.h: define exactly one CMPI_PLATFORM_* macro"
#endif

#endif /* _CMPIPL_H_ */
