// SPDX-License-Identifier: Apache-2.0
// The command groups, and what all of them share.
#ifndef CLI_COMMANDS_H
#define CLI_COMMANDS_H

#include <functional>
#include <stdexcept>
#include <string>
#include <vector>

#include "Arguments.h"

namespace cli {

enum ExitCode : int { // `device run` also passes on its command's
    SUCCESS = 0,
    FAILURE = 1,
    USAGE = 2,
    NOT_AVAILABLE = 3,
    BAD_DEVICE_FILE = 4,
    UNKNOWN_COUNTRY = 5,
    ENDED_BY_SIGNAL = 128, // and its number
};

// A mistake in the arguments, told to the user as it is.
struct UsageError : std::runtime_error {
    using std::runtime_error::runtime_error;
};

// The options of every command, and the command that was asked for.
struct Invocation {
    std::string deviceFile;
    bool verbose = false;
    bool json = false;
    bool wide = false;
    std::string color = "auto";
    std::vector<std::string> tail; // behind "--", of a command that takes another one
    std::function<ExitCode()> command;
};

void addInfoCommands(const Command& app, Invocation& invocation);
void addCountryCommand(const Command& app, Invocation& invocation);
void addSimCommand(const Command& app, Invocation& invocation);
void addPackageCommand(const Command& app, Invocation& invocation);
void addStorageCommand(const Command& app, Invocation& invocation);
void addWatchCommand(const Command& app, Invocation& invocation);
void addLogCommands(const Command& app, Invocation& invocation);
void addDoctorCommand(const Command& app, Invocation& invocation);
void addDeviceCommands(const Command& app, Invocation& invocation);

} // namespace cli

#endif
