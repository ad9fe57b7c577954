/*
 * cmpios.h - OS-dependent types and linkage macros of the project's own
 * CMPI 2.0 headers (written to the CMPI 2.0 binary interface).
 */
#ifndef _CMPIOS_H_
#define _CMPIOS_H_

#include "cmpipl.h"
#include <stdlib.h> /* size_t */

/* Thread, mutex and condition handles are opaque pointers on every platform. */
#define CMPI_THREAD_RETURN void*
#define CMPI_THREAD_TYPE   void*
#define CMPI_MUTEX_TYPE    void*
#define CMPI_COND_TYPE     void*

#if defined(CMPI_PLATFORM_WIN32_IX86_MSVC)
#define CMPI_THREAD_CDECL    __stdcall
#define CMPI_THREAD_KEY_TYPE unsigned long int
#define CMPI_EXPORT          __declspec(dllexport)
#ifndef HAVE_STRUCT_TIMESPEC
#define HAVE_STRUCT_TIMESPEC
struct timespec {
  long tv_sec;
  long tv_nsec;
};
#endif
#else
/* Empty on Linux: g++/clang++ have no __cdecl, and the default convention is
 * the only one there. */
#define CMPI_THREAD_CDECL
/* The brokers store a pthread_key_t (4 bytes in glibc) through the key
 * pointer, so the key must not be an 8-byte long on LP64. */
#define CMPI_THREAD_KEY_TYPE unsigned int
#if defined(CMPI_PLATFORM_LINUX_GENERIC_GNU) && defined(__GNUC__) && (__GNUC__ >= 4)
/* Factories must stay visible when a provider builds with -fvisibility=hidden. */
#define CMPI_EXPORT __attribute__((visibility("default")))
#else
#define CMPI_EXPORT
#endif
#endif

#ifdef __cplusplus
#define CMPI_EXTERN_C extern "C" CMPI_EXPORT
#else
#define CMPI_EXTERN_C CMPI_EXPORT
#endif

#endif /* _CMPIOS_H_ */
