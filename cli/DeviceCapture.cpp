// SPDX-License-Identifier: Apache-2.0
// `coresystem device capture`: the device that answers now, as a device file.
#include <memory>

#include <coresystem_port.h>

#include "DeviceCommands.h"
#include "DeviceWrite.h"
#include "Session.h"
#include "Terminal.h"

namespace cli {
namespace {

struct Capture {
    coresystem_port::CaptureOptions options;
    std::string file;
    bool force = false;
};

// Report the machine's facts that a device file cannot hold.
void checkCaptured(const std::string& text)
{
    const auto reading = port::devicefile::readDevice(text, "captured");
    if (!reading.problems.empty())
        throw std::runtime_error("a device file cannot say all of it: " +
                                 describe("captured", reading.problems.front()));
}

ExitCode runCapture(const Capture& capture)
{
    if (reportDeviceFileProblem())
        return BAD_DEVICE_FILE;
    const std::string text = coresystem_port::captureDevice(capture.options);
    checkCaptured(text);
    if (capture.file.empty())
        writeOut(text);
    else
        writeDevice(capture.file, text, capture.force);
    return SUCCESS;
}

} // namespace
} // namespace cli

void cli::addDeviceCaptureCommand(const Command& device, Invocation& invocation)
{
    const Command command = device.add("capture", "Write this machine as a device file");
    const auto capture = std::make_shared<Capture>();
    command.option("-o,--output", capture->file, "File to write (default: standard output)")
        .called("FILE");
    command.flag("--force", capture->force, "Replace a file that is there");
    command.flag("--reveal", capture->options.reveal, "Write what is masked in full");
    command
        .option("--package", capture->options.packages,
                "Write the version of a package, too; may be repeated")
        .called("NAME")
        .takesAll();
    command.setFooter("Examples: coresystem device capture -o this.toml\n"
                      "          coresystem device capture --reveal --package bash\n"
                      "Each fact has a comment where it came from.");
    command.onUse([&invocation, capture] {
        invocation.command = [capture] { return runCapture(*capture); };
    });
}
