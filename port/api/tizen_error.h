/* SPDX-License-Identifier: Apache-2.0 */
/* Error numbers shared by the platform's interfaces; most are negated errno values. */
#ifndef PORT_API_TIZEN_ERROR_H
#define PORT_API_TIZEN_ERROR_H

typedef enum {
    TIZEN_ERROR_NONE = 0,
    TIZEN_ERROR_NOT_PERMITTED = -1,
    TIZEN_ERROR_IO_ERROR = -5,
    TIZEN_ERROR_OUT_OF_MEMORY = -12,
    TIZEN_ERROR_PERMISSION_DENIED = -13,
    TIZEN_ERROR_INVALID_PARAMETER = -22,
    TIZEN_ERROR_UNKNOWN = -1073741824,
    TIZEN_ERROR_TIMED_OUT = -1073741823,
    TIZEN_ERROR_NOT_SUPPORTED = -1073741822
} tizen_error_e;

#define TIZEN_ERROR_SYSTEM_SETTING (-0x02460000)

#endif
