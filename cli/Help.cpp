// SPDX-License-Identifier: Apache-2.0
#include "Help.h"

#include <algorithm>

#include "Arguments.h"
#include "Terminal.h"
#include "Text.h"
#include "devicefile/Closest.h"

namespace cli {
namespace {

const char* const START_PAGE[][2] = {
    {"coresystem info", "show every fact about this machine"},
    {"coresystem info --device phone", "show those of a simulated phone"},
    {"coresystem doctor", "check the services"},
    {"coresystem help", "list all commands"},
};

// "device set"; the command itself by its own name.
std::string nameOf(const CLI::App& command)
{
    const CLI::App* const parent = command.get_parent();
    const bool isBelow = parent != nullptr && parent->get_parent() != nullptr;
    return (isBelow ? nameOf(*parent) + " " : "") + command.get_name();
}

std::vector<const CLI::Option*> positionalsOf(const CLI::App& command)
{
    return command.get_options([](const CLI::Option* option) { return option->get_positional(); });
}

std::vector<const CLI::Option*> optionsOf(const CLI::App& command)
{
    return command.get_options([](const CLI::Option* option) { return option->nonpositional(); });
}

std::string positionalText(const CLI::Option& option)
{
    const bool takesMany = option.get_items_expected_max() > 1;
    const std::string name = option.get_name(true, false) + (takesMany ? "..." : "");
    return option.get_required() ? name : "[" + name + "]";
}

std::string usageLine(const CLI::App& command)
{
    std::string line =
        "Usage: " + std::string(command.get_parent() != nullptr ? "coresystem " : "") +
        nameOf(command) + " [OPTION...]";
    if (!command.get_subcommands({}).empty())
        line += " COMMAND";
    for (const CLI::Option* const option : positionalsOf(command))
        line += " " + positionalText(*option);
    return line;
}

// "-o, --output FILE"
std::string optionText(const CLI::Option& option)
{
    std::string text;
    for (const std::string& name : option.get_snames())
        text += (text.empty() ? "-" : ", -") + name;
    for (const std::string& name : option.get_lnames())
        text += (text.empty() ? "--" : ", --") + name;
    return text + (option.get_items_expected_max() > 0 ? " " + option.get_type_name() : "");
}

std::string section(const char* title, const Rows& rows)
{
    return rows.empty() ? "" : "\n" + heading(title) + "\n" + aligned(rows);
}

std::string optionsText(const CLI::App& command)
{
    Rows rows;
    for (const CLI::Option* const option : optionsOf(command))
        rows.push_back({optionText(*option), option->get_description()});
    return section("Options:", rows);
}

std::string argumentsText(const CLI::App& command)
{
    Rows rows;
    for (const CLI::Option* const option : positionalsOf(command))
        rows.push_back({option->get_name(true, false), option->get_description()});
    return section("Arguments:", rows);
}

std::string commandsText(const CLI::App& command)
{
    Rows rows;
    for (const CLI::App* const below : command.get_subcommands({}))
        rows.push_back({below->get_name(), below->get_description()});
    return section("Commands:", rows);
}

// Examples stay as they are, so that they can be copied.
std::string remarksText(const CLI::App& command)
{
    const std::string remarks = command.get_footer();
    return remarks.empty() ? "" : "\n" + wrapped(remarks, 0);
}

// The option that a message of the parser is about, which begins with its name.
const CLI::Option* optionOf(const std::string& message, const CLI::App& chosen)
{
    const std::string name = message.substr(0, message.find_first_of(": "));
    for (const CLI::App* app = &chosen; app != nullptr; app = app->get_parent())
        if (const CLI::Option* const option = app->get_option_no_throw(name))
            return option;
    return nullptr;
}

std::vector<std::string> optionNames(const CLI::App& chosen)
{
    std::vector<std::string> names;
    for (const CLI::App* app = &chosen; app != nullptr; app = app->get_parent())
        for (const CLI::Option* const option : optionsOf(*app))
            for (const std::string& name : option->get_lnames())
                names.push_back("--" + name);
    return names;
}

std::string didYouMean(const std::string& word)
{
    return word.empty() ? "" : "; did you mean " + quoted(word) + "?";
}

std::string missingText(const CLI::App& chosen)
{
    for (const CLI::Option* const option : chosen.get_options())
        if (option->get_required() && option->count() == 0)
            return nameOf(chosen) + " needs " +
                   (option->get_positional() ? option->get_name(true, false)
                                             : optionText(*option)) +
                   ": " + option->get_description();
    return nameOf(chosen) + " needs more arguments";
}

} // namespace

std::string hintAt(const CLI::App& chosen)
{
    return "Try \"coresystem help" + (chosen.get_parent() != nullptr ? " " + nameOf(chosen) : "") +
           "\".";
}

std::string helpText(const CLI::App& command)
{
    return wrapped(command.get_description(), 0) + "\n" + wrapped(usageLine(command), 0) +
           argumentsText(command) + commandsText(command) + optionsText(command) +
           remarksText(command);
}

std::string startPage()
{
    Rows rows;
    for (const auto& [command, meaning] : START_PAGE)
        rows.push_back({command, meaning});
    return wrapped("coresystem tells what an application learns about the device it runs on.", 0) +
           "\n" + aligned(rows);
}

std::string usageProblem(const CLI::ParseError& error, const CLI::App& chosen)
{
    const std::string message = error.what();
    if (dynamic_cast<const CLI::RequiredError*>(&error) != nullptr)
        return missingText(chosen);
    const CLI::Option* const option = optionOf(message, chosen);
    if (option == nullptr)
        return printable(message);
    const std::string name = option->get_name();
    if (dynamic_cast<const CLI::ValidationError*>(&error) != nullptr)
        return printable(name + message.substr(message.find(':')));
    return option->get_items_expected_max() > 0
               ? name + " needs a value: " + option->get_type_name()
               : name + " takes no value";
}

std::string extrasProblem(const std::vector<std::string>& extras, const CLI::App& chosen)
{
    const std::string word = extras.empty() ? "" : extras.front();
    if (word.rfind('-', 0) == 0)
        return "there is no option " + quoted(word) +
               didYouMean(port::devicefile::similar(word, optionNames(chosen)));
    const std::vector<std::string> names = namesOfCommands(chosen);
    if (names.empty())
        return nameOf(chosen) + " does not take " + quoted(word);
    const std::string kind = chosen.get_parent() == nullptr ? "" : nameOf(chosen) + " ";
    return "there is no " + kind + "command " + quoted(word) +
           didYouMean(port::devicefile::similar(word, names)) + "\nThe commands are " +
           listed(names) + ".";
}

} // namespace cli
