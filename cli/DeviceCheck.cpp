// SPDX-License-Identifier: Apache-2.0
// `coresystem device check`: every mistake in device files.
#include "DeviceCommands.h"
#include "Terminal.h"
#include "Text.h"

namespace cli {
namespace {

ExitCode runCheck(const std::vector<std::string>& names)
{
    ExitCode result = SUCCESS;
    for (const std::string& name : names) {
        const DeviceText device = readDevice(name);
        const std::vector<std::string> problems = problemsOf(device);
        for (const std::string& problem : problems)
            writeOut(printable(problem) + "\n");
        if (problems.empty())
            writeOut(printable(device.path) + ": OK\n");
        else
            result = FAILURE;
    }
    return result;
}

} // namespace
} // namespace cli

void cli::addDeviceCheckCommand(const Command& device, Invocation& invocation)
{
    const Command check = device.add("check", "Check device files");
    const auto names = std::make_shared<std::vector<std::string>>();
    check.option("DEVICE", *names, "Devices, by file or name").required();
    check.setFooter("Example: coresystem device check phone.toml\n"
                    "Each mistake is one line, FILE:LINE:COLUMN: what is wrong.\n"
                    "Exit code 1: there is a mistake, or a file cannot be read.");
    check.onUse(
        [&invocation, names] { invocation.command = [names] { return runCheck(*names); }; });
}
