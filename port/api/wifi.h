/* SPDX-License-Identifier: Apache-2.0 */
/* The Wi-Fi radio and its connection. */
#ifndef PORT_API_WIFI_H
#define PORT_API_WIFI_H

#include <tizen.h>

#ifdef __cplusplus
extern "C" {
#endif

/* An access point; valid during the call that passes it, null when it is not known. */
typedef void* wifi_ap_h;

typedef enum {
    WIFI_DEVICE_STATE_DEACTIVATED = 0,
    WIFI_DEVICE_STATE_ACTIVATED = 1
} wifi_device_state_e;

typedef enum {
    WIFI_CONNECTION_STATE_FAILURE = -1,
    WIFI_CONNECTION_STATE_DISCONNECTED = 0,
    WIFI_CONNECTION_STATE_ASSOCIATION = 1,
    WIFI_CONNECTION_STATE_CONFIGURATION = 2,
    WIFI_CONNECTION_STATE_CONNECTED = 3
} wifi_connection_state_e;

typedef enum {
    WIFI_ERROR_NONE = TIZEN_ERROR_NONE,
    WIFI_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    WIFI_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    WIFI_ERROR_INVALID_OPERATION = TIZEN_ERROR_INVALID_OPERATION,
    WIFI_ERROR_OPERATION_FAILED = TIZEN_ERROR_WIFI | 0x0301,
    WIFI_ERROR_PERMISSION_DENIED = TIZEN_ERROR_PERMISSION_DENIED,
    WIFI_ERROR_NOT_SUPPORTED = TIZEN_ERROR_NOT_SUPPORTED
} wifi_error_e;

typedef void (*wifi_device_state_changed_cb)(wifi_device_state_e state, void* user_data);
typedef void (*wifi_connection_state_changed_cb)(wifi_connection_state_e state, wifi_ap_h ap,
                                                 void* user_data);

/*
 * Switches the interface on for this process. INVALID_OPERATION: it is on already; NOT_SUPPORTED:
 * this device has no Wi-Fi; OPERATION_FAILED. Any thread.
 */
int wifi_initialize(void);

/*
 * Each sets the one callback of its kind, in place of the one before. It is called on changes only,
 * on the GLib main context that was thread-default at registration. INVALID_OPERATION: before
 * wifi_initialize(); INVALID_PARAMETER: a null callback; NOT_SUPPORTED. Any thread.
 */
int wifi_set_device_state_changed_cb(wifi_device_state_changed_cb callback, void* user_data);
int wifi_set_connection_state_changed_cb(wifi_connection_state_changed_cb callback,
                                         void* user_data);

/*
 * Each removes its callback, if there is one. A call of it that runs on another thread has ended
 * when these return. INVALID_OPERATION: before wifi_initialize(); NOT_SUPPORTED. Any thread.
 */
int wifi_unset_device_state_changed_cb(void);
int wifi_unset_connection_state_changed_cb(void);

#ifdef __cplusplus
}
#endif

#endif
