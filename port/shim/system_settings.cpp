// SPDX-License-Identifier: Apache-2.0
#include <system_settings.h>

#include "Keys.h"

namespace {

using port::fact;
using port::FontSize;
using port::KeyRow;
using port::Question;

constexpr port::Codes CODES{SYSTEM_SETTINGS_ERROR_IO_ERROR, SYSTEM_SETTINGS_ERROR_NOT_SUPPORTED,
                            SYSTEM_SETTINGS_ERROR_PERMISSION_DENIED};

static_assert(static_cast<int>(FontSize::Small) == SYSTEM_SETTINGS_FONT_SIZE_SMALL &&
                  static_cast<int>(FontSize::Giant) == SYSTEM_SETTINGS_FONT_SIZE_GIANT,
              "both count the sizes alike");

// Every setting, by type.
constexpr KeyRow<std::string> STRING_KEYS[] = {
    fact<Question::DeviceName>(SYSTEM_SETTINGS_KEY_DEVICE_NAME),
    fact<Question::Language>(SYSTEM_SETTINGS_KEY_LOCALE_LANGUAGE),
    {SYSTEM_SETTINGS_KEY_INCOMING_CALL_RINGTONE},
    {SYSTEM_SETTINGS_KEY_WALLPAPER_HOME_SCREEN},
    {SYSTEM_SETTINGS_KEY_WALLPAPER_LOCK_SCREEN},
    {SYSTEM_SETTINGS_KEY_FONT_TYPE},
    {SYSTEM_SETTINGS_KEY_EMAIL_ALERT_RINGTONE},
    {SYSTEM_SETTINGS_KEY_LOCKSCREEN_APP},
    {SYSTEM_SETTINGS_KEY_DEFAULT_FONT_TYPE},
    {SYSTEM_SETTINGS_KEY_LOCALE_COUNTRY},
    {SYSTEM_SETTINGS_KEY_LOCALE_TIMEZONE},
    {SYSTEM_SETTINGS_KEY_SOUND_NOTIFICATION},
};

constexpr KeyRow<bool> BOOL_KEYS[] = {
    fact<Question::MobileData>(SYSTEM_SETTINGS_KEY_3G_DATA_NETWORK_ENABLED),
    {SYSTEM_SETTINGS_KEY_MOTION_ACTIVATION},
    {SYSTEM_SETTINGS_KEY_USB_DEBUGGING_ENABLED},
    {SYSTEM_SETTINGS_KEY_LOCALE_TIMEFORMAT_24HOUR},
    {SYSTEM_SETTINGS_KEY_SOUND_LOCK},
    {SYSTEM_SETTINGS_KEY_SOUND_SILENT_MODE},
    {SYSTEM_SETTINGS_KEY_SOUND_TOUCH},
    {SYSTEM_SETTINGS_KEY_DISPLAY_SCREEN_ROTATION_AUTO},
    {SYSTEM_SETTINGS_KEY_MOTION_ENABLED},
    {SYSTEM_SETTINGS_KEY_NETWORK_WIFI_NOTIFICATION},
    {SYSTEM_SETTINGS_KEY_NETWORK_FLIGHT_MODE},
};

constexpr KeyRow<FontSize> INT_KEYS[] = {
    fact<Question::FontSize>(SYSTEM_SETTINGS_KEY_FONT_SIZE),
    {SYSTEM_SETTINGS_KEY_TAP_AND_HOLD_DELAY},
    {SYSTEM_SETTINGS_KEY_TIME_CHANGED},
    {SYSTEM_SETTINGS_KEY_SCREEN_BACKLIGHT_TIME},
    {SYSTEM_SETTINGS_KEY_SOUND_NOTIFICATION_REPETITION_PERIOD},
    {SYSTEM_SETTINGS_KEY_LOCK_STATE},
};

} // namespace

int system_settings_get_value_string(system_settings_key_e key, char** value)
{
    return port::readKey(__func__, port::findKey(STRING_KEYS, port::numberOf(key)), value, CODES);
}

int system_settings_get_value_bool(system_settings_key_e key, bool* value)
{
    return port::readKey(__func__, port::findKey(BOOL_KEYS, port::numberOf(key)), value, CODES);
}

int system_settings_get_value_int(system_settings_key_e key, int* value)
{
    return port::readKey(__func__, port::findKey(INT_KEYS, port::numberOf(key)), value, CODES);
}
