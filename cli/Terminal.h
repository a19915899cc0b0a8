// SPDX-License-Identifier: Apache-2.0
// Standard output and standard error.
#ifndef CLI_TERMINAL_H
#define CLI_TERMINAL_H

#include <string>

namespace cli {

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

/// The text in bold when standard output is a terminal.
std::string heading(const std::string& text);

} // namespace cli

#endif
