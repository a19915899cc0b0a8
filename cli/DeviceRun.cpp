// SPDX-License-Identifier: Apache-2.0
// `coresystem device run`: any program on a simulated device.
#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <memory>
#include <new>
#include <sstream>

#include <coresystem_port.h>
#include <sys/wait.h>

#include "Child.h"
#include "DeviceCommands.h"
#include "PrivateBus.h"
#include "Session.h"
#include "Terminal.h"
#include "Text.h"

namespace fs = std::filesystem;

namespace cli {
namespace {

// As env(1) and shells have them.
enum : int {
    CANNOT_PREPARE = 125,
    CANNOT_EXECUTE = 126,
    NO_SUCH_COMMAND = 127,
};

struct Run {
    std::string file;
    bool onCopy = false;
    std::string services; // empty: all of them
};

void setVariable(const char* name, const std::string& value)
{
    if (setenv(name, value.c_str(), 1) != 0)
        throw std::bad_alloc();
}

// The command's device: the file itself, or a copy that goes away with the folder.
std::string deviceFor(const Run& run, const std::string& folder)
{
    const fs::path file = fs::absolute(coresystem_port::deviceFile());
    if (!run.onCopy)
        return file;
    // In a folder of its own: it may be called as something of the bus is.
    const fs::path copy = fs::path(folder) / "device" / file.filename();
    fs::create_directory(copy.parent_path());
    fs::copy_file(file, copy);
    fs::permissions(copy, fs::perms::owner_write, fs::perm_options::add);
    return copy;
}

// A terminal tells all its processes of a key; a process tells only this one.
void passOn(const siginfo_t& signal, pid_t child)
{
    if (signal.si_signo != SIGCHLD && signal.si_code != SI_KERNEL)
        kill(child, signal.si_signo);
}

int exitCodeOf(int status)
{
    return WIFEXITED(status) ? WEXITSTATUS(status) : ENDED_BY_SIGNAL + WTERMSIG(status);
}

int awaitEnd(pid_t child)
{
    int status = 0;
    while (waitpid(child, &status, WNOHANG) == 0) {
        siginfo_t signal;
        if (sigwaitinfo(&signalsOfChildren(), &signal) > 0)
            passOn(signal, child);
    }
    return exitCodeOf(status);
}

// Whether the device has a system bus at all.
bool hasBus(const std::string& file)
{
    const auto text = port::devicefile::readDeviceText(file);
    const auto device = text ? port::devicefile::parseDevice(text.value(), file) : text.error();
    return !device || device.value().section("fault").find("g_bus_get_sync") == nullptr;
}

// The services that a program finds on its bus.
constexpr const char* SERVICES[] = {"ModemManager", "NetworkManager", "bluez", "hostname1",
                                    "locale1"};
constexpr char NONE[] = "none";

std::vector<std::string> servicesOf(const Run& run)
{
    const std::vector<std::string> all(std::begin(SERVICES), std::end(SERVICES));
    if (run.services.empty())
        return all;
    if (run.services == NONE)
        return {};
    std::vector<std::string> chosen;
    std::istringstream names(run.services);
    for (std::string name; std::getline(names, name, ',');) {
        if (std::find(all.begin(), all.end(), name) == all.end())
            throw UsageError(
                "--services takes none, or some of ModemManager, NetworkManager, bluez, "
                "hostname1, locale1 with commas between them; not \"" +
                name + "\"");
        chosen.push_back(name);
    }
    return chosen;
}

// A program that plays a scenario need not know where this command is.
void putOwnFolderOnPath()
{
    const std::string folder = fs::read_symlink("/proc/self/exe").parent_path();
    const char* const path = std::getenv("PATH");
    setVariable("PATH", path != nullptr && *path != '\0' ? path + (":" + folder) : folder);
}

int runOnDevice(const Run& run, const std::vector<std::string>& command)
{
    const HeldSignals held;
    PrivateBus bus;
    setVariable("CORESYSTEM_DEVICE", deviceFor(run, bus.folder()));
    setVariable("DBUS_SYSTEM_BUS_ADDRESS", bus.address());
    putOwnFolderOnPath();
    bus.start(hasBus(coresystem_port::deviceFile()), servicesOf(run));
    Streams streams;
    streams.sharesAll = true;
    return awaitEnd(startChild(command, streams));
}

int tryToRun(const Run& run, const std::vector<std::string>& command)
{
    try {
        return runOnDevice(run, command);
    } catch (const NotStarted& failure) {
        complain(printable(failure.reason));
        return failure.isMissing ? NO_SUCH_COMMAND : CANNOT_EXECUTE;
    } catch (const std::exception& error) {
        complain(printable(error.what()));
        return CANNOT_PREPARE;
    }
}

ExitCode runCommand(const Invocation& invocation, const Run& run)
{
    if (!invocation.deviceFile.empty())
        throw UsageError("device run takes its device by itself, not by --device");
    if (invocation.tail.empty())
        throw UsageError("device run takes a command behind \"--\"");
    servicesOf(run); // before anything is begun
    if (reportDeviceFileProblem())
        return BAD_DEVICE_FILE;
    return static_cast<ExitCode>(tryToRun(run, invocation.tail));
}

} // namespace
} // namespace cli

void cli::addDeviceRunCommand(const Command& device, Invocation& invocation)
{
    const Command command = device.add("run", "Run a program: run DEVICE -- COMMAND...");
    const auto run = std::make_shared<Run>();
    command.option("DEVICE", run->file, "Device, by file or name").required();
    command.flag("--copy", run->onCopy, "Run on a copy of the file, which goes away");
    command.option("--services", run->services,
                   "Services on its bus: some with commas between, or none");
    command.setFooter(
        "Examples: coresystem device run phone.toml -- ./application --option\n"
        "          coresystem device run --copy phone.toml -- make check\n"
        "The program gets CORESYSTEM_DEVICE and DBUS_SYSTEM_BUS_ADDRESS. The bus ends with "
        "it.\n"
        "Exit code: the program's; 128+N when signal N ended it; 127: there is no such "
        "program;\n"
        "126: it cannot be executed; 125: the bus cannot be started.");
    command.onUse([&invocation, run] {
        chooseDevice(run->file);
        invocation.command = [&invocation, run] { return runCommand(invocation, *run); };
    });
}
