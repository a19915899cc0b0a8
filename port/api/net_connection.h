/* SPDX-License-Identifier: Apache-2.0 */
/* Connections of the device. */
#ifndef PORT_API_NET_CONNECTION_H
#define PORT_API_NET_CONNECTION_H

#include <tizen.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef void* connection_h;

typedef enum {
    CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE = 0,
    CONNECTION_CELLULAR_STATE_FLIGHT_MODE = 1,
    CONNECTION_CELLULAR_STATE_ROAMING_OFF = 2,
    CONNECTION_CELLULAR_STATE_CALL_ONLY_AVAILABLE = 3,
    CONNECTION_CELLULAR_STATE_AVAILABLE = 4,
    CONNECTION_CELLULAR_STATE_CONNECTED = 5
} connection_cellular_state_e;

typedef enum {
    CONNECTION_WIFI_STATE_DEACTIVATED = 0,
    CONNECTION_WIFI_STATE_DISCONNECTED = 1,
    CONNECTION_WIFI_STATE_CONNECTED = 2
} connection_wifi_state_e;

typedef enum {
    CONNECTION_BT_STATE_DEACTIVATED = 0,
    CONNECTION_BT_STATE_DISCONNECTED = 1,
    CONNECTION_BT_STATE_CONNECTED = 2
} connection_bt_state_e;

typedef enum {
    CONNECTION_ERROR_NONE = TIZEN_ERROR_NONE,
    CONNECTION_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    CONNECTION_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    CONNECTION_ERROR_INVALID_OPERATION = TIZEN_ERROR_INVALID_OPERATION,
    CONNECTION_ERROR_ADDRESS_FAMILY_NOT_SUPPORTED = TIZEN_ERROR_ADDRESS_FAMILY_NOT_SUPPORTED,
    CONNECTION_ERROR_OPERATION_FAILED = TIZEN_ERROR_CONNECTION | 0x0401,
    CONNECTION_ERROR_ITERATOR_END = TIZEN_ERROR_CONNECTION | 0x0402,
    CONNECTION_ERROR_NO_CONNECTION = TIZEN_ERROR_CONNECTION | 0x0403,
    CONNECTION_ERROR_NOW_IN_PROGRESS = TIZEN_ERROR_NOW_IN_PROGRESS,
    CONNECTION_ERROR_ALREADY_EXISTS = TIZEN_ERROR_CONNECTION | 0x0404,
    CONNECTION_ERROR_OPERATION_ABORTED = TIZEN_ERROR_CONNECTION | 0x0405,
    CONNECTION_ERROR_DHCP_FAILED = TIZEN_ERROR_CONNECTION | 0x0406,
    CONNECTION_ERROR_INVALID_KEY = TIZEN_ERROR_CONNECTION | 0x0407,
    CONNECTION_ERROR_NO_REPLY = TIZEN_ERROR_CONNECTION | 0x0408,
    CONNECTION_ERROR_PERMISSION_DENIED = TIZEN_ERROR_PERMISSION_DENIED,
    CONNECTION_ERROR_NOT_SUPPORTED = TIZEN_ERROR_NOT_SUPPORTED
} connection_error_e;

/* Makes a handle, released with connection_destroy(). INVALID_PARAMETER: null. Any thread. */
int connection_create(connection_h* connection);

/* Releases a handle. INVALID_PARAMETER: null or no handle of connection_create(). Any thread. */
int connection_destroy(connection_h connection);

/*
 * Each reads one state, which stays untouched on failure. INVALID_PARAMETER: a null argument or no
 * handle; NOT_SUPPORTED: this device has no such radio; PERMISSION_DENIED; OPERATION_FAILED. Any
 * thread.
 */
int connection_get_cellular_state(connection_h connection, connection_cellular_state_e* state);
int connection_get_wifi_state(connection_h connection, connection_wifi_state_e* state);
int connection_get_bt_state(connection_h connection, connection_bt_state_e* state);

#ifdef __cplusplus
}
#endif

#endif
