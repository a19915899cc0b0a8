// SPDX-License-Identifier: Apache-2.0
// `coresystem device get`, `set` and `unset`: single values of a device file.
#include <optional>

#include "DeviceCommands.h"
#include "DeviceWrite.h"
#include "Terminal.h"
#include "Text.h"
#include "devicefile/DevicePath.h"
#include "devicefile/DeviceSearch.h"
#include "devicefile/DeviceText.h"

namespace cli {
namespace {

using port::devicefile::Edit;

const char* const PATHS = "A path is settings.flight_mode, slot[0].sim, fault.telephony_init or "
                          "packages.org.example.app.";

ExitCode reportFailure(const std::string& reason)
{
    complain(printable(reason));
    return FAILURE;
}

ExitCode runGet(const std::string& path)
{
    const DeviceText device = readDevice("");
    if (!device.problem.empty())
        return reportFailure(device.problem);
    const auto value = port::devicefile::getValue(device.text, device.path, path);
    if (!value)
        return reportFailure(value.error().reason);
    writeOut(printable(value.value()) + "\n");
    return SUCCESS;
}

// PATH=VALUE; a path may hold a "=" in quotes.
Edit assignmentOf(const std::string& argument)
{
    for (std::size_t at = 0; (at = argument.find('=', at)) != std::string::npos; ++at)
        if (const std::string path = argument.substr(0, at); port::devicefile::parsePath(path))
            return {path, argument.substr(at + 1)};
    throw UsageError(quoted(argument) + " is no PATH=VALUE. " + PATHS);
}

Edit removalOf(const std::string& path)
{
    if (!port::devicefile::parsePath(path))
        throw UsageError(quoted(path) + " is no path. " + PATHS);
    return {path, std::nullopt};
}

ExitCode runChange(const std::vector<Edit>& changes)
{
    const port::devicefile::FoundDevice device = port::devicefile::findDevice(chosenDevice());
    if (device.isShipped)
        return reportFailure(device.path + " comes with the library; change a copy of it");
    try {
        changeDevice(device.path, changes);
        return SUCCESS;
    } catch (const std::runtime_error& error) {
        return reportFailure(error.what() + device.elsewhere);
    }
}

void addDeviceGet(const Command& device, Invocation& invocation)
{
    const Command get = device.add("get", "Show a value");
    const auto path = std::make_shared<std::string>();
    get.option("PATH", *path, "Where the value is").required();
    get.setFooter(std::string("Example: coresystem device get slot[0].sim --device phone.toml\n") +
                  PATHS + "\nExit code 1: the file does not have it.");
    get.onUse([&invocation, path] { invocation.command = [path] { return runGet(*path); }; });
}

// A command that changes values, each of which an argument tells.
void addChange(const Command& device, Invocation& invocation, const char* name,
               const char* argument, const char* meaning, Edit (*changeOf)(const std::string&),
               const char* description, const char* remarks)
{
    const Command command = device.add(name, description);
    const auto arguments = std::make_shared<std::vector<std::string>>();
    command.option(argument, *arguments, meaning).required();
    command.setFooter(std::string(remarks) + PATHS +
                      "\nAll changes are made at once, or none. Exit code 1: none was.");
    command.onUse([&invocation, arguments, changeOf] {
        std::vector<Edit> changes;
        for (const std::string& text : *arguments)
            changes.push_back(changeOf(text));
        invocation.command = [changes] { return runChange(changes); };
    });
}

} // namespace
} // namespace cli

void cli::addDeviceEditCommands(const Command& device, Invocation& invocation)
{
    addDeviceGet(device, invocation);
    addChange(device, invocation, "set", "ASSIGNMENT", "What to change, each PATH=VALUE",
              assignmentOf, "Set values",
              "Example: coresystem device set settings.flight_mode=true network.wifi=deactivated "
              "--device phone.toml\n");
    addChange(device, invocation, "unset", "PATH", "What to remove", removalOf, "Remove values",
              "Example: coresystem device unset slot[0].number --device phone.toml\n");
}
