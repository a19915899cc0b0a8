/* SPDX-License-Identifier: Apache-2.0 */
/* The preferred subscription for calls, by the older telephony interface. */
#ifndef PORT_API_ITAPI_CALL_H
#define PORT_API_ITAPI_CALL_H

#include <TelCall.h>
#include <tapi_common.h>

#ifdef __cplusplus
extern "C" {
#endif

/* Reads the subscription preferred for calls; as tel_get_network_default_subscription(). */
int tel_get_call_preferred_voice_subscription(TapiHandle* handle,
                                              TelCallPreferredVoiceSubs_t* subs);

#ifdef __cplusplus
}
#endif

#endif
