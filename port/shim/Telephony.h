// SPDX-License-Identifier: Apache-2.0
// Shared by both generations of the telephony interface.
#ifndef PORT_SHIM_TELEPHONY_H
#define PORT_SHIM_TELEPHONY_H

#include <telephony.h>

#include "Call.h"
#include "Handles.h"

namespace port {

/// The newer interface's state of a card whose status the older one gives in detail.
inline telephony_sim_state_e simState(CardStatus status)
{
    switch (status) {
    case CardStatus::Ready:
        return TELEPHONY_SIM_STATE_AVAILABLE;
    case CardStatus::PinRequired:
    case CardStatus::PukRequired:
    case CardStatus::Blocked:
    case CardStatus::NetworkLocked:
    case CardStatus::SubsetLocked:
    case CardStatus::ProviderLocked:
    case CardStatus::CorporateLocked:
    case CardStatus::DeviceLocked:
        return TELEPHONY_SIM_STATE_LOCKED;
    case CardStatus::Absent:
    case CardStatus::Removed:
    case CardStatus::Error:
    case CardStatus::Crashed:
    case CardStatus::PoweredOff:
        return TELEPHONY_SIM_STATE_UNAVAILABLE;
    case CardStatus::Initializing:
    case CardStatus::Unknown:
        break;
    }
    return TELEPHONY_SIM_STATE_UNKNOWN;
}

/// The slots of the backend, unless they are more than the limit.
inline Result<Sourced<std::vector<SlotName>>> slotsOfBackend()
{
    auto slots = backend().telephony().slots();
    if (slots && slots.value().value.size() > SLOT_LIMIT)
        return notAvailable(slots.value().source + " has more than " + std::to_string(SLOT_LIMIT) +
                            " slots");
    return slots;
}

/// Asks the slot that a handle stands for, in the body of a call; `take` puts the value into *out
/// and gives the result.
template <typename Handle, typename T, typename Out, typename Take>
int askSlot(const Call& call, Handle handle, Question question,
            Result<Sourced<T>> (Telephony::*ask)(const SlotName&), Out* out, Take take)
{
    const auto slot = Handles<Handle, SlotName>::find(handle);
    if (!slot || out == nullptr)
        return call.codes().invalid;
    return call.pass(question, (backend().telephony().*ask)(*slot),
                     [&](const T& value) { return take(value, *out); });
}

/// The same as a call of its own, which may be told to hand out nothing.
template <typename Handle, typename T, typename Out, typename Take>
int callSlot(const Call& call, Handle handle, Question question,
             Result<Sourced<T>> (Telephony::*ask)(const SlotName&), Out* out, Take take)
{
    return call.run(out, [&] { return askSlot(call, handle, question, ask, out, take); });
}

/// Lists of telephony_init() that were not released yet.
std::size_t liveTelephonyLists();

} // namespace port

#endif
