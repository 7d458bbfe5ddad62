/**
 * @file
 * Threads, mutexes and conditions of the operating system, as CMPI names them.
 */
#ifndef CMPIOS_H
#define CMPIOS_H

#include "cmpipl.h"

#include <pthread.h>
#include <time.h>

#define CMPI_THREAD_RETURN void*
#define CMPI_THREAD_TYPE void*
#define CMPI_THREAD_CDECL
#define CMPI_THREAD_KEY_TYPE pthread_key_t
#define CMPI_MUTEX_TYPE void*
#define CMPI_COND_TYPE void*

#ifdef __cplusplus
extern "C" {
#endif

/** What a thread runs. */
typedef CMPI_THREAD_RETURN(CMPI_THREAD_CDECL* CMPIThreadFunc)(void*);
/** What is run once in the process. */
typedef void (*CMPIThreadOnceFunc)(void);
/** Releases a value that a thread has kept under a key. */
typedef void (*CMPIThreadKeyCleanupFunc)(void*);

#ifdef __cplusplus
}
#endif

#endif
