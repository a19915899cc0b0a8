// SPDX-License-Identifier: Apache-2.0
#include <system_info.h>

#include <string_view>

#include "../backend/Backend.h"
#include "Keys.h"

namespace {

using coresystem_port::Question;
using port::DeviceInfo;

// This interface has no code for "not supported".
constexpr port::Codes CODES{SYSTEM_INFO_ERROR_IO_ERROR, SYSTEM_INFO_ERROR_IO_ERROR,
                            SYSTEM_INFO_ERROR_PERMISSION_DENIED};

struct KeyRow {
    std::string_view key;
    Question question;
    port::Result<port::Fact> (DeviceInfo::*read)();
};

constexpr KeyRow KEYS[] = {
    {"tizen.org/system/tizenid", Question::PlatformId, &DeviceInfo::platformId},
    {"tizen.org/system/platform.name", Question::PlatformName, &DeviceInfo::platformName},
    {"tizen.org/feature/platform.version", Question::PlatformVersion, &DeviceInfo::platformVersion},
    {"tizen.org/system/model_name", Question::ModelName, &DeviceInfo::modelName},
};

const KeyRow* findRow(const char* key)
{
    for (const KeyRow& row : KEYS)
        if (key != nullptr && row.key == key)
            return &row;
    return nullptr;
}

} // namespace

int system_info_get_platform_string(const char* key, char** value)
{
    const KeyRow* const row = findRow(key);
    if (const auto refusal = port::refusalOf(__func__, row))
        return refusal.code(value);
    if (row == nullptr || value == nullptr)
        return SYSTEM_INFO_ERROR_INVALID_PARAMETER;
    return port::guarded([&]() -> int {
        return port::handOut(row->question, (port::backend().deviceInfo().*row->read)(), value,
                             CODES);
    });
}
