// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cstring>
#include <memory>

#include <ITapiCall.h>
#include <ITapiNetText.h>
#include <ITapiNetwork.h>
#include <ITapiSim.h>
#include <tapi_common.h>

#include "Telephony.h"

namespace {

using port::Call;
using port::CardStatus;
using port::Codes;
using port::Question;
using port::Subscriptions;
using port::Telephony;

using ModemHandles = port::Handles<TapiHandle*, port::SlotName>;

constexpr Codes CODES{TAPI_API_OPERATION_FAILED,  TAPI_API_NOT_SUPPORTED,
                      TAPI_API_ACCESS_DENIED,     TAPI_API_SIM_NOT_INITIALIZED,
                      TAPI_API_SYSTEM_OUT_OF_MEM, TAPI_API_INVALID_PTR};

port::Result<port::Sourced<std::vector<port::SlotName>>> askSlots()
{
    auto slots = port::slotsOfBackend();
    port::recordOrigin(Question::SimSlots, slots);
    return slots;
}

// All lists of names together may take that much: hundreds of sets of modems.
constexpr std::size_t MOST_NAME_BYTES = 1024 * 1024;

// The names as the platform hands them out. An application never releases a list, so every one that
// was handed out stays: one for each set of modems that the machine had.
class NameList {
public:
    explicit NameList(std::vector<port::SlotName> names) : names_(std::move(names))
    {
        for (port::SlotName& name : names_)
            pointers_.push_back(name.data());
        pointers_.resize(port::SLOT_LIMIT + 1, nullptr);
    }

    char** pointers()
    {
        return pointers_.data();
    }

    std::size_t bytes() const
    {
        std::size_t all = pointers_.size() * sizeof pointers_.front();
        for (const port::SlotName& name : names_)
            all += 2 * name.size(); // beside the text, the one it is found by
        return all;
    }

private:
    std::vector<port::SlotName> names_;
    // As long as any list, and ended: applications look at the place of a slot that they counted
    // before, whose modem may be gone.
    std::vector<char*> pointers_;
};

// Null when there were too many.
char** keep(const std::vector<port::SlotName>& names)
{
    static std::mutex mutex;
    static auto& kept = *new std::map<std::vector<port::SlotName>, std::unique_ptr<NameList>>;
    static std::size_t bytes = 0;
    const std::lock_guard<std::mutex> lock(mutex);
    const auto known = kept.find(names);
    if (known != kept.end())
        return known->second->pointers();
    auto list = std::make_unique<NameList>(names);
    if (bytes + list->bytes() > MOST_NAME_BYTES)
        return nullptr;
    bytes += list->bytes();
    return kept.emplace(names, std::move(list)).first->second->pointers();
}

// The name itself, or the first when none is asked for; null when there is no such modem.
const port::SlotName* findModem(const std::vector<port::SlotName>& names, const char* name)
{
    const auto found =
        name != nullptr ? std::find(names.begin(), names.end(), name) : names.begin();
    return found != names.end() ? &*found : nullptr;
}

TelSimCardStatus_t cardStatus(CardStatus status)
{
    switch (status) {
    case CardStatus::Absent:
        return TAPI_SIM_STATUS_CARD_NOT_PRESENT;
    case CardStatus::Removed:
        return TAPI_SIM_STATUS_CARD_REMOVED;
    case CardStatus::Error:
        return TAPI_SIM_STATUS_CARD_ERROR;
    case CardStatus::Initializing:
        return TAPI_SIM_STATUS_SIM_INITIALIZING;
    case CardStatus::Ready:
        return TAPI_SIM_STATUS_SIM_INIT_COMPLETED;
    case CardStatus::PinRequired:
        return TAPI_SIM_STATUS_SIM_PIN_REQUIRED;
    case CardStatus::PukRequired:
        return TAPI_SIM_STATUS_SIM_PUK_REQUIRED;
    case CardStatus::Blocked:
        return TAPI_SIM_STATUS_CARD_BLOCKED;
    case CardStatus::NetworkLocked:
        return TAPI_SIM_STATUS_SIM_NCK_REQUIRED;
    case CardStatus::SubsetLocked:
        return TAPI_SIM_STATUS_SIM_NSCK_REQUIRED;
    case CardStatus::ProviderLocked:
        return TAPI_SIM_STATUS_SIM_SPCK_REQUIRED;
    case CardStatus::CorporateLocked:
        return TAPI_SIM_STATUS_SIM_CCK_REQUIRED;
    case CardStatus::DeviceLocked:
        return TAPI_SIM_STATUS_SIM_LOCK_REQUIRED;
    case CardStatus::Crashed:
        return TAPI_SIM_STATUS_CARD_CRASHED;
    case CardStatus::PoweredOff:
        return TAPI_SIM_STATUS_CARD_POWEROFF;
    case CardStatus::Unknown:
        break;
    }
    return TAPI_SIM_STATUS_UNKNOWN;
}

// Why a card cannot be read.
int unreadable(CardStatus status)
{
    if (status == CardStatus::Blocked)
        return TAPI_API_SIM_PERM_BLOCKED;
    switch (port::simState(status)) {
    case TELEPHONY_SIM_STATE_LOCKED:
        return TAPI_API_SIM_LOCKED;
    case TELEPHONY_SIM_STATE_UNAVAILABLE:
        return TAPI_API_SIM_NOT_FOUND;
    default:
        return TAPI_API_SIM_NOT_INITIALIZED;
    }
}

// Whole or not at all: a part of an identity is another identity.
template <std::size_t Size>
bool copyWhole(const std::string& digits, char (&field)[Size])
{
    if (digits.size() >= Size)
        return false;
    std::memcpy(field, digits.c_str(), digits.size() + 1);
    return true;
}

int handOutImsi(const port::Imsi& imsi, TelSimImsiInfo_t& slot)
{
    TelSimImsiInfo_t parts = {};
    if (!copyWhole(imsi.mcc, parts.szMcc) || !copyWhole(imsi.mnc, parts.szMnc) ||
        !copyWhole(imsi.msin, parts.szMsin))
        return TAPI_API_OPERATION_FAILED;
    slot = parts;
    return TAPI_API_SUCCESS;
}

// The interface knows two slots by name.
template <typename Subs>
Subs slotName(const std::optional<int>& slot, Subs first, Subs second, Subs unknown)
{
    if (slot == 0)
        return first;
    return slot == 1 ? second : unknown;
}

TelNetworkDefaultSubs_t networkSubscription(const Subscriptions& all)
{
    return slotName(all.network, TAPI_NETWORK_DEFAULT_SUBS_SIM1, TAPI_NETWORK_DEFAULT_SUBS_SIM2,
                    TAPI_NETWORK_DEFAULT_SUBS_UNKNOWN);
}

TelNetworkDefaultDataSubs_t dataSubscription(const Subscriptions& all)
{
    return slotName(all.data, TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM1,
                    TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM2, TAPI_NETWORK_DEFAULT_DATA_SUBS_UNKNOWN);
}

TelCallPreferredVoiceSubs_t voiceSubscription(const Subscriptions& all)
{
    switch (all.voice) {
    case Subscriptions::Voice::CurrentNetwork:
        return TAPI_CALL_PREFERRED_VOICE_SUBS_CURRENT_NETWORK;
    case Subscriptions::Voice::AskAlways:
        return TAPI_CALL_PREFERRED_VOICE_SUBS_ASK_ALWAYS;
    case Subscriptions::Voice::Slot1:
        return TAPI_CALL_PREFERRED_VOICE_SUBS_SIM1;
    case Subscriptions::Voice::Slot2:
        return TAPI_CALL_PREFERRED_VOICE_SUBS_SIM2;
    case Subscriptions::Voice::Unknown:
        break;
    }
    return TAPI_CALL_PREFERRED_VOICE_SUBS_UNKNOWN;
}

template <typename Subs>
int askSubscription(const char* name, TapiHandle* handle, Subs (*choose)(const Subscriptions&),
                    Subs* subs)
{
    const Call call(name, CODES, {Question::Subscriptions});
    return call.run([&]() -> int {
        if (!ModemHandles::find(handle) || subs == nullptr)
            return TAPI_API_INVALID_PTR;
        return call.pass(Question::Subscriptions, port::backend().telephony().subscriptions(),
                         [&](const Subscriptions& all) {
                             *subs = choose(all);
                             return TAPI_API_SUCCESS;
                         });
    });
}

// Questions about a modem by its name.
constexpr std::initializer_list<Question> MODEM_QUESTIONS = {
    Question::SimCard, Question::SimIdentity, Question::SmsReadiness, Question::Subscriptions};
constexpr std::initializer_list<Question> LIST_QUESTIONS = {
    Question::SimSlots, Question::SimCard, Question::SimIdentity, Question::SmsReadiness,
    Question::Subscriptions};

// The reason why a handle's card cannot be read, by asking for its status.
int askWhyUnreadable(const Call& call, TapiHandle* handle)
{
    int code = TAPI_API_SIM_NOT_INITIALIZED;
    const int failure = port::askSlot(call, handle, Question::SimCard, &Telephony::card, &code,
                                      [](const port::Card& card, int& slot) {
                                          slot = unreadable(card.status);
                                          return TAPI_API_SUCCESS;
                                      });
    return failure == TAPI_API_SUCCESS ? code : failure;
}

} // namespace

char** tel_get_cp_name_list(void)
{
    return Call(__func__, CODES, LIST_QUESTIONS).pointer([]() -> char** {
        const auto slots = askSlots();
        return slots ? keep(slots.value().value) : nullptr;
    });
}

TapiHandle* tel_init(const char* cp_name)
{
    return Call(__func__, CODES, MODEM_QUESTIONS).pointer([&]() -> TapiHandle* {
        const auto slots = askSlots();
        const port::SlotName* const name =
            slots ? findModem(slots.value().value, cp_name) : nullptr;
        return name != nullptr ? ModemHandles::open(*name) : nullptr;
    });
}

int tel_deinit(TapiHandle* handle)
{
    return Call(__func__, CODES).release([&]() -> int {
        return ModemHandles::close(handle) ? TAPI_API_SUCCESS : TAPI_API_INVALID_PTR;
    });
}

int tel_get_sim_imsi(TapiHandle* handle, TelSimImsiInfo_t* imsi)
{
    const Call call(__func__, CODES, {Question::SimIdentity});
    return call.run([&]() -> int {
        const int result =
            port::askSlot(call, handle, Question::SimIdentity, &Telephony::imsi, imsi, handOutImsi);
        return result == CODES.noSim ? askWhyUnreadable(call, handle) : result;
    });
}

int tel_get_sim_init_info(TapiHandle* handle, TelSimCardStatus_t* status, int* card_changed)
{
    const Call call(__func__, CODES, {Question::SimCard});
    return call.run([&]() -> int {
        if (card_changed == nullptr)
            return TAPI_API_INVALID_PTR;
        return port::askSlot(call, handle, Question::SimCard, &Telephony::card, status,
                             [&](const port::Card& card, TelSimCardStatus_t& slot) {
                                 slot = cardStatus(card.status);
                                 *card_changed = card.changed ? 1 : 0;
                                 return TAPI_API_SUCCESS;
                             });
    });
}

int tel_get_network_default_subscription(TapiHandle* handle, TelNetworkDefaultSubs_t* subs)
{
    return askSubscription(__func__, handle, networkSubscription, subs);
}

int tel_get_network_default_data_subscription(TapiHandle* handle, TelNetworkDefaultDataSubs_t* subs)
{
    return askSubscription(__func__, handle, dataSubscription, subs);
}

int tel_get_call_preferred_voice_subscription(TapiHandle* handle, TelCallPreferredVoiceSubs_t* subs)
{
    return askSubscription(__func__, handle, voiceSubscription, subs);
}

int tel_check_sms_device_status(TapiHandle* handle, int* ready)
{
    return port::callSlot(Call(__func__, CODES, {Question::SmsReadiness}), handle,
                          Question::SmsReadiness, &Telephony::smsReady, ready,
                          [](bool isReady, int& slot) {
                              slot = isReady ? 1 : 0;
                              return TAPI_API_SUCCESS;
                          });
}
