/* SPDX-License-Identifier: Apache-2.0 */
/* Handles and errors of the telephony interface. */
#ifndef PORT_API_TELEPHONY_COMMON_H
#define PORT_API_TELEPHONY_COMMON_H

#include <tizen.h>

#ifdef __cplusplus
extern "C" {
#endif

/* One SIM slot of the telephony service. */
typedef struct telephony_data* telephony_h;

/* One handle a slot, the first slot first. */
typedef struct {
    unsigned int count;
    telephony_h* handle;
} telephony_handle_list_s;

typedef enum {
    TELEPHONY_ERROR_NONE = TIZEN_ERROR_NONE,
    TELEPHONY_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    TELEPHONY_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    TELEPHONY_ERROR_PERMISSION_DENIED = TIZEN_ERROR_PERMISSION_DENIED,
    TELEPHONY_ERROR_NOT_SUPPORTED = TIZEN_ERROR_NOT_SUPPORTED,
    TELEPHONY_ERROR_OPERATION_FAILED = TIZEN_ERROR_TELEPHONY | 0x0001,
    TELEPHONY_ERROR_SIM_NOT_AVAILABLE = TIZEN_ERROR_TELEPHONY | 0x1001
} telephony_error_e;

#ifdef __cplusplus
}
#endif

#endif
