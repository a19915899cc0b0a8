// SPDX-License-Identifier: Apache-2.0
#include <system_settings.h>

#include "../backend/Backend.h"
#include "HandOut.h"

namespace {

using coresystem_port::Question;
using port::Settings;

struct KeyRow {
    int key;
    Question question{};
    port::Result<port::Fact> (Settings::*read)() = nullptr;
};

// Every setting that is a text. No device of the port has those without a reader.
constexpr KeyRow STRING_KEYS[] = {
    {SYSTEM_SETTINGS_KEY_DEVICE_NAME, Question::DeviceName, &Settings::deviceName},
    {SYSTEM_SETTINGS_KEY_LOCALE_LANGUAGE, Question::Language, &Settings::language},
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

const KeyRow* findStringKey(int key)
{
    for (const KeyRow& row : STRING_KEYS)
        if (row.key == key)
            return &row;
    return nullptr;
}

// A caller may pass a number that the enumeration lacks: it is looked at as the int it is.
int numberOf(const system_settings_key_e& key)
{
    int number = 0;
    static_assert(sizeof number == sizeof key, "the platform's enumerations are int-sized");
    std::memcpy(&number, &key, sizeof number);
    return number;
}

} // namespace

int system_settings_get_value_string(system_settings_key_e key, char** value)
{
    const KeyRow* const row = findStringKey(numberOf(key));
    if (row == nullptr || value == nullptr)
        return SYSTEM_SETTINGS_ERROR_INVALID_PARAMETER;
    if (row->read == nullptr)
        return SYSTEM_SETTINGS_ERROR_NOT_SUPPORTED;
    return port::guarded([&]() -> int {
        return port::handOut(row->question, (port::backend().settings().*row->read)(), value,
                             SYSTEM_SETTINGS_ERROR_NOT_SUPPORTED);
    });
}
