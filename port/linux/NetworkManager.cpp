// SPDX-License-Identifier: Apache-2.0
#include "NetworkManager.h"

#include <algorithm>

#include <glib.h>

namespace port::linux_backend {
namespace {

// A connection's type, and the name of that type's settings.
constexpr char GSM[] = "gsm";
constexpr char CDMA[] = "cdma";

struct RadioRow {
    Radio radio;
    const char* software; // the switch that the user sets
    const char* hardware; // the one on the case
    std::uint32_t flag;   // NMRadioFlags
    NMDeviceType device;
};
constexpr RadioRow RADIOS[] = {
    {Radio::Wifi, "WirelessEnabled", "WirelessHardwareEnabled", NM_RADIO_FLAG_WLAN_AVAILABLE,
     NM_DEVICE_TYPE_WIFI},
    {Radio::Cellular, "WwanEnabled", "WwanHardwareEnabled", NM_RADIO_FLAG_WWAN_AVAILABLE,
     NM_DEVICE_TYPE_MODEM},
};

const RadioRow& rowOf(Radio radio)
{
    return *std::find_if(std::begin(RADIOS), std::end(RADIOS),
                         [radio](const RadioRow& row) { return row.radio == radio; });
}

bool isCellular(const std::string& type)
{
    return type == GSM || type == CDMA;
}

Error fromNetworkManager(const Error& error)
{
    return {error.kind, "NetworkManager: " + error.reason};
}

// NetworkManager leaves out what has its default value.
template <typename T>
Result<T> orDefault(const Properties& settings, Result<T> (Properties::*read)(const char*) const,
                    const char* name, T valueIfMissing)
{
    return settings.has(name) ? (settings.*read)(name) : Result<T>(valueIfMissing);
}

// Nothing for a connection of another type.
Result<std::optional<CellularConnection>> cellularConnection(const Object& settings, bool isActive)
{
    using Found = std::optional<CellularConnection>;
    const Result<Properties> common = settings.properties(settingsName("connection").c_str());
    const auto type = common ? common.value().text("type") : Result<std::string>(common.error());
    if (!type || !isCellular(type.value()))
        return type ? Result<Found>(Found()) : type.error();
    const Result<bool> connectsItself =
        orDefault(common.value(), &Properties::flag, "autoconnect", true);
    const Result<std::int32_t> priority =
        orDefault(common.value(), &Properties::signedNumber, "autoconnect-priority", 0);
    // Only these have the setting; it forbids roaming.
    const Result<Properties> gsm = settings.properties(settingsName(GSM).c_str());
    const Result<bool> isHomeOnly =
        gsm ? orDefault(gsm.value(), &Properties::flag, "home-only", false) : Result<bool>(false);
    if (!connectsItself || !priority || !isHomeOnly)
        return notAvailable("a cellular connection has malformed settings");
    return Found({isActive, connectsItself.value(), priority.value(), isHomeOnly.value()});
}

} // namespace

Result<NetworkView> NetworkView::from(const Result<Objects>& objects)
{
    if (!objects)
        return objects.error();
    return NetworkView(objects.value());
}

Result<Properties> NetworkView::at(const std::string& path, const char* interface) const
{
    const auto found = objects_->find(path);
    return found != objects_->end() ? Object(path, found->second).properties(interface)
                                    : notAvailable(path + " is not there");
}

Result<Properties> NetworkView::manager() const
{
    const auto found = at(NETWORK_MANAGER.path, NETWORK_MANAGER.interface);
    return found ? found : fromNetworkManager(found.error());
}

Result<bool> NetworkView::managerFlag(const char* name) const
{
    const Result<Properties> all = manager();
    if (!all)
        return all.error();
    const Result<bool> flag = all.value().flag(name);
    return flag ? flag : fromNetworkManager(flag.error());
}

Result<bool> NetworkView::isOn() const
{
    return managerFlag("NetworkingEnabled");
}

Result<bool> NetworkView::isSwitchedOn(Radio radio) const
{
    return managerFlag(rowOf(radio).software);
}

Result<bool> NetworkView::isOn(Radio radio) const
{
    const Result<bool> on = isSwitchedOn(radio);
    return on && on.value() ? managerFlag(rowOf(radio).hardware) : on;
}

Result<bool> NetworkView::isThere(Radio radio) const
{
    const Result<Properties> all = manager();
    const auto devices = devicesOf({rowOf(radio).device});
    if (!all || !devices)
        return all ? devices.error() : all.error();
    // The flags are there from version 1.38 on; they know a radio whose device has gone.
    const Result<std::uint32_t> flags = all.value().number("RadioFlags");
    return !devices.value().empty() || (flags && (flags.value() & rowOf(radio).flag) != 0);
}

Result<std::vector<NetworkDevice>>
NetworkView::devicesOf(std::initializer_list<NMDeviceType> types) const
{
    std::vector<NetworkDevice> devices;
    for (const auto& [path, interfaces] : *objects_) {
        const Object object(path, interfaces);
        const Result<Properties> device = object.properties(NM_DBUS_INTERFACE_DEVICE);
        if (!device)
            continue;
        const Result<std::uint32_t> kind = device.value().number("DeviceType");
        if (kind && std::none_of(types.begin(), types.end(), [&kind](NMDeviceType type) {
                return kind.value() == static_cast<std::uint32_t>(type);
            }))
            continue;
        const Result<std::uint32_t> state = device.value().number("State");
        if (!kind || !state)
            return fromNetworkManager(kind ? state.error() : kind.error());
        const Result<std::string> interface = device.value().text("Interface");
        devices.push_back({state.value(), interface ? interface.value() : ""});
    }
    return devices;
}

// Whether a predicate holds for one of the connections that are up or coming up.
template <typename Predicate>
bool anyActive(const Tree& objects, Predicate holds)
{
    return std::any_of(objects.begin(), objects.end(), [holds](const auto& each) {
        const Object object(each.first, each.second);
        const auto active = object.properties(NM_DBUS_INTERFACE_ACTIVE_CONNECTION);
        const auto state =
            active ? active.value().number("State") : Result<std::uint32_t>(active.error());
        return state &&
               (state.value() == NM_ACTIVE_CONNECTION_STATE_ACTIVATING ||
                state.value() == NM_ACTIVE_CONNECTION_STATE_ACTIVATED) &&
               holds(active.value());
    });
}

Result<std::uint32_t> NetworkView::connectivity() const
{
    const Result<Properties> all = manager();
    const auto state =
        all ? all.value().number("Connectivity") : Result<std::uint32_t>(all.error());
    return state ? state : all ? fromNetworkManager(state.error()) : state;
}

// A name is any bytes; what is no text cannot be told as one.
Result<std::string> NetworkView::nameOf(const std::string& accessPoint) const
{
    const auto point = at(accessPoint, NM_DBUS_INTERFACE_ACCESS_POINT);
    const auto bytes =
        point ? point.value().bytes("Ssid") : Result<std::vector<std::uint8_t>>(point.error());
    if (!bytes)
        return fromNetworkManager(bytes.error());
    const std::string name(bytes.value().begin(), bytes.value().end());
    if (name.empty())
        return notAvailable("the Wi-Fi network hides its name");
    if (g_utf8_validate(name.data(), static_cast<gssize>(name.size()), nullptr) == FALSE)
        return notAvailable("the name of the Wi-Fi network is no text");
    return name;
}

Result<Fact> NetworkView::ssid() const
{
    for (const auto& [path, interfaces] : *objects_) {
        const Object object(path, interfaces);
        const auto device = object.properties(NM_DBUS_INTERFACE_DEVICE);
        const auto radio = object.properties(NM_DBUS_INTERFACE_DEVICE_WIRELESS);
        const auto state = device ? device.value().number("State") : device.error();
        if (!radio || !state || state.value() != NM_DEVICE_STATE_ACTIVATED)
            continue;
        const auto point = radio.value().path("ActiveAccessPoint");
        const auto name = point ? nameOf(point.value()) : fromNetworkManager(point.error());
        if (!name)
            return name.error();
        const auto interface = device.value().text("Interface");
        return Fact{name.value(),
                    std::string(NETWORK_MANAGER.name) + (interface ? " " + interface.value() : "")};
    }
    return notAvailable("Wi-Fi is not connected");
}

bool NetworkView::hasActiveCellularConnection() const
{
    return anyActive(*objects_, [](const Properties& connection) {
        const auto type = connection.text("Type");
        return type && isCellular(type.value());
    });
}

bool NetworkView::isActive(const std::string& connection) const
{
    return anyActive(*objects_, [&connection](const Properties& active) {
        const auto path = active.path("Connection");
        return path && path.value() == connection;
    });
}

Result<std::vector<CellularConnection>> NetworkView::cellularConnections() const
{
    std::vector<CellularConnection> found;
    bool isAnyKnown = false;
    bool isAnyThere = false;
    for (const auto& [path, interfaces] : *objects_) {
        const Object settings(path, interfaces);
        if (!settings.has(NM_DBUS_INTERFACE_SETTINGS_CONNECTION))
            continue;
        isAnyThere = true;
        if (!settings.has(settingsName("connection").c_str()))
            continue;
        isAnyKnown = true;
        const auto connection = cellularConnection(settings, isActive(path));
        if (!connection)
            return fromNetworkManager(connection.error());
        if (connection.value())
            found.push_back(*connection.value());
    }
    if (isAnyThere && !isAnyKnown)
        return notAvailable("NetworkManager tells the settings of no connection");
    return found;
}

// The names of a connection's devices below NetworkManager: a modem's device is named by
// its ModemManager object.
std::optional<std::string> NetworkView::deviceBelow(const Properties& connection) const
{
    const auto devices = connection.paths("Devices");
    if (!devices || devices.value().empty())
        return std::nullopt;
    const auto device = at(devices.value().front(), NM_DBUS_INTERFACE_DEVICE);
    const auto name = device ? device.value().text("Udi") : Result<std::string>(device.error());
    return name ? std::optional<std::string>(name.value()) : std::nullopt;
}

std::optional<std::string> NetworkView::primaryModem() const
{
    const auto network = manager();
    if (!network)
        return std::nullopt;
    const auto primary = network.value().path("PrimaryConnection");
    const auto type = network.value().text("PrimaryConnectionType");
    if (!primary || !type || type.value() != GSM)
        return std::nullopt;
    const auto connection = at(primary.value(), NM_DBUS_INTERFACE_ACTIVE_CONNECTION);
    return connection ? deviceBelow(connection.value()) : std::nullopt;
}

} // namespace port::linux_backend
