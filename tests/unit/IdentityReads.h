// SPDX-License-Identifier: Apache-2.0
// The four reads of a SIM card, one row each: as SimManager has them for one slot, and as the
// facade has them for the first slot and for all.
#ifndef CORESYSTEM_TESTS_UNIT_IDENTITY_READS_H
#define CORESYSTEM_TESTS_UNIT_IDENTITY_READS_H

#include <ostream>
#include <string>
#include <vector>

#include "SimSlots.h"

namespace fake {

const int SIM_NOT_AVAILABLE = -39841791;

struct IdentityRead {
    std::string name;
    std::string Card::*part; // null for all three of the IMSI
    bool isNumber;           // read with the slot's handle; the others with the modem's
    bool isSecret;           // never formatted, and its intermediate copy is freed
    int failureWithoutList;  // of the facade

    int (SimManager::*read)(telephony_handle_list_s list, int slot, char** value);
    std::string foundLine; // takes the value unless it is secret
    std::string failureLine;

    CoreSystemInternals::SingleRead readFirst;
    std::string firstEntry;
    std::string firstFound; // "" for no line

    CoreSystemInternals::ListRead readAll;
    std::string allEntry;
    std::string added; // before the value and the count

    std::string valueOf(const Card& card) const
    {
        return part != nullptr ? card.*part : card.imsi();
    }
    int failure() const
    {
        return isNumber ? SIM_NOT_AVAILABLE : 4;
    }
};

inline std::ostream& operator<<(std::ostream& out, const IdentityRead& read)
{
    return out << read.name;
}

// The facade's lines that name another method are meant, and so is its 0 without a list.
inline const std::vector<IdentityRead> IDENTITY_READS = {
    {"GetMCCFromSim", &Card::mcc, false, false, 4, &SimManager::GetMCCFromSim,
     "Mcc: ", "fail to get MCC", &CoreSystem::GetMCCFromSim, "CoreSystem::GetMCCFromSim",
     "GetMCCFromSim mcc: ", CoreSystemInternals::LIST_MCCS, "GetMCCFromSim [Vector]TYPE",
     "ADD MCC: "},
    {"GetMNCFromSim", &Card::mnc, false, false, 4, &SimManager::GetMNCFromSim,
     "Mnc: ", "fail to get MNC", &CoreSystem::GetMNCFromSim, "GetMCCFromSim [Vector]TYPE",
     "GetMNCFromSim mcc: ", CoreSystemInternals::LIST_MNCS, "GetMNCFromSim [Vector]TYPE",
     "ADD MNC: "},
    {"GetIMSIFromSim", nullptr, false, true, 4, &SimManager::GetIMSIFromSim, "imsi exist",
     "fail to get imsi", CoreSystemInternals::GET_IMSI, "CoreSystem::GetIMSIFromSim",
     "GetIMSIFromSim IMSI exist", CoreSystemInternals::LIST_IMSIS, "GetIMSIFromSim [Vector]TYPE",
     "ADD IMSI "},
    {"GetPhoneNumberFromSim", &Card::number, true, true, 0, &SimManager::GetPhoneNumberFromSim,
     "phoneNumber exist", "fail to get phoneNumber", &CoreSystem::GetPhoneNumberFromSim,
     "CoreSystem::GetPhoneNumberFromSim", "", CoreSystemInternals::LIST_PHONE_NUMBERS,
     "GetPhoneNumberListFromSim [Vector]TYPE", "ADD PhoneNumber "},
};

} // namespace fake

#endif
