// SPDX-License-Identifier: Apache-2.0
// Texts as a terminal shows them. Works on UTF-8 once useUtf8() was called.
#ifndef CLI_TEXT_H
#define CLI_TEXT_H

#include <string>
#include <vector>

namespace cli {

/// Takes characters as UTF-8, whatever the user's locale says; messages stay as they are.
void useUtf8();

/// The text with every control character, every mark that turns the order of letters or is not
/// seen, and every byte that is no UTF-8 escaped: one line that cannot steer a terminal.
std::string printable(const std::string& text);

/// The same for a text that is JSON, by escapes of JSON.
std::string escapedInJson(const std::string& text);

std::string quoted(const std::string& text);

/// "a, b and c"
std::string listed(const std::vector<std::string>& words);

/// Rows of cells, aligned under each other, two blanks apart; printable() is applied to each cell.
/// Continues what does not fit the terminal in lines below, indented.
using Rows = std::vector<std::vector<std::string>>;
std::string aligned(const Rows& rows, const std::string& indent = "  ");

/// The same with titles in the first row; where a row is wider than the terminal, each is shown as
/// lines of a title and a cell.
std::string table(const Rows& rows);

/// A text in lines of blanks and words that fit the terminal, `indent` blanks further in.
std::string wrapped(const std::string& text, std::size_t indent);

} // namespace cli

#endif
