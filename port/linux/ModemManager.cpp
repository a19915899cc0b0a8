// SPDX-License-Identifier: Apache-2.0
#include "ModemManager.h"

#include <algorithm>
#include <climits>
#include <tuple>

namespace port::linux_backend {
namespace {

// More SIM slots than this are not believed.
constexpr std::size_t MOST_SIMS = 16;

// What stands for "no object".
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

} // namespace

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

bool Modem::isPoweredOff() const
{
    const Result<std::uint32_t> power = modem_.number(MM_MODEM_PROPERTY_POWERSTATE);
    return power && power.value() == MM_MODEM_POWER_STATE_OFF;
}

Result<std::uint32_t> Modem::registration() const
{
    const Result<Properties> network = object_.properties(MM_DBUS_INTERFACE_MODEM_MODEM3GPP);
    if (!network)
        return network.error();
    return network.value().number(MM_MODEM_MODEM3GPP_PROPERTY_REGISTRATIONSTATE);
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

Result<std::vector<Modem>> modemsIn(const Reply& reply)
{
    const Result<std::vector<Object>> objects = objectsIn(reply.body);
    if (!objects)
        return notAvailable(std::string(MODEM_MANAGER.name) + " " + objects.error().reason);
    std::vector<Modem> modems;
    for (const Object& object : objects.value())
        // A modem that comes or goes has only some of its interfaces for a while.
        if (const Result<Properties> modem = object.properties(MM_DBUS_INTERFACE_MODEM))
            modems.emplace_back(object, modem.value());
    std::sort(modems.begin(), modems.end(),
              [](const Modem& a, const Modem& b) { return orderOf(a) < orderOf(b); });
    return modems;
}

} // namespace port::linux_backend
