// SPDX-License-Identifier: Apache-2.0
// SIM slots, their cards and modems. Both generations of the platform's telephony interface ask
// here, so that they always agree. Any thread.
#ifndef PORT_BACKEND_TELEPHONY_H
#define PORT_BACKEND_TELEPHONY_H

#include <optional>
#include <string>
#include <vector>

#include "Result.h"

namespace port {

// A SIM slot. The same slot keeps its name for as long as its modem is there.
using SlotName = std::string;

// How far a card is initialised.
enum class CardStatus {
    Absent,
    Removed,
    Error,
    Initializing,
    Ready,
    PinRequired,
    PukRequired,
    Blocked,         // the PUK was wrong too often
    NetworkLocked,   // bound to a network (3GPP TS 22.022), and so the four that follow
    SubsetLocked,    // to a part of a network
    ProviderLocked,  // to a service provider
    CorporateLocked, // to a corporation
    DeviceLocked,    // to another device
    Crashed,
    PoweredOff,
    Unknown,
};

struct Card {
    CardStatus status = CardStatus::Unknown;
    bool changed = false; // another card than before; meaningful when ready
};

// The parts of an IMSI (ITU E.212), digits only.
struct Imsi {
    std::string mcc;  // three digits
    std::string mnc;  // two or three
    std::string msin; // up to ten
};

// Numbered as ModemManager's bits are.
enum class AccessTechnology {
    Pots,
    Gsm,
    GsmCompact,
    Gprs,
    Edge,
    Umts,
    Hsdpa,
    Hsupa,
    Hspa,
    HspaPlus,
    OneXrtt,
    Evdo0,
    EvdoA,
    EvdoB,
    Lte,
    FiveGNr,
    LteCatM,
    LteNbIot,
};

enum class PowerState { Off, Low, On };

enum class ServiceState { InService, OutOfService, EmergencyOnly };

// The answers of a slot's modem about itself and its network, each with a source or reason of its own.
struct ModemReport {
    // Later ones are used for more.
    enum class Use { None, Service, Data };

    SlotName slot;
    Use use;
    Result<Fact> operatorName;
    Result<Fact> operatorMcc;
    Result<Fact> operatorMnc;
    Result<Sourced<AccessTechnology>> accessTechnology; // the newest of several at once
    Result<Sourced<int>> signal;                        // in per cent
    Result<Sourced<PowerState>> power;
    Result<Sourced<int>> pinTries; // before the card wants its PUK
};

/// A report in which each answer is this error.
inline ModemReport emptyReport(const SlotName& slot, const Error& error)
{
    return {slot, ModemReport::Use::None, error, error, error, error, error, error, error};
}

// Subscriptions by 0-based slot; nothing where it is not known.
struct Subscriptions {
    std::optional<int> network; // the default of the network
    std::optional<int> data;    // the default for data
    enum class Voice { Unknown, CurrentNetwork, AskAlways, Slot1, Slot2 };
    Voice voice = Voice::Unknown;
};

/// The most slots that a device may have. Who was told of a slot may look it up in any later list.
constexpr std::size_t SLOT_LIMIT = 64;

inline Error noTelephony()
{
    return notSupported("no telephony");
}

class Telephony {
public:
    virtual ~Telephony() = default;

    /// The slots of the device, the primary one first; none when the service knows no modem.
    /// NotSupported: this device has no telephony; NotAvailable: no service answers.
    virtual Result<Sourced<std::vector<SlotName>>> slots()
    {
        return noTelephony();
    }
    virtual Result<Sourced<Card>> card(const SlotName&)
    {
        return noTelephony();
    }
    /// NoSim: there is no card, or it is locked or not ready; the reason says which.
    virtual Result<Sourced<Imsi>> imsi(const SlotName&)
    {
        return noTelephony();
    }
    /// The card's own number; nothing when the card holds none, empty where a device file wants
    /// the platform to succeed without one. NoSim as imsi().
    virtual Result<Sourced<std::optional<std::string>>> number(const SlotName&)
    {
        return noTelephony();
    }
    /// The modem's IMEI (3GPP TS 23.003), with or without a card.
    virtual Result<Fact> imei(const SlotName&)
    {
        return noTelephony();
    }
    virtual Result<Sourced<ServiceState>> service(const SlotName&)
    {
        return noTelephony();
    }
    virtual Result<Sourced<bool>> roaming(const SlotName&)
    {
        return noTelephony();
    }
    virtual Result<Sourced<Subscriptions>> subscriptions()
    {
        return noTelephony();
    }
    /// Whether text messages can be sent and received.
    virtual Result<Sourced<bool>> smsReady(const SlotName&)
    {
        return noTelephony();
    }

    // No call of the platform asks for what follows.

    /// Gives one report a slot, in the order of slots(), all of one moment.
    virtual Result<std::vector<ModemReport>> reports()
    {
        return noTelephony();
    }
    /// The ICCID of the card (ITU-T E.118), also while it is locked. NoSim: there is none.
    virtual Result<Fact> iccid(const SlotName&)
    {
        return noTelephony();
    }
};

/// The report of one modem; where there is none, an empty one that says why.
inline ModemReport reportOf(Telephony& telephony, const SlotName& slot)
{
    const auto reports = telephony.reports();
    if (!reports)
        return emptyReport(slot, reports.error());
    for (const ModemReport& report : reports.value())
        if (report.slot == slot)
            return report;
    return emptyReport(slot, notAvailable("no modem " + slot));
}

} // namespace port

#endif
