// SPDX-License-Identifier: Apache-2.0
#include <dlog.h>

#include <cstdarg>
#include <cstdio>
#include <string>

#include "../backend/Log.h"
#include "Call.h"

namespace {

constexpr port::Codes CODES{TIZEN_ERROR_IO_ERROR, TIZEN_ERROR_IO_ERROR};

// The formatted text; empty and false when the format is no good. Most lines are short and are
// formatted once.
bool format(std::string& text, const char* fmt, va_list arguments)
{
    char line[512];
    va_list again;
    va_copy(again, arguments);
    const int result = std::vsnprintf(line, sizeof line, fmt, arguments);
    const auto length = static_cast<std::size_t>(result);
    if (result >= 0 && length < sizeof line) {
        text.assign(line, length);
    } else if (result >= 0) {
        text.resize(length + 1); // vsnprintf writes a NUL
        std::vsnprintf(text.data(), text.size(), fmt, again);
        text.pop_back();
    }
    va_end(again);
    return result >= 0;
}

} // namespace

int __dlog_print(log_id_t, int prio, const char* tag, const char* fmt, ...)
{
    va_list arguments;
    va_start(arguments, fmt);
    const int result = port::Call(__func__, CODES).run([&]() -> int {
        if (fmt == nullptr)
            return DLOG_ERROR_INVALID_PARAMETER;
        if (!port::processLog().isOn())
            return 0; // the length of what was written
        std::string text;
        if (!format(text, fmt, arguments))
            return DLOG_ERROR_INVALID_PARAMETER;
        if (!port::processLog().write(prio, tag != nullptr ? tag : "", text))
            return DLOG_ERROR_NOT_PERMITTED;
        return static_cast<int>(text.size());
    });
    va_end(arguments);
    return result;
}
