// SPDX-License-Identifier: Apache-2.0
#include "Telephony.h"

#include "../../devicefile/Card.h"
#include "../backend/Network.h"

namespace port::simulator {
namespace {

using devicefile::Device;
using devicefile::Section;

// A switch that is off where the file does not say so.
bool isOn(const Section& section, const char* key)
{
    const auto value = section.get<bool>(key);
    return value && value.value().value;
}

Result<Sourced<Card>> cardOf(const Section& slot)
{
    const auto status =
        slot.get<CardStatus>(slot.find("init_status") != nullptr ? "init_status" : "sim");
    if (!status)
        return status.error();
    return Sourced<Card>{{status.value().value, isOn(slot, "card_changed")}, status.value().source};
}

const char* obstacle(CardStatus status)
{
    switch (status) {
    case CardStatus::Absent:
    case CardStatus::Removed:
        return "there is no SIM card";
    case CardStatus::PinRequired:
        return "the SIM card is locked: it wants a PIN";
    case CardStatus::PukRequired:
        return "the SIM card is locked: it wants a PUK";
    case CardStatus::Blocked:
        return "the SIM card is locked for good";
    case CardStatus::NetworkLocked:
    case CardStatus::SubsetLocked:
    case CardStatus::ProviderLocked:
    case CardStatus::CorporateLocked:
    case CardStatus::DeviceLocked:
        return "the SIM card is locked to a network, provider or device";
    case CardStatus::PoweredOff:
        return "the SIM card is switched off";
    case CardStatus::Error:
    case CardStatus::Crashed:
        return "the SIM card cannot be used";
    default:
        return "the SIM card is not ready yet";
    }
}

bool isReady(CardStatus status)
{
    return status == CardStatus::Ready;
}

// Why the card cannot be read; nothing when it can.
std::optional<Error> obstacleOf(const Section& slot, bool (*isReadable)(CardStatus) = isReady)
{
    const auto card = cardOf(slot);
    if (!card)
        return card.error();
    if (!isReadable(card.value().value.status))
        return noSim(card.value().source + ": " + obstacle(card.value().value.status));
    return std::nullopt;
}

Error deniedBy(const Section& slot)
{
    return denied(slot.find("denied")->source + ": this slot is private");
}

// Reads a key that a file may leave out.
template <typename T>
Result<Sourced<T>> optional(const Section& slot, const char* key)
{
    return slot.find(key) != nullptr ? slot.get<T>(key)
                                     : notAvailable(slot.source() + ": [[slot]] does not say");
}

template <typename T>
Result<Sourced<T>> ofNetwork(const Section& slot, const char* key)
{
    const auto service = slot.get<ServiceState>("service");
    if (!service)
        return service.error();
    if (service.value().value != ServiceState::InService)
        return notAvailable(service.value().source + ": the slot is not in service");
    return optional<T>(slot, key);
}

Result<Sourced<PowerState>> powerOf(const Section& slot)
{
    const auto card = cardOf(slot);
    if (slot.find("power") == nullptr && card &&
        card.value().value.status == CardStatus::PoweredOff)
        return Sourced<PowerState>{PowerState::Off, card.value().source};
    return optional<PowerState>(slot, "power");
}

Result<Sourced<int>> pinTriesIn(const Section& slot)
{
    if (const auto error = obstacleOf(slot, devicefile::isCardThere))
        return *error;
    const auto card = cardOf(slot).value();
    const auto said = slot.get<int>("pin_retries");
    const int tries = devicefile::pinTriesOf(
        card.value.status, said ? std::optional<int>(said.value().value) : std::nullopt);
    return Sourced<int>{tries, said ? said.value().source : card.source};
}

ModemReport::Use useOf(const Section& slot, bool carriesData)
{
    const auto service = slot.get<ServiceState>("service");
    if (!service || service.value().value != ServiceState::InService)
        return ModemReport::Use::None;
    return carriesData ? ModemReport::Use::Data : ModemReport::Use::Service;
}

ModemReport reportOf(const Section& slot, bool carriesData)
{
    const SlotName name = slot.get<std::string>("cp_name").value().value;
    if (isOn(slot, "denied"))
        return emptyReport(name, deniedBy(slot));
    return {name,
            useOf(slot, carriesData),
            ofNetwork<std::string>(slot, "operator"),
            ofNetwork<std::string>(slot, "operator_mcc"),
            ofNetwork<std::string>(slot, "operator_mnc"),
            ofNetwork<AccessTechnology>(slot, "access_technology"),
            ofNetwork<int>(slot, "signal"),
            powerOf(slot),
            pinTriesIn(slot)};
}

std::optional<int> slotNumber(const Section& section, const char* key)
{
    const auto number = section.get<int>(key);
    return number && number.value().value >= 0 ? std::optional<int>(number.value().value)
                                               : std::nullopt;
}

} // namespace

Result<std::shared_ptr<const Device>> SimulatedTelephony::device()
{
    const auto now = file_.device();
    if (now) {
        const auto telephony = now.value()->section("device").get<bool>("telephony");
        if (telephony && !telephony.value().value)
            return notSupported(telephony.value().source + ": this device has no telephony");
    }
    return now;
}

Result<Section> SimulatedTelephony::slot(const SlotName& name)
{
    const auto now = device();
    if (!now)
        return now.error();
    for (const Section& slot : now.value()->slots) {
        if (slot.get<std::string>("cp_name").value().value != name)
            continue;
        if (isOn(slot, "denied"))
            return deniedBy(slot);
        return slot;
    }
    return notAvailable(file_.path() + ": no slot " + name);
}

template <typename T>
Result<Sourced<T>> SimulatedTelephony::get(const SlotName& name, const char* key)
{
    const Result<Section> found = slot(name);
    return found ? found.value().get<T>(key) : found.error();
}

Result<Sourced<std::vector<SlotName>>> SimulatedTelephony::slots()
{
    const auto now = device();
    if (!now)
        return now.error();
    std::vector<SlotName> names;
    for (const Section& slot : now.value()->slots)
        names.push_back(slot.get<std::string>("cp_name").value().value);
    return Sourced<std::vector<SlotName>>{std::move(names), file_.path()};
}

Result<Sourced<Card>> SimulatedTelephony::card(const SlotName& name)
{
    const Result<Section> found = slot(name);
    return found ? cardOf(found.value()) : found.error();
}

Result<Sourced<Imsi>> SimulatedTelephony::imsi(const SlotName& name)
{
    const Result<Section> found = slot(name);
    if (!found)
        return found.error();
    if (const auto error = obstacleOf(found.value()))
        return *error;
    const auto mcc = found.value().get<std::string>("mcc");
    const auto mnc = found.value().get<std::string>("mnc");
    const auto msin = found.value().get<std::string>("msin");
    for (const auto* part : {&mcc, &mnc, &msin})
        if (!*part)
            return part->error();
    return Sourced<Imsi>{{mcc.value().value, mnc.value().value, msin.value().value},
                         mcc.value().source};
}

Result<Sourced<std::optional<std::string>>> SimulatedTelephony::number(const SlotName& name)
{
    const Result<Section> found = slot(name);
    if (!found)
        return found.error();
    if (const auto error = obstacleOf(found.value()))
        return *error;
    const auto number = found.value().get<std::string>("number");
    if (!number)
        return Sourced<std::optional<std::string>>{std::nullopt, found.value().source()};
    return Sourced<std::optional<std::string>>{number.value().value, number.value().source};
}

Result<Fact> SimulatedTelephony::imei(const SlotName& name)
{
    return get<std::string>(name, "imei");
}

Result<Sourced<ServiceState>> SimulatedTelephony::service(const SlotName& name)
{
    return get<ServiceState>(name, "service");
}

Result<Sourced<bool>> SimulatedTelephony::roaming(const SlotName& name)
{
    return get<bool>(name, "roaming");
}

Result<Sourced<bool>> SimulatedTelephony::smsReady(const SlotName& name)
{
    return get<bool>(name, "sms");
}

Result<std::vector<ModemReport>> SimulatedTelephony::reports()
{
    const auto now = device();
    if (!now)
        return now.error();
    const auto cellular = now.value()->section("network").get<CellularState>("cellular");
    const bool isConnected = cellular && cellular.value().value == CellularState::Connected;
    const auto data = slotNumber(now.value()->section("subscriptions"), "data");
    std::vector<ModemReport> all;
    for (const Section& slot : now.value()->slots)
        all.push_back(reportOf(slot, isConnected && data == static_cast<int>(all.size())));
    return all;
}

Result<Fact> SimulatedTelephony::iccid(const SlotName& name)
{
    const Result<Section> found = slot(name);
    if (!found)
        return found.error();
    if (const auto error = obstacleOf(found.value(), devicefile::isCardThere))
        return *error;
    return optional<std::string>(found.value(), "iccid");
}

Result<Sourced<Subscriptions>> SimulatedTelephony::subscriptions()
{
    const auto now = device();
    if (!now)
        return now.error();
    const Section& section = now.value()->section("subscriptions");
    Subscriptions all;
    all.network = slotNumber(section, "network");
    all.data = slotNumber(section, "data");
    if (const auto voice = section.get<Subscriptions::Voice>("voice"))
        all.voice = voice.value().value;
    return Sourced<Subscriptions>{all, section.source()};
}

} // namespace port::simulator
