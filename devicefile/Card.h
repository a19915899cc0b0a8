// SPDX-License-Identifier: Apache-2.0
// Conclusions from the state of a card in a device file.
#ifndef DEVICEFILE_CARD_H
#define DEVICEFILE_CARD_H

#include <optional>

#include "../port/backend/Telephony.h"

namespace port::devicefile {

constexpr int PIN_TRIES = 3; // of a card that nobody tried yet (3GPP TS 31.101)

/// Whether there is a card at all that its modem can talk to.
constexpr bool isCardThere(CardStatus card)
{
    switch (card) {
    case CardStatus::Absent:
    case CardStatus::Removed:
    case CardStatus::Error:
    case CardStatus::Crashed:
    case CardStatus::PoweredOff:
    case CardStatus::Unknown:
        return false;
    default:
        return true;
    }
}

/// The tries left for the PIN of such a card, of which a file may say how many they are.
inline int pinTriesOf(CardStatus card, std::optional<int> said)
{
    const bool isPinGone = card == CardStatus::PukRequired || card == CardStatus::Blocked;
    return isPinGone ? 0 : said.value_or(PIN_TRIES);
}

} // namespace port::devicefile

#endif
