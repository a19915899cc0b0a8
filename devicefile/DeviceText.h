// SPDX-License-Identifier: Apache-2.0
// Reads and changes single values in the text of a device file. No input or output here.
//
// A change promises this: the new text is TOML in which the value is the one asked for and every
// other value is what it was. Of the text only the value's own bytes change, or, for a key that
// comes or goes, one run of bytes: comments, order, blanks, quotes, line endings and a byte order
// mark stay, as does a missing line ending at the end. A change that cannot be made so is an error.
#ifndef DEVICEFILE_DEVICE_TEXT_H
#define DEVICEFILE_DEVICE_TEXT_H

#include <cstdint>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "../port/backend/Result.h"

namespace port::devicefile {

/// A value of a device file.
struct Entry {
    std::string section; // settings, slot[0]; empty for "schema"
    std::string key;     // as it stands in the file
    std::variant<std::string, bool, std::int64_t>
        value; // of another type: as it stands in the file
    std::size_t line;

    std::string path() const
    {
        return section.empty() ? key : section + "." + key;
    }
};

/// All values in the order of the text. `file` is for messages only, here and below.
Result<std::vector<Entry>> listEntries(const std::string& text, const std::string& file);

/// The value of a path as plain text: no quotes, true or false.
Result<std::string> getValue(const std::string& text, const std::string& file,
                             const std::string& path);

struct Edit {
    std::string path;
    std::optional<std::string> value; // as getValue() tells it; none: the key is removed
};

/// The text with all changes made, or the reason why one of them cannot be. A value becomes what
/// its key wants: a text in quotes, a switch, a number; a fault may also be a table in braces. A
/// file with mistakes may be changed when it is TOML: a change must not add one.
Result<std::string> changeText(const std::string& text, const std::string& file,
                               const std::vector<Edit>& changes);

} // namespace port::devicefile

#endif
