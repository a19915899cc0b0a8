// SPDX-License-Identifier: Apache-2.0
// Completes the last word of a command line. The completions of all shells ask for it, so that
// none of them knows a command or an option itself.
#ifndef CLI_COMPLETION_H
#define CLI_COMPLETION_H

#include <string>
#include <vector>

#include <CLI/CLI.hpp>

namespace cli {

/// The first word of a command line that asks for completion; the other words follow, the last of
/// them as far as it was typed.
extern const char* const COMPLETE;

/// One line for each word that may take the place of the last one, with a tabulator and what it
/// means behind it; the line ":files" says that the name of a file may, too, ":commands" that of
/// another program.
std::string completions(const CLI::App& app, const std::vector<std::string>& words);

} // namespace cli

#endif
