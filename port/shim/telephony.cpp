// SPDX-License-Identifier: Apache-2.0
#include <telephony.h>

#include <memory>

#include "Telephony.h"

namespace {

using port::Call;
using port::Codes;
using port::Question;
using port::Telephony;

using SlotHandles = port::Handles<telephony_h, port::SlotName>;

constexpr Codes CODES{TELEPHONY_ERROR_OPERATION_FAILED,  TELEPHONY_ERROR_NOT_SUPPORTED,
                      TELEPHONY_ERROR_PERMISSION_DENIED, TELEPHONY_ERROR_SIM_NOT_AVAILABLE,
                      TELEPHONY_ERROR_OUT_OF_MEMORY,     TELEPHONY_ERROR_INVALID_PARAMETER};

// The handles of one list.
class SlotList {
public:
    explicit SlotList(const std::vector<port::SlotName>& slots)
    {
        handles_.reserve(slots.size());
        for (const port::SlotName& slot : slots)
            handles_.push_back(SlotHandles::open(slot));
    }
    ~SlotList()
    {
        for (const telephony_h handle : handles_)
            SlotHandles::close(handle);
    }
    SlotList(const SlotList&) = delete;
    SlotList& operator=(const SlotList&) = delete;

    telephony_handle_list_s list()
    {
        return {static_cast<unsigned>(handles_.size()), handles_.data()};
    }

private:
    std::vector<telephony_h> handles_;
};

// Every list that was handed out, by the array that the application holds.
struct Lists {
    std::mutex mutex;
    std::map<const telephony_h*, std::unique_ptr<SlotList>> live;
};

Lists& lists()
{
    static Lists& only = *new Lists;
    return only;
}

int fill(telephony_handle_list_s& list, const std::vector<port::SlotName>& slots)
{
    if (slots.empty()) {
        list = {0, nullptr};
        return TELEPHONY_ERROR_NONE;
    }
    auto filled = std::make_unique<SlotList>(slots);
    const telephony_handle_list_s result = filled->list();
    const std::lock_guard<std::mutex> lock(lists().mutex);
    lists().live[result.handle] = std::move(filled);
    list = result;
    return TELEPHONY_ERROR_NONE;
}

int release(telephony_handle_list_s& list)
{
    const std::lock_guard<std::mutex> lock(lists().mutex);
    if (list.handle != nullptr && lists().live.erase(list.handle) == 0)
        return TELEPHONY_ERROR_INVALID_PARAMETER;
    list = {0, nullptr};
    return TELEPHONY_ERROR_NONE;
}

// A card that holds no number is an error that stores null.
int handOutNumber(const std::optional<std::string>& number, char*& slot)
{
    if (number && !number->empty())
        return port::handOutCopy(*number, &slot);
    slot = nullptr;
    return number ? TELEPHONY_ERROR_NONE : TELEPHONY_ERROR_OPERATION_FAILED;
}

telephony_network_service_state_e serviceState(port::ServiceState service)
{
    switch (service) {
    case port::ServiceState::InService:
        return TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE;
    case port::ServiceState::EmergencyOnly:
        return TELEPHONY_NETWORK_SERVICE_STATE_EMERGENCY_ONLY;
    case port::ServiceState::OutOfService:
        break;
    }
    return TELEPHONY_NETWORK_SERVICE_STATE_OUT_OF_SERVICE;
}

// Questions about a slot by its handle, and those that only an available card answers.
constexpr std::initializer_list<Question> LIST_QUESTIONS = {
    Question::SimSlots, Question::SimCard,        Question::SimIdentity, Question::PhoneNumber,
    Question::Imei,     Question::NetworkService, Question::Roaming};
constexpr std::initializer_list<Question> STATE_QUESTIONS = {
    Question::SimCard, Question::SimIdentity, Question::PhoneNumber};

template <typename Value>
int store(const Value& value, Value& slot)
{
    slot = value;
    return TELEPHONY_ERROR_NONE;
}

} // namespace

std::size_t port::liveTelephonyLists()
{
    const std::lock_guard<std::mutex> lock(lists().mutex);
    return lists().live.size();
}

int telephony_init(telephony_handle_list_s* list)
{
    const Call call(__func__, CODES, LIST_QUESTIONS);
    return call.run(list, [&]() -> int {
        if (list == nullptr)
            return TELEPHONY_ERROR_INVALID_PARAMETER;
        return call.pass(
            Question::SimSlots, port::slotsOfBackend(),
            [&](const std::vector<port::SlotName>& slots) { return fill(*list, slots); });
    });
}

int telephony_deinit(telephony_handle_list_s* list)
{
    return Call(__func__, CODES).release([&]() -> int {
        return list != nullptr ? release(*list) : TELEPHONY_ERROR_INVALID_PARAMETER;
    });
}

int telephony_sim_get_state(telephony_h handle, telephony_sim_state_e* state)
{
    return port::callSlot(Call(__func__, CODES, STATE_QUESTIONS), handle, Question::SimCard,
                          &Telephony::card, state,
                          [](const port::Card& card, telephony_sim_state_e& slot) {
                              return store(port::simState(card.status), slot);
                          });
}

int telephony_sim_get_subscriber_number(telephony_h handle, char** number)
{
    return port::callSlot(Call(__func__, CODES, {Question::PhoneNumber}), handle,
                          Question::PhoneNumber, &Telephony::number, number, handOutNumber);
}

int telephony_modem_get_imei(telephony_h handle, char** imei)
{
    return port::callSlot(
        Call(__func__, CODES, {Question::Imei}), handle, Question::Imei, &Telephony::imei, imei,
        [](const std::string& text, char*& slot) { return port::handOutCopy(text, &slot); });
}

int telephony_network_get_service_state(telephony_h handle,
                                        telephony_network_service_state_e* state)
{
    return port::callSlot(Call(__func__, CODES, {Question::NetworkService}), handle,
                          Question::NetworkService, &Telephony::service, state,
                          [](port::ServiceState service, telephony_network_service_state_e& slot) {
                              return store(serviceState(service), slot);
                          });
}

int telephony_network_get_roaming_status(telephony_h handle, bool* roaming)
{
    return port::callSlot(Call(__func__, CODES, {Question::Roaming}), handle, Question::Roaming,
                          &Telephony::roaming, roaming, store<bool>);
}
