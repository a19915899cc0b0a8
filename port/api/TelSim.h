/* SPDX-License-Identifier: Apache-2.0 */
/* SIM types of the older telephony interface. */
#ifndef PORT_API_TEL_SIM_H
#define PORT_API_TEL_SIM_H

#include <tizen_type.h>

#ifdef __cplusplus
extern "C" {
#endif

/* The parts of an IMSI (ITU E.212), each ended by a NUL. */
typedef struct {
    char szMcc[4];   /* three digits */
    char szMnc[4];   /* two or three digits */
    char szMsin[11]; /* up to ten digits */
} TelSimImsiInfo_t;

typedef enum {
    TAPI_SIM_ACCESS_SUCCESS = 0,
    TAPI_SIM_ACCESS_CARD_ERROR = 1,
    TAPI_SIM_ACCESS_FILE_NOT_FOUND = 2,
    TAPI_SIM_ACCESS_ACCESS_CONDITION_NOT_SATISFIED = 3,
    TAPI_SIM_ACCESS_FAILED = 4
} TelSimAccessResult_t;

typedef enum {
    TAPI_SIM_STATUS_CARD_ERROR = 0x00,
    TAPI_SIM_STATUS_CARD_NOT_PRESENT = 0x01,
    TAPI_SIM_STATUS_SIM_INITIALIZING = 0x02,
    TAPI_SIM_STATUS_SIM_INIT_COMPLETED = 0x03,
    TAPI_SIM_STATUS_SIM_PIN_REQUIRED = 0x04,
    TAPI_SIM_STATUS_SIM_PUK_REQUIRED = 0x05,
    TAPI_SIM_STATUS_CARD_BLOCKED = 0x06,
    TAPI_SIM_STATUS_SIM_NCK_REQUIRED = 0x07,
    TAPI_SIM_STATUS_SIM_NSCK_REQUIRED = 0x08,
    TAPI_SIM_STATUS_SIM_SPCK_REQUIRED = 0x09,
    TAPI_SIM_STATUS_SIM_CCK_REQUIRED = 0x0a,
    TAPI_SIM_STATUS_CARD_REMOVED = 0x0b,
    TAPI_SIM_STATUS_SIM_LOCK_REQUIRED = 0x0c,
    TAPI_SIM_STATUS_CARD_CRASHED = 0x0d,
    TAPI_SIM_STATUS_CARD_POWEROFF = 0x0e,
    TAPI_SIM_STATUS_UNKNOWN = 0xff
} TelSimCardStatus_t;

#ifdef __cplusplus
}
#endif

#endif
