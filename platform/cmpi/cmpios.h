/* CMPI 2.0 operating-system types and symbol export (C and C++). */
#ifndef CMPIOS_H
#define CMPIOS_H

#include "cmpipl.h"

#define CMPI_EXPORT __attribute__((visibility("default")))

#ifdef __cplusplus
#define CMPI_EXTERN_C extern "C" CMPI_EXPORT
#else
#define CMPI_EXTERN_C CMPI_EXPORT
#endif

#define CMPI_THREAD_TYPE void*
#define CMPI_THREAD_RETURN void*
#define CMPI_THREAD_CDECL
#define CMPI_MUTEX_TYPE void*
#define CMPI_COND_TYPE void*

/* Eight bytes at level 200. Later headers narrow it to four: keep keys only in
 * variables of this type, since createThreadKey writes through a pointer. */
#define CMPI_THREAD_KEY_TYPE unsigned long int

#endif
