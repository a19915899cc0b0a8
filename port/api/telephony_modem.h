/* SPDX-License-Identifier: Apache-2.0 */
/* What a modem says. */
#ifndef PORT_API_TELEPHONY_MODEM_H
#define PORT_API_TELEPHONY_MODEM_H

#include <telephony_common.h>

#ifdef __cplusplus
extern "C" {
#endif

/*
 * Reads the modem's IMEI (3GPP TS 23.003); *imei is malloc memory that the caller frees, untouched
 * on failure. Errors as telephony_sim_get_state(). Any thread.
 */
int telephony_modem_get_imei(telephony_h handle, char** imei);

#ifdef __cplusplus
}
#endif

#endif
