// SPDX-License-Identifier: Apache-2.0
#include <runtime_info.h>

#include "../events/ChangeEvents.h"
#include "Keys.h"

namespace {

using port::backend;
using port::Change;
using port::fact;
using port::KeyRow;
using port::LinkState;
using port::Question;

constexpr port::Codes CODES{RUNTIME_INFO_ERROR_IO_ERROR, RUNTIME_INFO_ERROR_NOT_SUPPORTED,
                            RUNTIME_INFO_ERROR_PERMISSION_DENIED};

static_assert(static_cast<int>(LinkState::Deactivated) == RUNTIME_INFO_WIFI_STATUS_DISABLED &&
                  static_cast<int>(LinkState::Connected) == RUNTIME_INFO_WIFI_STATUS_CONNECTED,
              "both count the states alike");

// Every key that is a switch or a number, by type; the others are texts.
constexpr KeyRow<bool> BOOL_KEYS[] = {
    fact<Question::FlightMode>(RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED),
    fact<Question::PacketData>(RUNTIME_INFO_KEY_PACKET_DATA_ENABLED),
    fact<Question::DataRoaming>(RUNTIME_INFO_KEY_DATA_ROAMING_ENABLED),
    {RUNTIME_INFO_KEY_BLUETOOTH_ENABLED},
    {RUNTIME_INFO_KEY_WIFI_HOTSPOT_ENABLED},
    {RUNTIME_INFO_KEY_BLUETOOTH_TETHERING_ENABLED},
    {RUNTIME_INFO_KEY_USB_TETHERING_ENABLED},
    {RUNTIME_INFO_KEY_LOCATION_SERVICE_ENABLED},
    {RUNTIME_INFO_KEY_LOCATION_ADVANCED_GPS_ENABLED},
    {RUNTIME_INFO_KEY_LOCATION_NETWORK_POSITION_ENABLED},
    {RUNTIME_INFO_KEY_SILENT_MODE_ENABLED},
    {RUNTIME_INFO_KEY_VIBRATION_ENABLED},
    {RUNTIME_INFO_KEY_24HOUR_CLOCK_FORMAT_ENABLED},
    {RUNTIME_INFO_KEY_AUDIO_JACK_CONNECTED},
    {RUNTIME_INFO_KEY_BATTERY_IS_CHARGING},
    {RUNTIME_INFO_KEY_TV_OUT_CONNECTED},
    {RUNTIME_INFO_KEY_SLIDING_KEYBOARD_OPENED},
    {RUNTIME_INFO_KEY_USB_CONNECTED},
    {RUNTIME_INFO_KEY_CHARGER_CONNECTED},
    {RUNTIME_INFO_KEY_AUTO_ROTATION_ENABLED},
};

constexpr KeyRow<LinkState> INT_KEYS[] = {
    {RUNTIME_INFO_KEY_WIFI_STATUS, Question::Wifi, [] { return backend().network().wifi(); }},
    {RUNTIME_INFO_KEY_FIRST_DAY_OF_WEEK},
    {RUNTIME_INFO_KEY_GPS_STATUS},
    {RUNTIME_INFO_KEY_AUDIO_JACK_STATUS},
    {RUNTIME_INFO_KEY_VIBRATION_LEVEL_HAPTIC_FEEDBACK},
};

// The keys whose changes are told.
constexpr struct {
    int key;
    Change change;
} CHANGES[] = {
    {RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED, Change::FlightMode},
    {RUNTIME_INFO_KEY_WIFI_STATUS, Change::WifiStatus},
    {RUNTIME_INFO_KEY_PACKET_DATA_ENABLED, Change::PacketData},
    {RUNTIME_INFO_KEY_DATA_ROAMING_ENABLED, Change::DataRoaming},
};

bool isKey(int key)
{
    return key >= RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED &&
           key <= RUNTIME_INFO_KEY_AUTO_ROTATION_ENABLED;
}

} // namespace

int runtime_info_get_value_bool(runtime_info_key_e key, bool* value)
{
    return port::readKey(__func__, port::findKey(BOOL_KEYS, port::numberOf(key)), value, CODES);
}

int runtime_info_get_value_int(runtime_info_key_e key, int* value)
{
    return port::readKey(__func__, port::findKey(INT_KEYS, port::numberOf(key)), value, CODES);
}

int runtime_info_set_changed_cb(runtime_info_key_e key, runtime_info_changed_cb callback,
                                void* user_data)
{
    return port::Call(__func__, CODES).run([&]() -> int {
        const auto* const row = port::findKey(CHANGES, port::numberOf(key));
        if (!isKey(port::numberOf(key)) || callback == nullptr)
            return RUNTIME_INFO_ERROR_INVALID_PARAMETER;
        const auto tell = [key, callback, user_data](int) { callback(key, user_data); };
        return row != nullptr && port::changeEvents().set(row->change, tell)
                   ? RUNTIME_INFO_ERROR_NONE
                   : RUNTIME_INFO_ERROR_NOT_SUPPORTED;
    });
}

int runtime_info_unset_changed_cb(runtime_info_key_e key)
{
    return port::Call(__func__, CODES).release([&]() -> int {
        if (!isKey(port::numberOf(key)))
            return RUNTIME_INFO_ERROR_INVALID_PARAMETER;
        if (const auto* const row = port::findKey(CHANGES, port::numberOf(key)))
            port::changeEvents().unset(row->change);
        return RUNTIME_INFO_ERROR_NONE;
    });
}
