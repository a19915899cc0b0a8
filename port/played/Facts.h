// SPDX-License-Identifier: Apache-2.0
// The facts of a device file that the played services publish.
#ifndef PORT_PLAYED_FACTS_H
#define PORT_PLAYED_FACTS_H

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "../../devicefile/Device.h"
#include "../backend/Network.h"
#include "../backend/Telephony.h"

namespace port::played {

struct SlotFacts {
    std::string name; // the modem's
    std::optional<CardStatus> card;
    std::string mcc;
    std::string mnc;
    std::string msin;
    std::string number;
    std::string imei;
    std::optional<ServiceState> service;
    bool isRoaming = false;
    std::string operatorName;
    std::string operatorMcc;
    std::string operatorMnc;
    std::optional<AccessTechnology> accessTechnology;
    std::optional<int> signal;
    std::optional<PowerState> power;
    std::string iccid;
    bool hasMessages = false;
    bool isEnabled = true;
    std::string pin; // empty: any is right
    std::string puk;
    std::optional<int> pinRetries;
    std::optional<int> pukRetries;

    bool isReady() const
    {
        return card == CardStatus::Ready;
    }
    /// MCC and MNC of the network that it is registered with: at home those of its card, unless the
    /// file says others. Empty when they are not known.
    std::string operatorCode() const
    {
        if (service != ServiceState::InService)
            return "";
        if (!operatorMcc.empty() && !operatorMnc.empty())
            return operatorMcc + operatorMnc;
        return isRoaming ? "" : mcc + mnc;
    }
};

// How a service misbehaves.
struct Behaviour {
    using Kind = devicefile::ServiceFault;
    Kind kind = Kind::None;
    int delayMs = 0;
    int call = 0;

    bool operator==(const Behaviour& other) const
    {
        return kind == other.kind && delayMs == other.delayMs && call == other.call;
    }
};

struct Facts {
    bool hasTelephony = true;
    std::vector<SlotFacts> slots;
    std::optional<int> dataSlot; // the default for data
    std::optional<CellularState> cellular;
    std::optional<LinkState> wifi;
    std::optional<WifiConnection> wifiConnection;
    std::string ssid;
    std::optional<LinkState> bluetooth;
    std::optional<bool> flightMode;
    std::optional<bool> dataRoaming;
    std::optional<bool> packetData;
    std::optional<bool> mobileData;
    std::string deviceName;
    std::string hostName;
    std::string language;
    std::string modelName;
    std::string platform; // its name and version
    std::string serial;
    std::map<std::string, Behaviour> behaviours; // by the name of a service

    bool isFlying() const
    {
        return flightMode.value_or(false);
    }
    bool isWifiOn() const
    {
        return !isFlying() && wifi != LinkState::Deactivated;
    }
    bool isCellularOn() const
    {
        return !isFlying() && cellular != CellularState::FlightMode;
    }
    bool isBluetoothOn() const
    {
        return bluetooth && bluetooth != LinkState::Deactivated;
    }
    /// The slot over which data goes; nothing while no data goes over the cellular network.
    std::optional<std::size_t> connectedSlot() const;
};

Facts factsOf(const devicefile::Device& device);

} // namespace port::played

#endif
