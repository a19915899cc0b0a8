// SPDX-License-Identifier: Apache-2.0
// The commands below `coresystem device`, which read and change device files.
#ifndef CLI_DEVICE_COMMANDS_H
#define CLI_DEVICE_COMMANDS_H

#include <string>

#include "Commands.h"
#include "devicefile/DeviceFile.h"

namespace cli {

void addDeviceListCommand(const Command& device, Invocation& invocation);
void addDeviceCheckCommand(const Command& device, Invocation& invocation);
void addDeviceShowCommand(const Command& device, Invocation& invocation);
void addDeviceEditCommands(const Command& device, Invocation& invocation);
void addDeviceCaptureCommand(const Command& device, Invocation& invocation);
void addDevicePlayCommand(const Command& device, Invocation& invocation);
void addDeviceRunCommand(const Command& device, Invocation& invocation);

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
