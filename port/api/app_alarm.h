/* SPDX-License-Identifier: Apache-2.0 */
/* Alarms and the clock. */
#ifndef PORT_API_APP_ALARM_H
#define PORT_API_APP_ALARM_H

#include <time.h>

#include <tizen.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    ALARM_ERROR_NONE = TIZEN_ERROR_NONE,
    ALARM_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    ALARM_ERROR_INVALID_TIME = TIZEN_ERROR_APPLICATION | 0x05,
    ALARM_ERROR_INVALID_DATE = TIZEN_ERROR_APPLICATION | 0x06,
    ALARM_ERROR_CONNECTION_FAIL = TIZEN_ERROR_APPLICATION | 0x07,
    ALARM_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    ALARM_ERROR_PERMISSION_DENIED = TIZEN_ERROR_PERMISSION_DENIED
} alarm_error_e;

/*
 * The current time of the device, local and broken down; the zone name is the platform's.
 * INVALID_PARAMETER: null; CONNECTION_FAIL: the clock cannot be asked. Any thread.
 */
int alarm_get_current_time(struct tm* date);

#ifdef __cplusplus
}
#endif

#endif
