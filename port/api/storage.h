/* SPDX-License-Identifier: Apache-2.0 */
/* Storage of the device. */
#ifndef PORT_API_STORAGE_H
#define PORT_API_STORAGE_H

#include <sys/statvfs.h>

#include <tizen.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    STORAGE_ERROR_NONE = TIZEN_ERROR_NONE,
    STORAGE_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    STORAGE_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    STORAGE_ERROR_NOT_SUPPORTED = TIZEN_ERROR_NO_SUCH_DEVICE,
    STORAGE_ERROR_OPERATION_FAILED = TIZEN_ERROR_SYSTEM_CLASS | 0x12
} storage_error_e;

/* The structure differs with the width of file offsets, and so does the function that fills it. */
#ifdef __USE_FILE_OFFSET64
#define storage_get_internal_memory_size storage_get_internal_memory_size64
#endif

/*
 * Fills *buf with the size of the internal storage (f_bsize, f_frsize, f_blocks, f_bavail); 0, or
 * negative on failure: INVALID_PARAMETER, OPERATION_FAILED. Any thread.
 */
int storage_get_internal_memory_size(struct statvfs* buf);

#ifdef __cplusplus
}
#endif

#endif
