/* SPDX-License-Identifier: Apache-2.0 */
/* One installed package. */
#ifndef PORT_API_PACKAGE_INFO_H
#define PORT_API_PACKAGE_INFO_H

#include <tizen.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef struct package_info_s* package_info_h;

typedef enum {
    PACKAGE_MANAGER_ERROR_NONE = TIZEN_ERROR_NONE,
    PACKAGE_MANAGER_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    PACKAGE_MANAGER_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    PACKAGE_MANAGER_ERROR_IO_ERROR = TIZEN_ERROR_IO_ERROR,
    PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE = TIZEN_ERROR_PACKAGE_MANAGER | 0x71,
    PACKAGE_MANAGER_ERROR_SYSTEM_ERROR = TIZEN_ERROR_PACKAGE_MANAGER | 0x72,
    PACKAGE_MANAGER_ERROR_PERMISSION_DENIED = TIZEN_ERROR_PERMISSION_DENIED
} package_manager_error_e;

/*
 * Makes a handle on an installed package, released with package_info_destroy(); *info stays
 * untouched on failure. INVALID_PARAMETER: a null argument; NO_SUCH_PACKAGE; IO_ERROR: the packages
 * cannot be read; PERMISSION_DENIED. Any thread.
 */
int package_info_create(const char* package_id, package_info_h* info);

/* Releases a handle. INVALID_PARAMETER: null or no handle of package_info_create(). */
int package_info_destroy(package_info_h info);

/*
 * The version of a package; *version is malloc memory that the caller frees, untouched on failure.
 * INVALID_PARAMETER: a null argument or no handle; IO_ERROR. Any thread.
 */
int package_info_get_version(package_info_h info, char** version);

#ifdef __cplusplus
}
#endif

#endif
