// SPDX-License-Identifier: Apache-2.0
#include "Facts.h"

namespace port::played {
namespace {

using devicefile::Section;

template <typename T>
std::optional<T> find(const Section& section, const char* key)
{
    const auto found = section.get<T>(key);
    return found ? std::optional<T>(found.value().value) : std::nullopt;
}

std::string textIn(const Section& section, const char* key)
{
    return find<std::string>(section, key).value_or("");
}

SlotFacts slotOf(const Section& section)
{
    SlotFacts slot;
    slot.name = textIn(section, "cp_name");
    if (find<bool>(section, "denied").value_or(false)) // nobody may know anything of it
        return slot;
    slot.card =
        find<CardStatus>(section, section.find("init_status") != nullptr ? "init_status" : "sim");
    slot.mcc = textIn(section, "mcc");
    slot.mnc = textIn(section, "mnc");
    slot.msin = textIn(section, "msin");
    slot.number = textIn(section, "number");
    slot.imei = textIn(section, "imei");
    slot.service = find<ServiceState>(section, "service");
    slot.isRoaming = find<bool>(section, "roaming").value_or(false);
    slot.operatorName = textIn(section, "operator");
    slot.operatorMcc = textIn(section, "operator_mcc");
    slot.operatorMnc = textIn(section, "operator_mnc");
    slot.accessTechnology = find<AccessTechnology>(section, "access_technology");
    slot.signal = find<int>(section, "signal");
    slot.power = find<PowerState>(section, "power");
    slot.iccid = textIn(section, "iccid");
    slot.hasMessages = find<bool>(section, "sms").value_or(false);
    slot.isEnabled = find<bool>(section, "enabled").value_or(true);
    slot.pin = textIn(section, "pin");
    slot.puk = textIn(section, "puk");
    slot.pinRetries = find<int>(section, "pin_retries");
    slot.pukRetries = find<int>(section, "puk_retries");
    return slot;
}

// A radio of which nothing is said is off in flight mode.
template <typename State>
std::optional<State> radio(const Section& network, const char* key, bool isFlying, State off)
{
    if (network.find(key) == nullptr && isFlying)
        return off;
    return find<State>(network, key);
}

Behaviour behaviourOf(const Section& services, const char* name)
{
    const auto fault = find<devicefile::Fault>(services, name);
    if (!fault)
        return {};
    // Late without a name is slow.
    const auto kind = fault->error.empty() ? Behaviour::Kind::Slow
                                           : static_cast<Behaviour::Kind>(fault->meaning.number);
    return {kind, static_cast<int>(fault->delayMs), static_cast<int>(fault->call)};
}

std::string joined(const std::string& left, const std::string& right)
{
    return left.empty() || right.empty() ? left + right : left + " " + right;
}

} // namespace

std::optional<std::size_t> Facts::connectedSlot() const
{
    if (cellular != CellularState::Connected)
        return std::nullopt;
    if (dataSlot && *dataSlot >= 0 && static_cast<std::size_t>(*dataSlot) < slots.size() &&
        slots[static_cast<std::size_t>(*dataSlot)].isReady())
        return static_cast<std::size_t>(*dataSlot);
    for (std::size_t i = 0; i < slots.size(); ++i)
        if (slots[i].isReady() && slots[i].service == ServiceState::InService)
            return i;
    return std::nullopt;
}

Facts factsOf(const devicefile::Device& device)
{
    const Section& about = device.section("device");
    const Section& settings = device.section("settings");
    const Section& network = device.section("network");
    Facts facts;
    facts.hasTelephony = find<bool>(about, "telephony").value_or(true);
    if (facts.hasTelephony)
        for (const Section& slot : device.slots)
            facts.slots.push_back(slotOf(slot));
    facts.flightMode = find<bool>(settings, "flight_mode");
    facts.cellular = radio(network, "cellular", facts.isFlying(), CellularState::FlightMode);
    facts.wifi = radio(network, "wifi", facts.isFlying(), LinkState::Deactivated);
    facts.wifiConnection = find<WifiConnection>(network, "wifi_connection");
    facts.ssid = textIn(network, "ssid");
    facts.bluetooth = radio(network, "bluetooth", facts.isFlying(), LinkState::Deactivated);
    facts.dataRoaming = find<bool>(settings, "data_roaming");
    facts.packetData = find<bool>(settings, "packet_data");
    facts.mobileData = find<bool>(settings, "mobile_data");
    facts.dataSlot = find<int>(device.section("subscriptions"), "data");
    facts.deviceName = textIn(settings, "device_name");
    facts.hostName = textIn(settings, "host_name");
    facts.language = textIn(settings, "language");
    facts.modelName = textIn(about, "model_name");
    facts.platform = joined(textIn(about, "platform_name"), textIn(about, "platform_version"));
    facts.serial = textIn(about, "serial");
    for (const std::string& name : devicefile::keyNames(*devicefile::findSection("service")))
        facts.behaviours[name] = behaviourOf(device.section("service"), name.c_str());
    return facts;
}

} // namespace port::played
