// SPDX-License-Identifier: Apache-2.0
#include "Facts.h"

#include <algorithm>
#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstdlib>
#include <exception>
#include <memory>
#include <mutex>
#include <optional>
#include <thread>
#include <utility>

#include <coresystem_port.h>
#include <gio/gio.h>

#include "Commands.h"
#include "CountryData.h"
#include "Serial.h"
#include "Sims.h"
#include "Text.h"
#include "devicefile/Closest.h"
#include "port/facts/Facts.h"

namespace {

using cli::Fact;
using cli::Json;
using cli::library;
using coresystem_port::Origins;
using coresystem_port::Question;

// Asks the library; the origins are those of what it asks.
using Ask = Fact (*)(const Origins&);

// A text that the library handed out, which is released; nothing for null.
std::optional<std::string> taken(char* slot)
{
    const auto text = slot != nullptr ? std::optional<std::string>(slot) : std::nullopt;
    std::free(slot);
    return text;
}

Fact answer(const Origins& origins, Question question, Json value)
{
    return {"", std::move(value), origins.of(question).source, ""};
}

// Lists the parts between the semicolons of several texts, each once.
std::string joined(const std::vector<std::string>& texts)
{
    const std::string separator = "; ";
    std::vector<std::string> parts;
    for (const std::string& text : texts)
        for (std::size_t begin = 0, end = 0; end < text.size(); begin = end + separator.size()) {
            end = std::min(text.find(separator, begin), text.size());
            const std::string part = text.substr(begin, end - begin);
            if (std::find(parts.begin(), parts.end(), part) == parts.end())
                parts.push_back(part);
        }
    std::string all;
    for (const std::string& part : parts)
        all += (all.empty() ? "" : separator) + part;
    return all;
}

Fact noAnswer(const std::string& reason)
{
    return {"", nullptr, "", reason};
}

// The value that applications get in place of an answer.
std::string butTold(const std::string& reason, const std::string& told)
{
    return reason + "; applications are told " + told;
}

std::string reasonOf(const Origins& origins, Question question, int code)
{
    const std::string reason = origins.of(question).reason;
    return reason.empty() ? "the platform answered with error " + std::to_string(code) : reason;
}

// Says why a question succeeded and handed out null.
std::string reasonOfNull(const Origins& origins, Question question)
{
    const std::string reason = origins.of(question).reason;
    return reason.empty() ? "out of memory" : reason;
}

// A question that fails with a code of the platform.
template <Question question, int (CoreSystem::*read)(char**)>
Fact text(const Origins& origins)
{
    char* slot = nullptr;
    const int code = (library().*read)(&slot);
    const auto value = taken(slot);
    // After a failed read the slot holds nothing that the device said.
    if (code != 0)
        return noAnswer(reasonOf(origins, question, code));
    return value ? answer(origins, question, *value) : noAnswer(reasonOfNull(origins, question));
}

std::optional<std::string> readLanguage(bool asIso639, int& code)
{
    char* slot = nullptr;
    code = library().GetDeviceLanguageCode(&slot, asIso639);
    return taken(slot);
}

Fact noIso639Code(const std::string& language)
{
    return noAnswer("the language table has no ISO 639-2 code for \"" + language + "\"");
}

// The answer beside what is true of the language today.
Fact withErrata(Fact fact, const std::string& language)
{
    const auto errata = cli::errataOf(language);
    if (!errata.empty()) {
        fact.today = cli::jsonOf(errata);
        fact.reason = fact.reason.empty() ? cli::sentenceOf(errata.front())
                                          : fact.reason + " (" + cli::wordOf(errata.front()) + ")";
    }
    return fact;
}

// English when the platform does not say, which is not the device's language.
template <bool asIso639>
Fact language(const Origins& origins)
{
    int code = 0;
    const auto value = readLanguage(asIso639, code);
    if (code != 0 || !origins.of(Question::Language).available)
        return noAnswer(
            butTold(reasonOf(origins, Question::Language, code), value.value_or("nothing")));
    if (!asIso639)
        return value ? answer(origins, Question::Language, *value) : noAnswer("out of memory");
    const std::string own = readLanguage(false, code).value_or("");
    return withErrata(value ? answer(origins, Question::Language, *value) : noIso639Code(own), own);
}

Fact askSimAvailable(const Origins& origins)
{
    const bool isAvailable = library().IsSimAvailable();
    const auto slots = origins.of(Question::SimSlots);
    const auto card = origins.of(Question::SimCard);
    for (const auto& origin :
         {slots, card}) // a card that cannot be asked may be there all the same
        if (!isAvailable && !origin.reason.empty())
            return noAnswer(butTold(origin.reason, "no"));
    return {"", isAvailable, card.available ? card.source : slots.source, ""};
}

// The first slot's that has one.
template <Question question, int (CoreSystem::*read)(char**)>
Fact ofSim(const Origins& origins)
{
    char* slot = nullptr;
    const int code = (library().*read)(&slot);
    const auto value = taken(slot); // success without telephony leaves it empty
    return code == 0 && value ? answer(origins, question, *value)
                              : noAnswer(cli::whyNoSlotAnswers(origins, question));
}

// The country that issued the SIM, not the one where it is.
Fact askSimCountry(const Origins& origins)
{
    const Fact mcc = ofSim<Question::SimIdentity, &CoreSystem::GetMCCFromSim>(origins);
    if (mcc.value.is_null())
        return mcc;
    const cli::ValueOrReason country = cli::askCountryOf(mcc.value.get<std::string>());
    return {"", country.value, country.value.is_null() ? "" : mcc.source, country.reason};
}

// Never fails: without a modem that tells one, it is made of the time zone.
Fact askImei(const Origins& origins)
{
    char* slot = nullptr;
    library().GetIMEI(&slot);
    const std::string imei = taken(slot).value_or("");
    if (origins.of(Question::Imei).available)
        return answer(origins, Question::Imei, imei);
    return noAnswer(butTold(cli::whyNoImei(origins), imei));
}

Fact askRoamingOfFirstSlot(const Origins& origins)
{
    const cli::ValueOrReason roaming = cli::askRoaming(0);
    return roaming.value.is_null() ? noAnswer(roaming.reason)
                                   : answer(origins, Question::Roaming, roaming.value);
}

// A switch that cannot be read is told to applications as off.
Fact yesOrNo(const Origins& origins, Question question, bool isOn)
{
    const auto origin = origins.of(question);
    if (!isOn && !origin.available)
        return noAnswer(butTold(joined({origin.reason}), "no"));
    return {"", isOn, origin.available ? joined({origin.source}) : "", ""};
}

template <Question question, bool (CoreSystem::*read)()>
Fact switchState(const Origins& origins)
{
    return yesOrNo(origins, question, (library().*read)());
}

Fact askStorage(const Origins& origins)
{
    return yesOrNo(origins, Question::Storage, library().IsSystemMemoryAvailable(0));
}

// The state of a link or of a modem's network, which only the port knows; where there is none, the
// reason stands for a source.
template <Question question>
Fact alone(const Origins& /*ofTheLibrary*/)
{
    const auto told = coresystem_port::ask(question);
    const auto& origin = told.origin;
    const cli::ValueOrReason value = cli::answerOf(told);
    if (value.value.is_null())
        return noAnswer(origin.reason);
    return {"", value.value, origin.available ? origin.source : origin.reason, ""};
}

// Treats a link that is not there as not connected; one that cannot be asked may be.
template <bool overWifi, bool overBluetooth>
Fact connected(const Origins& origins)
{
    std::vector<Question> counted = {Question::Cellular};
    if (overWifi)
        counted.push_back(Question::Wifi);
    if (overBluetooth)
        counted.push_back(Question::Bluetooth);
    const bool isOn = library().IsNetworkConnected(overWifi, overBluetooth);
    std::vector<std::string> sources;
    std::vector<std::string> missing;
    std::vector<std::string> unknown;
    for (const Question question : counted) {
        const auto origin = origins.of(question);
        if (origin.available)
            sources.push_back(origin.source);
        else
            (isOn || origin.isMissing ? missing : unknown).push_back(origin.reason);
    }
    if (!unknown.empty())
        return noAnswer(butTold(joined(unknown), "no"));
    return Fact{"", isOn, joined(sources.empty() ? missing : sources), ""};
}

// As a person means it: also by cable, and by what only the network's manager knows.
Fact askConnectedAny(const Origins& origins)
{
    const Fact told = connected<true, true>(origins);
    if (told.value == true)
        return told;
    const auto ethernet = coresystem_port::ask(Question::Ethernet);
    const auto connectivity = coresystem_port::ask(Question::Connectivity);
    if (ethernet.word == "connected")
        return {"", true, ethernet.origin.source, ""};
    if (!connectivity.word.empty() && connectivity.word != "none")
        return {"", true, connectivity.origin.source, ""};
    // A connection over Bluetooth is made by who tells of the connectivity.
    if (told.value.is_null() && connectivity.word == "none" &&
        connected<true, false>(origins).value == false)
        return {"", false, connectivity.origin.source, ""};
    return ethernet.word.empty() ? noAnswer(joined({ethernet.origin.reason, told.reason})) : told;
}

Fact askSalesCode(const Origins& origins)
{
    const auto code = taken(library().GetCSC());
    return code ? answer(origins, Question::SalesCode, *code)
                : noAnswer(origins.of(Question::SalesCode).reason);
}

const std::string DAEMON = "device daemon (org.tizen.system.deviced)";

// The library asks over the bus library's shared connection, which would end this process with the
// bus.
void outliveTheBus()
{
    GDBusConnection* const bus = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
    if (bus == nullptr)
        return;
    g_dbus_connection_set_exit_on_close(bus, FALSE);
    g_object_unref(bus);
}

// The daemon has a backend of its own.
Fact askSerial(const Origins&)
{
    outliveTheBus();
    const char* slot = nullptr;
    const int code = library().GetDeviceUniqueID(&slot);
    const auto serial = taken(const_cast<char*>(slot)); // the caller's, though it is read-only
    return serial ? Fact{"", *serial, DAEMON, ""} : noAnswer(cli::whyNoSerial(code));
}

// The facts by the names that the command has for them, with the place in a device file of those in facts.def.
struct FactRow {
    std::string_view name;
    std::string_view section;
    std::string_view key;
    Ask ask;
};
constexpr FactRow ROWS[] = {
    {"device_name", "settings", "device_name",
     text<Question::DeviceName, &CoreSystem::GetDeviceName>},
    {"tizen_id", "device", "platform_id", text<Question::PlatformId, &CoreSystem::GetTizenIdN>},
    {"platform_name", "device", "platform_name",
     text<Question::PlatformName, &CoreSystem::GetPlatformName>},
    {"sw_version", "device", "platform_version",
     text<Question::PlatformVersion, &CoreSystem::GetSWVersion>},
    {"model_name", "device", "model_name", text<Question::ModelName, &CoreSystem::GetModelName>},
    {"language_code", "settings", "language", language<false>},
    {"language_code_iso639_2", "", "", language<true>},
    {"sim_available", "", "", askSimAvailable},
    {"sim_mcc", "slot", "mcc", ofSim<Question::SimIdentity, &CoreSystem::GetMCCFromSim>},
    {"sim_mnc", "slot", "mnc", ofSim<Question::SimIdentity, &CoreSystem::GetMNCFromSim>},
    {"sim_country", "", "", askSimCountry},
    {"phone_number", "slot", "number",
     ofSim<Question::PhoneNumber, &CoreSystem::GetPhoneNumberFromSim>},
    {"imei", "slot", "imei", askImei},
    {"roaming", "slot", "roaming", askRoamingOfFirstSlot},
    {"flight_mode", "settings", "flight_mode",
     switchState<Question::FlightMode, &CoreSystem::IsFlightMode>},
    {"data_roaming", "settings", "data_roaming",
     switchState<Question::DataRoaming, &CoreSystem::IsDataRoamingEnabled>},
    {"mobile_data", "settings", "mobile_data",
     switchState<Question::MobileData, &CoreSystem::IsMobileData>},
    {"cellular", "", "", alone<Question::Cellular>},
    {"operator", "", "", alone<Question::OperatorName>},
    {"operator_mcc", "", "", alone<Question::OperatorMcc>},
    {"operator_mnc", "", "", alone<Question::OperatorMnc>},
    {"access_technology", "", "", alone<Question::AccessTechnology>},
    {"signal", "", "", alone<Question::SignalStrength>},
    {"wifi", "", "", alone<Question::Wifi>},
    {"ssid", "", "", alone<Question::Ssid>},
    {"bluetooth", "", "", alone<Question::Bluetooth>},
    {"ethernet", "", "", alone<Question::Ethernet>},
    {"connectivity", "", "", alone<Question::Connectivity>},
    {"connected_cellular", "", "", connected<false, false>},
    {"connected_cellular_or_wifi", "", "", connected<true, false>},
    {"connected_cellular_or_bluetooth", "", "", connected<false, true>},
    {"connected_any", "", "", askConnectedAny},
    {"sales_code", "settings", "sales_code", askSalesCode},
    {"storage_available", "", "", askStorage},
    {"device_serial", "device", "serial", askSerial},
};

// No public question of the library's is about these alone.
constexpr const char* NOT_SHOWN[] = {"font_size", "packet_data"};

constexpr bool isShownOrNotMeantToBe(const port::FactRow& fact)
{
    for (const FactRow& row : ROWS)
        if (row.section == fact.section && row.key == fact.key)
            return true;
    for (const std::string_view key : NOT_SHOWN)
        if (key == fact.key)
            return true;
    return false;
}
#define FACT(number, question, ...)                                                \
    static_assert(isShownOrNotMeantToBe(port::PlainFact<Question::question>::row), \
                  "the command shows every plain fact, or says that it does not");
#include "port/facts/facts.def"

const FactRow& rowOf(const std::string& name)
{
    const std::string meant = cli::factNameOf(name);
    return *std::find_if(std::begin(ROWS), std::end(ROWS),
                         [&](const FactRow& each) { return each.name == meant; });
}

bool isIdentity(const std::string& name)
{
    const FactRow& row = rowOf(name);
    return port::isPrivate(row.section, row.key);
}

bool isDaemons(const std::string& name)
{
    return name == "device_serial";
}

constexpr std::chrono::seconds PATIENCE(4);
std::atomic<int> askingThreads{0};

// An answer that a thread of its own asks for, and that can be waited for with a limit.
class Answers {
public:
    explicit Answers(const std::vector<std::string>& names)
    {
        for (const std::string& name : names)
            facts_.push_back({name, nullptr, "", "", false});
        states_.resize(names.size(), State::Waiting);
    }

    bool areThere(bool ofDaemon)
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        return std::any_of(facts_.begin(), facts_.end(),
                           [&](const Fact& fact) { return isDaemons(fact.name) == ofDaemon; });
    }

    // The next one that nobody has asked for yet; past the last when there is none.
    std::size_t take(bool ofDaemon)
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        std::size_t next = 0;
        while (next < facts_.size() &&
               (states_[next] != State::Waiting || isDaemons(facts_[next].name) != ofDaemon))
            ++next;
        if (next < facts_.size())
            states_[next] = State::Asked;
        return next;
    }
    std::string name(std::size_t index)
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        return facts_.at(index).name;
    }
    bool isIn(std::size_t index) const
    {
        return index < states_.size();
    }
    void give(std::size_t index, Fact fact)
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        fact.name = facts_.at(index).name;
        facts_.at(index) = std::move(fact);
        states_.at(index) = State::Answered;
        changed_.notify_all();
    }
    void fail(std::exception_ptr failure)
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        failure_ = std::move(failure);
        changed_.notify_all();
    }

    std::vector<Fact> await()
    {
        std::unique_lock<std::mutex> lock(mutex_);
        changed_.wait_for(lock, PATIENCE, [this] {
            return failure_ || std::count(states_.begin(), states_.end(), State::Answered) ==
                                   static_cast<std::ptrdiff_t>(states_.size());
        });
        if (failure_)
            std::rethrow_exception(failure_);
        std::vector<Fact> facts = facts_;
        for (std::size_t i = 0; i < facts.size(); ++i)
            if (states_[i] != State::Answered)
                facts[i].reason = whyNoAnswer(facts[i], states_[i]);
        return facts;
    }

private:
    enum class State { Waiting, Asked, Answered };

    static std::string whyNoAnswer(const Fact& fact, State state)
    {
        std::string reason = "not asked: what comes before it is not answered";
        if (isDaemons(fact.name))
            reason = DAEMON + " does not answer";
        else if (state == State::Asked)
            reason = "what tells " + fact.name + " does not answer";
        return reason.append(" within ").append(std::to_string(PATIENCE.count())) + " seconds";
    }

    std::mutex mutex_;
    std::condition_variable changed_;
    std::vector<Fact> facts_;
    std::vector<State> states_;
    std::exception_ptr failure_;
};

Fact ask(const FactRow& row)
{
    const Origins origins;
    return row.ask(origins);
}

void askOneByOne(Answers& answers, bool ofDaemon)
{
    ++askingThreads;
    try {
        for (std::size_t i = answers.take(ofDaemon); answers.isIn(i); i = answers.take(ofDaemon))
            answers.give(i, ask(rowOf(answers.name(i))));
    } catch (...) {
        answers.fail(std::current_exception());
    }
    --askingThreads;
}

} // namespace

std::vector<std::string> cli::factNames()
{
    std::vector<std::string> names;
    for (const FactRow& row : ROWS)
        names.emplace_back(row.name);
    return names;
}

void cli::checkFactName(const std::string& name, const std::vector<std::string>& names)
{
    if (std::find(names.begin(), names.end(), factNameOf(name)) != names.end())
        return;
    const std::string meant = port::devicefile::similar(name, names);
    throw UsageError("there is no fact " + quoted(name) +
                     (meant.empty() ? "" : "; did you mean " + quoted(meant) + "?") +
                     "\n\"coresystem get --list\" names them.");
}

std::vector<std::string> cli::watchableFactNames()
{
    std::vector<std::string> names = factNames();
    names.erase(std::remove_if(names.begin(), names.end(), isDaemons), names.end());
    return names;
}

cli::Fact cli::askFact(const std::string& name)
{
    Fact fact = ask(rowOf(name));
    fact.name = name;
    fact.isIdentity = isIdentity(name);
    return fact;
}

const std::vector<std::pair<std::string, std::string>>& cli::factAliases()
{
    static const std::vector<std::pair<std::string, std::string>> all = {
        {"connected_wifi", "connected_cellular_or_wifi"},
        {"connected_bluetooth", "connected_cellular_or_bluetooth"},
    };
    return all;
}

std::string cli::factNameOf(const std::string& name)
{
    const auto& aliases = factAliases();
    const auto alias = std::find_if(aliases.begin(), aliases.end(),
                                    [&](const auto& each) { return each.first == name; });
    return alias != aliases.end() ? alias->second : name;
}

std::vector<cli::Fact> cli::askFacts(const std::vector<std::string>& names)
{
    const auto answers = std::make_shared<Answers>(names);
    // The daemon's answer may take longest, so that the others need not wait for it.
    for (const bool ofDaemon : {false, true})
        if (answers->areThere(ofDaemon))
            std::thread([=] { askOneByOne(*answers, ofDaemon); }).detach();
    std::vector<Fact> facts = answers->await();
    for (Fact& fact : facts)
        fact.isIdentity = isIdentity(fact.name);
    return facts;
}

bool cli::isStillAsking()
{
    return askingThreads != 0;
}

std::string cli::textOf(const Json& value)
{
    if (value.is_boolean())
        return value.get<bool>() ? "yes" : "no";
    return value.is_string() ? value.get<std::string>() : value.dump();
}
