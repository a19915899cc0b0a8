// SPDX-License-Identifier: Apache-2.0
// What the library tells an application about the SIM slots.
#ifndef CLI_SIMS_H
#define CLI_SIMS_H

#include <string>
#include <vector>

#include <coresystem_port.h>

#include "Session.h"

namespace cli {

// Null with a reason when it was not answered.
struct Answer {
    Json value;
    std::string reason;
};

struct SimSlot {
    int number;
    std::string modem;
    Answer status; // "ready", "absent", ...
    Answer mcc;
    Answer mnc;
    Answer msin;
    Answer country; // its English name
    Answer phoneNumber;
    Answer roaming;
    Answer sms; // whether text messages can be sent and received
};

// The slot that serves something by default, or "unknown".
struct DefaultSlot {
    const char* use; // "network", ...
    Answer slot;
};

struct Sims {
    std::vector<SimSlot> slots;
    std::string reason; // why there are none
    std::vector<DefaultSlot> defaults;
};

Sims askSims();

/// Why no slot answered a question whose origins are these: no telephony, no usable card, or the
/// question's own reason.
std::string whyNoSlotAnswers(const coresystem_port::Origins& origins,
                             coresystem_port::Question question);

/// Why no modem tells its IMEI.
std::string whyNoImei(const coresystem_port::Origins& origins);

/// The English name of an MCC's country.
Answer askCountryOf(const std::string& mcc);

/// Whether a slot is roaming.
Answer askRoaming(int slot);

/// The value with all but its last two characters hidden.
Json masked(const Json& value);

} // namespace cli

#endif
