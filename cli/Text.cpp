// SPDX-License-Identifier: Apache-2.0
#include "Text.h"

#include <algorithm>
#include <clocale>
#include <cstdint>
#include <cstdio>
#include <cwchar>
#include <cwctype>
#include <iterator>
#include <numeric>
#include <utility>

#include "Terminal.h"

namespace {

// Wider cells stick out instead of pushing their whole column away.
constexpr std::size_t WIDEST_COLUMN = 48;

// A cell with less room than this goes into a line of its own.
constexpr std::size_t NARROWEST_CELL = 18;

// How much further in a row goes on.
constexpr std::size_t HANGING = 4;

constexpr std::size_t GAP = 2; // between columns

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

// Characters that a terminal obeys but does not show: marks that turn the order of letters, or
// have no width.
bool isInvisible(wchar_t code)
{
    constexpr std::pair<wchar_t, wchar_t> RANGES[] = {
        {0x00ad, 0x00ad},   {0x061c, 0x061c},   {0x115f, 0x1160},   {0x17b4, 0x17b5},
        {0x180b, 0x180f},   {0x200b, 0x200f},   {0x2028, 0x202e},   {0x2060, 0x206f},
        {0x3164, 0x3164},   {0xfeff, 0xfeff},   {0xffa0, 0xffa0},   {0xfff0, 0xfffb},
        {0x1bca0, 0x1bca3}, {0x1d173, 0x1d17a}, {0xe0000, 0xe007f},
    };
    return std::any_of(std::begin(RANGES), std::end(RANGES), [&](const auto& range) {
        return code >= range.first && code <= range.second;
    });
}

bool isShown(const Character& character)
{
    return character.valid && std::iswprint(static_cast<wint_t>(character.code)) &&
           !isInvisible(character.code);
}

// As UTF-16, of which JSON's escapes are.
std::string asJsonEscape(std::uint32_t code)
{
    char text[16];
    if (code < 0x10000)
        std::snprintf(text, sizeof text, "\\u%04x", code);
    else
        std::snprintf(text, sizeof text, "\\u%04x\\u%04x", 0xd7c0 + (code >> 10),
                      0xdc00 + (code & 0x3ff));
    return text;
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
    const std::size_t widest = std::min(WIDEST_COLUMN, cli::outputWidth() / 2);
    std::vector<std::size_t> widths;
    for (const auto& row : rows) {
        widths.resize(std::max(widths.size(), row.size()));
        for (std::size_t i = 0; i < row.size(); ++i)
            if (const std::size_t width = widthOf(row[i]); width <= widest)
                widths[i] = std::max(widths[i], width);
    }
    return widths;
}

std::string blanks(std::size_t count)
{
    return std::string(count, ' ');
}

// Words in lines of so many columns; a longer word sticks out.
std::vector<std::string> linesOf(const std::string& text, std::size_t width)
{
    std::vector<std::string> lines(1);
    std::size_t used = 0;
    for (std::size_t at = 0; at < text.size();) {
        const std::size_t end = std::min(text.find(' ', at), text.size());
        const std::string word = text.substr(at, end - at);
        if (at > 0 && used + 1 + widthOf(word) > width)
            lines.emplace_back();
        else if (at > 0)
            lines.back() += ' ';
        lines.back() += word;
        used = widthOf(lines.back());
        at = end + 1;
    }
    return lines;
}

// A row whose cells go on below where the terminal ends.
std::string rowText(const std::vector<std::string>& row, const std::vector<std::size_t>& widths,
                    std::size_t indent)
{
    const std::size_t limit = cli::outputWidth();
    std::string text;
    std::size_t end = 0; // of the line so far
    std::size_t start = indent;
    for (std::size_t i = 0; i < row.size(); start += widths[i++] + GAP) {
        if (row[i].empty())
            continue;
        start = std::max(start, end > 0 ? end + GAP : 0);
        const std::size_t width = widthOf(row[i]);
        if (end > 0 && width > limit - std::min(start, limit) &&
            limit - std::min(start, limit) < NARROWEST_CELL) {
            text.erase(text.find_last_not_of(' ') + 1);
            text += '\n';
            end = 0;
            start = indent + HANGING;
        }
        text += blanks(start - end);
        const std::size_t room = limit - std::min(start, limit);
        const auto lines = width <= room ? std::vector<std::string>{row[i]} : linesOf(row[i], room);
        for (std::size_t line = 0; line < lines.size(); ++line)
            text += (line > 0 ? "\n" + blanks(start) : "") + cli::colored(lines[line]);
        end = start + widthOf(lines.back());
    }
    return text + "\n";
}

cli::Rows printableRows(cli::Rows rows)
{
    for (auto& row : rows)
        std::transform(row.begin(), row.end(), row.begin(), cli::printable);
    return rows;
}

// The width of the rows when none of them is broken.
std::size_t fullWidthOf(const std::vector<std::size_t>& widths)
{
    return std::accumulate(widths.begin(), widths.end(), GAP * (widths.size() - 1));
}

// Each row as lines of a title and a cell.
std::string records(const cli::Rows& rows)
{
    std::string text;
    for (std::size_t i = 1; i < rows.size(); ++i) {
        cli::Rows lines;
        for (std::size_t column = 0; column < rows[i].size(); ++column)
            lines.push_back({rows[0][column], rows[i][column]});
        text += (i > 1 ? "\n" : "") + cli::aligned(lines, "");
    }
    return text;
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
        const bool good = isShown(character);
        for (const char byte : text.substr(at, character.size))
            good ? shown.push_back(byte) : void(shown += escaped(byte));
        at += character.size;
    }
    return shown;
}

std::string cli::escapedInJson(const std::string& text)
{
    std::string shown;
    for (std::size_t at = 0; at < text.size();) {
        const Character character = characterAt(text, at);
        const bool isAscii = static_cast<unsigned char>(text[at]) < 0x80;
        if (isAscii || isShown(character))
            shown.append(text, at, character.size);
        else
            shown += asJsonEscape(static_cast<std::uint32_t>(character.code));
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
    const Rows shown = printableRows(rows);
    const std::vector<std::size_t> widths = widthsOf(shown);
    std::string text;
    for (const auto& row : shown)
        text += rowText(row, widths, indent.size());
    return text;
}

std::string cli::table(const Rows& rows)
{
    const bool fits = fullWidthOf(widthsOf(printableRows(rows))) <= outputWidth();
    return fits ? aligned(rows, "") : records(rows);
}

std::string cli::wrapped(const std::string& text, std::size_t indent)
{
    std::string all;
    for (std::size_t at = 0; at < text.size();) {
        const std::size_t end = std::min(text.find('\n', at), text.size());
        all += rowText({text.substr(at, end - at)}, {0}, indent);
        at = end + 1;
    }
    return all;
}
