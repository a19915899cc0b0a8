/* SPDX-License-Identifier: Apache-2.0 */
/* Fixed facts about the platform. */
#ifndef PORT_API_SYSTEM_INFO_H
#define PORT_API_SYSTEM_INFO_H

#include <tizen.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    SYSTEM_INFO_ERROR_NONE = TIZEN_ERROR_NONE,
    SYSTEM_INFO_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    SYSTEM_INFO_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    SYSTEM_INFO_ERROR_IO_ERROR = TIZEN_ERROR_IO_ERROR,
    SYSTEM_INFO_ERROR_PERMISSION_DENIED = TIZEN_ERROR_PERMISSION_DENIED
} system_info_error_e;

/*
 * Reads the string value of a key; *value is malloc memory that the caller frees, untouched on
 * failure. INVALID_PARAMETER: unknown key or null argument; IO_ERROR: the value cannot be read. Any
 * thread.
 */
int system_info_get_platform_string(const char* key, char** value);

#ifdef __cplusplus
}
#endif

#endif
