// SPDX-License-Identifier: Apache-2.0
#include "Service.h"

#include <algorithm>
#include <cstdarg>

namespace port::played {

using devicefile::Edit;

const Face* Object::find(const std::string& interface) const
{
    const auto found = std::find_if(faces.begin(), faces.end(),
                                    [&](const Face& each) { return each.interface == interface; });
    return found != faces.end() ? &*found : nullptr;
}

bool ModemNumbers::hasFailed(const SlotFacts& slot)
{
    return slot.card == CardStatus::Absent || slot.card == CardStatus::Removed ||
           slot.card == CardStatus::Error || slot.card == CardStatus::Crashed;
}

void ModemNumbers::follow(const std::vector<SlotFacts>& slots)
{
    std::map<std::string, Row> now;
    for (const SlotFacts& slot : slots) {
        const auto known = rows_.find(slot.name);
        const bool isSame = known != rows_.end() && known->second.hasFailed == hasFailed(slot);
        now[slot.name] = {isSame ? known->second.number : next_++, hasFailed(slot)};
    }
    rows_ = std::move(now);
}

int ModemNumbers::numberOf(const SlotFacts& slot) const
{
    return rows_.at(slot.name).number;
}

const Values& Request::values() const
{
    for (const Object& object : world)
        if (object.path == path)
            if (const Face* const found = object.find(interface))
                return found->values;
    static const Values none;
    return none;
}

Face face(const char* interface, Values known)
{
    const Values& defaults = interfaceOf(interface).defaults;
    known.insert(defaults.begin(), defaults.end());
    return {interface, std::move(known)};
}

Variant value(const char* format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    GVariant* const made = g_variant_new_va(format, nullptr, &arguments);
    va_end(arguments);
    return share(g_variant_ref_sink(made));
}

Variant texts(const std::vector<std::string>& all, const char* type)
{
    GVariantBuilder builder;
    g_variant_builder_init(&builder, G_VARIANT_TYPE(type));
    for (const std::string& text : all)
        g_variant_builder_add(&builder, type + 1, text.c_str());
    return share(g_variant_ref_sink(g_variant_builder_end(&builder)));
}

std::string versionText(int major, int minor, int micro)
{
    return std::to_string(major) + '.' + std::to_string(minor) + '.' + std::to_string(micro);
}

Edit set(const std::string& path, const char* value)
{
    return {path, std::string(value)};
}

Edit unset(const std::string& path)
{
    return {path, std::nullopt};
}

std::string slotKey(std::size_t slot, const char* key)
{
    return "slot[" + std::to_string(slot) + "]." + key;
}

// One radio that is switched on in flight mode ends it; the others stay off, by their own keys. The
// last one that is switched off begins it.
std::vector<Edit> wifiSwitch(const Facts& facts, bool on)
{
    std::vector<Edit> changes = {set("network.wifi", on ? "disconnected" : "deactivated"),
                                 unset("network.wifi_connection")};
    if (on && facts.isFlying()) {
        changes.push_back(set("settings.flight_mode", "false"));
        if (facts.cellular)
            changes.push_back(set("network.cellular", "flight_mode"));
    }
    if (!on && facts.hasTelephony && !facts.isCellularOn() && !facts.isBluetoothOn())
        changes.push_back(set("settings.flight_mode", "true"));
    return changes;
}

std::vector<Edit> cellularSwitch(const Facts& facts, bool on)
{
    std::vector<Edit> changes = {set("network.cellular", on ? "available" : "flight_mode")};
    for (std::size_t i = 0; i < facts.slots.size(); ++i)
        if (facts.slots[i].isReady())
            changes.push_back(set(slotKey(i, "service"), on ? "in_service" : "out_of_service"));
    if (on && facts.isFlying()) {
        changes.push_back(set("settings.flight_mode", "false"));
        if (facts.wifi)
            changes.push_back(set("network.wifi", "deactivated"));
    }
    if (!on && facts.wifi && !facts.isWifiOn() && !facts.isBluetoothOn())
        changes.push_back(set("settings.flight_mode", "true"));
    return changes;
}

std::vector<Edit> bluetoothSwitch(const Facts& facts, bool on)
{
    std::vector<Edit> changes = {set("network.bluetooth", on ? "disconnected" : "deactivated")};
    if (on && facts.isFlying()) {
        changes.push_back(set("settings.flight_mode", "false"));
        if (facts.wifi)
            changes.push_back(set("network.wifi", "deactivated"));
        if (facts.cellular)
            changes.push_back(set("network.cellular", "flight_mode"));
    }
    if (!on && facts.hasTelephony && facts.wifi && !facts.isCellularOn() && !facts.isWifiOn())
        changes.push_back(set("settings.flight_mode", "true"));
    return changes;
}

const std::vector<const Role*>& allServices()
{
    static const std::vector<const Role*> all = {&modemManager(), &networkManager(), &bluez(),
                                                 &hostname1(), &locale1()};
    return all;
}

} // namespace port::played
