/* SPDX-License-Identifier: Apache-2.0 */
/* SIM cards, by the older telephony interface. */
#ifndef PORT_API_ITAPI_SIM_H
#define PORT_API_ITAPI_SIM_H

#include <TelSim.h>
#include <tapi_common.h>

#ifdef __cplusplus
extern "C" {
#endif

/*
 * Reads the parts of the IMSI; *imsi stays untouched on failure. 0, a negative TapiResult_t
 * (INVALID_PTR: null or no handle; ACCESS_DENIED; SIM_NOT_FOUND, SIM_LOCKED, SIM_NOT_INITIALIZED;
 * OPERATION_FAILED) or a positive TelSimAccessResult_t. Any thread.
 */
int tel_get_sim_imsi(TapiHandle* handle, TelSimImsiInfo_t* imsi);

/*
 * Reads how far the card is initialised, and whether it is another card than before (1) or not
 * (0; meaningful with SIM_INIT_COMPLETED only); both stay untouched on failure. Errors as
 * tel_get_sim_imsi(), without those of the card. Any thread.
 */
int tel_get_sim_init_info(TapiHandle* handle, TelSimCardStatus_t* status, int* card_changed);

#ifdef __cplusplus
}
#endif

#endif
