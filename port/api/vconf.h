/* SPDX-License-Identifier: Apache-2.0 */
/* The device's configuration store. */
#ifndef PORT_API_VCONF_H
#define PORT_API_VCONF_H

#include <tizen_type.h>

#ifdef __cplusplus
extern "C" {
#endif

#define VCONFKEY_CSC_SALESCODE "db/csc/salescode"

/*
 * The text of a key in malloc memory that the caller frees; null on any error: unknown key, a key
 * without a known prefix ("db/", "file/", "memory/"), a value of another type. Any thread.
 */
char* vconf_get_str(const char* key);

#ifdef __cplusplus
}
#endif

#endif
