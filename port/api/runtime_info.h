/* SPDX-License-Identifier: Apache-2.0 */
/* What goes on in the device. */
#ifndef PORT_API_RUNTIME_INFO_H
#define PORT_API_RUNTIME_INFO_H

#include <tizen.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED = 0,
    RUNTIME_INFO_KEY_WIFI_STATUS = 1,
    RUNTIME_INFO_KEY_BLUETOOTH_ENABLED = 2,
    RUNTIME_INFO_KEY_WIFI_HOTSPOT_ENABLED = 3,
    RUNTIME_INFO_KEY_BLUETOOTH_TETHERING_ENABLED = 4,
    RUNTIME_INFO_KEY_USB_TETHERING_ENABLED = 5,
    RUNTIME_INFO_KEY_LOCATION_SERVICE_ENABLED = 6,
    RUNTIME_INFO_KEY_LOCATION_ADVANCED_GPS_ENABLED = 7,
    RUNTIME_INFO_KEY_LOCATION_NETWORK_POSITION_ENABLED = 8,
    RUNTIME_INFO_KEY_PACKET_DATA_ENABLED = 9,
    RUNTIME_INFO_KEY_DATA_ROAMING_ENABLED = 10,
    RUNTIME_INFO_KEY_SILENT_MODE_ENABLED = 11,
    RUNTIME_INFO_KEY_VIBRATION_ENABLED = 12,
    RUNTIME_INFO_KEY_24HOUR_CLOCK_FORMAT_ENABLED = 13,
    RUNTIME_INFO_KEY_FIRST_DAY_OF_WEEK = 14,
    RUNTIME_INFO_KEY_LANGUAGE = 15,
    RUNTIME_INFO_KEY_REGION = 16,
    RUNTIME_INFO_KEY_AUDIO_JACK_CONNECTED = 17,
    RUNTIME_INFO_KEY_GPS_STATUS = 18,
    RUNTIME_INFO_KEY_BATTERY_IS_CHARGING = 19,
    RUNTIME_INFO_KEY_TV_OUT_CONNECTED = 20,
    RUNTIME_INFO_KEY_AUDIO_JACK_STATUS = 21,
    RUNTIME_INFO_KEY_SLIDING_KEYBOARD_OPENED = 22,
    RUNTIME_INFO_KEY_USB_CONNECTED = 23,
    RUNTIME_INFO_KEY_CHARGER_CONNECTED = 24,
    RUNTIME_INFO_KEY_VIBRATION_LEVEL_HAPTIC_FEEDBACK = 25,
    RUNTIME_INFO_KEY_AUTO_ROTATION_ENABLED = 26
} runtime_info_key_e;

typedef enum {
    RUNTIME_INFO_WIFI_STATUS_DISABLED = 0,
    RUNTIME_INFO_WIFI_STATUS_UNCONNECTED = 1,
    RUNTIME_INFO_WIFI_STATUS_CONNECTED = 2
} runtime_info_wifi_status_e;

typedef enum {
    RUNTIME_INFO_ERROR_NONE = TIZEN_ERROR_NONE,
    RUNTIME_INFO_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    RUNTIME_INFO_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    RUNTIME_INFO_ERROR_IO_ERROR = TIZEN_ERROR_IO_ERROR,
    RUNTIME_INFO_ERROR_PERMISSION_DENIED = TIZEN_ERROR_PERMISSION_DENIED,
    RUNTIME_INFO_ERROR_NOT_SUPPORTED = TIZEN_ERROR_NOT_SUPPORTED,
    RUNTIME_INFO_ERROR_REMOTE_IO = TIZEN_ERROR_REMOTE_IO
} runtime_info_error_e;

/* The new value is not passed: it is read again. */
typedef void (*runtime_info_changed_cb)(runtime_info_key_e key, void* user_data);

/*
 * Each reads one value, which stays untouched on failure. INVALID_PARAMETER: unknown key, a key of
 * another type or a null argument; IO_ERROR: the value cannot be read; PERMISSION_DENIED;
 * NOT_SUPPORTED: this device has no such thing. Any thread.
 */
int runtime_info_get_value_bool(runtime_info_key_e key, bool* value);
int runtime_info_get_value_int(runtime_info_key_e key, int* value);

/*
 * Sets the one callback of a key, in place of the one before. It is called on changes only, on the
 * GLib main context that was thread-default at registration. INVALID_PARAMETER: unknown key or null
 * callback; NOT_SUPPORTED: changes of this key are not told. Any thread.
 */
int runtime_info_set_changed_cb(runtime_info_key_e key, runtime_info_changed_cb callback,
                                void* user_data);

/*
 * Removes the callback of a key, if there is one. A call of it that runs on another thread has
 * ended when this returns. INVALID_PARAMETER: unknown key. Any thread.
 */
int runtime_info_unset_changed_cb(runtime_info_key_e key);

#ifdef __cplusplus
}
#endif

#endif
