/* SPDX-License-Identifier: Apache-2.0 */
/* SIM cards, modems and the mobile network. */
#ifndef PORT_API_TELEPHONY_H
#define PORT_API_TELEPHONY_H

#include <telephony_common.h>
#include <telephony_modem.h>
#include <telephony_network.h>
#include <telephony_sim.h>

#ifdef __cplusplus
extern "C" {
#endif

/*
 * Fills *list with one handle a SIM slot; undone by telephony_deinit(). INVALID_PARAMETER: a null
 * list; NOT_SUPPORTED: this device has no telephony; OPERATION_FAILED: the service cannot be asked.
 * Any thread.
 */
int telephony_init(telephony_handle_list_s* list);

/*
 * Releases the handles of *list and empties it. INVALID_PARAMETER: a null list, or handles that are
 * none of telephony_init(). A list that was never filled is no error. Any thread.
 */
int telephony_deinit(telephony_handle_list_s* list);

#ifdef __cplusplus
}
#endif

#endif
