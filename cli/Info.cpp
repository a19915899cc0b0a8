// SPDX-License-Identifier: Apache-2.0
// `coresystem info` and `coresystem get`.
#include <algorithm>

#include <coresystem_port.h>

#include "Commands.h"
#include "Facts.h"
#include "Session.h"
#include "Sims.h"
#include "Terminal.h"
#include "Text.h"
#include "common/Closest.h"

namespace cli {
namespace {

// What is wrong with the device file is told once, not with each fact.
std::string shortReason(const std::string& reason)
{
    const std::string problem = coresystem_port::deviceFileProblem();
    const bool isOfTheFile = !problem.empty() && reason.find(problem) != std::string::npos;
    return isOfTheFile ? "the device file is unusable" : reason;
}

std::vector<std::string> rowOf(const Fact& fact)
{
    if (fact.value.is_null())
        return {fact.name, "not available", "(" + shortReason(fact.reason) + ")"};
    const std::string text = textOf(fact.value);
    return {fact.name, text.empty() ? "\"\"" : text, fact.source};
}

std::string infoText(const std::vector<Fact>& facts)
{
    Rows rows;
    for (const Fact& fact : facts)
        rows.push_back(rowOf(fact));
    return backendLine() + "\n\n" + aligned(rows, "");
}

std::string infoJson(const std::vector<Fact>& facts)
{
    Json json = jsonAnswer();
    Json sources = Json::object();
    Json reasons = Json::object();
    for (const Fact& fact : facts) {
        json[fact.name] = fact.value;
        fact.value.is_null() ? reasons[fact.name] = fact.reason : sources[fact.name] = fact.source;
    }
    json["sources"] = sources;
    json["reasons"] = reasons;
    return jsonText(json);
}

// What an application may learn of its connections.
const std::vector<std::string> NETWORK_FACTS = {
    "connected_cellular", "connected_wifi", "connected_bluetooth", "connected_any",
    "flight_mode",        "mobile_data",    "data_roaming",
};

std::vector<Fact> askAll(const std::vector<std::string>& names, bool reveal)
{
    std::vector<Fact> facts;
    for (const std::string& name : names) {
        facts.push_back(askFact(name));
        if (facts.back().isIdentity && !reveal)
            facts.back().value = masked(facts.back().value);
    }
    return facts;
}

ExitCode runInfo(const Invocation& invocation, const std::vector<std::string>& names, bool reveal)
{
    const std::vector<Fact> facts = askAll(names, reveal);
    const bool deviceFileBad = reportDeviceFileProblem();
    writeOut(invocation.json ? infoJson(facts) : infoText(facts));
    return deviceFileBad ? BAD_DEVICE_FILE : SUCCESS;
}

void checkFactName(const std::string& name)
{
    const std::vector<std::string> names = factNames();
    if (std::find(names.begin(), names.end(), name) == names.end())
        throw UsageError("no fact is called " + quoted(name) + "; did you mean \"" +
                         port::closest(name, names) + "\"? The facts are " + listed(names));
}

ExitCode reportMissing(const Fact& fact)
{
    if (reportDeviceFileProblem())
        return BAD_DEVICE_FILE;
    complain(fact.name + " is not available: " + printable(fact.reason));
    return NOT_AVAILABLE;
}

ExitCode runGet(const Invocation& invocation, const std::string& name)
{
    checkFactName(name);
    const Fact fact = askFact(name);
    if (invocation.json)
        writeOut(infoJson({fact}));
    else if (!fact.value.is_null())
        writeOut(printable(textOf(fact.value)) + "\n");
    return fact.value.is_null() ? reportMissing(fact) : SUCCESS;
}

ExitCode listFacts()
{
    for (const std::string& name : factNames())
        writeOut(name + "\n");
    return SUCCESS;
}

void addGet(CLI::App& app, Invocation& invocation)
{
    CLI::App* const get = app.add_subcommand("get", "Print one fact: the value and nothing else");
    const auto name = std::make_shared<std::string>();
    const auto list = std::make_shared<bool>(false);
    get->add_option("FACT", *name, "The fact, as `coresystem get --list` names it");
    get->add_flag("--list", *list, "Print the names of all facts");
    get->add_flag("--json", invocation.json, "Print a JSON object with value and source");
    setFooter(*get, "Example: coresystem get device_name\n"
                    "Exit code 3: the fact is not available; the reason is on standard error.");
    get->callback([&invocation, name, list] {
        if (name->empty() != *list)
            throw UsageError("get takes one fact (or --list)");
        invocation.command = [&invocation, name, list] {
            return *list ? listFacts() : runGet(invocation, *name);
        };
    });
}

void addNetwork(CLI::App& app, Invocation& invocation)
{
    CLI::App* const network =
        app.add_subcommand("network", "Print what applications may learn of the connections");
    network->add_flag("--json", invocation.json, "Print one JSON object");
    setFooter(*network, "A connection over Wi-Fi or Bluetooth counts beside the cellular one: "
                        "\"connected_wifi\" is yes when either is there.");
    network->callback([&invocation] {
        invocation.command = [&invocation] { return runInfo(invocation, NETWORK_FACTS, false); };
    });
}

void addSerial(CLI::App& app, Invocation& invocation)
{
    CLI::App* const serial =
        app.add_subcommand("serial", "Print the serial number that the device daemon tells");
    serial->add_flag("--json", invocation.json, "Print a JSON object with value and source");
    setFooter(*serial, "The daemon answers by the device file that it was started with, not by "
                       "--device.\n"
                       "Exit code 3: there is no serial number; the reason is on standard error.");
    serial->callback([&invocation] {
        invocation.command = [&invocation] { return runGet(invocation, "device_serial"); };
    });
}

} // namespace
} // namespace cli

void cli::addInfoCommands(CLI::App& app, Invocation& invocation)
{
    CLI::App* const info =
        app.add_subcommand("info", "Print every fact about the device, with its source");
    const auto reveal = std::make_shared<bool>(false);
    info->add_flag("--reveal", *reveal, "Show phone number, IMEI and serial number, unmasked");
    info->add_flag("--json", invocation.json, "Print one JSON object");
    setFooter(*info, "Examples: coresystem info\n"
                     "          coresystem info --json --device phone.toml");
    info->callback([&invocation, reveal] {
        invocation.command = [&invocation, reveal] {
            return runInfo(invocation, factNames(), *reveal);
        };
    });
    addGet(app, invocation);
    addNetwork(app, invocation);
    addSerial(app, invocation);
}
