// SPDX-License-Identifier: Apache-2.0
// `coresystem device`: looks at device files and changes them.
#include <cstdlib>

#include "DeviceCommands.h"
#include "Text.h"
#include "devicefile/DeviceSearch.h"

std::string cli::chosenDevice()
{
    const char* const name = secure_getenv("CORESYSTEM_DEVICE"); // --device has set it
    if (name == nullptr || *name == '\0')
        throw UsageError("no device is chosen; --device or CORESYSTEM_DEVICE names one");
    return name;
}

cli::DeviceText cli::readDevice(const std::string& name)
{
    const auto found = port::devicefile::findDevice(name.empty() ? chosenDevice() : name);
    const auto text = port::devicefile::readDeviceText(found.path);
    if (!text)
        return {found.path, "", text.error().reason + found.elsewhere};
    return {found.path, text.value(), ""};
}

std::vector<std::string> cli::problemsOf(const DeviceText& device)
{
    if (!device.problem.empty())
        return {device.problem};
    std::vector<std::string> lines;
    for (const auto& problem : port::devicefile::readDevice(device.text, device.path).problems)
        lines.push_back(describe(device.path, problem));
    return lines;
}

void cli::addDeviceCommands(const Command& app, Invocation& invocation)
{
    const Command device = app.add("device", "Manage simulated devices");
    device.setFooter("Examples: coresystem device list\n"
                     "          coresystem device check phone.toml\n"
                     "          coresystem device set settings.flight_mode=true "
                     "--device phone.toml");
    device.requireCommand();
    addDeviceListCommand(device, invocation);
    addDeviceCheckCommand(device, invocation);
    addDeviceShowCommand(device, invocation);
    addDeviceEditCommands(device, invocation);
    addDeviceCaptureCommand(device, invocation);
    addDevicePlayCommand(device, invocation);
    addDeviceRunCommand(device, invocation);
}
