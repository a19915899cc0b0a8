/* SPDX-License-Identifier: Apache-2.0 */
/* What a SIM card says. */
#ifndef PORT_API_TELEPHONY_SIM_H
#define PORT_API_TELEPHONY_SIM_H

#include <telephony_common.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    TELEPHONY_SIM_STATE_UNAVAILABLE = 0,
    TELEPHONY_SIM_STATE_LOCKED = 1,
    TELEPHONY_SIM_STATE_AVAILABLE = 2,
    TELEPHONY_SIM_STATE_UNKNOWN = 3 /* in transition */
} telephony_sim_state_e;

/*
 * Reads the state of a slot's card; *state stays untouched on failure. INVALID_PARAMETER: a null
 * argument or no handle of a list; PERMISSION_DENIED; NOT_SUPPORTED: this device has no telephony;
 * OPERATION_FAILED. Any thread.
 */
int telephony_sim_get_state(telephony_h handle, telephony_sim_state_e* state);

/*
 * Reads the card's own phone number; *number is malloc memory that the caller frees. Errors as
 * telephony_sim_get_state(), and SIM_NOT_AVAILABLE: no usable card. A card that holds no number is
 * OPERATION_FAILED with null stored; some platforms succeed with null. Any other failure leaves
 * *number untouched. Any thread.
 */
int telephony_sim_get_subscriber_number(telephony_h handle, char** number);

#ifdef __cplusplus
}
#endif

#endif
