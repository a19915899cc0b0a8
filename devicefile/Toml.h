// SPDX-License-Identifier: Apache-2.0
// The TOML parser, made fit for texts that anybody may have written. Nobody calls it but by this.
#ifndef DEVICEFILE_TOML_H
#define DEVICEFILE_TOML_H

#include <cstddef>
#include <stdexcept>
#include <string>

#include <toml++/toml.h>

namespace port::devicefile {

/// Why a text is no TOML that is read here, on one line, and where; both from 1, the column in
/// characters.
struct TomlError : std::runtime_error {
    TomlError(const std::string& reason, std::size_t onLine, std::size_t inColumn)
        : std::runtime_error(reason), line(onLine), column(inColumn)
    {
    }

    std::size_t line;
    std::size_t column;
};

/// Throws TomlError, also for what TOML allows but the parser cannot be given: values nested deeper
/// than 8, and a letter outside ASCII that goes on with a text after a backslash at a line's end.
toml::table parseToml(const std::string& text, const std::string& path = "");

} // namespace port::devicefile

#endif
