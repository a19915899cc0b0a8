// SPDX-License-Identifier: Apache-2.0
// `coresystem device play`: the steps of a scenario, one after the other, onto another device file.
#include <algorithm>
#include <charconv>
#include <chrono>
#include <filesystem>
#include <memory>
#include <optional>

#include <poll.h>
#include <unistd.h>

#include "Child.h"
#include "DeviceCommands.h"
#include "DeviceWrite.h"
#include "Terminal.h"
#include "Text.h"
#include "devicefile/DeviceSearch.h"
#include "devicefile/DeviceText.h"

namespace fs = std::filesystem;

namespace cli {
namespace {

using port::devicefile::Step;

// In a file that was made by playing: it may be made anew.
const char MARK[] = "# Made by coresystem device play";

struct Play {
    std::string scenario;
    bool isFast = false;
    bool isByLine = false;
    bool force = false;
    std::string limit = "60"; // seconds that a line is waited for
};

// Waits for the time of a step, a line of standard input, or a signal that ends it all.
class Pace {
public:
    /// False when it is to end.
    bool awaitTime(int milliseconds) const
    {
        pollfd either[] = {{signals_.descriptor(), POLLIN, 0}, {STDOUT_FILENO, 0, 0}};
        return poll(either, 2, milliseconds) == 0;
    }
    bool awaitLine(const std::string& limit, const std::string& when) const
    {
        using Clock = std::chrono::steady_clock;
        const Clock::time_point end = Clock::now() + std::chrono::seconds(std::stoi(limit));
        char byte = 0;
        while (byte != '\n') {
            const auto left = std::chrono::ceil<std::chrono::milliseconds>(end - Clock::now());
            pollfd any[] = {{signals_.descriptor(), POLLIN, 0},
                            {STDIN_FILENO, POLLIN, 0},
                            {STDOUT_FILENO, 0, 0}};
            const int ready =
                poll(any, 3, static_cast<int>(std::max<std::int64_t>(left.count(), 0)));
            if (ready == 0)
                throw std::runtime_error(std::string(when)
                                             .append(": no line came within ")
                                             .append(limit)
                                             .append(" s (--limit)"));
            if (ready < 0 || any[0].revents != 0 || any[2].revents != 0 ||
                read(STDIN_FILENO, &byte, 1) != 1)
                return false;
        }
        return true;
    }

    /// The reason why it ends early: a signal, a reader that is gone, or no more input.
    ExitCode endBefore() const
    {
        if (const int signal = signals_.read())
            return static_cast<ExitCode>(ENDED_BY_SIGNAL + signal);
        pollfd reader = {STDOUT_FILENO, 0, 0};
        poll(&reader, 1, 0);
        return reader.revents != 0 ? SUCCESS : FAILURE;
    }

private:
    const SignalReader signals_;
};

// Shows the progress of a scenario while it runs.
class Progress {
public:
    explicit Progress(std::size_t steps) : steps_(steps) {}

    void countDown(std::size_t number, const Step& step, std::int64_t milliseconds) const
    {
        if (isTerminal_)
            writeOut("\r\033[K" + lineOf(number, step) + " in " +
                     std::to_string((milliseconds + 999) / 1000) + " s");
    }
    void tell(std::size_t number, const Step& step) const
    {
        writeOut((isTerminal_ ? "\r\033[K" : "") + lineOf(number, step) + "\n");
    }
    void stop(std::size_t number) const
    {
        if (isTerminal_)
            writeOut("\r\033[K");
        complain(stopText(number));
    }
    std::string stopText(std::size_t number) const
    {
        return "stopped before step " + std::to_string(number) + " of " + std::to_string(steps_);
    }

private:
    std::string lineOf(std::size_t number, const Step& step) const
    {
        return "step " + std::to_string(number) + " of " + std::to_string(steps_) +
               (step.note.empty() ? "" : ": " + printable(step.note));
    }

    const std::size_t steps_;
    const bool isTerminal_ = isSmartTerminal();
};

std::string problemOfLimit(const std::string& text)
{
    int seconds = 0;
    const char* const end = text.data() + text.size();
    const auto read = std::from_chars(text.data(), end, seconds);
    const bool isGood =
        read.ec == std::errc() && read.ptr == end && seconds > 0 && seconds <= 86400;
    return isGood ? "" : quoted(text) + " is no number of seconds from 1 to 86400";
}

bool awaitStep(const Play& play, const Pace& pace, const Progress& progress, std::size_t number,
               const Step& step)
{
    if (play.isByLine)
        return pace.awaitLine(play.limit, progress.stopText(number));
    std::int64_t left = play.isFast ? 0 : step.afterMs;
    for (; left > 0; left -= 1000) {
        progress.countDown(number, step, left);
        if (!pace.awaitTime(static_cast<int>(std::min<std::int64_t>(left, 1000))))
            return false;
    }
    return pace.awaitTime(0);
}

// Every step must be possible before the first one is made.
void rehearse(const DeviceText& scenario, const std::vector<Step>& steps)
{
    std::string text = scenario.text;
    for (const Step& step : steps) {
        const auto next = port::devicefile::changeText(text, scenario.path, step.changes);
        if (!next)
            throw std::runtime_error(step.source +
                                     ": the step is not possible: " + next.error().reason);
        text = next.value();
    }
}

// A file that is not there yet may have the name of a device that comes with the library.
std::string fileFor(const std::string& name)
{
    if (name.find('/') != std::string::npos || fs::path(name).extension() == ".toml")
        return name;
    const port::devicefile::FoundDevice device = port::devicefile::findDevice(name);
    if (device.isShipped)
        throw std::runtime_error(device.path + " comes with the library; play onto another file");
    return device.path;
}

// Where the scenario is played, which keeps nothing of the file that is there.
std::string stageFor(const Play& play, const DeviceText& scenario)
{
    const std::string path = fileFor(chosenDevice());
    std::error_code none;
    if (fs::equivalent(path, scenario.path, none))
        throw UsageError(path +
                         " is the scenario itself; --device names the file it is played onto");
    const DeviceText there = readDevice(path);
    const bool isFree = !fs::exists(path) || there.text == scenario.text ||
                        there.text.find(MARK) != std::string::npos;
    if (!isFree && !play.force)
        throw std::runtime_error(path + " was not made by playing; --force replaces it");
    return path;
}

std::string firstScene(const DeviceText& scenario)
{
    const bool endsLine = scenario.text.empty() || scenario.text.back() == '\n';
    return scenario.text + (endsLine ? "" : "\n") + MARK + ", from " + printable(scenario.path) +
           "\n";
}

ExitCode playSteps(const Play& play, const std::string& stage, const DeviceText& scenario,
                   const std::vector<Step>& steps)
{
    const Pace pace;
    const Progress progress(steps.size());
    writeDevice(stage, firstScene(scenario), true);
    for (std::size_t i = 0; i < steps.size(); ++i) {
        if (!awaitStep(play, pace, progress, i + 1, steps[i])) {
            progress.stop(i + 1);
            return pace.endBefore();
        }
        changeDevice(stage, steps[i].changes);
        progress.tell(i + 1, steps[i]);
    }
    if (play.isByLine)
        pace.awaitLine(play.limit, "all steps are made");
    return SUCCESS;
}

ExitCode runPlay(const Play& play)
{
    const DeviceText scenario = readDevice(play.scenario);
    const std::vector<std::string> problems = problemsOf(scenario);
    for (const std::string& problem : problems)
        writeErrorLine(printable(problem));
    if (!problems.empty())
        return BAD_DEVICE_FILE;
    const std::vector<Step> steps =
        port::devicefile::readDevice(scenario.text, scenario.path).device.steps;
    if (steps.empty())
        throw std::runtime_error(printable(scenario.path) + " has no [[step]]");
    const std::string stage = stageFor(play, scenario);
    rehearse(scenario, steps);
    return playSteps(play, stage, scenario, steps);
}

} // namespace
} // namespace cli

void cli::addDevicePlayCommand(const Command& device, Invocation& invocation)
{
    const Command command = device.add("play", "Play a scenario onto the file of --device");
    const auto play = std::make_shared<Play>();
    command.option("DEVICE", play->scenario, "Scenario: a device file with steps").required();
    command.flag("--fast", play->isFast, "Do not wait");
    command.flag("--by-line", play->isByLine, "Wait for a line of standard input before each step");
    const Argument limit = command
                               .option("--limit", play->limit,
                                       "With --by-line: wait for a line this long at most (60)")
                               .called("SECONDS")
                               .checkedBy(problemOfLimit);
    command.flag("--force", play->force, "Replace a file that was not made by playing");
    command.setFooter("Examples: coresystem device play --device phone.toml travel\n"
                      "          ./application | coresystem device play --by-line travel.toml\n"
                      "The scenario's own file is never written. It stops between steps only.");
    command.onUse([&invocation, play, limit] {
        if (limit.isGiven() && !play->isByLine)
            throw UsageError("--limit is of --by-line");
        if (play->isFast && play->isByLine)
            throw UsageError("--fast and --by-line cannot go together");
        invocation.command = [play] { return runPlay(*play); };
    });
}
