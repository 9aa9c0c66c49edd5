/* CMPI, the Common Manageability Programming Interface (The Open Group), version 2.0: what differs by platform:
 * threads, and how entry points are exported. */

#ifndef _CMPIOS_H_
#define _CMPIOS_H_

#include <stdlib.h>

#include "cmpipl.h"

/* What a thread function returns; handles of threads, mutexes and condition variables. */
#define CMPI_THREAD_RETURN void*
#define CMPI_THREAD_TYPE void*
#define CMPI_MUTEX_TYPE void*
#define CMPI_COND_TYPE void*

/* The calling convention of a thread function, and the type of a key for values of each thread. */
#if defined(CMPI_PLATFORM_WIN32_IX86_MSVC)
#define CMPI_THREAD_CDECL __stdcall
#define CMPI_THREAD_KEY_TYPE unsigned long int
/* Keeps POSIX thread libraries for this platform from defining struct timespec again. */
#ifndef HAVE_STRUCT_TIMESPEC
#define HAVE_STRUCT_TIMESPEC
#endif
#elif defined(CMPI_PLATFORM_ZOS_ZSERIES_IBM)
#ifndef __cplusplus
#include <pthread.h>
#define CMPI_THREAD_CDECL
#else
#define CMPI_THREAD_CDECL __cdecl
#endif
#define CMPI_THREAD_KEY_TYPE pthread_key_t
#else
#define CMPI_THREAD_CDECL
#define CMPI_THREAD_KEY_TYPE unsigned long int
#endif

/* Lets a symbol be seen outside of its library, however the rest is built. */
#if defined(CMPI_PLATFORM_WIN32_IX86_MSVC)
#define CMPI_EXPORT __declspec(dllexport)
#elif defined(CMPI_PLATFORM_LINUX_GENERIC_GNU) && (__GNUC__ >= 4)
#define CMPI_EXPORT __attribute__((visibility("default")))
#else
#define CMPI_EXPORT
#endif

/* The linkage of a provider's entry points. */
#ifdef __cplusplus
#define CMPI_EXTERN_C extern "C" CMPI_EXPORT
#else
#define CMPI_EXTERN_C CMPI_EXPORT
#endif

#endif /* _CMPIOS_H_ */
