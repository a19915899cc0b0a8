/* SPDX-License-Identifier: Apache-2.0 */
/* Results of the older telephony interface. */
#ifndef PORT_API_TAPI_UTILITY_H
#define PORT_API_TAPI_UTILITY_H

#include <tizen_type.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    TAPI_API_SUCCESS = 0,
    TAPI_API_INVALID_INPUT = -1,
    TAPI_API_INVALID_PTR = -2,
    TAPI_API_NOT_SUPPORTED = -3,
    TAPI_API_SYSTEM_OUT_OF_MEM = -5,
    TAPI_API_SYSTEM_RPC_LINK_DOWN = -6,
    TAPI_API_SERVICE_NOT_READY = -7,
    TAPI_API_OPERATION_FAILED = -17,
    TAPI_API_ACCESS_DENIED = -19,
    TAPI_API_SIM_CARD_ERROR = -500,
    TAPI_API_SIM_NOT_FOUND = -501,
    TAPI_API_SIM_NOT_INITIALIZED = -502,
    TAPI_API_SIM_LOCKED = -503,
    TAPI_API_SIM_PERM_BLOCKED = -504
} TapiResult_t;

#ifdef __cplusplus
}
#endif

#endif
