// SPDX-License-Identifier: Apache-2.0
#include <dlog.h>

#include <cstdarg>
#include <cstdio>
#include <string>

#include "../backend/Log.h"
#include "Refusal.h"

namespace {

// The formatted text; empty and false when the format is no good.
bool format(std::string& text, const char* fmt, va_list arguments)
{
    va_list again;
    va_copy(again, arguments);
    const int length = std::vsnprintf(nullptr, 0, fmt, again);
    va_end(again);
    if (length < 0)
        return false;
    text.resize(static_cast<std::size_t>(length) + 1); // vsnprintf writes a NUL
    std::vsnprintf(text.data(), text.size(), fmt, arguments);
    text.pop_back();
    return true;
}

} // namespace

int __dlog_print(log_id_t, int prio, const char* tag, const char* fmt, ...)
{
    if (const port::Refusal refusal{__func__})
        return refusal.code();
    if (fmt == nullptr)
        return DLOG_ERROR_INVALID_PARAMETER;
    va_list arguments;
    va_start(arguments, fmt);
    const int result = port::guarded([&]() -> int {
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
