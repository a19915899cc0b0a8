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
#include "devicefile/Closest.h"

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
                         port::devicefile::closest(name, names) + "\"? The facts are " +
                         listed(names));
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

void addGet(const Command& app, Invocation& invocation)
{
    const Command get = app.add("get", "Print one fact: the value and nothing else");
    const auto name = std::make_shared<std::string>();
    const auto list = std::make_shared<bool>(false);
    get.option("FACT", *name, "The fact, as `coresystem get --list` names it");
    get.flag("--list", *list, "Print the names of all facts");
    get.flag("--json", invocation.json, "Print a JSON object with value and source");
    get.setFooter("Example: coresystem get device_name\n"
                  "Exit code 3: the fact is not available; the reason is on standard error.");
    get.onUse([&invocation, name, list] {
        if (name->empty() != *list)
            throw UsageError("get takes one fact (or --list)");
        invocation.command = [&invocation, name, list] {
            return *list ? listFacts() : runGet(invocation, *name);
        };
    });
}

void addNetwork(const Command& app, Invocation& invocation)
{
    const Command network =
        app.add("network", "Print what applications may learn of the connections");
    network.flag("--json", invocation.json, "Print one JSON object");
    network.setFooter("A connection over Wi-Fi or Bluetooth counts beside the cellular one: "
                      "\"connected_wifi\" is yes when either is there.");
    network.onUse([&invocation] {
        invocation.command = [&invocation] { return runInfo(invocation, NETWORK_FACTS, false); };
    });
}

void addSerial(const Command& app, Invocation& invocation)
{
    const Command serial =
        app.add("serial", "Print the serial number that the device daemon tells");
    serial.flag("--json", invocation.json, "Print a JSON object with value and source");
    serial.setFooter("The daemon answers by the device file that it was started with, not by "
                     "--device.\n"
                     "Exit code 3: there is no serial number; the reason is on standard error.");
    serial.onUse([&invocation] {
        invocation.command = [&invocation] { return runGet(invocation, "device_serial"); };
    });
}

} // namespace
} // namespace cli

void cli::addInfoCommands(const Command& app, Invocation& invocation)
{
    const Command info = app.add("info", "Print every fact about the device, with its source");
    const auto reveal = std::make_shared<bool>(false);
    info.flag("--reveal", *reveal, "Show phone number, IMEI and serial number, unmasked");
    info.flag("--json", invocation.json, "Print one JSON object");
    info.setFooter("Examples: coresystem info\n"
                   "          coresystem info --json --device phone.toml");
    info.onUse([&invocation, reveal] {
        invocation.command = [&invocation, reveal] {
            return runInfo(invocation, factNames(), *reveal);
        };
    });
    addGet(app, invocation);
    addNetwork(app, invocation);
    addSerial(app, invocation);
}
