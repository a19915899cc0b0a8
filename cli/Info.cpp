// SPDX-License-Identifier: Apache-2.0
// `coresystem info` and `coresystem get`.
#include <algorithm>
#include <utility>

#include <coresystem_port.h>

#include "Commands.h"
#include "Facts.h"
#include "Session.h"
#include "Sims.h"
#include "Terminal.h"
#include "Text.h"

namespace cli {
namespace {

// Report a mistake in the device file once, not with each fact.
std::string shortReason(const std::string& reason)
{
    const std::string problem = coresystem_port::deviceFileProblem();
    const bool isOfTheFile = !problem.empty() && reason.find(problem) != std::string::npos;
    return isOfTheFile ? "the device file is unusable" : reason;
}

struct Section {
    const char* title;
    std::vector<std::string> beginnings; // of the names of its facts
};

// Counts a fact that no section names as one of the device itself.
const std::vector<Section> SECTIONS = {
    {"Device", {""}},
    {"Language", {"language"}},
    {"SIM card", {"sim_", "phone_number", "imei", "roaming"}},
    {"Network",
     {"cellular", "operator", "access_technology", "signal", "wifi", "ssid", "bluetooth",
      "ethernet", "connect"}},
    {"Settings", {"flight_mode", "data_roaming", "mobile_data", "sales_code"}},
    {"Storage", {"storage"}},
};

bool isIn(const Section& section, const std::string& name)
{
    return std::any_of(section.beginnings.begin(), section.beginnings.end(),
                       [&](const std::string& beginning) { return name.rfind(beginning, 0) == 0; });
}

// The last one that takes the name.
const Section& sectionOf(const std::string& name)
{
    return *std::find_if(SECTIONS.rbegin(), SECTIONS.rend(),
                         [&](const Section& section) { return isIn(section, name); });
}

std::vector<std::string> rowOf(const Fact& fact)
{
    if (fact.value.is_null())
        return {fact.name, "not available"};
    const std::string text = textOf(fact.value);
    return {fact.name, text.empty() ? "\"\"" : text, shortened(fact.source)};
}

// Facts under what they have in common, in the order in which that comes up.
using Groups = std::vector<std::pair<std::string, std::string>>;

void addTo(Groups& groups, const std::string& what, const std::string& name)
{
    const auto same = std::find_if(groups.begin(), groups.end(),
                                   [&](const auto& group) { return group.first == what; });
    if (same == groups.end())
        groups.emplace_back(what, name);
    else
        same->second += ", " + name;
}

const std::string TOLD = "applications are told ";

// Each reason once, with all facts that it takes away, and what applications get all the same.
std::string missingText(const std::vector<Fact>& facts)
{
    Groups reasons;
    Groups told;
    for (const Fact& fact : facts) {
        const std::string reason =
            fact.value.is_null() ? shortened(shortReason(fact.reason)) : std::string();
        for (std::size_t at = 0; at < reason.size();) {
            const std::size_t end = std::min(reason.find("; ", at), reason.size());
            const std::string part = reason.substr(at, end - at);
            part.rfind(TOLD, 0) == 0 ? addTo(told, part.substr(TOLD.size()), fact.name)
                                     : addTo(reasons, part, fact.name);
            at = end + 2;
        }
    }
    std::string text = reasons.empty() ? "" : "\n" + heading("Not available") + "\n";
    for (const auto& [reason, names] : reasons)
        text += wrapped(printable(reason), 2) + wrapped(names, 4);
    Rows rows;
    for (const auto& [answer, names] : told)
        rows.push_back({answer, names});
    return text + (rows.empty()
                       ? ""
                       : "\n" + heading("What applications are told") + "\n" + aligned(rows));
}

std::string infoText(const std::vector<Fact>& facts)
{
    std::string text = backendLine() + "\n";
    for (const Section& section : SECTIONS) {
        Rows rows;
        for (const Fact& fact : facts)
            if (&sectionOf(fact.name) == &section)
                rows.push_back(rowOf(fact));
        if (!rows.empty())
            text += "\n" + heading(section.title) + "\n" + aligned(rows);
    }
    return text + missingText(facts);
}

std::string infoJson(const std::vector<Fact>& facts)
{
    Json json = jsonAnswer();
    Json sources = Json::object();
    Json reasons = Json::object();
    Json today = Json::object();
    for (const Fact& fact : facts) {
        json[fact.name] = fact.value;
        fact.value.is_null() ? reasons[fact.name] = fact.reason : sources[fact.name] = fact.source;
        if (!fact.today.is_null())
            today[fact.name] = fact.today;
    }
    for (const auto& [former, name] : factAliases()) {
        if (!json.contains(name) || json.contains(former))
            continue;
        json[former] = json[name];
        Json& told = sources.contains(name) ? sources : reasons;
        told[former] = told[name];
    }
    json["sources"] = sources;
    json["reasons"] = reasons;
    if (!today.empty())
        json["today"] = today;
    return jsonText(json);
}

// The facts about connections.
std::vector<std::string> networkFacts()
{
    std::vector<std::string> names = factNames();
    names.erase(std::remove_if(names.begin(), names.end(),
                               [](const std::string& name) {
                                   return sectionOf(name).title != std::string("Network");
                               }),
                names.end());
    names.insert(names.end(), {"flight_mode", "mobile_data", "data_roaming"});
    return names;
}

std::vector<Fact> askAll(const std::vector<std::string>& names, bool reveal)
{
    std::vector<Fact> facts = askFacts(names);
    for (Fact& fact : facts)
        if (fact.isIdentity && !reveal)
            fact.value = masked(fact.value);
    return facts;
}

ExitCode runInfo(const Invocation& invocation, const std::vector<std::string>& names, bool reveal)
{
    const std::vector<Fact> facts = askAll(names, reveal);
    const bool deviceFileBad = reportDeviceFileProblem();
    writeOut(invocation.json ? infoJson(facts) : infoText(facts));
    return deviceFileBad ? BAD_DEVICE_FILE : SUCCESS;
}

ExitCode reportMissing(const Fact& fact)
{
    if (reportDeviceFileProblem())
        return BAD_DEVICE_FILE;
    complain(fact.name + " is not available: " + printable(fact.reason));
    return NOT_AVAILABLE;
}

// The facts that `get` was asked for.
struct Wanted {
    std::vector<std::string> names;
    bool list = false;
    bool endsWithNul = false;
};

// A fact that is not available is an empty line among others, so that each stays in its place.
std::string valueLine(const Fact& fact, const Wanted& wanted)
{
    if (fact.value.is_null() && wanted.names.size() == 1)
        return "";
    const std::string text = fact.value.is_null() ? "" : textOf(fact.value);
    return wanted.endsWithNul ? text + '\0' : printable(text) + "\n";
}

ExitCode runGet(const Invocation& invocation, const Wanted& wanted)
{
    const std::vector<Fact> facts = askAll(wanted.names, true);
    ExitCode code = SUCCESS;
    if (invocation.json)
        writeOut(infoJson(facts));
    for (const Fact& fact : facts) {
        if (!invocation.json)
            writeOut(valueLine(fact, wanted));
        if (!fact.value.is_null() && !fact.today.is_null())
            complain(fact.name + ": " + fact.reason);
        if (fact.value.is_null() && code != BAD_DEVICE_FILE)
            code = reportMissing(fact);
    }
    return code;
}

ExitCode listFacts()
{
    for (const std::string& name : factNames())
        writeOut(name + "\n");
    return SUCCESS;
}

void addGet(const Command& app, Invocation& invocation)
{
    const Command get = app.add("get", "Show facts, for scripts");
    const auto wanted = std::make_shared<Wanted>();
    get.option("FACT", wanted->names, "Facts, as `coresystem get --list` names them");
    get.flag("--list", wanted->list, "Show the names of all facts");
    get.flag("-0,--null", wanted->endsWithNul, "End each value with NUL, and escape nothing");
    get.flag("--json", invocation.json, "Print JSON");
    get.setFooter("Example: coresystem get device_name sw_version\n"
                  "Exit code 3: a fact is not available; the reason is on standard error.");
    get.onUse([&invocation, wanted] {
        if (wanted->names.empty() != wanted->list)
            throw UsageError("get needs facts, or --list");
        for (const std::string& name : wanted->names)
            checkFactName(name, factNames());
        invocation.command = [&invocation, wanted] {
            return wanted->list ? listFacts() : runGet(invocation, *wanted);
        };
    });
}

void addNetwork(const Command& app, Invocation& invocation)
{
    const Command network = app.add("network", "Show connections and their switches");
    network.flag("--json", invocation.json, "Print JSON");
    network.setFooter(
        "Each link is shown on its own, then in the combinations that applications ask for, all of "
        "which count the cellular link: \"connected_cellular_or_wifi\" is yes when either is up.\n"
        "\"connected_any\" also counts a cable, which applications do not see. \"operator\" to "
        "\"signal\" describe the modem that carries the data, else the first one with service; "
        "`coresystem sim` shows them for each.");
    network.onUse([&invocation] {
        invocation.command = [&invocation] { return runInfo(invocation, networkFacts(), false); };
    });
}

void addSerial(const Command& app, Invocation& invocation)
{
    const Command serial = app.add("serial", "Show the serial number");
    serial.flag("--json", invocation.json, "Print JSON");
    serial.setFooter("The device daemon tells it, of the device file that it was started with: "
                     "--device does not count.\n"
                     "Exit code 3: there is no serial number; the reason is on standard error.");
    serial.onUse([&invocation] {
        invocation.command = [&invocation] { return runGet(invocation, {{"device_serial"}}); };
    });
}

} // namespace
} // namespace cli

void cli::addInfoCommands(const Command& app, Invocation& invocation)
{
    const Command info = app.add("info", "Show every fact, with its source");
    const auto reveal = std::make_shared<bool>(false);
    info.flag("--reveal", *reveal, "Show what identifies the device and its user in full");
    info.flag("--json", invocation.json, "Print JSON");
    info.setFooter("Examples: coresystem info\n"
                   "          coresystem info --json --device phone");
    info.onUse([&invocation, reveal] {
        invocation.command = [&invocation, reveal] {
            return runInfo(invocation, factNames(), *reveal);
        };
    });
    addGet(app, invocation);
    addNetwork(app, invocation);
    addSerial(app, invocation);
}
