// SPDX-License-Identifier: Apache-2.0
#include <app_alarm.h>

#include "Call.h"

namespace {

using port::Question;

// This interface has no code for "not supported".
constexpr port::Codes CODES{ALARM_ERROR_CONNECTION_FAIL, ALARM_ERROR_CONNECTION_FAIL,
                            ALARM_ERROR_PERMISSION_DENIED};

} // namespace

int alarm_get_current_time(struct tm* date)
{
    const port::Call call(__func__, CODES, {Question::CurrentTime});
    return call.run([&]() -> int {
        if (date == nullptr)
            return ALARM_ERROR_INVALID_PARAMETER;
        return call.handOut(Question::CurrentTime, port::backend().now(), date);
    });
}
