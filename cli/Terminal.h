// SPDX-License-Identifier: Apache-2.0
// Standard output and standard error.
#ifndef CLI_TERMINAL_H
#define CLI_TERMINAL_H

#include <cstddef>
#include <string>

namespace cli {

enum class Color {
    Auto, ///< where standard output is a terminal that has it and NO_COLOR is not set
    Always,
    Never,
};
void useColor(Color when);

/// Lets no line be wrapped or shortened to fit the terminal.
void useFullWidth();
bool isFullWidth();

/// The columns that a line of standard output may fill; the largest number where none limits it.
std::size_t outputWidth();

/// Whether standard output is a terminal that understands escape sequences.
bool isSmartTerminal();

// Standard output cannot be written; `error` is an errno value.
struct OutputFailed {
    int error;
};

/// Makes sure that no file or socket opened later takes the number of a closed standard stream,
/// and that a reader who went away or a file that grew too large is an error, not a signal.
void prepareStandardStreams();

/// Writes a text to standard output at once; throws OutputFailed.
void writeOut(const std::string& text);

/// Writes one line to standard error, in the command's name.
void complain(const std::string& text);

/// Writes one line to standard error as it is.
void writeErrorLine(const std::string& text);

/// The text in bold where there is colour.
std::string heading(const std::string& text);

/// A word of state ("found", "missing", "not available") in its colour; every other text as it is.
std::string colored(const std::string& word);

} // namespace cli

#endif
