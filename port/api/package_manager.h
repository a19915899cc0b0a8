/* SPDX-License-Identifier: Apache-2.0 */
/* The installed packages. */
#ifndef PORT_API_PACKAGE_MANAGER_H
#define PORT_API_PACKAGE_MANAGER_H

#include <package_info.h>

#ifdef __cplusplus
extern "C" {
#endif

/* Sizes in bytes. */
typedef struct {
    long long data_size;
    long long cache_size;
    long long app_size;
    long long ext_data_size;
    long long ext_cache_size;
    long long ext_app_size;
} package_size_info_t;

typedef void (*package_manager_size_info_receive_cb)(const char* package_id,
                                                     const package_size_info_t* size_info,
                                                     void* user_data);

/*
 * Asks for the size of a package; without a callback only the result counts. INVALID_PARAMETER: a
 * null name; NO_SUCH_PACKAGE; IO_ERROR: the packages cannot be read; SYSTEM_ERROR: there is a
 * callback, and the sizes are not known; PERMISSION_DENIED. Any thread.
 */
int package_manager_get_package_size_info(const char* package_id,
                                          package_manager_size_info_receive_cb callback,
                                          void* user_data);

#ifdef __cplusplus
}
#endif

#endif
