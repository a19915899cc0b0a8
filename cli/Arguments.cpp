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

Argument Argument::excludes(const Argument& other) const
{
    option_->excludes(other.option_);
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
                             " takes a command: " + listed(namesOfCommands(*app)));
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

Argument Command::option(const std::string& names, double& value,
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
    app_->footer(remarks + "\n--device FILE and -v go with every command; \"coresystem --help\" "
                           "lists all exit codes.");
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
