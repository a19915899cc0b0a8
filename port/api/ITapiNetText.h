/* SPDX-License-Identifier: Apache-2.0 */
/* Text messages, by the older telephony interface. */
#ifndef PORT_API_ITAPI_NET_TEXT_H
#define PORT_API_ITAPI_NET_TEXT_H

#include <tapi_common.h>

#ifdef __cplusplus
extern "C" {
#endif

/*
 * Reads whether text messages can be sent and received: *ready is 1 or 0, untouched on failure.
 * Errors as tel_get_network_default_subscription(). Any thread.
 */
int tel_check_sms_device_status(TapiHandle* handle, int* ready);

#ifdef __cplusplus
}
#endif

#endif
