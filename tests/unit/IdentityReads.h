// SPDX-License-Identifier: Apache-2.0
// The four reads of a SIM card, one row each: as SimManager has them for one slot, and as the
// facade has them for the first slot and for all.
#ifndef CORESYSTEM_TESTS_UNIT_IDENTITY_READS_H
#define CORESYSTEM_TESTS_UNIT_IDENTITY_READS_H

#include <ostream>
#include <string>
#include <vector>

#include "SimSlots.h"

struct IdentityRead {
    std::string name;
    std::string (*valueOf)(const Card& card);
    bool isSecret; // never formatted

    // SimManager.
    int (SimManager::*read)(telephony_handle_list_s list, int slot, char** value);
    bool isNumber;                       // read with the slot's handle; the others with the modem's
    std::vector<std::string> foundLines; // the last takes the value unless it is secret
    std::string failureLine;
    int failure;

    // The facade, the first slot.
    CoreSystemInternals::SingleRead readFirst;
    std::string firstEntry;
    std::string firstFound; // "" for no line
    int failureWithoutList;
    bool keepsIntermediate;

    // The facade, every slot.
    CoreSystemInternals::ListRead readAll;
    std::string allEntry;
    std::string added; // before the value and the count
};

inline std::ostream& operator<<(std::ostream& out, const IdentityRead& read)
{
    return out << read.name;
}

const int SIM_NOT_AVAILABLE = -39841791;

inline const std::vector<IdentityRead>& identityReads()
{
    // The facade's lines that name another method are meant, and so is its 0 without a list.
    static const std::vector<IdentityRead> rows = {
        {"GetMCCFromSim",
         [](const Card& card) { return card.mcc; },
         false,
         &SimManager::GetMCCFromSim,
         false,
         {"Mcc: "},
         "fail to get MCC",
         4,
         &CoreSystem::GetMCCFromSim,
         "CoreSystem::GetMCCFromSim",
         "GetMCCFromSim mcc: ",
         4,
         true,
         CoreSystemInternals::LIST_MCCS,
         "GetMCCFromSim [Vector]TYPE",
         "ADD MCC: "},
        {"GetMNCFromSim",
         [](const Card& card) { return card.mnc; },
         false,
         &SimManager::GetMNCFromSim,
         false,
         {"Mnc: "},
         "fail to get MNC",
         4,
         &CoreSystem::GetMNCFromSim,
         "GetMCCFromSim [Vector]TYPE",
         "GetMNCFromSim mcc: ",
         4,
         true,
         CoreSystemInternals::LIST_MNCS,
         "GetMNCFromSim [Vector]TYPE",
         "ADD MNC: "},
        {"GetIMSIFromSim",
         [](const Card& card) { return card.imsi(); },
         true,
         &SimManager::GetIMSIFromSim,
         false,
         {"Mcc exist", "Mnc exist", "Msin exist", "imsi exist"},
         "fail to get imsi",
         4,
         CoreSystemInternals::GET_IMSI,
         "CoreSystem::GetIMSIFromSim",
         "GetIMSIFromSim IMSI exist",
         4,
         false,
         CoreSystemInternals::LIST_IMSIS,
         "GetIMSIFromSim [Vector]TYPE",
         "ADD IMSI "},
        {"GetPhoneNumberFromSim",
         [](const Card& card) { return card.number; },
         true,
         &SimManager::GetPhoneNumberFromSim,
         true,
         {"phoneNumber exist"},
         "fail to get phoneNumber",
         SIM_NOT_AVAILABLE,
         &CoreSystem::GetPhoneNumberFromSim,
         "CoreSystem::GetPhoneNumberFromSim",
         "",
         0,
         false,
         CoreSystemInternals::LIST_PHONE_NUMBERS,
         "GetPhoneNumberListFromSim [Vector]TYPE",
         "ADD PhoneNumber "},
    };
    return rows;
}

// A value as the lines show it, "" of one that they do not.
inline std::string shown(const IdentityRead& read, const std::string& value)
{
    return read.isSecret ? "" : "[" + value + "]";
}

inline fake::Texts readEntered(const IdentityRead& read, int slot, unsigned int count)
{
    fake::Texts trace = {
        fake::SIM_MANAGER.debug(read.name, read.name + " : slot " + std::to_string(slot + 1))};
    if (read.isNumber)
        trace.push_back(fake::SIM_MANAGER.debug(read.name, "GetTelephonyHandle. handle count : " +
                                                               std::to_string(count)));
    return trace;
}

inline std::string readCall(const IdentityRead& read, int slot)
{
    return read.isNumber ? numberCall(slot) : imsiCall(slot);
}

// Up to the read itself.
inline fake::Texts readBegun(const IdentityRead& read, int slot, unsigned int count)
{
    using fake::operator+;
    fake::Texts trace = readEntered(read, slot, count) + availabilityAsked(slot, count, true);
    if (!read.isNumber)
        trace = trace + fake::Texts{"tel_get_cp_name_list()", initCall(slot)};
    return trace + lockedAround(readCall(read, slot));
}

inline fake::Texts readEnded(const IdentityRead& read, int slot)
{
    return read.isNumber ? fake::Texts{} : fake::Texts{modemCall("tel_deinit", slot)};
}

inline fake::Texts failureLogged(const IdentityRead& read)
{
    return {fake::SIM_MANAGER.error(read.name, read.failureLine)};
}

// A card that is read; `value` as the lines show it.
inline fake::Texts slotRead(const IdentityRead& read, int slot, unsigned int count,
                            const std::string& value)
{
    using fake::operator+;
    fake::Texts lines;
    for (const std::string& line : read.foundLines)
        lines.push_back(fake::SIM_MANAGER.debug(read.name, line));
    lines.back() += shown(read, value);
    return readBegun(read, slot, count) + lines + readEnded(read, slot);
}

// No available card.
inline fake::Texts slotUnavailable(const IdentityRead& read, int slot, unsigned int count)
{
    using fake::operator+;
    return readEntered(read, slot, count) + availabilityAsked(slot, count, false) +
           failureLogged(read);
}

// A card that is available but cannot be read.
inline fake::Texts slotFailed(const IdentityRead& read, int slot, unsigned int count)
{
    using fake::operator+;
    return readBegun(read, slot, count) + readEnded(read, slot) + failureLogged(read);
}

// The copies that the library keeps once the facade has read these cards: those of MCC and
// MNC, and the platform's own numbers.
inline fake::Texts kept(const IdentityRead& read, const std::vector<Card>& cards)
{
    fake::Texts texts;
    for (const Card& card : cards) {
        if (read.keepsIntermediate)
            texts.push_back("copy: " + read.valueOf(card));
        if (read.isNumber)
            texts.push_back("platform: " + read.valueOf(card));
    }
    return texts;
}

inline fake::Texts copies(const IdentityRead& read, const std::vector<Card>& cards)
{
    fake::Texts texts;
    for (const Card& card : cards)
        texts.push_back("copy: " + read.valueOf(card));
    return texts;
}

// The reads that answer parts of the IMSI.
inline std::vector<IdentityRead> imsiReads()
{
    std::vector<IdentityRead> reads = identityReads();
    reads.pop_back();
    return reads;
}

#endif
