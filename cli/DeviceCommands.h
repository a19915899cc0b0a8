// SPDX-License-Identifier: Apache-2.0
// The commands below `coresystem device`, which read and change device files.
#ifndef CLI_DEVICE_COMMANDS_H
#define CLI_DEVICE_COMMANDS_H

#include <string>

#include "Commands.h"
#include "simulator/DeviceFile.h"

namespace cli {

void addDeviceListCommand(CLI::App& device, Invocation& invocation);
void addDeviceCheckCommand(CLI::App& device, Invocation& invocation);
void addDeviceShowCommand(CLI::App& device, Invocation& invocation);
void addDeviceEditCommands(CLI::App& device, Invocation& invocation);
void addDeviceCaptureCommand(CLI::App& device, Invocation& invocation);
void addDevicePlayCommand(CLI::App& device, Invocation& invocation);
void addDeviceRunCommand(CLI::App& device, Invocation& invocation);

/// The name of the device that --device or CORESYSTEM_DEVICE chooses; throws UsageError when there
/// is none.
std::string chosenDevice();

// The text of a device file, or why it cannot be read.
struct DeviceText {
    std::string path;
    std::string text;
    std::string problem;
};

/// Looks for a device as --device does and reads its file; an empty name is the chosen device's.
DeviceText readDevice(const std::string& name);

/// Every problem of a device, as lines for people; none when it is good.
std::vector<std::string> problemsOf(const DeviceText& device);

} // namespace cli

#endif
