// SPDX-License-Identifier: Apache-2.0
#include <vconf.h>

#include <algorithm>
#include <cstring>
#include <string_view>

#include "Call.h"

namespace {

using port::Question;

constexpr port::Codes CODES{TIZEN_ERROR_IO_ERROR, TIZEN_ERROR_IO_ERROR};

// The prefix of a key names the store that holds it.
constexpr std::string_view STORES[] = {"db/", "file/", "memory/"};

bool isInAStore(std::string_view key)
{
    return std::any_of(std::begin(STORES), std::end(STORES), [key](std::string_view store) {
        return key.substr(0, store.size()) == store;
    });
}

} // namespace

char* vconf_get_str(const char* key)
{
    return port::Call(__func__, CODES, {Question::SalesCode}).pointer([&]() -> char* {
        if (key == nullptr || !isInAStore(key))
            return nullptr;
        const auto answer = port::backend().configuration(key);
        if (std::string_view(key) == VCONFKEY_CSC_SALESCODE)
            port::recordOrigin(Question::SalesCode, answer);
        return answer ? strdup(answer.value().value.c_str()) : nullptr;
    });
}
