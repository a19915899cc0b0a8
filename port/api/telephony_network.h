/* SPDX-License-Identifier: Apache-2.0 */
/* What the mobile network says. */
#ifndef PORT_API_TELEPHONY_NETWORK_H
#define PORT_API_TELEPHONY_NETWORK_H

#include <telephony_common.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE = 0,
    TELEPHONY_NETWORK_SERVICE_STATE_OUT_OF_SERVICE = 1,
    TELEPHONY_NETWORK_SERVICE_STATE_EMERGENCY_ONLY = 2
} telephony_network_service_state_e;

/*
 * Reads whether a slot has service; *state stays untouched on failure. Errors as
 * telephony_sim_get_state(). Any thread.
 */
int telephony_network_get_service_state(telephony_h handle,
                                        telephony_network_service_state_e* state);

/*
 * Reads whether a slot is roaming; *roaming stays untouched on failure. Meaningful in service only.
 * Errors as telephony_sim_get_state(). Any thread.
 */
int telephony_network_get_roaming_status(telephony_h handle, bool* roaming);

#ifdef __cplusplus
}
#endif

#endif
