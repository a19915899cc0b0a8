// SPDX-License-Identifier: Apache-2.0
// A text of TOML with the places of what stands in it; how it reads with one thing more, less or
// other. Nothing here knows what a device is.
#ifndef DEVICEFILE_TEXT_DOCUMENT_H
#define DEVICEFILE_TEXT_DOCUMENT_H

#include <string>
#include <string_view>
#include <vector>

#include "TextPlaces.h"
#include "Toml.h"

namespace port::devicefile {

/// The text that differs from the document's own in one run of bytes is what each with…() gives.
/// Values are as they are to be written. Where a text cannot be, it is empty.
class TextDocument {
public:
    /// Throws TomlError.
    explicit TextDocument(std::string text);
    TextDocument(const TextDocument&) = delete;
    TextDocument& operator=(const TextDocument&) = delete;

    const toml::table& root() const
    {
        return root_;
    }

    /// The text of a node that stands behind "=" or in brackets.
    std::string_view textOf(const toml::node& node) const;

    std::string withValue(const toml::node& old, const std::string& value) const;
    std::string withKey(const toml::table& table, const std::string& key,
                        const std::string& value) const;
    std::string withoutKey(const toml::table& table, const std::string& key) const;
    /// A section at the end; `header` is [name] or [[name]].
    std::string withSection(const std::string& header, const std::string& key,
                            const std::string& value) const;
    /// One element more in a list of tables.
    std::string withElement(const toml::array& list, const std::string& header,
                            const std::string& key, const std::string& value) const;

private:
    // A key whose value has the rest of the line.
    struct Line {
        std::size_t key; // its last part
        std::size_t end; // behind the value
        const toml::table* table;
    };

    std::size_t beginOf(const toml::node& node) const;
    std::size_t endOf(const toml::node& node) const;
    std::size_t lastEndIn(const toml::table& table) const;
    std::size_t lineBegin(std::size_t at) const;
    bool hasHeader(const toml::table& table) const;

    void collect(const toml::table& table);
    void collectSection(const toml::table& table);
    const Line* lastLineOf(const toml::table& table) const;

    std::string spliced(std::size_t begin, std::size_t end, const std::string& by) const;
    std::string withLineBehind(std::size_t at, const std::string& line) const;
    std::string withInlineKey(const toml::table& table, const std::string& entry) const;
    std::string withoutLine(const Line& line) const;
    std::string withoutInlineKey(const toml::table& table, const std::string& key) const;

    const std::string text_;
    const TextPlaces places_;
    const std::string lineEnding_;
    const toml::table root_;
    std::vector<Line> lines_;
    std::vector<std::size_t> headers_;
};

} // namespace port::devicefile

#endif
