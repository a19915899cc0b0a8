// SPDX-License-Identifier: Apache-2.0
#include "Completion.h"

#include <algorithm>
#include <cstdlib>
#include <set>

#include "Facts.h"
#include "devicefile/DeviceFile.h"
#include "devicefile/DeviceSearch.h"
#include "devicefile/DeviceText.h"
#include "devicefile/Schema.h"

namespace cli {
namespace {

const char* const FILES = ":files\n";
const char* const COMMANDS = ":commands\n";

using Words = std::vector<std::string>;

// The words that are known for a value, by what the help calls it. `begun` is the value as far as
// it was typed, `device` the one that was chosen before it.
struct Values {
    const char* label;
    Words (*list)(const std::string& begun, const std::string& device);
};

Words facts(const std::string&, const std::string&)
{
    return factNames();
}

Words colors(const std::string&, const std::string&)
{
    return {"auto", "always", "never"};
}

Words deviceNames(const std::string&, const std::string&)
{
    Words names;
    for (const auto& device : port::devicefile::listDevices())
        names.push_back(device.name);
    return names;
}

// "settings.flight_mode"; of slots the first one's, and no section with keys of any name.
Words devicePaths(const std::string&, const std::string&)
{
    using namespace port::devicefile;
    Words paths;
    for (const SectionRow* row = beginSections(); row != endSections(); ++row)
        for (const std::string& key : keyNames(*row))
            paths.push_back(std::string(row->name) + (row->form == Form::List ? "[0]." : ".") +
                            key);
    return paths;
}

// The type of what a path leads to; null when there is nothing.
const port::devicefile::Type* typeAt(const std::string& path)
{
    const std::size_t dot = path.find_last_of('.');
    const auto* const section =
        port::devicefile::findSection(path.substr(0, std::min(path.find('['), dot)));
    return section != nullptr && dot != std::string::npos
               ? port::devicefile::findKey(*section, path.substr(dot + 1))
               : nullptr;
}

Words valuesOf(const port::devicefile::Type& type)
{
    if (type.kind == port::devicefile::Type::Kind::Switch)
        return {"true", "false"};
    Words values;
    for (const auto& name : type.names)
        values.emplace_back(name.name);
    return values;
}

Words deviceAssignments(const std::string& begun, const std::string& device)
{
    Words words;
    const std::size_t sign = begun.find('=');
    const std::string path = begun.substr(0, sign);
    if (sign == std::string::npos)
        for (const std::string& known : devicePaths(begun, device))
            words.push_back(known + "=");
    else if (const auto* const type = typeAt(path))
        for (const std::string& value : valuesOf(*type))
            words.push_back(std::string(path).append("=").append(value));
    return words;
}

// The packages that a simulated device names.
Words packages(const std::string&, const std::string& device)
{
    const char* const chosen = secure_getenv("CORESYSTEM_DEVICE");
    const std::string name = device.empty() && chosen != nullptr ? chosen : device;
    Words names;
    if (name.empty())
        return names;
    const std::string path = port::devicefile::findDevice(name).path;
    const auto text = port::devicefile::readDeviceText(path);
    const auto entries = port::devicefile::listEntries(text ? text.value() : "", path);
    if (entries)
        for (const auto& entry : entries.value())
            if (entry.section == "packages" && entry.key.size() > 1)
                names.push_back(entry.key.front() == '"' ? entry.key.substr(1, entry.key.size() - 2)
                                                         : entry.key);
    return names;
}

const Values VALUES[] = {
    {"FACT", facts},         {"WHEN", colors},      {"NAME", packages},
    {"DEVICE", deviceNames}, {"PATH", devicePaths}, {"ASSIGNMENT", deviceAssignments},
};

// Where the last word stands.
struct Place {
    const CLI::App* command = nullptr;
    const CLI::Option* option = nullptr; // whose value it is
    std::size_t positionals = 0;         // before it
    std::string device;                  // that of --device
    std::size_t wordsOfAnother = 0;      // and "--" before them; none without it
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

bool isOfAnother(const Place& place)
{
    return place.wordsOfAnother > 0;
}

const char* const DEVICE_OPTION = "--device";

void step(Place& place, const std::string& word)
{
    if (place.option != nullptr && place.option->check_name(DEVICE_OPTION))
        place.device = word;
    if (const std::string given = std::string(DEVICE_OPTION) + "="; beginsWith(word, given))
        place.device = word.substr(given.size());
    if (isOfAnother(place) || (place.option == nullptr && word == "--")) {
        ++place.wordsOfAnother;
        return;
    }
    if (place.command->get_parent() == nullptr && place.option == nullptr && word == "help")
        return;
    const CLI::App* const command =
        place.positionals == 0 ? findCommand(*place.command, word) : nullptr;
    if (place.option != nullptr)
        place.option = nullptr;
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

    // `before` stands in the same word, before the value.
    void addValues(const CLI::Option& option, const std::string& device,
                   const std::string& before = "")
    {
        const std::string begun = beginning_.substr(before.size());
        const std::string label =
            option.get_positional() ? option.get_name(true, false) : option.get_type_name();
        for (const Values& values : VALUES)
            if (label == values.label)
                for (const std::string& word : values.list(begun, device))
                    add(before + word);
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
    if (isOfAnother(place))
        return place.wordsOfAnother == 1 ? COMMANDS : FILES;
    if (place.option != nullptr) {
        lines.addValues(*place.option, place.device);
        return lines.text();
    }
    const std::size_t sign = beginning.find('=');
    if (beginsWith(beginning, "--") && sign != std::string::npos) {
        if (const auto* const option = findValueOption(place.command, beginning.substr(0, sign)))
            lines.addValues(*option, place.device, beginning.substr(0, sign + 1));
        return lines.text();
    }
    if (place.positionals == 0)
        lines.addCommands(*place.command);
    if (place.command->get_parent() == nullptr)
        lines.add("help", "Show the help of a command");
    if (const CLI::Option* const positional = positionalAt(place))
        lines.addValues(*positional, place.device);
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
