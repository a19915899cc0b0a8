// SPDX-License-Identifier: Apache-2.0
#include <system_info.h>

#include <string_view>

#include "../backend/Backend.h"
#include "HandOut.h"

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

} // namespace

int system_info_get_platform_string(const char* key, char** value)
{
    if (key == nullptr || value == nullptr)
        return SYSTEM_INFO_ERROR_INVALID_PARAMETER;
    return port::guarded([&]() -> int {
        for (const KeyRow& row : KEYS)
            if (row.key == key)
                return port::handOut(row.question, (port::backend().deviceInfo().*row.read)(),
                                     value, CODES);
        return SYSTEM_INFO_ERROR_INVALID_PARAMETER;
    });
}
