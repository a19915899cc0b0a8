// SPDX-License-Identifier: Apache-2.0
// The command `coresystem`.
#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <exception>

#include <CLI/CLI.hpp>
#include <unistd.h>

#include "Commands.h"
#include "Completion.h"
#include "Facts.h"
#include "Help.h"
#include "Session.h"
#include "Terminal.h"
#include "Text.h"

namespace cli {
namespace {

const char* const VERSION_TEXT = "coresystem " CORESYSTEM_VERSION;

const char* const FOOTER = R"(Examples:
  coresystem info --device phone
  coresystem get device_name sw_version
  coresystem storage --at-least 500
  coresystem country 340
  coresystem device run phone.toml -- ./application
"coresystem help COMMAND" tells more of a command, coresystem(1) everything.

Exit codes:
  0 success   1 failure, or less storage   2 usage error   3 fact not available
  4 device file unusable   5 no such country key   128+N ended by signal N)";

struct ColorWord {
    const char* word;
    Color color;
};

constexpr ColorWord COLORS[] = {
    {"auto", Color::Auto}, {"always", Color::Always}, {"never", Color::Never}};

const ColorWord* findColor(const std::string& word)
{
    for (const ColorWord& row : COLORS)
        if (word == row.word)
            return &row;
    return nullptr;
}

std::string colorProblem(const std::string& word)
{
    return findColor(word) != nullptr ? "" : quoted(word) + " is not auto, always or never";
}

struct Program {
    CLI::App app{"Show what an application learns about the device it runs on.", "coresystem"};
    Invocation invocation;
    CLI::Option* device = nullptr;

    Program()
    {
        app.set_help_flag("-h,--help", "Show this help"); // inherited
        app.set_version_flag("-V,--version", VERSION_TEXT, "Show the version");
        device = app.add_option("--device", invocation.deviceFile,
                                "Ask a simulated device, by file or name");
        device->type_name("DEVICE");
        app.add_flag("-v,--verbose", invocation.verbose,
                     "Show the library's log lines on standard error");
        app.add_flag("--wide", invocation.wide, "Wrap and shorten nothing");
        app.add_option("--color", invocation.color, "Use color: auto, always or never")
            ->type_name("WHEN")
            ->check(CLI::Validator([](std::string& word) { return colorProblem(word); }, ""));
        app.fallthrough(); // options of every command may also stand behind it; inherited
        app.require_subcommand(0, 1);
        const Command command(app);
        addInfoCommands(command, invocation);
        addSimCommand(command, invocation);
        addCountryCommand(command, invocation);
        addPackageCommand(command, invocation);
        addStorageCommand(command, invocation);
        addWatchCommand(command, invocation);
        addDoctorCommand(command, invocation);
        addDeviceCommands(command, invocation);
        addLogCommands(command, invocation);
        app.footer(FOOTER);
    }
};

// The innermost command that was given.
const CLI::App& chosenCommand(const CLI::App& app)
{
    const std::vector<CLI::App*> chosen = app.get_subcommands();
    return chosen.empty() ? app : chosenCommand(*chosen.front());
}

ExitCode reportUsage(const std::string& text, const CLI::App& chosen)
{
    complain(text + "\n" + hintAt(chosen));
    return USAGE;
}

ExitCode execute(const Program& program)
{
    if (program.invocation.wide)
        useFullWidth();
    useColor(findColor(program.invocation.color)->color);
    if (program.device->count() > 0) {
        if (program.invocation.deviceFile.empty())
            return reportUsage("--device needs a value: DEVICE", program.app);
        chooseDevice(program.invocation.deviceFile);
    }
    if (!program.invocation.command) {
        writeOut(startPage());
        return SUCCESS;
    }
    chooseLogSink(program.invocation.verbose);
    if (program.invocation.verbose)
        writeErrorLine(backendLine());
    return program.invocation.command();
}

// Takes the words behind "--" away, which are another command's: none of them is ours to read.
std::vector<std::string> takeTail(std::vector<std::string>& words)
{
    const auto end = std::find(words.begin(), words.end(), "--");
    if (end == words.end() || std::find(words.begin(), end, "run") == end)
        return {};
    std::vector<std::string> tail(end + 1, words.end());
    words.erase(end, words.end());
    return tail;
}

ExitCode showHelp(const CLI::App& app)
{
    const CLI::App& chosen = chosenCommand(app);
    if (const auto extras = app.remaining(true); !extras.empty())
        return reportUsage(extrasProblem(extras, chosen), chosen);
    writeOut(helpText(chosen));
    return SUCCESS;
}

// "help COMMAND" is "COMMAND --help".
void takeHelp(std::vector<std::string>& words)
{
    if (words.empty() || words.front() != "help")
        return;
    words.erase(words.begin());
    words.push_back("--help");
}

ExitCode run(int argc, char** argv)
{
    Program program;
    if (argc > 1 && argv[1] == std::string(COMPLETE)) {
        writeOut(completions(program.app, {argv + 2, argv + argc}));
        return SUCCESS;
    }
    try {
        std::vector<std::string> words(argv + 1, argv + argc);
        program.invocation.tail = takeTail(words);
        takeHelp(words);
        std::reverse(words.begin(), words.end()); // as the parser takes them
        program.app.parse(words);
        return execute(program);
    } catch (const CLI::CallForHelp&) {
        return showHelp(program.app);
    } catch (const CLI::CallForVersion&) {
        writeOut(std::string(VERSION_TEXT) + "\n");
        return SUCCESS;
    } catch (const CLI::ExtrasError&) {
        const CLI::App& chosen = chosenCommand(program.app);
        return reportUsage(extrasProblem(program.app.remaining(true), chosen), chosen);
    } catch (const CLI::ParseError& error) {
        const CLI::App& chosen = chosenCommand(program.app);
        return reportUsage(usageProblem(error, chosen), chosen);
    } catch (const UsageError& error) {
        return reportUsage(error.what(), chosenCommand(program.app));
    }
}

ExitCode reportOutputFailure(int error)
{
    if (error == EPIPE) // the reader has seen enough
        return SUCCESS;
    complain(std::string("standard output cannot be written: ") + std::strerror(error));
    return FAILURE;
}

} // namespace

} // namespace cli

int main(int argc, char** argv)
{
    try {
        cli::useUtf8();
        cli::prepareStandardStreams();
        const cli::ExitCode code = cli::run(argc, argv);
        if (!cli::isStillAsking())
            return code;
        std::fflush(nullptr);
        _exit(code);
    } catch (const cli::OutputFailed& failure) {
        return cli::reportOutputFailure(failure.error);
    } catch (const std::exception& error) {
        cli::complain(error.what());
    } catch (...) {
        cli::complain("unknown failure");
    }
    return cli::FAILURE;
}
