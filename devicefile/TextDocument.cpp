// SPDX-License-Identifier: Apache-2.0
#include "TextDocument.h"

#include <algorithm>

#include "DevicePath.h"

namespace port::devicefile {
namespace {

constexpr const char* BLANKS = " \t";

// As the first line has it.
std::string lineEndingOf(const std::string& text)
{
    const std::size_t at = text.find('\n');
    return at != std::string::npos && at > 0 && text[at - 1] == '\r' ? "\r\n" : "\n";
}

// A table that stands in braces is a value.
bool isSection(const toml::node& node)
{
    return node.is_table() && !node.as_table()->is_inline();
}

bool isListOfSections(const toml::node& node)
{
    return node.is_array() && !node.as_array()->empty() && isSection(node.as_array()->front());
}

std::string assignment(const std::string& key, const std::string& value)
{
    return writtenKey(key) + " = " + value;
}

} // namespace

TextDocument::TextDocument(std::string text)
    : text_(std::move(text)), places_(text_), lineEnding_(lineEndingOf(text_)),
      root_(parseToml(text_))
{
    collect(root_);
    std::sort(lines_.begin(), lines_.end(),
              [](const Line& left, const Line& right) { return left.key < right.key; });
    std::sort(headers_.begin(), headers_.end());
}

std::size_t TextDocument::beginOf(const toml::node& node) const
{
    return places_.offsetOf(node.source().begin);
}

std::size_t TextDocument::endOf(const toml::node& node) const
{
    return places_.offsetOf(node.source().end);
}

std::size_t TextDocument::lineBegin(std::size_t at) const
{
    const std::size_t before = at > 0 ? text_.rfind('\n', at - 1) : std::string::npos;
    return std::max(before == std::string::npos ? 0 : before + 1, places_.begin());
}

// Else a dotted key has made it.
bool TextDocument::hasHeader(const toml::table& table) const
{
    return text_.compare(beginOf(table), 1, "[") == 0;
}

void TextDocument::collectSection(const toml::table& table)
{
    if (hasHeader(table))
        headers_.push_back(beginOf(table));
    collect(table);
}

void TextDocument::collect(const toml::table& table)
{
    for (const auto& [key, node] : table) {
        if (isSection(node))
            collectSection(*node.as_table());
        else if (isListOfSections(node))
            for (const toml::node& element : *node.as_array())
                collectSection(*element.as_table());
        else
            lines_.push_back({places_.offsetOf(key.source().begin), endOf(node), &table});
    }
}

// Null when it has none.
const TextDocument::Line* TextDocument::lastLineOf(const toml::table& table) const
{
    const bool isRoot = &table == &root_;
    const bool isDotted = !isRoot && !hasHeader(table);
    const std::size_t begin = isRoot ? 0 : beginOf(table);
    const auto next =
        isRoot ? headers_.begin() : std::upper_bound(headers_.begin(), headers_.end(), begin);
    const std::size_t end = next != headers_.end() ? *next : text_.size();
    const Line* last = nullptr;
    for (const Line& line : lines_)
        if (isDotted ? line.table == &table : begin <= line.key && line.key < end)
            last = &line;
    return last;
}

std::string_view TextDocument::textOf(const toml::node& node) const
{
    const std::size_t begin = beginOf(node);
    return std::string_view(text_).substr(begin, endOf(node) - begin);
}

std::string TextDocument::spliced(std::size_t begin, std::size_t end, const std::string& by) const
{
    return text_.substr(0, begin) + by + text_.substr(end);
}

std::string TextDocument::withLineBehind(std::size_t at, const std::string& line) const
{
    const std::size_t ending = text_.find('\n', at);
    if (ending == std::string::npos)
        return text_ + lineEnding_ + line;
    return spliced(ending + 1, ending + 1, line + lineEnding_);
}

std::string TextDocument::withValue(const toml::node& old, const std::string& value) const
{
    return spliced(beginOf(old), endOf(old), value);
}

// Behind the last value of a table in braces; 0 when it is empty.
std::size_t TextDocument::lastEndIn(const toml::table& table) const
{
    std::size_t end = 0;
    for (const auto& [key, node] : table)
        end = std::max(end, isSection(node) ? lastEndIn(*node.as_table()) : endOf(node));
    return end;
}

std::string TextDocument::withInlineKey(const toml::table& table, const std::string& entry) const
{
    if (table.empty())
        return withValue(table, "{ " + entry + " }");
    const std::size_t end = lastEndIn(table);
    return spliced(end, end, ", " + entry);
}

std::string TextDocument::withKey(const toml::table& table, const std::string& key,
                                  const std::string& value) const
{
    const std::string entry = assignment(key, value);
    if (table.is_inline())
        return withInlineKey(table, entry);
    const Line* const last = lastLineOf(table);
    if (last != nullptr) {
        // Indented like its neighbour, and behind the same dots.
        const std::size_t begin = lineBegin(last->key);
        const std::size_t own =
            last->table == &table ? last->key : text_.find_first_not_of(BLANKS, begin);
        return withLineBehind(last->end, text_.substr(begin, own - begin) + entry);
    }
    if (&table == &root_)
        return spliced(places_.begin(), places_.begin(), entry + lineEnding_);
    return hasHeader(table) ? withLineBehind(beginOf(table), entry) : "";
}

std::string TextDocument::withoutLine(const Line& line) const
{
    const std::size_t begin = lineBegin(line.key);
    const std::size_t ending = text_.find('\n', line.end);
    if (ending != std::string::npos)
        return spliced(begin, ending + 1, "");
    // The line before becomes the one without an ending.
    const bool hasEnding =
        begin >= lineEnding_.size() &&
        text_.compare(begin - lineEnding_.size(), lineEnding_.size(), lineEnding_) == 0;
    return text_.substr(0, begin - (hasEnding ? lineEnding_.size() : 0));
}

std::string TextDocument::withoutInlineKey(const toml::table& table, const std::string& key) const
{
    const toml::node& node = *table.get(key);
    const std::size_t open = beginOf(table) + 1;
    std::size_t before = open; // the end of what stands before it
    for (const auto& [other, value] : table)
        if (const std::size_t end = endOf(value); end <= beginOf(node))
            before = std::max(before, end);
    std::size_t end = endOf(node);
    if (before > open) // it goes with the comma before it
        return spliced(before, end, "");
    const std::size_t comma = text_.find_first_not_of(BLANKS, end);
    if (text_[comma] != ',')
        return withValue(table, "{}");
    end = text_.find_first_not_of(BLANKS, comma + 1);
    return spliced(text_.find_first_not_of(BLANKS, open), end, "");
}

std::string TextDocument::withoutKey(const toml::table& table, const std::string& key) const
{
    const toml::node& node = *table.get(key);
    if (isSection(node) || isListOfSections(node))
        return "";
    if (table.is_inline())
        return withoutInlineKey(table, key);
    for (const Line& line : lines_)
        if (line.table == &table && line.end == endOf(node))
            return withoutLine(line);
    return "";
}

std::string TextDocument::withSection(const std::string& header, const std::string& key,
                                      const std::string& value) const
{
    const bool isEnded = text_.empty() || text_.back() == '\n';
    const std::string blank = text_.size() > places_.begin() ? lineEnding_ : "";
    return text_ + (isEnded ? "" : lineEnding_) + blank + header + lineEnding_ +
           assignment(key, value) + (isEnded ? lineEnding_ : "");
}

std::string TextDocument::withElement(const toml::array& list, const std::string& header,
                                      const std::string& key, const std::string& value) const
{
    const std::string entry = assignment(key, value);
    if (list.empty())
        return withValue(list, "[{ " + entry + " }]");
    if (!isListOfSections(list))
        return spliced(endOf(list.back()), endOf(list.back()), ", { " + entry + " }");
    const toml::table& last = *list.back().as_table();
    const Line* const line = lastLineOf(last);
    return withLineBehind(line != nullptr ? line->end : beginOf(last),
                          lineEnding_ + header + lineEnding_ + entry);
}

} // namespace port::devicefile
