// SPDX-License-Identifier: Apache-2.0
// `coresystem sim`: what an application may learn of each SIM slot.
#include <map>

#include "Commands.h"
#include "Facts.h"
#include "Session.h"
#include "Sims.h"
#include "Terminal.h"
#include "Text.h"

namespace cli {
namespace {

// The lines about a slot.
struct Column {
    int table; // each is told on its own
    const char* title;
    const char* key; // in JSON
    ValueOrReason SimSlot::*answer;
    bool isIdentity;      // masked unless it is to be revealed
    const char* fact;     // that tells it of the first slot, or empty
    const char* yes = ""; // the words for true and false
    const char* no = "";
};

constexpr Column COLUMNS[] = {
    {0, "SIM", "status", &SimSlot::status, false, ""},
    {0, "MCC", "mcc", &SimSlot::mcc, false, "sim_mcc"},
    {0, "MNC", "mnc", &SimSlot::mnc, false, "sim_mnc"},
    {0, "MSIN", "msin", &SimSlot::msin, true, ""},
    {0, "number", "phone_number", &SimSlot::phoneNumber, true, "phone_number"},
    {0, "country", "country", &SimSlot::country, false, "sim_country"},
    {0, "network", "roaming", &SimSlot::roaming, false, "roaming", "roaming", "home"},
    {0, "SMS", "sms", &SimSlot::sms, false, "", "ready", "not ready"},
    {1, "operator", "operator", &SimSlot::operatorName, false, ""},
    {1, "its MCC", "operator_mcc", &SimSlot::operatorMcc, false, ""},
    {1, "its MNC", "operator_mnc", &SimSlot::operatorMnc, false, ""},
    {1, "technology", "access_technology", &SimSlot::accessTechnology, false, ""},
    {1, "signal %", "signal", &SimSlot::signal, false, ""},
    {2, "power", "power", &SimSlot::power, false, ""},
    {2, "PIN tries", "pin_tries", &SimSlot::pinTries, false, ""},
    {2, "ICCID", "iccid", &SimSlot::iccid, true, ""},
};
constexpr int TABLES = 3;

Json shown(const Column& column, const SimSlot& slot, bool reveal)
{
    const Json& value = (slot.*column.answer).value;
    return column.isIdentity && !reveal ? masked(value) : value;
}

std::string cellOf(const Column& column, const SimSlot& slot, bool reveal)
{
    const Json value = shown(column, slot, reveal);
    if (value.is_boolean())
        return value.get<bool>() ? column.yes : column.no;
    return value.is_null() ? "-" : textOf(value);
}

// Whether anything is known of what a table tells.
bool isFilled(const std::vector<SimSlot>& slots, int table)
{
    for (const SimSlot& slot : slots)
        for (const Column& column : COLUMNS)
            if (column.table == table && !(slot.*column.answer).value.is_null())
                return true;
    return false;
}

std::string tableText(const std::vector<SimSlot>& slots, int number, bool reveal)
{
    Rows rows = {{"slot"}};
    if (number == 0)
        rows[0].emplace_back("modem");
    for (const Column& column : COLUMNS)
        if (column.table == number)
            rows[0].emplace_back(column.title);
    for (const SimSlot& slot : slots) {
        rows.push_back({std::to_string(slot.number)});
        if (number == 0)
            rows.back().push_back(slot.modem);
        for (const Column& column : COLUMNS)
            if (column.table == number)
                rows.back().push_back(cellOf(column, slot, reveal));
    }
    return table(rows);
}

std::string slotsText(const std::vector<SimSlot>& slots, bool reveal)
{
    std::string text = tableText(slots, 0, reveal);
    for (int number = 1; number < TABLES; ++number)
        if (isFilled(slots, number))
            text += "\n" + tableText(slots, number, reveal);
    return text;
}

// Each reason once for a slot, with everything that it takes away.
std::string reasonsText(const std::vector<SimSlot>& slots)
{
    Rows rows;
    for (const SimSlot& slot : slots) {
        std::map<std::string, std::size_t> rowOfReason;
        for (const Column& column : COLUMNS) {
            const ValueOrReason& answer = slot.*column.answer;
            if (!answer.value.is_null())
                continue;
            const auto [found, isNew] = rowOfReason.emplace(answer.reason, rows.size());
            if (isNew)
                rows.push_back({"slot " + std::to_string(slot.number), column.title,
                                shortened(answer.reason)});
            else
                rows[found->second][1] += std::string(", ") + column.title;
        }
    }
    return rows.empty() ? "" : "\n" + heading("Not available") + "\n" + aligned(rows);
}

std::string defaultsText(const std::vector<DefaultSlot>& defaults)
{
    Rows rows;
    for (const auto& [use, slot] : defaults)
        rows.push_back({use, slot.value.is_null() ? "not available (" + shortened(slot.reason) + ")"
                                                  : slot.value.get<std::string>()});
    return "\n" + heading("Default slots") + "\n" + aligned(rows);
}

bool hidesAnything(const std::vector<SimSlot>& slots)
{
    for (const SimSlot& slot : slots)
        for (const Column& column : COLUMNS)
            if (column.isIdentity && !(slot.*column.answer).value.is_null())
                return true;
    return false;
}

std::string simText(const Sims& sims, bool reveal)
{
    std::string text = backendLine() + "\n\n" + slotsText(sims.slots, reveal) +
                       reasonsText(sims.slots) + defaultsText(sims.defaults);
    if (!reveal && hidesAnything(sims.slots))
        text += "\n" + wrapped("What identifies the subscriber is masked; --reveal shows it.", 0);
    return text;
}

Json slotJson(const SimSlot& slot, bool reveal)
{
    Json json = {{"slot", slot.number}, {"modem", slot.modem}};
    Json reasons = Json::object();
    for (const Column& column : COLUMNS) {
        const ValueOrReason& answer = slot.*column.answer;
        json[column.key] = shown(column, slot, reveal);
        if (answer.value.is_null())
            reasons[column.key] = answer.reason;
    }
    json["reasons"] = reasons;
    return json;
}

std::string simJson(const Sims& sims, bool reveal)
{
    Json json = jsonAnswer();
    json["masked"] = !reveal;
    json["slots"] = Json::array();
    for (const SimSlot& slot : sims.slots)
        json["slots"].push_back(slotJson(slot, reveal));
    if (sims.slots.empty())
        json["reason"] = sims.reason;
    for (const auto& [use, slot] : sims.defaults)
        json["default_slots"][use] = slot.value;
    return jsonText(json);
}

ExitCode runSim(const Invocation& invocation, bool reveal)
{
    const Sims sims = askSims();
    const bool deviceFileBad = reportDeviceFileProblem();
    if (invocation.json)
        writeOut(simJson(sims, reveal));
    else if (!sims.slots.empty())
        writeOut(simText(sims, reveal));
    else if (!deviceFileBad)
        complain("no SIM slot is known: " + printable(sims.reason));
    if (deviceFileBad)
        return BAD_DEVICE_FILE;
    return sims.slots.empty() ? NOT_AVAILABLE : SUCCESS;
}

} // namespace

std::vector<Fact> askSlotFacts()
{
    std::vector<Fact> facts;
    for (const SimSlot& slot : askSims().slots)
        for (const Column& column : COLUMNS) {
            const ValueOrReason& answer = slot.*column.answer;
            if (slot.number == 0 && *column.fact != '\0')
                continue;
            facts.push_back({"slot[" + std::to_string(slot.number) + "]." + column.key,
                             answer.value, "", answer.reason, column.isIdentity});
        }
    return facts;
}

} // namespace cli

void cli::addSimCommand(const Command& app, Invocation& invocation)
{
    const Command sim = app.add("sim", "Show SIM cards");
    const auto reveal = std::make_shared<bool>(false);
    sim.flag("--reveal", *reveal, "Show MSIN, phone number and ICCID in full");
    sim.flag("--json", invocation.json, "Print JSON");
    sim.setFooter("Examples: coresystem sim\n"
                  "          coresystem sim --reveal --device phone\n"
                  "Exit code 3: no SIM slot is known; the reason is on standard error.");
    sim.onUse([&invocation, reveal] {
        invocation.command = [&invocation, reveal] { return runSim(invocation, *reveal); };
    });
}
