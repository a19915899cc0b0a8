// SPDX-License-Identifier: Apache-2.0
#include "ModemManager.h"

#include <algorithm>
#include <climits>
#include <tuple>

namespace port::linux_backend {
namespace {

// More SIM slots than this are not believed.
constexpr std::size_t MOST_SIMS = 16;

// The path that means "no object".
constexpr char NO_OBJECT[] = "/";

std::string objectOrNone(const std::string& path)
{
    return path == NO_OBJECT ? "" : path;
}

std::string deviceOf(const Object& object, const Properties& modem)
{
    const Result<std::string> device = modem.text(MM_MODEM_PROPERTY_DEVICE);
    return device && device.value().size() < PATH_MAX ? device.value() : object.path();
}

// Objects are numbered in the order of their making, so the shorter path is the older one.
auto orderOf(const Modem& modem)
{
    return std::make_tuple(modem.device(), modem.path().size(), modem.path());
}

constexpr Registration REGISTRATIONS[] = {
    {MM_MODEM_3GPP_REGISTRATION_STATE_IDLE, ServiceState::OutOfService, false},
    {MM_MODEM_3GPP_REGISTRATION_STATE_HOME, ServiceState::InService, false},
    {MM_MODEM_3GPP_REGISTRATION_STATE_SEARCHING, ServiceState::OutOfService, false},
    {MM_MODEM_3GPP_REGISTRATION_STATE_DENIED, ServiceState::OutOfService, false},
    {MM_MODEM_3GPP_REGISTRATION_STATE_ROAMING, ServiceState::InService, true},
    {MM_MODEM_3GPP_REGISTRATION_STATE_HOME_SMS_ONLY, ServiceState::InService, false},
    {MM_MODEM_3GPP_REGISTRATION_STATE_ROAMING_SMS_ONLY, ServiceState::InService, true},
    {MM_MODEM_3GPP_REGISTRATION_STATE_EMERGENCY_ONLY, ServiceState::EmergencyOnly, false},
    {MM_MODEM_3GPP_REGISTRATION_STATE_HOME_CSFB_NOT_PREFERRED, ServiceState::InService, false},
    {MM_MODEM_3GPP_REGISTRATION_STATE_ROAMING_CSFB_NOT_PREFERRED, ServiceState::InService, true},
    // Some services of this place only, for whoever has no subscription here.
    {MM_MODEM_3GPP_REGISTRATION_STATE_ATTACHED_RLOS, ServiceState::EmergencyOnly, false},
};

} // namespace

std::optional<Registration> findRegistration(std::uint32_t state)
{
    for (const Registration& row : REGISTRATIONS)
        if (row.state == state)
            return row;
    return std::nullopt;
}

Modem::Modem(Object object, Properties modem)
    : object_(std::move(object)), modem_(std::move(modem)), device_(deviceOf(object_, modem_))
{
    readSims();
}

void Modem::readSims()
{
    const Result<std::vector<std::string>> slots = modem_.paths(MM_MODEM_PROPERTY_SIMSLOTS);
    if (!slots || slots.value().empty() || slots.value().size() > MOST_SIMS) {
        const Result<std::string> sim = modem_.path(MM_MODEM_PROPERTY_SIM);
        sims_ = {sim ? objectOrNone(sim.value()) : ""};
        return;
    }
    std::transform(slots.value().begin(), slots.value().end(), std::back_inserter(sims_),
                   objectOrNone);
    // Counted from 1; 0 when no slot is in use.
    const Result<std::uint32_t> primary = modem_.number(MM_MODEM_PROPERTY_PRIMARYSIMSLOT);
    activeSim_ = primary && primary.value() > 0 ? primary.value() - 1 : sims_.size();
}

Result<std::int32_t> Modem::state() const
{
    return modem_.signedNumber(MM_MODEM_PROPERTY_STATE);
}

Result<std::uint32_t> Modem::failedReason() const
{
    return modem_.number(MM_MODEM_PROPERTY_STATEFAILEDREASON);
}

Result<std::uint32_t> Modem::lock() const
{
    return modem_.number(MM_MODEM_PROPERTY_UNLOCKREQUIRED);
}

Result<std::uint32_t> Modem::retriesLeft(MMModemLock lock) const
{
    return modem_.numberOf(MM_MODEM_PROPERTY_UNLOCKRETRIES, lock);
}

Result<std::uint32_t> Modem::powerState() const
{
    return modem_.number(MM_MODEM_PROPERTY_POWERSTATE);
}

Result<std::uint32_t> Modem::numberOfNetwork(const char* interface, const char* name) const
{
    const Result<Properties> network = object_.properties(interface);
    return network ? network.value().number(name) : Result<std::uint32_t>(network.error());
}

Result<std::uint32_t> Modem::registration() const
{
    return numberOfNetwork(MM_DBUS_INTERFACE_MODEM_MODEM3GPP,
                           MM_MODEM_MODEM3GPP_PROPERTY_REGISTRATIONSTATE);
}

Result<std::uint32_t> Modem::packetService() const
{
    return numberOfNetwork(MM_DBUS_INTERFACE_MODEM_MODEM3GPP,
                           MM_MODEM_MODEM3GPP_PROPERTY_PACKETSERVICESTATE);
}

bool Modem::isCdmaRoaming() const
{
    for (const char* const name : {MM_MODEM_MODEMCDMA_PROPERTY_CDMA1XREGISTRATIONSTATE,
                                   MM_MODEM_MODEMCDMA_PROPERTY_EVDOREGISTRATIONSTATE}) {
        const auto state = numberOfNetwork(MM_DBUS_INTERFACE_MODEM_MODEMCDMA, name);
        if (state && state.value() == MM_MODEM_CDMA_REGISTRATION_STATE_ROAMING)
            return true;
    }
    return false;
}

Result<std::string> Modem::textOfNetwork(const char* name) const
{
    const auto network = object_.properties(MM_DBUS_INTERFACE_MODEM_MODEM3GPP);
    return network ? network.value().text(name) : network.error();
}

Result<std::string> Modem::operatorName() const
{
    return textOfNetwork(MM_MODEM_MODEM3GPP_PROPERTY_OPERATORNAME);
}

Result<std::string> Modem::operatorCode() const
{
    return textOfNetwork(MM_MODEM_MODEM3GPP_PROPERTY_OPERATORCODE);
}

Result<std::uint32_t> Modem::accessTechnologies() const
{
    return modem_.number(MM_MODEM_PROPERTY_ACCESSTECHNOLOGIES);
}

Result<std::pair<std::uint32_t, bool>> Modem::signal() const
{
    return modem_.numberAndFlag(MM_MODEM_PROPERTY_SIGNALQUALITY);
}

Result<std::string> Modem::equipmentIdentifier() const
{
    return modem_.text(MM_MODEM_PROPERTY_EQUIPMENTIDENTIFIER);
}

Result<std::vector<std::string>> Modem::ownNumbers() const
{
    return modem_.texts(MM_MODEM_PROPERTY_OWNNUMBERS);
}

bool Modem::hasMessaging() const
{
    return object_.has(MM_DBUS_INTERFACE_MODEM_MESSAGING);
}

Look modems()
{
    return {
        MODEMS, [](const Tree& objects) {
            std::vector<Deciding> deciding;
            for (const auto& [path, interfaces] : objects)
                if (deciding.empty() && interfaces.count(MM_DBUS_INTERFACE_MODEM) != 0)
                    deciding.push_back({path, MM_DBUS_INTERFACE_MODEM, MM_MODEM_PROPERTY_STATE});
            return deciding;
        }};
}

Result<std::vector<Modem>> modemsIn(const Result<Objects>& objects)
{
    if (!objects)
        return objects.error();
    std::vector<Modem> modems;
    for (const auto& [path, interfaces] : *objects.value()) {
        const Object object(path, interfaces);
        // A modem that comes or goes has only some of its interfaces for a while.
        if (const Result<Properties> modem = object.properties(MM_DBUS_INTERFACE_MODEM))
            modems.emplace_back(object, modem.value());
        if (modems.size() > MOST_MODEMS)
            return notAvailable(std::string(MODEM_MANAGER.name) + " told of more than " +
                                std::to_string(MOST_MODEMS) + " modems");
    }
    std::sort(modems.begin(), modems.end(),
              [](const Modem& a, const Modem& b) { return orderOf(a) < orderOf(b); });
    return modems;
}

} // namespace port::linux_backend
