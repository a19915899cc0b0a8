/* SPDX-License-Identifier: Apache-2.0 */
/* Handles of the older telephony interface. */
#ifndef PORT_API_TAPI_COMMON_H
#define PORT_API_TAPI_COMMON_H

#include <TapiUtility.h>

#ifdef __cplusplus
extern "C" {
#endif

/* A connection to one modem. */
typedef struct tapi_handle TapiHandle;

/*
 * The names of all modems, one a SIM slot, ended by null; null when the service cannot be asked.
 * The list and its names are the platform's and stay as they are until the process ends. Any thread.
 */
char** tel_get_cp_name_list(void);

/*
 * Opens a handle on the modem of that name, or on the first one when `cp_name` is null; null when
 * there is no such modem. Released with tel_deinit(). Any thread.
 */
TapiHandle* tel_init(const char* cp_name);

/* Releases a handle. INVALID_PTR: null or no handle of tel_init(). Any thread. */
int tel_deinit(TapiHandle* handle);

#ifdef __cplusplus
}
#endif

#endif
