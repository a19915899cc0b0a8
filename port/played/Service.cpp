// SPDX-License-Identifier: Apache-2.0
#include "Service.h"

#include <algorithm>
#include <cstdarg>

namespace port::played {
namespace {

constexpr char WIFI_KEY[] = "network.wifi";
constexpr char CELLULAR_KEY[] = "network.cellular";
constexpr char BLUETOOTH_KEY[] = "network.bluetooth";

} // namespace

using devicefile::Edit;

const Face* Object::find(const std::string& interface) const
{
    const auto found = std::find_if(faces.begin(), faces.end(),
                                    [&](const Face& each) { return each.interface == interface; });
    return found != faces.end() ? &*found : nullptr;
}

GVariant* Face::value(const std::string& property) const
{
    const auto found = known.find(property);
    return (found != known.end() ? found->second : defaults.at(property)).get();
}

Values Face::all() const
{
    Values all = known;
    all.insert(defaults.begin(), defaults.end());
    return all;
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

GVariant* Request::value(const std::string& property) const
{
    const auto object = std::find_if(world.begin(), world.end(),
                                     [this](const Object& each) { return each.path == path; });
    return object->find(interface)->value(property);
}

Face face(const char* interface, Values known)
{
    return {interface, std::move(known), interfaceOf(interface).defaults};
}

Variant value(const char* format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    GVariant* const made = g_variant_new_va(format, nullptr, &arguments);
    va_end(arguments);
    return share(g_variant_ref_sink(made));
}

Variant textOf(const std::string& text)
{
    return value("s", text.c_str());
}

Variant pathOf(const std::string& path)
{
    return value("o", path.c_str());
}

std::string numbered(const char* prefix, int number)
{
    return prefix + ("/" + std::to_string(number));
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

Outcome nothing(const Request&)
{
    return {};
}

// One radio that is switched on in flight mode ends it; the others stay off, by their own keys. The
// last one that is switched off begins it.
std::vector<Edit> withFlightMode(const Facts& facts, const std::string& key, bool on,
                                 std::vector<Edit> changes)
{
    const int radiosOn = facts.isWifiOn() + facts.isCellularOn() + facts.isBluetoothOn();
    if (!on && radiosOn == 1 && facts.wifi && facts.hasTelephony)
        changes.push_back(set("settings.flight_mode", "true"));
    if (!on || !facts.isFlying())
        return changes;
    changes.push_back(set("settings.flight_mode", "false"));
    if (facts.wifi && key != WIFI_KEY)
        changes.push_back(set(WIFI_KEY, "deactivated"));
    if (facts.cellular && key != CELLULAR_KEY)
        changes.push_back(set(CELLULAR_KEY, "flight_mode"));
    return changes;
}

std::vector<Edit> wifiSwitch(const Facts& facts, bool on)
{
    return withFlightMode(
        facts, WIFI_KEY, on,
        {set(WIFI_KEY, on ? "disconnected" : "deactivated"), unset("network.wifi_connection")});
}

std::vector<Edit> cellularSwitch(const Facts& facts, bool on)
{
    std::vector<Edit> changes = {set(CELLULAR_KEY, on ? "available" : "flight_mode")};
    for (std::size_t i = 0; i < facts.slots.size(); ++i)
        if (facts.slots[i].isReady())
            changes.push_back(set(slotKey(i, "service"), on ? "in_service" : "out_of_service"));
    return withFlightMode(facts, CELLULAR_KEY, on, std::move(changes));
}

std::vector<Edit> bluetoothSwitch(const Facts& facts, bool on)
{
    return withFlightMode(facts, BLUETOOTH_KEY, on,
                          {set(BLUETOOTH_KEY, on ? "disconnected" : "deactivated")});
}

const std::vector<const Role*>& allServices()
{
    static const std::vector<const Role*> all = {&modemManager(), &networkManager(), &bluez(),
                                                 &hostname1(), &locale1()};
    return all;
}

} // namespace port::played
