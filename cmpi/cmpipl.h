/* CMPI, the Common Manageability Programming Interface (The Open Group), version 2.0: the platform.
 *
 * Exactly one of the CMPI_PLATFORM_... symbols must be defined before any CMPI header, commonly on the compiler's
 * command line; cmpios.h follows it. */

#ifndef _CMPIPL_H_
#define _CMPIPL_H_

#if !defined(CMPI_PLATFORM_AIX_RS_IBMCXX) && !defined(CMPI_PLATFORM_DARWIN_PPC_GNU) &&         \
    !defined(CMPI_PLATFORM_HPUX_ACC) && !defined(CMPI_PLATFORM_LINUX_GENERIC_GNU) &&           \
    !defined(CMPI_PLATFORM_OS400_ISERIES_IBM) && !defined(CMPI_PLATFORM_SOLARIS_SPARC_CC) &&   \
    !defined(CMPI_PLATFORM_SOLARIS_SPARC_GNU) && !defined(CMPI_PLATFORM_TRU64_ALPHA_DECCXX) && \
    !defined(CMPI_PLATFORM_VMS_ALPHA_DECCXX) && !defined(CMPI_PLATFORM_VMS_IA64_DECCXX) &&     \
    !defined(CMPI_PLATFORM_WIN32_IX86_MSVC) && !defined(CMPI_PLATFORM_ZOS_ZSERIES_IBM)
#error "CMPI: no platform chosen; define one of the CMPI_PLATFORM_... symbols that cmpipl.h lists"
#endif

#endif /* _CMPIPL_H_ */
