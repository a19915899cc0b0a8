// SPDX-License-Identifier: Apache-2.0
// A device with SIM slots over the fake platform, and what SimManager does to ask it: the parts
// that the traces of all SIM questions are made of.
#ifndef CORESYSTEM_TESTS_UNIT_SIM_SLOTS_H
#define CORESYSTEM_TESTS_UNIT_SIM_SLOTS_H

#include <algorithm>
#include <cstring>
#include <optional>
#include <string>
#include <vector>

#include <TelSim.h>
#include <telephony.h>

#include "support/PlatformTest.h"

namespace fake {

// The modem of slot N is "cpN".

struct Card {
    std::string mcc;
    std::string mnc;
    std::string msin;
    std::string number;

    std::string imsi() const
    {
        return mcc + mnc + msin;
    }
};

const Card KOREAN_CARD = {"450", "05", "8173926450", "+821087654321"};
const Card AMERICAN_CARD = {"310", "260", "907264815", "+12025550143"};

inline std::string slotCall(const std::string& function, int slot)
{
    return function + "(slot " + std::to_string(slot) + ")";
}

inline const auto modemOf = [](int slot) { return "cp" + std::to_string(slot); };

inline std::string modemCall(const std::string& function, int slot)
{
    return function + "(modem " + modemOf(slot) + ")";
}

inline const auto initCall = [](int slot) { return "tel_init(" + modemOf(slot) + ")"; };
inline const auto stateCall = [](int slot) { return slotCall("telephony_sim_get_state", slot); };
inline const auto numberCall = [](int slot) {
    return slotCall("telephony_sim_get_subscriber_number", slot);
};
inline const auto imsiCall = [](int slot) { return modemCall("tel_get_sim_imsi", slot); };
inline const auto listName = [](unsigned int count) { return "list of " + std::to_string(count); };
inline const auto deinitCall = [](unsigned int count) {
    return "telephony_deinit(" + listName(count) + ")";
};

// A field without room for its NUL is given without one.
template <std::size_t size>
void fillField(char (&field)[size], const std::string& text)
{
    std::memset(field, 0, size);
    std::memcpy(field, text.data(), std::min(text.size(), size));
}

inline TelSimImsiInfo_t imsiInfo(const Card& card)
{
    TelSimImsiInfo_t info;
    fillField(info.szMcc, card.mcc);
    fillField(info.szMnc, card.mnc);
    fillField(info.szMsin, card.msin);
    return info;
}

// Telephony that reports `count` slots; what the slots answer is set apart.
inline void setSlotCount(unsigned int count)
{
    platform().answer("telephony_init()", 0, count);
    platform().answer(deinitCall(count), 0);
}

// Telephony that cannot be initialised.
inline void setNoTelephony(int code = -1073741822)
{
    platform().answer("telephony_init()", code);
    platform().answer("telephony_deinit(no list)", 0);
}

inline void setState(int slot, int state, int code = 0)
{
    platform().answer(stateCall(slot), code, state);
}

inline void setCard(int slot, const Card& card)
{
    setState(slot, TELEPHONY_SIM_STATE_AVAILABLE);
    platform().answer(initCall(slot), 0);
    platform().answer(imsiCall(slot), 0, imsiInfo(card));
    platform().answer(modemCall("tel_deinit", slot), 0);
    platform().answer(numberCall(slot), 0, card.number);
}

const std::nullopt_t NO_CARD = std::nullopt;

// A whole device: one slot each.
inline void setSlots(const std::vector<std::optional<Card>>& cards)
{
    Texts modems;
    for (const std::optional<Card>& card : cards) {
        const int slot = static_cast<int>(modems.size());
        if (card)
            setCard(slot, *card);
        else
            setState(slot, TELEPHONY_SIM_STATE_UNAVAILABLE);
        modems.push_back(modemOf(slot));
    }
    platform().setModems(modems);
    setSlotCount(static_cast<unsigned int>(cards.size()));
}

// A list as telephony_init() fills it, for the calls that take one. The fake keeps it.
inline telephony_handle_list_s openList(unsigned int count)
{
    return platform().openList(count);
}

const std::string SIM_ACCESS = "CORE_MUTEX_NAME_SIM_ACCESS";

// Locked around one platform call only.
inline Texts lockedAround(const std::string& call)
{
    return {SIM_ACCESS + ".Lock()", call, SIM_ACCESS + ".Unlock()"};
}

// Locked from the beginning to the end.
inline Texts lockedThroughout(const Texts& trace)
{
    return Texts{"lock " + SIM_ACCESS} + trace + Texts{"unlock " + SIM_ACCESS};
}

inline Texts listAskedFor(const std::string& line)
{
    const std::string method = "SuccessToInitTelephonyHandle";
    return {SIM_MANAGER.debug(method, method), "telephony_init()", line};
}

inline Texts listTaken(unsigned int count)
{
    const std::string line = "Success! telephony_init, handle count : " + std::to_string(count);
    return listAskedFor(SIM_MANAGER.debug("SuccessToInitTelephonyHandle", line));
}

inline Texts noListTaken()
{
    return listAskedFor(
        SIM_MANAGER.error("SuccessToInitTelephonyHandle", "telephony_init Failed."));
}

inline Texts listReleased(unsigned int count)
{
    return {SIM_MANAGER.debug("DeleteTelephonyHandle", "DeleteTelephonyHandle"), deinitCall(count)};
}

// SimManager::IsSimAvailable() of one slot.
inline Texts availabilityAsked(int slot, unsigned int count, bool available)
{
    const auto line = [](const std::string& text) {
        return SIM_MANAGER.debug("IsSimAvailable", text);
    };
    return Texts{line("IsSimAvailable : slot " + std::to_string(slot + 1)),
                 line("GetTelephonyHandle, handle count : " + std::to_string(count))} +
           lockedAround(stateCall(slot)) +
           Texts{available ? line("SIM is available")
                           : SIM_MANAGER.error("IsSimAvailable", "Sim is not available")};
}

// Steps of the facade, each with the access to SimManager before it.
inline Texts accessed(const Texts& step)
{
    return SIM_MANAGER.access() + step;
}

// Whether the text was formatted or logged anywhere.
inline bool isTold(const std::string& secret)
{
    if (isInFormatBuffer(secret))
        return true;
    for (const Event& event : platform().events())
        for (const std::string& text : {event.text, event.line.text, event.line.plain})
            if (text.find(secret) != std::string::npos)
                return true;
    return false;
}

// Whether any five digits in a row of the MSIN or of the number were formatted or logged.
inline bool isIdentityTold(const Card& card)
{
    for (const std::string& secret : {card.msin, card.number})
        for (std::size_t start = 0; start + 5 <= secret.size(); ++start)
            if (isTold(secret.substr(start, 5)))
                return true;
    return false;
}

} // namespace fake

#endif
