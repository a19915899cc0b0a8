// SPDX-License-Identifier: Apache-2.0
// The words that a command takes. The commands state them here and do not include the parser's own
// header, which takes several times as long to compile as a command does.
#ifndef CLI_ARGUMENTS_H
#define CLI_ARGUMENTS_H

#include <functional>
#include <string>
#include <vector>

namespace CLI {
class App;
class Option;
} // namespace CLI

namespace cli {

/// A value or a switch of a command; lives as long as the parser.
class Argument {
public:
    explicit Argument(CLI::Option& option) : option_(&option) {}

    Argument required() const;
    /// How the help names the value.
    Argument called(const std::string& name) const;
    /// Makes it a list: each time that it is given adds a value.
    Argument takesAll() const;
    /// Explains what is wrong with a value; empty when nothing is.
    Argument checkedBy(std::string (*problemOf)(const std::string& value)) const;

    bool isGiven() const;

private:
    CLI::Option* option_;
};

/// A command, or a group of commands; lives as long as the parser. What its words are written to
/// must live as long.
class Command {
public:
    explicit Command(CLI::App& app) : app_(&app) {}

    Command add(const std::string& name, const std::string& description) const;
    /// The commands of a group, of which one must be given.
    void requireCommand() const;

    Argument flag(const std::string& names, bool& value, const std::string& description) const;
    Argument option(const std::string& names, std::string& value,
                    const std::string& description) const;
    Argument option(const std::string& names, std::vector<std::string>& values,
                    const std::string& description) const;

    /// Ends the help with the command's own remarks and those that hold for every command.
    void setFooter(const std::string& remarks) const;
    /// Runs when the command was given and its words are right.
    void onUse(const std::function<void()>& action) const;

private:
    CLI::App* app_;
};

/// The names of the commands of a group.
std::vector<std::string> namesOfCommands(const CLI::App& command);

} // namespace cli

#endif
