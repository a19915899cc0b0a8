// SPDX-License-Identifier: Apache-2.0
#include <app_alarm.h>

#include "../backend/Backend.h"
#include "Refusal.h"

namespace {

// This interface has no code for "not supported".
constexpr port::Codes CODES{ALARM_ERROR_CONNECTION_FAIL, ALARM_ERROR_CONNECTION_FAIL,
                            ALARM_ERROR_PERMISSION_DENIED};

} // namespace

int alarm_get_current_time(struct tm* date)
{
    if (const port::Refusal refusal{__func__, {coresystem_port::Question::CurrentTime}})
        return refusal.code();
    if (date == nullptr)
        return ALARM_ERROR_INVALID_PARAMETER;
    return port::guarded(
        [&] {
            return port::handOut(coresystem_port::Question::CurrentTime,
                                 port::backend().clock().now(), date, CODES);
        },
        CODES.failed);
}
