// SPDX-License-Identifier: Apache-2.0
#include "Toml.h"

#include <algorithm>
#include <cstdio>
#include <string_view>
#include <utility>

#include "TextPlaces.h"

namespace port::devicefile {
namespace {

constexpr int NESTING_LIMIT = 8; // The parser calls itself, and so does what releases its values.

bool isBlank(char c)
{
    return c == ' ' || c == '\t';
}

bool isControl(char c)
{
    const auto code = static_cast<unsigned char>(c);
    return code < 0x20 || code == 0x7f;
}

bool isAscii(char c)
{
    return static_cast<unsigned char>(c) < 0x80;
}

bool beginsKey(char c)
{
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '-' ||
           c == '_' || c == '"' || c == '\'';
}

// Refuses what the parser takes for granted never to meet, and so does not check: a table header
// that does not begin with a name, a letter outside ASCII where it tells blanks from the rest,
// endless nesting. Everything else that is wrong is left to the parser, which names it better; the
// first such place ends the check.
class Check {
public:
    explicit Check(const std::string& text) : text_(text) {}

    void run()
    {
        if (text_.substr(0, 3) == "\xEF\xBB\xBF")
            text_.remove_prefix(3);
        bool isLineStart = true;
        while (at_ < text_.size()) {
            const char c = text_[at_];
            if (c == '[' && isLineStart && depth_ == 0)
                passHeader();
            else if (!(c == '#' ? passComment() : c == '"' || c == '\'' ? passText() : passOne()))
                return;
            isLineStart = c == '\n' || (isLineStart && isBlank(c));
        }
    }

private:
    char peek(std::size_t ahead = 0) const
    {
        return at_ + ahead < text_.size() ? text_[at_ + ahead] : '\0';
    }

    void passBlanks()
    {
        while (isBlank(peek()))
            ++at_;
    }

    bool passOne()
    {
        const char c = peek();
        if (!isAscii(c))
            refuse("a letter outside ASCII, which stands in quotes only");
        if ((c == '[' || c == '{') && ++depth_ > NESTING_LIMIT)
            refuse("values nested deeper than " + std::to_string(NESTING_LIMIT));
        if ((c == ']' || c == '}') && depth_ > 0)
            --depth_;
        ++at_;
        return !isControl(c) || c == '\t' || c == '\n' || (c == '\r' && peek() == '\n');
    }

    void passHeader()
    {
        at_ += peek(1) == '[' ? 2 : 1;
        passBlanks();
        if (at_ < text_.size() && !beginsKey(peek()))
            refuse("a section header begins with a name");
    }

    bool passComment()
    {
        at_ = std::min(text_.find('\n', at_), text_.size());
        return true;
    }

    bool passText()
    {
        const char quote = peek();
        const std::size_t length = peek(1) == quote && peek(2) == quote ? 3 : 1;
        for (at_ += length; at_ < text_.size();) {
            if (peek() == quote && (length == 1 || (peek(1) == quote && peek(2) == quote)))
                return passEnd(quote, length);
            const bool isEscape = quote == '"' && peek() == '\\';
            if (length == 1 && peek() == '\n')
                return false;
            at_ += isEscape ? 2 : 1;
            if (isEscape && length == 3)
                passLineEnd();
        }
        return false;
    }

    // A text in three quotes may end with two more, which belong to it.
    bool passEnd(char quote, std::size_t length)
    {
        at_ += length;
        for (int more = 0; length == 3 && more < 2 && peek() == quote; ++more)
            ++at_;
        return true;
    }

    // Behind an escape of a text of several lines; at_ is behind the escaped character.
    void passLineEnd()
    {
        const std::size_t escaped = at_ - 1;
        at_ = escaped;
        while (isBlank(peek()) || peek() == '\n' || peek() == '\r')
            ++at_;
        if (!isAscii(peek()))
            refuse("a letter outside ASCII behind a backslash");
        if (at_ == escaped)
            ++at_;
    }

    [[noreturn]] void refuse(const std::string& reason) const
    {
        const std::size_t begin = at_ == 0 ? 0 : text_.rfind('\n', at_ - 1) + 1;
        const auto line =
            std::count(text_.begin(), text_.begin() + static_cast<long>(at_), '\n') + 1;
        throw TomlError(reason, static_cast<std::size_t>(line),
                        charactersOf(text_.substr(begin, at_ - begin)) + 1);
    }

    std::string_view text_;
    std::size_t at_ = 0;
    int depth_ = 0;
};

// On one line: the parser quotes what it met, line endings and all.
std::string reasonOf(const toml::parse_error& error)
{
    std::string reason;
    for (const char character : error.description()) {
        char shown[] = {character, '\0', '\0', '\0', '\0'};
        if (isControl(character))
            std::snprintf(shown, sizeof shown, "\\x%02x", static_cast<unsigned>(character));
        reason += shown;
    }
    return reason;
}

// A sign that stands in texts and comments only, for each letter outside ASCII, which does so too.
std::string withoutLetters(std::string_view text)
{
    std::string ascii;
    for (const char c : text.substr(TextPlaces(text).begin()))
        if (beginsCharacter(c))
            ascii += isAscii(c) ? c : '!';
    return ascii;
}

} // namespace

toml::table parseToml(const std::string& text, const std::string& path)
{
    Check(text).run();
    try {
        // A broken text throws here, before the parser meets a letter where it expects none.
        toml::table table = toml::parse(withoutLetters(text), path);
        const bool isAsciiOnly = std::all_of(text.begin(), text.end(), isAscii);
        return isAsciiOnly ? std::move(table) : toml::parse(text, path);
    } catch (const toml::parse_error& error) {
        const toml::source_position where = error.source().begin;
        throw TomlError(reasonOf(error), where.line, where.column);
    }
}

} // namespace port::devicefile
