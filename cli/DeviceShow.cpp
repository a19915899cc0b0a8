// SPDX-License-Identifier: Apache-2.0
// `coresystem device show`: the values of a device file, each with its line.
#include <algorithm>
#include <iterator>
#include <string>

#include "DeviceCommands.h"
#include "Session.h"
#include "Sims.h"
#include "Terminal.h"
#include "Text.h"
#include "devicefile/DevicePath.h"
#include "devicefile/DeviceText.h"
#include "port/facts/Facts.h"

namespace cli {
namespace {

using port::devicefile::Entry;

// A step says what it sets as a path of its own.
bool identifies(const Entry& entry)
{
    const bool isOfStep = entry.section.compare(0, 4, "step") == 0;
    std::string text = isOfStep ? entry.key.substr(entry.key.find('.') + 1) : entry.path();
    if (isOfStep) // in quotes or not, slot.0.sim and slot[0].sim alike
        text.erase(std::remove(text.begin(), text.end(), '"'), text.end());
    const auto path = port::devicefile::parsePath(text);
    return path && path.value().size() > 1 &&
           port::isPrivate(path.value().front(), path.value().back());
}

Json valueOf(const Entry& entry, bool reveal)
{
    const Json value = std::visit([](const auto& content) { return Json(content); }, entry.value);
    return identifies(entry) && !reveal ? masked(value) : value;
}

std::string shown(const Json& value)
{
    return value.is_string() ? value.get<std::string>() : value.dump();
}

std::string sourceOf(const DeviceText& device, const Entry& entry)
{
    return device.path + ":" + std::to_string(entry.line);
}

std::string showText(const DeviceText& device, const std::vector<Entry>& entries, bool reveal)
{
    std::string text = device.path + "\n";
    for (auto first = entries.begin(); first != entries.end();) {
        const auto behind = std::find_if(first, entries.end(), [&](const Entry& entry) {
            return entry.section != first->section;
        });
        Rows rows;
        std::transform(first, behind, std::back_inserter(rows), [&](const Entry& entry) {
            return std::vector<std::string>{entry.key, shown(valueOf(entry, reveal)),
                                            isFullWidth() ? sourceOf(device, entry)
                                                          : "line " + std::to_string(entry.line)};
        });
        if (!first->section.empty()) // the schema's number is none of the device's values
            text += "\n" + heading("[" + first->section + "]") + "\n" + aligned(rows);
        first = behind;
    }
    const bool hides = !reveal && std::any_of(entries.begin(), entries.end(), identifies);
    return text + (hides ? "\nWhat identifies the subscriber is masked; --reveal shows it.\n" : "");
}

std::string showJson(const DeviceText& device, const std::vector<Entry>& entries, bool reveal)
{
    Json json = {{"schema", 1}, {"device_file", device.path}, {"masked", !reveal}};
    for (const char* const part : {"values", "sources"})
        json[part] = Json::object();
    for (const Entry& entry : entries) {
        if (entry.section.empty())
            continue;
        json["values"][entry.path()] = valueOf(entry, reveal);
        json["sources"][entry.path()] = sourceOf(device, entry);
    }
    return jsonText(json);
}

ExitCode runShow(const Invocation& invocation, const std::string& name, bool reveal)
{
    const DeviceText device = readDevice(name);
    const std::vector<std::string> problems = problemsOf(device);
    for (const std::string& problem : problems)
        writeErrorLine(printable(problem));
    if (!problems.empty())
        return BAD_DEVICE_FILE;
    const auto entries = port::devicefile::listEntries(device.text, device.path);
    writeOut((invocation.json ? showJson : showText)(device, entries.value(), reveal));
    return SUCCESS;
}

} // namespace
} // namespace cli

void cli::addDeviceShowCommand(const Command& device, Invocation& invocation)
{
    const Command show = device.add("show", "Show the values, each with its line");
    const auto name = std::make_shared<std::string>();
    const auto reveal = std::make_shared<bool>(false);
    show.option("DEVICE", *name, "Device, by file or name (default: that of --device)");
    show.flag("--reveal", *reveal, "Show what is masked in full");
    show.flag("--json", invocation.json, "Print JSON");
    show.setFooter("Example: coresystem device show phone.toml\n"
                   "Exit code 4: the file has mistakes; they are on standard error.");
    show.onUse([&invocation, name, reveal] {
        invocation.command = [&invocation, name, reveal] {
            return runShow(invocation, *name, *reveal);
        };
    });
}
