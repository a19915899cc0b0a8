// SPDX-License-Identifier: Apache-2.0
// The command `coresystem`.
#include <algorithm>
#include <cerrno>
#include <cstring>
#include <exception>

#include <CLI/CLI.hpp>

#include "Commands.h"
#include "Completion.h"
#include "Session.h"
#include "Terminal.h"
#include "Text.h"
#include "devicefile/Closest.h"

namespace cli {
namespace {

const char* const VERSION_TEXT = "coresystem " CORESYSTEM_VERSION;

const char* const FOOTER = R"(Examples:
  coresystem info                        every fact about this machine
  coresystem info --device phone.toml    every fact about a simulated device
  coresystem get device_name             one fact, for scripts
  coresystem sim                         what applications may learn of the SIM cards
  coresystem network                     connections, flight mode, mobile data
  coresystem watch                       connection changes, until interrupted
  coresystem package org.example.clock   the version of an installed package
  coresystem storage --at-least 500      whether more than 500 MB are free
  coresystem country 340                 what the library makes of a country key
  coresystem log decipher --key key <log read a debug trace
  coresystem doctor                      what the answers rest on
  coresystem device list                 the simulated devices there are

Exit codes:
  0 success   1 failure, or less storage   2 usage error   3 fact not available
  4 device file unusable   5 no such country key)";

struct Program {
    CLI::App app{"Asks the CoreSystem library about this device.", "coresystem"};
    Invocation invocation;
    CLI::Option* device = nullptr;

    Program()
    {
        app.set_version_flag("--version", VERSION_TEXT, "Print the version and exit");
        device = app.add_option("--device", invocation.deviceFile,
                                "Ask a simulated device (overrides CORESYSTEM_DEVICE)");
        device->type_name("DEVICE");
        app.add_flag("-v,--verbose", invocation.verbose,
                     "Show the library's log lines and the backend on standard error");
        app.fallthrough(); // options of every command may also stand behind it; inherited
        app.require_subcommand(0, 1);
        const Command command(app);
        addInfoCommands(command, invocation);
        addCountryCommand(command, invocation);
        addSimCommand(command, invocation);
        addPackageCommand(command, invocation);
        addStorageCommand(command, invocation);
        addWatchCommand(command, invocation);
        addLogCommands(command, invocation);
        addDoctorCommand(command, invocation);
        addDeviceCommands(command, invocation);
        app.footer(FOOTER);
    }
};

ExitCode reportUsage(const std::string& text)
{
    complain(text + "\nRun \"coresystem --help\" for the commands and their options.");
    return USAGE;
}

// The innermost command that was given.
const CLI::App& chosenCommand(const CLI::App& app)
{
    const std::vector<CLI::App*> chosen = app.get_subcommands();
    return chosen.empty() ? app : chosenCommand(*chosen.front());
}

ExitCode reportExtras(const CLI::App& app)
{
    const std::vector<std::string> extras = app.remaining(true);
    const std::string word = extras.empty() ? "" : extras.front();
    const CLI::App& chosen = chosenCommand(app);
    const std::vector<std::string> names = namesOfCommands(chosen);
    if (names.empty() || word.rfind('-', 0) == 0)
        return reportUsage("unexpected argument " + quoted(word));
    const std::string kind = &chosen == &app ? "" : chosen.get_name() + " ";
    return reportUsage("no " + kind + "command is called " + quoted(word) + "; did you mean \"" +
                       port::devicefile::closest(word, names) + "\"? The commands are " +
                       listed(names));
}

ExitCode execute(const Program& program)
{
    if (program.device->count() > 0) {
        if (program.invocation.deviceFile.empty())
            return reportUsage("--device names no file");
        chooseDevice(program.invocation.deviceFile);
    }
    if (!program.invocation.command) {
        writeOut(program.app.help());
        return USAGE;
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
        std::reverse(words.begin(), words.end()); // as the parser takes them
        program.app.parse(words);
        return execute(program);
    } catch (const CLI::CallForHelp&) {
        writeOut(program.app.help());
        return SUCCESS;
    } catch (const CLI::CallForVersion&) {
        writeOut(std::string(VERSION_TEXT) + "\n");
        return SUCCESS;
    } catch (const CLI::ExtrasError&) {
        return reportExtras(program.app);
    } catch (const CLI::ParseError& error) {
        return reportUsage(printable(error.what()));
    } catch (const UsageError& error) {
        return reportUsage(error.what());
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
        return cli::run(argc, argv);
    } catch (const cli::OutputFailed& failure) {
        return cli::reportOutputFailure(failure.error);
    } catch (const std::exception& error) {
        cli::complain(error.what());
    } catch (...) {
        cli::complain("unknown failure");
    }
    return cli::FAILURE;
}
