/* SPDX-License-Identifier: Apache-2.0 */
/* Call types of the older telephony interface. */
#ifndef PORT_API_TEL_CALL_H
#define PORT_API_TEL_CALL_H

#include <tizen_type.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    TAPI_CALL_PREFERRED_VOICE_SUBS_UNKNOWN = -1,
    TAPI_CALL_PREFERRED_VOICE_SUBS_CURRENT_NETWORK = 0,
    TAPI_CALL_PREFERRED_VOICE_SUBS_ASK_ALWAYS = 1,
    TAPI_CALL_PREFERRED_VOICE_SUBS_SIM1 = 2,
    TAPI_CALL_PREFERRED_VOICE_SUBS_SIM2 = 3
} TelCallPreferredVoiceSubs_t;

#ifdef __cplusplus
}
#endif

#endif
