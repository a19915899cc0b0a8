// SPDX-License-Identifier: Apache-2.0
// Where the parser's lines and columns are in a text.
#ifndef DEVICEFILE_TEXT_PLACES_H
#define DEVICEFILE_TEXT_PLACES_H

#include <algorithm>
#include <string_view>
#include <vector>

#include "Toml.h"

namespace port::devicefile {

inline bool beginsCharacter(char byte)
{
    return (static_cast<unsigned char>(byte) & 0xC0) != 0x80; // else it goes on one of UTF-8's
}

/// How many characters a text of UTF-8 has; the parser's columns count them.
inline std::size_t charactersOf(std::string_view text)
{
    return static_cast<std::size_t>(std::count_if(text.begin(), text.end(), beginsCharacter));
}

class TextPlaces {
public:
    explicit TextPlaces(std::string_view text) : text_(text)
    {
        const bool hasMark = text.substr(0, 3) == "\xEF\xBB\xBF"; // no character to the parser
        lines_.push_back(hasMark ? 3 : 0);
        for (std::size_t at = 0; (at = text.find('\n', at)) != std::string_view::npos;)
            lines_.push_back(++at);
    }

    /// The first byte behind a byte order mark.
    std::size_t begin() const
    {
        return lines_.front();
    }

    std::size_t offsetOf(toml::source_position place) const
    {
        std::size_t at = lines_[std::min<std::size_t>(place.line, lines_.size()) - 1];
        for (auto left = place.column; left > 1 && at < text_.size(); --left)
            at += sizeAt(at);
        return at;
    }

private:
    std::size_t sizeAt(std::size_t at) const
    {
        std::size_t size = 1;
        while (at + size < text_.size() && !beginsCharacter(text_[at + size]))
            ++size;
        return size;
    }

    const std::string_view text_;
    std::vector<std::size_t> lines_; // where each begins
};

} // namespace port::devicefile

#endif
