// SPDX-License-Identifier: Apache-2.0
#include "Arguments.h"

#include <CLI/CLI.hpp>

#include "Commands.h"
#include "Text.h"

namespace cli {

Argument Argument::required() const
{
    option_->required();
    return *this;
}

Argument Argument::called(const std::string& name) const
{
    option_->type_name(name);
    return *this;
}

Argument Argument::takesAll() const
{
    option_->take_all();
    return *this;
}

Argument Argument::checkedBy(std::string (*problemOf)(const std::string& value)) const
{
    option_->check(CLI::Validator([problemOf](std::string& text) { return problemOf(text); }, ""));
    return *this;
}

bool Argument::isGiven() const
{
    return option_->count() > 0;
}

Command Command::add(const std::string& name, const std::string& description) const
{
    return Command(*app_->add_subcommand(name, description));
}

void Command::requireCommand() const
{
    app_->require_subcommand(0, 1);
    app_->callback([app = app_] {
        if (app->get_subcommands().empty())
            throw UsageError(app->get_name() +
                             " needs a command: " + listed(namesOfCommands(*app)));
    });
}

Argument Command::flag(const std::string& names, bool& value, const std::string& description) const
{
    return Argument(*app_->add_flag(names, value, description));
}

Argument Command::option(const std::string& names, std::string& value,
                         const std::string& description) const
{
    return Argument(*app_->add_option(names, value, description));
}

Argument Command::option(const std::string& names, std::vector<std::string>& values,
                         const std::string& description) const
{
    return Argument(*app_->add_option(names, values, description));
}

void Command::setFooter(const std::string& remarks) const
{
    app_->footer(remarks + "\nMore options and all exit codes: coresystem help");
}

void Command::onUse(const std::function<void()>& action) const
{
    app_->callback(action);
}

std::vector<std::string> namesOfCommands(const CLI::App& command)
{
    std::vector<std::string> names;
    for (const CLI::App* const below : command.get_subcommands({}))
        names.push_back(below->get_name());
    return names;
}

} // namespace cli
