// SPDX-License-Identifier: Apache-2.0
// The help texts of the command.
#ifndef CLI_HELP_H
#define CLI_HELP_H

#include <string>

#include <CLI/CLI.hpp>

namespace cli {

/// The help of a command, in lines that fit the terminal.
std::string helpText(const CLI::App& command);

/// The text for somebody who gives no command.
std::string startPage();

/// Where more is said of a command.
std::string hintAt(const CLI::App& chosen);

/// Why the words of a command line cannot be understood, and what to do. `chosen` is the innermost
/// command of those that were given.
std::string usageProblem(const CLI::ParseError& error, const CLI::App& chosen);

/// The same of words that nobody takes.
std::string extrasProblem(const std::vector<std::string>& extras, const CLI::App& chosen);

} // namespace cli

#endif
