// SPDX-License-Identifier: Apache-2.0
#include <system_info.h>

#include <string_view>

#include "Keys.h"

namespace {

using port::fact;
using port::Question;

// This interface has no code for "not supported".
constexpr port::Codes CODES{SYSTEM_INFO_ERROR_IO_ERROR, SYSTEM_INFO_ERROR_IO_ERROR,
                            SYSTEM_INFO_ERROR_PERMISSION_DENIED};

struct Key {
    std::string_view name;
    port::KeyRow<std::string> row;
};

constexpr Key KEYS[] = {
    {"tizen.org/system/tizenid", fact<Question::PlatformId>()},
    {"tizen.org/system/platform.name", fact<Question::PlatformName>()},
    {"tizen.org/feature/platform.version", fact<Question::PlatformVersion>()},
    {"tizen.org/system/model_name", fact<Question::ModelName>()},
};

const port::KeyRow<std::string>* findRow(const char* name)
{
    for (const Key& key : KEYS)
        if (name != nullptr && key.name == name)
            return &key.row;
    return nullptr;
}

} // namespace

int system_info_get_platform_string(const char* key, char** value)
{
    return port::readKey(__func__, findRow(key), value, CODES);
}
