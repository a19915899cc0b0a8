// SPDX-License-Identifier: Apache-2.0
#include "Text.h"

#include <algorithm>
#include <clocale>
#include <cstdio>
#include <cwchar>
#include <cwctype>

namespace {

// Wider cells stick out instead of pushing their whole column away.
constexpr std::size_t WIDEST_COLUMN = 48;

struct Character {
    wchar_t code;
    std::size_t size; // in bytes
    bool valid;
};

Character characterAt(const std::string& text, std::size_t position)
{
    Character character{L'\0', 1, false};
    std::mbstate_t state{};
    const std::size_t left = text.size() - position;
    const std::size_t size = std::mbrtowc(&character.code, text.data() + position, left, &state);
    character.valid = size <= left; // errors are the largest numbers
    if (character.valid)
        character.size = std::max<std::size_t>(size, 1); // NUL is said to have none
    return character;
}

std::string escaped(char byte)
{
    switch (byte) {
    case '\n':
        return "\\n";
    case '\r':
        return "\\r";
    case '\t':
        return "\\t";
    default:
        char text[8];
        std::snprintf(text, sizeof text, "\\x%02x", static_cast<unsigned char>(byte));
        return text;
    }
}

std::size_t widthOf(const std::string& text)
{
    std::size_t width = 0;
    for (std::size_t at = 0; at < text.size();) {
        const Character character = characterAt(text, at);
        width += static_cast<std::size_t>(std::max(wcwidth(character.code), 0));
        at += character.size;
    }
    return width;
}

std::vector<std::size_t> widthsOf(const cli::Rows& rows)
{
    std::vector<std::size_t> widths;
    for (const auto& row : rows) {
        widths.resize(std::max(widths.size(), row.size()));
        for (std::size_t i = 0; i < row.size(); ++i)
            if (const std::size_t width = widthOf(row[i]); width <= WIDEST_COLUMN)
                widths[i] = std::max(widths[i], width);
    }
    return widths;
}

std::string joined(const std::vector<std::string>& row, const std::vector<std::size_t>& widths)
{
    std::string line;
    for (std::size_t i = 0; i < row.size(); ++i) {
        line += row[i];
        if (i + 1 < row.size()) {
            const std::size_t width = widthOf(row[i]);
            line.append(std::max(widths[i], width) - width + 2, ' ');
        }
    }
    return line;
}

} // namespace

void cli::useUtf8()
{
    std::setlocale(LC_CTYPE, "C.UTF-8");
}

std::string cli::printable(const std::string& text)
{
    std::string shown;
    for (std::size_t at = 0; at < text.size();) {
        const Character character = characterAt(text, at);
        const bool good = character.valid && std::iswprint(static_cast<wint_t>(character.code));
        for (const char byte : text.substr(at, character.size))
            good ? shown.push_back(byte) : void(shown += escaped(byte));
        at += character.size;
    }
    return shown;
}

std::string cli::quoted(const std::string& text)
{
    return '"' + printable(text) + '"';
}

std::string cli::listed(const std::vector<std::string>& words)
{
    std::string list;
    for (std::size_t i = 0; i < words.size(); ++i) {
        const bool last = i + 1 == words.size();
        list += (i == 0 ? "" : last ? " and " : ", ") + words[i];
    }
    return list;
}

std::string cli::aligned(const Rows& rows, const std::string& indent)
{
    Rows shown = rows;
    for (auto& row : shown)
        std::transform(row.begin(), row.end(), row.begin(), printable);
    const std::vector<std::size_t> widths = widthsOf(shown);
    std::string text;
    for (const auto& row : shown)
        text += indent + joined(row, widths) + "\n";
    return text;
}
