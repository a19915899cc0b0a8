/* SPDX-License-Identifier: Apache-2.0 */
/* Default subscriptions, by the older telephony interface. */
#ifndef PORT_API_ITAPI_NETWORK_H
#define PORT_API_ITAPI_NETWORK_H

#include <TelNetwork.h>
#include <tapi_common.h>

#ifdef __cplusplus
extern "C" {
#endif

/*
 * Reads the subscription that serves by default; *subs stays untouched on failure. 0 or a negative
 * TapiResult_t: INVALID_PTR, ACCESS_DENIED, NOT_SUPPORTED, OPERATION_FAILED. Any thread.
 */
int tel_get_network_default_subscription(TapiHandle* handle, TelNetworkDefaultSubs_t* subs);

/* The same for data. */
int tel_get_network_default_data_subscription(TapiHandle* handle,
                                              TelNetworkDefaultDataSubs_t* subs);

#ifdef __cplusplus
}
#endif

#endif
