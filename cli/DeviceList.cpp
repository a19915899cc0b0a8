// SPDX-License-Identifier: Apache-2.0
// `coresystem device list`: the devices that --device knows by name.
#include "DeviceCommands.h"
#include "Session.h"
#include "Terminal.h"
#include "Text.h"
#include "devicefile/DeviceSearch.h"

namespace cli {
namespace {

using port::devicefile::NamedDevice;

// A word that a comment for an editor begins with: no description.
constexpr const char* DIRECTIVE = "#:";

struct ListedDevice {
    NamedDevice device;
    std::string description;
    std::vector<std::string> problems;
};

// The first comment before the device itself.
std::string descriptionOf(const std::string& text)
{
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);) {
        const std::size_t begin = line.find('#');
        if (begin != 0 || line.find_first_not_of("# \t\r") == std::string::npos ||
            line.rfind(DIRECTIVE, 0) == 0)
            continue;
        line.erase(line.find_last_not_of(" \t\r") + 1);
        return line.substr(line.find_first_not_of("# \t"));
    }
    return {};
}

std::vector<ListedDevice> askDevices()
{
    std::vector<ListedDevice> devices;
    for (const NamedDevice& device : port::devicefile::listDevices()) {
        const DeviceText text = readDevice(device.path);
        devices.push_back({device, descriptionOf(text.text), problemsOf(text)});
    }
    return devices;
}

const char* originOf(const NamedDevice& device)
{
    return device.isShipped ? "shipped" : "yours";
}

std::string listText(const std::vector<ListedDevice>& devices)
{
    Rows rows;
    for (const auto& [device, description, problems] : devices) {
        rows.push_back({device.name, originOf(device), description});
        if (!problems.empty())
            rows.back().back() = "unusable: " + problems.front();
    }
    return aligned(rows, "");
}

std::string listJson(const std::vector<ListedDevice>& devices)
{
    Json list = Json::array();
    for (const auto& [device, description, problems] : devices)
        list.push_back({{"name", device.name},
                        {"origin", originOf(device)},
                        {"path", device.path},
                        {"description", description},
                        {"problems", problems}});
    return jsonText({{"schema", 1}, {"devices", list}});
}

ExitCode runList(const Invocation& invocation)
{
    const std::vector<ListedDevice> devices = askDevices();
    writeOut((invocation.json ? listJson : listText)(devices));
    return SUCCESS;
}

} // namespace
} // namespace cli

void cli::addDeviceListCommand(const Command& device, Invocation& invocation)
{
    const Command list = device.add("list", "Show the devices that have names");
    list.flag("--json", invocation.json, "Print JSON");
    list.setFooter("The user's own devices are the files of $XDG_CONFIG_HOME/coresystem/devices "
                   "(by default ~/.config/coresystem/devices); they hide shipped ones of the "
                   "same name.");
    list.onUse(
        [&invocation] { invocation.command = [&invocation] { return runList(invocation); }; });
}
