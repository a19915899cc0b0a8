// SPDX-License-Identifier: Apache-2.0
// The library's answers about the SIM slots, and the port's about their modems.
#ifndef CLI_SIMS_H
#define CLI_SIMS_H

#include <string>
#include <vector>

#include <coresystem_port.h>

#include "Session.h"

namespace cli {

// Null with a reason when it was not answered.
struct ValueOrReason {
    Json value;
    std::string reason;
};

struct SimSlot {
    int number;
    std::string modem;
    ValueOrReason status; // "ready", "absent", ...
    ValueOrReason mcc;
    ValueOrReason mnc;
    ValueOrReason msin;
    ValueOrReason country; // its English name
    ValueOrReason phoneNumber;
    ValueOrReason roaming;
    ValueOrReason sms; // whether text messages can be sent and received
    // No application is told what follows.
    ValueOrReason operatorName = {};
    ValueOrReason operatorMcc = {};
    ValueOrReason operatorMnc = {};
    ValueOrReason accessTechnology = {};
    ValueOrReason signal = {}; // in per cent
    ValueOrReason power = {};
    ValueOrReason pinTries = {};
    ValueOrReason iccid = {};
};

// The slot that serves something by default, or "unknown".
struct DefaultSlot {
    const char* use; // "network", ...
    ValueOrReason slot;
};

struct Sims {
    std::vector<SimSlot> slots;
    std::string reason; // why there are none
    std::vector<DefaultSlot> defaults;
};

Sims askSims();

/// Turns what the port tells into a text, a number or a switch.
ValueOrReason answerOf(const coresystem_port::Answer& told);

/// Why no slot answered a question whose origins are these: no telephony, no usable card, or the
/// question's own reason.
std::string whyNoSlotAnswers(const coresystem_port::Origins& origins,
                             coresystem_port::Question question);

/// Why no modem tells its IMEI.
std::string whyNoImei(const coresystem_port::Origins& origins);

/// The English name of an MCC's country.
ValueOrReason askCountryOf(const std::string& mcc);

/// Whether a slot is roaming.
ValueOrReason askRoaming(int slot);

/// The value with all but its last two characters hidden.
Json masked(const Json& value);

} // namespace cli

#endif
