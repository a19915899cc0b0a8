/* SPDX-License-Identifier: Apache-2.0 */
/* Network types of the older telephony interface. */
#ifndef PORT_API_TEL_NETWORK_H
#define PORT_API_TEL_NETWORK_H

#include <tizen_type.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    TAPI_NETWORK_DEFAULT_SUBS_UNKNOWN = -1,
    TAPI_NETWORK_DEFAULT_SUBS_SIM1 = 0,
    TAPI_NETWORK_DEFAULT_SUBS_SIM2 = 1
} TelNetworkDefaultSubs_t;

typedef enum {
    TAPI_NETWORK_DEFAULT_DATA_SUBS_UNKNOWN = -1,
    TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM1 = 0,
    TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM2 = 1
} TelNetworkDefaultDataSubs_t;

#ifdef __cplusplus
}
#endif

#endif
