// SPDX-License-Identifier: Apache-2.0
#include <vconf.h>

#include <algorithm>
#include <string_view>

#include "../backend/Backend.h"
#include "Refusal.h"

namespace {

using coresystem_port::Question;

// The prefix of a key names the store that holds it.
constexpr std::string_view STORES[] = {"db/", "file/", "memory/"};

bool isInAStore(std::string_view key)
{
    return std::any_of(std::begin(STORES), std::end(STORES), [key](std::string_view store) {
        return key.substr(0, store.size()) == store;
    });
}

int read(const std::string& key, char** slot)
{
    const auto answer = port::backend().configuration().text(key);
    if (key == VCONFKEY_CSC_SALESCODE)
        port::recordOrigin(Question::SalesCode, answer);
    return answer ? port::handOutCopy(answer.value().value, slot) : TIZEN_ERROR_IO_ERROR;
}

} // namespace

char* vconf_get_str(const char* key)
{
    if (port::Refusal{__func__, {Question::SalesCode}})
        return nullptr;
    char* text = nullptr;
    if (key != nullptr && isInAStore(key))
        port::guarded([&] { return read(key, &text); });
    return text;
}
