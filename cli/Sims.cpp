// SPDX-License-Identifier: Apache-2.0
#include "Sims.h"

#include <cstdlib>

#include "port/facts/Privacy.h"

namespace cli {
namespace {

using coresystem_port::Origins;
using coresystem_port::Question;

// A number that no status has: what stays when none was read.
constexpr auto NOT_READ = static_cast<TelSimCardStatus_t>(0x7f);

// A number and the word for it.
template <typename Number>
struct Word {
    Number number;
    const char* word;
};

constexpr Word<TelSimCardStatus_t> STATUSES[] = {
    {TAPI_SIM_STATUS_CARD_ERROR, "error"},
    {TAPI_SIM_STATUS_CARD_NOT_PRESENT, "absent"},
    {TAPI_SIM_STATUS_SIM_INITIALIZING, "initializing"},
    {TAPI_SIM_STATUS_SIM_INIT_COMPLETED, "ready"},
    {TAPI_SIM_STATUS_SIM_PIN_REQUIRED, "PIN required"},
    {TAPI_SIM_STATUS_SIM_PUK_REQUIRED, "PUK required"},
    {TAPI_SIM_STATUS_CARD_BLOCKED, "blocked"},
    {TAPI_SIM_STATUS_SIM_NCK_REQUIRED, "network locked"},
    {TAPI_SIM_STATUS_SIM_NSCK_REQUIRED, "network subset locked"},
    {TAPI_SIM_STATUS_SIM_SPCK_REQUIRED, "service provider locked"},
    {TAPI_SIM_STATUS_SIM_CCK_REQUIRED, "corporate locked"},
    {TAPI_SIM_STATUS_CARD_REMOVED, "removed"},
    {TAPI_SIM_STATUS_SIM_LOCK_REQUIRED, "device locked"},
    {TAPI_SIM_STATUS_CARD_CRASHED, "crashed"},
    {TAPI_SIM_STATUS_CARD_POWEROFF, "powered off"},
    {TAPI_SIM_STATUS_UNKNOWN, "unknown"},
};

constexpr Word<TelNetworkDefaultSubs_t> NETWORK_SLOTS[] = {
    {TAPI_NETWORK_DEFAULT_SUBS_UNKNOWN, "unknown"},
    {TAPI_NETWORK_DEFAULT_SUBS_SIM1, "slot 0"},
    {TAPI_NETWORK_DEFAULT_SUBS_SIM2, "slot 1"},
};

constexpr Word<TelNetworkDefaultDataSubs_t> DATA_SLOTS[] = {
    {TAPI_NETWORK_DEFAULT_DATA_SUBS_UNKNOWN, "unknown"},
    {TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM1, "slot 0"},
    {TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM2, "slot 1"},
};

constexpr Word<TelCallPreferredVoiceSubs_t> VOICE_SLOTS[] = {
    {TAPI_CALL_PREFERRED_VOICE_SUBS_UNKNOWN, "unknown"},
    {TAPI_CALL_PREFERRED_VOICE_SUBS_CURRENT_NETWORK, "current network"},
    {TAPI_CALL_PREFERRED_VOICE_SUBS_ASK_ALWAYS, "ask always"},
    {TAPI_CALL_PREFERRED_VOICE_SUBS_SIM1, "slot 0"},
    {TAPI_CALL_PREFERRED_VOICE_SUBS_SIM2, "slot 1"},
};

template <typename Number, std::size_t count>
std::string wordOf(const Word<Number> (&words)[count], Number number)
{
    for (const Word<Number>& row : words)
        if (row.number == number)
            return row.word;
    return std::to_string(static_cast<int>(number));
}

// The reason of a question that failed; it has none when the modem went away before it was asked.
ValueOrReason unanswered(const Origins& origins, Question question)
{
    const std::string reason = origins.of(question).reason;
    return {nullptr, reason.empty() ? "the platform gave no answer" : reason};
}

ValueOrReason askStatus(int slot)
{
    const Origins origins;
    TelSimCardStatus_t status = NOT_READ;
    library().IsAvaliableState(slot, &status);
    return status == NOT_READ ? unanswered(origins, Question::SimCard)
                              : ValueOrReason{wordOf(STATUSES, status), ""};
}

struct Identity {
    ValueOrReason mcc;
    ValueOrReason mnc;
    ValueOrReason msin;
    ValueOrReason country;
};

Identity askIdentity(const char* modem)
{
    const Origins origins;
    std::string mcc;
    std::string mnc;
    std::string msin;
    if (library().GetSimInfo(modem, &mcc, &mnc, &msin))
        return {{mcc, ""}, {mnc, ""}, {msin, ""}, askCountryOf(mcc)};
    const ValueOrReason none = unanswered(origins, Question::SimIdentity);
    return {none, none, none, none};
}

// The platform fails, or succeeds with nothing, when the card holds no number.
ValueOrReason askPhoneNumber(telephony_h& handle)
{
    const Origins origins;
    char* number = nullptr;
    const bool wasRead = library().GetPhoneNumber(&handle, &number);
    ValueOrReason answer = unanswered(origins, Question::PhoneNumber);
    if (wasRead && number != nullptr)
        answer = {number, ""};
    else if (origins.of(Question::PhoneNumber).available)
        answer = {nullptr, "the SIM card holds no number"};
    std::free(number);
    return answer;
}

ValueOrReason askSms(char* modem)
{
    const Origins origins;
    int ready = 0;
    return library().CheckSmsEnabled(modem, &ready) ? ValueOrReason{ready != 0, ""}
                                                    : unanswered(origins, Question::SmsReadiness);
}

// The port's own facts, and their places in a slot.
struct ModemFact {
    Question question;
    ValueOrReason SimSlot::*answer;
};
constexpr ModemFact MODEM_FACTS[] = {
    {Question::OperatorName, &SimSlot::operatorName},
    {Question::OperatorMcc, &SimSlot::operatorMcc},
    {Question::OperatorMnc, &SimSlot::operatorMnc},
    {Question::AccessTechnology, &SimSlot::accessTechnology},
    {Question::SignalStrength, &SimSlot::signal},
    {Question::PowerState, &SimSlot::power},
    {Question::PinTries, &SimSlot::pinTries},
    {Question::Iccid, &SimSlot::iccid},
};

void askModem(SimSlot& slot)
{
    std::vector<Question> questions;
    for (const ModemFact& fact : MODEM_FACTS)
        questions.push_back(fact.question);
    const auto answers = coresystem_port::askModem(slot.modem, questions);
    for (std::size_t i = 0; i < answers.size(); ++i)
        slot.*MODEM_FACTS[i].answer = answerOf(answers[i]);
}

SimSlot askSlot(int number, char* modem, telephony_h& handle)
{
    const ValueOrReason status = askStatus(number);
    const Identity identity = askIdentity(modem);
    SimSlot slot = {number,
                    modem,
                    status,
                    identity.mcc,
                    identity.mnc,
                    identity.msin,
                    identity.country,
                    askPhoneNumber(handle),
                    askRoaming(number),
                    askSms(modem)};
    askModem(slot);
    return slot;
}

template <typename Number, std::size_t count>
ValueOrReason askSubscription(char* modem, bool (CoreSystem::*ask)(char*, Number*),
                              const Word<Number> (&words)[count])
{
    const Origins origins;
    auto slot = words[0].number;
    return (library().*ask)(modem, &slot) ? ValueOrReason{wordOf(words, slot), ""}
                                          : unanswered(origins, Question::Subscriptions);
}

std::vector<DefaultSlot> askDefaults(char* modem)
{
    return {
        {"network", askSubscription(modem, &CoreSystem::GetMainSimSubscription, NETWORK_SLOTS)},
        {"data", askSubscription(modem, &CoreSystem::GetDefaultDataSubscription, DATA_SLOTS)},
        {"calls", askSubscription(modem, &CoreSystem::GetCallPreferredSubscription, VOICE_SLOTS)},
    };
}

// Why there are no slots.
std::string whyNoSlots(const Origins& origins)
{
    const coresystem_port::Origin slots = origins.of(Question::SimSlots);
    return slots.available ? "the telephony service knows no modem" : slots.reason;
}

} // namespace
} // namespace cli

cli::Sims cli::askSims()
{
    const Origins origins;
    Sims sims;
    telephony_handle_list_s list = {0, nullptr};
    char** const modems = library().InitHandleList(&list) ? library().GetCpNameList() : nullptr;
    // Both are lists of the slots; the second one ends where a modem went away meanwhile.
    for (unsigned int i = 0; modems != nullptr && i < list.count && modems[i] != nullptr; ++i)
        sims.slots.push_back(askSlot(static_cast<int>(i), modems[i], list.handle[i]));
    if (sims.slots.empty())
        sims.reason = whyNoSlots(origins);
    else
        sims.defaults = askDefaults(sims.slots.front().modem.data());
    library().DeinitHandleList(&list);
    return sims;
}

cli::ValueOrReason cli::answerOf(const coresystem_port::Answer& told)
{
    using Kind = coresystem_port::Answer::Kind;
    if (told.word.empty())
        return {nullptr, told.origin.reason};
    switch (told.kind) {
    case Kind::Number:
        return {std::stoll(told.word), ""};
    case Kind::Switch:
        return {told.word == "true", ""};
    default:
        return {told.word, ""};
    }
}

std::string cli::whyNoSlotAnswers(const Origins& origins, Question question)
{
    const coresystem_port::Origin asked = origins.of(question);
    if (!origins.of(Question::SimSlots).available)
        return whyNoSlots(origins);
    if (asked.available || !asked.reason.empty())
        return asked.available ? "the SIM card holds none" : asked.reason;
    // No card was good enough to be asked; the states say why.
    char** const modems = library().GetCpNameList();
    std::string states;
    for (int slot = 0; modems != nullptr && modems[slot] != nullptr; ++slot) {
        const ValueOrReason status = askStatus(slot);
        states += (states.empty() ? "slot " : "; slot ") + std::to_string(slot) + ": " +
                  (status.value.is_null() ? status.reason : status.value.get<std::string>());
    }
    return states.empty() ? whyNoSlots(origins) : "no usable SIM card: " + states;
}

cli::ValueOrReason cli::askCountryOf(const std::string& mcc)
{
    const Silence silence; // of the MCCs that the table lacks
    char* name = nullptr;
    library().GetCountryNameFromMcc(mcc.c_str(), &name);
    const ValueOrReason answer =
        name != nullptr ? ValueOrReason{name, ""}
                        : ValueOrReason{nullptr, "the country table has no MCC " + mcc};
    std::free(name);
    return answer;
}

std::string cli::whyNoImei(const Origins& origins)
{
    const std::string reason = origins.of(Question::Imei).reason;
    return reason.empty() ? whyNoSlots(origins) : reason;
}

cli::ValueOrReason cli::askRoaming(int slot)
{
    const Origins origins;
    bool roaming = false;
    if (library().GetRoamingStatus(slot, &roaming))
        return {roaming, ""};
    if (!origins.of(Question::SimSlots).available)
        return {nullptr, whyNoSlots(origins)};
    const coresystem_port::Origin service = origins.of(Question::NetworkService);
    if (service.available)
        return origins.of(Question::Roaming).reason.empty()
                   ? ValueOrReason{nullptr, "the slot is not in service"}
                   : unanswered(origins, Question::Roaming);
    return service.reason.empty() ? ValueOrReason{nullptr, whyNoSlots(origins)}
                                  : unanswered(origins, Question::NetworkService);
}

cli::Json cli::masked(const Json& value)
{
    return value.is_string() ? Json(port::masked(value.get<std::string>())) : value;
}
