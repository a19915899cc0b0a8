// SPDX-License-Identifier: Apache-2.0
#include "Completion.h"

#include <set>

#include "Facts.h"
#include "devicefile/DeviceSearch.h"
#include "devicefile/Schema.h"

namespace cli {
namespace {

const char* const FILES = ":files\n";

// The words that are known for a value, by what the help calls it.
struct Values {
    const char* label;
    std::vector<std::string> (*list)();
};

std::vector<std::string> deviceNames()
{
    std::vector<std::string> names;
    for (const auto& device : port::devicefile::listDevices())
        names.push_back(device.name);
    return names;
}

// "settings.flight_mode"; of slots the first one's, and no section with keys of any name.
std::vector<std::string> devicePaths()
{
    using namespace port::devicefile;
    std::vector<std::string> paths;
    for (const SectionRow* row = beginSections(); row != endSections(); ++row)
        for (const std::string& key : keyNames(*row))
            paths.push_back(std::string(row->name) + (row->form == Form::List ? "[0]." : ".") +
                            key);
    return paths;
}

std::vector<std::string> deviceAssignments()
{
    std::vector<std::string> paths = devicePaths();
    for (std::string& path : paths)
        path += "=";
    return paths;
}

const Values VALUES[] = {
    {"FACT", factNames},
    {"DEVICE", deviceNames},
    {"PATH", devicePaths},
    {"ASSIGNMENT", deviceAssignments},
};

// Where the last word stands.
struct Place {
    const CLI::App* command = nullptr;
    const CLI::Option* option = nullptr; // whose value it is
    std::size_t positionals = 0;         // before it
    bool isOfAnotherCommand = false;     // behind "--"
};

bool beginsWith(const std::string& text, const std::string& beginning)
{
    return text.compare(0, beginning.size(), beginning) == 0;
}

const CLI::App* findCommand(const CLI::App& app, const std::string& name)
{
    for (const CLI::App* const command : app.get_subcommands({}))
        if (command->get_name() == name)
            return command;
    return nullptr;
}

// The option of this command or of those around it, if it takes a value.
const CLI::Option* findValueOption(const CLI::App* app, const std::string& name)
{
    for (; app != nullptr; app = app->get_parent())
        for (const CLI::Option* const option : app->get_options({}))
            if (option->check_name(name))
                return option->get_items_expected_max() > 0 ? option : nullptr;
    return nullptr;
}

void step(Place& place, const std::string& word)
{
    const CLI::App* const command =
        place.positionals == 0 ? findCommand(*place.command, word) : nullptr;
    if (place.option != nullptr)
        place.option = nullptr;
    else if (word == "--")
        place.isOfAnotherCommand = true;
    else if (beginsWith(word, "-"))
        place.option = findValueOption(place.command, word);
    else if (command != nullptr)
        place.command = command;
    else
        ++place.positionals;
}

const CLI::Option* positionalAt(const Place& place)
{
    std::size_t position = 0;
    for (const CLI::Option* const option : place.command->get_options({})) {
        if (!option->get_positional())
            continue;
        position += static_cast<std::size_t>(option->get_items_expected_max());
        if (place.positionals < position)
            return option;
    }
    return nullptr;
}

class Lines {
public:
    explicit Lines(const std::string& beginning) : beginning_(beginning) {}

    void add(const std::string& word, const std::string& meaning = "")
    {
        if (beginsWith(word, beginning_) && words_.insert(word).second)
            text_ += word + "\t" + meaning.substr(0, meaning.find('\n')) + "\n";
    }

    void addValues(const CLI::Option& option)
    {
        const std::string label =
            option.get_positional() ? option.get_name(true, false) : option.get_type_name();
        for (const Values& values : VALUES)
            if (label == values.label)
                for (const std::string& word : values.list())
                    add(word);
        if (label == "FILE" || label == "DEVICE")
            text_ += FILES;
    }

    void addOptions(const CLI::App* app)
    {
        for (; app != nullptr; app = app->get_parent())
            for (const CLI::Option* const option : app->get_options({}))
                for (const std::string& name : option->get_lnames())
                    add("--" + name, option->get_description());
    }

    void addCommands(const CLI::App& app)
    {
        for (const CLI::App* const command : app.get_subcommands({}))
            add(command->get_name(), command->get_description());
    }

    const std::string& text() const
    {
        return text_;
    }

private:
    const std::string beginning_;
    std::set<std::string> words_;
    std::string text_;
};

std::string linesAt(const Place& place, const std::string& beginning)
{
    Lines lines(beginning);
    if (place.isOfAnotherCommand)
        return FILES;
    if (place.option != nullptr) {
        lines.addValues(*place.option);
        return lines.text();
    }
    if (place.positionals == 0)
        lines.addCommands(*place.command);
    if (const CLI::Option* const positional = positionalAt(place))
        lines.addValues(*positional);
    lines.addOptions(place.command);
    return lines.text();
}

} // namespace

const char* const COMPLETE = "__complete";

std::string completions(const CLI::App& app, const std::vector<std::string>& words)
{
    Place place;
    place.command = &app;
    for (std::size_t i = 0; i + 1 < words.size(); ++i)
        step(place, words[i]);
    return linesAt(place, words.empty() ? "" : words.back());
}

} // namespace cli
