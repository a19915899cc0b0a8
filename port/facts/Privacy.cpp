// SPDX-License-Identifier: Apache-2.0
#include "Privacy.h"

#include <algorithm>
#include <cctype>

namespace {

// Else it goes on a character of UTF-8's.
bool beginsCharacter(char byte)
{
    return (static_cast<unsigned char>(byte) & 0xC0) != 0x80;
}

} // namespace

std::string port::masked(const std::string& text)
{
    auto hidden = std::count_if(text.begin(), text.end(), beginsCharacter);
    if (hidden > 4)
        hidden -= 2;
    std::string shown;
    for (const char byte : text) {
        if (beginsCharacter(byte) && hidden-- > 0)
            shown += '*';
        else if (hidden < 0)
            shown += byte;
    }
    return shown;
}

std::string port::zeroed(const std::string& text)
{
    std::string zeros;
    for (const char byte : text) {
        const auto code = static_cast<unsigned char>(byte);
        if (code >= 0x80 ? beginsCharacter(byte) : std::isalnum(code) != 0)
            zeros += '0';
        else if (code < 0x80)
            zeros += byte;
    }
    return zeros;
}
