// SPDX-License-Identifier: Apache-2.0
#include <system_settings.h>

#include "../backend/Backend.h"
#include "HandOut.h"

namespace {

using coresystem_port::Question;
using port::Settings;

struct KeyRow {
    int key;
    Question question;
    port::Result<port::Fact> (Settings::*read)();
};

constexpr KeyRow STRING_KEYS[] = {
    {SYSTEM_SETTINGS_KEY_DEVICE_NAME, Question::DeviceName, &Settings::deviceName},
    {SYSTEM_SETTINGS_KEY_LOCALE_LANGUAGE, Question::Language, &Settings::language},
};

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
    const int number = numberOf(key);
    if (value == nullptr || number < 0 || number >= SYSTEM_SETTINGS_KEY_MAX)
        return SYSTEM_SETTINGS_ERROR_INVALID_PARAMETER;
    return port::guarded([&]() -> int {
        for (const KeyRow& row : STRING_KEYS)
            if (row.key == number)
                return port::handOut(row.question, (port::backend().settings().*row.read)(), value,
                                     SYSTEM_SETTINGS_ERROR_NOT_SUPPORTED);
        return SYSTEM_SETTINGS_ERROR_NOT_SUPPORTED;
    });
}
